"""A browser by the WebDriver protocol (W3C), with Python's standard library alone."""
import base64
import http.client
import json
import socket
import subprocess
import tempfile
import time

ELEMENT = "element-6066-11e4-a52e-4f735466cecf"
KEYS = {"Tab": "\ue004", "Enter": "\ue007", "ArrowDown": "\ue015", "ArrowUp": "\ue013", "Escape": "\ue00c", "Shift": "\ue008", "End": "\ue010"}
LONGEST = 60  # seconds that anything may take to appear, on a machine that is busy with other things


class DriverError(Exception):
    pass


def free_port():
    with socket.socket() as probe:
        probe.bind(("127.0.0.1", 0))
        return probe.getsockname()[1]


class Browser:
    """One window of Chromium. `language` is what it asks for; `scheme` is "light" or "dark"."""

    def __init__(self, language="en", scheme="light", width=1280, height=900):
        self.port = free_port()
        self.profile = tempfile.TemporaryDirectory(prefix="zorva-browser-")
        self.driver = subprocess.Popen(["chromedriver", f"--port={self.port}"], stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        arguments = ["--headless=new", "--no-sandbox", "--disable-gpu", "--disable-dev-shm-usage", "--no-first-run",
                     "--disable-background-networking", "--disable-component-update", "--ignore-certificate-errors", "--hide-scrollbars",
                     f"--user-data-dir={self.profile.name}", f"--lang={language}", f"--accept-lang={language}",
                     f"--window-size={width},{height}"] + (["--force-dark-mode"] if scheme == "dark" else [])
        wanted = {"browserName": "chrome", "acceptInsecureCerts": True, "timeouts": {"script": 120000}, "goog:loggingPrefs": {"browser": "ALL"},
                  "goog:chromeOptions": {"binary": "/usr/bin/chromium", "args": arguments,
                                         "prefs": {"intl.accept_languages": language}}}
        self.session = ""
        self.session = self._until_up("POST", "/session", {"capabilities": {"alwaysMatch": wanted}})["sessionId"]
        self._devtools("Emulation.setEmulatedMedia", {"features": [{"name": "prefers-color-scheme", "value": scheme}]})
        self.resize(width, height)

    def close(self):
        try:
            self._call("DELETE", "")
        except (DriverError, OSError):
            pass
        self.driver.terminate()
        self.driver.wait(10)
        self.profile.cleanup()

    def _until_up(self, *request):
        deadline = time.monotonic() + LONGEST
        while True:
            try:
                return self._raw(*request)
            except OSError:
                if time.monotonic() > deadline:
                    raise
                time.sleep(0.1)

    def _raw(self, method, path, body=None):
        connection = http.client.HTTPConnection("127.0.0.1", self.port, timeout=90)
        try:
            connection.request(method, path, json.dumps(body) if body is not None else None, {"Content-Type": "application/json"})
            value = json.loads(connection.getresponse().read())["value"]
        finally:
            connection.close()
        if isinstance(value, dict) and "error" in value and "message" in value:
            raise DriverError(f"{value['error']}: {value['message'].splitlines()[0]}")
        return value

    def _call(self, method, path, body=None):
        return self._raw(method, f"/session/{self.session}{path}", body)

    def _devtools(self, command, parameters):
        return self._call("POST", "/goog/cdp/execute", {"cmd": command, "params": parameters})

    def resize(self, width, height=900):
        self._devtools("Emulation.setDeviceMetricsOverride", {"width": width, "height": height, "deviceScaleFactor": 1, "mobile": False})

    def open(self, url):
        self._call("POST", "/url", {"url": url})

    def run(self, script, *arguments):
        return self._call("POST", "/execute/sync", {"script": script, "args": list(arguments)})

    def run_async(self, script, *arguments):
        """The script calls its last argument with the result."""
        return self._call("POST", "/execute/async", {"script": script, "args": list(arguments)})

    def find(self, selector):
        return self._call("POST", "/element", {"using": "css selector", "value": selector})[ELEMENT]

    def click(self, selector):
        self._call("POST", f"/element/{self.find(selector)}/click", {})

    def click_text(self, text, within="body"):
        """Clicks the button or link with that text, again if the page has just replaced it."""
        for _ in range(3):
            try:
                return self._click_text(text, within)
            except DriverError as error:
                if "stale" not in str(error):
                    raise
        raise AssertionError(f"'{text}' is replaced all the time")

    def _click_text(self, text, within):
        found = self.run("""const [text, within] = arguments;
          return [...document.querySelectorAll(within + ' button, ' + within + ' a, ' + within + ' summary')]
            .find((each) => each.textContent.trim() === text && each.checkVisibility()) ?? null;""", text, within)
        if found is None:
            raise AssertionError(f"there is no button or link '{text}'")
        self._call("POST", f"/element/{found[ELEMENT]}/click", {})

    def type(self, selector, text):
        """Replaces the text of a field."""
        element = self.find(selector)
        self._call("POST", f"/element/{element}/clear", {})
        if text:
            self._call("POST", f"/element/{element}/value", {"text": text})

    def press(self, *keys):
        """Presses keys one after the other; "Shift+Tab" holds the first one."""
        steps = []
        for key in keys:
            parts = [KEYS.get(part, part) for part in key.split("+")]
            steps += [{"type": "keyDown", "value": part} for part in parts] + [{"type": "keyUp", "value": part} for part in reversed(parts)]
        self._call("POST", "/actions", {"actions": [{"type": "key", "id": "keyboard", "actions": steps}]})

    def text(self, selector="body"):
        return self.run("const found = document.querySelector(arguments[0]); return found ? found.innerText : '';", selector)

    def wait(self, condition, what):
        """Waits until the script, the body of a function, returns something true, and returns it."""
        deadline = time.monotonic() + LONGEST
        while True:
            value = self.run(condition)
            if value:
                return value
            if time.monotonic() > deadline:
                raise AssertionError(f"{what} did not come; the page says:\n{self.text()}")
            time.sleep(0.1)

    def wait_text(self, text, selector="body"):
        self.wait(f"const found = document.querySelector({json.dumps(selector)}); return found !== null && found.innerText.includes({json.dumps(text)});",
                  f"'{text}' in {selector}")

    def screenshot(self, path):
        path.write_bytes(base64.b64decode(self._call("GET", "/screenshot")))

    def complaints(self):
        """What the browser wrote to its console: violations of the policy, scripts that failed."""
        return [entry["message"] for entry in self._call("POST", "/se/log", {"type": "browser"})
                if entry["level"] in ("SEVERE", "WARNING")]
