"""The panel as a process, and its questions as a program asks them."""
import http.client
import json
import pathlib
import re
import subprocess

ROOT = pathlib.Path(__file__).resolve().parents[2]
ANSWER_TIME_S = 60


class Panel:
    def __init__(self, simulator, what="UFI", *options, environment=None):
        command = [simulator, "panel", what, "--no-browser", *options]
        self.process = subprocess.Popen(command, cwd=ROOT, stdout=subprocess.PIPE, text=True, env=environment)
        self.url = self.process.stdout.readline().strip()
        self.port = int(re.search(r":(\d+)/$", self.url)[1])
        self.token = re.search(r'panel-token" content="(\w+)"', self.get("/"))[1]

    def ask(self, method, path, body=None, **headers):
        """Status and text of the answer; a header of None is left out."""
        connection = http.client.HTTPConnection("127.0.0.1", self.port, timeout=ANSWER_TIME_S)
        sent = {"X-Panel-Token": getattr(self, "token", None)} if method == "POST" else {}
        sent.update({name.replace("_", "-"): value for name, value in headers.items()})
        connection.request(method, path, body, {name: value for name, value in sent.items() if value is not None})
        response = connection.getresponse()
        text = response.read().decode()
        connection.close()
        return response.status, text

    def get(self, path):
        status, text = self.ask("GET", path)
        assert status == 200, f"{path}: {status} {text}"
        return text

    def post(self, path, body):
        status, text = self.ask("POST", path, body.encode())
        assert status == 200, f"{path}: {status} {text}"
        return json.loads(text)

    def do(self, *statements):
        return self.post("/do", "\n".join(statements))

    def time(self, what):
        return self.post("/time", what)

    def state(self):
        return json.loads(self.get("/state"))

    def end(self):
        self.process.terminate()
        self.process.stdout.close()
        return self.process.wait(ANSWER_TIME_S)
