"""Boots the guest for one case and gives its checks what came back.

A case is cases/NAME.sh, which runs in the guest, and cases/NAME.py, which holds a subclass of Case and ends in
bench.main(__file__). Its command line: --cache FOLDER --results FOLDER [--reuse] PROGRAM...
"""

import argparse
import os
import pathlib
import re
import subprocess
import sys
import unittest

CANNOT_RUN = 77

results = None  # the folder with what the guest left
programs = {}  # name: path on this machine


class Step:
    """One command that ran in the guest."""

    def __init__(self, name):
        folder = results / "steps" / name
        self.out = (folder / "out").read_bytes()
        self.err = (folder / "err").read_bytes()
        self.ms = int((folder / "ms").read_text())
        kind, _, number = (folder / "status").read_text().strip().partition(" ")
        self.hung = kind == "limit"
        self.code = int(number) if kind == "exit" else None
        self.signal = int(number) if kind == "signal" else None

    @property
    def lines(self):
        return self.out.decode().splitlines()


class Event:
    """One line of a controller's log."""

    def __init__(self, line):
        ms, self.kind, *rest = line.split(" ", 2)
        self.ms = int(ms)
        self.details = rest[0] if rest else ""


def log(name):
    return [Event(line) for line in (results / f"{name}.log").read_text().splitlines()]


class Case(unittest.TestCase):
    """The base of all cases, with the checks that hold in every one."""

    written_on_purpose = frozenset()  # controllers
    hung_on_purpose = frozenset()  # steps

    def step(self, name):
        return Step(name)

    def log(self, name):
        return log(name)

    def controllers(self):
        names = {path.stem for path in results.glob("*.log")}
        self.assertTrue(names, "no controller ran")
        return names

    def test_nothing_was_ever_written_to_a_device(self):
        for name in self.controllers() - self.written_on_purpose:
            written = [e.details for e in log(name) if e.kind in ("set-report", "output")]
            self.assertEqual(written, [], name)

    def test_every_controller_understood_its_commands(self):
        for name in self.controllers():
            self.assertEqual([e.details for e in log(name) if e.kind in ("error", "event")], [], name)

    def test_no_step_hung_or_was_lost(self):
        for path in (results / "steps").iterdir():
            self.assertTrue((path / "status").exists(), f"step {path.name} never ended")
            if path.name not in self.hung_on_purpose:
                self.assertFalse(Step(path.name).hung, f"step {path.name} ran into its limit")

    def test_kernel_is_sound(self):
        bad = re.findall(r".*(?:BUG:|Oops|WARNING:|Call Trace).*", (results / "dmesg").read_text(errors="replace"))
        self.assertEqual(bad, [])


def main(case, limit=120, cpus=1, files=()):
    """Boots, unless told to reuse, and runs the checks of the calling file; `files` are ("here", "/in/the/guest")."""
    global results
    case = pathlib.Path(case).resolve()
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("--cache", required=True)
    parser.add_argument("--results", required=True, type=pathlib.Path)
    parser.add_argument("--reuse", action="store_true", help="check the results of the last boot again")
    parser.add_argument("programs", nargs="+")
    options = parser.parse_args()
    results = options.results
    programs.update({pathlib.Path(p).name: p for p in options.programs})
    if not options.reuse:
        command = [case.parent.parent / "boot", "--script", case.with_suffix(".sh"), "--cache", options.cache]
        command += ["--results", results, "--limit", str(limit), "--cpus", str(cpus)]
        for here, there in files:
            command += ["--file", f"{here}={there}"]
        code = subprocess.run([*command, *options.programs]).returncode
        if code == CANNOT_RUN and not os.environ.get("VESK_KERNEL_REQUIRED"):
            sys.exit(CANNOT_RUN)
        if code != 0:
            sys.exit(f"{case.stem}: the guest's run failed (boot ended with {code}), see {results}")
    unittest.main(module="__main__", argv=[str(case)], verbosity=1)
