# SPDX-License-Identifier: BSD-2-Clause
"""A headless Chromium, driven through its DevTools protocol on a pair of pipes."""

import base64
import collections
import json
import os
import shutil
import signal
import subprocess
import tempfile
import threading
import time

PATIENCE = int(os.environ.get("KVLOAM_TEST_PATIENCE", "120"))  # seconds for anything to happen, also on a slow machine
PROGRAM = "chromium"


class BrowserError(Exception):
    """The browser has refused a command, or has not done what was waited for."""


class Browser:
    """A `Browser` is a Chromium process with a profile of its own. It ends with `close`."""

    def __init__(self):
        program = shutil.which(PROGRAM)
        if program is None:
            raise BrowserError(f"{PROGRAM} is not installed; scripts/install-packages browser installs it")
        self._folder = tempfile.TemporaryDirectory(prefix="kvloam-browser-", ignore_cleanup_errors=True)
        # It reads commands from descriptor 3 and writes answers and events to descriptor 4.
        command_end, self._commands = os.pipe()
        self._answers, answer_end = os.pipe()
        arguments = [program, "--headless", "--remote-debugging-pipe", "--no-first-run", "--disable-gpu",
                     "--disable-dev-shm-usage", "--disable-extensions", "--disable-background-networking",
                     "--disable-component-update", "--disable-default-apps", "--disable-sync",
                     "--force-color-profile=srgb", "--hide-scrollbars",
                     f"--user-data-dir={self._folder.name}/profile", "about:blank"]
        if os.geteuid() == 0:
            arguments.insert(1, "--no-sandbox")

        def connect():
            # Both are moved out of the way first, since one may be where the other one goes.
            reader, writer = os.dup(command_end), os.dup(answer_end)
            os.dup2(reader, 103), os.dup2(writer, 104)
            os.dup2(103, 3), os.dup2(104, 4)

        self._log = open(f"{self._folder.name}/log", "w+", encoding="utf-8", errors="replace")
        environment = {**os.environ, "HOME": self._folder.name, "XDG_RUNTIME_DIR": self._folder.name,
                       "DBUS_SESSION_BUS_ADDRESS": "unix:path=/nonexistent"}
        self._process = subprocess.Popen(arguments, preexec_fn=connect, close_fds=False, env=environment,
                                         stdin=subprocess.DEVNULL, stdout=self._log, stderr=self._log,
                                         start_new_session=True)
        os.close(command_end)
        os.close(answer_end)
        self._next = 0
        self._results = {}
        self._tabs = {}
        self._arrived = threading.Condition()
        self._ended = False
        self._reader = threading.Thread(target=self._read, daemon=True)
        self._reader.start()

    def _read(self):
        rest = b""
        while chunk := os.read(self._answers, 1 << 16):
            *messages, rest = (rest + chunk).split(b"\0")
            for message in map(json.loads, messages):
                with self._arrived:
                    if "id" in message:
                        self._results[message["id"]] = message
                    elif message.get("sessionId") in self._tabs:
                        self._tabs[message["sessionId"]].take(message["method"], message["params"])
                    self._arrived.notify_all()
        with self._arrived:
            self._ended = True
            self._arrived.notify_all()

    def call(self, method, session=None, patience=PATIENCE, **parameters):
        with self._arrived:
            self._next += 1
            number = self._next
        message = {"id": number, "method": method, "params": parameters}
        if session:
            message["sessionId"] = session
        self._write(json.dumps(message).encode() + b"\0")
        with self._arrived:
            if not self._arrived.wait_for(lambda: number in self._results or self._ended, patience):
                raise BrowserError(f"{method}: no answer within {patience} s")
            if number not in self._results:
                raise BrowserError(f"{method}: the browser has ended: {self._output()}")
            result = self._results.pop(number)
        if "error" in result:
            raise BrowserError(f"{method}: {result['error']}")
        return result["result"]

    def _write(self, data):
        while data:
            data = data[os.write(self._commands, data):]

    def _output(self):
        self._log.seek(0)
        return self._log.read()[-2000:]

    def open(self, address, width=1280, height=900):
        """A new tab, in a context that shares no storage with others."""
        context = self.call("Target.createBrowserContext")["browserContextId"]
        target = self.call("Target.createTarget", url="about:blank", browserContextId=context)["targetId"]
        session = self.call("Target.attachToTarget", targetId=target, flatten=True)["sessionId"]
        tab = Tab(self, context, session)
        with self._arrived:
            self._tabs[session] = tab
        tab.prepare(width, height)
        tab.go(address)
        return tab

    def close(self):
        try:
            self.call("Browser.close", patience=20)
            self._process.wait(20)
        except (BrowserError, OSError, subprocess.TimeoutExpired):
            pass
        # What it has started may outlive it, and writes to its profile.
        try:
            os.killpg(self._process.pid, signal.SIGKILL)
        except ProcessLookupError:
            pass
        self._process.wait()
        self._reader.join()
        os.close(self._commands)
        os.close(self._answers)
        self._log.close()
        self._folder.cleanup()


