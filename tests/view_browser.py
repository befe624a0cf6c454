#!/usr/bin/env python3
# Settles conflicts on the page of the built program, in a real browser: view_browser.py <folder of the programs>

import json
import os
import subprocess
import sys
import tempfile
import time
from pathlib import Path

from browser import browser, expect

TYPES = Path(__file__).resolve().parent.parent / "examples" / "typeinfo.yaml"
FILES = ["base.vexel", "left.vexel", "right.vexel"]
HEADER = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n"
# Names and values that would take the page over if they became markup, or an attribute's end.
HOSTILE = r"""</script><script>document.title='taken'</script><img src=x onerror=\"document.title='taken'\">' \e[31m\x01"""


def lamp(number, intensity, extent="10", name="Lamp", colour="{r: 1, g: 1, b: 1, a: 1}"):
    return (f"--- !v!1 &{number}0\nGameObject:\n  m_Component:\n  - component: {{fileID: {number}1}}\n"
            f"  - component: {{fileID: {number}2}}\n  m_Name: \"{name}\"\n"
            f"--- !v!4 &{number}1\nTransform:\n  m_GameObject: {{fileID: {number}0}}\n"
            "  m_Children: []\n  m_Father: {fileID: 0}\n"
            f"--- !v!108 &{number}2\nLight:\n  m_GameObject: {{fileID: {number}0}}\n"
            f"  m_Color: {colour}\n  m_Intensity: {intensity}\n  m_Range: {extent}\n")


def mesh(has_filter, has_renderer):
    """An object with the one, the other or both of two components, of which the second needs the first."""
    components = [(number, kind) for number, kind, there in
                  ((92, "v!33 &92\nMeshFilter", has_filter), (93, "v!23 &93\nMeshRenderer", has_renderer)) if there]
    listed = "".join(f"  - component: {{fileID: {number}}}\n" for number, _ in components)
    return ("--- !v!1 &90\nGameObject:\n  m_Component:\n  - component: {fileID: 91}\n" + listed + "  m_Name: Boat\n"
            "--- !v!4 &91\nTransform:\n  m_GameObject: {fileID: 90}\n  m_Children: []\n  m_Father: {fileID: 0}\n"
            + "".join(f"--- !{kind}:\n  m_GameObject: {{fileID: 90}}\n" for _, kind in components))


def environment_in(programs, home):
    return {**os.environ, "PATH": f"{programs}:{os.environ['PATH']}", "HOME": str(home)}


class View:
    """The program that has been started, with the browser on its page."""

    def __init__(self, programs, page, folder, *command):
        self.programs, self.page, self.folder = programs, page, folder
        self.merged = folder / "merged.vexel"
        self.process = subprocess.Popen([programs / command[0], *command[1:]], cwd=folder, stdout=subprocess.PIPE,
                                        text=True, env=environment_in(programs, folder))
        page.call("url", url=self.process.stdout.readline().strip())
        page.wait("document.querySelector('#cards[aria-busy=false]') !== null")

    def text(self, selector):
        return self.page.script("return document.querySelector(arguments[0]).innerText", selector)

    def tile(self, path, side):
        return f'[data-path="{path}"] [data-choice={side}]'

    def open(self, count, what):
        self.page.wait(f"document.getElementById('pending').textContent === '{count}'", what)

    def taken(self):
        """Which side is taken, by path."""
        return self.page.script("return Object.fromEntries(Array.from(document.querySelectorAll('[data-path]'), row => ["
                                "row.dataset.path, row.querySelector('[aria-pressed=true]')?.dataset.choice ?? null]))")

    def ends_with(self, status, what):
        expect(what, self.process.wait(timeout=60), status)


