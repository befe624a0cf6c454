#!/usr/bin/env python3
# Settles conflicts with vexel-merge-view as its page does, and attacks it as other pages and programs may:
#   view_requests.py <VexelYAMLMerge> <vexel-merge-view> <vexel-merge-report> <examples> [<random scenes>]

import ctypes
import http.client
import json
import os
import random
import resource
import signal
import socket
import subprocess
import sys
import tempfile
import time
from concurrent.futures import ThreadPoolExecutor
from pathlib import Path

sys.path.insert(0, str(Path(__file__).resolve().parent / "scene_editor"))
import edits  # noqa: E402
import scene  # noqa: E402
from browser import expect  # noqa: E402
from view_program import View  # noqa: E402

MERGE, VIEW, REPORT, EXAMPLES = *map(os.path.abspath, sys.argv[1:4]), Path(sys.argv[4]).resolve()
PAIRS = int(sys.argv[5]) if len(sys.argv) > 5 else 25
HOSTILE = "<img src=x onerror=alert(1)>\u202e\u0001\t\"'</script>"


def node(name, number, father, children, fields=""):
    kids = "".join(f"\n  - {{fileID: {child}1}}" for child in children) or " []"
    return (f"--- !v!1 &{number}0\nGameObject:\n  m_Component:\n  - component: {{fileID: {number}1}}\n"
            f"  m_Name: {json.dumps(name)}\n  m_IsActive: 1\n{fields}--- !v!4 &{number}1\nTransform:\n"
            f"  m_GameObject: {{fileID: {number}0}}\n  m_Children:{kids}\n  m_Father: {{fileID: {father}}}\n")


def rows(state, cards="cards"):
    return {row["key"]: row for card in state[cards] for part in card["objects"] for row in part["rows"]}


def examples():
    return [(EXAMPLES / f"{name}.vexel").read_bytes() for name in ("base", "left", "right")]


LIGHT, DELAY = "500302.Light.m_Intensity", "501502.MonoBehaviour.waveDelay"


def settles_as_merge_does(*mode):
    view = View(examples(), "--theirs", "Ann", *(["--plain"] if not mode else []), "-o", "record")
    _, state = view.get("state")
    expect("what is open", (state["pending"], state["conflicts"], state["names"]["theirs"]), (2, 2, "Ann"))
    light = rows(state)[LIGHT]
    expect("their light", light["theirs"], {"kind": "changed", "text": "4", "value": {"type": "number", "number": "4"}})
    expect("its name", (light["label"], light["path"], light["choice"]), ("Intensity", LIGHT, None))
    expect("a save too early", view.post("save"), (409, {"error": "2 conflicts are not settled yet"}))

    status, delta = view.choose(**{LIGHT: "theirs"})
    expect("a choice", (status, delta["pending"], [card["key"] for card in delta["changed"]]), (200, 1, ["100300"]))
    expect("a settled place", rows(delta, "changed")[LIGHT]["result"]["text"], "4")
    for place in ("choose", "undo", "redo", "save"):
        expect(f"{place} from an old page", view.post(place, revision=1, choices=[])[0], 409)
        answer, _ = view.raw("POST", f"/{view.secret}/{place}", '{"file": 0, "choices": []}', Content_Type="application/json")
        expect(f"{place} from any page", answer.status, 400)
    view.choose(**{DELAY: "ours", LIGHT: "base"})
    _, state = view.post("undo")
    expect("what is taken back", (state["pending"], state["can_undo"], state["can_redo"]), (1, True, True))
    _, before = view.get("state")
    _, state = view.post("redo")
    expect("what is done again", (state["pending"], state["can_redo"]), (0, False))
    view.choose(**{LIGHT: None})
    _, state = view.get("state")
    expect("an open place", (state["pending"], rows(state)[LIGHT]["state"]), (1, "conflict"))
    expect("the order", [card["key"] for card in state["cards"]], [card["key"] for card in before["cards"]])
    view.choose(**{LIGHT: "theirs"})

    status, answer = view.post("save")
    expect("the save", (status, answer["saved"], answer["next"], answer["unread"]), (200, True, None, []))
    expect("how to go on outside of version control", answer["next_step"]["command"], "")
    status, merged = view.end()
    expect("the status of the saved merge", status, 0)
    again = view.folder / "again"
    subprocess.run([MERGE, "merge", "-h", "--force", "--fallback", "none", *mode, "-i", "record", "-o", os.devnull,
                    *view.versions, again], check=True)
    expect("the merge with the same choices is the same", again.read_text() == merged, True)
    report = subprocess.run([REPORT, "--json", *mode, "--committed", again, *view.versions], capture_output=True, check=True)
    expect("what a report says of it in the end", rows(json.loads(report.stdout))[LIGHT]["committed"]["text"], "4")


