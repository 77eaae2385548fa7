"""A headless Chromium, driven by Debian's chromedriver over the WebDriver protocol."""
import base64
import json
import re
import subprocess
import tempfile
import time
import urllib.request

CHROMIUM = [
    "--headless", "--no-sandbox", "--disable-gpu", "--disable-quic", "--no-first-run", "--disable-dev-shm-usage",
    "--disable-background-networking", "--disable-component-update", "--disable-sync", "--hide-scrollbars",
]
ELEMENT = "element-6066-11e4-a52e-4f735466cecf"
SCRIPT_TIME_MS = 120_000
KEYS = {"Tab": "\ue004", "Enter": "\ue007", "Space": " ", "Down": "\ue015"}


class Browser:
    def __init__(self, *options):
        self.profile = tempfile.TemporaryDirectory()
        self.driver = subprocess.Popen(["chromedriver", "--port=0"], stdout=subprocess.PIPE, text=True)
        for line in self.driver.stdout:
            started = re.search(r"success.*on port (\d+)", line)
            if started:
                break
        self.base = f"http://127.0.0.1:{started[1]}/session"
        arguments = [*CHROMIUM, f"--user-data-dir={self.profile.name}", *options]
        capabilities = {"goog:chromeOptions": {"args": arguments}, "goog:loggingPrefs": {"browser": "ALL"},
                        "timeouts": {"script": SCRIPT_TIME_MS}}
        answer = self.call("POST", "", {"capabilities": {"alwaysMatch": capabilities}})
        self.base += "/" + answer["sessionId"]

    def call(self, method, path, body=None):
        data = None if body is None else json.dumps(body).encode()
        request = urllib.request.Request(self.base + path, data, {"Content-Type": "application/json"}, method=method)
        with urllib.request.urlopen(request, timeout=180) as response:
            return json.load(response)["value"]

    def end(self):
        self.call("DELETE", "")
        self.driver.terminate()
        self.driver.wait(30)
        self.driver.stdout.close()
        self.profile.cleanup()

    def devtools(self, command, **parameters):
        return self.call("POST", "/goog/cdp/execute", {"cmd": command, "params": parameters})

    def open(self, url):
        self.call("POST", "/url", {"url": url})
        self.until("return document.getElementById('link').textContent === 'connected' && !!document.querySelector('.lens')")

    def open_another(self, url):
        window = self.call("POST", "/window/new", {"type": "tab"})["handle"]
        self.call("POST", "/window", {"handle": window})
        self.open(url)

    def windows(self):
        return self.call("GET", "/window/handles")

    def to_window(self, handle):
        self.call("POST", "/window", {"handle": handle})

    def run(self, script, *arguments):
        return self.call("POST", "/execute/sync", {"script": script, "args": list(arguments)})

    def until(self, script, *arguments, seconds=30):
        end = time.monotonic() + seconds
        while True:
            value = self.run(script, *arguments)
            if value:
                return value
            if time.monotonic() > end:
                raise AssertionError(f"still not so: {script} {arguments}")
            time.sleep(0.02)

    def find(self, css):
        return self.call("POST", "/element", {"using": "css selector", "value": css})[ELEMENT]

    def click(self, css):
        self.call("POST", f"/element/{self.find(css)}/click", {})

    def type(self, css, text):
        self.call("POST", f"/element/{self.find(css)}/value", {"text": text})

    def press(self, *names):
        actions = []
        for name in names:
            key = KEYS.get(name, name)
            actions += [{"type": "keyDown", "value": key}, {"type": "keyUp", "value": key}]
        self.call("POST", "/actions", {"actions": [{"type": "key", "id": "keys", "actions": actions}]})

    def complaints(self):
        entries = self.call("POST", "/se/log", {"type": "browser"})
        return [entry["message"] for entry in entries if entry["level"] in ("SEVERE", "WARNING")]

    def screenshot(self, path):
        with open(path, "wb") as out:
            out.write(base64.b64decode(self.call("GET", "/screenshot")))
