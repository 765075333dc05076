#!/usr/bin/env python3
"""What the live commands do with devices that are played to them.

Usage: commands.py VESK-REPORT PLAYED-DEVICES
"""

import errno
import json
import os
import pty
import re
import signal
import struct
import fcntl
import subprocess
import sys
import termios
import time
import unittest

import played
from played import FEATURES, NODE, image

PROGRAM, LIBRARY = sys.argv[1:3]
IDS = ["a2", "a9", "d0", "d2", "dc", "de", "df", "e0", "e1", "e2", "e3", "e4", "e5", "ea", "ec"]
SUMMARY = "--Black Box Summary--"
GONE = f"{NODE}: error: the device has gone"


def counts(inputs, features=0, lost=0):
    return f"vesk-report: {inputs + features} reports ({inputs} input, {features} feature), {lost} lost"


class Commands(unittest.TestCase):
    def setUp(self):
        self.bench = played.Bench(PROGRAM, LIBRARY)
        self.addCleanup(self.bench.close)
        self.output = self.bench.folder / "out.hid"

    def ended(self, code, errors, *arguments, **more):
        """Runs; checks the exit code and all of standard error; returns standard output."""
        result = self.bench.run(*arguments, **more)
        self.assertEqual((result.errors, result.returncode), (errors, code), arguments)
        return result.stdout

    def refused(self, words, *arguments):
        result = self.bench.run(*arguments)
        self.assertEqual((result.returncode, result.stdout), (2, ""))
        self.assertIn(words, result.stderr)

    def recorded(self, prefix):
        return [line for line in self.output.read_text().splitlines() if line.startswith(prefix)]

    def nothing_is_left(self):
        self.assertEqual([path.name for path in self.bench.folder.glob("out*")], [])


class Lists(Commands):
    def test_devices_in_the_order_of_nodes(self):
        self.bench.add("hidraw10", bus=0x1C, name="Vesk auf dem Gerätebus", serial="")
        self.bench.add("hidraw9", ids=(0x046D, 0xC077), name="Mouse", serial="", descriptor=bytes.fromhex("85 D0 B1 02"))
        rows = [re.split(r"  +", line) for line in self.ended(0, [], "list").splitlines()]
        self.assertEqual(rows, [
            ["node", "bus", "ids", "name", "serial", "declared reports"],
            ["/dev/hidraw9", "USB", "046d:c077", "Mouse", "1 of 17 of ours, by chance"],
            ["/dev/hidraw10", "SPI", "1234:5678", "Vesk auf dem Gerätebus", "all 17 of ours: a controller"],
        ])

    def test_nothing(self):
        self.assertEqual(self.ended(0, [], "list"), "node  bus  ids  name  serial  declared reports\n")
        self.assertEqual(self.ended(0, [], "list", "-o", "json"), '{"format": "vesk-report-devices/1", "devices": []}\n')

    def test_json(self):
        self.bench.add("hidraw0", ids=(0x046D, 0xC077), name="Mouse", serial="", phys="", descriptor=b"")
        self.bench.add("hidraw1")
        document = json.loads(self.ended(0, [], "list", "-o", "json"))
        self.assertEqual(document["devices"][0], {
            "node": "/dev/hidraw0", "bus": "USB", "vendor": "046d", "product": "c077", "name": "Mouse", "serial": "",
            "physical_path": "", "reports": [], "is_controller": False})
        self.assertEqual(document["devices"][1]["reports"], [0x76, 0x77, *(int(id, 16) for id in IDS)])
        self.assertTrue(document["devices"][1]["is_controller"])

    def test_a_device_that_leaves_meanwhile_is_none(self):
        self.bench.add("hidraw0")
        self.bench.add("hidraw1")
        (self.bench.devices / "class/hidraw0/device/uevent").unlink()
        self.assertNotIn("/dev/hidraw0", self.ended(0, [], "list"))

    def test_a_device_that_the_machine_does_not_show(self):
        self.bench.add("hidraw0")
        shown = self.bench.devices / "class/hidraw0/device/report_descriptor"
        shown.unlink()
        shown.mkdir()  # can be opened, and then not be read
        what = "cannot be looked at: Is a directory"
        out = self.ended(3, [f"/dev/hidraw0: error: {what}"], "list")
        self.assertIn("none of ours", out)
        self.ended(3, ["error: no device speaks the controller's reports; there are:",
                       f"  /dev/hidraw0  USB 1234:5678  Vesk Controller  serial SN1  ({what})"], "read", "0xE0")
        self.assertIn(SUMMARY, self.ended(0, [], "read", "0xE0", "--device", NODE))

    def test_a_machine_that_lists_nothing(self):
        folder = self.bench.devices / "class"
        folder.rmdir()
        folder.write_text("no folder")
        error = "/sys/class/hidraw: error: cannot be listed: Not a directory"
        self.ended(3, [error], "list")
        self.assertEqual(json.loads(self.ended(3, [error], "list", "-o", "json"))["devices"], [])
        self.ended(3, [error], "read", "0xE0")
        self.ended(3, [error], "udev-rule")


