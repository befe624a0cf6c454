#!/usr/bin/env python3
# Makes the page of a merge and uses it in a real browser, through its WebDriver:
#   report_in_browser.py <vexel-merge-report>

import json
import subprocess
import sys
import tempfile
from pathlib import Path

from browser import browser, expect

# A name that would take the page over if it became markup in a text, an attribute or the script.
HOSTILE = "</script><script>document.title='taken'</script><img src=x onerror=\"document.title='taken'\">'\""


def scene(intensity, extent, lamps, name=HOSTILE):
    """A lamp with a light, on a pier, and further lamps of these file IDs."""
    text = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n"
    text += "--- !v!1 &10\nGameObject:\n  m_Component:\n  - component: {fileID: 11}\n"
    text += f"  - component: {{fileID: 12}}\n  m_Name: {json.dumps(name)}\n"
    text += "--- !v!4 &11\nTransform:\n  m_GameObject: {fileID: 10}\n  m_Father: {fileID: 21}\n"
    text += f"--- !v!108 &12\nLight:\n  m_GameObject: {{fileID: 10}}\n  m_Intensity: {intensity}\n  m_Range: {extent}\n"
    text += "--- !v!1 &20\nGameObject:\n  m_Component:\n  - component: {fileID: 21}\n  m_Name: Pier\n"
    text += "--- !v!4 &21\nTransform:\n  m_GameObject: {fileID: 20}\n  m_Father: {fileID: 0}\n"
    return text + "".join(f"--- !v!108 &{lamp}\nLight:\n  m_Range: {lamp}\n" for lamp in lamps)


def shown(page):
    """The file IDs of the objects that can be seen, and what the page says about their number."""
    seen = page.script("return Array.from(document.querySelectorAll('section.object'))"
                       ".filter(e => e.checkVisibility()).map(e => e.dataset.fileId).sort()")
    return seen, page.script("return document.getElementById('shown').textContent")


def main(reporter):
    with tempfile.TemporaryDirectory(prefix="report") as folder:
        versions = {"base": scene(2, 10, [31]), "left": scene(3, 40, [31, 32]), "right": scene(5, 10, [33])}
        for name, text in versions.items():
            Path(folder, name).write_text(text)
        subprocess.run([reporter, "-o", "page.html", "--title", HOSTILE, *versions], cwd=folder, check=True)
        with browser(folder) as page:
            page.call("url", url=f"file://{folder}/page.html")
            expect("the title is the text that was given", page.script("return document.title"), HOSTILE)
            expect("nothing of a file is markup", page.script(
                "return [document.scripts.length, document.images.length]"), [1, 0])
            expect("the object's name and place", page.script(
                "return document.querySelector('[data-file-id=\"12\"] h2').textContent.includes(arguments[0])",
                f"Pier/{HOSTILE}"), True)
            row = page.script("return Array.from(document.querySelectorAll('[data-path=\"Light.m_Intensity\"] td'))"
                              ".slice(0, 4).map(e => e.textContent.trim())")
            expect("base, left, right and result of the conflict", row, ["2", "3", "5", "2"])

            subprocess.run([reporter, "-o", "committed.html", "--committed", "left", *versions], cwd=folder, check=True)
            page.call("window/rect", width=1300, height=900)
            page.call("url", url=f"file://{folder}/committed.html")
            columns = page.script("return Array.from(document.querySelectorAll('[data-file-id=\"12\"] thead th'), e => e.offsetWidth)")
            expect("each of the columns of a finished merge has room", [width for width in columns if width < 100], [])
            page.call("url", url=f"file://{folder}/page.html")

            expect("at first", shown(page), (["12", "31", "32", "33"], "4 of 4 objects"))
            page.click("input[name=kind][value=conflict]")
            expect("conflicts", shown(page), (["12"], "1 of 4 objects"))
            page.click("input[name=kind][value=removed]")
            expect("conflicts and what was removed", shown(page), (["12", "31"], "2 of 4 objects"))
            page.click("button[type=reset]")
            expect("after the reset", shown(page)[1], "4 of 4 objects")
            page.click("#side option[value=left]")
            expect("left's changes", shown(page)[0], ["12", "32"])
            page.click("#side option[value=both]")
            expect("changes of both", shown(page)[0], ["12"])
            page.click("#side option[value=all]")
            page.type("#text", "LIGHT 33")
            expect("a text, whatever its case", shown(page)[0], ["33"])
            page.type("#text", "nowhere")
            expect("no object", shown(page)[1], "0 of 4 objects")
            expect("and it is said", page.script("return document.getElementById('nothing').checkVisibility()"), True)


if __name__ == "__main__":
    main(*sys.argv[1:])
    print("the page works in the browser")
