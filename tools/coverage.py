#!/usr/bin/env python3
"""Adds up what gcov saw of a build: lines and branches, by folder. Called by tools/coverage.sh.

Usage: coverage.py BUILD-FOLDER [--show]
Lines of headers and templates count as reached where any of their copies was. A branch is one outcome of a condition in
a line of ours; outcomes that only a thrown exception takes are not counted.
"""

import collections
import json
import pathlib
import subprocess
import sys

ROOT = pathlib.Path(__file__).resolve().parent.parent
CORE = ("values", "plugin", "reports")
LEAST = {"core lines": 100.0, "core branches": 100.0, "host lines": 95.0}


def data_files(build):
    return sorted(pathlib.Path(build).resolve().rglob("*.gcda"))


def gcov(files):
    """The documents that gcov makes of many files at once, one a line."""
    for i in range(0, len(files), 20):
        out = subprocess.run(["gcov", "--stdout", "--json-format", "--branch-probabilities", *map(str, files[i:i + 20])],
                             check=True, capture_output=True, text=True).stdout
        for line in out.splitlines():
            if line.startswith("{"):
                yield json.loads(line)


def own_path(name, directory):
    path = pathlib.Path(directory, name).resolve()
    if not path.is_relative_to(ROOT):
        return None
    relative = path.relative_to(ROOT)
    return relative if relative.parts[0] in (*CORE, "host") else None


def collect(build):
    lines = collections.defaultdict(int)        # (file, line) to calls
    branches = collections.defaultdict(dict)    # (file, line) to {number in its copy: calls}
    for document in gcov(data_files(build)):
        for file in document["files"]:
            path = own_path(file["file"], document["current_working_directory"])
            if path is None:
                continue
            for line in file["lines"]:
                key = (str(path), line["line_number"])
                lines[key] += line["count"]
                outcomes = [branch["count"] for branch in line["branches"] if not branch["throw"]]
                # Copies of a template have each their own; an outcome counts where any copy took it.
                for number, count in enumerate(outcomes):
                    branches[key][number] = branches[key].get(number, 0) + count
    return lines, branches


def percent(reached, total):
    return 100.0 * reached / total if total else 0.0


def main():
    build, show = sys.argv[1], "--show" in sys.argv[2:]
    lines, branches = collect(build)
    results = {}
    for room, folders in (("core", CORE), ("host", ("host",))):
        own = [key for key in lines if key[0].split("/")[0] in folders]
        missed = sorted(key for key in own if lines[key] == 0)
        outcomes = [(key, number) for key in own for number in branches.get(key, {})]
        untaken = sorted({key for key, number in outcomes if branches[key][number] == 0 and lines[key] != 0})
        untaken_count = sum(branches[key][number] == 0 for key, number in outcomes)
        results[f"{room} lines"] = percent(len(own) - len(missed), len(own))
        results[f"{room} branches"] = percent(len(outcomes) - untaken_count, len(outcomes))
        if show or room == "core":
            for what, keys in (("never run", missed), ("a branch never taken", untaken)):
                for path, number in keys:
                    text = (ROOT / path).read_text().splitlines()[number - 1].strip()
                    print(f"{path}:{number}: {what}: {text}")
    failed = False
    for what, value in results.items():
        least = LEAST.get(what)
        low = least is not None and value < least
        failed = failed or low
        print(f"{what}: {value:.2f} %" + (f", at least {least:.0f} % wanted" if low else ""))
    sys.exit(1 if failed or not lines else 0)


if __name__ == "__main__":
    main()
