"""The JSON contract from the outside: schema, two strict parsers, and every number against the report's own bytes.

Usage: contract.py REPOSITORY VESK-REPORT
"""
import csv
import io
import json
import math
import os
import pathlib
import random
import struct
import subprocess
import sys
import tempfile
import unittest

try:
    import jsonschema
except ImportError:
    print("python3-jsonschema is not installed; skipped")
    sys.exit(77)

ROOT = pathlib.Path(sys.argv[1])
PROGRAM = sys.argv[2]
SCHEMA = json.loads((ROOT / "docs/schema/vesk-report-1.schema.json").read_text())

SIZES = {0x76: 792, 0x77: 2064, 0xA2: 193, 0xA9: 49, 0xD0: 9, 0xD2: 13, 0xDC: 25, 0xDE: 2, 0xDF: 25, 0xE0: 7, 0xE1: 1023,
         0xE2: 241, 0xE3: 57, 0xE4: 401, 0xE5: 401, 0xEA: 1023, 0xEC: 193}
TEXTS = {0xD0: b"1.2.3-a\0", 0xD2: b"a\nb\nc\nd\ne\nf\0"}

# Where the numbers of a report lie: key, offset, struct format, count (0: no array).
NUMBERS = {
    0x76: [("COOKIE", 1, "B", 0), ("FLAGS", 2, "H", 0), ("FRAME_NUMBER", 4, "I", 0), ("FRAME_PARAMS", 8, "I", 0),
           ("TIMESTAMP_MS", 12, "I", 0), ("D_SCAN_I", 16, "i", 48), ("D_SCAN_Q", 208, "i", 48),
           ("P_SCAN_I", 400, "i", 48), ("P_SCAN_Q", 592, "i", 48), ("TMON_PARAMS", 784, "I", 0),
           ("TMON_DEG_C", 788, "f", 0)],
    0x77: [("PACKET_ID", 4, "I", 0), ("PAYLOAD_SIZE", 8, "I", 0), ("TOTAL_DUMP_SIZE", 12, "I", 0),
           ("PAYLOAD_DATA", 16, "I", 512)],
    0xA2: [("BASELINE", 1, "f", 48)],
    0xEC: [("NOISY_PIXEL_THRESHOLDS", 1, "f", 48)],
    0xDC: [("START_ADDRESS", 1, "I", 0), ("CHANNEL_ENABLE_MASK", 5, "Q", 0), ("SAMPLE_COUNT", 13, "I", 0)],
    0xDF: [("Count", 1, "I", 0), ("Timestamp", 5, "q", 0), ("Register", 13, "I", 0), ("Idle", 21, "I", 0)],
    0xE0: [("SEVERITY_LEVEL", 1, "B", 0), ("MODULE_COUNT", 2, "H", 0)],
    0xE3: [("SHORT_TX_POS", 1, "Q", 0), ("SHORT_TX_NEG", 9, "Q", 0), ("SHORT_BOTH", 17, "Q", 0),
           ("OPEN_TX_POS", 25, "Q", 0), ("OPEN_TX_NEG", 33, "Q", 0), ("OPEN_BOTH", 41, "Q", 0), ("WEAK_OS", 49, "Q", 0)],
    0xE4: [("SATURATION_DATA", 1, "Q", 0), ("SCAN_DATA_I", 9, "I", 48), ("SCAN_DATA_Q", 201, "I", 48)],
}


def closed(schema):
    """The schema for our own output, which holds nothing that is not described."""
    if isinstance(schema, list):
        return [closed(item) for item in schema]
    if not isinstance(schema, dict):
        return schema
    result = {key: closed(item) for key, item in schema.items()}
    if isinstance(schema.get("properties"), dict) and "required" in schema:
        result["additionalProperties"] = False
    return result


VALIDATOR = jsonschema.Draft202012Validator(closed(SCHEMA))


def refuse(constant):
    raise ValueError("no JSON: " + constant)


def without_duplicates(pairs):
    keys = [key for key, _ in pairs]
    if len(keys) != len(set(keys)):
        raise ValueError("a key twice")
    return dict(pairs)


