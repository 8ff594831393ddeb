# SPDX-License-Identifier: MIT
"""The report says of each goal whether the figures meet it. Its folder is the only argument."""
import json
import pathlib
import subprocess
import sys
import tempfile
import xml.etree.ElementTree as xml

GOALS = """# A comment
Find | * | Orb | best | 0.5 | time | Bounded by memory.
Grow | 1000 | Orb | Orb/10 | 1.5 | time |
Copy@ext4 | * | Orb | cp | 1.0 | peak_MiB |
"""


def row(name, time, **more):
    return {"run_name": name, "run_type": "iteration", "cpu_time": time, "real_time": 9 * time,
            "time_unit": "ns", "iterations": 1, **more}


RESULTS = {
    "text.0.json": [
        row("Find/Orb/8", 2.0), row("Find/Orb/8", 99.0), row("Find/Orb/8", 6.0),  # The median is 6.
        row("Find/Qt/8", 10.0), row("Find/std/8", 20.0), row("Find/limit-x/8", 1.0),
        row("Grow/Orb/10", 10.0), row("Grow/Orb/1000", 1400.0),
        {"run_name": "Find/ICU/8", "run_type": "iteration", "error_occurred": True,
         "error_message": "no ICU"},
    ],
    "copy@ext4.3.json": [row("Copy/Orb/real_time", 100.0, peak_MiB=3.0),
                         row("Copy/cp/real_time", 200.0, peak_MiB=2.0)],
}

EXPECTED = (
    "**1 of 3 goals are met.**",
    "| Find | 8 | 0.60 × Qt | ≤ 0.5 |",  # Among the missed; the limit is nobody's peer.
    "| Find | 8 | 6 ns | Qt 10 ns<br>std 20 ns | limit-x 1 ns | 0.60 × Qt | ≤ 0.5 | **missed** |",
    "- Find: Bounded by memory.",
    "| Grow | 1,000 | 1.4 µs | – | – | 1.40 × Orb/10 | ≤ 1.5 | met |",
    "| Copy@ext4, peak |  | 3 MiB | cp 2 MiB | – | 1.50 × cp | ≤ 1 | **missed** |",
    "Did not run: Find/ICU (no ICU).",
)


def main():
    scripts = pathlib.Path(sys.argv[1])
    with tempfile.TemporaryDirectory() as name:
        folder = pathlib.Path(name)
        (folder / "results").mkdir()
        for file, rows in RESULTS.items():
            (folder / "results" / file).write_text(json.dumps({"benchmarks": rows}))
        (folder / "goals").write_text(GOALS)
        command = [sys.executable, "-B", scripts / "report.py", folder / "results", folder / "goals"]
        subprocess.run([*command, folder], check=True)
        text = (folder / "benchmarks.md").read_text()
        wrong = [line for line in EXPECTED if line not in text.splitlines()]
        assert not wrong, f"{wrong} not in\n{text}"

        sys.path.insert(0, str(scripts))
        sys.dont_write_bytecode = True
        import plot
        image = xml.fromstring(plot.draw([("A<B", {"Orb": [(1, 5.0), (10, 60.0)]})]))
        assert any(part.text == "A<B" for part in image.iter()), "the title is not in the plot"


if __name__ == "__main__":
    main()
