#!/usr/bin/env python3
"""A fault in the daemon is found by the property that should find it, and its history shows it on a real daemon:
fault_test.py EXPLORER PLAY PROPERTY STEPS OPTION...

PLAY is the command that plays a scenario with the program that has the same fault.
"""
import re
import subprocess
import sys
import tempfile
from pathlib import Path

explorer, play, wanted, steps, *options = sys.argv[1:]
outcome = subprocess.run([explorer, "--single", *options], check=False, capture_output=True, text=True)
histories = [
    history
    for history in outcome.stdout.split("\n# Broken: ")[1:]
    if re.match(rf".*?\(unknown {wanted} .*?\).* history, {steps} steps:\n", history)
]
print(outcome.stdout)
if outcome.returncode != 1 or not histories:
    sys.exit(f"property {wanted} should break after {steps} steps\n{outcome.stderr}")
with tempfile.TemporaryDirectory() as folder:
    for number, history in enumerate(histories):
        Path(folder, f"{number}.scn").write_text(history.split("\n", 1)[1])
    sys.exit(subprocess.run([*play.split(), folder], check=False).returncode)