class Reads(Commands):
    def setUp(self):
        super().setUp()
        self.bench.add()

    def test_all_in_the_order_of_the_table(self):
        document = json.loads(self.ended(0, [], "read", "all", "-o", "json"))
        self.assertEqual([r["report"]["hex"].lower() for r in document["reports"]], IDS)
        self.assertEqual({r["source"]["file"] for r in document["reports"]}, {NODE})

    def test_named_ones_in_the_order_of_their_names(self):
        out = self.ended(0, [], "read", "0xE0", "version", "-o", "hex")
        self.assertEqual([re.sub(r" [\d.]+ s$", "", line) for line in out.splitlines() if line.startswith("#")],
                         ["# feature 0xE0 black-box-summary, 7 bytes,", "# feature 0xD0 version, 12 bytes,"])

    def test_names_of_nothing(self):
        self.refused("no report is called so", "read", "0x12")
        self.refused("an input report, which cannot be asked for", "read", "sensor-image")
        self.ended(3, ["error: no device is called NONE; there are:", "  /dev/hidraw0  USB 1234:5678  Vesk Controller  "
                       "serial SN1  (speaks the controller's reports)"], "read", "all", "--device", "NONE")

    def test_answers_that_are_none(self):
        for id, what in (("a2", errno.EIO), ("a9", b""), ("d0", b"\xD2\x34"), ("dc", FEATURES["dc"] + b"\1\2"),
                         ("de", b"\xDE"), ("df", "mute"), ("e0", errno.ETIMEDOUT), ("e1", errno.EAGAIN)):
            self.bench.answers(id, what)
        out = self.ended(4, [
            f"{NODE}: error: 0xA2: the device refused the request: Input/output error",
            f"{NODE}: error: 0xA9: the device's answer is empty",
            f"{NODE}: error: 0xD0: the device answered with report 0xD2, 2 bytes long",
            f"{NODE}: note: 0xDC: 2 bytes behind the layout's 25; not decoded",
            f"{NODE}: error: 0xDE: 1 byte long, 2 expected; the missing ones are read as zero",
            f"{NODE}: error: 0xDF: no answer within 0.3 s",
            f"{NODE}: error: 0xE0: no answer within 0.3 s",
            f"{NODE}: error: 0xE1: the device refused the request: Resource temporarily unavailable",
        ], "read", "all", "--timeout", "0.3", "-v")
        self.assertIn("Open/Short Test P-SCAN Data:", out)
        self.assertNotIn(SUMMARY, out)

    def test_a_device_that_goes(self):
        self.bench.answers("e0", "gone")
        out = self.ended(3, [f"{NODE}: error: 0xE0: the device has gone"], "read", "0xDE", "0xE0", "0xDF", "-o", "hex")
        self.assertEqual([line.split()[2] for line in out.splitlines() if line.startswith("#")], ["0xDE"])

    def test_what_a_device_does_not_say(self):
        (self.bench.devices / "hidraw0/uniq").unlink()  # an old kernel
        self.assertIn(SUMMARY, self.ended(0, [], "read", "0xE0"))
        for file in ("name", "phys", "descriptor"):
            kept = (self.bench.devices / "hidraw0" / file).read_bytes()
            (self.bench.devices / "hidraw0" / file).unlink()
            self.ended(3, [f"{NODE}: error: cannot be opened: not a HID device node"], "read", "0xE0")
            (self.bench.devices / "hidraw0" / file).write_bytes(kept)
        (self.bench.devices / "hidraw0/descriptor").write_bytes(bytes(4097))
        self.ended(3, [f"{NODE}: error: cannot be opened: Message too long"], "read", "0xE0")

    def test_missing_rights(self):
        (self.bench.devices / "hidraw0/refused").write_text(str(errno.EACCES))
        (self.bench.devices / "hidraw0").chmod(0o700)
        result = self.bench.run("read", "0xE0", "-o", "json")
        rule = self.ended(0, [], "udev-rule").splitlines()
        self.assertEqual(result.returncode, 3)
        self.assertRegex(result.errors[0], rf"^{NODE}: error: cannot be opened: Permission denied \(mode 0700, owner \S+, "
                         r"group \S+\); this udev rule would help:$")
        self.assertEqual(result.errors[1:], rule)
        self.assertIn('KERNEL=="hidraw*", ATTRS{idVendor}=="1234", ATTRS{idProduct}=="5678", TAG+="uaccess"', rule)
        self.assertEqual([m["code"] for m in json.loads(result.stdout)["messages"]], ["device-denied"])

    def test_missing_rights_where_nothing_is_listed(self):
        (self.bench.devices / "hidraw0/refused").write_text(str(errno.EPERM))
        (self.bench.devices / "class").rename(self.bench.devices / "away")
        (self.bench.devices / "class").write_text("no folder")
        result = self.bench.run("read", "0xE0", "--device", NODE)
        self.assertEqual((result.returncode, len(result.errors)), (3, 1))
        self.assertIn(f"{NODE}: error: cannot be opened: Operation not permitted", result.stderr)

    def test_a_rule_for_nothing(self):
        self.ended(3, ["/dev/null: error: this is no HID device of this machine"], "udev-rule", "--device", "/dev/null")

    def test_a_line_on_the_terminal_says_what_is_waited_for(self):
        shown = on_terminal(self.bench, "read", "0xE0", "0xDE", "-o", "raw").replace(b"\r\n", b"\n")
        for text in (b"reading 0xE0 black-box-summary (1 of 2)\r\x1b[K", b"reading 0xDE adc-dump-state (2 of 2)\r\x1b[K"):
            self.assertIn(text, shown)
        self.assertNotIn(b"reading", on_terminal(self.bench, "-q", "read", "0xE0", "-o", "raw"))


