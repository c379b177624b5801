#!/bin/bash
# rnsap-decode -j N against -j 1 on the samples, the golden captures and a
# generated corpus capture, the full decode in text and JSON and every other
# pass: the same output, byte for byte.
#   parallel_corpus.sh RNSAP_DECODE MAKE_SAMPLE_CAPTURE SAMPLES_DIR CAPTURES_DIR SCRATCH_DIR
set -euo pipefail
decode=$1 make_capture=$2 samples=$3 captures=$4 scratch=$5
mkdir -p "$scratch"
# What rnsap-decode -j JOBS ARGUMENTS prints on both streams, and its exit status.
run() {
  local jobs=$1 status=0
  shift
  "$decode" -j "$jobs" "$@" 2>&1 || status=$?
  echo "exit status $status"
}
"$make_capture" "$samples/messages.hex" "$scratch/corpus.pcap" 5000
# The sample of the most fields, over and over: a batch prints more than a
# worker's slot holds.
largest=$("$decode" -V --json -f "$samples/messages.hex" | grep -o '"source":"[^"]*"' |
  sort | uniq -c | sort -n | tail -1 | sed 's/.*:\([0-9]*\)"$/\1/')
sed -n "${largest}p" "$samples/messages.hex" >"$scratch/largest.hex"
"$make_capture" "$scratch/largest.hex" "$scratch/largest.pcap" 600
for capture in "$samples/messages.pcap" "$captures"/*.pcap "$captures"/*.pcapng "$scratch/corpus.pcap" \
  "$scratch/largest.pcap"; do
  for form in "-V --json" "-V" "--pass display" "--pass keys" "--pass validate"; do
    run 1 $form -r "$capture" -r "$capture" >"$scratch/one.out"
    for jobs in 3 0; do
      run $jobs $form -r "$capture" -r "$capture" >"$scratch/many.out"
      cmp "$scratch/one.out" "$scratch/many.out" || { echo "-j $jobs $form $capture differs"; exit 1; }
    done
  done
done
