# The program with the page, and what its page would ask.

import http.client
import json
import os
import subprocess
import sys
import tempfile
from pathlib import Path

from browser import expect

# Of the test that uses it.
VIEW = os.path.abspath(sys.argv[2])


class View:
    """A running program, and what its page would ask."""

    def __init__(self, versions, *options, merged=None, **environment):
        self.folder = Path(tempfile.mkdtemp(dir=os.getcwd()))
        self.versions = []
        for name, text in zip(("base", "left", "right"), versions):
            self.versions.append(str(self.folder / name))
            if isinstance(text, str):
                text = ("%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n" + text).encode()
            Path(self.versions[-1]).write_bytes(text)
        self.merged = self.folder / "merged.vexel"
        self.merged.write_text("as it was\n")
        if "BROWSER" not in environment:
            options += ("--no-browser",)
        self.program = subprocess.Popen([VIEW, *options, "--", *self.versions, merged or str(self.merged)],
                                        stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True,
                                        env={**os.environ, **environment})
        self.address = self.program.stdout.readline().strip()
        host, self.secret = self.address.removeprefix("http://").rstrip("/").split("/")
        self.port = int(host.split(":")[1])
        self.revision = 1

    def raw(self, method, path, body=None, **headers):
        connection = http.client.HTTPConnection("127.0.0.1", self.port, timeout=60)
        connection.request(method, path, body, {name.replace("_", "-"): text for name, text in headers.items()})
        answer = connection.getresponse()
        return answer, answer.read()

    def get(self, place):
        answer, body = self.raw("GET", f"/{self.secret}/{place}")
        return self.read(answer, body)

    def post(self, place, **request):
        request = {"file": 0, "revision": self.revision, **request}
        answer, body = self.raw("POST", f"/{self.secret}/{place}", json.dumps(request), Content_Type="application/json")
        return self.read(answer, body)

    def read(self, answer, body):
        content = json.loads(body)
        self.revision = content.get("revision", self.revision)
        return answer.status, content

    def choose(self, **choices):
        return self.post("choose", choices=[{"path": path, "choice": side} for path, side in choices.items()])

    def end(self):
        """The exit status, and what is at the destination."""
        status = self.program.wait(60)
        expect("nothing is left beside the files", [p.name for p in self.folder.iterdir() if "MERGE" in p.name], [])
        return status, self.merged.read_text()
