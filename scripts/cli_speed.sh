#!/usr/bin/env bash
# Measures rnsap-decode over many messages: wall time of each pass and form
# (best of several runs, output to /dev/null), the ratios to a validate run,
# and the maximum resident memory at 1 thousand, 100 thousand and 1 million
# messages. The messages are the shipped samples, repeated. Not run by CI.
#
#   scripts/cli_speed.sh [MESSAGES] [RUNS] [DECODER]
#
# MESSAGES defaults to 100000, RUNS to 3, DECODER to the native tree's build.
set -euo pipefail
cd "$(dirname "$0")/.."

readonly MESSAGES=${1:-100000}
readonly RUNS=${2:-3}
readonly DECODER=${3:-build/native/cli/rnsap-decode}
readonly SCRATCH=$(mktemp -d)
trap 'rm -rf "$SCRATCH"' EXIT

# Writes `count` messages, the samples over and over, one per line.
write_messages() {
  local count=$1 file=$2
  grep -Ev '^[[:space:]]*(#|$)' samples/messages.hex |
    awk -v count="$count" '{ line[NR] = $0 } END { for (i = 0; i < count; ++i) print line[i % NR + 1] }' >"$file"
}

# shellcheck source=scripts/timing.sh
source scripts/timing.sh

main() {
  write_messages "$MESSAGES" "$SCRATCH/messages.hex"
  echo "$MESSAGES messages, best of $RUNS runs, $DECODER"
  local validate
  validate=$(best_time --pass validate -f "$SCRATCH/messages.hex")
  printf '%-22s %6.2f s\n' "validate" "$validate"
  local name options seconds
  for name in "json decode" "text decode" "json display" "text display" "keys"; do
    case $name in
      "json decode") options=(--json) ;;
      "text decode") options=() ;;
      "json display") options=(--json --pass display) ;;
      "text display") options=(--pass display) ;;
      keys) options=(--pass keys) ;;
    esac
    seconds=$(best_time "${options[@]}" -f "$SCRATCH/messages.hex")
    printf '%-22s %6.2f s  %4.1f x validate\n' "$name" "$seconds" \
      "$(awk -v a="$seconds" -v b="$validate" 'BEGIN { print a / b }')"
  done
  local count
  for count in 1000 100000 1000000; do
    write_messages "$count" "$SCRATCH/rss.hex"
    printf 'max RSS at %7d messages: validate %6d KB, json decode %6d KB\n' "$count" \
      "$(max_rss_kb --pass validate -f "$SCRATCH/rss.hex")" \
      "$(max_rss_kb --json -f "$SCRATCH/rss.hex")"
  done
}

main "$@"
