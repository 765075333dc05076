"""What `vesk-report explain` prints, and how it ends.

Usage: explain.py REPOSITORY VESK-REPORT
"""
import pathlib
import re
import subprocess
import sys
import unittest

ROOT = pathlib.Path(sys.argv[1])
PROGRAM = sys.argv[2]

WATCHDOG = """\
0xDF watchdog: Watchdog
feature report, 25 bytes; what a shorter one lacks is read as zero; decoder parseWatchDogReport

offset  bytes  type       on screen       in the value  unit
     1      4  u32        Feed Count      /Count
     5      8  u64        Feed Timestamp  /Timestamp    us
                          unsigned on screen, signed in the value
     5      8  u64        Feed Wallclock  /Wallclock    s
                          the timestamp times 0.000001 in single precision, as the firmware's tools compute it:
                          seven digits
    13      4  u32        Register        /Register
    17      4  u32        Wake            /Wake
    21      4  u32        Sleep           /Idle
                          named differently in the two forms
"""


def explain(*arguments, stdin=""):
    result = subprocess.run([PROGRAM, "explain", *arguments], input=stdin, capture_output=True, text=True, timeout=60)
    return result.returncode, result.stdout, result.stderr


class Explain(unittest.TestCase):
    def test_a_layout(self):
        for name in ("0xDF", "0xdf", "223", "watchdog"):
            self.assertEqual(explain(name), (0, WATCHDOG, ""))

    def test_several_layouts(self):
        status, out, err = explain("watchdog", "0xDE")
        self.assertEqual((status, err), (0, ""))
        self.assertTrue(out.startswith(WATCHDOG + "\n0xDE adc-dump-state: "), out)

    def test_every_report(self):
        listed = subprocess.run([PROGRAM, "reports"], capture_output=True, text=True, check=True).stdout.splitlines()[1:]
        self.assertEqual(len(listed), 17)
        for line in listed:
            name, kind = line.split()[0:2]
            status, out, err = explain(name)
            self.assertEqual((status, err), (0, ""))
            self.assertTrue(out.startswith(name + " "))
            self.assertIn("\n" + kind + " report, ", out)
            self.assertLessEqual(max(map(len, out.splitlines())), 140)

    def test_rows_of_the_black_box(self):
        rows = explain("black-box-report")[1]
        self.assertRegex(rows, r"\n   583      4  u32  +ALGS_EVENT_PIXEL_NOISE_CNT_CH_0 +/ALGS/ALGS_EVENT_PIXEL_NOISE_CNT_CH_0\n")
        self.assertRegex(rows, r"\n   985      2  u16  +PMGR # Events +-\n +on screen only")
        self.assertEqual(len(re.findall(r"^ *\d+ +4  u32 ", rows, re.MULTILINE)), 163 + 70)
        rows = explain("0xE2")[1]
        self.assertRegex(rows, r"\n   202      1  unused +- +-\n")
        self.assertRegex(explain("0xE0")[1], r"\n     6      1  bit 2 +HIDSPI_SLAVE +/HIDSPI_SLAVE\n")

    def test_a_report_of_a_recording(self):
        recording = "F: 000002.500135 2 de 01\nF: 000003.000000 7 e0 0d 05 00 21 40 24\n"
        status, out, err = explain("0xDE", "--bytes", "-", stdin="N: x\n" + recording)
        self.assertEqual((status, err), (0, ""))
        self.assertEqual(out, "== (standard input):2 2.500135 s, device 0: feature 0xDE adc-dump-state, 2 bytes\n"
                              '     1  01                        ADC Dump State            "SINGLE"\n')

    def test_both_forms_of_an_example(self):
        status, out, err = explain("--bytes", str(ROOT / "examples/E0-black-box-summary.hex"), "--hex", "DE 02")
        self.assertEqual((status, err), (0, ""))
        self.assertEqual(out.count("== "), 2)
        self.assertIn('ADC Dump State            "CONTINUOUS"\n', out)

    def test_a_short_report_is_a_finding(self):
        status, out, err = explain("--hex", "DE")
        self.assertEqual(status, 4)
        self.assertIn("\n     1  --  ", out)
        self.assertIn("1 byte long, 2 expected", err)

    def test_wrong_usage(self):
        for arguments in ((), ("0x99",), ("no-such-report",), ("--bytes",)):
            status, out, err = explain(*arguments)
            self.assertEqual((status, out), (2, ""), arguments)
            self.assertTrue(err)

    def test_what_cannot_be_read_or_written(self):
        status, out, err = explain("--bytes", "/nonexistent")
        self.assertEqual((status, out), (3, ""))
        self.assertIn("/nonexistent: error: ", err)
        with open("/dev/full", "w") as full:
            result = subprocess.run([PROGRAM, "explain", "0xE0"], stdout=full, stderr=subprocess.PIPE)
        self.assertEqual(result.returncode, 5)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
