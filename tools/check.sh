#!/bin/bash
# What must hold before a change is handed in; prints the time of each step.
# Usage: tools/check.sh [STEP]...     (without a name: all of them)
# Needs the packages of tools/packages.*, which tools/install_packages installs.
set -uo pipefail

cd "$(dirname "$0")/.." || exit 1

tests() { ./test; }

format() { git ls-files '*.h' '*.cpp' | xargs clang-format-14 --dry-run -Werror; }

scripts() {
  local bash
  mapfile -t bash < <(git grep -lE '^#!/bin/(ba)?sh')
  shellcheck --severity=warning "${bash[@]}"
}

# The second compiler: warnings are errors there too.
clang() {
  tools/build clang &&
    ctest --test-dir build/clang --parallel 2 --output-on-failure --no-tests=error --label-exclude kernel --quiet
}

# What .clang-tidy lists is an error. Needs the compile commands of the clang build, but nothing that it builds.
tidy() {
  local sources
  cmake --preset clang >/dev/null &&
    mapfile -t sources < <(git ls-files 'values/*.cpp' 'plugin/*.cpp' 'reports/*.cpp' 'host/*.cpp') &&
    printf '%s\n' "${sources[@]}" | xargs -P 2 -n 4 clang-tidy-14 -p build/clang --quiet 2>&1 |
    { grep -v ' warnings generated' || true; }  # of headers that are not ours
}

# What it misreads is listed, with reasons.
cppcheck() {
  command cppcheck --quiet --std=c++20 --language=c++ --enable=warning,performance,portability --error-exitcode=1 \
    --suppressions-list=tools/cppcheck-suppressions.txt -I. values plugin reports host
}

# Each step, the minutes that it may take (in all they stay below an hour and a half), and the command where it is not a
# function above.
steps() {
  step format 1
  step scripts 1
  step tests 26
  step clang 10
  step tidy 12
  step cppcheck 5
  step fuzz 8 tools/fuzz.sh 30
  step coverage 12 tools/coverage.sh
  step threads 9 tools/threads.sh
  step instructions 4 tools/check_instructions
}

wanted=("$@") done=0 passed=0 failed=0
step() {
  local name=$1 minutes=$2 status=0 start=$SECONDS
  shift 2
  if [[ ${#wanted[@]} != 0 && " ${wanted[*]} " != *" $name "* ]]; then return; fi
  echo "== $name"
  if [[ $# == 0 ]]; then
    export -f "${name?}"
    set -- bash -uo pipefail -c "$name"
  fi
  timeout --kill-after=10 "${minutes}m" "$@" </dev/null || status=$?
  if [[ $status == 0 ]]; then passed=$((passed + 1)); else failed=$((failed + 1)); fi
  case $status in
    0) echo "== $name: passed in $((SECONDS - start)) s" ;;
    124 | 137) echo "== $name: FAILED, not done after $minutes minutes" ;;
    *) echo "== $name: FAILED with exit code $status after $((SECONDS - start)) s" ;;
  esac
  done=$((done + 1))
}
steps

if [[ $done == 0 ]]; then
  echo "There is no step ${wanted[*]}." >&2
  exit 2
fi
echo "Steps:"
echo "$passed passed, $failed failed"
[[ $failed == 0 ]]