def a_choice_settles_what_follows():
    # One side hung the crane below the hook, the other one the hook below the crane.
    base = node("Crane", 1, 0, []) + node("Hook", 2, 0, [])
    left = node("Crane", 1, 21, []) + node("Hook", 2, 0, [1])
    right = node("Crane", 1, 0, [2]) + node("Hook", 2, 11, [])
    view = View([base, left, right])
    _, state = view.get("state")
    places = [row["path"] for row in rows(state).values() if "path" in row]
    expect("what is open", (state["pending"], places), (2, ["11.Transform.m_Father", "21.Transform.m_Father"]))
    _, delta = view.choose(**{places[0]: "ours"})
    expect("both at once", (delta["pending"], rows(delta, "changed")[places[1]]["choice"]), (0, "ours"))
    expect("opening what follows from it", view.choose(**{places[1]: None})[0], 400)
    view.post("give-up")
    expect("what is given up", view.end(), (1, "as it was\n"))


def a_report_tells_what_became_of_an_element():
    versions = {"base": "12", "theirs": "13", "ours": "14", "as_ours": "14", "without": "1", "as_base": "12"}
    for name, materials in versions.items():
        entries = "".join(f"  - {{fileID: 2, guid: a{material}, type: 2}}\n" for material in materials)
        Path(f"{name}.vexel").write_text(f"{scene.HEADER}--- !v!23 &5\nMeshRenderer:\n  m_Materials:\n{entries}")
    paths = [f"{name}.vexel" for name in versions]
    for committed, (kind, guid) in zip(paths[3:], (("changed", "a4"), ("removed", ""), ("unchanged", "a2"))):
        report = subprocess.run([REPORT, "--safe", "--json", "--committed", committed, *paths[:3]], capture_output=True, check=True)
        cell = rows(json.loads(report.stdout))["5.MeshRenderer.m_Materials.1"]["committed"]
        expect(f"an element of {committed}", (cell["kind"], guid in cell["text"]), (kind, True))


def a_name_changes_wherever_it_is_shown():
    def scene_with(name, target):
        return (node(name, 1, 0, []) + node("Hook", 2, 0, []) + "--- !v!1 &30\nGameObject:\n  m_Name: Wall\n"
                f"--- !v!114 &31\nMonoBehaviour:\n  m_GameObject: {{fileID: 30}}\n  targets:{target}\n")
    view = View([scene_with("Crane", " []"), scene_with("Big Crane", "\n  - {fileID: 11}\n  - {fileID: 21}"),
                 scene_with("Tall Crane", " []")])
    view.get("state")
    _, delta = view.choose(**{"10.GameObject.m_Name": "theirs"})
    expect("what other cards call it", rows(delta, "changed")["31.MonoBehaviour.targets"]["result"]["shown"],
           "+ Big Crane\n+ Hook")
    view.post("give-up")
    view.end()


def a_pattern_can_be_taken_back():
    Path("patterns").write_text("Conflict handling:\nleft *.Light.m_Intensity\nright *.*.*\n")
    view = View(examples(), "-i", "patterns")
    _, state = view.get("state")
    expect("what is settled", (state["pending"], rows(state)[LIGHT]["choice"], rows(state)[DELAY]["choice"]),
           (0, "theirs", "ours"))
    _, delta = view.choose(**{LIGHT: None})
    expect("what is open again", (delta["pending"], rows(delta, "changed")[LIGHT]["state"]), (1, "conflict"))
    _, delta = view.choose(**{LIGHT: "ours"})
    expect("what is chosen instead", (delta["pending"], rows(delta, "changed")[LIGHT]["choice"]), (0, "ours"))
    view.post("undo")
    _, delta = view.post("undo")
    expect("the pattern again", (delta["pending"], rows(delta, "changed")[LIGHT]["choice"]), (0, "theirs"))
    view.post("save")
    expect("what is saved", "m_Intensity: 4\n" in view.end()[1], True)


