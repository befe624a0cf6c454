# A real browser without a window, driven through its WebDriver, for the tests of pages.

import json
import subprocess
import sys
import time
import urllib.error
import urllib.request
from contextlib import contextmanager

OPTIONS = ["--headless", "--no-sandbox", "--disable-gpu", "--disable-quic", "--no-first-run",
           "--disable-background-networking", "--disable-component-update", "--disable-sync"]


class Page:
    def __init__(self, session):
        self.session = session

    def call(self, command, **body):
        request = urllib.request.Request(f"{self.session}/{command}", json.dumps(body).encode())
        try:
            return json.load(urllib.request.urlopen(request, timeout=300))["value"]
        except urllib.error.HTTPError as error:
            sys.exit(f"{command} {body}: {json.load(error)['value']['message'].splitlines()[0]}")

    def script(self, code, *arguments):
        return self.call("execute/sync", script=code, args=arguments)

    def wait(self, condition, what=None):
        """Until an expression is true in the page."""
        deadline = time.monotonic() + 60
        while not self.script(f"return Boolean({condition})"):
            if time.monotonic() > deadline:
                sys.exit(f"{what or condition}: it does not come about")
            time.sleep(0.02)

    def keys(self, keys):
        """Pressed wherever the focus is; the keys of a list together."""
        held = keys if isinstance(keys, list) else [keys]
        actions = [{"type": "keyDown", "value": key} for key in held]
        actions += [{"type": "keyUp", "value": key} for key in reversed(held)]
        self.call("actions", actions=[{"type": "key", "id": "keyboard", "actions": actions}])

    def element(self, selector):
        return next(iter(self.call("element", using="css selector", value=selector).values()))

    def click(self, selector):
        # The driver itself would scroll just far enough, which may be below a bar.
        self.script("document.querySelector(arguments[0]).scrollIntoView({block: 'center'})", selector)
        self.call(f"element/{self.element(selector)}/click")

    def type(self, selector, text):
        self.call(f"element/{self.element(selector)}/value", text=text)


@contextmanager
def browser(folder):
    driver = subprocess.Popen(["chromedriver", "--port=0"], stdout=subprocess.PIPE, text=True)
    try:
        port = next(line for line in driver.stdout if "started successfully on port" in line).rstrip(".\n").split()[-1]
        page = Page(f"http://127.0.0.1:{port}")
        arguments = [*OPTIONS, f"--user-data-dir={folder}/profile"]
        session = page.call("session", capabilities={"alwaysMatch": {"goog:chromeOptions": {"args": arguments}}})
        page.session += f"/session/{session['sessionId']}"
        # Otherwise the browser would go on writing into the folder.
        try:
            yield page
        finally:
            urllib.request.urlopen(urllib.request.Request(page.session, method="DELETE"), timeout=300)
    finally:
        driver.kill()
        driver.wait()


def expect(what, got, wanted):
    if got != wanted:
        sys.exit(f"{what}: {got!r} instead of {wanted!r}")