class Snapshots(Commands):
    def setUp(self):
        super().setUp()
        self.bench.add()

    def test_hold_the_device(self):
        self.ended(0, [], "snapshot", "-O", self.output)
        lines = self.output.read_text().splitlines()
        self.assertRegex(lines[0], r"^# vesk-report [\d.]+, \d{4}-\d\d-\d\dT\d\d:\d\d:\d\dZ, on .+$")
        self.assertEqual(lines[1], "# Bus USB, device 1234:5678, serial SN1")
        self.assertEqual(lines[2], f"R: {len(played.DESCRIPTOR)} {played.DESCRIPTOR.hex(' ')}")
        self.assertEqual(lines[3:6], ["N: Vesk Controller", "P: usb-1/input0", "I: 3 1234 5678"])
        self.assertEqual([bytes.fromhex("".join(line.split()[3:])) for line in lines[6:]], [FEATURES[id] for id in IDS])

    def test_do_not_tell_whose_device_it_is_unless_they_may(self):
        text = self.ended(0, [], "snapshot", "--no-identity")
        for word in ("SN1", "usb-1", ", on "):
            self.assertNotIn(word, text)

    def test_an_interrupt_keeps_what_was_read(self):
        self.bench.answers("dc", "mute")
        process = self.bench.start("snapshot", "-O", self.output)
        time.sleep(0.5)
        process.send_signal(signal.SIGINT)
        _, errors = process.communicate(timeout=20)
        self.assertEqual((process.returncode, errors.splitlines()),
                         (0, [f"{NODE}: warning: interrupted; 4 of 15 reports were asked for"]))
        self.assertEqual([line.split()[3] for line in self.recorded("F:")], ["a2", "a9", "d0", "d2"])

    def test_an_interrupt_before_the_device_is_open_leaves_no_file(self):
        (self.bench.devices / "hidraw0/refused").write_text(str(errno.EACCES))
        for command in ("snapshot", "record"):
            process = self.bench.start(command, "-O", self.output)
            time.sleep(0.4)
            process.send_signal(signal.SIGTERM)
            _, errors = process.communicate(timeout=20)
            self.assertEqual((process.returncode, errors), (0, ""))
            self.nothing_is_left()


