"""Every kind of message is described in docs/JSON.md, with its severity and exit code, and nothing else is.

Usage: message_codes.py REPOSITORY
"""
import pathlib
import re
import sys

root = pathlib.Path(sys.argv[1])
severities = {"kNote": "note", "kWarning": "warning", "kError": "error"}
exits = {"kExitOk": "0", "kExitUsage": "2", "kExitUnreadable": "3", "kExitFindings": "4", "kExitOutput": "5"}

definition = re.compile(r'MessageKind\s+k\w+\s*\{\s*"([a-z-]+)",\s*Severity::(k\w+),\s*(k\w+)(,\s*true)?\s*\}')
described = re.compile(r"^\| `([a-z-]+)` \| (note|warning|error)( †)? \| ([0-9]) \| (\S.*) \|$", re.MULTILINE)

problems = []
defined = {}
definitions = 0
for path in sorted((root / "host").rglob("*.[ch]*")):
    text = path.read_text()
    definitions += len(re.findall(r"MessageKind\s+k\w+\s*\{", text))
    for code, severity, status, lenient in definition.findall(text):
        if code in defined:
            problems.append(f"{path.relative_to(root)}: {code} is defined twice")
        defined[code] = (severities[severity], bool(lenient), exits[status])
if definitions != len(defined):
    problems.append(f"{definitions} kinds are defined, but only {len(defined)} could be read")

documented = {}
for code, severity, lenient, status, _ in described.findall((root / "docs/JSON.md").read_text()):
    if code in documented:
        problems.append(f"docs/JSON.md: {code} is described twice")
    documented[code] = (severity, bool(lenient), status)

for code in sorted(defined.keys() | documented.keys()):
    if defined.get(code) != documented.get(code):
        problems.append(f"{code}: the code says {defined.get(code)}, docs/JSON.md {documented.get(code)}")

print("\n".join(problems) or f"{len(defined)} kinds of messages")
sys.exit(1 if problems or not defined else 0)
