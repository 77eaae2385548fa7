"""Each service file ends a running daemon promptly, with its own signal and time limit, whoever's uloop it links."""

import argparse
import configparser
import pathlib
import signal
import subprocess
import sys
import unittest

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parents[2] / "scripts"))
import footprint_rig as rig  # noqa: E402

PROMPT_S = 2
PROCD = """
procd_open_instance() { :; }
procd_close_instance() { :; }
procd_set_param() { echo "$@"; }
. "$0"
start_service
"""

options = None


def running_daemon():
    prefix = [part for part in options.emulator.split(";") if part]
    return rig.Rig(options.daemon, "MODULE", prefix=prefix)


def stop(process, first_signal, limit_s):
    """Does what a service manager does; returns the signal that the daemon ended by."""
    process.send_signal(first_signal)
    try:
        process.wait(limit_s)
    except subprocess.TimeoutExpired:
        process.kill()
    return signal.Signals(-process.wait())


class ServiceFiles(unittest.TestCase):
    def test_systemd_ends_it_with_the_unit_s_own_signal(self):
        unit = configparser.ConfigParser(strict=False, interpolation=None)
        unit.optionxform = str
        unit.read(options.unit)
        kill_signal = signal.Signals[unit["Service"]["KillSignal"]]
        limit_s = int(unit["Service"]["TimeoutStopSec"])
        self.assertLessEqual(limit_s, PROMPT_S)
        with running_daemon() as device:
            self.assertEqual(stop(device.process, kill_signal, limit_s), kill_signal)

    def test_procd_ends_it_within_its_limit(self):
        printed = subprocess.run(["sh", "-c", PROCD, options.init], check=True, capture_output=True, text=True).stdout
        settings = dict(line.split(maxsplit=1) for line in printed.splitlines())
        limit_s = int(settings["term_timeout"])
        self.assertLessEqual(limit_s, PROMPT_S)
        with running_daemon() as device:
            print("under procd it ends by", stop(device.process, signal.SIGTERM, limit_s).name)


if __name__ == "__main__":
    parser = argparse.ArgumentParser()
    parser.add_argument("--daemon", required=True)
    parser.add_argument("--unit", required=True)
    parser.add_argument("--init", required=True)
    parser.add_argument("--emulator", default="")
    options = parser.parse_args()
    unittest.main(argv=sys.argv[:1], verbosity=2)
