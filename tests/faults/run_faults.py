#!/usr/bin/env python3
# Runs the commands of commands.txt while something fails: run_faults.py PART PROGRAMS LIBRARY [--all] [--only NAME]
#   PART      calls    a call of the programs, or it and all later ones (by LIBRARY, see fail_calls.cpp)
#             git      the same below a `git merge`
#             signals  the programs are ended at a random time
#             disk     the disk is too small for what they write; skipped where no such disk can be mounted
#   PROGRAMS  the folder of the programs and of their data files
#   --all     at every position, and 234 times for each signal, instead of what is quick enough for the suite
#   --only    those commands alone whose names hold NAME
#
# Whatever fails: a file that is written is the old or the whole new one; the status of success (or of conflicts)
# comes with all that belongs to it; any other end has status 1 and a message; no work file is left.

import argparse
import itertools
import os
import random
import shutil
import subprocess
import sys
import tempfile
import time
from collections import namedtuple
from errno import EACCES, EAGAIN, EINTR, EIO, EMFILE, ENOMEM, ENOSPC, EPERM
from pathlib import Path
from signal import SIGKILL, SIGTERM

HERE = Path(__file__).resolve().parent
SKIPPED = 77

# What each kind of call fails with: an errno, 0 for a short count, or a signal that follows the call.
FAULTS = {
    "open": [EMFILE, EINTR],
    "create": [ENOSPC, EMFILE, -SIGTERM, -SIGKILL],
    "read": [EIO, EINTR, 0],
    "write": [ENOSPC, EIO, EINTR, 0, -SIGTERM, -SIGKILL],
    "fsync": [EIO, ENOSPC],
    "close": [EIO, ENOSPC],
    "rename": [ENOSPC, EACCES, -SIGTERM, -SIGKILL],
    "unlink": [EACCES],
    "mode": [EPERM],
    "thread": [EAGAIN],
    "process": [EAGAIN],
    "memory": [ENOMEM],
}
ONCE = {EINTR, -SIGTERM, -SIGKILL}
# No harm is done: nobody may notice.
HARMLESS = {("read", 0), ("write", 0), ("thread", EAGAIN), ("mode", EPERM)}

Result = namedtuple("Result", "status stdout stderr files left failed calls")


def scene(objects, intensity, reach):
    lines = ["%YAML 1.1", "%TAG !v! tag:vexel.com,2011:"]
    for number in range(objects):
        lines += [f"--- !v!108 &{10 + number}", "Light:", f"  m_Intensity: {1 if number else intensity}",
                  f"  m_Notes: {'long ' * 1000}", f"  m_Range: {10 if number else reach}"]
    return "\n".join(lines) + "\n"