def settled_by_hand(view, choices, *options):
    """What `merge` makes of the same files with these choices, by path."""
    record = "Conflict handling:\n" + "".join(f"{side} {path}\n" for path, side in choices.items())
    (view.folder / "choices").write_text(record)
    subprocess.run([f"{view.programs}/VexelYAMLMerge", "merge", "-h", "--fallback", "none", "--safe", "-i", "choices",
                    *options, *FILES, "by_hand.vexel"], cwd=view.folder, check=True, stdout=subprocess.DEVNULL)
    return (view.folder / "by_hand.vexel").read_bytes()


CONTROL, SHIFT = "\ue009", "\ue008"
LAMP, COLOUR, SECOND = "12.Light.m_Intensity", "12.Light.m_Color", "22.Light.m_Intensity"


def settle_and_save(bench):
    view = bench.start({"base": lamp(1, 2) + lamp(2, 5, name="Second"),
                  "left": lamp(1, 3, colour="{r: 1, g: 0.5, b: 0, a: 1}") + lamp(2, 6, 40, "Second"),
                  "right": lamp(1, 4, colour="{r: 0, g: 0, b: 1, a: 1}") + lamp(2, 7, name="Second")},
                 "--theirs", "Ben, wider")
    page = view.page
    view.open(3, "all are open at first")
    expect("nothing can be saved yet", page.script("return document.getElementById('save').disabled"), True)
    expect("who is behind theirs", "Ben, wider" in view.text("thead .theirs"), True)
    expect("the colour is seen", page.script(
        "return getComputedStyle(document.querySelector(arguments[0] + ' .swatch span')).backgroundColor",
        view.tile(COLOUR, "theirs")), "rgb(255, 128, 0)")

    expect("what a terminal calls it is there", page.script(
        "return document.querySelector(`[data-path='${arguments[0]}'] th`).title", COLOUR),
        f"Light.m_Color; in a terminal: --path '{COLOUR}'")

    page.keys([CONTROL, "s"])
    expect("which is said", view.text("#notice p"), "It can't be saved yet: 3 conflicts still open.")
    page.click(view.tile(LAMP, "theirs"))
    view.open(2, "a click settles")
    page.click(view.tile(LAMP, "theirs"))
    view.open(3, "the second click opens again")
    page.keys([CONTROL, "z"])
    view.open(2, "undone by key")
    page.click("#undo")
    view.open(3, "undone by click")
    page.keys([CONTROL, SHIFT, "z"])
    view.open(2, "done again")
    expect("what is said", view.text("#settled"), "1 of 3 settled")

    page.keys("n")
    page.keys("o")
    view.open(1, "a key settles the next open conflict")
    page.keys("n")
    page.keys("b")
    view.open(0, "and the last one")
    taken = view.taken()
    expect("the word for base is the column's", view.text(f'[data-path="{COLOUR}"] .badge'), "settled: before")
    expect("each has the side that was meant", taken, {LAMP: "theirs", SECOND: "ours", COLOUR: "base"})
    page.keys([SHIFT, "T"])
    page.wait(f"document.querySelector('[data-path=\"{COLOUR}\"] [aria-pressed=true]').dataset.choice === 'theirs'",
              "a key takes a side for the object")
    page.click("#undo")
    page.wait(f"document.querySelector('[data-path=\"{COLOUR}\"] [aria-pressed=true]').dataset.choice === 'base'")

    page.click("#save")
    view.ends_with(0, "the status once it is saved")
    page.wait("document.getElementById('end').checkVisibility()", "that it is saved is shown")
    words = {"theirs": "left", "ours": "right", "base": "base"}
    wanted = settled_by_hand(view, {path: words[side] for path, side in taken.items()})
    expect("what is saved", view.merged.read_bytes(), wanted)


