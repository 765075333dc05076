"""vesk-report against the reference decoder: the examples, the session, and random reports of every ID, in both forms.

Usage: against_reference.py ROOT PROGRAM
"""

import ctypes
import json
import math
import pathlib
import random
import re
import struct
import subprocess
import sys
import unittest

ROOT = pathlib.Path(sys.argv.pop(1)).resolve()
PROGRAM = pathlib.Path(sys.argv.pop(1)).resolve()
sys.path.insert(0, str(ROOT / "tools"))

import reference_decoder as reference  # noqa: E402

EXAMPLES = ROOT / "examples"
LARGEST_EXACT = 1 << 53  # of the integers that a double holds
RANDOM_REPORTS = 25  # of each ID


class Number(str):
    """A number of a JSON document, as it is written."""


def parsed(text):
    return json.loads(text, parse_int=Number, parse_float=Number, parse_constant=lambda name: 1 / 0)


def run(*arguments, stdin=""):
    done = subprocess.run([PROGRAM, *arguments], input=stdin.encode(), capture_output=True, timeout=120)
    errors = done.stderr.decode()
    assert (done.returncode, errors) == (0, ""), f"{arguments}: exit code {done.returncode}: {errors}"
    return done.stdout.decode()


def values_in(lines):
    """(value, exact) of each record of JSON Lines."""
    records = [parsed(line) for line in lines.splitlines()]
    return [(record["value"], record["exact"]) for record in records if "value" in record]


def digits(text):
    """The significant digits of a number."""
    return re.sub(r"[eE].*|[-+.]", "", text).strip("0") or "0"


def single(text):
    """What a single-precision number reads from the text; infinity where it is too large for one."""
    return ctypes.c_float(float(text)).value


def fewest_digits(number):
    """How many digits it takes until the text reads back to the same single-precision number."""
    return next(n for n in range(1, 10) if single(f"{number:.{n}g}") == number)


def leaves(value, path=""):
    if isinstance(value, dict):
        for key, entry in value.items():
            yield from leaves(entry, f"{path}/{key}")
    elif isinstance(value, list):
        for index, entry in enumerate(value):
            yield from leaves(entry, f"{path}/{index}")
    else:
        yield path, value


class AgainstReference(unittest.TestCase):

    def check_float(self, written, number, where):
        is_single = isinstance(number, reference.F32)
        read_back = single(written) if is_single else float(written)
        self.assertEqual(struct.pack("<d", read_back), struct.pack("<d", number), where)  # the sign of zero counts
        fewest = fewest_digits(number) if is_single else len(digits(repr(number)))
        if re.fullmatch("-?[0-9]+", written):  # a long whole number, where that is shorter than an exponent
            self.assertLessEqual(len(written), len(f"{number:.{fewest - 1}e}"), where)
        else:
            self.assertLessEqual(len(digits(written)), fewest, where)

    def check_value(self, written, exact, report):
        """The value of a report as it stands in JSON, with what stands in `exact` for numbers that JSON loses."""
        found = dict(leaves(written))
        wanted = dict(leaves(reference.value(report)))
        self.assertEqual(found.keys(), wanted.keys())
        beyond = {}
        for path, value in wanted.items():
            where = f"0x{report[0]:02X}{path}"
            if isinstance(value, float) and not math.isfinite(value):
                self.assertIsNone(found[path], where)
                beyond[path] = str(float(value))
                continue
            self.assertIs(type(found[path]), str if isinstance(value, str) else Number, where)
            if isinstance(value, float):
                self.check_float(found[path], value, where)
            else:
                self.assertEqual(found[path], str(value), where)
                if isinstance(value, int) and abs(value) > LARGEST_EXACT:
                    beyond[path] = str(value)
        self.assertEqual(exact, beyond)

    def check_values(self, lines, reports):
        values = values_in(lines)
        self.assertEqual(len(values), len(reports))
        for (written, exact), report in zip(values, reports, strict=True):
            self.check_value(written, exact, report)

    def check_text(self, text, reports, decimal=False):
        for number, report in enumerate(reports):
            expected = reference.printed(report, decimal)
            self.assertEqual(text[:len(expected)], expected, f"report {number}, 0x{report[0]:02X}")
            text = text[len(expected):]
        self.assertEqual(text, "")

    def test_examples(self):
        examples = sorted(EXAMPLES.glob("*.hex"))
        self.assertEqual({int(path.name[:2], 16) for path in examples}, set(reference.REPORTS))
        for path in examples:
            with self.subTest(path.name):
                report = bytes.fromhex(re.sub("#.*", "", path.read_text()))
                self.assertEqual(report[0], int(path.name[:2], 16))
                self.assertEqual(run("decode", path), path.with_suffix(".txt").read_bytes().decode())
                self.check_text(run("decode", "-decimal", path), [report], decimal=True)
                ((written, exact),) = values_in(run("decode", "-o", "jsonl", path))
                self.check_value(written, exact, report)
                self.check_value(parsed(path.with_suffix(".json").read_text()), exact, report)
                (record,) = parsed(run("decode", "-o", "json", path))["reports"]
                self.assertEqual(record["value"], written)

    def test_examples_are_what_the_generator_writes(self):
        subprocess.run([ROOT / "tools" / "make_examples", "--check"], check=True)

    def test_session(self):
        path = EXAMPLES / "session.hid"
        reports = [bytes.fromhex(line.split(" ", 3)[3]) for line in path.read_text().splitlines() if line[0] in "EF"]
        self.assertEqual({report[0] for report in reports}, set(reference.REPORTS))
        self.assertEqual(run("decode", path), path.with_suffix(".txt").read_bytes().decode())
        self.check_values(run("decode", "-o", "jsonl", path), reports)

    def test_random_reports(self):
        generator = random.Random(20)
        reports = [random_report(generator, report_id, number)
                   for report_id in reference.REPORTS for number in range(RANDOM_REPORTS)]
        text = "\n\n".join(report.hex(" ") for report in reports)
        # Quiet, because frame numbers that jump are told as frames that are lost.
        self.check_text(run("-q", "decode", stdin=text), reports)
        self.check_text(run("-q", "decode", "--decimal", stdin=text), reports, decimal=True)
        self.check_values(run("-q", "decode", "-o", "jsonl", stdin=text), reports)


def random_report(generator, report_id, number):
    size = reference.REPORTS[report_id]
    if size is None:
        lines = ["".join(generator.choices("Version 0.1_µ—\"\\\t\r", k=generator.randrange(20))) for _ in range(6)]
        return bytes([report_id]) + "\n".join(lines).encode() + b"\0"
    # Every fourth one with many bytes of all zeros and all ones, which are where signs and special floats are.
    extreme = [0x00, 0xFF, 0x7F, 0x80] if number % 4 == 0 else range(256)
    return bytes([report_id]) + bytes(generator.choices(extreme, k=size - 1))


if __name__ == "__main__":
    unittest.main()
