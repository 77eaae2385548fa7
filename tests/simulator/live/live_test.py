"""Talking to a daemon that runs: at a terminal, from a pipe, from a shell; one that is started, and one that is there."""

import argparse
import os
import pathlib
import shutil
import signal
import subprocess
import sys
import tempfile
import time
import unittest

from terminal import Terminal

POWERED = "product UFI\nnv battery_exist=1 battery_value=80 network_type=LTE\nstart\nnotify MAIN POWERON\n"
CONTROL_C = "\x03"
CONTROL_D = "\x04"
SENSES = {"KIV_FAULTS": "1", "KIV_LOG": "none"}

options = None


def simulator(*arguments, given=""):
    return subprocess.run([options.simulator, *arguments], input=given, capture_output=True, text=True, timeout=60)


class Place(unittest.TestCase):
    def setUp(self):
        self.place = tempfile.TemporaryDirectory()
        self.addCleanup(self.place.cleanup)
        os.environ["TMPDIR"] = self.place.name
        os.environ["XDG_STATE_HOME"] = self.place.name
        self.device = self.place.name + "/device"

    def run_daemon(self, **environment):
        """One that others have started: it waits for the start record in the device directory."""
        os.mkdir(self.device, 0o700)
        process = subprocess.Popen([options.daemon], stderr=subprocess.DEVNULL,
                                   env={**os.environ, **SENSES, "KIV_DEVICE_DIR": self.device, **environment})
        self.addCleanup(process.wait)
        self.addCleanup(process.kill)
        while not pathlib.Path(self.device, "bus/MSG_ID_LED").exists():
            time.sleep(0.01)
        return process

    def run_traced_daemon(self):
        return self.run_daemon(KIV_TRACE=self.device + "/trace")

    def send(self, *words):
        return simulator("send", "--device", self.device, *words)


class FromAPipe(Place):
    def test_plays_and_shows_what_the_leds_do(self):
        done = simulator("live", given=POWERED + "repeat 2\nnotify NWINFO NETTYPE\nend\nexpect bat_green on 4\n")
        self.assertIn("bat_green      on 4\n", done.stdout)
        self.assertIn("1 expectation held, 0 failed\n", done.stdout)
        self.assertEqual(done.returncode, 0, done.stderr)

    def test_goes_on_behind_a_failed_expectation(self):
        done = simulator("live", given=POWERED + "expect dark\nexpect bat_green on 4\n")
        self.assertIn("standard input:5: expected: dark\n", done.stderr)
        self.assertIn("1 expectation held, 1 failed\n", done.stdout)
        self.assertEqual(done.returncode, 1)

    def test_ends_at_a_line_that_cannot_be_read_or_played(self):
        for bad in ("notify NOBODY 1", "clock 22:00", "start"):
            done = simulator("live", "--product", "MODULE", given=f"expect alive\n{bad}\nexpect dark\n")
            self.assertIn("standard input:2: ", done.stderr)
            self.assertEqual(done.returncode, 2)

    def test_starts_a_daemon_for_the_first_statement_that_needs_one(self):
        done = simulator("live", given="expect alive\n")
        self.assertEqual((done.returncode, done.stderr), (0, ""))

    def test_tells_once_that_the_daemon_has_ended_and_leaves_nothing(self):
        done = simulator("live", "--daemon", "/bin/false", given="launch\nnotify MAIN POWERON\nexpect ended\n")
        self.assertIn("it ended with status 1", done.stderr)
        self.assertEqual(done.returncode, 1)
        self.assertEqual(os.listdir(self.place.name), [])

    def test_a_scenario_plays_as_it_is(self):
        scenario = pathlib.Path(self.place.name, "a.scn")
        scenario.write_text(POWERED + "expect bat_green on 4\n")
        self.assertEqual(simulator("live", str(scenario)).returncode, 0)