def choices_for_many(bench):
    lamps = range(1, 8)
    view = bench.start({name: "".join(lamp(n, value, extent, f"Lamp {n}") for n in lamps)
                  for name, value, extent in (("base", 1, 10), ("left", 2, 20), ("right", 3, 30))})
    page = view.page
    view.open(14, "two conflicts a lamp")
    page.click('[data-card="10"][data-take=ours]')
    view.open(12, "a whole object")
    page.click(f'[data-path="{SECOND}"] .alike summary')
    page.click(f'[data-path="{SECOND}"] [data-take=theirs]')
    view.open(6, "all of a field, the settled one too")
    page.type("#text", "LAMP 7")
    page.wait("document.getElementById('shown').textContent === '1 of 7 objects'", "what is found")
    page.click("#rest [data-take=base]")
    view.open(5, "what is open among what is shown")
    page.click("#filters [type=reset]")
    page.click("#side option[value=both]")
    page.click("input[value=conflict]")
    page.wait("document.getElementById('shown').textContent === '5 of 7 objects'", "what is open")
    page.click("#filters [type=reset]")
    page.click("#rest [data-take=theirs]")
    view.open(0, "the rest")
    taken = view.taken()
    expect("what was taken", [taken[f"{n}2.Light.{field}"] for n in (1, 2, 7) for field in ("m_Intensity", "m_Range")],
           ["theirs", "ours", "theirs", "theirs", "theirs", "base"])
    for count in (5, 6, 12, 14):
        page.click("#undo")
        view.open(count, "each was one step")


def many_in_one_object(bench):
    """It is drawn in parts, which are one object all the same."""
    view = bench.start({name: "--- !v!114 &1\nMonoBehaviour:\n" + "".join(f"  field{n}: {value}\n" for n in range(250))
                  for name, value in (("base", 1), ("left", 2), ("right", 3))})
    page = view.page
    expect("every conflict is there", len(view.taken()), 250)
    page.keys("n")
    page.keys("k")
    page.keys("o")
    view.open(249, "the last one, which is before the first")
    expect("it keeps the focus", page.script("return document.activeElement.dataset.path"), "1.MonoBehaviour.field249")
    page.click("[data-card][data-take=theirs]")
    view.open(0, "all of the object")
    expect("each row shows it", set(view.taken().values()), {"theirs"})
    page.click("#undo")
    view.open(249, "and back")
    expect("each row shows that", [path for path, side in view.taken().items() if side], ["1.MonoBehaviour.field249"])


def what_a_choice_brings_up(bench):
    types = ["--typeInfo", TYPES]
    view = bench.start({"base": mesh(True, False), "left": mesh(False, False), "right": mesh(True, True)}, *types)
    page = view.page
    view.open(1, "the filter that is needed and gone")
    page.click(view.tile("92", "theirs"))
    page.wait("document.querySelector('tr.fresh') !== null", "another conflict is marked")
    view.open(1, "and counts")
    expect("it is said", "brought up 1 other conflict" in view.text("#notice"), True)
    page.click("#notice button")
    expect("and the way leads there", page.script("return document.activeElement.dataset.path"), "93")
    page.keys("t")
    view.open(0, "it can be settled, too")
    page.click("#save")
    view.ends_with(0, "the status of the two choices")
    expect("what is saved", view.merged.read_bytes(), settled_by_hand(view, {"92": "left", "93": "left"}, *types))


def give_up(bench):
    versions = {"base": lamp(1, 2), "left": lamp(1, 3), "right": lamp(1, 4)}
    view = bench.start(versions)
    view.page.click(view.tile(LAMP, "ours"))
    view.open(0, "settled")
    view.page.click("#give-up")
    view.page.click("#question [autofocus]")
    expect("it goes on where that was asked", view.process.poll(), None)
    view.page.click("#give-up")
    view.page.click("#question .danger")
    view.ends_with(1, "given up")
    expect("the file", view.merged.read_text(), "as it was\n")

    view = bench.start(versions)
    view.page.click(view.tile(LAMP, "ours"))
    view.open(0, "settled")
    view.page.call("refresh")
    view.page.wait("document.getElementById('pending').textContent === '0'", "it is there when the page is loaded again")
    view.page.call("url", url="about:blank")
    view.ends_with(1, "the page was left")
    expect("the file", view.merged.read_text(), "as it was\n")

    view = bench.start(versions)
    view.process.kill()
    view.page.wait("document.getElementById('cards').inert && document.querySelector('#notice.failure') !== null",
                   "that the program is gone is said")


