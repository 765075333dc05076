#!/usr/bin/env python3
"""Adds up by room what was reached, and names what was not. Called by tools/coverage.sh.

Usage: coverage.py FILE.lcov [--show]
A header's line, or a condition in a template, counts as reached where any of its copies was.
"""

import collections
import pathlib
import sys

ROOT = pathlib.Path(__file__).resolve().parent.parent
ROOMS = {"values": "core", "plugin": "core", "reports": "core", "host": "host"}
LEAST = {"core lines": 100.0, "core branches": 100.0, "host lines": 95.0}


def collect(report):
    """(file, line) to how often it ran, and (file, line, place in the line, outcome) to how often it was taken."""
    lines, branches = collections.Counter(), collections.Counter()
    path = None
    for record in report.read_text().splitlines():
        kind, _, rest = record.partition(":")
        if kind == "SF":
            file = pathlib.Path(rest)
            relative = file.relative_to(ROOT) if file.is_relative_to(ROOT) else None
            path = str(relative) if relative is not None and relative.parts[0] in ROOMS else None
        elif path is not None and kind == "DA":
            number, count = rest.split(",")[:2]
            lines[path, int(number)] += int(count)
        elif path is not None and kind == "BRDA":
            number, block, branch, count = rest.split(",")
            branches[path, int(number), block, branch] += 0 if count == "-" else int(count)
    return lines, branches


def source(path, number):
    return (ROOT / path).read_text().splitlines()[number - 1].strip()


def main():
    lines, branches = collect(pathlib.Path(sys.argv[1]))
    show = "--show" in sys.argv[2:]
    failed = not lines
    for room in ("core", "host"):
        for what, counts in (("lines", lines), ("branches", branches)):
            own = [key for key in counts if ROOMS[key[0].split("/")[0]] == room]
            missed = sorted({key[:2] for key in own if counts[key] == 0})
            if show or room == "core":
                for path, number in missed:
                    print(f"{path}:{number}: {'never run' if what == 'lines' else 'one outcome only'}: {source(path, number)}")
            reached = 100.0 * sum(counts[key] != 0 for key in own) / max(1, len(own))
            least = LEAST.get(f"{room} {what}", 0.0)
            failed = failed or reached < least
            print(f"{room} {what}: {reached:.2f} % of {len(own)}" + (f"; {least:.0f} % wanted" if reached < least else ""))
    sys.exit(1 if failed else 0)


if __name__ == "__main__":
    main()
