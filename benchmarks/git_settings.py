"""Repositories with many scenes, and with many versions of one."""

import os
import re
import subprocess
from pathlib import Path

from processes import ENVIRONMENT, BrokenRun, run

OBJECTS = 56  # 30 KB
SIDES = ("base", "left", "right")


def git(folder, *arguments, **options):
    done = subprocess.run(["git", "-C", str(folder), *arguments], env=ENVIRONMENT, capture_output=True, **options)
    if done.returncode != 0:
        raise BrokenRun(f"git {' '.join(arguments)}: {done.stderr.decode(errors='replace')}")
    return done.stdout


def make_repository(folder, programs, patterns=None):
    git(folder.parent, "init", "-q", "-b", "main", str(folder))
    if patterns:
        run([programs.git_helper, "enable", "--patterns", patterns], folder=folder)


def scene_text(programs, folder, seed):
    paths = [str(folder / side) for side in SIDES]
    run([programs.make_scene, "--objects", str(OBJECTS), "--edited", "0", "--seed", str(seed), *paths])
    return Path(paths[0]).read_bytes()


def with_layer(text, index, layer):
    """The scene with another layer in its game object number `index`."""
    found = list(re.finditer(rb"(?<=  m_Layer: )\d+", text))[index]
    return text[:found.start()] + b"%d" % layer + text[found.end():]


def versions_of(text, in_conflict):
    return text, with_layer(text, 0, 20), with_layer(text, 0 if in_conflict else -1, 21)


def drivers(programs, in_conflict):
    """Drivers that show what a merge costs whatever is merged, in the form that ours has."""
    end = f"; exit {int(in_conflict)}; }}; f %O %A %B"
    copy = f'"$2" "$1" "$3" "$2"{end}'
    return {"shell": f"f() {{ true{end}",
            "copy": f"f() {{ {programs.least_work} {copy}",
            "ask": f"f() {{ {programs.least_work} --ask-git {copy}",
            "ask thrice": f"f() {{ {programs.least_work} --ask-git --ask-git --ask-git {copy}"}


def merges(count, in_conflict, folder, programs, rows):
    """`count` changed scenes, merged by git's text merge in one repository and by another driver in each other."""
    scenes = [versions_of(scene_text(programs, folder, seed), in_conflict) for seed in range(count)]
    least = drivers(programs, in_conflict)
    commands = {}
    for name in dict.fromkeys(name for row in rows for name in row.commands()):
        repository = folder / name
        make_repository(repository, programs, None if name == "text" else "*.vexel")
        if name in least:
            git(repository, "config", "merge.vexel.driver", least[name])
        for side, branch in enumerate(("main", "theirs", "ours")):
            if side:
                git(repository, "checkout", "-q", "-b", branch, "main")
            for number, texts in enumerate(scenes):
                (repository / f"{number}.vexel").write_bytes(texts[side])
            git(repository, "add", "-A")
            git(repository, "commit", "-q", "-m", branch)
        commands[name] = lambda repository=repository: merge_once(repository, in_conflict)
    return commands


def merge_once(repository, in_conflict):
    git(repository, "reset", "-q", "--hard", "ours")
    git(repository, "clean", "-qfdx")
    result = run(["git", "merge", "-q", "-m", "merged", "theirs"], (1,) if in_conflict else (0,), folder=repository)
    unmerged = set(git(repository, "ls-files", "-u", "-z").split(b"\0")[:-1])
    if bool(unmerged) != in_conflict:
        raise BrokenRun(f"{len(unmerged)} entries are unmerged in {repository}")
    git(repository, "checkout", "-q", "-f", "-B", "ours", "ORIG_HEAD")
    return result


def log(count, folder, programs, _rows):
    """`git log -p` of one scene: without our textconv, with it and nothing cached, and with all cached."""
    repository = folder / "log"
    make_repository(repository, programs, "*.vexel")
    attributes = (repository / ".gitattributes").read_bytes()
    text = scene_text(programs, folder, 1)
    stream = [file_of_commit(".gitattributes", attributes, 0)]
    for version in range(1, count + 1):
        text = with_layer(text, version % 9, version)
        stream.append(file_of_commit("scene.vexel", text, version))
    git(repository, "fast-import", "--quiet", input=b"".join(stream))
    git(repository, "reset", "-q", "--hard", "main")

    def show(*options):
        return run(["git", *options, "main", "--", "scene.vexel"], folder=repository)

    def show_with_empty_cache(*options):
        for note in git(repository, "for-each-ref", "--format=%(refname)", "refs/notes/textconv/").split():
            git(repository, "update-ref", "-d", os.fsdecode(note))
        return show(*options)

    cat = ("-c", "diff.vexel.textconv=cat", "log", "-p")
    return {"plain": lambda: show("log", "-p", "--no-textconv"),
            "first": lambda: show_with_empty_cache("log", "-p"), "later": lambda: show("log", "-p"),
            "first with cat": lambda: show_with_empty_cache(*cat), "later with cat": lambda: show(*cat)}


def file_of_commit(name, text, time):
    return (b"commit refs/heads/main\ncommitter Compare <compare@example.com> %d +0000\ndata 0\n"
            b"M 100644 inline %s\ndata %d\n%s\n") % (1_700_000_000 + time, name.encode(), len(text), text)
