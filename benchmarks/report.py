# SPDX-License-Identifier: MIT
"""Turns the results of run.py into benchmarks.md and its plots.

usage: report.py RESULTS GOALS FOLDER
"""
import fnmatch
import json
import pathlib
import statistics
import sys
from collections import defaultdict
from dataclasses import dataclass

import plot

SECTIONS = (
    ("strings", "Strings: sharing, making, growing, formatting, cutting"),
    ("convert", "Conversions between UTF-8 and UTF-16"),
    ("text", "Searching, replacing, splitting, comparing"),
    ("time", "Local time"),
    ("types", "Type by extension"),
    ("records", "Record copies"),
    ("fileinfo", "File information"),
    ("copy", "Copies of files"),
    ("tree", "Trees and big files: copying and removing"),
    ("temp", "Unique names"),
    ("trash", "Trash and drives"),
    ("start", "Start of a program that does nothing"),
    ("import", "orb-import --dry-run"),
)

# File, and its panels: workloads whose time should grow with the size and no faster.
PLOTS = (
    ("conversions", ("ToUtf16Road-ASCII", "ToUtf16Road-Latin", "ToUtf16Road-CJK",
                     "ToUtf8Road-ASCII", "ToUtf8Road-Latin", "ToUtf8Road-CJK")),
    ("texts", ("Find-ASCII", "Replace-ASCII", "Split-ASCII", "Find-CJK", "Replace-CJK", "Split-CJK")),
    ("vectors", ("GrowVector", "GrowVector-paths", "Append")),
    ("trees", ("CopyTree@xfs", "CopyTree@ext4", "CopyTree@btrfs",
               "RemoveTree@xfs", "RemoveTree@ext4", "RemoveTree@btrfs")),
    ("names", ("UniqueNames@xfs", "UniqueNames@ext4", "UniqueNames@btrfs")),
    ("dry-run", ("DryRun",)),
)

NANOSECONDS = {"ns": 1, "us": 1e3, "ms": 1e6, "s": 1e9}


@dataclass
class Figures:
    """The medians of one row."""

    whole: float  # One iteration, in ns.
    each: float  # One of the things that it handles, in ns.
    counters: dict

    def of(self, what):
        return self.each if what == "time" else self.counters.get(what)


@dataclass
class Goal:
    workload: str
    sizes: str
    ours: str
    against: str
    at_most: float | None
    what: str
    note: str

    def fits(self, workload, size):
        if not fnmatch.fnmatchcase(workload, self.workload):
            return False
        if self.sizes == "*":
            return True
        if self.sizes.endswith(".."):
            return size is not None and size >= int(self.sizes[:-2])
        return size is not None and str(size) in self.sizes.split(",")


@dataclass
class Line:
    """One line of a table: our row of one workload and size against what a goal names."""

    workload: str
    size: int | None
    ours: str
    goal: Goal | None
    against: str
    ratio: float | None

    @property
    def met(self):
        if self.goal is None or self.goal.at_most is None:
            return None
        return self.ratio is not None and self.ratio <= self.goal.at_most


def split_name(name):
    """Workload, row and size of Workload/row/size/real_time; no row for a name of another form."""
    workload, *rest = name.split("/")
    row = rest[0] if rest and rest[0][0].isalpha() and not rest[0].endswith("_time") else None
    sizes = [int(part) for part in rest[1:] if part.isdigit()]
    return workload, row, sizes[0] if sizes else None


def is_peer(row):
    return not row.startswith(("Orb", "limit"))


KNOWN = {"name", "run_name", "run_type", "family_index", "per_family_instance_index", "repetitions",
         "repetition_index", "threads", "iterations", "real_time", "cpu_time", "time_unit",
         "items_per_second", "bytes_per_second", "label"}


def figures_of(entries):
    def median(value):
        return statistics.median(value(entry) for entry in entries)

    def time_of(entry):
        clock = "real_time" if any(part in entry["run_name"] for part in ("/real_time", "/manual_time")) \
            else "cpu_time"
        return entry[clock] * NANOSECONDS[entry["time_unit"]]

    def each_of(entry):
        return 1e9 / entry["items_per_second"] if "items_per_second" in entry else time_of(entry)

    counters = [name for name in entries[0] if name not in KNOWN]
    return Figures(median(time_of), median(each_of),
                   {name: median(lambda entry, name=name: entry[name]) for name in counters})


