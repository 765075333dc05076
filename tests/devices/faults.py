#!/usr/bin/env python3
"""Every call with which the live commands deal with a device fails in turn.

Usage: faults.py VESK-REPORT FAILING-CALLS PLAYED-DEVICES
What must hold: the documented exit code; a message that names the device and the reason; all else is delivered; a file
is whole or is not there; no run hangs. What fails of the output is played in tests/faults; here it is what happens to
files that grow.
"""

import errno
import os
import sys
import unittest

import played
from played import FEATURES, NODE, image

PROGRAM, FAILING, PLAYED = sys.argv[1:4]
IDS = ["a2", "a9", "d0", "d2", "dc", "de", "df", "e0", "e1", "e2", "e3", "e4", "e5", "ea", "ec"]
IDENTITY = ["info", "name", "physical path", "serial number", "descriptor size", "descriptor"]  # asked for in this order
REFUSALS = (errno.EIO, errno.EPIPE, errno.EAGAIN, errno.ENOMEM)
OLD = "what was there before\n"


class Faults(unittest.TestCase):
    def setUp(self):
        self.bench = played.Bench(PROGRAM, FAILING, PLAYED)
        self.addCleanup(self.bench.close)
        self.output = self.bench.folder / "out"
        self.bench.add(inputs=[image(1), image(2), image(3)])
        self.bench.delivers([image(1), image(2), image(3)], opening=2)

    def failing(self, fault, *arguments):
        """One run; nobody is ever killed by a signal, which a failed assertion or an exception without a home would do."""
        self.output.unlink(missing_ok=True)
        result = self.bench.run(*arguments, VESK_FAULT=fault)
        self.assertGreaterEqual(result.returncode, 0, (fault, arguments, result.stderr))
        left = [path.name for path in self.bench.folder.glob("out?*")]
        self.assertEqual(left, [], (fault, arguments))
        return result

    def counts(self, *arguments):
        file = self.bench.folder / "counts"
        result = self.failing(f"count {file}", *arguments)
        self.assertEqual(result.returncode, 0, result.stderr)
        return {name: int(number) for name, number in (line.split() for line in file.read_text().splitlines())}

    def ended(self, code, errors, fault, *arguments):
        result = self.failing(fault, *arguments)
        told = [line for line in result.errors if not line.startswith("vesk-report: ") or "error" in line]
        self.assertEqual((result.returncode, told), (code, errors), (fault, arguments))
        return result

    def read_ids(self):
        return [line.split()[3] for line in self.output.read_text().splitlines() if line.startswith("F:")]

    def frames(self):
        rows = [line.split() for line in self.output.read_text().splitlines() if line.startswith("E:")]
        for row in rows:
            self.assertEqual(int(row[2]), len(row) - 3, "a line that is cut")
        return [int(row[7], 16) for row in rows]


class WhoADeviceIs(Faults):
    COMMANDS = (["read", "0xE0", "-o", "text"], ["read", "0xE0", "-o", "jsonl"], ["snapshot"],
                ["watch", "--count", "3", "-o", "hex"], ["record", "--count", "3"])

    def test_is_asked_for_in_the_order_that_the_others_rely_on(self):
        asked = self.counts("read", "0xE0", "--device", NODE, "-O", self.output)
        self.assertEqual(asked["ioctl"], len(IDENTITY) + 1)

    def test_a_device_that_does_not_say_it_is_not_opened(self):
        for command in self.COMMANDS:
            for number, what in enumerate(IDENTITY, 1):
                for code in (*REFUSALS, errno.ENODEV):
                    self.ended(3, [f"{NODE}: error: cannot be opened: {os.strerror(code)}"], f"ioctl {number} {code}",
                               *command, "-O", self.output)
                    self.assertEqual(self.output.exists(), command[0] in ("read", "watch"), (command, what))
                    if self.output.exists():
                        self.assertNotIn("BLACK_BOX", self.output.read_text())

    def test_an_interrupted_question_is_asked_again(self):
        for command in self.COMMANDS:
            for number in range(1, len(IDENTITY) + 1):
                self.ended(0, [], f"ioctl {number} {errno.EINTR}", *command, "-O", self.output)
        result = self.ended(3, [f"{NODE}: error: cannot be opened: {os.strerror(errno.EINTR)}"],
                            f"ioctl all {errno.EINTR}", "read", "0xE0")
        self.assertEqual(result.stdout, "")

    def test_opening_fails(self):
        for code in (errno.EIO, errno.EMFILE, errno.ENXIO, errno.ENODEV, errno.ENOMEM):
            for command in self.COMMANDS:
                self.ended(3, [f"{NODE}: error: cannot be opened: {os.strerror(code)}"], f"open 1 {code}", *command,
                           "--device", NODE)
        self.ended(0, [], f"open 1 {errno.EINTR}", "read", "0xE0", "--device", NODE)


