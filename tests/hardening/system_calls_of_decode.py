#!/usr/bin/env python3
"""`decode` never opens the network, starts no program, and writes to nothing but its outputs: seen with strace.

Usage: system_calls_of_decode.py PROGRAM EXAMPLES-FOLDER        Exit code 77 where strace cannot run here.
"""

import pathlib
import re
import shutil
import subprocess
import sys
import tempfile

PROGRAM, EXAMPLES = sys.argv[1:3]
failures = []


def traced(folder, *arguments):
    log = pathlib.Path(folder) / "trace"
    result = subprocess.run(["strace", "-f", "-y", "-o", str(log), PROGRAM, *arguments], stdout=subprocess.DEVNULL,
                            stderr=subprocess.PIPE, stdin=subprocess.DEVNULL)
    if result.returncode != 0:
        failures.append(f"{arguments}: exit code {result.returncode}: {result.stderr.decode()}")
    return log.read_text()


def check(what, trace, writable):
    calls = re.findall(r"^\d+ +(\w+)\((.*)$", trace, re.MULTILINE)
    if not any(name == "exit_group" for name, _ in calls):
        failures.append(f"{what}: the trace is not whole")
    for name, rest in calls:
        if name in ("socket", "connect", "bind", "listen", "accept", "accept4", "sendto", "sendmsg", "recvfrom", "ptrace",
                    "fork", "vfork", "kill", "mount"):
            failures.append(f"{what}: {name}({rest}")
        if name == "execve" and PROGRAM not in rest:
            failures.append(f"{what}: {name}({rest}")
        if name in ("openat", "open") and re.search(r"O_WRONLY|O_RDWR|O_CREAT|O_TRUNC", rest):
            if not any(str(path) in rest for path in writable):
                failures.append(f"{what}: opened for writing: {rest}")
        if name in ("unlink", "unlinkat", "rename", "renameat", "renameat2", "mkdir", "chmod", "fchmodat", "chown"):
            if not any(str(path) in rest for path in writable):
                failures.append(f"{what}: {name}({rest}")
        if name in ("write", "writev", "pwrite64"):
            target = re.match(r"\d+<([^>]*)>", rest)
            # Standard output and standard error may be anything; everything else must be an output.
            if not rest.startswith(("1<", "2<")) and not any(str(path) in target.group(1) for path in writable):
                failures.append(f"{what}: wrote to {target.group(1)}")


def main():
    if shutil.which("strace") is None or subprocess.run(["strace", "-o", "/dev/null", "true"],
                                                        stderr=subprocess.DEVNULL).returncode != 0:
        print("strace is missing or may not trace: this test cannot run here")
        sys.exit(77)
    session = f"{EXAMPLES}/session.hid"
    with tempfile.TemporaryDirectory() as folder:
        output = pathlib.Path(folder) / "out"
        for form in ("text", "json", "jsonl", "hex", "raw", "recording"):
            check(f"{form} to standard output", traced(folder, "decode", "-o", form, "--jobs", "2", session), [])
            check(f"{form} to a file", traced(folder, "decode", "-o", form, "-O", str(output), session), [output])
        check("reports", traced(folder, "reports"), [])
    print(*failures, sep="\n")
    sys.exit(1 if failures else 0)


if __name__ == "__main__":
    main()
