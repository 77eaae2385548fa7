#!/usr/bin/env python3
"""Writes a source with one fault put into it: mutate.py SOURCE OUTPUT OLD NEW. OLD must stand there exactly once."""
import sys
from pathlib import Path

source, output, old, new = sys.argv[1:]
text = Path(source).read_text()
if text.count(old) != 1:
    sys.exit(f"{source} holds {text.count(old)} times: {old}")
Path(output).parent.mkdir(parents=True, exist_ok=True)
Path(output).write_text(text.replace(old, new))
