# Timing helpers of the speed scripts, sourced by them: DECODER and RUNS set.

# The best of `RUNS` runs of the decoder with the given options, in seconds:
# wall time, or CPU time (user and system) when TIMING is "cpu".
best_time() {
  local best="" run seconds
  for ((run = 0; run < RUNS; ++run)); do
    seconds=$(/usr/bin/time -f '%e %U %S' "$DECODER" "$@" 2>&1 >/dev/null | tail -1 |
      awk -v cpu="${TIMING:-wall}" '{ print cpu == "cpu" ? $2 + $3 : $1 }')
    if [[ -z $best ]] || awk -v a="$seconds" -v b="$best" 'BEGIN { exit !(a < b) }'; then
      best=$seconds
    fi
  done
  echo "$best"
}

# The maximum resident memory in KB of the decoder with the given options.
max_rss_kb() {
  /usr/bin/time -f %M "$DECODER" "$@" 2>&1 >/dev/null | tail -1
}