def two_windows(bench):
    view = bench.start({"base": lamp(1, 2), "left": lamp(1, 3), "right": lamp(1, 4)})
    page = view.page
    page.click(view.tile(LAMP, "theirs"))
    view.open(0, "settled")
    page.script("return fetch('choose', {method: 'POST', headers: {'Content-Type': 'application/json'}, body: arguments[0]})"
                ".then(answer => answer.json())",
                json.dumps({"file": 0, "revision": 2, "choices": [{"path": LAMP, "choice": "ours"}]}))
    page.click("#save")
    page.wait("document.querySelector('#notice.failure') !== null", "the save of what is not shown is refused")
    expect("why", "Another window" in view.text("#notice"), True)
    expect("what the other window chose is shown", view.taken(), {LAMP: "ours"})
    expect("nothing is saved", view.merged.read_text(), "as it was\n")
    page.click("#save")
    view.ends_with(0, "saved")
    expect("what was shown is saved", "m_Intensity: 4" in view.merged.read_text(), True)


def hostile_values(bench):
    long = "x" * 100_000
    view = bench.start({"base": lamp(1, 2, name=HOSTILE), "left": lamp(1, f'"{HOSTILE}"', name=HOSTILE),
                  "right": lamp(1, long, name=HOSTILE)}, "--title", HOSTILE, "--theirs", HOSTILE)
    page = view.page
    view.open(1, "the conflict is there")
    expect("nothing of a file is markup or a script", page.script(
        "return [document.images.length, document.scripts.length, document.title === 'taken']"), [0, 1, False])
    expect("the name is text", "<script>document.title='taken'</script>" in view.text(".object h2"), True)
    expect("no control character comes through", page.script(
        r"return /[\x00-\x08\x0b-\x1f]/.test(document.body.textContent)"), False)
    page.click("td.ours .whole summary")
    page.wait("document.querySelector('td.ours pre').textContent.length === 100000", "all of a long value")
    page.click(view.tile(LAMP, "ours"))
    view.open(0, "it can be taken")
    page.click("#save")
    view.ends_with(0, "and saved")
    expect("the long value is in the file", long in view.merged.read_text(), True)


