#!/usr/bin/env python3
"""Decodes every capture that make_captures writes, from the file and from standard input, and compares what comes out
with what was put in: each report, the messages and the exit code."""

import json
import pathlib
import subprocess
import sys
import tempfile

# They say how a run went, not what was wrong with it.
ALWAYS = {"input-kind", "capture-summary"}


def decode(program, path, through_pipe):
    command = [program, "decode", "-o", "json", "--with-bytes", "-" if through_pipe else str(path)]
    with open(path if through_pipe else "/dev/null", "rb") as standard_input:
        result = subprocess.run(command, stdin=standard_input, capture_output=True, timeout=60, check=False)
    return result.returncode, json.loads(result.stdout)


def differences(expected, exit_code, document):
    codes = {message["code"] for message in document["messages"]} - ALWAYS
    reports = [(report["report"]["type"], report["bytes"]) for report in document["reports"]]
    wanted = [(report["type"], report["bytes"]) for report in expected["reports"]]
    if exit_code != expected["exit"] or document["exit_status"] != exit_code:
        yield f"exit code {exit_code}, expected {expected['exit']}"
    if sorted(codes) != expected["messages"]:
        yield f"messages {sorted(codes)}, expected {expected['messages']}"
    if reports != wanted:
        yield f"{len(reports)} reports, expected these {len(wanted)}"
    if any(report["source"]["device"] != "1.7" for report in document["reports"]):
        yield "a report of another device"


def packet_numbers(program, path):
    command = [program, "decode", "--headers", str(path)]
    result = subprocess.run(command, capture_output=True, timeout=60, check=False)
    lines = result.stdout.decode().splitlines()
    return [int(line.split("packet ")[1].split()[0].rstrip(":,")) for line in lines if line.startswith("== ")]


def main():
    source, program = pathlib.Path(sys.argv[1]), sys.argv[2]
    failures = 0
    with tempfile.TemporaryDirectory() as name:
        folder = pathlib.Path(name)
        subprocess.run([sys.executable, source / "tools/make_captures", folder], check=True)
        captures = json.loads((folder / "captures.json").read_text())
        for expected in captures:
            path = folder / expected["file"]
            complaints = []
            for through_pipe in (False, True):
                complaints += differences(expected, *decode(program, path, through_pipe))
            if packet_numbers(program, path) != [report["packet"] for report in expected["reports"]]:
                complaints.append(f"packets {packet_numbers(program, path)}")
            for complaint in complaints:
                print(f"{expected['file']}: {complaint}")
            failures += bool(complaints)
        print(f"{len(captures)} captures, {failures} not as they should be")
    return 1 if failures or len(captures) < 60 else 0


if __name__ == "__main__":
    sys.exit(main())
