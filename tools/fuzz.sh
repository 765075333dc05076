#!/bin/bash
# Fuzzes every target, each for some seconds, two at a time. Findings stay in build/fuzz/findings and make it fail.
# Usage: tools/fuzz.sh [SECONDS] [TARGET]...     (20 seconds and all targets)
# VESK_FUZZ_SEED, where it is set, makes a run one that can be repeated.
# What was learned stays in build/fuzz/corpus and is built upon by the next run.
set -euo pipefail

cd "$(dirname "$0")/.."
seconds=${1-20}
if [[ ! $seconds =~ ^[1-9][0-9]*$ ]]; then
  echo "Usage: tools/fuzz.sh [SECONDS] [TARGET]..." >&2
  exit 2
fi
if [[ $# -gt 0 ]]; then shift; fi

tools/build fuzz fuzz/all
targets=("$@")
if [[ $# == 0 ]]; then mapfile -t targets < <(basename -s .cpp fuzz/Fuzz*.cpp); fi

# fuzz SECONDS TARGET: one line of figures, or the end of the log of a finding.
fuzz() {
  local seconds=$1 target=$2 learned=build/fuzz/corpus/$2 log=build/fuzz/$2.log
  local options=(-max_total_time="$seconds" -max_len=16384 -timeout=10 -rss_limit_mb=2048 -print_final_stats=1
                 -artifact_prefix="build/fuzz/findings/$target-")
  if [[ -e fuzz/dictionaries/$target.dict ]]; then options+=(-dict="fuzz/dictionaries/$target.dict"); fi
  if [[ -n ${VESK_FUZZ_SEED-} ]]; then options+=(-seed="$VESK_FUZZ_SEED"); fi
  mkdir -p "$learned" build/fuzz/findings
  # What a target says about its inputs on standard error is much, and is no finding.
  if ! "build/fuzz/fuzz/$target" "${options[@]}" "$learned" "fuzz/corpus/$target" >"$log" 2>&1 </dev/null; then
    printf '%s: FOUND\n' "$target"
    tail -n 60 "$log"
    return 1
  fi
  sed -nE 's/^#([0-9]+)\tDONE +cov: ([0-9]+) ft: ([0-9]+) corp: ([0-9]+)\/.*/\1 \2 \3 \4/p' "$log" | {
    read -r runs edges features inputs
    printf '%s: %d executions, %d edges, %d features, %d inputs, nothing found\n' \
      "$target" "$runs" "$edges" "$features" "$inputs"
  }
}
export -f fuzz
printf '%s\n' "${targets[@]}" | xargs -P 2 -I '{}' bash -euo pipefail -c "fuzz $seconds {}"
