#!/usr/bin/env python3
# Settles the conflicts of git, Mercurial and the merge command by the requests that the page makes:
#   git_on_page.py PROGRAM
# As the browser that these start (git_on_page.py --browser ANSWERS ADDRESS) it takes each side named in ANSWERS.

import atexit
import http.client
import json
import os
import subprocess
import sys
import tempfile
import urllib.request
from pathlib import Path

from browser import expect

SCENE = """%YAML 1.1
%TAG !v! tag:vexel.com,2011:
--- !v!1 &10
GameObject:
  m_Component:
  - component: {{fileID: 11}}
  m_Name: Lamp
--- !v!108 &11
Light:
  m_GameObject: {{fileID: 10}}
  m_Intensity: {}
  m_Range: {}
"""


class Page:
    def __init__(self, address):
        self.address = address.strip().rstrip("/")

    def state(self, file=0):
        return json.load(urllib.request.urlopen(f"{self.address}/state?file={file}", timeout=60))

    def summary(self, file):
        return json.load(urllib.request.urlopen(f"{self.address}/summary?file={file}", timeout=60))

    def post(self, what, **body):
        host, secret = self.address.removeprefix("http://").split("/")
        connection = http.client.HTTPConnection(host, timeout=60)
        connection.request("POST", f"/{secret}/{what}", json.dumps(body), {"Content-Type": "application/json"})
        answer = connection.getresponse()
        return answer.status, json.loads(answer.read() or b"{}")

    def save(self, file=0):
        return self.post("save", file=file, revision=self.state(file)["revision"])

    def choose(self, row, side):
        choices = [{"path": row["path"], "choice": side}]
        expect("a choice", self.post("choose", file=0, revision=self.state()["revision"], choices=choices)[0], 200)

    def take(self, side, file=0):
        state = self.state(file)
        rows = [row for card in state["cards"] for part in card["objects"] for row in part["rows"] if row["pending"]]
        choices = [{"path": row["path"], "choice": side} for row in rows]
        expect("a choice", self.post("choose", file=file, revision=state["revision"], choices=choices)[0], 200)


def settle_as_browser(side, address):
    # The first address leads to the page's own.
    page = Page(urllib.request.urlopen(address, timeout=60).geturl())
    page.take(side)
    status, answer = page.save()
    with Path(os.environ["HOME"], "next").open("a") as said:
        said.write(answer.get("next_step", {}).get("command") or "git goes on")
        said.write("\n")
    if status != 200:
        page.post("give-up")


def run(*command, status=0, **env):
    # Git asks for a return before a tool that it has chosen itself.
    done = subprocess.run(command, env={**os.environ, **env}, input="\n", capture_output=True, text=True, timeout=40)
    if (done.returncode == 0) != (status == 0):
        sys.exit(f"{command} ended with {done.returncode}: {done.stdout}{done.stderr}")
    return done.stdout


def opened(*command):
    process = subprocess.Popen(["vexel-merge-git", *command, "--no-browser"], stdout=subprocess.PIPE, text=True)
    atexit.register(process.kill)
    return process, Page(process.stdout.readline())


def write(intensity, reach, *files):
    for file in files:
        Path(file).write_text(SCENE.format(intensity, reach))


def commit(branch, intensity, reach, *files):
    run("git", "checkout", "-q", "-B", branch, "start")
    write(intensity, reach, *files)
    Path("notes.txt").write_text(branch)
    run("git", "commit", "-q", "-a", "-m", branch)


def conflict():
    run("git", "reset", "-q", "--hard")
    run("git", "merge", "-q", "theirs", status=1)


def is_unmerged(file):
    return run("git", "ls-files", "-u", "--", file) != ""


def check_resolve():
    conflict()
    process, page = opened("resolve", "--web")
    state = page.state()
    expect("the sides", state["names"], {"base": "", "theirs": "Test, theirs", "ours": "Test, ours"})
    expect("the files", [file["title"] for file in state["files"]], ["A.vexel", "B.vexel"])
    expect("what is saved too early", page.save()[0], 409)
    page.take("theirs")
    expect("the next file", page.save(), (200, {"saved": True, "next": 1, "unread": []}))
    expect("what is still in conflict", [is_unmerged(file) for file in ("A.vexel", "B.vexel")], [False, True])
    page.take("ours", file=1)
    write(7, 7, "B.vexel")
    status, answer = page.save(1)
    expect("a save over edits", (status, "edited by hand" in answer["error"]), (409, True))
    expect("the edited file", Path("B.vexel").read_text(), SCENE.format(7, 7))
    run("git", "checkout", "-q", "-m", "--", "B.vexel")
    status, answer = page.save(1)
    expect("a save without them", status, 200)
    step = answer["next_step"]
    expect("what else is in conflict", ("in notes.txt," in step["text"], step["command"]), (True, "git status"))
    expect("the end", process.wait(30), 0)
    run("git", "add", "notes.txt")
    run("git", "commit", "-q", "-m", "merged")
    expect("what is committed", [Path(file).read_text() for file in ("A.vexel", "B.vexel")],
           [SCENE.format(4, 10), SCENE.format(9, 10)])
    run("git", "reset", "-q", "--hard", "HEAD~")
    conflict()
    expect("what was chosen, when it comes again", Path("A.vexel").read_text(), SCENE.format(4, 10))
    process, page = opened("resolve", "--web", "A.vexel")
    expect("what is left to do", page.state()["pending"], 0)
    status, answer = page.post("give-up")
    expect("what is left", (answer["left"], answer["next_step"]["command"]),
           (["A.vexel"], "vexel-merge-git resolve 'A.vexel'"))
    expect("giving up", process.wait(30), 1)
    expect("the file that was given up", is_unmerged("A.vexel"), True)