def parse(text):
    return json.loads(text, parse_constant=refuse, object_pairs_hook=without_duplicates)


def run(*arguments, stdin=b""):
    result = subprocess.run([PROGRAM, *arguments], input=stdin, capture_output=True, timeout=120)
    return result.returncode, result.stdout, result.stderr


def jq(text):
    """What jq makes of it, parsed again."""
    result = subprocess.run(["jq", "-c", "."], input=text, capture_output=True, timeout=120, check=True)
    return [json.loads(line) for line in result.stdout.splitlines()]


def random_report(number, rng):
    if number in TEXTS:
        return bytes([number]) + TEXTS[number]
    body = bytearray(rng.randbytes(SIZES[number] - 1))
    for at in range(0, len(body)):  # extremes of all widths, NaNs and infinities among them
        if rng.random() < 0.15:
            body[at] = rng.choice((0x00, 0xFF, 0x7F, 0x80))
    report = bytes([number]) + bytes(body)
    if number in (0xA2, 0xEC):
        special = struct.pack("<8f", math.inf, -math.inf, math.nan, -0.0, 1e-45, 3.4028235e38, 0.1, 16777216.0)
        report = report[:1] + special + report[1 + len(special):]
    return report


def as_hex_text(reports):
    return "\n\n".join(report.hex(" ") for report in reports).encode() + b"\n"


def at_pointer(value, pointer):
    for step in pointer.split("/")[1:]:
        step = step.replace("~1", "/").replace("~0", "~")
        value = value[int(step)] if isinstance(value, list) else value[step]
    return value


