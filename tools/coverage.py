#!/usr/bin/env python3
"""Adds up by room what was reached, and names what was not. Called by tools/coverage.sh.

Usage: coverage.py LCOV-EXPORT TEXT-EXPORT [--show]
A header's line, or a condition in a template, counts as reached where any of its copies was.
"""

import collections
import json
import pathlib
import re
import sys

ROOT = pathlib.Path(__file__).resolve().parent.parent
ROOMS = {"values": "core", "plugin": "core", "reports": "core", "host": "host"}
LEAST = {"core lines": 100.0, "core branches": 100.0, "host lines": 95.0}

# Functions that the compiler runs and the program never does. What they make is tested whole.
COMPILE_TIME = re.compile(r"makeFourDigits|makeThreeHexDigits|parseConversion|blockSize|TextBlock.*append|"
                          r"allResolve|isPermutation|optionByte|shownByte|flagText|Format.*5kRoomI|layoutSize|"
                          r"vesk4host12_GLOBAL__N_15knownE")
# Outcomes that cannot be, each with its reason in docs/TESTING.md.
IMPOSSIBLE = {("plugin/Options.cpp", "if (!configuration || !configParser(*configuration, &error)) {"),
              ("values/DisplayLines.h", "friend bool operator==(const Iterator &, const Iterator &) = default;")}


def room_path(name):
    file = pathlib.Path(name)
    relative = file.relative_to(ROOT) if file.is_relative_to(ROOT) else None
    return str(relative) if relative is not None and relative.parts[0] in ROOMS else None


def run_by_compiler(export):
    """The lines of the functions above."""
    lines = set()
    for function in export["functions"]:
        path = room_path(function["filenames"][0])
        if path is not None and COMPILE_TIME.search(function["name"]):
            for region in function["regions"]:
                lines.update((path, number) for number in range(region[0], region[2] + 1))
    return lines


def count_lines(report, skipped):
    lines = collections.Counter()
    path = None
    for record in report.read_text().splitlines():
        kind, _, rest = record.partition(":")
        if kind == "SF":
            path = room_path(rest)
        elif path is not None and kind == "DA":
            number, count = rest.split(",")[:2]
            if (path, int(number)) not in skipped:
                lines[path, int(number)] += int(count)
    return lines


def count_branches(export, skipped):
    """(file, line, column, outcome) to how often it was taken."""
    branches = collections.Counter()
    for function in export["functions"]:
        for line, column, _, _, taken, not_taken, file, _, _ in function.get("branches", ()):
            path = room_path(function["filenames"][file])
            if path is None or (path, line) in skipped or (path, source(path, line)) in IMPOSSIBLE:
                continue
            branches[path, line, column, True] += taken
            branches[path, line, column, False] += not_taken
    return branches


def explained():
    """Branches of the host that one outcome is enough for: tests/uncovered-branches.txt says why."""
    lines = (ROOT / "tests/uncovered-branches.txt").read_text().splitlines()
    return {tuple(line.split(": ", 1)) for line in lines if line.startswith("host/")}


def source(path, number):
    return (ROOT / path).read_text().splitlines()[number - 1].strip()


def main():
    export = json.loads(pathlib.Path(sys.argv[2]).read_text())["data"][0]
    skipped = run_by_compiler(export)
    lines, branches = count_lines(pathlib.Path(sys.argv[1]), skipped), count_branches(export, skipped)
    show = "--show" in sys.argv[3:]
    known = explained()
    failed = not lines
    for room in ("core", "host"):
        for what, counts in (("lines", lines), ("branches", branches)):
            own = [key for key in counts if ROOMS[key[0].split("/")[0]] == room]
            missed = sorted({key[:2] for key in own if counts[key] == 0})
            if show or room == "core":
                for path, number in missed:
                    if what == "branches" and (path, source(path, number)) in known:
                        continue
                    print(f"{path}:{number}: {'never run' if what == 'lines' else 'one outcome only'}: {source(path, number)}")
            reached = 100.0 * sum(counts[key] != 0 for key in own) / max(1, len(own))
            least = LEAST.get(f"{room} {what}", 0.0)
            failed = failed or reached < least
            print(f"{room} {what}: {reached:.2f} % of {len(own)}" + (f"; {least:.0f} % wanted" if reached < least else ""))
    sys.exit(1 if failed else 0)


if __name__ == "__main__":
    main()
