"""A program at a pseudo-terminal: what it shows is read, what is typed is sent."""

import os
import pty
import re
import select
import signal
import time

PATIENCE_S = 30
ESCAPES = re.compile(r"\x1b\[[0-9;?]*[a-zA-Z]|\x1b[=>()][0-9B]?|\r")


class Terminal:
    def __init__(self, command, environment=None):
        self.pid, self.fd = pty.fork()
        if self.pid == 0:
            os.environ.update({"TERM": "xterm", "LC_ALL": "C.UTF-8", **(environment or {})})
            os.execvp(command[0], command)
        self.shown = ""  # since it was last waited for, escape sequences and all

    def type(self, text):
        os.write(self.fd, text.encode())

    def wait_for(self, text):
        """Returns what was shown up to the end of text, as plain text."""
        until = time.monotonic() + PATIENCE_S
        while text not in ESCAPES.sub("", self.shown):
            if not self._read_more(until):
                raise AssertionError(f"{text!r} was not shown, but\n{ESCAPES.sub('', self.shown)}")
        plain = ESCAPES.sub("", self.shown)
        self.shown = plain[plain.index(text) + len(text):]
        return plain[:plain.index(text) + len(text)]

    def raw_until(self, pattern):
        """The same by a pattern, over the escape sequences themselves."""
        until = time.monotonic() + PATIENCE_S
        while not (found := re.search(pattern, self.shown)):
            if not self._read_more(until):
                raise AssertionError(f"{pattern!r} was not shown, but\n{self.shown!r}")
        self.shown = self.shown[found.end():]
        return found

    def _read_more(self, until):
        ready, _, _ = select.select([self.fd], [], [], max(0, until - time.monotonic()))
        try:
            more = os.read(self.fd, 65536).decode(errors="replace") if ready else ""
        except OSError:  # the program has gone
            more = ""
        self.shown += more
        return more != ""

    def end(self, first_signal=None):
        """Waits for the end of the program; returns its exit code."""
        if first_signal:
            os.kill(self.pid, first_signal)
        until = time.monotonic() + PATIENCE_S
        while self._read_more(until):
            pass
        if time.monotonic() >= until:
            os.kill(self.pid, signal.SIGKILL)
        os.close(self.fd)
        return os.waitstatus_to_exitcode(os.waitpid(self.pid, 0)[1])
