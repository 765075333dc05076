#!/usr/bin/env python3
"""Tests the tests: changes the core in one place at a time, and expects that a test fails.

Usage: tools/mutate.sh [--sample N] [--every-character] [FILE]...
Changed are numbers, operators, characters of strings, and statements (which go) of values/, plugin/ and reports/. Each
source file of the tests becomes a program of its own, linked to the core as a shared library; so a change costs the
compilation of one file, and the test of the same name runs first. tests/equivalent-mutants.txt lists changes that cannot
be noticed, with the reason. What survives and is not listed there is printed, and makes it fail.
"""

import argparse
import concurrent.futures
import hashlib
import json
import pathlib
import re
import resource
import shutil
import subprocess
import sys
import threading

ROOT = pathlib.Path(__file__).resolve().parent.parent
BUILD = ROOT / "build" / "mutate"
EQUIVALENT = ROOT / "tests" / "equivalent-mutants.txt"
FOLDERS = ("values", "plugin", "reports")
CXX = ["ccache", "g++"] if shutil.which("ccache") else ["g++"]
FLAGS = ["-std=c++20", "-fPIC", "-w", "-D_GLIBCXX_ASSERTIONS"]
CORE_FLAGS = [*FLAGS, "-O0"]
TEST_FLAGS = [*FLAGS, "-O1"]
LIBRARY = "libvesk_mutant.so"
ADDRESS_SPACE = 4 << 30

TOKEN = re.compile(r'''
    (?P<comment>//[^\n]*|/\*.*?\*/)
  | (?P<preprocessor>^[ \t]*\#(?:\\\n|[^\n])*)
  | (?P<assertion>static_assert\((?:[^;"]|"(?:\\.|[^"\\])*")*;)
  | (?P<string>"(?:\\.|[^"\\\n])*")
  | (?P<character>'(?:\\.|[^'\\\n])')
  | (?P<number>(?<![\w.])(?:0[xX][0-9a-fA-F'p]+|\d[\d']*(?:\.\d+)?(?:e-?\d+)?)[uUlLfF]*)
  | (?P<word>[A-Za-z_]\w*)
  | (?P<operator>\+\+|--|<<|>>|==|!=|<=|>=|&&|\|\||\+=|-=|\*=|/=|%=|\|=|&=|\^=|<<=|>>=|->|::|[-+*/%<>!&|^~?])
''', re.VERBOSE | re.MULTILINE | re.DOTALL)

BINARY = {"==": "!=", "!=": "==", "<": "<=", ">": ">=", "<=": "<", ">=": ">", "+": "-", "-": "+", "*": "+", "/": "*",
          "%": "/", "<<": ">>", ">>": "<<", "&&": "||", "||": "&&", "&": "|", "|": "&", "^": "|", "+=": "-=", "-=": "+=",
          "*=": "+=", "/=": "*=", "%=": "/=", "|=": "&=", "&=": "|=", "^=": "|=", "<<=": ">>=", ">>=": "<<="}
WORDS = {"true": "false", "false": "true", "min": "max", "max": "min"}


class Mutant:
    def __init__(self, path, text, begin, end, replacement):
        self.path, self.begin, self.end, self.replacement = path, begin, end, replacement
        self.text = text[:begin] + replacement + text[end:]
        first = text.rfind("\n", 0, begin) + 1
        last = text.find("\n", max(end - 1, begin))
        self.line = text.count("\n", 0, begin) + 1
        self.before = " ".join(text[first:last].split())
        self.after = " ".join((text[first:begin] + replacement + text[end:last]).split())

    @property
    def key(self):
        return f"{self.path}: {self.before} ==> {self.after}"

    def __str__(self):
        return f"{self.path}:{self.line}: {self.before} ==> {self.after}"