# What is settled can be kept without the rest: by its button, in giving up, and when the page is closed.
def check_keeping():
    run("git", "config", "rerere.enabled", "false")
    run("git", "reset", "-q", "--hard")
    commit("more", 5, 50, "A.vexel")
    commit("less", 1, 20, "A.vexel")
    run("git", "merge", "-q", "more", status=1)
    process, page = opened("resolve", "--web", "A.vexel")
    rows = [lamp(page.state(), field) for field in ("m_Intensity", "m_Range")]
    page.choose(rows[0], "theirs")
    expect("what isn't saved", page.state()["files"][0]["unsaved"], True)
    status, answer = page.post("keep", file=0, revision=page.state()["revision"])
    expect("what is kept", (status, answer["pending"], answer["files"][0]["unsaved"]), (200, 1, False))
    expect("the file", (Path("A.vexel").read_text(), is_unmerged("A.vexel")), (SCENE.format(5, 10), True))
    page.choose(rows[1], "base")
    page.post("give-up")
    expect("giving up the rest", process.wait(30), 1)
    process, page = opened("resolve", "--web")
    expect("what is found again", [lamp(page.state(), row["field"]).get("choice") for row in rows], ["theirs", None])
    page.choose(rows[0], "ours")
    page.post("give-up", keep=True)
    expect("giving up, but keeping", (process.wait(30), Path("A.vexel").read_text()), (1, SCENE.format(1, 10)))
    process, page = opened("resolve", "--web")
    page.choose(rows[1], "theirs")
    with urllib.request.urlopen(f"{page.address}/events", timeout=60):
        page.post("bye")
    expect("a page that is closed", (process.wait(30), Path("A.vexel").read_text()), (1, SCENE.format(1, 50)))
    expect("it is not staged unasked", is_unmerged("A.vexel"), True)
    process, page = opened("resolve", "--web")
    write(7, 7, "A.vexel")
    page.choose(rows[1], "ours")
    expect("what would lose edits is not kept", page.post("give-up", keep=True)[0], 409)
    write(1, 50, "A.vexel")
    page.choose(rows[1], "theirs")
    expect("what was kept can be saved", (page.save()[0], process.wait(30), is_unmerged("A.vexel")), (200, 0, False))


def check_going_on():
    run("git", "config", "rerere.enabled", "false")
    for command, wanted in (("rebase", "git rebase --continue"), ("cherry-pick", "git cherry-pick --continue")):
        run("git", "reset", "-q", "--hard")
        run("git", "checkout", "-q", "-B", "moved", "ours")
        run("git", command, "theirs", status=1)
        run("git", "checkout", "-q", "--ours", "notes.txt")
        run("git", "add", "notes.txt")
        process, page = opened("resolve", "--web")
        if command == "cherry-pick":
            expect("the picked commit's subject", page.state()["names"]["theirs"], '"theirs"')
        expect("conflicts of files not yet read", [file["pending"] for file in page.state()["files"]], [1, 1])
        page.take("theirs")
        page.save()
        page.take("theirs", file=1)
        expect(f"how a {command} goes on", page.save(1)[1]["next_step"]["command"], wanted)
        process.wait(30)
        run("git", *wanted.split()[1:], GIT_EDITOR="true")


def check_what_cannot_be_shown():
    for branch, value in (("adds", 3), ("also", 4)):
        run("git", "checkout", "-q", "-f", "-B", branch, "start")
        write(value, 10, "B.vexel", "C.vexel")
        run("git", "add", "-A")
        run("git", "commit", "-q", "-m", branch)
    run("git", "merge", "-q", "adds", status=1)
    process, page = opened("resolve", "--web")
    told = page.state()["not_shown"]
    expect("both added it", [text.startswith("both sides have added C.vexel; take one: ") for text in told], [True])
    page.take("theirs")
    expect("it is left to do", "what is left, in C.vexel," in page.save()[1]["next_step"]["text"], True)
    expect("the end with something left", process.wait(30), 1)


