#!/usr/bin/env python3
"""Tests the tests: changes the core in one place at a time, and expects that a test fails.

Usage: tools/mutate.sh [--sample N] [--every-character] [--anew] [FILE]...
Changed are numbers, operators, characters of strings, and statements (which go) of values/, plugin/ and reports/. Each
source file of the tests becomes a program of its own, linked to the core as a shared library; so a change costs the
compilation of one file, and the tests that noticed its neighbours run first. What was noticed is kept in
build/mutate/results.jsonl and not tried again while its line is the same. tests/equivalent-mutants.txt lists changes
that cannot be noticed, with the reason. What survives and is not listed there is printed, and makes it fail.
"""

import argparse
import collections
import concurrent.futures
import fcntl
import json
import os
import pathlib
import re
import resource
import shutil
import subprocess
import sys
import threading
import time

from mutants import FOLDERS, ROOT, chosen_mutants, known_equivalents

BUILD = ROOT / "build" / "mutate"
RESULTS = BUILD / "results.jsonl"
CXX = ["g++", "-std=c++20", "-w", "-D_GLIBCXX_ASSERTIONS", "-fPIC"]
# Changed code is compiled for one run of the tests: quickly, and with the standard headers read beforehand.
QUICKLY = ["-O0", "-include", BUILD / "headers.h"]
HEADERS = ("algorithm array bit charconv cmath cstddef cstdint cstdio cstring functional limits map memory new optional "
           "ostream random set span sstream stdexcept string string_view type_traits utility variant vector "
           "gmock/gmock.h gtest/gtest.h").split()
LIBRARY = "libvesk_mutant.so"
ADDRESS_SPACE = 4 << 30
COMPILER_SECONDS = 120


def limited(seconds):
    """Limits of processor time, so that a busy machine makes no difference; an endless loop ends there."""
    def limit():
        resource.setrlimit(resource.RLIMIT_AS, (ADDRESS_SPACE, ADDRESS_SPACE))
        resource.setrlimit(resource.RLIMIT_CORE, (0, 0))
        resource.setrlimit(resource.RLIMIT_CPU, (seconds, seconds))
    return limit


def run(command, seconds=COMPILER_SECONDS, **options):
    return subprocess.run(list(map(str, command)), stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True,
                          errors="replace", preexec_fn=limited(seconds), **options)


def must(command):
    result = run(command)
    if result.returncode != 0:
        sys.exit(f"{' '.join(map(str, command))}\n{result.stdout}")


class Bench:
    """The core as objects, the tests as programs, and a folder for each worker."""

    def __init__(self, jobs):
        self.sources = self.found(ROOT)
        self.tests = [t for t in self.found(ROOT / "tests") if t.stem != "Exports"]  # it asks about the released library
        self.workers = threading.local()
        self.numbers = iter(range(1000))
        self.noticed_by = collections.defaultdict(collections.Counter)
        self.precompile()
        with concurrent.futures.ThreadPoolExecutor(jobs) as pool:
            list(pool.map(self.compile, self.sources, ["-O0"] * len(self.sources)))
            list(pool.map(self.compile, self.tests, ["-O1"] * len(self.tests)))
        self.depends = {file: self.read_depends(file) for file in self.sources + self.tests}
        self.link([self.object(source) for source in self.sources], BUILD / LIBRARY)
        self.seconds = dict.fromkeys(self.tests, 600)
        for test in self.tests:
            if not self.link_test(self.object(test), self.program(test)):
                sys.exit(f"{test} cannot be linked")
            before = resource.getrusage(resource.RUSAGE_CHILDREN).ru_utime
            if self.fails(test, BUILD):
                sys.exit(f"{test} fails before anything was changed")
            used = resource.getrusage(resource.RUSAGE_CHILDREN).ru_utime - before
            self.seconds[test] = 3 + round(4 * used)
        self.tests.sort(key=self.seconds.get)

    @staticmethod
    def found(root):
        return sorted(p.relative_to(ROOT) for folder in FOLDERS for p in (root / folder).rglob("*.cpp"))

    @staticmethod
    def precompile():
        header = BUILD / "headers.h"
        if not header.exists():
            header.write_text("".join(f"#include <{name}>\n" for name in HEADERS))
            must([*CXX, "-O0", "-x", "c++-header", header, "-o", f"{header}.gch"])

    @staticmethod
    def object(path):
        return BUILD / (str(path).replace("/", "_") + ".o")

    @staticmethod
    def program(test):
        return BUILD / str(test).replace("/", "_").removesuffix(".cpp")

    def read_depends(self, path):
        """The files of the repository that `path` reads."""
        listed = self.object(path).with_suffix(".d")
        return {word for word in re.split(r"[\s\\]+", listed.read_text())[1:] if word} if listed.exists() else set()

    def compile(self, path, optimisation):
        file, known = self.object(path), self.read_depends(path)
        if known and file.exists() and all(os.path.exists(p) and os.path.getmtime(p) < file.stat().st_mtime for p in known):
            return
        must([*CXX, optimisation, f"-I{ROOT}", "-MMD", "-c", ROOT / path, "-o", file])

    @staticmethod
    def link(objects, library):
        return run(["g++", "-fuse-ld=gold", "-shared", "-Wl,-Bsymbolic", *objects, "-o", library]).returncode == 0

    @staticmethod
    def link_test(test_object, program):
        return run(["g++", "-fuse-ld=gold", test_object, f"-L{BUILD}", "-lvesk_mutant", "-lgmock", "-lgtest_main",
                    "-lgtest", "-pthread", "-ldl", "-o", program]).returncode == 0

    def fails(self, test, libraries, program=None):
        return run([program or self.program(test), "--gtest_fail_fast", "--gtest_brief=1"], self.seconds[test],
                   env={"LD_LIBRARY_PATH": str(libraries)}, cwd="/").returncode != 0

    def folder(self):
        if not hasattr(self.workers, "path"):
            self.workers.path = BUILD / f"worker{next(self.numbers)}"
        shutil.rmtree(self.workers.path, ignore_errors=True)
        self.workers.path.mkdir()
        return self.workers.path

    def likely_first(self, path):
        """The tests that noticed most changes of this file, the one of the same name, of the same folder, the others."""
        noticed = self.noticed_by[str(path)]
        return sorted(self.tests, key=lambda test: (-noticed[str(test)], test.stem != path.stem,
                                                    test.parent.name != path.parent.name))

    def judge(self, mutant, listed):
        """"killed" and by which test, "compiler" for what does not compile, or "survived". `listed`: as equivalent."""
        folder, path = self.folder(), pathlib.Path(mutant.path)
        (folder / path).parent.mkdir(parents=True)
        (folder / path).write_text(mutant.text)
        near = [test for test in self.likely_first(path) if test.parent == "tests" / path.parent]
        beside = [test for test in near if self.includes(test, path)]
        # The tests beside a header instantiate what it declares; most changes end here, without building the core anew.
        verdict = self.judge_by(beside, path, folder) or self.judge_in_core(path, folder)
        if verdict is None and not listed:  # what is inline may be in tests alone that read the header by way of others
            others = [test for test in near if test not in beside and str(ROOT / path) in self.depends[test]]
            verdict = self.judge_by(others, path, folder)
        return verdict or ("survived", "")

    @staticmethod
    def includes(test, header):
        return f'#include "{header}"' in (ROOT / test).read_text()

    def compile_changed(self, path, folder, file):
        """Compiles `path` as it is with the change."""
        changed = folder / path if (folder / path).exists() else ROOT / path
        return run([*CXX, *QUICKLY, f"-I{folder}", f"-I{ROOT}", "-c", changed, "-o", file]).returncode == 0

    def judge_by(self, tests, path, folder):
        """Judges the change of a header by tests that read it, compiled anew, and the core as it was."""
        for test in tests:
            program, test_object = folder / "test", folder / "test.o"
            if not self.compile_changed(test, folder, test_object) or not self.link_test(test_object, program):
                return "compiler", ""
            if self.fails(test, BUILD, program):
                self.noticed_by[str(path)][str(test)] += 1
                return "killed", str(test)
        return None

    def judge_in_core(self, path, folder):
        objects = []
        for source in self.sources:
            objects.append(self.object(source))
            if str(ROOT / path) in self.depends[source]:
                objects[-1] = folder / objects[-1].name
                if not self.compile_changed(source, folder, objects[-1]):
                    return "compiler", ""
        if not self.link(objects, folder / LIBRARY):
            return "compiler", ""
        for test in self.likely_first(path):
            if self.fails(test, folder):
                self.noticed_by[str(path)][str(test)] += 1
                return "killed", str(test)
        return None


