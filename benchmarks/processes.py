"""Runs programs as whole processes and tells what the system counted for each of them."""

import os
import statistics
import time
from dataclasses import dataclass
from pathlib import Path

ENVIRONMENT = dict(os.environ, LC_ALL="C", GIT_CONFIG_NOSYSTEM="1", GIT_CONFIG_GLOBAL=os.devnull,
                   GIT_AUTHOR_NAME="Compare", GIT_AUTHOR_EMAIL="compare@example.com",
                   GIT_COMMITTER_NAME="Compare", GIT_COMMITTER_EMAIL="compare@example.com")

median = statistics.median


class BrokenRun(Exception):
    """A program that can't be timed: it is missing, or did not do its work."""


class Programs:
    """The paths of what a build made."""

    def __init__(self, build):
        build = build.resolve()
        self.merge = str(build / "app/VexelYAMLMerge")
        self.report = str(build / "app/vexel-merge-report")
        self.view = str(build / "app/vexel-merge-view")
        self.git_helper = str(build / "app/vexel-merge-git")
        self.make_scene = str(build / "benchmarks/make_scene")
        self.text_floor = str(build / "benchmarks/text_floor")
        self.least_work = str(build / "benchmarks/least_work")
        self.libyaml_floor = str(build / "benchmarks/libyaml_floor")
        for path in vars(self).values():
            if not os.access(path, os.X_OK):
                raise BrokenRun(f"no program at {path}; build the release preset or name its folder with --build")


@dataclass(frozen=True)
class Run:
    wall: float    # seconds
    cpu: float     # seconds of user and system time, with those of all processes that it waited for
    memory: float  # bytes, of the largest process


def run(arguments, good_statuses=(0,), output=os.devnull, folder=None):
    """Runs one process to its end; its output goes to a file. Raises BrokenRun on any other status."""
    errors = Path(output + ".errors") if output != os.devnull else Path(os.devnull)
    to_files = [(os.POSIX_SPAWN_OPEN, descriptor, str(path), os.O_WRONLY | os.O_CREAT | os.O_TRUNC, 0o600)
                for descriptor, path in ((1, output), (2, errors))]
    command = ["env", "-C", str(folder), *arguments] if folder else arguments
    begin = time.perf_counter()
    process = os.posix_spawnp(command[0], command, ENVIRONMENT, file_actions=to_files)
    _, status, usage = os.wait4(process, 0)
    wall = time.perf_counter() - begin
    if os.waitstatus_to_exitcode(status) not in good_statuses:
        said = errors.read_text(errors="replace") if errors.is_file() else ""
        raise BrokenRun(f"status {os.waitstatus_to_exitcode(status)} of {' '.join(map(str, command))}\n{said}")
    return Run(wall, usage.ru_utime + usage.ru_stime, usage.ru_maxrss * 1024)
