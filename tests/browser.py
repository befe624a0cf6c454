# A real browser without a window, driven through its WebDriver, for the tests of pages.

import json
import subprocess
import sys
import urllib.request
from contextlib import contextmanager

OPTIONS = ["--headless", "--no-sandbox", "--disable-gpu", "--disable-quic", "--no-first-run",
           "--disable-background-networking", "--disable-component-update", "--disable-sync"]


class Page:
    def __init__(self, session):
        self.session = session

    def call(self, command, **body):
        request = urllib.request.Request(f"{self.session}/{command}", json.dumps(body).encode())
        return json.load(urllib.request.urlopen(request, timeout=60))["value"]

    def script(self, code, *arguments):
        return self.call("execute/sync", script=code, args=arguments)

    def element(self, selector):
        return next(iter(self.call("element", using="css selector", value=selector).values()))

    def click(self, selector):
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
        yield page
        urllib.request.urlopen(urllib.request.Request(page.session, method="DELETE"), timeout=60)
    finally:
        driver.kill()
        driver.wait()


def expect(what, got, wanted):
    if got != wanted:
        sys.exit(f"{what}: {got!r} instead of {wanted!r}")
