"""A headless Chromium, driven over its debugging pipe."""

import base64
import itertools
import json
import os
import subprocess
import tempfile

# No window, no profile of the user's, no shared memory of a container's small /dev/shm, and nothing that would
# reach for a network by itself.
ARGUMENTS = ("--headless", "--no-sandbox", "--disable-gpu", "--disable-dev-shm-usage", "--disable-quic", "--no-first-run",
             "--disable-sync", "--disable-background-networking", "--disable-component-update", "--disable-default-apps",
             "--disable-extensions", "--hide-scrollbars", "--force-device-scale-factor=1", "--lang=en-US",
             "--remote-debugging-pipe")


class Browser:
    """The process, which shows one tab at a time."""

    def __init__(self):
        self._ids = itertools.count(1)
        self._profile = tempfile.TemporaryDirectory(ignore_cleanup_errors=True)
        self._from_browser, browser_out = os.pipe()
        browser_in, self._to_browser = os.pipe()

        def place_pipes():  # the browser reads from descriptor 3 and writes to 4
            spare_in, spare_out = os.dup(browser_in), os.dup(browser_out)
            os.dup2(spare_in, 3)
            os.dup2(spare_out, 4)

        self._process = subprocess.Popen(
            ["chromium", *ARGUMENTS, f"--user-data-dir={self._profile.name}"],
            preexec_fn=place_pipes, close_fds=False, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
            stderr=subprocess.DEVNULL)
        os.close(browser_in)
        os.close(browser_out)
        self._buffer = b""
        self._tabs = {}

    def close(self):
        os.close(self._to_browser)  # which ends the browser
        try:
            self._process.wait(timeout=30)
        except subprocess.TimeoutExpired:
            self._process.kill()
            self._process.wait()
        os.close(self._from_browser)
        self._profile.cleanup()

    def open(self, url, width=1200, height=900, dark=False):
        """A new tab, when its page is loaded."""
        target = self.call(None, "Target.createTarget", url="about:blank")["targetId"]
        session = self.call(None, "Target.attachToTarget", targetId=target, flatten=True)["sessionId"]
        tab = self._tabs[session] = Tab(self, target, session)
        tab.load(url, width, height, dark)
        return tab

    def call(self, session, method, **parameters):
        """Calls a method of the debugging protocol."""
        number = next(self._ids)
        message = {"id": number, "method": method, "params": parameters} | ({"sessionId": session} if session else {})
        os.write(self._to_browser, json.dumps(message).encode() + b"\0")
        while True:
            answer = self.receive()
            if answer.get("id") == number:
                if "error" in answer:
                    raise RuntimeError(f"{method}: {answer['error']}")
                return answer["result"]

    def receive(self):
        """Waits for the next message and gives the tab that it is about what it says."""
        while b"\0" not in self._buffer:
            part = os.read(self._from_browser, 1 << 16)
            if not part:
                raise RuntimeError("the browser has ended")
            self._buffer += part
        message, _, self._buffer = self._buffer.partition(b"\0")
        message = json.loads(message)
        if "method" in message and message.get("sessionId") in self._tabs:
            self._tabs[message["sessionId"]].note(message["method"], message["params"])
        return message


class Tab:
    """One page. What it asks for and complains of is in `requests` and `complaints`."""

    def __init__(self, browser, target, session):
        self.requests = []
        self.complaints = []
        self._browser = browser
        self._target = target
        self._session = session
        self._loaded = False

    def load(self, url, width, height, dark):
        for domain in ("Page", "Runtime", "Log", "Network", "Performance"):
            self.call(domain + ".enable")
        self.call("Emulation.setFocusEmulationEnabled", enabled=True)
        self.call("Emulation.setDeviceMetricsOverride", width=width, height=height, deviceScaleFactor=1, mobile=False)
        self.call("Emulation.setEmulatedMedia",
                  features=[{"name": "prefers-color-scheme", "value": "dark" if dark else "light"}])
        self._loaded = False
        self.call("Page.navigate", url=url)
        while not self._loaded:
            self._browser.receive()

    def close(self):
        self._browser.call(None, "Target.closeTarget", targetId=self._target)

    def call(self, method, **parameters):
        return self._browser.call(self._session, method, **parameters)

    def run(self, script):
        """The value of a JavaScript expression, which may be a promise."""
        answer = self.call("Runtime.evaluate", expression=script, awaitPromise=True, returnByValue=True)
        if "exceptionDetails" in answer:
            raise RuntimeError(answer["exceptionDetails"]["exception"].get("description", script))
        return answer["result"].get("value")

    def counters(self):
        """The browser's own counts of what it has made and done for the page, by name."""
        return {metric["name"]: metric["value"] for metric in self.call("Performance.getMetrics")["metrics"]}

    def screenshot(self):
        """What is in sight, as the bytes of a PNG image."""
        return base64.b64decode(self.call("Page.captureScreenshot", format="png")["data"])

    def press(self, *keys):
        """Presses and releases keys: characters, or names such as "Enter"."""
        codes = {"Enter": 13, "Escape": 27, "Tab": 9, "ArrowLeft": 37, "ArrowUp": 38, "ArrowRight": 39,
                 "ArrowDown": 40, "Home": 36, "End": 35, " ": 32}
        for key in keys:
            facts = {"key": key, "windowsVirtualKeyCode": codes.get(key, 0)}
            text = {"Enter": "\r"}.get(key, key if len(key) == 1 else "")
            self.call("Input.dispatchKeyEvent", type="keyDown", **facts, **({"text": text} if text else {}))
            self.call("Input.dispatchKeyEvent", type="keyUp", **facts)

    def type(self, text):
        self.press(*text)

    def note(self, event, facts):
        if event == "Page.loadEventFired":
            self._loaded = True
        elif event == "Network.requestWillBeSent":
            self.requests.append(facts["request"]["url"])
        elif event == "Network.loadingFailed":
            self.complaints.append(facts["errorText"])
        elif event == "Log.entryAdded" and facts["entry"]["level"] in ("warning", "error"):
            self.complaints.append(facts["entry"]["text"])
        elif event == "Runtime.exceptionThrown":
            self.complaints.append(facts["exceptionDetails"].get("text", "exception"))
        elif event == "Runtime.consoleAPICalled":
            self.complaints.append(str(facts["args"]))