class Requests(Faults):
    FIRST = len(IDENTITY) + 1

    def test_a_refused_one_is_told_and_the_others_are_read(self):
        for turn, id in enumerate(IDS):
            for code in REFUSALS:
                error = f"the device refused the request: {os.strerror(code)}"
                self.ended(4, [f"{NODE}: error: 0x{id.upper()}: {error}"], f"ioctl {self.FIRST + turn} {code}",
                           "snapshot", "-O", self.output)
                self.assertEqual(self.read_ids(), [other for other in IDS if other != id])
                self.assertIn(f"# F 0x{id.upper()} error request-failed: {error}\n", self.output.read_text())

    def test_nothing_is_asked_for_once_the_device_has_gone(self):
        for turn, id in enumerate(IDS):
            self.ended(3, [f"{NODE}: error: 0x{id.upper()}: the device has gone"],
                       f"ioctl {self.FIRST + turn} {errno.ENODEV}", "snapshot", "-O", self.output)
            self.assertEqual(self.read_ids(), IDS[:turn])

    def test_an_interrupted_one_is_made_again(self):
        for turn in range(len(IDS)):
            self.ended(0, [], f"ioctl {self.FIRST + turn} {errno.EINTR}", "snapshot", "-O", self.output)
            self.assertEqual(self.read_ids(), IDS)

    def test_a_short_answer_is_read_as_far_as_it_goes(self):
        for turn, id in enumerate(IDS):
            size = len(FEATURES[id])
            half = "1 byte" if size == 2 else f"{size // 2} bytes"
            told = [f"error: 0x{id.upper()}: {half} long, {size} expected; the missing ones are read as zero"]
            if id in ("d0", "d2"):
                told = [f"warning: 0x{id.upper()}: the text has no terminating zero; it ends with the report"]
            if id == "d2":
                told.append("error: 0xD2: HIDReportVeskPlugin: the extended version has fewer than six lines")
            self.ended(0 if id == "d0" else 4, [f"{NODE}: {text}" for text in told], f"ioctl {self.FIRST + turn} short",
                       "snapshot", "-O", self.output)
            self.assertEqual(self.read_ids(), IDS)

    def test_in_a_stream(self):
        asked = ("record", "-O", self.output, "--feature", "0xE0@60", "--feature", "0xDE@60", "--device", NODE)
        for code in REFUSALS:
            self.ended(4, [f"{NODE}: error: 0xE0: the device refused the request: {os.strerror(code)}"],
                       f"ioctl {self.FIRST} {code}", *asked, "--count", "4")
            self.assertEqual((self.read_ids(), self.frames()), (["de"], [1, 2, 3]))
        self.ended(0, [], f"ioctl {self.FIRST} {errno.EINTR}", *asked, "--count", "5")
        self.assertEqual(self.read_ids(), ["e0", "de"])
        self.ended(3, [f"{NODE}: error: the device has gone"], f"ioctl {self.FIRST + 1} {errno.ENODEV}", *asked)
        self.assertEqual(self.read_ids(), ["e0"])


