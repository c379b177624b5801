#!/usr/bin/env bash
# Measures rnsap-decode -r over captures that mix connection-oriented and
# connectionless SCCP (bench/make_speed_capture.py): frames per second of CPU
# time (user and system, best of several runs, output to /dev/null) of the
# full decode and of the packet list, filter, fields and statistics, and the
# maximum resident memory from 10 thousand to 1 million frames and with 100
# thousand parts never completed.
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

# The runs measured, by name: the full decode and the analyst's views, which
# run the Key-field pass only.
declare -A VIEWS=(
  [validate]="--pass validate"
  [json]="--json -V"
  [list]=""
  [list-json]="--json"
  [filter]="--filter procedure=id_radioLinkSetup"
  [fields]="--fields frame,procedure,transaction,IMSI,D_RNTI"
  [stats]="--stats"
)
readonly ORDER=(validate json list list-json filter fields stats)

main() {
  local capture=$SCRATCH/speed.pcap name seconds
  python3 bench/make_speed_capture.py "$FRAMES" "$capture"
  echo "$FRAMES frames, best CPU time of $RUNS runs, $DECODER"
  "$DECODER" --pass validate -r "$capture" | tail -1
  for name in "${ORDER[@]}"; do
    # shellcheck disable=SC2086 # the options are words
    seconds=$(best_time ${VIEWS[$name]} -r "$capture")
    printf '%-9s %6.3f s  %8.0f frames/s\n' "$name" "$seconds" \
      "$(awk -v f="$FRAMES" -v s="$seconds" 'BEGIN { print f / s }')"
  done
  local frames incomplete
  for frames in 10000 100000 1000000 100000+100000; do
    incomplete=${frames#*+}
    [[ $incomplete == "$frames" ]] && incomplete=0
    python3 bench/make_speed_capture.py "${frames%+*}" "$SCRATCH/rss.pcap" "$incomplete"
    printf 'max RSS at %13s frames:' "$frames"
    for name in validate json list stats; do
      # shellcheck disable=SC2086
      printf ' %s %6d KB' "$name" "$(max_rss_kb ${VIEWS[$name]} -r "$SCRATCH/rss.pcap")"
    done
    echo
  done
  "$DECODER" --pass validate -r "$SCRATCH/rss.pcap" 2>&1 | grep -v "^msg\|^summary\|^frame" | tail -5
}

main "$@"
