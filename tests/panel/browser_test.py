#!/usr/bin/env python3
"""The panel's page in a real browser, read as a person sees it: from the drawing."""
import argparse
import os
import pathlib
import shutil
import signal
import subprocess
import sys
import tempfile
import unittest

from browser import Browser
from panel_process import Panel

PRODUCTS = ("UFI", "DATA_CARD", "PAPER_KITE", "MODULE", "UNI_CORE_CPE")
HOUR_MS = 3_600_000
SKIPPED = 77
IS_LIT = """const led = document.querySelector(`[data-led="${arguments[0]}"]`);
            return Number(led.querySelector('.core').getAttribute('opacity')) > 0;"""
SHOWN_LIT = """return [...document.querySelectorAll('.led')].filter((led) =>
            Number(led.querySelector('.core').getAttribute('opacity')) > 0).map((led) => led.dataset.led).sort().join(' ')"""
DEVICE_MS = """const [h, m, s] = document.getElementById('since').textContent.match(/(?:(\\d+) d )?(\\d+):(\\d+):([\\d.]+)/).slice(2);
            return Math.round(((Number(h) * 60 + Number(m)) * 60 + Number(s)) * 1000);"""
LENS_SAYS = """return [...document.querySelectorAll('.lens')].some((lens) =>
            lens.getAttribute('aria-label') === arguments[0]);"""
simulator = ""