def read_results(folder):
    """{program: {(workload, size): {row: Figures}}}, and the rows that said they could not run."""
    found = defaultdict(lambda: defaultdict(list))
    failed = {}
    for path in sorted(folder.glob("*.json")):
        if path.name == "machine.json":
            continue
        program, _, system = path.name.split(".")[0].partition("@")
        for entry in json.loads(path.read_text())["benchmarks"]:
            workload, row, size = split_name(entry["run_name"])
            if system:
                workload += "@" + system
            if row is None:
                failed[workload] = "its name has no row"
            elif entry.get("error_occurred"):
                failed[f"{workload}/{row}"] = entry.get("error_message", "")
            elif entry["run_type"] == "iteration":
                found[program][workload, size, row].append(entry)
    results = {}
    for program, rows in found.items():
        groups = results[program] = defaultdict(dict)
        for (workload, size, row), entries in rows.items():
            groups[workload, size][row] = figures_of(entries)
    return results, failed


def read_goals(path):
    goals = []
    for line in path.read_text().splitlines():
        if not line.strip() or line.startswith("#"):
            continue
        workload, sizes, ours, against, at_most, what, note = (part.strip() for part in line.split("|"))
        limit = None if at_most == "-" else float(at_most)
        goals.append(Goal(workload, sizes, ours, against, limit, what, note))
    return goals


def compare(groups, workload, size, goal):
    """The name of what our row is held against, and the ratio to it; None where a row is missing."""
    rows = groups[workload, size]
    ours = rows[goal.ours].of(goal.what)
    if "/" in goal.against:
        row, other = goal.against.split("/")
        rows = groups.get((workload, int(other)), {})
        if row not in rows:
            return goal.against, None
        return goal.against, cost(groups[workload, size][goal.ours], size) / cost(rows[row], int(other))
    names = [row for row in rows if is_peer(row)] if goal.against == "best" else \
        [row for row in goal.against.split(",") if row in rows]
    values = {row: rows[row].of(goal.what) for row in names if rows[row].of(goal.what)}
    if not values or not ours:
        return goal.against, None
    best = min(values, key=values.get)
    return best, ours / values[best]


def cost(figures, size):
    """Of one thing, or of one byte where the size is a number of bytes."""
    return figures.each if figures.each != figures.whole else figures.whole / size


def lines_of(groups, goals):
    lines = []
    for (workload, size), rows in sorted(groups.items(), key=lambda group: (group[0][0], group[0][1] or 0)):
        for ours in sorted(row for row in rows if row.startswith("Orb")):
            fitting = [goal for goal in goals if goal.ours == ours and goal.fits(workload, size)]
            for goal in fitting or [None]:
                asked = goal or Goal(workload, "*", ours, "best", None, "time", "")
                against, ratio = compare(groups, workload, size, asked)
                lines.append(Line(workload, size, ours, goal, against, ratio))
    return lines


def time_text(nanoseconds):
    for unit, factor in (("s", 1e9), ("ms", 1e6), ("µs", 1e3)):
        if nanoseconds >= factor:
            return f"{nanoseconds / factor:.3g} {unit}"
    return f"{nanoseconds:.3g} ns"


def size_text(size):
    if size is None:
        return ""
    for unit, factor in (("Mi", 1 << 20), ("Ki", 1 << 10)):
        if size >= factor and size % factor == 0:
            return f"{size // factor} {unit}"
    return f"{size:,}"


def value_text(figures, what):
    value = figures.of(what)
    if value is None:
        return "–"
    return time_text(value) if what == "time" else f"{value:.3g} {what.partition('_')[2]}"


def ratio_text(ratio):
    return "–" if ratio is None else f"{ratio:.2f}"


def row_cells(groups, line):
    rows = groups[line.workload, line.size]
    what = line.goal.what if line.goal else "time"
    known = [row for row in rows if rows[row].of(what) is not None]

    def listed(wanted):
        chosen = sorted((row for row in known if wanted(row)), key=lambda row: rows[row].of(what))
        return "<br>".join(f"{row} {value_text(rows[row], what)}" for row in chosen) or "–"

    verdict = {True: "met", False: "**missed**", None: ""}[line.met]
    if line.goal and line.ratio is None:
        verdict = "not measured"
    goal = f"≤ {line.goal.at_most:g}" if line.met is not None else ""
    variant = line.ours.removeprefix("Orb").removeprefix("-")
    workload = f"{line.workload} ({variant})" if variant else line.workload
    if what != "time":
        workload += f", {what.partition('_')[0]}"
    return [workload, size_text(line.size), value_text(rows[line.ours], what), listed(is_peer),
            listed(lambda row: row.startswith("limit")), f"{ratio_text(line.ratio)} × {line.against}",
            goal, verdict]


