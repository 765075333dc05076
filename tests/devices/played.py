"""Plays HID devices to vesk-report where there are none; see PlayedDevices.cpp for how a device is described."""

import os
import pathlib
import shutil
import subprocess
import tempfile

EXAMPLES = pathlib.Path(__file__).resolve().parent.parent.parent / "examples"
NODE = "/dev/hidraw0"


def example_session():
    """The example session's report descriptor, feature reports by ID, and input reports."""
    rows = [line.split() for line in (EXAMPLES / "session.hid").read_text().splitlines()]
    descriptor = next(bytes.fromhex("".join(row[2:])) for row in rows if row[0] == "R:")
    features = {row[3]: bytes.fromhex("".join(row[3:])) for row in rows if row[0] == "F:"}
    inputs = [bytes.fromhex("".join(row[3:])) for row in rows if row[0] == "E:"]
    return descriptor, features, inputs


DESCRIPTOR, FEATURES, INPUTS = example_session()
IMAGE = next(report for report in INPUTS if report[0] == 0x76)


def image(number):
    """A sensor image with this frame number."""
    return IMAGE[:4] + number.to_bytes(4, "little") + IMAGE[8:]


class Bench:
    """The machine that the program sees, in a folder that goes away."""

    def __init__(self, program, *libraries):
        self.program = str(program)
        self.libraries = [str(library) for library in libraries]
        self._temporary = tempfile.TemporaryDirectory()
        self.folder = pathlib.Path(self._temporary.name)
        self.devices = self.folder / "devices"
        (self.devices / "class").mkdir(parents=True)

    def close(self):
        self._temporary.cleanup()

    def add(self, node="hidraw0", *, bus=3, ids=(0x1234, 0x5678), name="Vesk Controller", serial="SN1",
            phys="usb-1/input0", descriptor=DESCRIPTOR, features=FEATURES, inputs=()):
        folder, shown = self.devices / node, self.devices / "class" / node / "device"
        for path in (folder, shown):
            shutil.rmtree(path, ignore_errors=True)
            path.mkdir(parents=True)
        (folder / "features").mkdir()
        (folder / "info").write_text(f"{bus:x} {ids[0]:x} {ids[1]:x}\n")
        for what, text in (("name", name), ("phys", phys), ("uniq", serial)):
            (folder / what).write_text(text)
        (folder / "descriptor").write_bytes(descriptor)
        for id, report in features.items():
            (folder / "features" / id).write_bytes(report)
        self.delivers(inputs, node)
        (shown / "uevent").write_text(f"DRIVER=hid-generic\nHID_ID={bus:04X}:{ids[0]:08X}:{ids[1]:08X}\n"
                                      f"HID_NAME={name}\nHID_PHYS={phys}\nHID_UNIQ={serial}\n")
        (shown / "report_descriptor").write_bytes(descriptor)

    def delivers(self, inputs, node="hidraw0", opening=1):
        """What is sent when the node is opened for this time: reports, and "gone" at the end."""
        lines = [report if isinstance(report, str) else report.hex(" ") for report in inputs]
        name = "inputs" if opening == 1 else f"inputs.{opening}"
        (self.devices / node / name).write_text("".join(line + "\n" for line in lines))

    def answers(self, id, what, node="hidraw0"):
        """What comes in place of a feature report: "mute", "gone", an errno, or other bytes."""
        file = self.devices / node / "features" / id
        if isinstance(what, bytes):
            file.write_bytes(what)
        else:
            file.with_name(id + ".is").write_text(str(what))

    def environment(self, **more):
        loaded = {"LD_PRELOAD": ":".join(self.libraries), "VESK_DEVICES": str(self.devices)}
        return {**os.environ, **loaded, **more}

    def run(self, *arguments, **more):
        """Output and errors are text; variables of the environment come as keywords."""
        result = subprocess.run([self.program, *map(str, arguments)], env=self.environment(**more), text=True,
                                stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.PIPE, timeout=60)
        result.errors = result.stderr.splitlines()
        return result

    def start(self, *arguments, **more):
        return subprocess.Popen([self.program, *map(str, arguments)], env=self.environment(**more), text=True,
                                stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.PIPE)
