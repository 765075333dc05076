#!/bin/bash
# Changes the core in one place at a time and expects that a test fails; see tools/mutate.py for the arguments.
set -euo pipefail
cd "$(dirname "$0")/.."
exec python3 -B tools/mutate.py "$@"
