#!/usr/bin/env python3
"""Every system call that vesk-report makes fails in turn, in every output form.

Usage: system_calls.py VESK-REPORT PRELOADED-LIBRARY EXAMPLES-FOLDER
What must hold: the documented exit code; a message that names the file and the reason; and under the final name either
the whole file or what was there before.
"""

import errno
import os
import pathlib
import subprocess
import sys
import tempfile

from outcomes import FORMS, OLD, expect, finish

PROGRAM, SHIM, EXAMPLES = sys.argv[1:4]


class Bench:
    def __init__(self, folder):
        self.folder = pathlib.Path(folder)
        self.input = self.folder / "session.hid"
        # Long enough for several reads and writes.
        self.input.write_bytes((pathlib.Path(EXAMPLES) / "session.hid").read_bytes() * 40)
        self.images = self.folder / "images.hid"
        lines = (pathlib.Path(EXAMPLES) / "session.hid").read_text().splitlines(keepends=True)
        self.images.write_text("".join(l for l in lines if not l.startswith(("E:", "F:")) or " 792 76 " in l) * 40)
        self.output = self.folder / "out"

    def run(self, form, fault="", jobs="1", existing=True, to_file=True):
        for path in self.folder.glob("out*"):
            path.unlink()
        if existing:
            self.output.write_bytes(OLD)
        source = self.images if form == "csv" else self.input
        command = [PROGRAM, FORMS[form], "-o", form, "--jobs", jobs, str(source)]
        if to_file:
            command += ["-O", str(self.output)]
        environment = {"LD_PRELOAD": SHIM, "VESK_FAULT": fault} if fault else {}
        result = subprocess.run(command, env={**os.environ, **environment}, stdin=subprocess.DEVNULL,
                                stdout=subprocess.PIPE, stderr=subprocess.PIPE, timeout=120)
        result.errors = result.stderr.decode(errors="replace")
        return result

    def counts(self, form, to_file):
        file = self.folder / "counts"
        self.run(form, f"count {file}", to_file=to_file)
        return {name: int(number) for name, number in (line.split() for line in file.read_text().splitlines())}

    def under_final_name(self):
        return self.output.read_bytes() if self.output.exists() else None

    def left_over(self):
        return [path.name for path in self.folder.glob("out?*")]


