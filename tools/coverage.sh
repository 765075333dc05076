#!/bin/bash
# What the tests reach: lines and branches of the core (all of them must be) and lines of the host (95 % must be).
# Usage: tools/coverage.sh [--show]     (--show: what is not reached, line by line)
# Outcomes that only a thrown exception takes are not counted: they stand behind every call, and what they do is seen
# where each allocation fails in turn (tests/faults).
set -euo pipefail

cd "$(dirname "$0")/.."
show=
case ${1-} in
  '') ;;
  --show) show=--show ;;
  *) echo "Usage: tools/coverage.sh [--show]" >&2; exit 2 ;;
esac
tools/build coverage
find build/coverage -name '*.gcda' -delete
ctest --test-dir build/coverage --parallel 2 --output-on-failure --no-tests=error --label-exclude kernel --quiet >build/coverage/tests.log 2>&1 </dev/null ||
  { cat build/coverage/tests.log; exit 1; }
exec python3 -B tools/coverage.py build/coverage $show
