#!/usr/bin/env python3
"""Options of decode and convert, and what they show on a terminal.

Usage: decode.py REPOSITORY VESK-REPORT
"""

import gzip
import os
import pathlib
import pty
import re
import subprocess
import sys
import tempfile
import threading
import time
import unittest

ROOT, PROGRAM = pathlib.Path(sys.argv[1]), sys.argv[2]
SESSION = ROOT / "examples/session.hid"


def run(*arguments, code=0, **more):
    more = {"stdin": subprocess.DEVNULL, **more}
    if more["stdin"] is None:
        del more["stdin"]
    result = subprocess.run([PROGRAM, *map(str, arguments)], stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True,
                            timeout=60, **more)
    if result.returncode != code:
        raise AssertionError(f"{arguments}: exit code {result.returncode}: {result.stderr}")
    return result


def ids(*arguments, **more):
    """The IDs of the reports that come out, with the letter of their type."""
    lines = run("convert", "-o", "recording", *arguments, **more).stdout.splitlines()
    return [line[0] + line.split()[3] for line in lines if line[:2] in ("E:", "F:")]


class Choices(unittest.TestCase):
    FEATURES = ["Fd0", "Fd2", "Fa2", "Fec", "Fe2", "Fdc", "Fde", "Fe3", "Fe4", "Fe5", "Fe0", "Fe1", "Fdf", "Fa9", "Fea"]
    INPUTS = ["E76", "E76", "E77", "E77"]

    def test_types(self):
        self.assertEqual(ids(SESSION, "--type", "feature"), self.FEATURES)
        self.assertEqual(ids(SESSION, "--type", "input"), self.INPUTS)

    def test_a_type_where_the_input_does_not_tell_it(self):
        self.assertEqual(ids("--hex", "DE 02"), ["Fde"])
        self.assertEqual(ids("--hex", "DE 02", "--type", "input"), ["Ede"])

    def test_reports(self):
        self.assertEqual(ids(SESSION, "--report", "0x77", "--report", "version", "--report", "222"),
                         ["Fd0", "Fde", "E77", "E77"])
        self.assertIn("no report is called 0x99", run("decode", SESSION, "--report", "0x99", code=2).stderr)

    def test_times(self):
        self.assertEqual(ids(SESSION, "--from", "0.25", "--to", "0.26"), ["E76"])
        self.assertEqual(ids(SESSION, "--to", "0.0042"), ["Fd0", "Fd2"])
        self.assertEqual(ids(SESSION, "--from", "4"), ["Fea"])
        self.assertEqual(ids("--hex", "DE 02", "--from", "1"), [])
        self.assertEqual(ids(SESSION, "--from", "-1", "--to", ".0042"), ["Fd0", "Fd2"])

    def test_devices(self):
        self.assertEqual(len(ids(SESSION, "--device", "1234:5678")), 19)
        self.assertEqual(ids(SESSION, "--device", "1234:5679"), [])

    def test_threads(self):
        expected = run("decode", SESSION).stdout
        for count in ("1", "2", "3"):
            self.assertEqual(run("decode", "--jobs", count, SESSION).stdout, expected)
        self.assertIn("--jobs", run("decode", "--jobs", "0", SESSION, code=2).stderr)

    def test_times_are_exact(self):
        text = "".join(f"F: {time} 2 de 02\n" for time in ("1700000000.123457", "1700000001.654321", "1700000002.777777"))
        for number in range(3):
            time = text.splitlines()[number].split()[1]
            self.assertEqual(ids("-", "--from", time, "--to", time, input=text, stdin=None), ["Fde"], time)
        for time in ("nan", "inf", "x", "1.0000000001"):
            self.assertIn("a time in seconds was expected", run("decode", SESSION, f"--from={time}", code=2).stderr)

    def test_what_fits_nothing_is_told(self):
        result = run("decode", SESSION, "--report", "0xDE", "--type", "input")
        self.assertEqual(result.stderr, "warning: none of the 19 reports fits what --report, --type, --device, --from and --to "
                                        "ask for\n")
        self.assertEqual(result.stdout, "")

    def test_a_recording_keeps_its_bus_and_its_ids(self):
        text = "N: a pad\nI: 18 1234 abcd\nF: 000000.000000 2 de 02\n"
        self.assertIn("\nI: 18 1234 abcd\n", run("convert", "-", input=text, stdin=None).stdout)

    def test_the_plug_ins_own_word(self):
        decimal = run("decode", "-decimal", "--hex", "DE 02").stdout
        self.assertEqual(decimal, run("decode", "--decimal", "--hex", "DE 02").stdout)
        self.assertIn("-decimal: error: ", run("decode", "--", "-decimal", code=3).stderr)


