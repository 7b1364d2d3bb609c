"""A headless Chromium, driven by Selenium."""

import json

from selenium import webdriver
from selenium.webdriver.chrome.service import Service
from selenium.webdriver.common.keys import Keys

# No window, no use of /dev/shm, which is small in a container, and no network access of the browser's own.
ARGUMENTS = ("--headless", "--no-sandbox", "--disable-gpu", "--disable-dev-shm-usage", "--disable-quic",
             "--disable-background-networking", "--disable-component-update", "--hide-scrollbars",
             "--force-device-scale-factor=1", "--lang=en-US")

KEYS = {"Enter": Keys.ENTER, "Escape": Keys.ESCAPE, "Tab": Keys.TAB, "Home": Keys.HOME, "End": Keys.END,
        "ArrowLeft": Keys.ARROW_LEFT, "ArrowUp": Keys.ARROW_UP, "ArrowRight": Keys.ARROW_RIGHT,
        "ArrowDown": Keys.ARROW_DOWN, "Space": Keys.SPACE}

MODIFIERS = {"Control": Keys.CONTROL, "Shift": Keys.SHIFT}


class Browser:
    """A browser process. It shows the tab that was opened last."""

    def __init__(self):
        options = webdriver.ChromeOptions()
        options.binary_location = "/usr/bin/chromium"
        for argument in ARGUMENTS:
            options.add_argument(argument)
        options.set_capability("goog:loggingPrefs", {"browser": "ALL", "performance": "ALL"})
        self._driver = webdriver.Chrome(service=Service("/usr/bin/chromedriver"), options=options)
        self._blank = self._driver.current_window_handle

    def close(self):
        self._driver.quit()

    def open(self, url, width=1200, height=900, dark=False):
        """Opens a page in a new tab. Returns the tab once the page is loaded."""
        self._driver.switch_to.window(self._blank)
        self._driver.switch_to.new_window("tab")
        return Tab(self._driver, url, width, height, dark)


class Tab:
    """A page. `requests` has the URLs that it requested, `complaints` its errors and warnings."""

    def __init__(self, driver, url, width, height, dark):
        self._driver = driver
        self._window = driver.current_window_handle
        self._requests = []
        self._complaints = []
        for kind in ("browser", "performance"):
            driver.get_log(kind)  # drops the entries of earlier tabs
        driver.execute_cdp_cmd("Performance.enable", {})
        driver.execute_cdp_cmd("Emulation.setFocusEmulationEnabled", {"enabled": True})
        driver.execute_cdp_cmd("Emulation.setDeviceMetricsOverride",
                               {"width": width, "height": height, "deviceScaleFactor": 1, "mobile": False})
        driver.execute_cdp_cmd("Emulation.setEmulatedMedia", {
            "features": [{"name": "prefers-color-scheme", "value": "dark" if dark else "light"}]})
        driver.get(url)

    def close(self):
        self._driver.switch_to.window(self._window)
        self._driver.close()

    def run(self, script):
        """Returns the value of a JavaScript expression, which may be a promise."""
        return self._driver.execute_script(f"return ({script})")

    def counters(self):
        """Returns the browser's performance counters for the page, by name."""
        metrics = self._driver.execute_cdp_cmd("Performance.getMetrics", {})["metrics"]
        return {metric["name"]: metric["value"] for metric in metrics}

    def screenshot(self):
        """Returns the visible part of the page as the bytes of a PNG image."""
        return self._driver.get_screenshot_as_png()

    def load(self, path):
        """Runs a JavaScript file in the page, even if the page's security policy forbids scripts."""
        self._driver.execute_script(path.read_text("utf-8"))

    def press(self, *keys):
        """Presses and releases keys: characters, or names such as "Enter" and "Control+v"."""
        actions = webdriver.ActionChains(self._driver, duration=0)
        for key in keys:
            *held, last = [key] if len(key) == 1 else key.split("+")
            for modifier in held:
                actions.key_down(MODIFIERS[modifier])
            actions.send_keys(KEYS.get(last, last))
            for modifier in held:
                actions.key_up(MODIFIERS[modifier])
        actions.perform()

    def type(self, text):
        self.press(*text)

    @property
    def requests(self):
        self._read_logs()
        return self._requests

    @property
    def complaints(self):
        self._read_logs()
        return self._complaints

    def _read_logs(self):
        self._complaints += [entry["message"] for entry in self._driver.get_log("browser")]
        for entry in self._driver.get_log("performance"):
            event = json.loads(entry["message"])["message"]
            if event["method"] == "Network.requestWillBeSent":
                self._requests.append(event["params"]["request"]["url"])
            elif event["method"] == "Network.loadingFailed":
                self._complaints.append(event["params"]["errorText"])