def number_replacements(token):
    match = re.fullmatch(r"(0[xX][0-9a-fA-F']+|[\d']+)([uUlL]*)", token)
    if not match:
        return [token.replace("e-", "e-1", 1) if "e-" in token else "1" + token]
    digits, suffix = match.group(1).replace("'", ""), match.group(2)
    value = int(digits, 0)
    if digits.lower().startswith("0x"):
        return [f"0x{value + 1:X}{suffix}"]
    return [f"{value + 1}{suffix}"]


def changed_character(character):
    return {"%": "5", "\\": "/"}.get(character, chr(ord(character) ^ 1) if character not in "!#" else "x")


def string_replacements(token, every):
    body = token[1:-1]
    if not body:
        return ['"x"']
    pieces = re.findall(r"\\.|[^\\]", body)
    positions = range(len(pieces))
    if not every:
        positions = [int(hashlib.sha256(body.encode()).hexdigest(), 16) % len(pieces)]
    results = []
    for i in positions:
        piece = changed_character(pieces[i]) if len(pieces[i]) == 1 else "x"
        results.append('"' + "".join(pieces[:i] + [piece] + pieces[i + 1:]) + '"')
    return results


def operator_replacements(text, match):
    token = match.group()
    if token in ("++", "--"):
        return ["--" if token == "++" else "++"]
    if token == "!":
        return [""]
    # clang-format has blanks around binary operators, and none behind references, pointers and template brackets.
    around = text[match.start() - 1:match.start()] + text[match.end():match.end() + 1]
    return [BINARY[token]] if token in BINARY and around.strip() == "" else []


NO_STATEMENT = re.compile(r"(return|using|static_assert|template|struct|class|enum|friend|namespace|extern|typedef|case|"
                          r"default|public|private|else|const|constexpr|inline|static|explicit|virtual|for|while|if|do|"
                          r"throw|break|continue|requires|operator|auto|char|unsigned|float|double|bool|int|std::\w+ \w)\b")


def statement_spans(text, skipped):
    """Statements that are calls or assignments, from their first character to the semicolon."""
    body = r"([A-Za-z_*+-](?:[^;{}#]|\{[^;{}]*\})*;)"
    for match in [*re.finditer(r"(?<=[;{}:\n])\s*" + body, text), *re.finditer(r"\b(?:if \([^;{}]*\)|else)\s+" + body, text)]:
        begin, statement = match.start(1), match.group(1)
        if any(a <= begin < b for a, b in skipped) or NO_STATEMENT.match(statement):
            continue
        if statement.count("(") == statement.count(")") and re.search(r"\(|=|\+\+|--", statement):
            yield begin, match.end(1)


def mutants_of(path, every):
    text = (ROOT / path).read_text()
    skipped, found = [], []
    for match in TOKEN.finditer(text):
        kind, token = match.lastgroup, match.group()
        if kind in ("comment", "preprocessor", "assertion"):
            skipped.append(match.span())
            continue
        replacements = []
        if kind == "string":
            replacements = string_replacements(token, every)
        elif kind == "character":
            replacements = ["'x'" if token != "'x'" else "'y'"]
        elif kind == "number":
            replacements = number_replacements(token)
        elif kind == "word" and token in WORDS:
            replacements = [WORDS[token]]
        elif kind == "operator":
            replacements = operator_replacements(text, match)
        found += [Mutant(path, text, *match.span(), replacement) for replacement in replacements]
    for begin, end in sorted(set(statement_spans(text, skipped))):
        found.append(Mutant(path, text, begin, end, ";"))
    return found


def run(command, **options):
    return subprocess.run(list(map(str, command)), stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True,
                          errors="replace", **options)


def must(command):
    result = run(command)
    if result.returncode != 0:
        sys.exit(f"{' '.join(map(str, command))}\n{result.stdout}")


def limited(seconds):
    """Limits for a test: of processor time, so that a busy machine makes no difference; an endless loop ends there."""
    def limit():
        resource.setrlimit(resource.RLIMIT_AS, (ADDRESS_SPACE, ADDRESS_SPACE))
        resource.setrlimit(resource.RLIMIT_CORE, (0, 0))
        resource.setrlimit(resource.RLIMIT_CPU, (seconds, seconds))
    return limit