HEAD = ("workload", "size", "ours", "peers, quickest first", "limits", "ratio", "goal", "")


def table(head, rows):
    yield "| " + " | ".join(head) + " |"
    yield "|" + "---|" * len(head)
    for row in rows:
        yield "| " + " | ".join(row) + " |"
    yield ""


def section(title, groups, lines):
    yield f"## {title}"
    yield ""
    yield from table(HEAD, [row_cells(groups, line) for line in lines])
    notes = {}
    for line in lines:
        if line.goal and line.goal.note and line.met is not True:
            notes.setdefault(line.goal.note, []).append(line.workload)
    for note, workloads in notes.items():
        yield f"- {', '.join(dict.fromkeys(workloads))}: {note}"
    if notes:
        yield ""


def summary(lines):
    judged = [line for line in lines if line.met is not None and line.ratio is not None]
    missed = [line for line in judged if not line.met]
    yield f"**{len(judged) - len(missed)} of {len(judged)} goals are met.**"
    yield ""
    if missed:
        yield "Missed:"
        yield ""
        yield from table(
            ("workload", "size", "ratio", "goal"),
            [[line.workload + ("" if line.ours == "Orb" else f" ({line.ours})"), size_text(line.size),
              f"{ratio_text(line.ratio)} × {line.against}", f"≤ {line.goal.at_most:g}"]
             for line in sorted(missed, key=lambda line: -line.ratio / line.goal.at_most)])


def draw_plots(results, folder):
    """Writes the plots that have points, and gives their names."""
    groups = {key: rows for program in results.values() for key, rows in program.items()}
    for name, workloads in PLOTS:
        panels = []
        for workload in workloads:
            series = defaultdict(list)
            for (found, size), rows in groups.items():
                if found == workload and size:
                    for row, figures in rows.items():
                        series[row].append((size, figures.whole))
            series = {row: sorted(points) for row, points in series.items() if len(points) > 1}
            if series:
                panels.append((workload, series))
        if panels:
            (folder / f"{name}.svg").write_text(plot.draw(panels))
            yield name


INTRODUCTION = """# Benchmarks

Written by `./bench`. Times are medians, of one thing where a workload handles many; they are worth
comparing within this run alone. *ratio* is ours divided by the row named, so below 1 we are ahead; where
no goal is set it is to the quickest peer. Rows named *limit* are no peers but what nobody can beat, or
what the contract costs at least. What each workload does stands in the program's source in
`benchmarks/`, what is asked of it in `benchmarks/goals.txt`. Sizes are bytes of UTF-8, files, elements,
threads or MiB, as the workload says; `@xfs` is a new file system of that kind in memory.
"""


def report(results, failed, goals, machine, plots):
    titles = dict(SECTIONS)
    order = [name for name, _ in SECTIONS] + sorted(set(results) - set(titles))
    programs = [name for name in order if name in results]
    lines = {name: lines_of(results[name], goals) for name in programs}
    yield INTRODUCTION
    yield from table(("", ""), [[key, str(value)] for key, value in machine.items() if value])
    yield from summary([line for name in programs for line in lines[name]])
    if failed:
        yield "Did not run: " + "; ".join(f"{row} ({why})" for row, why in sorted(failed.items())) + "."
        yield ""
    if plots:
        yield "## Time over size"
        yield ""
        yield "Both axes are logarithmic; the dotted line grows as the size does."
        yield ""
        for name in plots:
            yield f"![{name}](benchmarks/{name}.svg)"
            yield ""
    for name in programs:
        yield from section(titles.get(name, name), results[name], lines[name])


def main():
    results_folder, goals_file, folder = map(pathlib.Path, sys.argv[1:])
    results, failed = read_results(results_folder)
    about = results_folder / "machine.json"
    machine = json.loads(about.read_text()) if about.exists() else {}
    plots_folder = folder / "benchmarks"
    plots_folder.mkdir(parents=True, exist_ok=True)
    plots = list(draw_plots(results, plots_folder))
    text = "\n".join(report(results, failed, read_goals(goals_file), machine, plots))
    (folder / "benchmarks.md").write_text(text.rstrip() + "\n")


if __name__ == "__main__":
    main()