def shows_random_scenes_as_a_whole_merge_does():
    """The page merges a part of each scene, and must never tell."""
    saved = 0
    for number in range(PAIRS):
        rng = random.Random(f"view/{number}")
        built = edits.build(*edits.make_triple(rng, 6))
        view = View([scene.write(built[name]).encode() for name in ("base", "left", "right")],
                    "--theirs", "theirs", "--ours", "ours", "-o", "record")
        chosen = view.folder / "chosen"
        choices = {}
        for _ in range(8):
            _, state = view.get("state")
            words = {"theirs": "left", "ours": "right", "base": "base"}
            chosen.write_text("Conflict handling:\n" + "".join(f"{words[choices[p]]} {p}\n" for p in sorted(choices)))
            report = json.loads(subprocess.run([REPORT, "--json", "--safe", "-i", chosen, *view.versions],
                                               capture_output=True, check=True).stdout)
            expect(f"the cards of scene {number}, {choices}", rows(state), rows(report))
            expect(f"what is open in scene {number}", state["pending"], report["pending"])
            expect(f"what is said of scene {number}", state["notes"], report["notes"])
            open_places = [row["path"] for row in rows(state).values() if row["pending"]]
            if not open_places:
                break
            choice = {path: rng.choice(list(words)) for path in rng.sample(open_places, rng.randint(1, len(open_places)))}
            choices.update(choice)
            view.choose(**choice)
        if view.post("save")[0] == 200:
            saved += 1
            again = view.folder / "again"
            subprocess.run([MERGE, "merge", "--safe", "-h", "--force", "--fallback", "none", "-i", chosen, "-o", os.devnull,
                            *view.versions, again], check=True, stderr=subprocess.DEVNULL)
            expect(f"the saved scene {number}", view.end(), (0, again.read_text()))
        else:
            view.post("give-up")
            expect(f"the status of scene {number}", view.end()[0], 1)
    expect("most scenes are saved", saved > PAIRS // 2, True)


def hostile_values_stay_text():
    def lamp(text, extra):
        return node(HOSTILE, 1, 0, []) + f"--- !v!108 &12\nLight:\n  m_Text: {json.dumps(text)}\n{extra}"

    extra = "".join(f"  m_Field{i}: %d\n" for i in range(5000))
    versions = [lamp(HOSTILE * n + "x" * 100_000, extra.replace("%d", str(n))) for n in (1, 2, 3)]
    view = View(versions)
    started = time.monotonic()
    answer, body = view.raw("GET", f"/{view.secret}/state")
    state = json.loads(body)
    expect("what is open", state["pending"], 5001)
    expect("a long value", len(rows(state)["12.Light.m_Text"]["theirs"]["full"]) > 100_000, True)
    expect("a control character", any(c in body.decode() for c in "\u202e\u0001"), False)
    expect("the state is there soon", time.monotonic() - started < 60, True)
    view.program.send_signal(signal.SIGTERM)
    expect("a terminated program", view.end(), (-signal.SIGTERM, "as it was\n"))


def refuses_others():
    view = View(examples())
    inside, wrong = f"/{view.secret}/", "/" + "0" * 32 + "/"
    own = f"127.0.0.1:{view.port}"
    for path in ("/", "/state", wrong, wrong + "state", f"/{view.secret}", "//" + view.secret + "/", "/../" + view.secret,
                 f"/{view.secret[:-1]}/state", f"/x/..{inside}state", "/favicon.ico", "*"):
        for method in ("GET", "POST", "PUT", "OPTIONS"):
            answer, body = view.raw(method, path)
            expect(f"{method} {path} without the secret", (answer.status, body), (404, b""))
    for headers in ({"Host": "evil.example"}, {"Host": f"evil.example:{view.port}"}, {"Host": "127.0.0.1"},
                    {"Origin": "http://evil.example"}, {"Origin": "null"}, {"Origin": f"https://{own}"},
                    {"Sec_Fetch_Site": "cross-site"}, {"Sec_Fetch_Site": "same-site"}):
        for method in ("GET", "POST"):
            answer, body = view.raw(method, inside + "state", **headers)
            expect(f"{method} with {headers}", (answer.status, body), (403, b""))
    for headers in ({"Host": f"localhost:{view.port}"}, {"Origin": f"http://{own}", "Sec_Fetch_Site": "same-origin"}):
        expect(f"with {headers}", view.raw("GET", inside + "state", **headers)[0].status, 200)
    for method in ("PUT", "DELETE", "HEAD", "OPTIONS"):
        expect(method, view.raw(method, inside)[0].status, 403)
    page = view.raw("GET", inside)[0]
    for name in ("Cache-Control", "Content-Security-Policy", "X-Content-Type-Options", "Referrer-Policy"):
        expect(f"one {name}", len(page.headers.get_all(name)), 1)
    expect("what the page may do", page.headers["Content-Security-Policy"].split(";")[0], "default-src 'none'")

    expect("a path trick", view.raw("GET", inside + "../../etc/passwd")[0].status, 404)
    for file, status in (("1", 404), ("9" * 30, 400), ("1x", 400)):
        expect(f"no such file as {file}", view.get(f"state?file={file}")[0], status)
    for body in ("", "[]", "{", '{"choices": 1}', '{"choices": [{"path": "1.x"}]}', "[" * 100_000):
        answer, _ = view.raw("POST", inside + "choose", body, Content_Type="application/json")
        expect(f"the request {body[:40]}", answer.status, 400)
    expect("no such place", view.choose(**{LIGHT: "ours", "*.Light.m_Intensity": "ours"})[0], 400)
    expect("a form", view.raw("POST", inside + "choose", "{}", Content_Type="text/plain")[0].status, 400)
    answer, body = view.raw("POST", inside + "choose", Content_Type="application/json", Content_Length=str(33 << 20))
    expect("a large body", (answer.status, json.loads(body)), (413, {"error": "These are too many choices at once"}))
    expect("a place that is none", "error" in json.loads(view.raw("GET", inside + "x")[1]), True)
    answer, body = view.raw("GET", inside + "state", Range="bytes=" + "0-," * 2000 + "0-")
    expect("parts of an answer", (answer.status, len(body) < 100_000), (200, True))
    many = [{"path": path, "choice": "ours"} for path in (LIGHT, DELAY) for _ in range(30_000)]
    expect("many choices", view.post("choose", choices=many)[1]["pending"], 0)
    view.post("undo")
    expect("what is open after all that", view.get("state")[1]["pending"], 2)

    # Every connection that the program lets in, half of them in the middle of a request.
    resource.setrlimit(resource.RLIMIT_NOFILE, (min(4096, resource.getrlimit(resource.RLIMIT_NOFILE)[1]),) * 2)
    held = []
    for number in range(1000):
        held.append(socket.create_connection(("127.0.0.1", view.port), 20))
        if number % 2:
            held[-1].sendall(b"GET / HTTP/1.1\r\nHost: ")
    started = time.monotonic()
    expect("beside 1,000 connections", view.choose(**{LIGHT: "ours"})[0], 200)
    expect("without having waited for them", time.monotonic() - started < 20, True)
    for connection in held:
        connection.close()
    view.post("give-up")
    expect("what is given up", view.end(), (1, "as it was\n"))


def open_page(view):
    events = socket.create_connection(("127.0.0.1", view.port), 60)
    events.sendall(f"GET /{view.secret}/events HTTP/1.1\r\nHost: 127.0.0.1:{view.port}\r\n\r\n".encode())
    said = b""
    while b"retry: 500\n\n" not in said:
        said += events.recv(100) or sys.exit(f"a page is told {said}")
    return events


def ends_with_its_page():
    listing = Path(WORK) / "browser"
    # The second line is only written by who dies of a broken pipe.
    listing.write_text("#!/bin/sh\nsh -c 'kill -PIPE $$' || : >\"$1.pipe\"\nprintf %s \"$2\" >\"$1.called.new\"; mv \"$1.called.new\" \"$1.called\"\n")
    listing.chmod(0o700)
    view = View(examples(), BROWSER=f"{listing} {listing} %s:other", DISPLAY=":0", SSH_CONNECTION="")
    called = Path(f"{listing}.called")
    deadline = time.monotonic() + 20
    while not called.exists() and time.monotonic() < deadline:
        time.sleep(0.01)
    path = called.read_text().removeprefix(f"http://127.0.0.1:{view.port}")
    expect("the secret in the browser's arguments", view.secret in path, False)
    answer, _ = view.raw("GET", path)
    expect("its address leads to the page", (answer.status, answer.headers["Location"]), (303, f"/{view.secret}/"))
    expect("its address the second time", view.raw("GET", path)[0].status, 404)

    expect("a broken pipe for the browser", Path(f"{listing}.pipe").exists(), True)
    open_page(view).close()
    again = open_page(view)
    time.sleep(6)
    expect("the program while its page was loaded again", view.program.poll(), None)
    again.close()
    expect("the program without its page", view.end(), (1, "as it was\n"))

    view = View(examples(), BROWSER="/nowhere/browser", DISPLAY=":0", SSH_CONNECTION="")
    view.choose(**{LIGHT: "ours"})
    open_page(view).close()
    time.sleep(8)
    expect("the program while a connection with choices is broken", view.program.poll(), None)
    again = open_page(view)
    view.post("bye")
    again.close()
    expect("the program without its page", view.end(), (1, "as it was\n"))
    expect("how to do without a browser", "Open this address" in view.program.stderr.read(), True)


def says_what_is_wrong():
    for record, other in (("/dev/full", "the result"), ("record", "the record")):
        view = View(examples(), "--idle-timeout", "8", "-o", record, merged="/dev/full" if record == "record" else None)
        Path("record").write_text("as it was\n")
        view.choose(**{LIGHT: "ours", DELAY: "ours"})
        status, answer = view.post("save")
        expect(f"no room beside {other}", (status, "/dev/full" in answer["error"]), (409, True))
        expect("the program left alone", view.end(), (1, "as it was\n"))
        expect("its record", Path("record").read_text(), "as it was\n")

    os.symlink(view.versions[1], "link")
    for what, *arguments in (("a file that can't be read", *view.versions[:2], "/nowhere/right", "merged"),
                             ("a record that can't be written", "-o", "/nowhere/record", *view.versions, "merged"),
                             ("a result that can't be written", *view.versions, "/nowhere/merged"),
                             ("a record in the result's place", "-o", "./merged", *view.versions, "merged"),
                             ("a record in a version's place", "-o", "link", *view.versions, "merged")):
        done = subprocess.run([VIEW, "--no-browser", "--idle-timeout", "8", *arguments], capture_output=True, text=True)
        expect(what, (done.returncode, done.stdout, done.stderr.count("\n")), (1, "", 1))
    with open("/dev/full", "w") as full:
        unprinted = subprocess.run([VIEW, "--no-browser", *view.versions, "merged"], stdout=full, stderr=subprocess.PIPE,
                                   text=True, timeout=60)
    expect("an address that can't be printed", (unprinted.returncode, unprinted.stderr),
           (1, "vexel-merge-view: Cannot print the address of the page\n"))


def ends_where_nobody_can_be_let_in():
    """As where the system has no room for another connection. Not everywhere a program may reach into its child."""
    view = View(examples())
    events = open_page(view)
    system = ctypes.CDLL(None).syscall
    pidfd_open, pidfd_getfd, process = 434, 438, Path("/proc", str(view.program.pid))
    numbers = [entry.name for entry in (process / "fd").glob("*") if os.readlink(entry).startswith("socket:")]
    flags = [int((process / "fdinfo" / number).read_text().split("flags:")[1].split()[0], 8) for number in numbers]
    expect("sockets that its children would get", [flag for flag in flags if not flag & os.O_CLOEXEC], [])
    copies = [system(pidfd_getfd, system(pidfd_open, view.program.pid, 0), int(number), 0) for number in numbers]
    listening = [copy for copy in (socket.socket(fileno=copy) for copy in copies if copy >= 0)
                 if copy.getsockopt(socket.SOL_SOCKET, socket.SO_ACCEPTCONN)]
    if not listening:
        print("not checked: the end of what listens")
        return view.program.kill()
    listening[0].shutdown(socket.SHUT_RDWR)
    expect("the end", view.end(), (1, "as it was\n"))
    expect("what is said", view.program.stderr.read(),
           f"No more requests of the page can be accepted\nNothing is saved: {view.merged} is as it was\n")
    events.close()


def gives_up_or_saves():
    """Never both, where the one comes while the other goes on."""
    os.mkfifo("pipe")
    view = View(examples(), "-o", "pipe")
    view.choose(**{LIGHT: "ours", DELAY: "ours"})
    with ThreadPoolExecutor() as threads:
        saving = threads.submit(view.post, "save")
        # The record is waiting for its reader.
        time.sleep(1)
        giving_up = threads.submit(view.post, "give-up")
        time.sleep(1)
        Path("pipe").read_text()
        expect("which one is done", (saving.result()[0], giving_up.result()[0]), (200, 409))
    expect("the status", view.end()[0], 0)


with tempfile.TemporaryDirectory() as WORK:
    os.chdir(WORK)
    settles_as_merge_does("--safe")
    settles_as_merge_does()
    a_choice_settles_what_follows()
    a_report_tells_what_became_of_an_element()
    a_name_changes_wherever_it_is_shown()
    a_pattern_can_be_taken_back()
    shows_random_scenes_as_a_whole_merge_does()
    hostile_values_stay_text()
    refuses_others()
    ends_with_its_page()
    says_what_is_wrong()
    gives_up_or_saves()
    if sys.platform == "linux":
        ends_where_nobody_can_be_let_in()
