# SPDX-License-Identifier: MIT
"""Runs the benchmark programs of a build and keeps what they say in BUILD/results/*.json.

usage: run.py BUILD [--quick] [program ...]

With the right to mount, and in a name space of its own, everything happens in a new tmpfs.
"""
import argparse
import contextlib
import json
import os
import pathlib
import platform
import random
import re
import subprocess
import sys
import time
from dataclasses import dataclass


@dataclass(frozen=True)
class Program:
    """One way to run <program>_bench: on each file system of `on` anew each round, or where it likes."""

    name: str
    only: str = ""  # The rows, as --benchmark_filter reads them.
    on: tuple = ()
    own_rounds: bool = False  # It makes file systems itself, a new one each repetition.
    quick: str = ""  # The rows of a quick run.


PROGRAMS = (
    # Once a thread has been started, locks cost more for good: hence two runs.
    Program("strings", only="-Share-(idle|threads)"),
    Program("strings", only="Share-(idle|threads)"),
    Program("convert"),
    Program("text"),
    Program("time"),
    Program("types"),
    Program("records"),
    Program("start"),
    Program("fileinfo", on=("ext4",)),
    Program("trash", on=("xfs", "ext4")),
    Program("temp", on=("xfs", "ext4", "btrfs")),
    Program("copy", on=("xfs-noreflink", "xfs", "ext4", "btrfs")),
    Program("tree", own_rounds=True, quick="@ext4"),
    Program("import"),
)

MAKE = {
    "xfs": ["mkfs.xfs", "-q", "-m", "reflink=1"],
    "xfs-noreflink": ["mkfs.xfs", "-q", "-m", "reflink=0"],
    "ext4": ["mkfs.ext4", "-q", "-F", "-E", "lazy_itable_init=0,lazy_journal_init=0"],
    "btrfs": ["mkfs.btrfs", "-q"],
}


@dataclass(frozen=True)
class Effort:
    repetitions: int
    rounds: int
    own_rounds: int
    seconds: float  # The least time that one repetition of a row in memory runs.
    file_systems: tuple


FULL = Effort(9, 5, 5, 0.02, tuple(MAKE))
QUICK = Effort(3, 1, 1, 0.002, ("ext4",))


@contextlib.contextmanager
def new_file_system(kind, folder):
    """A new file system of that kind, on an image below `folder`."""
    image, mounted = folder / "image", folder / "volume"
    with open(image, "wb") as file:
        file.truncate(4 << 30)
    mounted.mkdir(exist_ok=True)
    subprocess.run([*MAKE[kind], image], check=True, stdout=subprocess.DEVNULL)
    subprocess.run(["mount", "-o", "loop", image, mounted], check=True)
    try:
        yield mounted
    finally:
        subprocess.run(["umount", mounted], check=True)
        image.unlink()


@contextlib.contextmanager
def memory(folder):
    """A tmpfs that ends with the name space; None without the right to mount."""
    folder.mkdir(exist_ok=True)
    mount = ["mount", "-t", "tmpfs", "-o", "size=12g,mode=1777", "tmpfs", folder]
    if os.geteuid() != 0 or subprocess.run(mount, check=False).returncode != 0:
        yield None
        return
    try:
        yield folder
    finally:
        subprocess.run(["umount", "--lazy", folder], check=True)


class Runner:
    def __init__(self, build, effort, quick):
        self.build, self.effort, self.quick = build, effort, quick
        self.results = build / "results"
        self.results.mkdir(exist_ok=True)

    def run(self, program, folder, system="", **options):
        """One run of a program, its rows in random order, with `folder` to work in."""
        options |= {"enable_random_interleaving": "true", "out_format": "json"}
        only = program.quick if self.quick and program.quick else program.only
        if only:
            options["filter"] = only
        number = len(list(self.results.glob(f"{program.name}[@.]*")))
        options["out"] = self.results / f"{program.name}{'@' + system if system else ''}.{number}.json"
        command = [self.build / "benchmarks" / f"{program.name}_bench"]
        command += [f"--benchmark_{option}={value}" for option, value in options.items()]
        environment = os.environ | {"LC_ALL": "C.UTF-8"}
        if folder:
            environment |= {"ORB_BENCH_FOLDER": str(folder), "TMPDIR": str(folder)}
        done = subprocess.run(
            command, env=environment, cwd=folder, check=False,
            stdout=subprocess.DEVNULL, stderr=subprocess.PIPE, text=True)
        if done.returncode != 0:
            sys.exit(f"{program.name}_bench ended with {done.returncode}: {done.stderr[-2000:]}")

    def run_on_file_systems(self, program, scratch):
        rounds = [kind for kind in program.on if kind in self.effort.file_systems]
        rounds *= self.effort.rounds
        random.shuffle(rounds)
        for kind in rounds:
            with new_file_system(kind, scratch) as folder:
                self.run(program, folder, kind, min_time=0.01, repetitions=1)

    def run_program(self, program, scratch):
        needs_mount = program.on or program.own_rounds
        if needs_mount and scratch is None:
            print(f"{program.name}: left out without the right to mount", file=sys.stderr)
        elif program.on:
            self.run_on_file_systems(program, scratch)
        elif program.own_rounds:
            self.run(program, scratch, repetitions=self.effort.own_rounds, min_time=0)
        else:
            self.run(program, scratch, repetitions=self.effort.repetitions,
                     min_time=self.effort.seconds)


