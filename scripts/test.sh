#!/usr/bin/env bash
# Builds and tests the four trees: native (with the Python package, whose
# pytest run is one of its tests), AddressSanitizer + UBSan, 32-bit
# static under qemu-i386, and the 32-bit Windows DLL (cross-built, its PE tables
# checked, run in an emulated x86); compares what the passes report in the
# native tree with the 32-bit tree and the emulated DLL; fuzzes the passes and
# the capture reader for a short while. Every step is tried; the script fails
# if any step failed, and ends with the ctest totals.
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

# Writes each message of a generated corpus to a file of its own in DIR, behind
# a first octet 0: the fuzz target's selector of bits cut off the end.
write_seed_corpus() {
  local messages=$1 dir=$2
  mkdir -p "$dir"
  python3 - "$messages" "$dir" <<'PY'
import sys
messages, seeds = sys.argv[1:]
with open(messages) as lines:
    hexes = [line.split()[1] for line in lines if line.startswith("message ")]
for number, octets in enumerate(hexes):
    with open(f"{seeds}/generated-{number:04}", "wb") as seed:
        seed.write(b"\0" + bytes.fromhex(octets))
PY
}

# Short libFuzzer runs (clang, ASan+UBSan): every pass over arbitrary messages,
# seeded with generated messages and given the protocol's ids as a dictionary;
# then whole capture files through the capture reader, seeded with the shipped
# and golden captures, each input within a time limit and memory bounded.
run_fuzzer() {
  local dir=build/fuzz seed=${RNSAP_FUZZ_SEED:-2}
  echo "==== fuzz: build"
  CC=clang CXX=clang++ cmake -S . -B "$dir" -DCMAKE_BUILD_TYPE=RelWithDebInfo -DRNSAP_BUILD_TESTS=OFF \
    -DRNSAP_BUILD_FUZZERS=ON -DRNSAP_SANITIZE=ON >/dev/null &&
    cmake --build "$dir" -j"$JOBS" --target passes_fuzz capture_fuzz || { broken_steps+=("fuzz build"); return; }
  echo "==== fuzz: seeds of generator seed $seed"
  rm -rf "$dir/seeds"
  python3 generator/message_gen.py --seed "$seed" --out "$dir/seed_messages.txt" grammar &&
    write_seed_corpus "$dir/seed_messages.txt" "$dir/seeds" || { broken_steps+=("fuzz seeds"); return; }
  echo "==== fuzz: run"
  mkdir -p "$dir/corpus"
  (cd "$dir" && ./fuzz/passes_fuzz -max_total_time=30 -max_len=65537 -print_final_stats=1 \
    -dict=fuzz/passes_fuzz.dict corpus seeds) || broken_steps+=("fuzz run")
  echo "==== fuzz: captures"
  rm -rf "$dir/capture_seeds" && mkdir -p "$dir/capture_seeds" "$dir/capture_corpus" &&
    cp samples/messages.pcap tests/captures/*.pcap tests/captures/*.pcapng "$dir/capture_seeds" &&
    (cd "$dir" && ./fuzz/capture_fuzz -max_total_time=30 -max_len=65536 -timeout=5 -rss_limit_mb=512 \
      -print_final_stats=1 capture_corpus capture_seeds) || broken_steps+=("fuzz captures")
}

# compare_digests TAG FILE COMMAND...: the digest lines of the messages in FILE
# from COMMAND (given FILE last) must be the native pass_digest's.
compare_digests() {
  local tag=$1 file=$2 out=build/differential
  shift 2
  local name
  name="$tag-$(basename "$file")"
  mkdir -p "$out"
  if ! build/native/tests/pass_digest "$file" >"$out/native-$name.txt" ||
    ! "$@" "$file" >"$out/$name.txt"; then
    broken_steps+=("$tag differential run")
    return 1
  fi
  if ! diff "$out/native-$name.txt" "$out/$name.txt" >"$out/$name-difference.txt"; then
    head -n 20 "$out/$name-difference.txt"
    broken_steps+=("$tag differential")
    return 1
  fi
  echo "$(basename "$file"): $(wc -l <"$out/$name.txt") digests the same"
}

# The digests of generated and mutated messages in the native and the 32-bit
# tree (under qemu-i386), which must be the same.
run_differential() {
  echo "==== differential: native and 32-bit"
  compare_digests m32 build/native/generated/generated_messages.txt \
    qemu-i386 build/m32/tests/pass_digest
}

# The generated messages that reach each IE, extension and private branch, and
# the first RNSAP_WINDOWS_RANDOM (20) random ones: the emulated DLL is slow.
select_branch_messages() {
  awk -v random="${RNSAP_WINDOWS_RANDOM:-20}" '
    /^# (target|nest) / { keep = 1; print; next }
    /^# random/ { keep = (++seen <= random); if (keep) print; next }
    /^message / { if (keep) print; keep = 0 }' "$1"
}

# The digests of the samples and of those messages from the Windows DLL, run
# in an emulated 32-bit x86 by the Debian python3 that has unicorn.
run_windows_differential() {
  local branches=build/differential/branches.txt file
  echo "==== differential: native and the emulated Windows DLL"
  mkdir -p build/differential
  select_branch_messages build/native/generated/generated_messages.txt >"$branches"
  for file in samples/messages.hex "$branches"; do
    compare_digests win32 "$file" /usr/bin/python3 tests/windows/run_dll.py build/win32 || return
  done
}

main() {
  bash scripts/setup.sh || exit 1
  run_tree native -DCMAKE_BUILD_TYPE=RelWithDebInfo -DRNSAP_BUILD_BENCHMARKS=ON -DRNSAP_PYTHON_REQUIRED=ON
  run_tree sanitize -DCMAKE_BUILD_TYPE=Debug -DRNSAP_SANITIZE=ON
  run_tree m32 -DCMAKE_BUILD_TYPE=RelWithDebInfo -DRNSAP_M32=ON
  run_tree win32 --toolchain cmake/mingw-w64-i686.cmake -DCMAKE_BUILD_TYPE=Release
  run_differential
  run_windows_differential
  run_fuzzer

  if ((${#broken_steps[@]} > 0)); then
    echo "failed steps: ${broken_steps[*]}"
  fi
  echo "ctest: $passed passed, $failed failed"
  ((${#broken_steps[@]} == 0))
}

main "$@"
