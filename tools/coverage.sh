#!/bin/bash
# What the tests reach: lines and branches of the core (all of them must be) and lines of the host (95 % must be).
# Usage: tools/coverage.sh [--show]     (--show: what is not reached in the host too, line by line)
# clang counts the outcomes of conditions as they stand in the source; the ways that only an exception takes are no
# conditions, and are walked where each allocation fails in turn (tests/faults). Tests of how the program deals with the
# system are left out: a program that counts writes files of its own.
set -euo pipefail

cd "$(dirname "$0")/.."
case ${1-} in
  '' | --show) ;;
  *) echo "Usage: tools/coverage.sh [--show]" >&2; exit 2 ;;
esac
tools/build coverage
folder=build/coverage
rm -rf "$folder/profiles"
# From here on every program that runs adds its counts to one of eight files.
export LLVM_PROFILE_FILE=$PWD/$folder/profiles/%8m.profraw
ctest --test-dir "$folder" --parallel 2 --output-on-failure --no-tests=error --label-exclude kernel \
  --exclude-regex '^(hardening|faults|embedding)' >"$folder/tests.log" 2>&1 </dev/null || { cat "$folder/tests.log" >&2; exit 1; }

find "$folder/profiles" -name '*.profraw' >"$folder/profiles.list"
llvm-profdata-14 merge -sparse -f "$folder/profiles.list" -o "$folder/all.profdata"
objects=()
while read -r program; do objects+=(-object "$program"); done < <(
  find "$folder" -type f -executable \( -name '*_tests' -o -name 'Fuzz*' -o -name vesk-report -o -name 'lib*.so' \))
for format in lcov text; do
  llvm-cov-14 export -format="$format" -instr-profile "$folder/all.profdata" "${objects[@]}" >"$folder/coverage.$format"
done
exec python3 -B tools/coverage.py "$folder/coverage.lcov" "$folder/coverage.text" "$@"
