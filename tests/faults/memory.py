#!/usr/bin/env python3
"""Every allocation of vesk-report fails in turn, from when it makes its output file to its end.

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


def run(arguments, output, number):
    for path in output.parent.glob("out*"):
        path.unlink()
    return subprocess.run([PROGRAM, *arguments, "-O", str(output)], stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
                          stderr=subprocess.PIPE, text=True, timeout=60,
                          env={**os.environ, "LD_PRELOAD": SHIM, "VESK_NO_MEMORY": str(number)})


def check(arguments, output):
    count = int(re.search(r"allocations: (\d+)", run(arguments, output, 0).stderr)[1])
    whole = output.read_bytes()
    refused = 0
    for number in range(1, count + 1):
        result = run(arguments, output, number)
        what = f"{arguments}, allocation {number} of {count}"
        left = output.read_bytes() if output.exists() else None
        expect(result.returncode in (0, 3), f"{what}: exit code {result.returncode}: {result.stderr}")
        expect(left == (whole if result.returncode == 0 else None), f"{what}: the file")
        expect(result.returncode == 0 or "error: " in result.stderr, f"{what}: nothing is said: {result.stderr}")
        expect([*output.parent.glob("out?*")] == [], f"{what}: something is left over")
        refused += result.returncode == 3
    expect(refused > 50, f"{arguments}: only {refused} of {count} runs failed")


def main():
    with tempfile.TemporaryDirectory() as folder:
        for arguments in RUNS:
            check(arguments, pathlib.Path(folder) / "out")
    finish()


if __name__ == "__main__":
    main()
