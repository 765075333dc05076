#!/usr/bin/env python3
"""Has tshark read the captures that make_captures writes: in the packets in which we find reports it must find the same
bytes. Exits with 77 where there is no tshark."""

import json
import pathlib
import shutil
import subprocess
import sys
import tempfile


def payloads(path):
    """The data of each packet that has some, by its number."""
    # With its HID dissector tshark shows the answers of GET_REPORT in no field.
    command = ["tshark", "-r", str(path), "--disable-protocol", "usbhid", "-T", "fields", "-E", "occurrence=f",
               "-e", "frame.number", "-e", "usb.control.Response", "-e", "usb.capdata"]
    result = subprocess.run(command, capture_output=True, text=True, timeout=60, check=False)
    rows = [line.split("\t") for line in result.stdout.splitlines()]
    return result.returncode, {int(row[0]): row[1] or row[2] for row in rows}


def differences(expected, exit_code, found):
    if exit_code != 0:
        yield f"exit code {exit_code}"
    for report in expected["reports"]:
        data = found.get(report["packet"], "")
        # Of a report in pieces the packet holds the first.
        if not data or not report["bytes"].startswith(data):
            yield f"packet {report['packet']}: {data[:40] or 'nothing'}, expected {report['bytes'][:40]}"
        elif data != report["bytes"] and not expected["file"].startswith("piece"):
            yield f"packet {report['packet']}: {len(data) // 2} bytes, expected {len(report['bytes']) // 2}"


def main():
    if shutil.which("tshark") is None:
        print("tshark is not installed")
        return 77
    source = pathlib.Path(sys.argv[1])
    failures = checked = 0
    with tempfile.TemporaryDirectory() as name:
        folder = pathlib.Path(name)
        subprocess.run([sys.executable, source / "tools/make_captures", folder], check=True)
        for expected in json.loads((folder / "captures.json").read_text()):
            if not expected["analyser"]:
                continue
            complaints = list(differences(expected, *payloads(folder / expected["file"])))
            for complaint in complaints:
                print(f"{expected['file']}: {complaint}")
            failures += bool(complaints)
            checked += len(expected["reports"])
        print(f"{checked} reports compared, {failures} captures differ")
    return 1 if failures or checked < 600 else 0


if __name__ == "__main__":
    sys.exit(main())
