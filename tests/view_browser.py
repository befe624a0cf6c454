#!/usr/bin/env python3
# Settles conflicts on the page of the built program, in a real browser: view_browser.py <folder of the programs>

import subprocess
import sys
import tempfile
import time
from contextlib import contextmanager
from pathlib import Path

from browser import browser, expect

TYPES = Path(__file__).resolve().parent.parent / "examples" / "typeinfo.yaml"
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


class View:
    """The program, started on three versions of a scene, with the browser on its page."""

    def __init__(self, programs, page, folder, versions, *options):
        self.programs, self.page, self.folder = programs, page, Path(folder)
        for name, text in versions.items():
            (self.folder / f"{name}.vexel").write_text(HEADER + text)
        self.merged = self.folder / "merged.vexel"
        self.merged.write_text("as it was\n")
        self.files = ["base.vexel", "left.vexel", "right.vexel"]
        self.process = subprocess.Popen([f"{programs}/vexel-merge-view", "--no-browser", *options, *self.files,
                                         self.merged], cwd=folder, stdout=subprocess.PIPE, text=True)
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
                    *options, *view.files, "by_hand.vexel"], cwd=view.folder, check=True, stdout=subprocess.DEVNULL)
    return (view.folder / "by_hand.vexel").read_bytes()


CONTROL, SHIFT = "\ue009", "\ue008"
LAMP, COLOUR, SECOND = "12.Light.m_Intensity", "12.Light.m_Color", "22.Light.m_Intensity"


def settle_and_save(start):
    view = start({"base": lamp(1, 2) + lamp(2, 5, name="Second"),
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


def choices_for_many(start):
    lamps = range(1, 8)
    view = start({name: "".join(lamp(n, value, extent, f"Lamp {n}") for n in lamps)
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


def many_in_one_object(start):
    """It is drawn in parts, which are one object all the same."""
    view = start({name: "--- !v!114 &1\nMonoBehaviour:\n" + "".join(f"  field{n}: {value}\n" for n in range(250))
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


def what_a_choice_brings_up(start):
    types = ["--typeInfo", TYPES]
    view = start({"base": mesh(True, False), "left": mesh(False, False), "right": mesh(True, True)}, *types)
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


def give_up(start):
    versions = {"base": lamp(1, 2), "left": lamp(1, 3), "right": lamp(1, 4)}
    view = start(versions)
    view.page.click(view.tile(LAMP, "ours"))
    view.open(0, "settled")
    view.page.click("#give-up")
    view.page.click("#question [autofocus]")
    expect("it goes on where that was asked", view.process.poll(), None)
    view.page.click("#give-up")
    view.page.click("#question .danger")
    view.ends_with(1, "given up")
    expect("the file", view.merged.read_text(), "as it was\n")

    view = start(versions)
    view.page.call("url", url="about:blank")
    view.ends_with(1, "the page was left")
    expect("the file", view.merged.read_text(), "as it was\n")

    view = start(versions)
    view.process.kill()
    view.page.wait("document.getElementById('cards').inert && document.querySelector('#notice.failure') !== null",
                   "that the program is gone is said")


def hostile_values(start):
    long = "x" * 100_000
    view = start({"base": lamp(1, 2, name=HOSTILE), "left": lamp(1, f'"{HOSTILE}"', name=HOSTILE),
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


def main(programs):
    with tempfile.TemporaryDirectory(prefix="view") as root, browser(root) as page:
        views = []

        def start(versions, *options):
            folder = Path(root, str(len(views)))
            folder.mkdir()
            views.append(View(programs, page, folder, versions, *options))
            return views[-1]

        try:
            for test in (settle_and_save, choices_for_many, many_in_one_object, what_a_choice_brings_up, give_up,
                         hostile_values):
                started = time.monotonic()
                test(start)
                print(f"{test.__name__}: {time.monotonic() - started:.1f} s")
        finally:
            for view in views:
                view.process.kill()


if __name__ == "__main__":
    main(Path(sys.argv[1]).resolve())
