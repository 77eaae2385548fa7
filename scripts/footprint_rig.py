"""Runs the daemon on the stand-ins and plays the system daemon and the other modules to it."""

import contextlib
import fcntl
import os
import pathlib
import shutil
import signal
import socket
import struct
import subprocess
import tempfile
import termios
import time

MAIN, PPP, SMS, WLAN, MDM, NWINFO, DST, SLEEP, LED, VOICE = 1, 3, 5, 10, 16, 23, 24, 27, 38, 43
NOTIFY, REGISTER = 12034, 12033
PRODUCTS = ["DRIVER_UFI", "ONLY_DATA_CARD", "PAPER_KITE", "MODULE", "UNI_CORE_CPE"]
POWERON = (MAIN, 0x40, "")

# Every notification that a module sends: module, event, payload.
NOTIFICATIONS = (
    [(MAIN, event, "") for event in (0x2, 0x80, 0x40, 0x100, 0x40, 0x200, 0x40000010)]
    + [(MDM, 0x1, ""), (NWINFO, 0x1, ""), (NWINFO, 0x2, ""), (NWINFO, 0x40, ""), (PPP, 0x1, "1"), (PPP, 0x4, "")]
    + [(WLAN, 0x10, text) for text in ("0", "1", "2", "3", "4")]
    + [(WLAN, event, text) for event in (0x80, 0x100) for text in ("0", "1", "2", "3", "on", "off")]
    + [(SMS, event, "") for event in (0x2, 0x4, 0x4, 0x1000)] + [(SMS, 0x2000, "0"), (SMS, 0x2000, "1")]
    + [(VOICE, 0x2, "0"), (VOICE, 0x2, "1"), (VOICE, 0x2, "2"), (DST, 0x1, "1")]
    + [(SLEEP, 0x1, "1"), (NWINFO, 0x40, ""), (SLEEP, 0x1, "0"), (SLEEP, 0x1, "5"), (SLEEP, 0x1, "0")]
)
POWER_OFF = [(MAIN, event, "") for event in (0x400, 0x800, 0x40000200, 0x40000400, 0x40004000, 0x20)]
COMMANDS = [6914, 6915, 6916, 6932, 6933, 6934, REGISTER, 1]
INDICATIONS = ["1350", "1351", "1356", "1357", "1352", "1350 null"]


def message(command, source=LED, event=0, payload=""):
    text = payload.encode() + b"\0"
    return struct.pack("=6HI", command, 0, LED, source, 4 + len(text), 0, event) + text


class Rig:
    """One device directory and one daemon in it, from its start record on."""

    def __init__(self, daemon, product, nv=None, prefix=(), environment=None):
        self.dir = pathlib.Path(tempfile.mkdtemp(prefix="kiv-rig-"))
        for folder in ("bus", "nv", "cfg", "bsp", "leds"):
            (self.dir / folder).mkdir(mode=0o700)
        (self.dir / "cfg/531").write_text("1\n")
        (self.dir / "cfg/6000").write_text(product + "\n")
        for sensor in range(7):
            (self.dir / f"bsp/sensor_{sensor}").write_text("40\n")
        for name in ("charger", "battery"):
            (self.dir / "bsp" / name).write_text("1\n")
        self.nv(battery_exist=1, battery_value=80, network_type="LTE", signalbar=3, simcard_roam="Home", **(nv or {}))
        self.system = self._queue("MSG_ID_DAEMON")
        self.main = self._queue("MSG_ID_MAIN")
        self.sender = socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM)
        self.sender.setsockopt(socket.SOL_SOCKET, socket.SO_SNDBUF, 1 << 20)
        own = {"KIV_DEVICE_DIR": str(self.dir), "KIV_LOG": "none", "TZ": "UTC"}
        self.process = subprocess.Popen([*prefix, str(daemon)], env={**os.environ, **own, **(environment or {})},
                                        stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL, start_new_session=True)
        try:
            self._handshake()
        except Exception:
            self.close()
            raise

    def __enter__(self):
        return self

    def __exit__(self, *_):
        self.close()

    def close(self):
        with contextlib.suppress(ProcessLookupError):
            os.killpg(self.process.pid, signal.SIGKILL)  # strace, killed alone, would let the daemon run on
        self.process.wait()
        for end in (self.system, self.main, self.sender):
            end.close()
        shutil.rmtree(self.dir)

    def _queue(self, name):
        queue = socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM)
        queue.bind(str(self.dir / "bus" / name))
        queue.settimeout(30)
        return queue

    def _handshake(self):
        record_of = struct.Struct("=i64s32si")
        hello = record_of.unpack(self.system.recv(1036))
        self.sender.connect(str(self.dir / "bus/MSG_ID_LED"))
        self.sender.send(message(REGISTER, MAIN, 0x2, "0123456789a"))
        self.sender.send(record_of.pack(2, b"", b"", 0))
        complete = record_of.unpack(self.system.recv(1036))
        if (hello[0], complete[0]) != (0, 6):
            raise RuntimeError(f"the daemon sent the records {hello[0]} and {complete[0]}")
        self.settle()

    def nv(self, **values):
        for key, value in values.items():
            (self.dir / "nv" / (key + ".new")).write_text(f"{value}\n")
            (self.dir / "nv" / (key + ".new")).rename(self.dir / "nv" / key)

    def send(self, data):
        """Returns once the daemon has taken the message, so that its queue never fills."""
        self.sender.send(data)
        deadline = time.monotonic() + 30
        while struct.unpack("i", fcntl.ioctl(self.sender, termios.TIOCOUTQ, b"\0" * 4))[0] > 0:
            if time.monotonic() > deadline or self.process.poll() is not None:
                raise RuntimeError("the daemon does not take messages any more")
            time.sleep(0.0005)

    def notify(self, notifications):
        for module, event, payload in notifications:
            self.send(message(NOTIFY, module, event, payload))

    def settle(self):
        """Returns once a message that means nothing has come and gone twice: all before it is done."""
        self.send(message(1))
        self.send(message(1))
        self.main.setblocking(False)
        try:
            while True:
                self.main.recv(1036)
        except BlockingIOError:
            pass

    def indicate(self, text):
        with socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM) as sender:
            sender.sendto(text.encode(), str(self.dir / "bsp/ind"))

    def tasks(self):
        return sorted(int(task.name) for task in pathlib.Path(f"/proc/{self.process.pid}/task").iterdir())
