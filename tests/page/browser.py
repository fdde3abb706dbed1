# SPDX-License-Identifier: Apache-2.0
"""Debian's chromium, driven over its DevTools protocol through a pair of pipes. Python's own library is enough for it."""

import base64
import fcntl
import json
import os
import select
import shutil
import subprocess
import tempfile
import time

PATIENCE = 60  # seconds for what must come


class Failed(AssertionError):
    """The page is not as it should be."""


class Browser:
    """Ends with its block, with everything that it has started."""

    def __init__(self):
        self.program = shutil.which("chromium")
        if not self.program:
            raise Failed("chromium is missing: run scripts/setup")
        self.folder = tempfile.mkdtemp(prefix="page-")
        to_browser, self.write_end = os.pipe()
        self.read_end, from_browser = os.pipe()
        # The browser reads its descriptor 3 and writes 4.
        script = 'exec "$@" 3<&"$VEXA_IN" 4>&"$VEXA_OUT"'
        environment = {**os.environ, "HOME": self.folder, "VEXA_IN": str(to_browser), "VEXA_OUT": str(from_browser)}
        options = ["--headless=new", "--no-sandbox", "--disable-gpu", "--disable-dev-shm-usage", "--no-first-run",
                   "--disable-background-networking", "--disable-component-update", "--disable-sync", "--mute-audio",
                   "--remote-debugging-pipe", f"--user-data-dir={self.folder}/profile", "--window-size=1280,800", "about:blank"]
        self.log = open(f"{self.folder}/log", "w+b")
        self.process = subprocess.Popen(["bash", "-c", script, "bash", self.program, *options], env=environment,
                                        pass_fds=(to_browser, from_browser), stdin=subprocess.DEVNULL, stdout=self.log,
                                        stderr=self.log, start_new_session=True)
        os.close(to_browser)
        os.close(from_browser)
        fcntl.fcntl(self.read_end, fcntl.F_SETFL, os.O_NONBLOCK)
        self.received = b""
        self.number = 0
        self.errors = []

    def __enter__(self):
        return self

    def __exit__(self, *_):
        try:
            self.command("Browser.close", session=None, patience=10)
        except (Failed, OSError):
            pass
        try:
            self.process.wait(timeout=10)
        except subprocess.TimeoutExpired:
            os.killpg(self.process.pid, 9)
            self.process.wait()
        os.close(self.write_end)
        os.close(self.read_end)
        self.log.close()
        shutil.rmtree(self.folder, ignore_errors=True)

    def command(self, method, session="own", patience=PATIENCE, **parameters):
        """Sends a command and returns its result; notes what the page reports meanwhile."""
        self.number += 1
        message = {"id": self.number, "method": method, "params": parameters}
        if session == "own":
            message["sessionId"] = self.session
        os.write(self.write_end, json.dumps(message).encode() + b"\0")
        end = time.monotonic() + patience
        while True:
            answer = self.message(end, method)
            if answer.get("id") == self.number:
                if "error" in answer:
                    raise Failed(f"{method}: {answer['error']['message']}")
                return answer["result"]
            if answer.get("method") == "Runtime.exceptionThrown":
                details = answer["params"]["exceptionDetails"]
                self.errors.append(details.get("exception", {}).get("description") or details["text"])
            if answer.get("method") == "Log.entryAdded" and answer["params"]["entry"]["source"] == "security":
                self.errors.append(answer["params"]["entry"]["text"])

    def message(self, end, awaited):
        while b"\0" not in self.received:
            left = end - time.monotonic()
            if left <= 0 or not select.select([self.read_end], [], [], left)[0]:
                raise Failed(f"the browser does not answer {awaited}")
            piece = os.read(self.read_end, 1 << 20)
            if not piece:
                self.log.seek(0)
                raise Failed(f"the browser has ended: {self.log.read()[-2000:].decode(errors='replace')}")
            self.received += piece
        text, _, self.received = self.received.partition(b"\0")
        return json.loads(text)

    def open(self, address):
        """In a tab of its own; the one before is closed."""
        target = self.command("Target.createTarget", session=None, url="about:blank")["targetId"]
        self.session = self.command("Target.attachToTarget", session=None, targetId=target, flatten=True)["sessionId"]
        for domain in ("Page", "Runtime", "Log"):
            self.command(f"{domain}.enable")
        self.command("Emulation.setFocusEmulationEnabled", enabled=True)
        self.command("Page.navigate", url=address)

    def run(self, expression):
        """The value of an expression of the page's script."""
        result = self.command("Runtime.evaluate", expression=expression, returnByValue=True, awaitPromise=True)
        if "exceptionDetails" in result:
            raise Failed(f"{expression}: {result['exceptionDetails'].get('exception', {}).get('description')}")
        return result["result"].get("value")

    def wait(self, expression, patience=PATIENCE):
        """Until it is true; returns its value."""
        end = time.monotonic() + patience
        while True:
            try:
                value = self.run(f"(() => {{ try {{ return {expression}; }} catch {{ return false; }} }})()")
            except Failed as failure:  # the page is being loaded
                value = None
                if "context" not in str(failure):
                    raise
            if value:
                return value
            if time.monotonic() > end:
                shown = self.run("document.body.innerText")
                raise Failed(f"not within {patience} s: {expression}\n{shown[:2000]}\n{self.errors}")
            time.sleep(0.1)

    def press(self, key, code=0):
        text = {"Enter": "\r"}.get(key, "")
        for kind in ("keyDown", "keyUp"):
            self.command("Input.dispatchKeyEvent", type=kind, key=key, code=key, windowsVirtualKeyCode=code,
                         **({"text": text} if text and kind == "keyDown" else {}))

    def size(self, width, height, scheme="light", mobile=False):
        self.command("Emulation.setDeviceMetricsOverride", width=width, height=height, deviceScaleFactor=1, mobile=mobile)
        self.command("Emulation.setEmulatedMedia", features=[{"name": "prefers-color-scheme", "value": scheme}])

    def picture(self, path):
        data = self.command("Page.captureScreenshot", format="png")["data"]
        with open(path, "wb") as file:
            file.write(base64.b64decode(data))