class Streams(Commands):
    def setUp(self):
        super().setUp()
        self.bench.add(inputs=[image(5), image(6), image(9), "gone"])

    def frames(self, out):
        return [json.loads(line)["value"]["FRAME_NUMBER"] for line in out.splitlines() if '"value"' in line]

    def test_what_was_sent_is_delivered_before_the_end(self):
        loss = f"{NODE}: warning: 0x76: number 9 follows 6: 2 lost"
        self.assertEqual(self.frames(self.ended(3, [loss, GONE, counts(3, lost=2)], "watch", "-o", "jsonl")), [5, 6, 9])
        self.assertEqual(self.frames(self.ended(3, [GONE], "-q", "watch", "-o", "jsonl")), [5, 6, 9])

    def test_a_recording_says_what_was_sent(self):
        self.ended(0, [counts(2)], "record", "-O", self.output, "--count", "2")
        self.assertEqual([bytes.fromhex("".join(line.split()[3:])) for line in self.recorded("E:")], [image(5), image(6)])

    def test_the_end_after_a_time(self):
        self.bench.add(inputs=[image(5)])
        begin = time.monotonic()
        self.ended(0, [counts(1)], "record", "-O", self.output, "--duration", "0.5")
        self.assertGreaterEqual(time.monotonic() - begin, 0.5)

    def test_reports_of_choice(self):
        self.bench.add(inputs=[*played.INPUTS, "gone"])
        out = self.ended(3, [GONE, counts(2)], "watch", "--report", "0x77", "-o", "hex")
        self.assertEqual({line.split()[2] for line in out.splitlines() if line.startswith("#")}, {"0x77"})
        self.bench.add()
        self.refused("0x99: no report is called so", "watch", "--report", "0x99")
        out = self.ended(0, [counts(0, 2)], "watch", "--report", "0xE0", "--interval", "0.05", "--count", "2")
        self.assertEqual(out.count(SUMMARY), 2)
        self.assertEqual(self.ended(0, [counts(0, 1)], "watch", "--report", "0xE0", "--interval", "0.05", "--changes-only",
                                    "--duration", "0.3").count(SUMMARY), 1)

    def test_feature_reports_beside_the_stream(self):
        self.bench.add(inputs=[image(5)])
        self.bench.answers("df", errno.EPIPE)
        failure = "the device refused the request: Broken pipe"
        self.ended(4, [f"{NODE}: error: 0xDF: {failure}", counts(1, 2)], "record", "-O", self.output, "--feature", "0xE0@60",
                   "--feature", "0xDF@60", "--feature", "0xDE", "--duration", "0.5")
        self.assertEqual(sorted(line.split()[3] for line in self.recorded("F:")), ["de", "e0"])
        self.assertEqual(self.recorded("# F"), [f"# F 0xDF error request-failed: {failure}"])

    def test_times_that_are_none(self):
        for text in ("0xE0@", "0xE0@x", "0xE0@0", "0xE0@nan", "0xE0@2000000"):
            self.refused("a time from 0.001 to 1000000 seconds was expected", "record", "--feature", text)
        self.refused("use jsonl", "watch", "-o", "json")
        self.refused("--interval", "watch", "--interval", "0")
        self.refused("nan is no number of seconds", "watch", "--duration", "nan")
        self.refused("--interval", "watch", "--interval", "x")

    def test_a_device_that_goes_while_it_is_asked(self):
        self.bench.add(inputs=[])
        self.bench.answers("e0", "gone")
        self.ended(3, [GONE, counts(0)], "watch", "--report", "0xE0")

    def test_a_device_that_returns(self):
        self.bench.delivers([image(1), "gone"])
        self.bench.delivers([image(2), image(3)], opening=2)
        out = self.ended(0, [f"{NODE}: warning: the device has gone; waiting for its return",
                             f"{NODE}: warning: the device is back, as {NODE}", counts(3)],
                         "watch", "--reconnect", "--count", "3", "-o", "jsonl")
        self.assertEqual(self.frames(out), [1, 2, 3])

    def test_a_device_that_returns_and_cannot_be_opened_is_told_once(self):
        self.bench.delivers([image(1), "gone"])
        process = self.bench.start("record", "--reconnect", "--duration", "3", "-O", self.output)
        away = process.stderr.readline()
        (self.bench.devices / "hidraw0/refused").write_text(str(errno.EACCES))
        _, errors = process.communicate(timeout=20)
        self.assertEqual(away, f"{NODE}: warning: the device has gone; waiting for its return\n")
        self.assertEqual(errors.splitlines(), [f"{NODE}: warning: the device is back, as {NODE}, but cannot be opened: "
                                               "Permission denied; trying on", counts(1)])
        self.assertEqual(process.returncode, 0)

    def test_a_machine_that_lists_nothing_any_longer_is_told_once(self):
        self.bench.delivers([image(1), "gone"])
        process = self.bench.start("record", "--reconnect", "--duration", "3", "-O", self.output)
        process.stderr.readline()
        folder = self.bench.devices / "class"
        folder.rename(self.bench.devices / "away")
        folder.write_text("no folder")
        _, errors = process.communicate(timeout=20)
        self.assertEqual(errors.splitlines(), [
            f"{NODE}: warning: /sys/class/hidraw cannot be listed: Not a directory; trying on", counts(1)])
        self.assertEqual(process.returncode, 0)

    def test_a_signal_is_a_good_end(self):
        self.bench.add(inputs=[image(5)])
        for number in (signal.SIGINT, signal.SIGTERM, signal.SIGHUP):
            process = self.bench.start("record", "-O", self.output)
            while not self.output.exists() or not self.recorded("E:"):
                time.sleep(0.02)
            process.send_signal(number)
            _, errors = process.communicate(timeout=20)
            self.assertEqual((process.returncode, errors.splitlines()), (0, [counts(1)]))
            self.output.unlink()

    def test_without_a_device_there_is_no_recording(self):
        for command in ("record", "snapshot"):
            self.ended(3, ["/dev/hidraw8: error: cannot be opened: No such file or directory"], command, "-O", self.output,
                       "--device", "/dev/hidraw8")
            self.nothing_is_left()


