#!/bin/bash
# g++'s static analyzer over the product's sources, two at a time. A warning that tools/analyzer-suppressions.txt does not
# list makes it fail, and so does a file that it cannot finish.
# Usage: tools/analyze.sh [FILE]...     (without a name: all but those that read CLI11, which take it many minutes each)
set -euo pipefail

cd "$(dirname "$0")/.."
files=("$@")
if [[ $# == 0 ]]; then mapfile -t files < <(git ls-files 'values/*.cpp' 'plugin/*.cpp' 'reports/*.cpp' 'host/*.cpp' ':!host/main.cpp' ':!host/commands/'); fi

# analyze FILE: its warnings, one a line and without the place in the file.
analyze() {
  local file=$1 status=0 text
  ulimit -t 900
  text=$(g++ -std=c++20 -I. -DVESK_REPORT_VERSION='"0"' -O0 -fanalyzer -c -o /dev/null "$file" 2>&1) || status=$?
  if [[ $status != 0 ]]; then echo "$file: not finished, exit code $status"; fi
  sed -nE 's/^cc1plus: /'"${file//\//\\/}"': /; s/^(\.\/)?([^ :]+)(:[0-9]+)*: warning: (.*-Wanalyzer.*)/\2: \4/p' <<<"$text"
}
export -f analyze
found=$(printf '%s\n' "${files[@]}" | xargs -P 2 -I '{}' bash -euo pipefail -c "analyze {}" | sort -u |
  grep -vxFf <(grep -v '^#' tools/analyzer-suppressions.txt) || true)
if [[ -n $found ]]; then
  printf '%s\n' "$found"
  exit 1
fi
