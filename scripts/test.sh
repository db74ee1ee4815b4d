#!/usr/bin/env bash
# Builds everything and runs every test: the unit and tool tests, the same
# suite under AddressSanitizer + UndefinedBehaviorSanitizer, and the
# reliability stages (fuzzing, memcheck) when present.
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
cmake --workflow --preset dev
cmake --workflow --preset asan-ubsan
for stage in scripts/stages/*.sh; do
  [ -e "$stage" ] || continue
  echo "== ${stage##*/}"
  bash "$stage"
done
echo "all test stages passed"
