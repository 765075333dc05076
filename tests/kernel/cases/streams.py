"""Checks of watch and record."""

import csv
import io
import json
import pathlib
import re
import sys

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parent.parent))
sys.dont_write_bytecode = True  # the source folder stays clean
import bench

NODE = "/dev/hidraw0: "


def counts(inputs, features=0, lost=0):
    return f"vesk-report: {inputs + features} reports ({inputs} input, {features} feature), {lost} lost"


def recorded(name):
    return (bench.results / f"{name}.hid").read_text().splitlines()


def reports(name, kind):
    """Time in seconds and bytes of each report of a recording."""
    rows = [line.split() for line in recorded(name) if line.startswith(kind)]
    for row in rows:
        assert int(row[2]) == len(row[3:]), row
    return [(float(row[1]), bytes.fromhex("".join(row[3:]))) for row in rows]


class Streams(bench.Case):
    def ended(self, name, code, *errors):
        """The step's exit code, and its whole standard error."""
        step = self.step(name)
        self.assertEqual(step.err.decode().splitlines(), list(errors), name)
        self.assertEqual(step.code, code, name)
        return step

    def frames(self, name):
        return [int(n) for n in re.findall(r"^\[Frame # = (\d+)\]$", self.step(name).out.decode(), re.MULTILINE)]

    def packets(self, name):
        return [int(n) for n in re.findall(r"^\[ADC Packet #    = (\d+)\]$", self.step(name).out.decode(), re.MULTILINE)]

    def inputNumbers(self, name):
        return [int.from_bytes(report[4:8], "little") for _, report in reports(name, "E:")]

    # --- at leisure and in a hurry

    def test_sixty_a_second(self):
        self.ended("watch60", 0, counts(200))
        self.assertEqual(self.frames("watch60"), list(range(1, 101)))
        self.assertEqual(self.packets("watch60"), list(range(1, 101)))

    def test_a_thousand_a_second(self):
        self.ended("watch1000", 0, counts(1000))
        self.ended("record1000", 0, counts(1000))
        self.assertEqual(self.frames("watch1000"), list(range(101, 1101)))
        self.assertEqual(self.inputNumbers("record1000"), list(range(101, 1101)))

    def test_what_was_recorded_decodes_to_what_was_watched(self):
        self.assertEqual(self.ended("decode1000", 0).out, self.step("watch1000").out)

    def test_times_are_those_of_the_reports(self):
        times = [time for time, _ in reports("record1000", "E:")]
        self.assertEqual(times, sorted(times))
        self.assertAlmostEqual(times[-1] - times[0], 0.999, delta=0.5)

    def test_reports_that_are_not_wanted_are_left_out(self):
        self.ended("mixed", 0, counts(60))
        self.assertEqual(self.frames("mixed"), [])
        self.assertEqual(len(self.packets("mixed")), 60)

    def test_other_forms(self):
        lines = [json.loads(line) for line in self.ended("jsonl", 0, counts(10)).lines]
        frames = [line["value"]["FRAME_NUMBER"] for line in lines if "value" in line]
        self.assertEqual(frames, list(range(frames[0], frames[0] + 10)))
        rows = list(csv.DictReader(io.StringIO(self.ended("csv", 0, counts(2)).out.decode())))
        self.assertEqual(len(rows), 2 * 48)
        step = self.step("no-document")
        self.assertEqual((step.code, step.out), (2, b""))
        self.assertIn(b"jsonl", step.err)

    # --- more than the kernel keeps

    def test_a_burst_is_told_as_lost(self):
        frames = self.frames("burst")
        first = frames[0]
        self.assertEqual(frames, [*range(first, first + 63), first + 200])
        self.ended("burst", 0, NODE + f"warning: 0x76: number {first + 200} follows {first + 62}: 137 lost",
                   counts(64, lost=137))  # fmt: skip

    def test_losses_add_up_in_a_recording_and_when_it_is_decoded(self):
        numbers = self.inputNumbers("sleeper")
        first = numbers[0]
        self.assertEqual(numbers, [*range(first, first + 63), first + 100, first + 106])
        loss = f"warning: 0x76: number {first + 100} follows {first + 62}: 37 lost"
        self.ended("sleeper", 0, NODE + loss, NODE + "warning: 42 reports lost in 2 gaps",
                   NODE + "warning: 1 more of this kind (lost-reports)", counts(65, lost=42))  # fmt: skip
        decoded = self.step("sleeper-decoded")
        self.assertEqual(decoded.code, 0)
        self.assertIn(loss, decoded.err.decode())
        self.assertIn("42 reports lost in 2 gaps", decoded.err.decode())

    # --- feature reports beside the stream

    def test_feature_reports_are_polled_at_their_intervals(self):
        polled = reports("features", "F:")
        self.ended("features", 0, counts(100, len(polled)))
        summaries = [time for time, report in polled if report[0] == 0xE0]
        versions = [time for time, report in polled if report[0] == 0xD0]
        # In 1.9 seconds, of which a busy machine may miss the last tenth.
        self.assertIn(len(summaries), (9, 10))
        self.assertEqual(len(versions), 4)
        for times, interval in ((summaries, 0.2), (versions, 0.5)):
            for turn, time in enumerate(times):
                self.assertAlmostEqual(time, turn * interval, delta=0.15)

    def test_a_mute_report_holds_nothing_up(self):
        failures = ["request-timeout: no answer within 1.5 s",
                    "request-failed: the device refused the request: Input/output error"]  # fmt: skip
        errors = [f"error: 0x{id}: {text.split(': ', 1)[1]}" for id, text in zip(("DF", "DE"), failures)]
        self.ended("mute", 4, *(NODE + error for error in errors), counts(300))
        numbers = self.inputNumbers("mute")
        self.assertEqual(numbers, list(range(numbers[0], numbers[0] + 300)))
        comments = [line for line in recorded("mute") if line.startswith("# F ")]
        self.assertEqual(comments, [f"# F 0x{id} error {text}" for id, text in zip(("DF", "DE"), failures)])

    def test_polling_by_watch(self):
        self.ended("poll", 0, counts(0, 3))
        self.assertEqual(self.step("poll").lines.count("--Black Box Summary--"), 3)

    def test_changes_only(self):
        lines = self.ended("changes", 0, counts(0, 2)).lines
        self.assertEqual([line for line in lines if line[:2] == "DE"], ["DE 00", "DE 03"])

    # --- reports that are not as they should be

    def test_a_longer_report_is_not_taken_for_a_good_one(self):
        self.ended("sized", 4, NODE + "error: 0x76: 1000 bytes long, exactly 792 expected; not decoded",
                   NODE + "error: 1 more of this kind (wrong-length)", counts(3))  # fmt: skip
        self.assertEqual(self.frames("sized"), [])
        self.assertEqual(len(self.packets("sized")), 1)

    # --- signals, and output that goes away

    def test_signals_end_a_run_well(self):
        self.ended("interrupted", 0, counts(20))
        self.assertEqual(len(reports("interrupted", "E:")), 20)
        self.ended("terminated", 0, counts(5))
        self.assertEqual(len(self.packets("terminated")), 5)

    def test_a_recording_is_whole_at_any_moment(self):
        self.assertEqual(self.step("killed").signal, 9)
        self.assertEqual(len(reports("killed", "E:")), 20)
        self.assertEqual(self.ended("killed-decoded", 0).out.count(b'"FRAME_NUMBER"'), 20)

    def test_output_that_goes_away(self):
        self.ended("pipe", 0)
        self.assertEqual((bench.results / "pipe.code").read_text(), "0\n")
        self.assertEqual(len(self.step("pipe").lines), 3)
        self.ended("full", 5, "vesk-report: error: /dev/full: cannot be written: No space left on device")

    # --- the live view

    def test_the_view(self):
        screen = self.step("view").out.decode()
        self.assertTrue(screen.startswith("\x1b[?1049h"))
        pictures, after = screen.split("\x1b[?25h\x1b[?1049l")
        self.assertGreater(pictures.count("\x1b[H"), 5)
        last = pictures.split("\x1b[H")[-1].replace("\x1b[K", "").splitlines()
        self.assertRegex(last[0], r"^/dev/hidraw0  Vesk Controller$")
        self.assertRegex(last[1], r"^frame \d+   \d+\.\d/s   \d+\.\d\d degC   \d+ ADC packets   4 lost$")
        self.assertEqual([line for line in last if line.startswith("P-SCAN")],
                         ["P-SCAN I, +-500000", "P-SCAN Q, +-500000"])  # fmt: skip
        self.assertIn("4 lost", after, "messages come when the screen is free again")
        self.assertTrue(after.endswith(counts(60, lost=4) + "\r\n"), after)

    def test_no_view_without_a_terminal(self):
        self.ended("plain-view", 0, counts(2))
        self.assertEqual(len(self.frames("plain-view")), 2)
        self.assertNotIn(b"\x1b", self.step("plain-view").out)

    # --- away and back

    def test_what_was_queued_is_delivered_before_the_end(self):
        self.ended("queued", 3, NODE + "error: the device has gone", counts(5))
        self.assertEqual(len(self.frames("queued")), 5)

    def test_a_device_that_returns(self):
        self.ended("reconnected", 0, NODE + "warning: the device has gone; waiting for its return",
                   NODE + "warning: the device is back, as /dev/hidraw0", counts(6))  # fmt: skip
        self.assertEqual(len(self.frames("reconnected")), 6)


if __name__ == "__main__":
    bench.main(__file__, limit=240)