# A folder with inputs (in/) and results (out/), and the files through which the library is told what to do.
class Bench:
    def __init__(self, work, arguments, objects):
        self.work, self.out = work, work / "out"
        shutil.copytree(HERE / "in", work / "in")
        shutil.copy(Path(arguments.programs, "mergerules.txt"), work / "in/rules")
        for side, values in {"base": (1, 10), "left": (2, 10), "right": (1, 20), "clash": (3, 20)}.items():
            for extension in ("vexel", "txt"):
                (work / f"in/{side}.{extension}").write_text(scene(objects, *values))
        self.out.mkdir()
        path = f"{Path(arguments.programs).resolve()}:{os.environ['PATH']}"
        browser = f"{sys.executable} {HERE.parent}/git_on_page.py --browser theirs"
        self.environment = dict(os.environ, PATH=path, HOME=str(work), GIT_CONFIG_NOSYSTEM="1", CI="",
                                DISPLAY=":none", BROWSER=browser)
        self.preload = {"LD_PRELOAD": os.path.abspath(arguments.library), "FAULT_COUNT": str(work / "count"),
                        "FAULT_LOG": str(work / "log")}

    def shell(self, command):
        subprocess.run(command, shell=True, check=True, cwd=self.work, env=self.environment, capture_output=True)

    # On the branch left, with an asset that the branch right changes elsewhere, and the branch clash there, too.
    def make_repository(self):
        self.shell("git init -q -b base out && cd out && git config user.name Test && git config user.email t@localhost"
                   " && git config alias.settle '!vexel-merge-git resolve --theirs a.vexel'"
                   " && git config alias.settle-page '!vexel-merge-git resolve --web a.vexel'"
                   " && git config mergetool.keepBackup false && git config alias.settle-page-of-tool 'mergetool -y a.vexel'"
                   " && vexel-merge-git enable --patterns '*.vexel' && cp ../in/base.vexel a.vexel && git add -A"
                   " && git commit -q -m base && for side in right clash left; do git checkout -q -b $side base &&"
                   " cp ../in/$side.vexel a.vexel && git commit -q -a -m $side; done && cp -a .git ../git")

    def files(self):
        files = {str(path.relative_to(self.out)): path for path in self.out.rglob("*") if path.is_file()}
        return {name: path.read_bytes() for name, path in files.items()
                if not name.startswith(".git/") or "vexel" in name}

    # Leaves in out/ only what the command is to find, and returns that.
    def prepare(self, command):
        is_git = command.startswith("git")
        for path in [] if is_git else self.out.iterdir():
            path.unlink()
        if is_git:
            self.shell("cd out && rm -rf .git && cp -a ../git .git && git checkout -q -f left && git clean -fdxq")
            self.shell("cd out && ! git merge -q --no-edit clash" if " settle" in command else "true")
        for argument in command.split():
            if argument.startswith("out/old"):
                (self.work / argument).write_bytes(b"old\n" * 500)
        return self.files()

    def start(self, command, kind="none", error=0, at=0, goes_on=False):
        (self.work / "count").write_bytes(bytes(8))
        (self.work / "log").write_bytes(b"")
        fault = {"FAULT": f"{kind} {error} {at} {int(goes_on)}"}
        return subprocess.Popen(command.split(), cwd=self.work, env=self.environment | self.preload | fault,
                                stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.PIPE)

    def finish(self, process):
        stdout, stderr = process.communicate(timeout=60)
        log = [line.split(" ", 1) for line in (self.work / "log").read_text().splitlines()]
        made, failed = ([place for verb, place in log if verb == wanted] for wanted in ("made", "failed"))
        left = [self.work / place for place in made if (self.work / place).exists()]
        for path in [path for path in left if not path.is_relative_to(self.work)]:
            path.unlink()
        calls = int.from_bytes((self.work / "count").read_bytes(), "little")
        return Result(process.returncode, stdout, stderr, self.files(), left, failed, calls)

    def run(self, command, *fault):
        old = self.prepare(command)
        return old, self.finish(self.start(command, *fault))


# Whether a file is remembered as one that could not be merged, and is as it was.
def is_guarded(name, old, result):
    return name.endswith(".path") and b"not merged, but left" in result.files.get(name, b"") and (
        result.files["a.vexel"] == old["a.vexel"])


# What is wrong with a result. `old` are the files before the run, `clean` comes from a run without a fault.
def judge(command, kind, error, old, clean, result):
    problems = [f"{name} is neither old nor new" for name in sorted(clean.files.keys() | old.keys())
                if result.files.get(name) not in (old.get(name), clean.files.get(name))
                and not is_guarded(name, old, result)]
    if error != -SIGKILL:
        problems += [f"{path} is left" for path in result.left if f"unlink {path}" not in result.failed]
    is_ended = error < 0 and result.status in (error, 128 - error)
    settled = {name for name in clean.files.keys() | old.keys() if clean.files.get(name) != old.get(name)}
    part = {name for name in settled if result.files.get(name) != old.get(name)}
    if " settle" in command and error == -SIGTERM and part and part != settled:
        problems.append(f"of what is settled there is only {part}")
    if is_ended:
        return problems
    new = {name for name in clean.files if result.files.get(name) != old.get(name)}
    if "old.vexel" in new and new != clean.files.keys():
        problems.append("the destination is new, but the other files are not")
    if kind != "rename" and len([name for name in new if "_base" in name or "_right" in name]) == 1:
        problems.append("only one premerged file is new")
    # A page never has the same address twice.
    is_whole = (result.status, result.files) == (clean.status, clean.files) and (
        result.stdout == clean.stdout or " settle-page" in command)
    # Of a file that can't be opened or closed, these commands say nothing: their callers expect it so. One that
    # exists could have been opened.
    is_silent = kind in ["open", "close"] + ["create"] * (not old) and any("out/" in place for place in result.failed)
    if is_silent and (" strip " in command or " diff " in command):
        return problems + ["it is not silent"] * ((result.status, result.files, result.stderr) != (0, old, b""))
    if is_whole or result.status != 1 or (kind, error) in HARMLESS:
        return problems + ["this is not the right result"] * (not is_whole)
    return problems + ["there is no message"] * (not result.stderr.strip())


def report(name, what, result, problems):
    if problems:
        print(f"{name}: {what}: {'; '.join(problems)} (status {result.status}, {result.failed[:1]}, "
              f"{result.stderr[-300:]!r})", flush=True)
    return bool(problems)