def known_results(mutants, is_equivalent):
    """Verdicts of earlier runs. What survived and is not listed is tried again: there may be a test for it now."""
    lines = [json.loads(line) for line in RESULTS.read_text().splitlines()] if RESULTS.exists() else []
    kept = {line["mutant"]: line["verdict"] for line in lines}
    verdicts = {mutant: kept[mutant.id] for mutant in mutants if mutant.id in kept}
    return {mutant: verdict for mutant, verdict in verdicts.items() if verdict != "survived" or is_equivalent(mutant.key)}


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--sample", type=int, metavar="N", help="N changes, the same ones each time")
    parser.add_argument("--every-character", action="store_true", help="every character of a string, not one of them")
    parser.add_argument("--list", action="store_true", help="only show the changes")
    parser.add_argument("--anew", action="store_true", help="try again what was noticed before")
    parser.add_argument("--jobs", type=int, default=2)
    parser.add_argument("files", nargs="*", metavar="FILE")
    options = parser.parse_args()
    mutants = chosen_mutants(options.files, options.every_character, options.sample)
    if options.list:
        print(*mutants, sep="\n")
        return
    start = time.monotonic()
    BUILD.mkdir(parents=True, exist_ok=True)
    lock = (BUILD / "lock").open("w")
    fcntl.flock(lock, fcntl.LOCK_EX)  # a second run waits
    bench = Bench(options.jobs)
    if options.anew:
        RESULTS.unlink(missing_ok=True)
    is_equivalent = known_equivalents()
    known = known_results(mutants, is_equivalent)
    fresh = [mutant for mutant in mutants if mutant not in known]
    fresh.sort(key=lambda mutant: is_equivalent(mutant.key))  # last, because all tests run for them
    counts = collections.Counter("equivalent" if verdict == "survived" else verdict for verdict in known.values())
    with concurrent.futures.ThreadPoolExecutor(options.jobs) as pool, RESULTS.open("a") as log:
        listed = [is_equivalent(mutant.key) for mutant in fresh]
        for mutant, (verdict, test) in zip(fresh, pool.map(bench.judge, fresh, listed)):
            log.write(json.dumps({"mutant": mutant.id, "verdict": verdict, "by": test}) + "\n")
            log.flush()
            if verdict == "survived" and is_equivalent(mutant.key):
                verdict = "equivalent"
            counts[verdict] += 1
            if verdict == "survived":
                print(f"SURVIVED {mutant}", flush=True)
    print(f"{len(mutants)} changes: {counts['killed']} noticed by tests, {counts['compiler']} by the compiler, "
          f"{counts['equivalent']} cannot be noticed, {counts['survived']} survived; "
          f"{len(fresh)} tried now, in {round(time.monotonic() - start)} s")
    sys.exit(1 if counts["survived"] else 0)


if __name__ == "__main__":
    main()