def chosen(build, names):
    """What is built of PROGRAMS, and what is built beyond it, as far as it was asked for."""
    built = {path.name.removesuffix("_bench") for path in (build / "benchmarks").glob("*_bench")}
    unknown = set(names) - built
    if unknown:
        sys.exit(f"no such program: {' '.join(sorted(unknown))}; there are {' '.join(sorted(built))}")
    listed = [program for program in PROGRAMS if program.name in built]
    others = built - {program.name for program in listed}
    everything = listed + [Program(name) for name in sorted(others)]
    return [program for program in everything if not names or program.name in names]


def first_line(*command):
    try:
        done = subprocess.run(command, capture_output=True, text=True, check=False)
    except OSError:
        return ""
    lines = (done.stdout or done.stderr).splitlines()
    return lines[0].strip() if done.returncode == 0 and lines else ""


def field(path, pattern):
    """What the first group of `pattern` finds in a file."""
    try:
        found = re.search(pattern, pathlib.Path(path).read_text(), re.MULTILINE)
    except OSError:
        return ""
    return found[1].strip() if found else ""


def machine(build):
    """Who was measured where, without the machine's name."""
    cache = build / "CMakeCache.txt"
    memory_kib = int(field("/proc/meminfo", r"^MemTotal:\s+(\d+)") or 0)
    boost = field("/usr/include/boost/version.hpp", r'BOOST_LIB_VERSION "(.+)"')
    return {
        "date": time.strftime("%Y-%m-%d %H:%M UTC", time.gmtime()),
        "revision": first_line("git", "describe", "--always", "--dirty", "--exclude", "*"),
        "processor": field("/proc/cpuinfo", r"^model name\s*:\s*(.+)"),
        "cores": os.cpu_count(),
        "memory": f"{memory_kib / (1 << 20):.0f} GiB",
        "load before": f"{os.getloadavg()[0]:.1f}",
        "system": f"{field('/etc/os-release', r'^PRETTY_NAME=.(.*).$')}, Linux {platform.release()}",
        "compiler": first_line(field(cache, r"^CMAKE_CXX_COMPILER:\w+=(.+)"), "--version"),
        "C library": first_line("getconf", "GNU_LIBC_VERSION"),
        "ICU": first_line("pkg-config", "--modversion", "icu-uc"),
        "Qt": first_line("pkg-config", "--modversion", "Qt6Core"),
        "GLib and GIO": first_line("pkg-config", "--modversion", "gio-2.0"),
        "Boost": boost.replace("_", "."),
        "cp and rm": first_line("cp", "--version"),
    }


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("build", type=lambda path: pathlib.Path(path).resolve())
    parser.add_argument("--quick", action="store_true")
    parser.add_argument("programs", nargs="*")
    options = parser.parse_args()

    runner = Runner(options.build, QUICK if options.quick else FULL, options.quick)
    for old in runner.results.iterdir():
        old.unlink()
    about = machine(options.build) | {"run": "quick" if options.quick else "full"}
    begin = time.monotonic()
    with memory(options.build / "scratch") as scratch:
        for program in chosen(options.build, options.programs):
            start = time.monotonic()
            runner.run_program(program, scratch)
            took = time.monotonic() - start
            print(f"{program.name} {program.only}: {took:.0f} s", file=sys.stderr)
    about["took"] = f"{(time.monotonic() - begin) / 60:.1f} minutes"
    (runner.results / "machine.json").write_text(json.dumps(about, indent=1))


if __name__ == "__main__":
    main()