def check_calls(bench, commands, arguments):
    runs, failures, seen = 0, 0, set()
    for (name, command), (kind, errors) in itertools.product(commands.items(), FAULTS.items()):
        old, clean = bench.run(command, kind)
        assert clean.status in (0, 1, 2) and not clean.left, clean
        seen.update([kind] if clean.calls else [])
        if " settle-page" in command:
            errors = [error for error in errors if error == -SIGTERM]
        for error, goes_on in [(error, goes_on) for error in errors for goes_on in {False, error not in ONCE}]:
            chance = random.Random(f"{name} {kind} {error} {goes_on}")
            # Under git, how many calls there are is a matter of time, but the first one is always the same.
            first = {1} if arguments.part == "git" and clean.calls else set()
            some = first.union(chance.sample(range(1, clean.calls + 1), min(clean.calls, arguments.sample)))
            for at in itertools.count(1) if arguments.all else some:
                old, result = bench.run(command, kind, error, at, goes_on)
                if arguments.all and not result.failed:
                    break
                what = f"{kind} {at} of {clean.calls}{' and later' * goes_on}, error {error}"
                failures += report(name, what, result, judge(command, kind, error, old, clean, result))
                runs += 1
    unseen = FAULTS.keys() - seen
    print(f"{runs} runs, {failures} failures, never called: {unseen or 'none'}")
    return failures or (unseen and arguments.part == "calls" and not arguments.only)


def check_signals(bench, commands, arguments):
    failures, chance = 0, random.Random(1)
    for name, command in commands.items():
        start = time.monotonic()
        old, clean = bench.run(command)
        duration = time.monotonic() - start
        for signal in [SIGTERM, SIGKILL] * arguments.sample:
            bench.prepare(command)
            process = bench.start(command, "process")
            time.sleep(chance.uniform(0, duration))
            process.send_signal(signal)
            result = bench.finish(process)
            # A merge tool outlives the program, and may write a file that has just been removed.
            result = result._replace(left=[]) if result.calls else result
            failures += report(name, f"{signal!r}", result, judge(command, "", -signal, old, clean, result))
            # What is left must not be in the way of the next run.
            after = bench.finish(bench.start(command))
            is_well = after.status == clean.status and after.files.items() >= clean.files.items()
            failures += report(name, f"after {signal!r}", after, [] if is_well else ["this is not the right result"])
    print(f"{len(commands) * 2 * arguments.sample} runs, {failures} failures")
    return failures


def check_disk(bench, commands, _):
    failures = 0
    for name, command in commands.items():
        for folder in [bench.out] + ["/tmp"] * (not bench.work.is_relative_to("/tmp")):
            old, clean = bench.run(command)
            bench.shell(f"mount -t tmpfs -o size=64k small {folder}")
            old, result = bench.run(command)
            failures += report(name, f"{folder} is full", result, judge(command, "", 0, old, clean, result))
            bench.shell(f"umount {folder}")
    print(f"{len(commands)} commands, {failures} failures")
    return failures


def main():
    parser = argparse.ArgumentParser()
    for name in ("part", "programs", "library"):
        parser.add_argument(name)
    parser.add_argument("--all", action="store_true")
    parser.add_argument("--only", default="")
    arguments = parser.parse_args()
    part = arguments.part
    if part == "disk" and "FAULTS_MOUNT" not in os.environ:
        unshare = ["unshare", "--map-root-user", "--mount"]
        if subprocess.run([*unshare, "mount", "-t", "tmpfs", "small", "/tmp"]).returncode != 0:
            print("skipped: no disk can be mounted here")
            return SKIPPED
        os.environ["FAULTS_MOUNT"] = "1"
        os.execvp(unshare[0], [*unshare, sys.executable, *sys.argv])
    # Enough objects for threads, where they matter.
    check, objects, few, many = {"calls": (check_calls, 18, 3, 0), "git": (check_calls, 3, 1, 0),
                                 "signals": (check_signals, 200, 1, 13), "disk": (check_disk, 30, 0, 0)}[part]
    arguments.sample = many if arguments.all else few
    lines = [line.split(":", 1) for line in (HERE / "commands.txt").read_text().splitlines() if line and line[0] != "#"]
    commands = {name: command.strip() for name, command in lines if arguments.only in name
                and name.startswith("git") == (part == "git") and (part != "disk" or " out/" in command)}
    # Not in the folder for temporary files, which may be the full disk.
    with tempfile.TemporaryDirectory(prefix="faults", dir=os.getcwd()) as work:
        bench = Bench(Path(work), arguments, objects)
        if part == "git":
            bench.make_repository()
        return 1 if check(bench, commands, arguments) else 0


if __name__ == "__main__":
    sys.exit(main())
