"""Checks of list, read, snapshot and udev-rule."""

import json
import pathlib
import re
import subprocess
import sys
import tempfile
import unittest

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parent.parent))
sys.dont_write_bytecode = True  # the source folder stays clean
import bench

# In the order in which `reports` lists them.
FEATURES = ["a2", "a9", "d0", "d2", "dc", "de", "df", "e0", "e1", "e2", "e3", "e4", "e5", "ea", "ec"]
USB_RULE = 'KERNEL=="hidraw*", ATTRS{idVendor}=="1234", ATTRS{idProduct}=="5678", TAG+="uaccess"'


def recorded(name):
    """Lines of a recording in the results folder."""
    return (bench.results / name).read_text().splitlines()


def reports(lines, kind="F:"):
    """Time in seconds and bytes of each report of a recording."""
    rows = [line.split() for line in lines if line.startswith(kind)]
    for row in rows:
        assert int(row[2]) == len(row[3:]), row
    return [(float(row[1]), bytes.fromhex("".join(row[3:]))) for row in rows]


class Features(bench.Case):
    def contents(self):
        """What the controller holds, by ID."""
        with tempfile.TemporaryDirectory() as folder:
            subprocess.run([bench.programs["controller"], "--write-contents", folder], check=True)
            return {id: pathlib.Path(folder, f"{id}.bin").read_bytes() for id in FEATURES}

    def ended(self, name, code, *errors):
        """The step's exit code, and its whole standard error."""
        step = self.step(name)
        self.assertEqual(step.err.decode().splitlines(), list(errors), name)
        self.assertEqual(step.code, code, name)
        return step

    def asked(self, name):
        return [e.details.split()[0] for e in self.log(name) if e.kind == "get-report"]

    # --- what there is

    def test_list_without_devices(self):
        self.assertEqual(len(self.ended("list-none", 0).lines), 1)
        self.assertIn("there is no HID device here", self.step("read-none").err.decode())
        self.assertEqual(self.step("read-none").code, 3)

    def test_list_shows_all_devices_and_which_is_the_controller(self):
        lines = self.ended("list", 0).lines
        rows = [re.split(r"  +", line) for line in lines]
        self.assertEqual(rows, [
            ["node", "bus", "ids", "name", "serial", "declared reports"],
            ["/dev/hidraw0", "USB", "046d:c077", "Bench Mouse", "none of ours"],
            ["/dev/hidraw1", "USB", "1234:5678", "Vesk Controller", "BENCH0001", "all 17 of ours: a controller"],
            ["/dev/hidraw2", "virtual", "1234:5678", "Vesk on nothing", "BENCH0002", "all 17 of ours: a controller"],
            ["/dev/hidraw3", "SPI", "1234:5679", "Vesk auf dem Gerätebus", "BENCH0003", "all 17 of ours: a controller"],
        ])  # fmt: skip
        self.assertEqual({line.index("BENCH") for line in lines[2:]}, {lines[0].index("serial")})

    def test_list_as_json(self):
        document = json.loads(self.ended("list-json", 0).out)
        self.assertEqual(document["format"], "vesk-report-devices/1")
        mouse, _, _, spi = document["devices"]
        self.assertEqual((mouse["is_controller"], mouse["reports"], mouse["serial"]), (False, [], ""))
        self.assertEqual(spi["reports"], [0x76, 0x77, *(int(id, 16) for id in FEATURES)])
        del spi["reports"]
        self.assertEqual(spi, {
            "node": "/dev/hidraw3", "bus": "SPI", "vendor": "1234", "product": "5679",
            "name": "Vesk auf dem Gerätebus", "serial": "BENCH0003", "physical_path": "bench-0/input0",
            "is_controller": True,
        })  # fmt: skip

    # --- which one is meant

    def test_no_controller_among_others(self):
        self.ended("no-controller", 3, "error: no device speaks the controller's reports; there are:",
                   "  /dev/hidraw0  USB 046d:c077  Bench Mouse")  # fmt: skip

    def test_an_ambiguous_name_lists_the_candidates(self):
        speaks = "  (speaks the controller's reports)"
        candidates = [
            "  /dev/hidraw1  USB 1234:5678  Vesk Controller  serial BENCH0001" + speaks,
            "  /dev/hidraw2  virtual 1234:5678  Vesk on nothing  serial BENCH0002" + speaks,
            "  /dev/hidraw3  SPI 1234:5679  Vesk auf dem Gerätebus  serial BENCH0003" + speaks,
        ]
        name = "; name one of them with --device:"
        self.ended("ambiguous", 2, "error: more than one device speaks the controller's reports" + name, *candidates)
        self.ended("ambiguous-ids", 2, "error: more than one device is called 1234:5678" + name, *candidates[:2])

    def test_names(self):
        for name in ("by-ids", "by-serial", "by-path", "by-link"):
            self.assertIn("Module Count:   5", self.ended(name, 0).lines, name)
        self.assertEqual(self.asked("spi"), ["e0"])
        self.assertEqual(self.asked("virtual"), ["e0", "e0"])

    def test_a_path_is_taken_as_it_is(self):
        self.assertEqual(self.step("mouse").code, 0)
        self.assertEqual(self.asked("mouse"), ["e0"])

    def test_names_of_nothing(self):
        self.assertEqual(self.step("no-such").code, 3)
        self.assertIn("error: no device is called NOSUCH; there are:", self.step("no-such").err.decode())
        self.ended("no-path", 3, "/dev/hidraw77: error: cannot be opened: No such file or directory")
        self.ended("no-node", 3, "/dev/null: error: cannot be opened: not a HID device node")

    # --- all is well

    def test_read_all_reads_all(self):
        contents = self.contents()
        raw = self.ended("read-raw", 0).out
        self.assertEqual(raw, b"".join(contents[id] for id in FEATURES))
        document = json.loads(self.ended("read-json", 0).out)
        self.assertEqual([r["report"]["hex"].lower() for r in document["reports"]], FEATURES)
        self.assertEqual([r["report"]["length"] for r in document["reports"]], [len(contents[id]) for id in FEATURES])
        self.assertEqual((document["messages"], document["exit_status"]), ([], 0))

    def test_read_prints_what_decode_prints(self):
        self.assertEqual(self.ended("read-all", 0).out, self.ended("snapshot-decoded", 0).out)
        self.assertGreater(len(self.step("read-all").lines), 1000)

    def test_reports_are_read_in_the_order_in_which_they_are_named(self):
        heads = [line for line in self.ended("read-two", 0).lines if line.startswith("==")]
        self.assertRegex(heads[0], r"^== /dev/hidraw1 \d\.\d{6} s: feature 0xE0 black-box-summary, 7 bytes$")
        self.assertRegex(heads[1], r"^== /dev/hidraw1 \d\.\d{6} s: feature 0xD0 version, 128 bytes$")

    def test_snapshot_holds_the_device(self):
        lines = recorded("snapshot.hid")
        self.assertEqual([bytes for _, bytes in reports(lines)], list(self.contents().values()))
        self.assertRegex(lines[0], r"^# vesk-report [\d.]+, \d{4}-\d\d-\d\dT\d\d:\d\d:\d\dZ, on .+$")
        self.assertEqual(lines[1], "# Bus USB, device 1234:5678, serial BENCH0001")
        self.assertTrue(lines[2].startswith("R: 168 06 00 ff "), lines[2][:40])
        self.assertEqual(lines[3:6], ["N: Vesk Controller", "P: bench-0/input0", "I: 3 1234 5678"])
        self.assertEqual(len(lines), 6 + 15)

    def test_an_anonymous_snapshot_does_not_tell_whose_device_it_is(self):
        text = self.ended("anonymous", 0).out.decode()
        for word in ("BENCH0001", "bench-0", ", on "):
            self.assertNotIn(word, text)
        self.assertEqual(text.count("\nF: "), 15)

    def test_a_full_disk(self):
        self.ended("full-disk", 5, "vesk-report: error: /dev/full: cannot be written: No space left on device")

    # --- rights

    def test_missing_rights_are_explained(self):
        step = self.step("denied")
        self.assertEqual(step.code, 3)
        lines = step.err.decode().splitlines()
        self.assertEqual(lines[0], "/dev/hidraw1: error: cannot be opened: Permission denied (mode 0600, owner root, "
                                   "group root); this udev rule would help:")  # fmt: skip
        self.assertIn(USB_RULE, lines)
        self.assertGreaterEqual(step.ms, 1000, "rights may come a little later")
        self.assertEqual(self.step("rule").lines, lines[1:])
        document = json.loads(self.step("denied-json").out)
        self.assertEqual([m["code"] for m in document["messages"]], ["device-denied"])
        self.assertEqual(document["exit_status"], 3)

    def test_rights_that_come_late_suffice_and_so_does_reading(self):
        for name in ("soon-allowed", "allowed"):
            self.assertIn("Module Count:   5", self.ended(name, 0).lines, name)

    # --- faults

    def test_faults_have_their_messages(self):
        node = "/dev/hidraw1: "
        for id, code, message in (
            ("e0", 4, "error: 0xE0: the device refused the request: Input/output error"),
            ("e1", 4, "error: 0xE1: 3 bytes long, 1023 expected; the missing ones are read as zero"),
            ("e2", 4, "error: 0xE2: the device's answer is empty"),
            ("e3", 4, "error: 0xE3: the device answered with report 0xE4, 57 bytes long"),
            ("dc", 0, "note: 0xDC: 10 bytes behind the layout's 25; not decoded"),
            ("df", 4, "error: 0xDF: no answer within 0.4 s"),
            ("df-kernel", 4, "error: 0xDF: no answer within 5 s"),
        ):
            self.ended(f"fault-{id}", code, node + message)
        for id in ("e0", "e2", "e3", "df"):
            self.assertEqual(self.step(f"fault-{id}").out, b"", id)
        self.ended("fault-e4", 0)
        self.assertGreaterEqual(self.step("fault-e4").ms, 300)
        self.assertLess(self.step("fault-df").ms, 2500)
        self.ended("fault-lenient", 0, node + "warning: 0xE1: 3 bytes long, 1023 expected; the missing ones are read as zero")

    def test_faults_have_their_codes(self):
        document = json.loads(self.step("fault-json").out)
        found = [(m["code"], m["report_id"]) for m in document["messages"] if m["severity"] == "error"]
        self.assertEqual(found, [("request-timeout", 0xDF), ("request-failed", 0xE0), ("short-report", 0xE1),
                                 ("empty-answer", 0xE2), ("wrong-answer", 0xE3)])  # fmt: skip
        self.assertEqual(document["exit_status"], 4)
        self.assertEqual(self.step("fault-json").code, 4)

    def test_a_report_that_fails_is_data_in_a_snapshot(self):
        step = self.step("fault-snapshot")
        self.assertEqual(step.code, 4)
        told = re.findall(r"^/dev/hidraw1: error: 0x(..): ", step.err.decode(), re.MULTILINE)
        self.assertEqual(told, ["DF", "E0", "E1", "E2", "E3"])
        lines = recorded("faults.hid")
        self.assertEqual([line for line in lines if line.startswith("# F ")], [
            "# F 0xDF error request-timeout: no answer within 0.5 s",
            "# F 0xE0 error request-failed: the device refused the request: Input/output error",
            "# F 0xE2 error empty-answer: the device's answer is empty",
            "# F 0xE3 error wrong-answer: the device answered with report 0xE4, 57 bytes long",
        ])  # fmt: skip
        self.assertEqual(len(reports(lines)), 11)
        self.assertEqual(self.step("fault-decoded").code, 4)
        self.assertIn("0xE1: 3 bytes long", self.step("fault-decoded").err.decode())

    def test_progress_is_shown_on_a_terminal(self):
        shown = self.step("progress").out.decode()
        self.assertIn("\r\x1b[Kreading 0xDF watchdog (1 of 2)\r\x1b[K", shown)
        self.assertIn("reading 0xE5 open-short-data-p (2 of 2)\r\x1b[K", shown)
        self.assertNotIn(b"reading", self.step("fault-df").err)

    # --- interrupted, and gone

    def test_an_interrupt_is_no_device_error(self):
        self.ended("interrupted", 0, "/dev/hidraw1: warning: interrupted; 6 of 15 reports were asked for")
        lines = recorded("interrupted.hid")
        self.assertEqual([bytes[0] for _, bytes in reports(lines)], [0xA2, 0xA9, 0xD0, 0xD2, 0xDC, 0xDE])
        self.assertEqual([line for line in lines if line.startswith("# F")], [])
        self.assertLess(self.step("interrupted").ms, 4000)
        self.ended("terminated", 0, "/dev/hidraw1: warning: interrupted; 1 of 2 reports were asked for")
        self.assertIn("Open/Short Test P-SCAN Data:", self.step("terminated").lines)

    def test_a_device_that_goes_ends_the_run(self):
        self.ended("gone", 3, "/dev/hidraw1: error: 0xDF: the device has gone")
        self.assertIn("Open/Short Test P-SCAN Data:", self.step("gone").lines)


if __name__ == "__main__":
    bench.main(__file__, limit=240)
