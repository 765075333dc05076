#!/usr/bin/env python3
"""Every allocation of vesk-report fails in turn, from its first act to its end.

Usage: memory.py VESK-REPORT PRELOADED-LIBRARY EXAMPLES-FOLDER
What must hold: no run is killed; the exit code is 3 with a message, or the output is as it would have been; a file is
whole or is not there.
"""

import os
import pathlib
import re
import subprocess
import sys
import tempfile

from outcomes import expect, finish

PROGRAM, SHIM, EXAMPLES = sys.argv[1:4]
SESSION = str(pathlib.Path(EXAMPLES) / "session.hid")
RUNS = (["decode", "--jobs", "1", SESSION], ["decode", "--jobs", "4", SESSION], ["decode", "-o", "json", SESSION],
        ["convert", "-o", "recording", SESSION])
# Of these standard output is looked at, and how they end where all is well.
ANSWERS = ((["--help"], 0), (["explain", "0xE0"], 0), (["decode", "--nonsense"], 2))


def run(arguments, number):
    return subprocess.run([PROGRAM, *arguments], stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
                          stderr=subprocess.PIPE, text=True, timeout=60,
                          env={**os.environ, "LD_PRELOAD": SHIM, "VESK_NO_MEMORY": str(number)})


def allocations(result):
    return int(re.search(r"allocations: (\d+)", result.stderr)[1])


def check_file(arguments, output):
    arguments = [*arguments, "-O", str(output)]
    count = allocations(run(arguments, 0))
    whole = output.read_bytes()
    refused = 0
    for number in range(1, count + 1):
        output.unlink(missing_ok=True)
        result = run(arguments, number)
        what = f"{arguments}, allocation {number} of {count}"
        left = output.read_bytes() if output.exists() else None
        expect(result.returncode in (0, 3), f"{what}: exit code {result.returncode}: {result.stderr}")
        expect(left == (whole if result.returncode == 0 else None), f"{what}: the file")
        expect(result.returncode == 0 or "error: " in result.stderr, f"{what}: nothing is said: {result.stderr}")
        expect([*output.parent.glob("out?*")] == [], f"{what}: something is left over")
        refused += result.returncode == 3
    expect(refused > 500, f"{arguments}: only {refused} of {count} runs failed")


def check_answer(arguments, code):
    good = run(arguments, 0)
    expect(good.returncode == code, f"{arguments}: exit code {good.returncode}")
    count = allocations(good)
    refused = 0
    for number in range(1, count + 1):
        result = run(arguments, number)
        what = f"{arguments}, allocation {number} of {count}"
        expect(result.returncode in (code, 3), f"{what}: exit code {result.returncode}: {result.stderr}")
        expect(result.stdout == (good.stdout if result.returncode == code else ""), f"{what}: the answer")
        expect(result.returncode == code or "error: " in result.stderr, f"{what}: nothing is said: {result.stderr}")
        refused += result.returncode == 3
    expect(refused > 500, f"{arguments}: only {refused} of {count} runs failed")


def main():
    with tempfile.TemporaryDirectory() as folder:
        for arguments in RUNS:
            check_file(arguments, pathlib.Path(folder) / "out")
    for arguments, code in ANSWERS:
        check_answer(arguments, code)
    finish()


if __name__ == "__main__":
    main()