def lamp(state, field):
    rows = [row for card in state["cards"] for part in card["objects"] for row in part["rows"]]
    return next(row for row in rows if row["field"] == field)


def check_hand_edits():
    run("git", "config", "rerere.enabled", "false")
    conflict()
    write(77, 10, "A.vexel")
    process, page = opened("resolve", "--web", "A.vexel")
    state = page.state()
    row = lamp(state, "m_Intensity")
    expect("a conflict that was settled by hand",
           (state["pending"], row["state"], row["result"]["text"], "path" in row, state["notes"]),
           (0, "settled by hand", "77", False, ["Edits made by hand are kept: Lamp"]))
    expect("its save", page.save()[0], 200)
    expect("the end", process.wait(30), 0)
    expect("what is staged", run("git", "show", ":A.vexel"), SCENE.format(77, 10))

    conflict()
    process, page = opened("resolve", "--web", "A.vexel")
    page.take("base")
    write(77, 10, "A.vexel")
    for what, words in (("shown", "save again to keep that, too: Lamp"), ("kept by a choice", "m_Intensity was edited by hand")):
        status, answer = page.save()
        expect(f"an edit that isn't {what}", (status, words in answer["error"], is_unmerged("A.vexel")), (409, True, True))
    write(2, 11, "A.vexel")
    expect("another edit", page.save()[0], 409)
    expect("which is kept now", page.save()[0], 200)
    expect("what is staged", run("git", "show", ":A.vexel"), SCENE.format(2, 11))
    process.wait(30)
    run("git", "config", "rerere.enabled", "true")


def check_unreadable():
    run("git", "reset", "-q", "--hard")
    for branch, value, end in (("sound", 5, ""), ("broken", 8, "  m_Name: [\n")):
        run("git", "checkout", "-q", "-B", branch, "start")
        write(value, 10, "A.vexel", "B.vexel")
        Path("A.vexel").write_text(Path("A.vexel").read_text() + end)
        run("git", "commit", "-q", "-a", "-m", branch)
    run("git", "merge", "-q", "sound", status=1)
    process, page = opened("resolve", "--web")
    state = page.state("")
    expect("what is shown first", (state["title"], state["pending"]), ("B.vexel", 1))
    state = page.state(0)
    expect("a file that can't be read", (state["cards"], state["error"] == ""), ([], False))
    expect("it goes by the name that people know", ("'A.vexel (ours)'" in state["error"], "/" in state["error"]),
           (True, False))
    page.take("theirs", file=1)
    status, answer = page.save(1)
    expect("the other file is saved", (status, answer["next"], len(answer["unread"])), (200, None, 1))
    expect("the end with a file that can't be read", process.wait(30), 1)
    expect("what is still in conflict", [is_unmerged(file) for file in ("A.vexel", "B.vexel")], [True, False])


def said_next():
    said = Path(os.environ["HOME"], "next")
    lines = said.read_text().splitlines()
    said.unlink()
    return lines


def check_mergetool(browser):
    run("git", "config", "rerere.enabled", "false")
    conflict()
    tool = ("git", "-c", "mergetool.keepBackup=false", "mergetool", "--no-prompt")
    page = {"DISPLAY": ":none", "BROWSER": f"{browser} theirs"}
    run(*tool, "B.vexel", **page)
    expect("how to go on where git has opened the last of the named files", said_next(), ["vexel-merge-git resolve"])
    expect("the file", (Path("B.vexel").read_text(), is_unmerged("B.vexel")), (SCENE.format(4, 10), False))
    run(*tool, "A.vexel", status=1, GIT_EDITOR="true", CI="true", **page)
    expect("a file on a build server", is_unmerged("A.vexel"), True)
    vim = Path(os.environ["HOME"], "bin", "vim")
    vim.parent.mkdir()
    vim.write_text("#!/bin/sh\nfor merged; do :; done\necho settled >\"$merged\"\n")
    vim.chmod(0o755)
    run(*tool, "notes.txt", EDITOR="vim", PATH=f"{vim.parent}:{os.environ['PATH']}")
    expect("a file of another kind", (Path("notes.txt").read_text(), is_unmerged("notes.txt")), ("settled\n", False))
    conflict()
    run("git", "add", "notes.txt")
    run(*tool, **page)
    expect("how to go on where git opens another one", said_next(), ["git goes on", "git commit"])


