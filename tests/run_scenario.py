#!/usr/bin/env python3
"""Runs one scenario: run_scenario.py <program> <scenario folder>.

A scenario's input files are copied into a fresh folder, and the program runs there once for each line of the
file `args`. The file `env` may set environment variables (NAME=VALUE lines). What stands in `expected/` is
compared byte by byte:
  status          one exit status a line, one line a run (all 0 where the file is missing)
  stdout, stderr  of the last run, where present
  stdout_timed    the same, with "#" for each number behind a colon at the end of a line
  absent          names that must not exist, one a line; a pattern such as /tmp/MERGE* means: no new one
  anything else   a file of that name in the folder
An input that changed, and a file that nobody expected, is a failure too: a merge leaves nothing lying about.
"""

import difflib
import glob
import os
import re
import shlex
import shutil
import subprocess
import sys
import tempfile
import time
from pathlib import Path

NOT_COPIED = {"args", "env", "expected", "README.md"}
ABOUT_THE_RUN = {"status", "stdout", "stdout_timed", "stderr", "absent"}
TIME_LIMIT_SECONDS = 60


def text_lines(path):
    return path.read_text().splitlines() if path.exists() else []


def files_below(folder):
    return {str(p.relative_to(folder)): p.read_bytes() for p in folder.rglob("*") if p.is_file()}


def difference(name, expected, actual):
    """The unified diff of two byte strings, with escapes where they aren't plain text."""
    if expected == actual:
        return []
    before, after = ([line.decode("utf-8", "backslashreplace").replace("\r", "\\r").rstrip("\n")
                      for line in content.splitlines(keepends=True)] for content in (expected, actual))
    lines = list(difflib.unified_diff(before, after, f"expected {name}", f"actual {name}", lineterm=""))
    return lines or [f"{name}: only the line ends differ: {expected[-40:]!r}, {actual[-40:]!r}"]


def leftovers(before, pattern):
    """New names that stay: those of merges that run at the same time vanish while we wait."""
    new = set(glob.glob(pattern)) - before
    deadline = time.monotonic() + 5
    while new and time.monotonic() < deadline:
        time.sleep(0.05)
        new = {name for name in new if os.path.lexists(name)}
    return new


def run(program, scenario, work, home):
    environment = dict(os.environ, HOME=str(home))
    environment.update(line.split("=", 1) for line in text_lines(scenario / "env"))
    statuses, last = [], None
    for line in text_lines(scenario / "args") or [""]:
        last = subprocess.run([program, *shlex.split(line)], cwd=work, env=environment, capture_output=True,
                              stdin=subprocess.DEVNULL, timeout=TIME_LIMIT_SECONDS)
        statuses.append(last.returncode)
    return statuses, last


def check(program, scenario, work, home):
    expected_folder = scenario / "expected"
    absent = text_lines(expected_folder / "absent")
    outside = {pattern: set(glob.glob(pattern)) for pattern in absent if os.path.isabs(pattern)}
    inputs = files_below(work)

    statuses, last = run(program, scenario, work, home)

    wanted = text_lines(expected_folder / "status") or ["0"] * len(statuses)
    problems = difference("status", "\n".join(wanted).encode(), "\n".join(map(str, statuses)).encode())
    timed = re.sub(rb": \d+\n", b": #\n", last.stdout)
    for name, actual in (("stdout", last.stdout), ("stdout_timed", timed), ("stderr", last.stderr)):
        if (expected_folder / name).exists():
            problems += difference(name, (expected_folder / name).read_bytes(), actual)

    expected = dict(inputs)
    expected.update((name, content) for name, content in files_below(expected_folder).items()
                    if name not in ABOUT_THE_RUN)
    actual = files_below(work)
    for name in sorted(expected.keys() | actual.keys()):
        if name in absent:
            problems += [f"{name} exists"] * (name in actual)
        elif name not in expected:
            problems.append(f"{name}: nobody expected this file")
        elif name not in actual:
            problems.append(f"{name} is missing")
        else:
            problems += difference(name, expected[name], actual[name])
    for pattern, before in outside.items():
        problems += [f"left behind: {name}" for name in sorted(leftovers(before, pattern))]
    if problems and "stderr" not in os.listdir(expected_folder):
        problems += ["standard error was:", last.stderr.decode("utf-8", "backslashreplace")]
    return problems


def main():
    program, scenario = os.path.abspath(sys.argv[1]), Path(sys.argv[2]).resolve()
    with tempfile.TemporaryDirectory(prefix="scenario") as folder:
        work, home = Path(folder, "work"), Path(folder, "home")
        home.mkdir()
        shutil.copytree(scenario, work, symlinks=True,
                        ignore=lambda at, names: NOT_COPIED & set(names) if Path(at) == scenario else set())
        problems = check(program, scenario, work, home)
    print(*problems, sep="\n", end="\n" if problems else "")
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main())