class Contract(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        rng = random.Random(1)
        cls.reports = [random_report(number, rng) for number in SIZES for _ in range(5)]
        cls.text = as_hex_text(cls.reports)
        cls.folder = tempfile.TemporaryDirectory()
        cls.addClassCleanup(cls.folder.cleanup)

    def document(self, *arguments, stdin=b"", expected=None):
        status, out, _ = run("decode", "-o", "json", *arguments, stdin=stdin)
        document = parse(out)
        VALIDATOR.validate(document)
        self.assertEqual(document["exit_status"], status)
        if expected is not None:
            self.assertEqual(status, expected)
        return document

    def lines(self, *arguments, stdin=b""):
        status, out, _ = run("decode", "-o", "jsonl", *arguments, stdin=stdin)
        self.assertTrue(out.endswith(b"\n"))
        records = [parse(line) for line in out.splitlines()]
        for record in records:
            VALIDATOR.validate(record)
        closing = records.pop()
        self.assertEqual(closing["exit_status"], status)
        self.assertEqual(closing["summary"]["reports"], len(records))
        return records, closing

    def test_the_schema_is_one(self):
        jsonschema.Draft202012Validator.check_schema(SCHEMA)
        for broken in ({}, {"format": "vesk-report/2"}, [], {"format": "vesk-report/1", "reports": []}):
            with self.assertRaises(jsonschema.ValidationError):
                VALIDATOR.validate(broken)

    def test_examples(self):
        for path in sorted((ROOT / "examples").glob("*.hex")) + sorted((ROOT / "examples").glob("*.hid")):
            with self.subTest(path.name):
                document = self.document(str(path), expected=0)
                self.assertGreater(len(document["reports"]), 0)
                self.document(str(path), "--with-lines", "--with-bytes", expected=0)

    def test_both_forms_hold_the_same(self):
        options = ("--with-lines", "--with-bytes")
        records, closing = self.lines(*options, stdin=self.text)
        document = self.document(*options, stdin=self.text)
        self.assertEqual(records, document["reports"])
        self.assertEqual(closing["messages"], document["messages"])
        self.assertEqual([bytes.fromhex(record["bytes"]) for record in records], self.reports)
        self.assertEqual([record["source"]["index"] for record in records], list(range(len(records))))

    def test_numbers_are_those_of_the_bytes(self):
        records, _ = self.lines("--with-bytes", stdin=self.text)
        compared = told = 0
        for record in records:
            data = bytes.fromhex(record["bytes"])
            wanted = {}
            for key, offset, form, count in NUMBERS.get(data[0], []):
                numbers = struct.unpack_from("<%d%s" % (count or 1, form), data, offset)
                got = record["value"][key] if count else [record["value"][key]]
                self.assertEqual(len(got), len(numbers))
                for i, (have, number) in enumerate(zip(got, numbers)):
                    pointer = "/" + key + ("/%d" % i if count else "")
                    if form != "f":
                        self.assertIs(type(have), int)
                        self.assertEqual(have, number)
                        if abs(number) > 2 ** 53:
                            wanted[pointer] = str(number)
                    elif math.isfinite(number):
                        self.assertEqual(struct.pack("<f", have), struct.pack("<f", number))
                    else:
                        self.assertIsNone(have)
                        wanted[pointer] = "nan" if math.isnan(number) else "inf" if number > 0 else "-inf"
                    compared += 1
            if data[0] in NUMBERS:
                self.assertEqual(record["exact"], wanted)
                told += len(wanted)
        self.assertGreater(compared, 4000)
        self.assertGreater(told, 50)

    def test_jq_reads_the_same(self):
        _, out, _ = run("decode", "-o", "jsonl", stdin=self.text)
        ours = [parse(line) for line in out.splitlines()]
        theirs = jq(out)
        self.assertEqual(len(ours), len(theirs))

        def same(a, b):
            if isinstance(a, dict):
                self.assertEqual(a.keys(), b.keys())
                for key in a:
                    same(a[key], b[key])
            elif isinstance(a, list):
                self.assertEqual(len(a), len(b))
                for x, y in zip(a, b):
                    same(x, y)
            elif isinstance(a, (int, float)) and not isinstance(a, bool):
                # Its numbers are doubles, and some versions print 17 digits of them.
                self.assertEqual(float(a), float(b))
            else:
                self.assertEqual(a, b)

        same(ours, theirs)
        same(self.document(stdin=self.text)["reports"], ours[:-1])

    def test_what_a_reader_of_doubles_loses_is_in_exact(self):
        records, _ = self.lines(stdin=self.text)
        for record in records:
            for pointer, text in record["exact"].items():
                value = at_pointer(record["value"], pointer)
                self.assertIsNone(value) if text in ("nan", "inf", "-inf") else self.assertEqual(str(value), text)

    def test_names_and_arguments_that_are_no_text(self):
        name = os.fsencode(self.folder.name) + b'/a\xff"\\\n\t\x01.hex'
        with open(name, "wb") as file:
            file.write(b"DE 01\n")
        status, out, _ = run(b"decode", b"-o", b"json", name)
        self.assertEqual(status, 0)
        document = parse(out.decode("utf-8", "strict"))
        VALIDATOR.validate(document)
        shown = self.folder.name + '/a\ufffd"\\\n\t\x01.hex'
        self.assertEqual(document["reports"][0]["source"]["file"], shown)
        self.assertEqual(document["tool"]["argv"], ["decode", "-o", "json", shown])

    def test_device_text_that_is_no_text(self):
        document = self.document("--hex", "D0 41 ff 00", "--with-lines", expected=4)
        record = document["reports"][0]
        self.assertIsNone(record["value"])
        self.assertTrue(record["messages"])
        document = self.document("--hex", "D0 41 22 5c 0a 1b c3 a4 00", expected=0)
        self.assertEqual(document["reports"][0]["value"], 'A"\\\n\x1b\u00e4')

    def test_documents_of_runs_that_went_wrong(self):
        missing = os.path.join(self.folder.name, "missing")
        for arguments, stdin, status, code in (
                (("--hex", "99 01"), b"", 4, "unknown-report"),
                (("--hex", "E0 0D 05"), b"", 4, "short-report"),
                (("--hex", "76 00"), b"", 4, "wrong-length"),
                (("--hex", "D2 41 00"), b"", 4, "decoder-raised"),
                ((missing,), b"", 3, "unreadable"),
                ((self.folder.name,), b"", 3, "unreadable"),
                ((), b"", 4, "no-reports"),
                ((), b"neither hex nor anything else\n", None, None)):
            with self.subTest(arguments):
                document = self.document(*arguments, stdin=stdin, expected=status)
                self.assertTrue(document["messages"])
                if code is not None:
                    self.assertIn(code, [message["code"] for message in document["messages"]])
                self.lines(*arguments, stdin=stdin)
        # One input fails, the others are decoded all the same.
        good = ROOT / "examples/DE-adc-dump-state.hex"
        document = self.document(missing, str(good), expected=3)
        self.assertEqual(len(document["reports"]), 1)

    def test_lenient_runs_say_so(self):
        document = self.document("--lenient", "--hex", "E0 0D 05", expected=0)
        self.assertEqual(document["reports"][0]["messages"][0]["severity"], "warning")
        self.assertEqual(document["reports"][0]["value"]["SEVERITY_LEVEL"], 13)

    def test_no_locale_changes_a_number(self):
        environment = dict(os.environ, LC_ALL="de_DE.UTF-8", LANG="de_DE.UTF-8")
        result = subprocess.run([PROGRAM, "decode", "-o", "jsonl"], input=self.text, capture_output=True, env=environment)
        self.assertEqual(result.stdout, run("decode", "-o", "jsonl", stdin=self.text)[1])

    def test_what_is_converted_is_read_back(self):
        before, _ = self.lines("--with-bytes", stdin=self.text)
        for form, options in (("recording", ()), ("hex", ()), ("raw", ("--split", "--input-format", "raw"))):
            with self.subTest(form):
                status, out, _ = run("convert", "-o", form, stdin=self.text)
                self.assertEqual(status, 0)
                after, _ = self.lines("--with-bytes", *options, stdin=out)
                self.assertEqual([record["bytes"] for record in after], [record["bytes"] for record in before])
                self.assertEqual([record["value"] for record in after], [record["value"] for record in before])
                # From here on nothing changes any more: times and devices are those of the first conversion.
                again = run("convert", "-o", form, *options, stdin=out)
                self.assertEqual(again[0], 0)
                self.assertEqual(run("convert", "-o", form, *options, stdin=again[1]), again)

    def test_csv_holds_the_same_numbers(self):
        samples = [report for report in self.reports if report[0] in (0x76, 0x77, 0xE4, 0xE5, 0xA2, 0xEC)]
        text = as_hex_text(samples)
        status, out, _ = run("decode", "-o", "csv", stdin=text)
        self.assertEqual(status, 0)
        rows = list(csv.DictReader(io.StringIO(out.decode())))
        records, _ = self.lines(stdin=text)
        columns = {0x76: {"d_scan_i": "D_SCAN_I", "d_scan_q": "D_SCAN_Q", "p_scan_i": "P_SCAN_I", "p_scan_q": "P_SCAN_Q"},
                   0x77: {"payload": "PAYLOAD_DATA"}, 0xA2: {"value": "BASELINE"}, 0xEC: {"value": "NOISY_PIXEL_THRESHOLDS"},
                   0xE4: {"i": "SCAN_DATA_I", "q": "SCAN_DATA_Q"}, 0xE5: {"i": "SCAN_DATA_I", "q": "SCAN_DATA_Q"}}
        at = 0
        for record in records:
            mapping = columns[record["report"]["id"]]
            channels = len(record["value"][next(iter(mapping.values()))])
            for channel in range(channels):
                row = rows[at]
                at += 1
                self.assertEqual(row["report"], record["report"]["name"])
                self.assertEqual(int(row["channel"]), channel)
                filled = {name for name in ("d_scan_i", "d_scan_q", "p_scan_i", "p_scan_q", "payload", "i", "q", "value")
                          if row[name] != ""}
                self.assertEqual(filled, set(mapping))
                for column, key in mapping.items():
                    number = record["value"][key][channel]
                    if number is None:
                        self.assertIn(row[column].lstrip("-"), ("nan", "inf"))
                    else:
                        self.assertEqual(type(number)(row[column]), number)
        self.assertEqual(at, len(rows))
        status, out, err = run("decode", "-o", "csv", "--hex", "DE 00")
        self.assertEqual((status, len(out.splitlines())), (4, 1))
        self.assertIn(b"adc-dump-state", err)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
