#!/usr/bin/env python3
"""Writes to a disk that is full: a small file system of its own, in a mount namespace that ends with this test.

Usage: full_disk.py VESK-REPORT PLAYED-DEVICES
What must hold in every output form and wherever the space ends: exit code 5; a message that names the file and the
reason; under the final name what was there before, or nothing; and nothing beside it. A recording that grows keeps whole
lines.
"""

import os
import pathlib
import subprocess
import sys
import tempfile

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parent.parent / "devices"))
import played
from outcomes import FORMS, OLD, expect, finish

CANNOT_RUN = 77
PROGRAM, LIBRARY = sys.argv[1:3]
BLOCKS = 16  # of 4096 bytes
REASON = "No space left on device"


class Disk:
    """The small file system. What is free is set with a file that fills the rest."""

    def __init__(self, folder):
        self.folder = folder
        self.output = folder / "out"

    def leave(self, blocks, old):
        for path in self.folder.iterdir():
            path.unlink()
        if old:
            self.output.write_bytes(OLD)
        taken = BLOCKS - blocks - bool(old)
        if taken > 0:
            (self.folder / "ballast").write_bytes(b"\1" * (4096 * taken))
        status = os.statvfs(self.folder)
        assert status.f_bfree == blocks, status

    def left_over(self):
        return sorted({path.name for path in self.folder.iterdir()} - {"out", "ballast"})

    def contents(self):
        return self.output.read_bytes() if self.output.exists() else None


def run(*arguments, stdout=subprocess.PIPE, **more):
    result = subprocess.run([PROGRAM, *map(str, arguments)], stdin=subprocess.DEVNULL, stdout=stdout,
                            stderr=subprocess.PIPE, timeout=60, **more)
    result.errors = result.stderr.decode(errors="replace")
    return result