class WithARunningDaemon(Place):
    def test_a_session_starts_the_one_that_waits(self):
        daemon = self.run_traced_daemon()
        done = simulator("live", "--device", self.device, "--product", "UFI",
                         given="notify MAIN POWERON\nexpect net_red on 2\nkill\n")
        self.assertIn("waits for its start record", done.stdout)
        self.assertIn("net_red        on 2\n", done.stdout)
        self.assertIn("not this simulator's", done.stderr)
        self.assertIsNone(daemon.poll())
        self.assertTrue(os.path.isdir(self.device))

    def test_a_later_session_knows_what_stands(self):
        self.run_traced_daemon()
        simulator("live", "--device", self.device, "--product", "UFI", given="notify MAIN POWERON\n")
        done = simulator("live", "--device", self.device, given="expect only net_red on 2\nexpect timers 0\nstart\n")
        self.assertIn("the daemon runs already", done.stderr)
        self.assertEqual(done.returncode, 2)
        self.assertIn(" runs\n", done.stdout)

    def test_single_statements_from_a_shell(self):
        self.run_traced_daemon()
        for words in (["product", "UFI"], ["nv", "battery_exist=1", "battery_value=80", "sim_states=a b"], ["start"]):
            self.assertEqual(self.send(*words).returncode, 0)
        self.assertEqual(pathlib.Path(self.device, "nv/sim_states").read_text(), "a b\n")
        self.assertIn("bat_green      on 4\n", self.send("notify", "MAIN", "POWERON").stdout)
        self.assertEqual(self.send("expect bat_green on 4").returncode, 0)
        self.assertEqual(self.send("expect", "bat_green", "on", "3").returncode, 1)
        self.assertEqual(self.send("expect", "log", "POWERON").returncode, 2)
        self.assertEqual(self.send("fail", "kiv_bsp_set_leds_sync", "*", "-5", "1").returncode, 0)

    def test_without_a_trace_the_led_files_are_seen(self):
        self.run_daemon(KIV_FAULTS="0")
        self.send("product", "UFI")
        self.send("start")
        self.assertIn("net_red        on 2\n", self.send("notify", "MAIN", "POWERON").stdout)
        self.assertEqual(self.send("expect", "only", "net_red", "on", "2").returncode, 0)
        self.assertEqual(self.send("fail", "*", "*", "-5").returncode, 2)

    def test_says_so_when_nobody_is_there(self):
        self.assertEqual(self.send("notify", "MAIN", "POWERON").returncode, 2)
        os.mkdir(self.device, 0o700)
        nobody = self.send("notify", "MAIN", "POWERON")
        self.assertIn("no daemon runs", nobody.stderr)
        self.assertEqual(nobody.returncode, 2)

    def test_watching_tells_every_change_and_line(self):
        daemon = self.run_traced_daemon()
        with open(self.place.name + "/seen", "w+") as seen:
            watch = subprocess.Popen([options.simulator, "watch", "--device", self.device], stdout=seen)
            self.send("product", "UFI")
            self.send("start")
            self.send("notify", "MAIN", "POWERON")
            daemon.kill()
            daemon.wait()
            time.sleep(1)
            watch.terminate()
            self.assertEqual(watch.wait(), 0)
            seen.seek(0)
            lines = seen.read()
        self.assertIn("net_red        on 2\n", lines)
        self.assertIn("! ***************kiv_mirta_led start!***************\n", lines)
        self.assertIn("the daemon is gone\n", lines)


class UnderATool(Place):
    STORY = POWERED + "after 1h\nexpect bat_green on 4\n"

    def setUp(self):
        super().setUp()
        self.scenario = pathlib.Path(self.place.name, "a.scn")
        self.scenario.write_text(self.STORY)
        self.tool = pathlib.Path(self.place.name, "tool")
        self.tool.write_text('date +%s >"$0.began"\n"$@"\necho ended >"$0.ended"\n')

    def test_the_clock_is_set_in_the_daemon_alone(self):
        done = simulator("run", "--under", f"sh '{self.tool}'", str(self.scenario))
        self.assertEqual(done.returncode, 0, done.stderr)
        began = int(pathlib.Path(f"{self.tool}.began").read_text())
        self.assertAlmostEqual(began, time.time(), delta=120)
        self.assertTrue(pathlib.Path(f"{self.tool}.ended").exists())

    def test_a_session_waits_for_the_daemon(self):
        self.tool.write_text('sleep 1\nexec "$@"\n')
        done = simulator("live", "--product", "UFI", "--under", f"sh '{self.tool}'",
                         given="notify MAIN POWERON\nexpect net_red on 2\n")
        self.assertEqual(done.returncode, 0, done.stderr)

    @unittest.skipUnless(shutil.which("gdb"), "there is no gdb")
    def test_in_a_debugger_at_the_terminal(self):
        self.scenario.write_text(self.STORY + "notify SMS NEW_SMS\n")
        debugger = "gdb -q -ex 'set confirm off' -ex 'break recv_SMSstatus' --args"
        session = Terminal([options.simulator, "run", "--under", debugger, "--daemon", options.daemon,
                            str(self.scenario)])
        session.wait_for("(gdb) ")
        session.type("run\n")
        session.wait_for("hit Breakpoint 1, recv_SMSstatus")
        session.type("continue\n")
        session.wait_for("the run is over")
        session.type("quit\n")
        self.assertEqual(session.end(), 0)


