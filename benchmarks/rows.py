"""The rows of the table: what is run on what, which figure counts, and how large it may be."""

from dataclasses import dataclass
from functools import partial
from typing import Callable

import git_settings
import lists
import page
from processes import BrokenRun, run


@dataclass(frozen=True)
class Setting:
    """Files to work on. `prepare(folder, programs, rows)` makes them and returns the commands by name."""
    prepare: Callable
    is_large: bool = False
    repeats: int = 1  # runs a round: processes of milliseconds vary more


@dataclass(frozen=True)
class Row:
    name: str
    text: str
    setting: Setting
    target: float | None  # none for a limit: what nobody can do without
    ours: str
    theirs: str = ""  # a figure without a reference is given as it is
    what: str = "wall"
    scale: float = 1  # how many times as much work `ours` has
    less: float = 0   # a difference instead of a ratio: what a second is multiplied with

    def commands(self):
        return [self.ours, self.theirs] if self.theirs else [self.ours]

    def figure(self, runs):
        ours = getattr(runs[self.ours], self.what)
        theirs = getattr(runs[self.theirs], self.what) if self.theirs else 1
        return (ours - theirs) * self.less if self.less else ours / theirs / self.scale


@dataclass(frozen=True)
class Sizes:
    """Stands for a run whose memory is that of the files alone."""
    memory: float


def merge_commands(folder, programs, files, prefix=""):
    """What is run on the three files, by name. Conflicts are no failure: the merge was done, its time counts."""
    base, left, right = files
    out = str(folder / "out")
    vexel = [programs.merge]
    made = {
        "merge": (vexel + ["merge", "-h", "--fallback", "none", *files, out], (0, 2, 3)),
        "safe": (vexel + ["merge", "--safe", "-h", "--fallback", "none", *files, out], (0, 2, 3)),
        "strip": (vexel + ["strip", "-h", base, left, out], (0,)),
        "diff": (vexel + ["diff", "-h", base, left, out], (0,)),
        "report": ([programs.report, "-o", out, *files], (0,)),
        "git": (["git", "merge-file", "-p", left, base, right], range(128)),
        "least": ([programs.least_work, "--sync", out, *files], (0,)),
        "text floor": ([programs.text_floor, out, *files], (0,)),
        "text floor of two": ([programs.text_floor, out, base, left], (0,)),
        "libyaml floor": ([programs.libyaml_floor, out, *files], (0,)),
    }
    commands = {prefix + name: partial(run, arguments, statuses, str(folder / "output"))
                for name, (arguments, statuses) in made.items()}
    inputs = sum(path.stat().st_size for path in folder.glob("*.vexel"))
    commands[prefix + "inputs"] = lambda: Sizes(inputs)
    return commands


def files_in(folder):
    folder.mkdir(exist_ok=True)
    return [str(folder / f"{name}.vexel") for name in ("base", "left", "right")]


def scene(objects, edited, folder, programs, _rows=(), prefix=""):
    files = files_in(folder)
    run([programs.make_scene, "--objects", str(objects), "--edited", str(edited), *files])
    return merge_commands(folder, programs, files, prefix)


def scene_and_small_one(objects, folder, programs, _rows):
    return {**scene(objects, 1, folder / "large", programs),
            **scene(30_000, 1, folder / "small", programs, prefix="small ")}


def page_of_scene(folder, programs, _rows):
    files = files_in(folder)
    page.scene_with_conflicts(programs, files)
    commands = merge_commands(folder, programs, files)
    return {**commands, "choice": partial(page.choices, programs, files, str(folder / "merged.vexel"))}


def list_files(kind, counts, folder, programs, _rows):
    commands = {}
    for count in counts:
        files = files_in(folder / str(count))
        for path, text in zip(files, lists.versions(kind, count)):
            with open(path, "w") as file:
                file.write(text)
        commands.update(merge_commands(folder / str(count), programs, files, f"{count} "))
    return commands


