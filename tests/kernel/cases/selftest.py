"""Checks of the bench itself: what a bare reader sees of the controller, its faults and its log."""

import pathlib
import struct
import subprocess
import sys
import tempfile
import unittest

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parent.parent))
sys.dont_write_bytecode = True  # the source folder stays clean
import bench

EIO, ENOENT, EACCES, EINVAL, EPIPE = 5, 2, 13, 22, 32

FEATURES = {
    "d0": 128, "d2": 512, "dc": 25, "de": 2, "e0": 7, "e1": 1023, "ea": 1023, "e2": 241, "e3": 57, "e4": 401,
    "e5": 401, "a2": 193, "ec": 193, "df": 25, "a9": 49,
}  # fmt: skip
IMAGE, PACKET = ("76", 792), ("77", 2064)


class Selftest(bench.Case):
    written_on_purpose = {"writable"}
    hung_on_purpose = {"limit"}

    def got(self, name):
        """Count and bytes of one feature report, with the byte behind it."""
        step = self.step(name)
        self.assertEqual((step.code, step.err), (0, b""), name)
        count, *report = step.out.decode().split()
        return int(count), bytes.fromhex("".join(report))

    def failed(self, name, errno):
        self.assertEqual(self.step(name).lines[-1], f"error {errno}")

    def read(self, name):
        """Input reports as (id, length, number), and the last word of the reader."""
        lines = self.step(name).lines
        self.assertEqual(lines[0], "opened")
        reports = [line.split() for line in lines[1:] if line[0] == "7"]
        end = lines[-1] if lines[-1][0] != "7" else None
        return [(id, int(length), int(number)) for id, length, number in reports], end

    def numbers(self, name, kind=IMAGE):
        reports, _ = self.read(name)
        return [number for id, length, number in reports if (id, length) == kind]

    # --- feature reports

    def test_every_feature_report_has_its_length_and_contents(self):
        with tempfile.TemporaryDirectory() as folder:
            subprocess.run([bench.programs["controller"], "--write-contents", folder], check=True)
            for id, length in FEATURES.items():
                count, report = self.got(f"get-{id}")
                self.assertEqual(count, length, id)
                self.assertEqual(report[0], int(id, 16))
                self.assertEqual(report[:length], pathlib.Path(folder, f"{id}.bin").read_bytes(), id)
                self.assertEqual(report[length], 0xAA, "the rest of the buffer is untouched")

    def test_contents_are_what_they_mean_to_be(self):
        self.assertEqual(self.got("get-e0"), (7, bytes.fromhex("e00d0500214024aa")))
        self.assertEqual(self.got("get-d0")[1][1:11], b"4.2.1-317\0")
        self.assertEqual(self.got("get-d2")[1].split(b"\0")[0].count(b"\n"), 5)
        self.assertEqual(struct.unpack_from("<IQIII", self.got("get-df")[1], 1), (1234567, 1250999896491, 0xABC, 42, 41))
        self.assertEqual(struct.unpack_from("<f", self.got("get-a2")[1], 1 + 4 * 47), (1000.5 - 47 * 12.25,))
        full = self.got("get-e1")[1]
        self.assertEqual(struct.unpack_from("<HHH", full, 1), (22, 0x100, 5))
        self.assertEqual(struct.unpack_from("<HH", full, 487), (0x10F, 79))  # ALGS
        self.assertEqual(struct.unpack_from("<HH", full, 991), (0x115, 7))  # the last blob

    def test_odd_requests(self):
        self.failed("get-unknown", EIO)
        self.assertEqual(self.got("get-cut"), (4, bytes.fromhex("e00d0500")))
        self.failed("get-huge", EINVAL)
        self.assertEqual(self.got("get-changed"), (2, bytes.fromhex("de02aa")))

    def test_faults(self):
        self.failed("fault-e0", EIO)
        self.failed("fault-a9", EIO)  # the kernel makes one error of all
        self.assertEqual(self.got("fault-e1"), (3, bytes.fromhex("e11600aa")))
        self.assertEqual(self.got("fault-e2"), (0, bytes.fromhex("e2")))
        count, report = self.got("fault-e3")
        self.assertEqual((count, report[0]), (57, 0xE4))
        self.assertEqual(self.got("fault-dc")[0], 35)
        self.assertEqual(self.got("fault-e4")[0], 401)
        self.assertGreaterEqual(self.step("fault-e4").ms, 300)
        self.failed("fault-df", EIO)
        self.assertGreaterEqual(self.step("fault-df").ms, 5000)
        self.assertLess(self.step("fault-df").ms, 7000)
        self.assertEqual(self.got("fault-e5")[0], 401)
        self.assertEqual(self.got("fault-gone"), self.got("get-e0"))

    # --- input reports

    def test_paced_reports_arrive_counted(self):
        self.assertEqual(self.numbers("paced"), list(range(1, 31)))
        self.assertEqual(self.numbers("paced", PACKET), list(range(1, 31)))
        self.assertAlmostEqual(self.step("paced").ms, 1000, delta=400)

    def test_a_thousand_a_second_arrive(self):
        self.assertEqual(self.numbers("fast"), list(range(31, 1031)))

    def test_long_reports_arrive_whole_and_short_ones_do_or_are_named_by_the_kernel(self):
        reports, _ = self.read("sized")
        self.assertIn(("76", 1000, 1032), reports)
        dropped = "Event data for report 118 was too short" in (bench.results / "dmesg").read_text()
        self.assertEqual(("76", 100, 1031) in reports, not dropped)

    def test_a_burst_loses_all_but_63(self):
        numbers = self.numbers("burst")
        first = numbers[0]
        self.assertEqual(numbers, [*range(first, first + 63), first + 200])

    def test_a_reader_that_sleeps_loses_all_but_63(self):
        numbers = self.numbers("stopped")
        self.assertEqual(numbers, list(range(numbers[0], numbers[0] + 63)))
        self.assertEqual(self.read("stopped")[1], "timeout")

    def test_skipped_numbers(self):
        first = self.numbers("skipping")[0]
        self.assertEqual(self.numbers("skipping"), [first, first + 6, first + 7])

    # --- unplug

    def test_unplug_delivers_what_is_queued_then_an_error(self):
        reports, end = self.read("queued")
        self.assertEqual(len(reports), 5)
        self.assertEqual(end, f"error {EIO}")

    def test_the_node_vanishes_and_returns(self):
        self.failed("gone", ENOENT)
        self.assertEqual(self.got("replugged")[0], 7)
        nodes = [e.details for e in self.log("plain") if e.kind == "node"]
        self.assertEqual(nodes, ["/dev/hidraw0"] * 3)

    def test_unplug_ends_a_pending_request(self):
        self.failed("pending", EIO)
        self.assertLess(self.step("pending").ms, 3000)

    def test_unplug_after_a_number_of_reports(self):
        reports, end = self.read("counted")
        self.assertEqual(len(reports), 7)
        self.assertEqual(end, f"error {EIO}")

    # --- others

    def test_identities(self):
        def uevent(name):
            return dict(line.split("=", 1) for line in self.step(f"uevent-{name}").lines)

        self.assertEqual(uevent("mouse")["HID_ID"], "0003:0000046D:0000C077")
        self.assertEqual(uevent("mouse")["HID_NAME"], "Bench Mouse")
        self.assertEqual(uevent("spi")["HID_ID"], "001C:00001234:00005678")
        self.assertEqual(uevent("spi")["HID_UNIQ"], "BENCH0002")
        self.assertEqual(uevent("virtual")["HID_ID"], "0006:00001234:00005678")

    def test_descriptors(self):
        for name, collections in (("mouse", 2), ("spi", 1), ("virtual", 2)):
            descriptor = self.step(f"descriptor-{name}").out
            self.assertEqual(descriptor.count(b"\xa1"), collections, name)
            for id in (*FEATURES, "76", "77"):
                self.assertEqual(bytes([0x85, int(id, 16)]) in descriptor, name != "mouse", (name, id))

    def test_a_write_would_be_seen_in_the_log(self):
        self.assertEqual(self.step("set").lines, ["2"])
        self.assertEqual(self.step("write").lines, ["2"])
        written = [(e.kind, e.details) for e in self.log("writable") if e.kind in ("set-report", "output")]
        self.assertEqual(written, [("set-report", "e0 type 0 size 2"), ("output", "size 2")])

    def test_rights(self):
        self.failed("denied", EACCES)
        self.assertEqual(self.got("allowed"), self.got("get-e0"))

    def test_steps(self):
        self.assertEqual(self.step("interrupted").signal, 2)
        terminal = self.step("terminal")
        self.assertEqual((terminal.out, terminal.err, terminal.code), (b"30 100\r\nto the other stream\r\n", b"", 5))
        binary = self.step("binary")
        self.assertEqual(binary.out, pathlib.Path(bench.programs["probe"]).read_bytes())
        self.assertEqual(binary.err, b"no line end")
        self.assertTrue(self.step("limit").hung)
        self.assertEqual(self.step("nothing").code, 127)
        self.assertIn(b"no-such-program", self.step("nothing").err)


if __name__ == "__main__":
    bench.main(__file__)