def numbers(count):
    """All of them, or where they are many the first, some, and the last."""
    return sorted({*range(1, min(count, 6) + 1), *range(1, count + 1, max(1, count // 5)), count} - {0})


def check_failing_output(bench, form, whole):
    """Whatever fails on the way out: exit code 5, the reason, and the old file untouched."""
    counts = bench.counts(form, to_file=True)
    expect(counts["write"] >= 1 and counts["rename"] == 1 and counts["fsync"] == 1, f"{form}: calls are seen: {counts}")
    faults = [("write", number, code) for number in numbers(counts["write"]) for code in (errno.ENOSPC, errno.EIO)]
    faults += [("rename", 1, errno.EACCES), ("fsync", 1, errno.EIO), ("mkostemp", 1, errno.EROFS)]
    for call, number, code in faults:
        for existing in (True, False):
            what = f"{form}: {call} {number} fails with {errno.errorcode[code]}"
            result = bench.run(form, f"{call} {number} {code}", existing=existing)
            expect(result.returncode == 5, f"{what}: exit code {result.returncode}")
            expect(os.strerror(code) in result.errors and str(bench.output) in result.errors, f"{what}: {result.errors}")
            expect(bench.under_final_name() == (OLD if existing else None), f"{what}: something is under the final name")
            expect(bench.left_over() == [], f"{what}: left over {bench.left_over()}")
    for number in numbers(counts["close"]):
        result = bench.run(form, f"close {number} {errno.EIO}")
        what = f"{form}: close {number} fails"
        expect(result.returncode in (0, 5), f"{what}: exit code {result.returncode}")
        expect(bench.under_final_name() == (whole if result.returncode == 0 else OLD), f"{what}: the file")
        expect(bench.left_over() == [], f"{what}: left over {bench.left_over()}")


def check_failing_input(bench, form):
    """An input that cannot be read: exit code 3 and the reason; what was found before is kept."""
    counts = bench.counts(form, to_file=True)
    for number in numbers(counts["read"]):
        what = f"{form}: read {number} fails with EIO"
        result = bench.run(form, f"read {number} {errno.EIO}")
        expect(result.returncode == 3, f"{what}: exit code {result.returncode}")
        expect(os.strerror(errno.EIO) in result.errors and ".hid" in result.errors, f"{what}: {result.errors}")
    result = bench.run(form, f"open 1 {errno.EMFILE}")
    expect(result.returncode == 3, f"{form}: open fails: exit code {result.returncode}")
    expect(os.strerror(errno.EMFILE) in result.errors, f"{form}: open fails: {result.errors}")


def check_invisible(bench, form, whole):
    """Interrupted calls and calls that do part of their work change nothing."""
    counts = bench.counts(form, to_file=True)
    faults = [f"{call} {number} {errno.EINTR}" for call in ("read", "write") for number in numbers(counts[call])]
    faults += [f"open 1 {errno.EINTR}", "read all short", "write all short"]
    faults += [f"{call} {number} short" for call in ("read", "write") for number in numbers(counts[call])]
    for fault in faults:
        if fault == "write all short" and len(whole) > 100_000:
            continue  # a byte a call takes long and shows nothing more
        result = bench.run(form, fault)
        expect(result.returncode == 0, f"{form}: {fault}: exit code {result.returncode}: {result.errors}")
        expect(bench.under_final_name() == whole, f"{form}: {fault}: the output differs")


def check_standard_output(bench, form):
    counts = bench.counts(form, to_file=False)
    whole = bench.run(form, to_file=False).stdout  # a document says with which arguments it was made
    for number in numbers(counts["write"]):
        for jobs in ("1", "2"):
            result = bench.run(form, f"write {number} {errno.ENOSPC}", jobs=jobs, to_file=False)
            expect(result.returncode == 5, f"{form}: stdout write {number}, {jobs} jobs: exit code {result.returncode}")
            expect("(standard output)" in result.errors and os.strerror(errno.ENOSPC) in result.errors,
                   f"{form}: stdout write {number}: {result.errors}")
            if jobs == "1" and form != "json":
                expect(whole.startswith(result.stdout), f"{form}: stdout write {number}: not the beginning")
            result = bench.run(form, f"write {number} {errno.EPIPE}", jobs=jobs, to_file=False)
            expect((result.returncode, result.errors) == (0, ""), f"{form}: a closed pipe is no error: {result}")


def check_real_places(bench, form):
    """The same without the shim: /dev/full, a pipe that nobody reads, a folder that is not there, a full file system."""
    source = str(bench.images if form == "csv" else bench.input)
    command = [PROGRAM, FORMS[form], "-o", form, source]
    with open("/dev/full", "wb") as full:
        result = subprocess.run(command, stdout=full, stderr=subprocess.PIPE)
        expect(result.returncode == 5 and b"No space left" in result.stderr, f"{form}: /dev/full: {result}")
    result = subprocess.run([*command, "-O", "/dev/full"], stdout=subprocess.PIPE, stderr=subprocess.PIPE)
    expect(result.returncode == 5 and b"/dev/full" in result.stderr, f"{form}: -O /dev/full: {result}")
    reading, writing = os.pipe()
    os.close(reading)
    result = subprocess.run(command, stdout=writing, stderr=subprocess.PIPE)
    os.close(writing)
    expect((result.returncode, result.stderr) == (0, b""), f"{form}: closed pipe: {result}")
    bench.output.write_bytes(OLD)
    result = subprocess.run(["bash", "-c", 'ulimit -f 1; exec "$@"', "-", *command, "-O", str(bench.output)],
                            stderr=subprocess.PIPE)
    expect(result.returncode == 5 and b"File too large" in result.stderr, f"{form}: a limit of file sizes: {result}")
    expect(bench.output.read_bytes() == OLD and bench.left_over() == [], f"{form}: a limit of file sizes: files")
    result = subprocess.run([*command, "-O", str(bench.folder / "missing" / "out")], stderr=subprocess.PIPE)
    expect(result.returncode == 5 and b"No such file" in result.stderr, f"{form}: a folder that is not there: {result}")


def check_closed_descriptors(bench):
    """A program that is started without its standard descriptors must not take a file for one of them."""
    for closed in ("<&-", ">&-", "2>&-", "<&- >&-", "<&- >&- 2>&-"):
        for path in bench.folder.glob("out*"):
            path.unlink()
        result = subprocess.run(["bash", "-c", f'exec "$0" decode "$1" -O "$2" {closed}', PROGRAM, str(bench.input),
                                 str(bench.output)], stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        expect(result.returncode == 0 and bench.output.exists(),
               f"started with {closed}: exit code {result.returncode}, output there: {bench.output.exists()}")
    result = subprocess.run(["bash", "-c", '"$0" decode "$1" >&-', PROGRAM, str(bench.input)], stderr=subprocess.PIPE)
    expect(result.returncode == 5, f"decode without standard output: exit code {result.returncode}: {result.stderr}")
    for arguments in (["--help"], ["--version"], ["reports"], ["decode", "--help"]):
        with open("/dev/full", "wb") as full:
            result = subprocess.run([PROGRAM, *arguments], stdout=full, stderr=subprocess.PIPE)
        expect(result.returncode == 5, f"{arguments} to /dev/full: exit code {result.returncode}")


def check_few_threads(bench):
    """Where the machine gives fewer threads than were asked for, those that it gives do the work, and the reading one."""
    whole = bench.run("text", to_file=False).stdout
    for number in range(1, 8):
        result = bench.run("text", f"thread {number} {errno.EAGAIN}", jobs="8", to_file=False)
        expect(result.returncode == 0 and result.stdout == whole,
               f"{number - 1} of 7 threads: {result.returncode} {result.errors}")


def main():
    with tempfile.TemporaryDirectory() as folder:
        bench = Bench(folder)
        for form in FORMS:
            result = bench.run(form)
            expect(result.returncode == 0, f"{form} without faults: exit code {result.returncode}: {result.errors}")
            whole = bench.under_final_name()
            check_failing_output(bench, form, whole)
            check_failing_input(bench, form)
            check_invisible(bench, form, whole)
            check_standard_output(bench, form)
            check_real_places(bench, form)
        check_closed_descriptors(bench)
        check_few_threads(bench)
    finish()


if __name__ == "__main__":
    main()