def check_review():
    run("git", "reset", "-q", "--hard")
    run("git", "rm", "-q", "B.vexel")
    write(1, 1, "New.vexel")
    run("git", "add", "-A")
    run("git", "commit", "-q", "-m", "new")
    process, page = opened("review", "start...HEAD")
    state = page.state()
    expect("the mode", (state["mode"], state["names"]), ("review", {"base": "before HEAD", "result": "HEAD"}))
    expect("the changed files", [file["title"] for file in state["files"]], ["A.vexel", "B.vexel", "New.vexel"])
    expect("what is known of a file that isn't read", "objects" in state["files"][2], False)
    expect("what happened in the files", [page.summary(file)["objects"] for file in range(3)],
           [{"added": 0, "changed": 1, "removed": 0}, {"added": 0, "changed": 0, "removed": 1},
            {"added": 1, "changed": 0, "removed": 0}])
    row = state["cards"][0]["objects"][0]["rows"][0]
    expect("a change", (row["field"], row["base"]["text"], row["result"]["text"]), ("m_Intensity", "2", "9"))
    for file, kind in ((1, "removed"), (2, "added")):
        expect(f"a file that was {kind}", kind in page.state(file)["cards"][0]["kinds"], True)
    expect("a choice", page.post("choose", file=0, revision=1, choices=[])[0], 409)
    page.post("give-up")
    expect("the end of a review", process.wait(30), 0)
    run("vexel-merge-git", "review", "HEAD", status=1)


def check_others(browser):
    page = {"DISPLAY": ":none", "BROWSER": f"{browser} ours"}
    for name, values in (("base", (2, 10)), ("left", (4, 20)), ("right", (9, 10))):
        write(*values, f"{name}.vexel")
    merge = ("VexelYAMLMerge", "merge", "-h", "--safe", "base.vexel", "left.vexel", "right.vexel", "out.vexel")
    run(*merge, status=1, CI="true", TERM="dumb", **page)
    run(*merge[:4], "-o", "record", *merge[4:], **page)
    expect("the result of the default tools", Path("out.vexel").read_text(), SCENE.format(9, 20))
    expect("its record", "Right 11.Light.m_Intensity\n" in Path("record").read_text(), True)
    run("hg", "init", "hg")
    os.chdir("hg")
    for name in ("base", "left", "right"):
        Path("H.vexel").write_bytes(Path(f"../{name}.vexel").read_bytes())
        run("hg", "commit", "-q", "-A", "-m", name)
        run("hg", "update", "-q", "0")
    run("hg", "update", "-q", "2")
    run("hg", "merge", "1", status=1)
    run("hg", "resolve", "--tool", "vexel-page", "H.vexel", **page)
    expect("the result with Mercurial", Path("H.vexel").read_text(), SCENE.format(9, 20))


def main():
    program, project = Path(sys.argv[1]).resolve(), Path(__file__).resolve().parent.parent
    for name in list(os.environ):
        if name.startswith(("GIT_", "HG", "SSH_")) or name in ("DISPLAY", "WAYLAND_DISPLAY", "CI", "VISUAL", "EDITOR"):
            del os.environ[name]
    with tempfile.TemporaryDirectory() as folder:
        who = {f"GIT_{role}_{what}": "Test" for role in ("AUTHOR", "COMMITTER") for what in ("NAME", "EMAIL")}
        os.environ.update(who, HOME=folder, PATH=f"{program.parent}:{os.environ['PATH']}", GIT_CONFIG_NOSYSTEM="1",
                          HGRCPATH=str(project / "integrations/mercurial/hgrc"), HGUSER="Test")
        browser = Path(folder, "browser")
        browser.write_text(f'#!/bin/sh\nexec "{sys.executable}" "{Path(__file__).resolve()}" --browser "$@"\n')
        browser.chmod(0o755)
        run("git", "init", "-q", "-b", "start", f"{folder}/repository")
        os.chdir(f"{folder}/repository")
        run("vexel-merge-git", "enable")
        run("git", "config", "rerere.enabled", "true")
        write(2, 10, "A.vexel", "B.vexel")
        Path("notes.txt").write_text("start")
        run("git", "add", "-A")
        run("git", "commit", "-q", "-m", "start")
        commit("theirs", 4, 10, "A.vexel", "B.vexel")
        commit("ours", 9, 10, "A.vexel", "B.vexel")
        check_resolve()
        check_hand_edits()
        check_unreadable()
        check_keeping()
        check_going_on()
        check_what_cannot_be_shown()
        run("git", "reset", "-q", "--hard")
        run("git", "checkout", "-q", "ours")
        check_mergetool(browser)
        check_review()
        os.chdir(folder)
        check_others(browser)
        os.chdir("/")


if sys.argv[1] == "--browser":
    settle_as_browser(sys.argv[2], sys.argv[3])
else:
    main()
