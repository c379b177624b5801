#!/bin/bash
# rnsap-decode -j N against -j 1 on the samples and a generated corpus
# capture, in text and JSON, every pass: the same output, byte for byte.
#   parallel_corpus.sh RNSAP_DECODE MAKE_SAMPLE_CAPTURE SAMPLES_DIR SCRATCH_DIR
set -euo pipefail
decode=$1 make_capture=$2 samples=$3 scratch=$4
mkdir -p "$scratch"
"$make_capture" "$samples/messages.hex" "$scratch/corpus.pcap" 5000
for capture in "$samples/messages.pcap" "$scratch/corpus.pcap"; do
  for form in "--json" "--pass decode" "--pass display" "--pass keys" "--pass validate"; do
    "$decode" $form -r "$capture" -r "$capture" >"$scratch/one.out" 2>&1
    for jobs in 2 3 0; do
      "$decode" $form -j $jobs -r "$capture" -r "$capture" >"$scratch/many.out" 2>&1
      cmp "$scratch/one.out" "$scratch/many.out" || { echo "-j $jobs $form $capture differs"; exit 1; }
    done
  done
done
