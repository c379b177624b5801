#!/usr/bin/env bash
# The main job: builds the native tree (build output on stderr) and runs the
# command-line host over the shipped sample messages. Arguments, if any, go to
# rnsap-decode instead of the default ones.
set -euo pipefail
cd "$(dirname "$0")/.."

readonly BUILD_DIR=build/native

cmake -S . -B "$BUILD_DIR" -DCMAKE_BUILD_TYPE=RelWithDebInfo >&2
cmake --build "$BUILD_DIR" -j2 --target rnsap-decode >&2

if (($# > 0)); then
  exec "$BUILD_DIR/cli/rnsap-decode" "$@"
fi
shopt -s nullglob
samples=(samples/*.hex)
if ((${#samples[@]} == 0)); then
  echo "run.sh: no sample messages in samples/" >&2
  exit 1
fi
exec "$BUILD_DIR/cli/rnsap-decode" --pass validate "${samples[@]}"