ONE_PERCENT = Setting(partial(scene, 30_000, 1))
TEN_PERCENT = Setting(partial(scene, 30_000, 10))
ALL_EDITED = Setting(partial(scene, 30_000, 100))
LARGE = Setting(partial(scene_and_small_one, 300_000))
LARGEST = Setting(partial(scene_and_small_one, 1_000_000), is_large=True)
# Both sides edit: one per cent of ten objects would be none.
PREFAB = Setting(partial(scene, 10, 20), repeats=10)
PAGE = Setting(page_of_scene)
KEYED = Setting(partial(list_files, "keyed", (10_000, 100_000)))
EQUAL = Setting(partial(list_files, "equal", (10_000,)))
UNEQUAL = Setting(partial(list_files, "unequal", (10_000,)))
GIT_MERGE = Setting(partial(git_settings.merges, 200, False))
GIT_CONFLICTS = Setting(partial(git_settings.merges, 200, True))
GIT_LOG = Setting(partial(git_settings.log, 1000))

ALL = [
    Row("merge", "30,000 objects, 1 % edited: merge / git merge-file", ONE_PERCENT, 0.35, "merge", "git"),
    Row("merge-cpu", "the same, user and system time", ONE_PERCENT, 0.6, "merge", "git", what="cpu"),
    Row("merge-floor", "merge / text floor", ONE_PERCENT, 2.0, "merge", "text floor"),
    Row("merge-memory", "peak memory / size of the three inputs", ONE_PERCENT, 1.5, "merge", "inputs", what="memory"),
    Row("safe", "merge --safe / merge", ONE_PERCENT, 1.3, "safe", "merge"),
    Row("choice", "20 conflicts more: a choice on the page / merge", PAGE, 0.5, "choice", "merge"),
    Row("strip", "strip / text floor of two files", ONE_PERCENT, 2.5, "strip", "text floor of two"),
    Row("diff", "diff / text floor of two files", ONE_PERCENT, 2.5, "diff", "text floor of two"),
    Row("report", "vexel-merge-report / merge", ONE_PERCENT, 1.5, "report", "merge"),
    Row("merge-10", "10 % edited: merge / git merge-file", TEN_PERCENT, 0.7, "merge", "git"),
    Row("merge-all", "every object edited on both sides: merge / libyaml floor", ALL_EDITED, 1.3, "merge",
        "libyaml floor"),
    Row("linear-300k", "300,000 objects: time an object / that at 30,000", LARGE, 1.15, "merge", "small merge",
        scale=10),
    Row("memory-300k", "300,000 objects: peak memory / size of the three inputs", LARGE, 1.5, "merge", "inputs",
        what="memory"),
    Row("linear-1M", "1,000,000 objects: time an object / that at 30,000", LARGEST, 1.15, "merge", "small merge",
        scale=1_000_000 / 30_000),
    Row("memory-1M", "1,000,000 objects: peak memory / size of the three inputs", LARGEST, 1.5, "merge", "inputs",
        what="memory"),
    Row("prefab", "prefab of 10 objects: merge / git merge-file", PREFAB, 1.3, "merge", "git"),
    Row("prefab-least", "limit: read three files, write one, wait for the disk", PREFAB, None, "least", "git"),
    Row("list-keyed", "100,000 elements with keys, moved and edited: time an element / at 10,000", KEYED, 1.5,
        "100000 merge", "10000 merge", scale=10),
    Row("list-equal", "10,000 equal elements without keys: seconds", EQUAL, 3, "10000 merge"),
    Row("list-unequal", "10,000 unequal elements without keys, all edited: seconds", UNEQUAL, 3, "10000 merge"),
    Row("git-merge", "git merge of 200 scenes: ms a file more than git's own", GIT_MERGE, 6, "vexel", "text",
        less=1000 / 200),
    *(Row(f"git-merge-{name}", f"limit: a driver that is {what}", GIT_MERGE, None, name, "text", less=1000 / 200)
      for name, what in (("shell", "a shell only"), ("copy", "a shell and a program that copies"),
                         ("ask", "the same, and asks git once"))),
    Row("git-conflicts", "the same, all with conflicts", GIT_CONFLICTS, 10, "vexel", "text", less=1000 / 200),
    Row("git-conflicts-ask", "limit: a driver that copies, and asks git three times", GIT_CONFLICTS, None, "ask thrice",
        "text", less=1000 / 200),
    Row("git-log-first", "git log -p of 1,000 versions, first time / without textconv", GIT_LOG, 5, "first",
        "plain"),
    Row("git-log-cat", "limit: the same with cat as textconv", GIT_LOG, None, "first with cat", "plain"),
    Row("git-log", "git log -p of 1,000 versions, later / without textconv", GIT_LOG, 1.5, "later", "plain"),
    Row("git-log-later-cat", "limit: the same with cat as textconv", GIT_LOG, None, "later with cat", "plain"),
]
