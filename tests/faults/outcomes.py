"""What the tests of faults share: the output forms, what stood under a name before, and the counting of what fails."""

import sys

FORMS = {"text": "decode", "json": "decode", "jsonl": "decode", "csv": "decode", "hex": "convert", "raw": "convert",
         "recording": "convert"}
OLD = b"what was there before\n"
_failures = []


def expect(holds, what):
    if not holds:
        _failures.append(what)
        print("FAILED:", what)


def finish():
    """Ends the program, with exit code 1 where an expectation did not hold."""
    print(f"{len(_failures)} expectations failed")
    sys.exit(1 if _failures else 0)
