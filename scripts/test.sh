#!/usr/bin/env bash
# Builds and tests the three trees: native, AddressSanitizer + UBSan, and
# 32-bit static under qemu-i386. Every tree is tried; the script fails if any
# configure, build or test step failed, and ends with the totals of all trees.
set -uo pipefail
cd "$(dirname "$0")/.."

readonly JOBS=2
export ASAN_OPTIONS="detect_leaks=1:abort_on_error=1"
export UBSAN_OPTIONS="print_stacktrace=1:halt_on_error=1"

passed=0
failed=0
broken_steps=()

# Adds the counts of a ctest log to the totals.
count_results() {
  local log=$1 summary
  summary=$(grep -Eo '[0-9]+ tests failed out of [0-9]+' "$log" | tail -n 1)
  [[ -n "$summary" ]] || return 0
  local tree_failed tree_total
  read -r tree_failed _ _ _ _ tree_total <<<"$summary"
  failed=$((failed + tree_failed))
  passed=$((passed + tree_total - tree_failed))
}

# run_tree NAME CMAKE_ARGS...: configure, build and test build/NAME.
run_tree() {
  local name=$1 dir="build/$1"
  shift
  echo "==== $name: configure"
  cmake -S . -B "$dir" -DRNSAP_BUILD_TESTS=ON "$@" || { broken_steps+=("$name configure"); return; }
  echo "==== $name: build"
  cmake --build "$dir" -j"$JOBS" || { broken_steps+=("$name build"); return; }
  echo "==== $name: test"
  local log="$dir/ctest.log"
  ctest --test-dir "$dir" --output-on-failure --no-tests=error -j"$JOBS" 2>&1 | tee "$log"
  local status=${PIPESTATUS[0]}
  count_results "$log"
  ((status == 0)) || broken_steps+=("$name test")
}

main() {
  bash scripts/setup.sh || exit 1
  run_tree native -DCMAKE_BUILD_TYPE=RelWithDebInfo
  run_tree sanitize -DCMAKE_BUILD_TYPE=Debug -DRNSAP_SANITIZE=ON
  run_tree m32 -DCMAKE_BUILD_TYPE=RelWithDebInfo -DRNSAP_M32=ON

  if ((${#broken_steps[@]} > 0)); then
    echo "failed steps: ${broken_steps[*]}"
  fi
  echo "ctest: $passed passed, $failed failed"
  ((${#broken_steps[@]} == 0))
}

main "$@"