class Streams(Faults):
    def setUp(self):
        super().setUp()
        self.record = ("record", "-O", self.output, "--device", NODE)

    def test_reading_fails(self):
        for number in (1, 2, 3):
            for code, text in ((errno.EIO, "the device has gone"), (errno.ENODEV, "the device has gone"),
                               (errno.ENOMEM, "the device cannot be read: Cannot allocate memory"),
                               (errno.EBADF, "the device cannot be read: Bad file descriptor")):
                self.ended(3, [f"{NODE}: error: {text}"], f"read {number} {code}", *self.record)
                self.assertEqual(self.frames(), [1, 2, 3][:number - 1])

    def test_reading_is_interrupted(self):
        for number in (1, 2, 3):
            for code in (errno.EINTR, errno.EAGAIN):
                self.ended(0, [], f"read {number} {code}", *self.record, "--count", "3")
                self.assertEqual(self.frames(), [1, 2, 3])

    def test_reading_gives_less(self):
        told = [f"{NODE}: error: 0x76: 1 byte long, exactly 792 expected; not decoded",
                f"{NODE}: warning: 0x76: number 3 follows 1: 1 lost"]
        result = self.ended(4, told, "read 2 short", "watch", "--count", "3", "-o", "jsonl", "--device", NODE)
        self.assertEqual(result.stdout.count('"FRAME_NUMBER"'), 2)

    def test_waiting_fails(self):
        # Which of the waits is the one for reports is a matter of how the threads come to run.
        told, several = [], self.counts(*self.record, "--duration", "0.2")["poll"] + 1
        for attempt in range(20):
            number = 1 + attempt % several
            result = self.failing(f"poll {number} {errno.ENOMEM}", *self.record, "--duration", "0.3")
            self.assertEqual(self.frames(), [1, 2, 3])
            self.assertIn((result.returncode, result.errors[0]), (
                (3, f"{NODE}: error: the device cannot be read: Cannot allocate memory"),
                (0, "vesk-report: 3 reports (3 input, 0 feature), 0 lost")))
            told.append(result.returncode)
            self.ended(0, [], f"poll {number} {errno.EINTR}", *self.record, "--duration", "0.2")
            if attempt + 1 >= several and 3 in told:
                break
        self.assertIn(3, told, "the wait for reports is one of them")
        self.ended(3, [f"{NODE}: error: the device cannot be read: Cannot allocate memory"], f"poll all {errno.ENOMEM}",
                   *self.record)

    def test_a_device_that_cannot_be_read_is_not_opened_without_a_pause(self):
        away = f"{NODE}: warning: the device cannot be read: Cannot allocate memory; waiting for its return"
        back = f"{NODE}: warning: the device is back, as {NODE}"
        result = self.failing(f"poll all {errno.ENOMEM}", *self.record, "--reconnect", "--duration", "1")
        self.assertEqual((result.returncode, result.errors[:2]), (0, [away, back]))

    def test_too_few_threads(self):
        for command in (self.record, ("watch", "-O", self.output, "--device", NODE)):
            for number in (1, 2):
                self.ended(3, [f"{NODE}: error: the device cannot be read: {os.strerror(errno.EAGAIN)}"],
                           f"thread {number} {errno.EAGAIN}", *command)

    def test_too_few_descriptors(self):
        for number in range(1, self.counts(*self.record, "--count", "1")["eventfd"] + 1):
            result = self.failing(f"eventfd {number} {errno.EMFILE}", *self.record)
            self.assertEqual(result.returncode, 3)
            self.assertIn(os.strerror(errno.EMFILE), result.stderr)