class Tab:
    """A `Tab` is one page in a browser. It keeps the addresses that were asked for, and all errors."""

    def __init__(self, browser, context, session):
        self._browser = browser
        self._context = context
        self._session = session
        self.requests = []
        self.statuses = collections.Counter()
        self.errors = []

    def call(self, method, **parameters):
        return self._browser.call(method, self._session, **parameters)

    def take(self, method, parameters):
        if method == "Network.requestWillBeSent":
            self.requests.append((parameters["request"]["method"], parameters["request"]["url"]))
        elif method == "Network.responseReceived":
            self.statuses[parameters["response"]["status"]] += 1
        elif method == "Runtime.exceptionThrown":
            details = parameters["exceptionDetails"]
            self.errors.append(details.get("exception", {}).get("description") or details["text"])
        elif method == "Log.entryAdded" and parameters["entry"]["level"] == "error":
            self.errors.append(f"{parameters['entry']['text']} {parameters['entry'].get('url', '')}")

    def prepare(self, width, height):
        for domain in ("Page", "Runtime", "Network", "Log", "DOM", "Accessibility"):
            self.call(f"{domain}.enable")
        self.resize(width, height)

    def resize(self, width, height, mobile=False):
        self.call("Emulation.setDeviceMetricsOverride", width=width, height=height, deviceScaleFactor=1, mobile=mobile)

    def scheme(self, name):
        """The system's colours: "light" or "dark"."""
        self.call("Emulation.setEmulatedMedia", features=[{"name": "prefers-color-scheme", "value": name}])

    def go(self, address):
        result = self.call("Page.navigate", url=address)
        if "errorText" in result:
            raise BrowserError(f"{address}: {result['errorText']}")
        self.wait_for("document.readyState === 'complete'")

    def run(self, expression):
        """The value of a JavaScript expression; a promise is awaited."""
        result = self.call("Runtime.evaluate", expression=expression, returnByValue=True, awaitPromise=True)
        if "exceptionDetails" in result:
            details = result["exceptionDetails"]
            raise BrowserError(f"{expression}: {details.get('exception', {}).get('description', details['text'])}")
        return result["result"].get("value")

    def wait_for(self, condition, patience=PATIENCE):
        """Waits until a JavaScript expression is true, looking at every 20 ms. Returns its value and the
        seconds that it took."""
        began = time.monotonic()
        while True:
            # A page that is being replaced takes its evaluations with it.
            try:
                value = self.run(f"""new Promise((resolve) => {{
                    const limit = performance.now() + 5000;
                    const look = () => {{
                        const value = {condition};
                        if (value || performance.now() > limit) resolve(value); else setTimeout(look, 20);
                    }};
                    look();
                }})""")
            except BrowserError as error:
                if "context" not in str(error) and "navigat" not in str(error):
                    raise
                value = None
            if value:
                return value, time.monotonic() - began
            if time.monotonic() - began > patience:
                shown = self.run("document.body.innerText")[:2000]
                raise BrowserError(f"not within {patience} s: {condition}\nshown: {shown}\nerrors: {self.errors}")

    def text(self, selector):
        """What people see of an element; empty when it is not shown."""
        return self.run(self._text(selector))

    def wait_for_text(self, selector, part):
        return self.wait_for(f"({self._text(selector)}).includes({json.dumps(part)})")

    @staticmethod
    def _text(selector):
        # What is not shown has an innerText all the same.
        return (f"[...document.querySelectorAll({json.dumps(selector)})]"
                ".find((one) => one.checkVisibility())?.innerText ?? ''")

    def press(self, key, control=False):
        codes = {"Enter": 13, "Tab": 9, " ": 32, "End": 35, "Home": 36, "PageUp": 33, "PageDown": 34,
                 "ArrowLeft": 37, "ArrowUp": 38, "ArrowRight": 39, "ArrowDown": 40}
        text = {"Enter": "\r", " ": " "}.get(key)
        common = {"key": key, "code": "Space" if key == " " else key, "windowsVirtualKeyCode": codes[key],
                  "modifiers": 2 if control else 0}
        self.call("Input.dispatchKeyEvent", type="keyDown" if text else "rawKeyDown", **common,
                  **({"text": text} if text else {}))
        self.call("Input.dispatchKeyEvent", type="keyUp", **common)

    def type(self, text):
        self.call("Input.insertText", text=text)

    def click(self, selector):
        """Clicks an element once it has stopped moving, and again if the page moved it away all the same."""
        began = time.monotonic()
        while True:
            place = self.run(f"""new Promise((resolve) => {{
                document.querySelector({json.dumps(selector)}).scrollIntoView({{block: "nearest"}});
                const limit = performance.now() + 5000;
                const look = (former) => {{
                    const element = document.querySelector({json.dumps(selector)});
                    const box = element.getBoundingClientRect();
                    const place = [box.x + box.width / 2, box.y + box.height / 2];
                    const still = place.join() === former && element.contains(document.elementFromPoint(...place));
                    if (still || performance.now() > limit) resolve(place); else setTimeout(look, 50, place.join());
                }};
                look();
                window.hit = undefined;
                document.addEventListener("click", (event) => {{
                    window.hit = event.target.closest({json.dumps(selector)}) !== null;
                }}, {{capture: true, once: true}});
            }})""")
            for kind in ("mousePressed", "mouseReleased"):
                self.call("Input.dispatchMouseEvent", type=kind, x=place[0], y=place[1], button="left", clickCount=1)
            if self.run("window.hit"):
                return
            if time.monotonic() - began > PATIENCE:
                shown = self.run("document.body.innerText")[:2000]
                raise BrowserError(f"{selector} cannot be clicked at {place}\nshown: {shown}")

    def focus(self):
        """The text of the element that has the focus."""
        return self.run("document.activeElement.innerText || document.activeElement.id")

    def accessibility(self):
        """The nodes of the accessibility tree that are not ignored: [(role, name, properties)]."""
        nodes = self.call("Accessibility.getFullAXTree")["nodes"]
        return [(node["role"]["value"], node.get("name", {}).get("value", "").strip(),
                 {one["name"]: one["value"].get("value") for one in node.get("properties", [])})
                for node in nodes if not node.get("ignored")]

    def picture(self, path):
        data = self.call("Page.captureScreenshot", format="png")["data"]
        with open(path, "wb") as file:
            file.write(base64.b64decode(data))

    def close(self):
        self._browser.call("Target.disposeBrowserContext", browserContextId=self._context)