class Page(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.browser = Browser("--window-size=1400,1100")
        cls.addClassCleanup(cls.browser.end)

    def open(self, what="UFI"):
        panel = Panel(simulator, what)
        self.addCleanup(panel.end)
        panel.time("pause")
        self.browser.open(panel.url)
        return panel

    def wait_lit(self, led, lit=True):
        self.browser.until(f"return (() => {{ {IS_LIT} }})() === arguments[1]", led, lit)

    def click_button(self, text, where="body"):
        self.browser.until("""const found = [...document.querySelectorAll(arguments[1] + ' button')]
            .find((one) => one.textContent === arguments[0]); found?.click(); return !!found;""", text, where)

    def choose(self, control, word):
        self.browser.run("""const list = document.querySelector(`[data-control="${arguments[0]}"]`);
            list.value = [...list.options].find((one) => one.text === arguments[1]).value;
            list.dispatchEvent(new Event('change', { bubbles: true }));""", control, word)

    def device_ms(self):
        return self.browser.run(DEVICE_MS)

    def test_every_product_opens(self):
        for product in PRODUCTS:
            with self.subTest(product):
                self.browser.complaints()
                panel = self.open(product)
                looks = panel.state()["leds"].items()
                lit = sorted(name for name, look in looks if look["mode"] == "on" and look["brightness"] > 0)
                self.browser.until(f"return (() => {{ {SHOWN_LIT} }})().includes(arguments[0])", " ".join(lit))
                self.assertTrue(lit)
                self.assertEqual(self.browser.complaints(), [])

    def test_offers_what_the_product_hears(self):
        offered = """return [...document.querySelectorAll('#controls [data-says]')].filter((one) => !one.closest('[hidden]'))
            .map((one) => one.textContent || one.closest('label').textContent.trim()).join('|')"""
        wanted = {"UFI": ("Self-test", "Voicemail"), "DATA_CARD": ("Bars", "On"), "MODULE": ("rings", "WPS pairing")}
        for product, (shown, hidden) in wanted.items():
            with self.subTest(product):
                self.open(product)
                self.browser.until(f"return !(() => {{ {offered} }})().split('|').includes(arguments[0])", hidden)
                self.assertIn(shown, self.browser.run(offered))

    def test_a_click_lights_the_right_led(self):
        self.open()
        self.wait_lit("net_blue")
        self.choose("network", "no service")
        self.wait_lit("net_red")
        self.wait_lit("net_blue", False)
        self.browser.until(LENS_SAYS, "Network: red, on, brightness 2 of 4")
        self.click_button("Off", "#controls")
        self.wait_lit("wifi_blue", False)
        self.browser.until("return document.getElementById('done').textContent.includes('notify WLAN CURRENT_STATUS 0')")
        self.click_button("Shut down")
        self.browser.until(f"return (() => {{ {SHOWN_LIT} }})() === ''")

    def test_two_colours_at_once_are_marked(self):
        self.open("MODULE")
        self.wait_lit("net_14")
        self.choose("network", "3G")
        self.wait_lit("net_16")
        self.wait_lit("net_14")
        self.browser.until("return [...document.querySelectorAll('.both')].some((one) => one.textContent === '2 lit')")

    def test_blinks_in_its_rhythm(self):
        panel = self.open()
        self.click_button("New message")
        self.browser.until(LENS_SAYS, "Messages: blue, blinking, 0.8 s on, 1.2 s off, brightness 4 of 4")
        for wait_ms, lit in ((0, True), (799, True), (2, False), (1198, False), (2, True)):
            panel.do(f"after {wait_ms}ms")
            self.wait_lit("sms_blue", lit)
        panel.time("1")
        self.wait_lit("sms_blue", True)
        self.wait_lit("sms_blue", False)
        self.wait_lit("sms_blue", True)

    def test_time(self):
        self.open()
        self.click_button("New message")
        begin = self.device_ms()
        self.click_button("Step to next deadline")
        self.browser.until(f"return (() => {{ {DEVICE_MS} }})() === arguments[0]", begin + 10_000)
        self.browser.until(LENS_SAYS, "Messages: blue, on, brightness 4 of 4")
        self.browser.click('input[name="speed"][value="3600"]')
        self.browser.until(f"return (() => {{ {DEVICE_MS} }})() > arguments[0]", begin + HOUR_MS)
        self.click_button("Pause")
        self.browser.until("return document.getElementById('run').textContent === 'Run'")
        stopped = self.browser.until(DEVICE_MS)
        self.assertEqual(self.browser.until(DEVICE_MS), stopped)
        self.browser.run("document.getElementById('clock').value = '22:30'")
        self.click_button("Set")
        self.browser.until("return document.getElementById('wall').textContent.endsWith('22:30:00')")

    def test_a_scenario_is_played_to_its_end_and_kept(self):
        panel = self.open()
        panel.time("3600")
        self.browser.run("document.getElementById('scenario').value = 'scenarios/handheld/first-minute.scn'")
        self.click_button("Play", "#story")
        self.browser.until("return document.getElementById('verdict').textContent === 'every expectation held'")
        marks = self.browser.run("return [...document.querySelectorAll('#lines li')].map((line) => line.className)")
        self.assertEqual(set(marks), {"held"})
        panel.time("pause")
        self.click_button("On", "#controls")
        self.wait_lit("bat_green")
        self.click_button("Keep as a scenario…")
        text = self.browser.until("return document.getElementById('kept').open && document.getElementById('kept-text').value")
        self.click_button("Close")
        with tempfile.TemporaryDirectory() as folder:
            kept = pathlib.Path(folder) / "kept.scn"
            kept.write_text(text)
            run = subprocess.run([simulator, "run", "--quiet", kept], capture_output=True, text=True, check=False)
        self.assertEqual(run.returncode, 0, run.stderr + text)
        self.assertIn("expect only bat_green on 4", text.splitlines()[-1])

    def test_a_failed_expectation_is_shown(self):
        panel = self.open()
        self.browser.type("#text", "notify SLEEP 1\nexpect dark")
        self.click_button("Do")
        self.browser.until("return document.getElementById('answer').textContent === arguments[0]",
                           "line 2: expected: dark; shown: bat_green blink 300/5000 4")
        self.assertTrue(panel.do("expect alive")["ok"])

    def test_two_pages_agree(self):
        panel = self.open()
        first = self.browser.windows()[0]
        self.browser.open_another(panel.url)
        second = [window for window in self.browser.windows() if window != first][0]
        self.choose("network", "5G")
        self.wait_lit("net_white")
        self.browser.to_window(first)
        self.wait_lit("net_white")
        self.click_button("Off", "#controls")
        self.wait_lit("wifi_blue", False)
        self.browser.to_window(second)
        self.wait_lit("wifi_blue", False)
        self.browser.call("DELETE", "/window")
        self.browser.to_window(first)
        self.assertTrue(panel.do("expect wifi_blue off")["ok"])

    def test_the_daemon_dies_and_starts_again(self):
        panel = self.open()
        os.kill(panel.state()["daemon"]["pid"], signal.SIGKILL)
        self.browser.until("return !document.getElementById('death').hidden")
        self.assertIn("signal 9", self.browser.run("return document.getElementById('cause').textContent"))
        self.click_button("Start it again")
        self.browser.until("return document.getElementById('death').hidden")
        self.click_button("On", "#controls")
        self.wait_lit("bat_green")

    def test_suits_its_person(self):
        def prefers(**features):
            pairs = [{"name": "prefers-" + name.replace("_", "-"), "value": value} for name, value in features.items()]
            self.browser.devtools("Emulation.setEmulatedMedia", features=pairs)

        background = "return getComputedStyle(document.body).backgroundColor"
        self.addCleanup(prefers)
        prefers(color_scheme="light", reduced_motion="reduce")
        panel = self.open()
        light = self.browser.run(background)
        self.click_button("New message")
        self.browser.until(LENS_SAYS, "Messages: blue, blinking, 0.8 s on, 1.2 s off, brightness 4 of 4")
        for _ in range(4):
            panel.do("after 500ms")
            self.wait_lit("sms_blue", True)
        prefers(color_scheme="dark")
        self.assertNotEqual(self.browser.run(background), light)
        self.addCleanup(self.browser.devtools, "Emulation.clearDeviceMetricsOverride")
        self.browser.devtools("Emulation.setDeviceMetricsOverride", width=360, height=700, deviceScaleFactor=1, mobile=True)
        self.assertLessEqual(self.browser.run("return document.documentElement.scrollWidth"), 360)

    def test_keyboard_alone(self):
        self.open()
        self.browser.run("document.querySelector('.lens').focus()")
        self.browser.press("Tab")
        self.browser.until("return document.getElementById('details').textContent.includes('net_blue (15): blue, on')")
        self.browser.until("return document.getElementById('details').textContent.includes('NWINFO') || "
                           "document.getElementById('details').textContent.includes('POWERON')")
        for _ in range(60):
            self.browser.press("Tab")
            if self.browser.run("return document.activeElement.textContent === 'New message'"):
                break
        self.browser.press("Enter")
        self.wait_lit("sms_blue")

    def test_log(self):
        self.open()
        self.click_button("New message")
        self.browser.run("document.getElementById('of-led').value = 'sms_blue'")
        self.browser.run("document.getElementById('of-led').dispatchEvent(new Event('input'))")
        lines = "return [...document.querySelectorAll('#log div')].map((line) => line.textContent)"
        self.browser.until(lines.replace("return ", "const all = ") + "; return all.length > 0 && all.every((one) => "
                           "one.includes('sms_blue') || one.includes('led_id=50'))")


if __name__ == "__main__":
    options = argparse.ArgumentParser()
    options.add_argument("--simulator", required=True)
    known, rest = options.parse_known_args()
    simulator = known.simulator
    if not shutil.which("chromedriver"):
        print("chromedriver is missing: ./test installs it")
        sys.exit(SKIPPED)
    unittest.main(argv=[sys.argv[0], *rest])