class AtATerminal(Place):
    def test_answers_at_once_and_goes_on_after_mistakes(self):
        session = Terminal([options.simulator, "live", "--product", "UFI"])
        session.type("notify NOBODY 1\n")
        session.wait_for("unknown module 'NOBODY'")
        session.type("notify MAIN POWERON\n")
        session.wait_for("net_red        on 2\n")
        session.type("expect net_red on 2\n")
        session.wait_for("  holds\n")
        session.type("expect dark\n")
        session.wait_for("  expected: dark\n  shown:    net_red on 2\n")
        session.type("why net_red\n")
        session.wait_for("set off by     notify MAIN POWERON")
        session.type("help expect\n")
        session.wait_for("expect nothing changed")
        session.type(CONTROL_D)
        self.assertEqual(session.end(), 1)

    def test_a_change_appears_above_a_line_that_is_being_typed(self):
        session = Terminal([options.simulator, "live", "--product", "UFI"])
        session.wait_for("the device is ")
        device = session.wait_for("\n").strip()
        session.wait_for("sig_blue")
        session.type("expect bat_gr")
        session.wait_for("bat_gr")
        simulator("send", "--device", device, "notify MAIN POWERON")
        session.wait_for("net_red        on 2\nled> expect bat_gr")
        session.type("een off\n")
        session.wait_for("  holds\n")
        session.type(CONTROL_D)
        self.assertEqual(session.end(), 0)

    def test_completes_names_and_keeps_what_was_typed(self):
        session = Terminal([options.simulator, "live"])
        session.type("prod\tUF\t\n")
        session.wait_for("product UFI")
        session.type("start\nnoti\tSM\tNEW\t\n")
        session.wait_for("notify SMS NEW_SMS")
        session.type("notify NWINFO \t\t")
        session.wait_for("ROAMING_STATUS")
        session.type(CONTROL_C + "expect net_\t\t")
        session.wait_for("net_white")
        session.type(CONTROL_C + CONTROL_D)
        self.assertEqual(session.end(), 0)
        later = Terminal([options.simulator, "live"])
        later.wait_for("led> ")
        later.type("\x1b[A")
        later.wait_for("notify SMS NEW_SMS")
        later.type(CONTROL_C + CONTROL_D)
        self.assertEqual(later.end(), 0)

    def test_a_signal_leaves_nothing_behind(self):
        session = Terminal([options.simulator, "live", "--product", "UFI"])
        session.wait_for("led> ")
        session.type("after 1h\n")
        session.wait_for("after 1h\n")
        time.sleep(1)
        session.type(CONTROL_C)
        session.wait_for("led> ")
        self.assertEqual(session.end(signal.SIGTERM), 128 + signal.SIGTERM)
        self.assertEqual([name for name in os.listdir(self.place.name) if "kiv" in name], ["kiv_led_sim_history"])

    def test_the_leds_in_colour_blinking_in_their_rhythm(self):
        self.run_traced_daemon()
        self.send("product", "UFI")
        self.send("nv", "battery_exist=1", "battery_value=10")
        self.send("start")
        self.send("notify", "MAIN", "POWERON")
        watch = Terminal([options.simulator, "watch", "--device", self.device])
        red_lit = "\x1b\\[1;91m●"
        red_dark = "\x1b\\[2m○.*bat_red"
        watch.raw_until(red_lit)
        times = []
        for shown in (red_dark, red_lit, red_dark, red_lit):
            watch.raw_until("(?s)" + shown)
            times.append(time.monotonic())
        on_s, off_s = times[2] - times[1], times[3] - times[2]
        self.assertAlmostEqual(on_s, 0.8, delta=0.3)
        self.assertAlmostEqual(off_s, 1.2, delta=0.3)
        watch.type("q")
        self.assertEqual(watch.end(), 0)


if __name__ == "__main__":
    parser = argparse.ArgumentParser()
    parser.add_argument("--simulator", required=True)
    parser.add_argument("--daemon", required=True)
    options, rest = parser.parse_known_args()
    unittest.main(argv=sys.argv[:1] + rest, verbosity=2)
