"""Each quirk in docs/QUIRKS.md names files that exist, names in them, and tests that exist.

Usage: quirks_are_held.py ROOT
"""

import pathlib
import re
import sys

ROOT = pathlib.Path(sys.argv[1])
TEST = re.compile(r"^TEST(?:_F|_P)?\((\w+), (\w+)\)", re.MULTILINE)

tests = {".".join(match) for path in (ROOT / "tests").rglob("*.cpp") for match in TEST.findall(path.read_text())}
quirks = re.split(r"^### ", (ROOT / "docs" / "QUIRKS.md").read_text(), flags=re.MULTILINE)[1:]
complaints = [] if quirks else ["docs/QUIRKS.md lists nothing"]
for quirk in quirks:
    title = quirk.splitlines()[0]
    where, _, held = quirk.partition("- Where:")[2].partition("- Held by:")
    quoted = re.findall(r"`([^`]+)`", where)
    files = [name for name in quoted if "/" in name]
    names = re.findall(r"`(\w+\.\w+)`", held)
    if not files or not names:
        complaints.append(f"{title}: says not where it lives, or not what holds it")
    complaints += [f"{title}: there is no file {name}" for name in files if not (ROOT / name).is_file()]
    code = "".join((ROOT / name).read_text() for name in files if (ROOT / name).is_file())
    complaints += [f"{title}: nothing there is called {name}" for name in quoted if "/" not in name and name not in code]
    complaints += [f"{title}: there is no test {name}" for name in names if name not in tests]
for complaint in complaints:
    print(complaint)
sys.exit(1 if complaints else 0)