class Inputs(unittest.TestCase):
    def setUp(self):
        self.temporary = tempfile.TemporaryDirectory()
        self.addCleanup(self.temporary.cleanup)
        self.folder = pathlib.Path(self.temporary.name)

    def test_a_compressed_capture_that_is_spoilt_gives_what_came_before(self):
        subprocess.run([sys.executable, ROOT / "tools/make_captures", self.folder], check=True)
        capture = max(self.folder.glob("*.pcap"), key=lambda path: path.stat().st_size)
        header, packets = capture.read_bytes()[:24], capture.read_bytes()[24:]
        whole = gzip.compress(header + packets * 50)
        spoilt = self.folder / "spoilt.pcap.gz"
        middle = len(whole) * 3 // 4
        spoilt.write_bytes(whole[:middle] + b"\xFF" * 100 + whole[middle + 100:])
        result = run("decode", "-v", "-o", "jsonl", spoilt, code=4)
        self.assertIn(f"{spoilt}: error: the gzip data are damaged: ", result.stderr)
        self.assertRegex(result.stderr, r"note: packets \d+, ")
        self.assertIn('"value"', result.stdout)

    def test_a_name_in_brackets_is_one_name(self):
        (self.folder / "[a,b]").write_text("DE 02\n")
        self.assertIn("CONTINUOUS", run("decode", "[a,b]", cwd=self.folder).stdout)
        self.assertIn("CONTINUOUS", run("decode", "--", "[a,b]", cwd=self.folder).stdout)
        self.assertIn("[a: error: No such file", run("decode", "[a", cwd=self.folder, code=3).stderr)

    def test_a_reader_that_leaves_takes_no_error_with_it(self):
        for arguments, code in ((["--hex", "DE 02"], 0), (["--hex", "DE 02", "--hex", "DF 01"], 4)):
            ours, theirs = os.pipe()
            os.close(ours)
            process = subprocess.run([PROGRAM, "decode", *arguments], stdin=subprocess.DEVNULL, stdout=theirs,
                                     stderr=subprocess.DEVNULL, timeout=60)
            os.close(theirs)
            self.assertEqual(process.returncode, code)

    def test_dev_stdout_is_standard_output(self):
        shared = self.folder / "shared"
        command = f"echo one; '{PROGRAM}' decode --hex 'DE 01' -O /dev/stdout; echo two"
        with shared.open("w") as file:
            subprocess.run(["sh", "-c", command], stdout=file, check=True, timeout=60)
        self.assertEqual(shared.read_text(), "one\n\nADC Dump State: SINGLE\n\ntwo\n")
        self.assertIn("No such file", run("decode", "--hex", "DE 01", "-O", "", code=5).stderr)

    def test_a_folder_is_none(self):
        self.assertIn(f"{self.folder}: error: Is a directory", run("decode", self.folder, code=3).stderr)


class OnATerminal(unittest.TestCase):
    """Standard error is a terminal; the output is not."""

    def shown(self, *arguments, feed=None, environment=None):
        ours, theirs = pty.openpty()
        process = subprocess.Popen([PROGRAM, *map(str, arguments)], stdin=subprocess.PIPE, stdout=subprocess.DEVNULL,
                                   stderr=theirs, env={**os.environ, **(environment or {})})
        os.close(theirs)
        shown = []

        def read():
            try:
                while block := os.read(ours, 65536):
                    shown.append(block)
            except OSError:  # nobody holds the other end any longer
                pass

        reader = threading.Thread(target=read)
        reader.start()
        for block in feed or ():
            process.stdin.write(block)
            process.stdin.flush()
        process.stdin.close()
        self.code = process.wait(timeout=60)
        reader.join(timeout=60)
        os.close(ours)
        return b"".join(shown).decode()

    def slowly(self):
        text = SESSION.read_bytes()
        for _ in range(8):
            yield text
            time.sleep(0.15)

    def test_a_long_run_shows_how_far_it_is(self):
        shown = self.shown("decode", "-", feed=self.slowly())
        self.assertRegex(shown, r"\r\x1b\[K\(standard input\)  \d+ kB  \d+ reports  \d+/s")
        self.assertTrue(shown.endswith("\r\x1b[K"), shown)
        self.assertEqual(self.shown("-q", "decode", "-", feed=self.slowly()), "")

    def test_a_message_has_a_line_of_its_own_and_its_colour(self):
        shown = self.shown("decode", "--hex", "DE")
        self.assertIn("--hex:1: \x1b[1;31merror:\x1b[0m 0xDE: ", shown)
        self.assertEqual(self.code, 4)
        shown = self.shown("decode", "--hex", "DE", environment={"NO_COLOR": "1"})
        self.assertIn("--hex:1: error: 0xDE: ", shown)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[3:])