def from_conflict_to_commit(bench):
    """With git: everything from the merge that stops to the commit is clicked."""
    folder = bench.folder()
    environment = {**environment_in(bench.programs, folder), "GIT_AUTHOR_NAME": "Mara", "GIT_AUTHOR_EMAIL": "m@x.org",
                   "GIT_COMMITTER_NAME": "Mara", "GIT_COMMITTER_EMAIL": "m@x.org"}

    def git(*command, status=0):
        done = subprocess.run(["git", *command], cwd=folder, env=environment, capture_output=True, text=True)
        expect(f"git {command}: {done.stdout}{done.stderr}", done.returncode, status)
        return done.stdout

    def commit(intensity):
        (folder / "Harbour.vexel").write_text(HEADER + lamp(1, intensity))
        (folder / "Island.vexel").write_text(HEADER + lamp(1, intensity, 10 * intensity))
        git("add", ".")
        git("commit", "-q", "-m", f"Let it be {intensity}")

    git("init", "-q", "-b", "main")
    subprocess.run([bench.programs / "vexel-merge-git", "enable"], cwd=folder, env=environment, check=True,
                   stdout=subprocess.DEVNULL)
    commit(5)
    git("switch", "-q", "-c", "darker")
    commit(1)
    git("switch", "-q", "main")
    commit(7)
    git("merge", "--no-edit", "darker", status=1)

    view = bench.open(folder, "vexel-merge-git", "resolve", "--web", "--no-browser")
    page = view.page
    expect("both files are listed", page.script("return document.querySelectorAll('#files button').length"), 2)
    expect("the branch", "darker" in view.text("thead .theirs"), True)
    page.click(view.tile(LAMP, "theirs"))
    view.open(0, "the first file")
    page.click("#next-file")
    view.open(2, "the second one meanwhile")
    page.click("#give-up")
    expect("what would be lost is named", "What you chose for Harbour.vexel is lost" in view.text("#question"), True)
    page.click("#question [autofocus]")
    page.click("#files [data-file='0']")
    view.open(0, "the first file again")
    page.click("#save")
    view.open(2, "the next file comes up")
    page.click(view.tile(LAMP, "ours"))
    view.open(1, "the second file, in part")
    page.click("#keep")
    page.wait("document.getElementById('keep').disabled", "that is kept")
    expect("which is said", "1 of 2 settled" in view.text("#notice"), True)
    page.click(view.tile("12.Light.m_Range", "ours"))
    view.open(0, "all of it")
    page.call("url", url="about:blank")
    view.ends_with(1, "the window was closed")
    view = bench.open(folder, "vexel-merge-git", "resolve", "--web", "--no-browser")
    view.open(0, "it is found again, also what was chosen last")
    page.click("#save")
    view.ends_with(0, "all are saved")
    page.wait("document.getElementById('command').checkVisibility()", "it says how to go on")
    command = view.text("#command code").split()
    expect("by a command", command[0], "git")
    git(*command[1:], "--no-edit")
    expect("what is committed", [line for name in ("Harbour", "Island") for line in git("show", f"HEAD:{name}.vexel")
                                 .splitlines() if "Intensity" in line], ["  m_Intensity: 1", "  m_Intensity: 7"])

    view = bench.open(folder, "vexel-merge-git", "review", "--no-browser", "HEAD^^..HEAD")
    expect("what changed", [view.text(f".object {part}") for part in ("thead .base", "td.base", "thead .result", "td.result")],
           ["HEAD^^", "5", "HEAD", "1"])
    page.click("#next-file")
    page.wait("document.querySelector('td.result')?.innerText === '7'", "the other file")
    expect("there is nothing to choose", page.script(
        "return Array.from(document.querySelectorAll('[data-choice], [data-take], #save, #undo, #progress'))"
        ".filter(part => part.checkVisibility()).length"), 0)
    page.click("#give-up")
    view.ends_with(0, "it is closed")


class Bench:
    """Starts programs, each in a folder of its own, and ends what is left of them."""

    def __init__(self, programs, page, root):
        self.programs, self.page, self.root, self.views = programs, page, root, []

    def folder(self):
        folder = Path(self.root, str(len(self.views)))
        folder.mkdir()
        return folder

    def open(self, folder, *command):
        self.views.append(View(self.programs, self.page, folder, *command))
        return self.views[-1]

    def start(self, versions, *options):
        """The view on three versions of a scene."""
        folder = self.folder()
        for name, text in versions.items():
            (folder / f"{name}.vexel").write_text(HEADER + text)
        (folder / "merged.vexel").write_text("as it was\n")
        return self.open(folder, "vexel-merge-view", "--no-browser", *options, *FILES, "merged.vexel")


def main(programs):
    with tempfile.TemporaryDirectory(prefix="view") as root, browser(root) as page:
        bench = Bench(programs, page, root)
        try:
            for test in (settle_and_save, choices_for_many, many_in_one_object, what_a_choice_brings_up, give_up,
                         two_windows, hostile_values, from_conflict_to_commit):
                started = time.monotonic()
                test(bench)
                print(f"{test.__name__}: {time.monotonic() - started:.1f} s")
        finally:
            for view in bench.views:
                view.process.kill()


if __name__ == "__main__":
    main(Path(sys.argv[1]).resolve())
