"""The daemon allocates nothing once it has started: every notification, message, indication and timer, on every
product, with its waits a hundred times shorter. Exits 1 and names the callers when it does."""

import argparse
import mmap
import pathlib
import struct
import sys
import tempfile
import time

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parents[2] / "scripts"))
import footprint_rig as rig  # noqa: E402

REPORT_SIZE = 16 + 16 * 112
TR181_WRITES_S = 1.5  # 40 s and ten pauses, a hundred times shorter, and the emulator's own time
SETTINGS = [
    dict(night_mode_switch=1, night_mode_start_time="00:00", night_mode_end_time="00:00", nitz_sync_flag=1,
         thermal_led_enable=30, data_volume_limit_switch=1, data_volume_limit_unit="data",
         data_volume_limit_size="1_1", data_volume_alert_percent=50, monthly_tx_bytes=9999999, monthly_rx_bytes=1),
    dict(night_mode_switch=2, night_mode_start_time="23:00", night_mode_end_time="23:01", thermal_led_enable=90,
         data_volume_limit_unit="time", data_volume_limit_size="1.5", monthly_time=1),
    dict(night_mode_switch=0, thermal_led_enable=0, network_type="GSM", battery_charging=1, signalbar="x" * 200),
]


class HeapReport:
    def __init__(self):
        self.file = tempfile.NamedTemporaryFile()
        self.file.truncate(REPORT_SIZE)
        self.map = mmap.mmap(self.file.fileno(), REPORT_SIZE)

    def count(self):
        return struct.unpack_from("=I", self.map, 0)[0]

    def arm(self):
        struct.pack_into("=I", self.map, 4, 1)

    def callers(self):
        recorded = min(16, struct.unpack_from("=I", self.map, 8)[0])
        for index in range(recorded):
            file, symbol = (part.split(b"\0")[0].decode() for part in
                            struct.unpack_from("=80s32s", self.map, 16 + 112 * index))
            yield f"{pathlib.Path(file).name} {symbol or '(a function of its own)'}"


def work_through(device):
    for settings in SETTINGS:
        device.nv(**settings)
        device.notify([rig.POWERON])
        for command in rig.COMMANDS:
            device.send(rig.message(command))
        device.notify(rig.NOTIFICATIONS)
        device.notify([(rig.PPP, 0x1, "1")])
        for indication in rig.INDICATIONS:
            device.indicate(indication)
        device.send(b"\1\2\3")
        device.send(rig.message(rig.NOTIFY, rig.WLAN, 0x10, "w" * 1019))
        time.sleep(0.3)  # timers: 5 s, 10 s and 20 s
        device.notify(rig.POWER_OFF)
        device.settle()


def allocations(options, product, hurry):
    report = HeapReport()
    variables = {"LD_PRELOAD": options.hook, "KIV_HEAP_REPORT": report.file.name, "KIV_HURRY": hurry}
    prefix = [part for part in options.emulator.split(";") if part]
    environment = variables
    if prefix:
        prefix += [part for name, value in variables.items() for part in ("-E", f"{name}={value}")]
        environment = {}
    with rig.Rig(options.daemon, product, prefix=prefix, environment=environment) as device:
        time.sleep(0.2)
        at_start = report.count()
        report.arm()
        work_through(device)
        time.sleep(TR181_WRITES_S)
        if not (device.dir / "tr181/DEV.LEDS.LED10").exists():
            raise RuntimeError("the TR-181 records have not been written")
        return at_start, report.count() - at_start, list(report.callers())


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("--daemon", required=True)
    parser.add_argument("--hook", required=True)
    parser.add_argument("--emulator", default="")
    options = parser.parse_args()
    failed = False
    for product in rig.PRODUCTS:
        at_start, later, callers = allocations(options, product, "100")
        print(f"{product}: {at_start} allocations up to the end of start, {later} afterwards")
        if at_start == 0:
            print("  the hook counts nothing: the daemon's threads alone allocate at start")
        failed = failed or later != 0 or at_start == 0
        for caller in callers:
            print(f"  {caller}")
    sys.exit(1 if failed else 0)


if __name__ == "__main__":
    main()
