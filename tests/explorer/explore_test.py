#!/usr/bin/env python3
"""What the explorer finds now is what its page and its scenarios say: explore_test.py EXPLORER SOURCE STATES

Explores each family of events by itself, up to a number of states. A search that comes to its end must have the page's
numbers, and every oddity that it meets must be known there and have a scenario that is no longer than its history.
"""
import re
import subprocess
import sys
import tempfile
from pathlib import Path


def rows(page):
    """Product and families of each row of the table, and the row."""
    found = {}
    for line in page.splitlines():
        cells = [cell.strip() for cell in line.strip("|").split("|")]
        if line.startswith("| ") and len(cells) == 6:
            found[cells[0], cells[1]] = cells
    return found


def oddities(page):
    return dict(re.findall(r"^- `(.*?)` \(.*, (\d+) steps\)", page, re.MULTILINE))


def main():
    explorer, source, states = sys.argv[1], Path(sys.argv[2]), sys.argv[3]
    with tempfile.TemporaryDirectory() as folder:
        page_now = Path(folder, "states.md")
        command = [explorer, "--single", "--states", states, "--jobs", "2", "--document", page_now]
        outcome = subprocess.run(command, check=False)
        if outcome.returncode != 0:
            sys.exit("the explorer found what it does not know")
        now = page_now.read_text()
    then = (source / "docs/states.md").read_text()

    wrong = []
    for key, cells in rows(now).items():
        known = rows(then).get(key)
        if cells[3] == "every state" and cells != known:
            wrong.append(f"{cells} stands in the page as {known}")
    for name, steps in oddities(now).items():
        scenario = source / "scenarios/oddities" / f"{name}.scn"
        if not scenario.exists():
            wrong.append(f"{name} has no scenario")
        elif int(oddities(then).get(name, 1000)) > int(steps):
            wrong.append(f"{name} takes {steps} steps, not {oddities(then).get(name)}")
    if wrong:
        sys.exit("\n".join(wrong) + "\nkiv_led_explore --document docs/states.md --scenarios scenarios/oddities")


main()
