#!/usr/bin/env python3
"""Feeds vesk-report more than fits anywhere, and watches its memory. Called by tools/load.sh.

Usage: load.py PROGRAM
"""

import pathlib
import re
import struct
import subprocess
import sys
import tempfile
import threading
import time

PROGRAM = sys.argv[1]
MOST_MEMORY = 64 << 20  # with all threads; one thread takes half
failed = False


def image(frame, size=792):
    return struct.pack("<BBHIII", 0x76, 0, 0, frame & 0xFFFFFFFF, 0, frame * 17 & 0xFFFFFFFF) + bytes(size - 16)


def packets(count):
    """A capture of `count` input reports, each as the Linux kernel records it."""
    yield struct.pack("<IHHIIII", 0xA1B2C3D4, 2, 4, 0, 0, 262144, 220)
    for first in range(0, count, 1000):
        yield b"".join(
            struct.pack("<IIIIQBBBBHBBqiiII8xiiII", n // 60, n % 60 * 16000, 856, 856, 1, 0x43, 1, 0x81, 7, 1, 0x2D, 0, n // 60,
                        n % 60 * 16000, 0, 792, 792, 8, 0, 0x200, 0) + image(n) for n in range(first, min(first + 1000, count)))


def recorded(count, per_second=60):
    yield b"R: 4 05 01 09 02\nN: Vesk Controller\nI: 3 1234 5678\n"
    for first in range(0, count, 1000):
        yield b"".join(b"E: %06d.%06d 792 %s\n" % (n // per_second, n % per_second * (1000000 // per_second),
                                                   image(n).hex(" ").encode())
                       for n in range(first, min(first + 1000, count)))


def hostile():
    """Times, lengths and counts that lie, in a recording that never ends well."""
    yield b"R: 4294967295 05\nI: ffffffffffffffff ffff ffff\nD: 99999999999999999999\n"
    numbers = [b"-1", b"0", b"4294967295", b"18446744073709551616", b"1e9", b"nan", b""]
    for n in range(200_000):
        seconds, length = numbers[n % 7], numbers[n // 7 % 7]
        yield b"D: %d\nE: %s.%s %s 76 00\nF: %s %s e1\n" % (n, seconds, length, length, seconds, length)


def most_memory(process, found):
    """Keeps the high-water mark until the process is gone. (What wait4 tells includes that of the process it came from.)"""
    while True:
        try:
            status = pathlib.Path(f"/proc/{process.pid}/status").read_text()
        except OSError:
            return
        mark = re.search(r"VmHWM:\s+(\d+) kB", status)
        if mark is None:
            return
        found[0] = int(mark.group(1)) << 10
        time.sleep(0.02)


def keep_end(stream, found):
    """Reads all and keeps the end."""
    while piece := stream.read1(1 << 20):
        found[0] = (found[0] + piece)[-1000:]


def run(what, arguments, feed, reports=None, seconds=None):
    """Feeds standard input (or nothing), and tells time, bytes and the most memory."""
    global failed
    begin = time.monotonic()
    process = subprocess.Popen([PROGRAM, *arguments], stdin=subprocess.PIPE if feed else subprocess.DEVNULL,
                               stdout=subprocess.PIPE, stderr=subprocess.PIPE)
    memory, end, errors = [0], [b""], [b""]
    threads = [threading.Thread(target=most_memory, args=(process, memory)),
               threading.Thread(target=keep_end, args=(process.stdout, end)),
               threading.Thread(target=lambda: errors.__setitem__(0, process.stderr.read()))]
    for thread in threads:
        thread.start()
    fed = 0
    for piece in feed or ():
        process.stdin.write(piece)
        fed += len(piece)
        if seconds and time.monotonic() - begin > seconds:
            break
    if feed:
        process.stdin.close()
    threads[1].join()
    threads[2].join()
    code = process.wait()
    threads[0].join()
    good = code in (0, 4) and 0 < memory[0] <= MOST_MEMORY and len(errors[0]) < 1 << 20
    if reports is not None:
        good = good and b'"summary":{"reports":%d}' % reports in end[0]
    failed = failed or not good
    print(f"{what}: {fed >> 20} MB fed, {time.monotonic() - begin:.1f} s, most memory {memory[0] / (1 << 20):.1f} MB, "
          f"exit code {code}, {len(errors[0])} bytes of messages" + ("" if good else "  FAILED"), flush=True)


def main():
    with tempfile.TemporaryDirectory() as folder:
        capture = pathlib.Path(folder, "capture.pcap")
        with open(capture, "wb") as file:
            for piece in packets(1_150_000):
                file.write(piece)
        size = capture.stat().st_size >> 20
        for jobs in ("1", "2"):
            for form in ("text", "jsonl"):
                run(f"capture of {size} MB to {form}, {jobs} jobs", ["decode", "-o", form, "--jobs", jobs, str(capture)], None,
                    1_150_000 if form == "jsonl" else None)
    run("24 hours at 6 Hz", ["decode", "-o", "jsonl"], recorded(24 * 3600 * 6, 6), 24 * 3600 * 6)
    run("a pipe that does not end, for 20 s", ["decode", "-o", "jsonl"], recorded(10**9), seconds=20)
    run("a recording that lies", ["decode", "-o", "json"], hostile())
    sys.exit(1 if failed else 0)


if __name__ == "__main__":
    main()
