#!/usr/bin/env python3
"""The panel's server: what a program can ask of it, and what it refuses."""
import argparse
import json
import os
import pathlib
import signal
import socket
import subprocess
import sys
import tempfile
import time
import unittest

from panel_process import ROOT, Panel

LED_BLINKS = "sms_blue blink 800/1200 4"
BODY_MAX = 256 * 1024
FORBIDDEN = 403
TOO_LARGE = 413
simulator = ""


def read_event(stream):
    """The next batch of news, behind signs of life."""
    while True:
        line = stream.readline()
        if line.startswith(b"data: "):
            return json.loads(line[len(b"data: "):])
        if not line:
            raise EOFError


def daemon_of(process):
    return int(subprocess.run(["pgrep", "-P", str(process.pid)], capture_output=True, check=True).stdout)


class Server(unittest.TestCase):
    def setUp(self):
        place = tempfile.TemporaryDirectory()
        self.addCleanup(place.cleanup)
        self.place = place.name
        self.panel = self.open()

    def open(self, *arguments):
        panel = Panel(simulator, *arguments, environment={**os.environ, "TMPDIR": self.place})
        self.addCleanup(lambda: panel.process.poll() is None and panel.end())
        return panel

    def led(self, name, panel=None):
        return (panel or self.panel).state()["leds"].get(name)

    def test_statements(self):
        self.panel.time("pause")
        self.assertEqual(self.panel.do("notify SMS NEW_SMS", f"expect {LED_BLINKS}"), {"ok": True, "done": 2})
        self.assertEqual(self.led("sms_blue")["mode"], "blink")
        answer = self.panel.do("after 10s", "expect sms_blue off", "notify SMS NEW_SMS")
        self.assertEqual(answer, {"ok": False, "done": 1, "line": 2, "message": "expected: sms_blue off; shown: sms_blue on 4"})
        self.assertEqual(self.panel.do("alive", "")["line"], 1)
        self.assertIn("cannot read", self.panel.do("", 'include "/etc/passwd"')["message"])
        self.assertIn("20000", self.panel.do("repeat 1000", "repeat 1000", "notify MAIN POWERON", "end", "end")["message"])
        self.assertTrue(self.panel.do("expect alive")["ok"])

    def test_time(self):
        self.panel.time("pause")
        begin = self.panel.state()["clock"]["now_ms"]
        self.panel.do("notify SMS NEW_SMS")
        self.assertEqual(self.panel.state()["clock"]["next_ms"], begin + 10_000)
        self.assertTrue(self.panel.time("step")["ok"])
        self.assertEqual(self.panel.state()["clock"]["now_ms"], begin + 10_000)
        self.assertTrue(self.panel.do("expect sms_blue on 4", "clock 23:59")["ok"])
        self.panel.time("3600")
        started = time.monotonic()
        time.sleep(0.5)
        self.panel.time("pause")
        passed = self.panel.state()["clock"]["now_ms"] - begin
        self.assertGreater(passed, 0.2 * 3_600_000)
        self.assertLess(passed, (time.monotonic() - started + 0.2) * 3_600_000)
        self.assertFalse(self.panel.time("7")["ok"])

    def test_a_new_device(self):
        self.panel.do("notify SMS NEW_SMS", "after 1h")
        for product in self.panel.state()["products"]:
            self.assertTrue(self.panel.post("/new", product)["ok"])
            state = self.panel.state()
            self.assertEqual(state["product"], product)
            self.assertLess(state["clock"]["now_ms"], 60_000)
            lit = {name for name, look in state["leds"].items() if look["brightness"] > 0}
            on_front = {led["name"] for lens in state["front"] for led in lens["leds"]}
            self.assertTrue(lit and lit <= on_front, f"{product}: {lit - on_front}")
        self.assertFalse(self.panel.post("/new", "toaster")["ok"])

    def test_a_scenario_is_played_and_kept(self):
        self.panel.time("3600")
        self.panel.post("/play", "scenarios/handheld/first-minute.scn")
        story = {"lines": [], "next": 0}
        for _ in range(600):
            story = self.panel.state()["story"]
            if story["next"] == len(story["lines"]):
                break
            time.sleep(0.05)
        self.assertEqual({line["state"] for line in story["lines"]}, {"held"})
        self.assertEqual(story["lines"][-1]["text"], "expect dark")
        self.assertFalse(self.panel.post("/play", "../../etc/passwd")["ok"])
        self.panel.time("pause")
        self.panel.do("notify MAIN POWERON", "repeat 3", "notify SLEEP 1", "after 1500ms", "notify SLEEP 0", "end", "kill", "start")
        kept = pathlib.Path(self.place) / "kept.scn"
        kept.write_text(self.panel.get("/keep"))
        run = subprocess.run([simulator, "run", "--quiet", kept], capture_output=True, text=True, check=False)
        self.assertEqual(run.returncode, 0, run.stderr + kept.read_text())
        self.assertIn("repeat 3\n", kept.read_text())

    def test_events(self):
        with socket.create_connection(("127.0.0.1", self.panel.port)) as link, link.makefile("rb") as stream:
            link.sendall(f"GET /events HTTP/1.1\r\nHost: 127.0.0.1:{self.panel.port}\r\n\r\n".encode())
            read_event(stream)
            self.panel.do("notify SMS NEW_SMS")
            batch = read_event(stream)
            while not batch["changes"]:
                batch = read_event(stream)
            change = batch["changes"][0]
            self.assertEqual((change["led"], change["mode"], change["on_ms"]), ("sms_blue", "blink", 800))
            self.assertIn("kiv_bsp_set_leds_sync(sms_blue blink 4 800/1200) = 0", [line["text"] for line in batch["lines"]])

    def test_the_daemon_ends_and_starts_again(self):
        os.kill(daemon_of(self.panel.process), signal.SIGKILL)
        while self.panel.state()["daemon"]["alive"]:
            time.sleep(0.02)
        self.assertIn("signal 9", self.panel.state()["daemon"]["end"])
        self.assertFalse(self.panel.do("notify SMS NEW_SMS")["ok"])
        self.assertTrue(self.panel.do("start", "notify MAIN POWERON", "expect bat_green on 4")["ok"])

    def test_refuses_strangers(self):
        home = f"127.0.0.1:{self.panel.port}"
        for headers in ({"Host": "evil.example"}, {"Host": f"evil.example:{self.panel.port}"}, {"Host": "127.0.0.1"},
                        {"Origin": "http://evil.example"}, {"Origin": "null"}, {"Origin": f"https://{home}"},
                        {"X_Panel_Token": None}, {"X_Panel_Token": "0" * 32}):
            self.assertEqual(self.panel.ask("POST", "/do", "kill", **headers)[0], FORBIDDEN, headers)
            if "X_Panel_Token" not in headers:
                self.assertEqual(self.panel.ask("GET", "/state", **headers)[0], FORBIDDEN, headers)
        self.assertEqual(self.panel.ask("POST", "/do", "expect alive", Origin=f"http://{home}")[0], 200)
        self.assertEqual(self.panel.ask("POST", "/do", "#" * (BODY_MAX + 1))[0], TOO_LARGE)
        self.assertEqual(self.panel.ask("GET", "/../../etc/passwd")[0], 404)
        self.assertTrue(self.panel.do("expect alive")["ok"])

    def test_listens_on_loopback_alone(self):
        listening = pathlib.Path(f"/proc/{self.panel.process.pid}/net/tcp").read_text()
        addresses = {line.split()[1] for line in listening.splitlines() if line.split()[1].endswith(f":{self.panel.port:04X}")}
        self.assertEqual({address for address in addresses if not address.startswith("0100007F:")}, set())
        self.assertTrue(addresses)
        taken = subprocess.run([simulator, "panel", "--no-browser", "--port", str(self.panel.port)], cwd=ROOT,
                               capture_output=True, text=True, check=False)
        self.assertEqual(taken.returncode, 2, taken.stderr)

    def test_survives_garbage_and_crowds(self):
        self.panel.time("run")
        garbage = (b"\0" * 5000, b"GET / HTTP/9.9\r\n\r\n", b"POST /do HTTP/1.1\r\nContent-Length: -1\r\n\r\n", b"\r\n" * 9000,
                   b"GET /" + b"a" * 100_000, b"POST /do HTTP/1.1\r\nContent-Length: 99999999999999\r\n\r\nx", b"{}", b"",
                   b"GET / HTTP/1.1\r\n" + b"A: b\r\n" * 200_000)
        for text in garbage:
            with socket.create_connection(("127.0.0.1", self.panel.port)) as link:
                try:
                    link.sendall(text)
                except OSError:
                    pass # refused before its end
        crowd = [socket.create_connection(("127.0.0.1", self.panel.port)) for _ in range(1000)]
        refused = 0
        for link in crowd[-500:]:
            link.settimeout(10)
            try:
                refused += link.recv(100).startswith(b"HTTP/1.1 503")
            except ConnectionError:
                refused += 1
        self.assertGreater(refused, 400)
        for link in crowd:
            link.close()
        begin = time.monotonic()
        while True:
            try:
                before = self.panel.state()["clock"]["now_ms"]
                break
            except (AssertionError, OSError):
                self.assertLess(time.monotonic() - begin, 15)
                time.sleep(0.1)
        time.sleep(0.3)
        self.assertGreater(self.panel.state()["clock"]["now_ms"], before)

    def test_leaves_nothing_behind(self):
        daemon = daemon_of(self.panel.process)
        self.panel.process.send_signal(signal.SIGINT)
        self.assertEqual(self.panel.process.wait(20), 0)
        self.assertFalse(os.path.exists(f"/proc/{daemon}"))
        self.assertEqual(os.listdir(self.place), [])

    def test_what_it_opens_with(self):
        story = self.open("scenarios/paper-kite/wps.scn")
        self.assertEqual(story.state()["story"]["name"], "scenarios/paper-kite/wps.scn")
        wrong = subprocess.run([simulator, "panel", "TOASTER"], cwd=ROOT, capture_output=True, text=True, check=False)
        self.assertEqual(wrong.returncode, 2)
        self.assertIn("products are UFI", wrong.stderr)


if __name__ == "__main__":
    options = argparse.ArgumentParser()
    options.add_argument("--simulator", required=True)
    known, rest = options.parse_known_args()
    simulator = known.simulator
    unittest.main(argv=[sys.argv[0], *rest])