class Bench:
    """The core as objects, the tests as programs, and a folder for each worker."""

    def __init__(self, jobs):
        self.sources = sorted(p.relative_to(ROOT) for folder in FOLDERS for p in (ROOT / folder).rglob("*.cpp"))
        self.tests = sorted(p.relative_to(ROOT) for folder in FOLDERS for p in (ROOT / "tests" / folder).rglob("*.cpp")
                            if p.stem != "Exports")  # which asks about the library as it is released
        self.workers = threading.local()
        self.numbers = iter(range(1000))
        BUILD.mkdir(parents=True, exist_ok=True)
        with concurrent.futures.ThreadPoolExecutor(jobs) as pool:
            list(pool.map(self.compile_source, self.sources))
            list(pool.map(self.compile_test, self.tests))
        self.link([self.object(source) for source in self.sources], BUILD / LIBRARY)
        self.depends = {source: set(re.split(r"[\s\\]+", run(["g++", "-std=c++20", "-MM", f"-I{ROOT}", ROOT / source]).stdout))
                        for source in self.sources}
        self.seconds = dict.fromkeys(self.tests, 600)
        for test in self.tests:
            self.build_test(test, BUILD)
            before = resource.getrusage(resource.RUSAGE_CHILDREN).ru_utime
            if self.fails(test, BUILD):
                sys.exit(f"{test} fails before anything was changed")
            used = resource.getrusage(resource.RUSAGE_CHILDREN).ru_utime - before
            self.seconds[test] = 3 + round(4 * used)
        self.tests.sort(key=self.seconds.get)

    @staticmethod
    def object(path):
        return BUILD / (str(path).replace("/", "_") + ".o")

    def compile_source(self, source):
        must([*CXX, *CORE_FLAGS, f"-I{ROOT}", "-c", ROOT / source, "-o", self.object(source)])

    def compile_test(self, test):
        must([*CXX, *TEST_FLAGS, f"-I{ROOT}", "-c", ROOT / test, "-o", self.object(test)])

    @staticmethod
    def program(test):
        return str(test).replace("/", "_").removesuffix(".cpp")

    def build_test(self, test, folder):
        if run(["g++", self.object(test), f"-L{folder}", "-lvesk_mutant", "-lgmock", "-lgtest_main", "-lgtest", "-pthread",
                "-ldl", "-o", folder / self.program(test)]).returncode != 0:
            sys.exit(f"{test} cannot be linked")

    @staticmethod
    def link(objects, library):
        return run(["g++", "-shared", "-Wl,-Bsymbolic", *objects, "-o", library]).returncode == 0

    def fails(self, test, libraries, program=None):
        return run([program or BUILD / self.program(test), "--gtest_fail_fast", "--gtest_brief=1"],
                   env={"LD_LIBRARY_PATH": str(libraries)}, preexec_fn=limited(self.seconds[test]),
                   cwd="/").returncode != 0

    def folder(self):
        if not hasattr(self.workers, "path"):
            self.workers.path = BUILD / f"worker{next(self.numbers)}"
        shutil.rmtree(self.workers.path, ignore_errors=True)
        self.workers.path.mkdir()
        return self.workers.path

    def likely_first(self, path):
        """The test of the same name, those of the same folder, the others."""
        return sorted(self.tests, key=lambda test: (test.stem != path.stem, test.parent.name != path.parent.name))

    def judge(self, mutant):
        """"killed", "compiler" for what does not compile, or "survived"."""
        folder, path = self.folder(), pathlib.Path(mutant.path)
        (folder / path).parent.mkdir(parents=True)
        (folder / path).write_text(mutant.text)
        includes = [f"-I{folder}", f"-I{ROOT}"]
        if path.suffix == ".h" and (own := ROOT / "tests" / path.with_suffix(".cpp")).exists():
            verdict = self.judge_header_by_own_test(own.relative_to(ROOT), folder, includes)
            if verdict != "survived":
                return verdict
        changed = {}
        for source in self.sources:
            if source == path:
                changed[source] = folder / source
            elif str(ROOT / path) in self.depends[source]:
                changed[source] = ROOT / source
        for source, file in changed.items():
            if run(["g++", *CORE_FLAGS, *includes, "-c", file, "-o", folder / self.object(source).name]).returncode != 0:
                return "compiler"
        objects = [folder / self.object(s).name if s in changed else self.object(s) for s in self.sources]
        if not self.link(objects, folder / LIBRARY):
            return "compiler"
        return "killed" if any(self.fails(test, folder) for test in self.likely_first(path)) else "survived"

    def judge_header_by_own_test(self, test, folder, includes):
        """A header's own test instantiates what it declares; most changes end here, without building the core anew."""
        if run(["g++", *TEST_FLAGS, *includes, "-c", ROOT / test, "-o", folder / "own.o"]).returncode != 0:
            return "compiler"
        if run(["g++", folder / "own.o", f"-L{BUILD}", "-lvesk_mutant", "-lgmock", "-lgtest_main", "-lgtest", "-pthread",
                "-ldl", "-o", folder / "own"]).returncode != 0:
            return "compiler"
        return "killed" if self.fails(test, BUILD, folder / "own") else "survived"


