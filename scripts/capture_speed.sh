#!/usr/bin/env bash
# Measures rnsap-decode -r over captures that mix connection-oriented and
# connectionless SCCP (bench/make_speed_capture.py): frames per second of CPU
# time (user and system, best of several runs, output to /dev/null) with
# --pass validate and with --json, and the maximum resident memory from 10
# thousand to 1 million frames and with 100 thousand parts never completed.
# Not run by CI.
#
#   scripts/capture_speed.sh [FRAMES] [RUNS] [DECODER]
#
# FRAMES defaults to 120000, RUNS to 5, DECODER to the native tree's build.
set -euo pipefail
cd "$(dirname "$0")/.."

readonly FRAMES=${1:-120000}
readonly RUNS=${2:-5}
readonly DECODER=${3:-build/native/cli/rnsap-decode}
readonly SCRATCH=$(mktemp -d)
trap 'rm -rf "$SCRATCH"' EXIT

readonly TIMING=cpu
# shellcheck source=scripts/timing.sh
source scripts/timing.sh

main() {
  local capture=$SCRATCH/speed.pcap name seconds
  python3 bench/make_speed_capture.py "$FRAMES" "$capture"
  echo "$FRAMES frames, best CPU time of $RUNS runs, $DECODER"
  "$DECODER" --pass validate -r "$capture" | tail -1
  for name in validate json; do
    if [[ $name == validate ]]; then
      seconds=$(best_time --pass validate -r "$capture")
    else
      seconds=$(best_time --json -r "$capture")
    fi
    printf '%-9s %6.3f s  %8.0f frames/s\n' "$name" "$seconds" \
      "$(awk -v f="$FRAMES" -v s="$seconds" 'BEGIN { print f / s }')"
  done
  local frames incomplete
  for frames in 10000 100000 1000000 100000+100000; do
    incomplete=${frames#*+}
    [[ $incomplete == "$frames" ]] && incomplete=0
    python3 bench/make_speed_capture.py "${frames%+*}" "$SCRATCH/rss.pcap" "$incomplete"
    printf 'max RSS at %7s frames: validate %6d KB, json %6d KB\n' "$frames" \
      "$(max_rss_kb --pass validate -r "$SCRATCH/rss.pcap")" \
      "$(max_rss_kb --json -r "$SCRATCH/rss.pcap")"
  done
  "$DECODER" --pass validate -r "$SCRATCH/rss.pcap" 2>&1 | grep -v "^msg\|^summary\|^frame" | tail -5
}

main "$@"
