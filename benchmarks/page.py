"""A scene with conflicts that is settled on the page, choice by choice."""

import http.client
import json
import re
import subprocess
import time
from pathlib import Path

from processes import ENVIRONMENT, BrokenRun, Run, median, run

CONFLICTS = 20
NAME = re.compile(r"\n  m_Name: ([A-Za-z][A-Za-z0-9 ]*)\n")


def documents(path):
    return re.split(r"(?m)^(?=--- )", Path(path).read_text())


def scene_with_conflicts(programs, files):
    """Both sides rename some objects that neither of them has touched."""
    run([programs.make_scene, "--objects", "30000", "--edited", "1", *files])
    base, left, right = map(documents, files)
    in_both = set(left) & set(right)
    named = [text for text in base if text in in_both and NAME.search(text)]
    for text in named[::len(named) // CONFLICTS][:CONFLICTS]:
        for side, word in ((left, "theirs"), (right, "ours")):
            side[side.index(text)] = NAME.sub(rf"\n  m_Name: \1 of {word}\n", text)
    for path, side in zip(files[1:], (left, right)):
        Path(path).write_text("".join(side))


def choices(programs, files, merged):
    """What one choice takes, with the answer to the page: the median of one choice a conflict."""
    view = subprocess.Popen([programs.view, "--no-browser", "--", *files, merged], stdout=subprocess.PIPE, text=True,
                            env=ENVIRONMENT)
    try:
        host, secret = view.stdout.readline().strip().removeprefix("http://").rstrip("/").split("/")
        connection = http.client.HTTPConnection(host, timeout=60)

        def ask(method, place, body=None):
            connection.request(method, f"/{secret}/{place}", body, {"Content-Type": "application/json"})
            answer = connection.getresponse()
            text = answer.read()
            if answer.status != 200:
                raise BrokenRun(f"{place} on the page: {answer.status} {text[:200]}")
            return json.loads(text)

        state = ask("GET", "state")
        rows = [row for card in state["cards"] for part in card["objects"] for row in part["rows"]]
        times = []
        revision = state["revision"]
        for row in (row for row in rows if row["pending"]):
            body = json.dumps({"file": 0, "revision": revision, "choices": [{"path": row["path"], "choice": "ours"}]})
            begin = time.perf_counter()
            revision = ask("POST", "choose", body)["revision"]
            times.append(time.perf_counter() - begin)
        if len(times) < CONFLICTS:
            raise BrokenRun(f"the page shows {len(times)} conflicts instead of {CONFLICTS}")
        return Run(median(times), 0, 0)
    finally:
        view.kill()
        view.wait()
