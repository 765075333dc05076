#!/bin/bash
# Long inputs in bounded memory: a capture of 1 GB, a day of a recording, a pipe that does not end, and a recording in
# which every number lies. Takes minutes; needs 1 GB on the disk for the capture.
# Usage: tools/load.sh
set -euo pipefail

cd "$(dirname "$0")/.."
tools/build release vesk-report
exec python3 -B tools/load.py build/release/host/vesk-report