class Lists(Faults):
    def setUp(self):
        super().setUp()
        self.bench.add("hidraw1", name="Mouse", descriptor=b"")
        self.whole = self.bench.run("list").stdout

    def test_files_of_the_kernel_fail(self):
        calls = self.counts("list")
        files = {"open": 4, "read": 7}  # two of each device, read until nothing more comes; one is empty
        for call, most in files.items():
            self.assertGreaterEqual(calls[call], most)
            for number in range(1, most + 1):
                for code in (errno.EIO, errno.EACCES, errno.EMFILE):
                    result = self.failing(f"{call} {number} {code}", "list")
                    self.assertEqual(result.returncode, 3)
                    self.assertRegex(result.stderr, rf"^/dev/hidraw[01]: error: cannot be looked at: {os.strerror(code)}\n$")
                    self.assertEqual(len(result.stdout.splitlines()), 3)
                # It has left meanwhile.
                result = self.ended(0, [], f"{call} {number} {errno.ENODEV}", "list")
                self.assertEqual(len(result.stdout.splitlines()), 2)
        for number in range(1, files["read"] + 1):
            for what in (errno.EINTR, "short"):
                self.assertEqual(self.ended(0, [], f"read {number} {what}", "list").stdout, self.whole)
        self.assertEqual(self.ended(0, [], "read all short", "list").stdout, self.whole)

    def test_the_folder_fails(self):
        for code in (errno.EACCES, errno.EMFILE, errno.EIO):
            what = f"/sys/class/hidraw: error: cannot be listed: {os.strerror(code)}"
            self.assertEqual(self.ended(3, [what], f"opendir 1 {code}", "list").stdout,
                             "node  bus  ids  name  serial  declared reports\n")
            self.ended(3, [what], f"opendir 1 {code}", "udev-rule")
            self.ended(3, [what], f"opendir 1 {code}", "snapshot", "-O", self.output)
            self.assertFalse(self.output.exists())

    def test_output_fails(self):
        for code in (errno.ENOSPC, errno.EIO):
            for command in ("list", "udev-rule"):
                self.ended(5, [f"vesk-report: error: (standard output): cannot be written: {os.strerror(code)}"],
                           f"write 1 {code}", command)


class Outputs(Faults):
    def test_a_file_that_cannot_be_written_says_so(self):
        for command in (["record", "--count", "3"], ["watch", "--count", "3"], ["snapshot"], ["read", "all"]):
            calls = self.counts(*command, "-O", self.output)
            # Signals wake a thread by a write too, which is no output.
            faults = [("mkostemp", 1, errno.EROFS), ("rename", 1, errno.EACCES), ("fsync", 1, errno.EIO)]
            faults += [("write", number, errno.ENOSPC) for number in (1, 2)]
            self.assertGreaterEqual(calls["write"], 2)
            for call, number, code in faults:
                result = self.failing(f"{call} {number} {code}", *command, "-O", self.output)
                self.assertEqual(result.returncode, 5, (call, command, result.stderr))
                self.assertRegex(result.stderr, f"vesk-report: error: {self.output}: .*: {os.strerror(code)}\n")
                if command[0] in ("snapshot", "read") or call in ("mkostemp", "rename"):
                    self.assertFalse(self.output.exists(), (call, command))
                elif command[0] == "record" and (call, number) != ("write", 1):
                    self.frames()

    def test_the_old_file_stays_where_the_new_one_is_not_whole(self):
        for fault in (f"write 2 {errno.ENOSPC}", f"rename 1 {errno.EACCES}", f"fsync 1 {errno.EIO}"):
            self.output.write_text(OLD)
            result = self.bench.run("snapshot", "-O", self.output, VESK_FAULT=fault)
            self.assertEqual((result.returncode, self.output.read_text()), (5, OLD), fault)

    def test_a_reader_that_has_seen_enough_is_no_error(self):
        for command in (["watch", "-o", "hex"], ["record"], ["read", "all"], ["snapshot"], ["list"]):
            result = self.failing(f"write 1 {errno.EPIPE}", *command)
            self.assertEqual((result.returncode, result.errors), (0, []), command)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[4:])
