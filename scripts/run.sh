#!/usr/bin/env bash
# The main job: builds the native tree (build output on stderr) and runs the
# command-line host over the shipped sample messages (decode pass, text form).
# Arguments, if any, go to rnsap-decode instead of the default ones.
set -euo pipefail
cd "$(dirname "$0")/.."

readonly BUILD_DIR=build/native

cmake -S . -B "$BUILD_DIR" -DCMAKE_BUILD_TYPE=RelWithDebInfo >&2
cmake --build "$BUILD_DIR" -j2 --target rnsap-decode >&2

if (($# > 0)); then
  exec "$BUILD_DIR/cli/rnsap-decode" "$@"
fi
exec "$BUILD_DIR/cli/rnsap-decode" -f samples/messages.hex
