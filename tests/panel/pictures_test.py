#!/usr/bin/env python3
"""Pictures: what is drawn is what the timeline tells, and docs/ holds what the program draws now."""
import argparse
import pathlib
import re
import subprocess
import sys
import tempfile
import unittest
import xml.etree.ElementTree as xml

ROOT = pathlib.Path(__file__).resolve().parents[2]
PICTURE_WIDTH = 800
CHANGE = re.compile(r"^\s+(?:\d+\.\d+ +)?(\w+) +((?:on|blink|off).*)$")
simulator = ""


def run(scenario, *options):
    command = [simulator, "run", *options, scenario]
    return subprocess.run(command, cwd=ROOT, capture_output=True, text=True, check=False)


def drawn(path):
    return xml.parse(path).getroot()


def elements(picture, name, kind):
    return [e for e in picture.iter("{http://www.w3.org/2000/svg}" + name) if e.get("class", "").startswith(kind)]


def texts(picture, kind=""):
    return ["".join(e.itertext()) for e in elements(picture, "text", kind)]


def is_lit(look):
    return look != "off" and not look.endswith(" 0")


class Pictures(unittest.TestCase):
    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.folder = pathlib.Path(folder.name)
        self.file = self.folder / "a.svg"

    def play(self, text):
        scenario = self.folder / "a.scn"
        scenario.write_text(text)
        return run(scenario, "--picture", self.file)

    def test_bars_are_those_of_the_timeline(self):
        for scenario in sorted((ROOT / "scenarios").glob("*/all-indicators.scn")):
            with self.subTest(scenario.parent.name):
                timeline = run(scenario, "--picture", self.file).stdout
                shown = {}
                for line in timeline.splitlines():
                    change = CHANGE.match(line)
                    if change and is_lit(change[2]):
                        shown.setdefault(change[1], []).append(change[2])
                self.assertGreater(len(shown), 3)
                bars = {}
                for bar in elements(drawn(self.file), "rect", "bar"):
                    bars.setdefault(bar.get("data-led"), []).append(bar.get("data-look"))
                    self.assertEqual("blink" in bar.get("data-look"), bar.get("fill").startswith("url(#blink-"))
                    self.assertLessEqual(float(bar.get("x")) + float(bar.get("width")), PICTURE_WIDTH)
                self.assertEqual(bars, shown)

    def test_a_trace_is_drawn_like_its_run(self):
        trace = self.folder / "a.trace"
        of_trace = self.folder / "trace.svg"
        run("scenarios/handheld/a-day.scn", "--picture", self.file, "--trace", trace)
        subprocess.run([simulator, "show", "--picture", of_trace, trace], capture_output=True, check=True)
        drawn_bars = [[(bar.get("data-led"), bar.get("data-look")) for bar in elements(drawn(picture), "rect", "bar")]
                      for picture in (self.file, of_trace)]
        self.assertGreater(len(drawn_bars[0]), 10)
        self.assertEqual(*drawn_bars)
        self.assertIn("notify MAIN POWERON", texts(drawn(of_trace)))

    def test_idle_days_are_shortened(self):
        self.play("product UFI\nnv battery_exist=1 battery_value=80\nstart\nnotify MAIN POWERON\nafter 10s\n"
                  "notify SMS NEW_SMS\nafter 10s\nafter 3d\nnotify SLEEP 1\nafter 20s\nnotify SLEEP 0\nafter 5s\n")
        picture = drawn(self.file)
        self.assertEqual(len(elements(picture, "rect", "break")), 1)
        blinking = [bar for bar in elements(picture, "rect", "bar") if bar.get("data-look") == "blink 800/1200 4"]
        self.assertGreater(float(blinking[0].get("width")), 40)
        self.assertIn("72:00:20 h", texts(picture))

    def test_a_failed_expectation_stands_out(self):
        result = self.play("product UFI\nstart\nexpect alive\nnotify MAIN POWERON\nexpect net_blue on 2\n")
        self.assertEqual(result.returncode, 1)
        self.assertEqual(texts(drawn(self.file), "failed"), ["✗ expect net_blue on 2, shown: net_blue off"])
        self.assertIn("✓ expect alive", texts(drawn(self.file)))

    def test_any_text_can_be_drawn(self):
        result = self.play('product UFI\nnv a="<&\\">"\nstart\nnv network_type="<b>\\xff\\x01&"\nnotify SMS NEW_SMS "]]>"\n')
        self.assertEqual(result.returncode, 0, result.stderr)
        self.assertIn('notify SMS NEW_SMS "]]>"', texts(drawn(self.file)))

    def test_takes_one_scenario(self):
        self.assertEqual(run("scenarios/faults", "--picture", self.file).returncode, 2)
        self.assertEqual(run("scenarios/faults/nv.scn", "--picture", "/nowhere/a.svg").returncode, 2)

    def test_docs_are_current(self):
        subprocess.run([ROOT / "scripts/pictures", simulator, self.folder], capture_output=True, check=True)
        names = sorted(path.name for path in self.folder.glob("*.svg"))
        self.assertEqual(len(names), 6)
        for name in names:
            same = (self.folder / name).read_text() == (ROOT / "docs" / name).read_text()
            self.assertTrue(same, f"docs/{name} is not what the program draws: run scripts/pictures")


if __name__ == "__main__":
    options = argparse.ArgumentParser()
    options.add_argument("--simulator", required=True)
    known, rest = options.parse_known_args()
    simulator = known.simulator
    unittest.main(argv=[sys.argv[0], *rest])
