#!/bin/bash
# Runs what has threads under ThreadSanitizer: many plug-in objects at once, and decoding with several jobs.
set -euo pipefail

cd "$(dirname "$0")/.."
tools/build threads thread_tests vesk-report
export TSAN_OPTIONS=halt_on_error=1:exitcode=66
# ThreadSanitizer does not stand every address layout that a newer kernel deals out.
quiet() { setarch --addr-no-randomize "$@"; }
folder=$(mktemp -d)
trap 'rm -rf "$folder"' EXIT

quiet build/threads/tests/threads/thread_tests --gtest_brief=1
for _ in {1..40}; do cat examples/session.hid; done >"$folder/long.hid"
for form in text json jsonl csv hex raw recording; do
  for jobs in 1 2 8; do
    # The session holds reports that have no rows, which is finding enough for exit code 4.
    status=0
    quiet build/threads/host/vesk-report decode -q -o "$form" --jobs "$jobs" "$folder/long.hid" \
      >"$folder/$jobs.out" 2>"$folder/errors" || status=$?
    if [[ $status != 0 && $status != 4 ]] || grep -q ThreadSanitizer "$folder/errors"; then
      cat "$folder/errors" >&2
      exit 1
    fi
    # Documents name their command line.
    sed -i 's/"argv":\[[^]]*\]//' "$folder/$jobs.out"
    cmp "$folder/1.out" "$folder/$jobs.out"
  done
done
echo "No data race in the plug-in's tests, nor in decoding with 1, 2 and 8 jobs in 7 forms"
