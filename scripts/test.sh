#!/usr/bin/env bash
# Builds and tests the four trees: native, AddressSanitizer + UBSan, 32-bit
# static under qemu-i386, and the 32-bit Windows DLL (cross-built, its PE tables
# checked). Every tree is tried; the script fails if any configure, build or
# test step failed, and ends with the totals of all trees.
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

# A short libFuzzer run of every pass over arbitrary messages (clang, ASan+UBSan).
run_fuzzer() {
  local dir=build/fuzz corpus=build/fuzz/corpus
  echo "==== fuzz: build"
  CC=clang CXX=clang++ cmake -S . -B "$dir" -DCMAKE_BUILD_TYPE=RelWithDebInfo -DRNSAP_BUILD_TESTS=OFF \
    -DRNSAP_BUILD_FUZZERS=ON -DRNSAP_SANITIZE=ON >/dev/null &&
    cmake --build "$dir" -j"$JOBS" --target passes_fuzz || { broken_steps+=("fuzz build"); return; }
  echo "==== fuzz: run"
  mkdir -p "$corpus"
  (cd "$dir" && ./fuzz/passes_fuzz -max_total_time=30 -max_len=65537 -print_final_stats=1 corpus) ||
    broken_steps+=("fuzz run")
}

main() {
  bash scripts/setup.sh || exit 1
  run_tree native -DCMAKE_BUILD_TYPE=RelWithDebInfo -DRNSAP_BUILD_BENCHMARKS=ON
  run_tree sanitize -DCMAKE_BUILD_TYPE=Debug -DRNSAP_SANITIZE=ON
  run_tree m32 -DCMAKE_BUILD_TYPE=RelWithDebInfo -DRNSAP_M32=ON
  run_tree win32 --toolchain cmake/mingw-w64-i686.cmake -DCMAKE_BUILD_TYPE=Release
  run_fuzzer

  if ((${#broken_steps[@]} > 0)); then
    echo "failed steps: ${broken_steps[*]}"
  fi
  echo "ctest: $passed passed, $failed failed"
  ((${#broken_steps[@]} == 0))
}

main "$@"
