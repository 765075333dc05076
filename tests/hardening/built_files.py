#!/usr/bin/env python3
"""The built program and the built plug-in are as hard as their flags say.

Usage: built_files.py READELF COMPILER COMPILE-COMMANDS PROGRAM PLUGIN
COMPILER is "unoptimised" for a build in which the C library cannot check anything.
"""

import json
import pathlib
import re
import subprocess
import sys

READELF, COMPILER, COMMANDS, PROGRAM, PLUGIN = sys.argv[1:6]
failures = []


def readelf(option, path):
    return subprocess.run([READELF, "-W", option, path], check=True, capture_output=True, text=True).stdout


def expect(holds, what):
    print("ok:" if holds else "FAILED:", what)
    if not holds:
        failures.append(what)


def check(path):
    header, segments, dynamic, symbols = (readelf(option, path) for option in ("-h", "-l", "-d", "--dyn-syms"))
    name = path.rsplit("/", 1)[-1]
    expect("DYN" in re.search(r"Type:.*", header).group(), f"{name} can be loaded at any address")
    expect("GNU_RELRO" in segments and re.search(r"BIND_NOW|FLAGS.*\bNOW\b", dynamic) is not None,
           f"{name}: relocations are read-only once it runs")
    stack = re.search(r"GNU_STACK.*", segments)
    expect(stack is not None and " RWE" not in stack.group(), f"{name}: the stack is not executable")
    expect(not re.search(r"LOAD.* RWE", segments), f"{name}: no memory is both writable and executable")
    expect("TEXTREL" not in dynamic, f"{name}: code is not relocated")
    expect("__stack_chk_fail" in symbols, f"{name}: stacks are guarded")
    return symbols, dynamic


def main():
    symbols, _ = check(PROGRAM)
    check(PLUGIN)
    expect("PIE" in readelf("-d", PROGRAM) or "pie" in readelf("-h", PROGRAM).lower(), "the program is a PIE")
    if COMPILER != "unoptimised":
        commands = [entry for entry in json.loads(pathlib.Path(COMMANDS).read_text())
                    if re.search(r"/(values|plugin|reports|host)/", entry["file"]) and "/tests/" not in entry["file"]]
        expect(len(commands) > 80, "the commands of the product's sources are there")
        for entry in commands:
            expect("-D_FORTIFY_SOURCE=2" in entry["command"] and "-D_GLIBCXX_ASSERTIONS" in entry["command"],
                   f"{entry['file']} is compiled with the checks of both libraries")
    if COMPILER == "GNU":  # clang 14 leaves none, because it knows all sizes or none
        expect(re.search(r"__\w+_chk@", symbols.replace("__stack_chk_fail", "")) is not None,
               "the C library's checked functions are used")
    sys.exit(1 if failures else 0)


if __name__ == "__main__":
    main()
