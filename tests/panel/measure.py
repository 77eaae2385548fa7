#!/usr/bin/env python3
"""Measures the panel in a real browser: from click to changed LED, and a page in a storm of ten minutes."""
import argparse
import os
import statistics

from browser import Browser
from panel_process import Panel

CLICKS = 300
STORM_S = 600
NOTIFICATIONS_A_SECOND = 1000
NOTIFICATIONS_A_ROUND = 2
STEP_S = 5

# From the click to the moment the drawing has changed, in ms, one after the other.
CLICK_TO_LED = """const [clicks, done] = arguments;
const led = document.querySelector('[data-led="wifi_blue"]');
const button = (text) => [...document.querySelectorAll('#controls button')].find((one) => one.textContent === text
    && one.closest('fieldset').textContent.startsWith('Wi-Fi'));
const times = [];
let begin = 0;
const click = () => { begin = performance.now(); button(led.dataset.lit === 'true' ? 'Off' : 'On').click(); };
new MutationObserver(() => {
  times.push(performance.now() - begin);
  if (times.length < clicks) { setTimeout(click, 20); } else { done(times); }
}).observe(led, { attributeFilter: ['data-lit'] });
click();"""
WATCH_FRAMES = """window.longest = 0; window.frames_seen = 0; let before = performance.now();
const look = (now) => { window.longest = Math.max(window.longest, now - before); before = now; window.frames_seen++;
  requestAnimationFrame(look); };
requestAnimationFrame((now) => { before = now; requestAnimationFrame(look); });"""
HEAP = "gc(); return performance.memory.usedJSHeapSize / 1024 / 1024"
NODES = "return document.querySelectorAll('*').length"


def resident_mib(pid):
    with open(f"/proc/{pid}/statm", encoding="ascii") as statm:
        return int(statm.read().split()[1]) * os.sysconf("SC_PAGE_SIZE") / 1024 / 1024


def measure_clicks(browser, panel):
    panel.time("1")
    times = browser.call("POST", "/execute/async", {"script": CLICK_TO_LED, "args": [CLICKS]})
    cuts = statistics.quantiles(times, n=100)
    print(f"click to changed LED: median {statistics.median(times):.1f} ms, 99 % {cuts[98]:.1f} ms, {CLICKS} clicks")


def measure_storm(browser, panel):
    rounds = NOTIFICATIONS_A_SECOND * STEP_S // NOTIFICATIONS_A_ROUND
    step = (f"repeat {rounds}", "notify WLAN CURRENT_STATUS 0", "after 1ms", "notify WLAN CURRENT_STATUS 1", "after 1ms",
            "end")
    panel.time("pause")
    sizes = []
    browser.run(WATCH_FRAMES)
    for second in range(0, STORM_S, STEP_S):
        answer = panel.do(*step)
        assert answer["ok"], answer
        if second % (STORM_S // 5) == 0 or second == STORM_S - STEP_S:
            sizes.append(f"{second:5d} s: page {browser.run(HEAP):.1f} MiB, {browser.run(NODES)} elements, "
                         f"panel {resident_mib(panel.process.pid):.0f} MiB")
    longest, frames = browser.run("return [window.longest, window.frames_seen]")
    print(f"storm: {STORM_S} s of device time, {STORM_S * NOTIFICATIONS_A_SECOND} notifications")
    print("\n".join(sizes))
    print(f"{frames} frames, the longest {longest:.0f} ms")


def main():
    options = argparse.ArgumentParser()
    options.add_argument("--simulator", required=True)
    panel = Panel(options.parse_args().simulator, "UFI")
    browser = Browser("--window-size=1400,1000", "--js-flags=--expose-gc", "--enable-precise-memory-info")
    browser.open(panel.url)
    measure_clicks(browser, panel)
    measure_storm(browser, panel)
    browser.end()
    panel.end()


if __name__ == "__main__":
    main()
