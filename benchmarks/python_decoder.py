#!/usr/bin/env python3
"""What a user would write in an afternoon: ADC dump packets of a raw recording as text, with struct."""

import struct
import sys

SIZE = 2064


def main():
    with open(sys.argv[1], "rb") as recording:
        while len(report := recording.read(SIZE)) == SIZE:
            _, *magic, number, payload, total = struct.unpack_from("<4B3I", report)
            words = struct.unpack_from("<512I", report, 16)
            lines = ["", f"[ADC Packet #    = {number}]", "[Magic Value     = 0x%02x%02x%02x]" % tuple(magic),
                     f"[Payload Size    = {payload}]", f"[Total Dump Size = {total}]", "", "[Packet Payload Data]"]
            for first in range(0, 512, 8):
                lines.append("%08x %08x %08x %08x %08x %08x %08x %08x " % words[first:first + 8])
            sys.stdout.write("\n".join(lines) + "\n\n")


if __name__ == "__main__":
    main()