def check_form(disk, form, source, roomy):
    """Space for everything from nothing to one block less than needed, and then for all of it."""
    command = [FORMS[form], "-o", form, source]
    whole = run(*command, "-O", roomy)
    expect(whole.returncode == 0, f"{form} where there is space: {whole.errors}")
    bytes_there = roomy.read_bytes()
    needed = -(-len(bytes_there) // 4096)
    expect(needed > BLOCKS, f"{form}: {len(bytes_there)} bytes fill no disk")
    for free in (0, 1, 2, BLOCKS - 2):
        for old in (True, False):
            disk.leave(free, old)
            result = run(*command, "-O", disk.output)
            what = f"{form}, {free} blocks free, {'an' if old else 'no'} old file"
            expect(result.returncode == 5, f"{what}: exit code {result.returncode}")
            expect(f"vesk-report: error: {disk.output}: cannot be written: {REASON}" in result.errors,
                   f"{what}: {result.errors}")
            expect(disk.contents() == (OLD if old else None), f"{what}: something is under the final name")
            expect(disk.left_over() == [], f"{what}: left over {disk.left_over()}")
    check_standard_output(disk, command)


def check_standard_output(disk, command):
    disk.leave(2, old=False)
    with open(disk.output, "wb") as file:
        result = run(*command, stdout=file)
    expect(result.returncode == 5 and f"(standard output): cannot be written: {REASON}" in result.errors,
           f"{command} to standard output: exit code {result.returncode}: {result.errors}")


def check_a_small_output(disk, source):
    """One that just fits, and the same with a block less."""
    command = ["decode", "-o", "text", "--report", "0xE0", source]
    expected = run(*command).stdout
    needed = -(-len(expected) // 4096)
    for free, fits in ((needed, True), (needed - 1, False)):
        disk.leave(free, old=False)
        result = run(*command, "-O", disk.output)
        expect((result.returncode, disk.contents()) == ((0, expected) if fits else (5, None)),
               f"an output of {needed} blocks where {free} are free: {result.returncode}: {result.errors}")


def check_no_files_left(folder):
    """There is space, but no file can be made any longer."""
    subprocess.run(["mount", "-t", "tmpfs", "-o", "size=64k,nr_inodes=1", "tmpfs", str(folder)], check=True)
    result = run("decode", "--hex", "DE 02", "-O", folder / "out")
    expect(result.returncode == 5 and f"{folder / 'out'}: cannot be created: {REASON}" in result.errors,
           f"no file can be made: exit code {result.returncode}: {result.errors}")


def check_live(disk, bench):
    """A recording that grows keeps the lines that were written whole; a snapshot does not appear."""
    images = [played.image(number) for number in range(1, 61)]  # 2400 bytes each as a line
    bench.add(inputs=images)
    for free in (1, 2, 5, 9):
        disk.leave(free, old=True)
        result = bench.run("record", "-O", disk.output, "--count", len(images))
        what = f"record, {free} blocks free"
        expect(result.returncode == 5, f"{what}: exit code {result.returncode}")
        expect(f"vesk-report: error: {disk.output}: cannot be written: {REASON}" in result.stderr, f"{what}: {result.stderr}")
        expect(disk.left_over() == [], f"{what}: left over {disk.left_over()}")
        lines = disk.contents().decode().split("\n")
        rows = [line.split() for line in lines if line.startswith("E:")]
        expect(lines[-1] == "" and all(len(row) == 3 + 792 for row in rows), f"{what}: a line is cut")
        expect([int(row[7], 16) for row in rows] == list(range(1, len(rows) + 1)), f"{what}: not the first ones")
        expect(len(rows) >= (free - 1) * 4096 // 2400 - 1, f"{what}: only {len(rows)} reports")
        expect(run("decode", disk.output).returncode == 0, f"{what}: the recording cannot be decoded")
    disk.leave(0, old=True)
    result = bench.run("record", "-O", disk.output)
    expect((result.returncode, disk.contents()) == (5, OLD), f"record without any space: {result.returncode}")
    for free in (0, 1, 2):
        disk.leave(free, old=True)
        result = bench.run("snapshot", "-O", disk.output)
        expect((result.returncode, disk.contents(), disk.left_over()) == (5, OLD, []),
               f"snapshot, {free} blocks free: {result.returncode}: {result.stderr}")


def main():
    with tempfile.TemporaryDirectory() as name:
        folder = pathlib.Path(name)
        small, none, bench = folder / "small", folder / "none", played.Bench(PROGRAM, LIBRARY)
        small.mkdir()
        none.mkdir()
        subprocess.run(["mount", "-t", "tmpfs", "-o", f"size={4 * BLOCKS}k", "tmpfs", str(small)], check=True)
        session = (played.EXAMPLES / "session.hid").read_text()
        source, images = folder / "session.hid", folder / "images.hid"
        source.write_text(session * 20)
        images.write_text("".join(line for line in session.splitlines(keepends=True) if " 792 76 " in line) * 40)
        for form in FORMS:
            check_form(Disk(small), form, images if form == "csv" else source, folder / "roomy")
        check_standard_output(Disk(small), ["explain", "--bytes", source])
        check_a_small_output(Disk(small), source)
        check_no_files_left(none)
        check_live(Disk(small), bench)
        bench.close()
        for mounted in (small, none):
            subprocess.run(["umount", str(mounted)], check=True)
    finish()


def in_a_namespace():
    """This script once more, where mounting is its own affair."""
    ways = (["unshare", "--mount"], ["unshare", "--map-root-user", "--mount"])
    probe = ["sh", "-c", 'mount -t tmpfs tmpfs "$0" && umount "$0"', tempfile.gettempdir()]
    for way in ways:
        if subprocess.run([*way, *probe], stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL).returncode == 0:
            environment = {**os.environ, "VESK_OWN_MOUNTS": "1"}
            sys.exit(subprocess.run([*way, sys.executable, "-B", *sys.argv], env=environment).returncode)
    print("full_disk cannot run here: mounting is not permitted")
    sys.exit(1 if os.environ.get("VESK_KERNEL_REQUIRED") else CANNOT_RUN)


if __name__ == "__main__":
    main() if os.environ.get("VESK_OWN_MOUNTS") else in_a_namespace()
