#!/usr/bin/env python3
"""The host of examples/embedding builds against the plug-in as docs/EMBEDDING.md says, and does what it promises.

Usage: embedding.py REPOSITORY PLUGIN NM
"""

import os
import pathlib
import subprocess
import sys
import tempfile

REPOSITORY, PLUGIN, NM = sys.argv[1:4]
failures = []


def expect(holds, what):
    if not holds:
        failures.append(what)
        print("FAILED:", what)


def check_symbols():
    listed = {line for line in pathlib.Path(REPOSITORY, "tests/embedding/exported-symbols.txt").read_text().splitlines()
              if not line.startswith("#")}
    shown = subprocess.run([NM, "-D", "-C", "--defined-only", PLUGIN], check=True, capture_output=True, text=True).stdout
    symbols = {(line.split()[1], line.split(" ", 2)[2]) for line in shown.splitlines()}
    # Without optimisation the compiler also leaves copies of the class's inline functions there, as weak symbols.
    strong = {name for kind, name in symbols if kind not in "WV"}
    expect(len(listed) > 30, "the list of symbols is there")
    for name in sorted(listed - {name for _, name in symbols}):
        failures.append(f"no longer exported: {name}")
    for name in sorted(strong - listed):
        failures.append(f"exported and not listed: {name}")


def build(folder):
    subprocess.run(["cmake", "-S", f"{REPOSITORY}/examples/embedding", "-B", folder, f"-DVESK_PLUGIN={PLUGIN}",
                    "-DCMAKE_BUILD_TYPE=Release"], check=True, stdout=subprocess.DEVNULL)
    subprocess.run(["cmake", "--build", folder], check=True, stdout=subprocess.DEVNULL)
    return f"{folder}/host"


def run(host, folder, report, *options):
    path = pathlib.Path(folder, "report")
    path.write_bytes(report)
    result = subprocess.run([host, path, *options], capture_output=True, text=True)
    return result.returncode, result.stdout, result.stderr


def check_host(folder):
    host = build(folder)
    code, out, _ = run(host, folder, bytes.fromhex("E00D0500214024"))
    expect(code == 0, "the summary is decoded")
    expect("/SEVERITY_LEVEL = 13\n/MODULE_COUNT = 5\n/BLACK_BOX = 1\n/PSE = 0\n" in out, f"its value: {out}")
    expect("\n--Black Box Summary--\nSeverity Level: CRITICAL\nModule Count:   5\n\n" in out, f"its lines: {out}")
    image = bytes([0x76]) + bytes(787) + bytes(4)
    code, out, _ = run(host, folder, image, "-decimal")
    expect(code == 0 and "/D_SCAN_I: 48 numbers\n" in out and ("\n" + "             0 " * 8 + "\n") in out, "the image")
    code, out, errors = run(host, folder, image[:-1])
    expect((code, out) == (4, "") and "nothing decodes report 0x76 of 791 bytes" in errors, "a wrong length")
    code, out, _ = run(host, folder, b"\xE0", "-Decimal")
    expect(code == 2 and "Invalid option: -Decimal" in out, "an option that is none")
    code, out, errors = run(host, folder, b"\xD2a\nb\0")
    expect((code, out) == (4, "") and "fewer than six lines" in errors, "an exception of a decoder")
    code, out, _ = run(host, folder, b"\xE1")
    expect(code == 0 and out.count("\n") > 303, "one byte is enough for a report of 1023")


def main():
    check_symbols()
    with tempfile.TemporaryDirectory() as folder:
        check_host(folder)
    print(*failures, sep="\n")
    sys.exit(1 if failures else 0)


if __name__ == "__main__":
    main()