def on_terminal(bench, *arguments, columns=100, lines=30):
    """Runs on a terminal of its own; returns what it shows."""
    ours, theirs = pty.openpty()
    fcntl.ioctl(theirs, termios.TIOCSWINSZ, struct.pack("HHHH", lines, columns, 0, 0))
    process = subprocess.Popen([PROGRAM, *arguments], env=bench.environment(NO_COLOR="1"), stdin=theirs, stdout=theirs,
                               stderr=theirs)
    os.close(theirs)
    shown = b""
    while True:
        try:
            block = os.read(ours, 65536)
        except OSError:  # nobody holds the other end any longer
            break
        if not block:
            break
        shown += block
    os.close(ours)
    bench.code = process.wait(timeout=60)
    return shown


class Views(Commands):
    """The picture that is redrawn in place."""

    def shown(self, *arguments, **size):
        screen = on_terminal(self.bench, "watch", "--view", *arguments, **size).decode()
        self.assertTrue(screen.startswith("\x1b[?1049h\x1b[?25l"), screen[:40])
        pictures, after = screen.split("\x1b[?25h\x1b[?1049l")
        return pictures.split("\x1b[H")[-1].replace("\x1b[K", "").splitlines(), after.splitlines()

    def test_the_last_image(self):
        self.bench.add(inputs=[image(5), image(8)])
        self.bench.answers("df", errno.EPIPE)
        picture, after = self.shown("--duration", "0.4", "--scan", "P")
        self.assertEqual(picture[0], f"{NODE}  Vesk Controller")
        self.assertRegex(picture[1], r"^frame 8   \d+\.\d/s   34\.99 degC   2 lost$")
        self.assertEqual([line.split(",")[0] for line in picture if "SCAN" in line], ["P-SCAN I", "P-SCAN Q"])
        self.assertEqual(after, [f"{NODE}: warning: 0x76: number 8 follows 5: 2 lost", counts(2, lost=2)])
        self.assertEqual(self.bench.code, 0)

    def test_packets_and_reports_that_fail(self):
        self.bench.add(inputs=[report for report in played.INPUTS if report[0] == 0x77])
        self.bench.answers("df", errno.EPIPE)
        picture, after = self.shown("--duration", "0.4", "--report", "0x77", "--report", "0xDF")
        self.assertEqual(picture[1:3], ["2 ADC packets   0 lost", "waiting for a sensor image"])
        self.assertEqual(after, [f"{NODE}: error: 0xDF: the device refused the request: Broken pipe", counts(2)])
        self.assertEqual(self.bench.code, 4)

    def test_feature_reports_beside_the_image(self):
        self.bench.add(inputs=[image(5)])
        picture, after = self.shown("--duration", "0.4", "--report", "0x76", "--report", "0xE0")
        self.assertRegex(picture[1], r"^frame 5 ")
        self.assertEqual(after, [counts(1, 1)])

    def test_an_input_report_that_nobody_knows(self):
        self.bench.add(inputs=[image(5), bytes([0x55, 1, 2])])
        picture, after = self.shown("--duration", "0.4")
        self.assertRegex(picture[1], r"^frame 5 ")
        self.assertEqual(after, [f"{NODE}: error: 0x55: no report of the controller has this ID", counts(2)])

    def test_an_image_of_another_length(self):
        self.bench.add(inputs=[image(5) + b"more"])
        picture, after = self.shown("--duration", "0.4")
        self.assertEqual(picture[2], "waiting for a sensor image")
        self.assertEqual(after, [f"{NODE}: error: 0x76: 796 bytes long, exactly 792 expected; not decoded", counts(1)])
        self.assertEqual(self.bench.code, 4)

    def test_a_terminal_that_does_not_say_its_size(self):
        self.bench.add(inputs=[image(5)])
        picture, _ = self.shown("--duration", "0.4", columns=0, lines=0)
        self.assertLessEqual(len(picture), 24)

    def test_a_device_that_goes(self):
        self.bench.add(inputs=[image(5), "gone"])
        _, after = self.shown()
        self.assertEqual((after, self.bench.code), ([GONE, counts(1)], 3))

    def test_no_device(self):
        shown = on_terminal(self.bench, "watch", "--view", "--device", "/dev/hidraw8").decode()
        self.assertEqual(shown, "/dev/hidraw8: error: cannot be opened: No such file or directory\r\n")
        self.assertEqual(self.bench.code, 3)

    def test_quiet(self):
        self.bench.add(inputs=[image(5)])
        screen = on_terminal(self.bench, "-q", "watch", "--view", "--count", "1").decode()
        self.assertTrue(screen.endswith("\x1b[?25h\x1b[?1049l"), screen[-40:])

    def test_elsewhere_than_on_a_terminal_there_are_lines(self):
        self.bench.add(inputs=[image(5), "gone"])
        out = self.ended(3, [GONE, counts(1)], "watch", "--view")
        self.assertNotIn("\x1b", out)
        self.assertIn("Frame # = 5", out)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[3:])
