#!/usr/bin/env python3
"""A fault in the daemon is found by the property that should find it, and its history shows it on a real daemon:
fault_test.py EXPLORER PROPERTY STEPS OPTION..."""
import re
import subprocess
import sys

explorer, wanted, steps, *options = sys.argv[1:]
outcome = subprocess.run([explorer, "--single", *options], check=False, capture_output=True, text=True)
found = re.findall(r"^# Broken: .*?\(unknown (\d+) (.*?)\).* history, (\d+) steps", outcome.stdout, re.MULTILINE)
print(*found, sep="\n")
if outcome.returncode != 1 or (wanted, steps) not in [(broken, length) for broken, _, length in found]:
    sys.exit(f"property {wanted} should break after {steps} steps\n{outcome.stdout}{outcome.stderr}")