def known_equivalents():
    """A test for keys that are listed, as they stand or, behind a tilde, as a regular expression."""
    lines = [line.strip() for line in EQUIVALENT.read_text().splitlines() if " ==> " in line] if EQUIVALENT.exists() else []
    literal = {line for line in lines if not line.startswith("~ ")}
    patterns = [re.compile(line[2:]) for line in lines if line.startswith("~ ")]
    return lambda key: key in literal or any(pattern.fullmatch(key) for pattern in patterns)


def chosen_mutants(options):
    files = options.files or [str(p.relative_to(ROOT)) for folder in FOLDERS for p in sorted((ROOT / folder).rglob("*"))
                              if p.suffix in (".h", ".cpp")]
    mutants = [mutant for file in files for mutant in mutants_of(file, options.every_character)]
    if options.sample:
        mutants.sort(key=lambda mutant: hashlib.sha256(f"{mutant}{mutant.begin}".encode()).hexdigest())
        mutants = mutants[:options.sample]
    return mutants


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--sample", type=int, metavar="N", help="N changes, the same ones each time")
    parser.add_argument("--every-character", action="store_true", help="every character of a string, not one of them")
    parser.add_argument("--list", action="store_true", help="only show the changes")
    parser.add_argument("--jobs", type=int, default=2)
    parser.add_argument("files", nargs="*", metavar="FILE")
    options = parser.parse_args()
    mutants = chosen_mutants(options)
    if options.list:
        print(*mutants, sep="\n")
        return
    bench = Bench(options.jobs)
    is_equivalent = known_equivalents()
    counts = {"killed": 0, "compiler": 0, "survived": 0, "equivalent": 0}
    with concurrent.futures.ThreadPoolExecutor(options.jobs) as pool, open(BUILD / "results.jsonl", "w") as log:
        for mutant, verdict in zip(mutants, pool.map(bench.judge, mutants)):
            if verdict == "survived" and is_equivalent(mutant.key):
                verdict = "equivalent"
            counts[verdict] += 1
            log.write(json.dumps({"mutant": str(mutant), "verdict": verdict}) + "\n")
            log.flush()
            if verdict == "survived":
                print(f"SURVIVED {mutant}", flush=True)
    print(f"{len(mutants)} changes: {counts['killed']} noticed by tests, {counts['compiler']} by the compiler, "
          f"{counts['equivalent']} cannot be noticed, {counts['survived']} survived")
    sys.exit(1 if counts["survived"] else 0)


if __name__ == "__main__":
    main()
