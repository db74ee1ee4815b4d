#!/usr/bin/env bash
# Builds everything and runs every test: the unit and tool tests, the same
# suite under AddressSanitizer + UndefinedBehaviorSanitizer, then each stage
# below. A stage that is missing fails the run by name.
set -euo pipefail
cd "$(dirname "$0")/.."

stages=(20-install-examples 30-fuzz 40-tsan 50-valgrind 60-profile 70-report 80-python)

# Each step says how long it took, so that the run's time stays in view.
step() {
  local started=$SECONDS
  "$@"
  echo "-- $* took $((SECONDS - started)) s"
}

step scripts/setup.sh
step cmake --workflow --preset dev
scripts/skipped-tests.sh build/dev
step cmake --workflow --preset asan-ubsan
for stage in "${stages[@]}"; do
  echo "== $stage"
  step bash "scripts/stages/$stage.sh"
done
echo "all test stages passed in $SECONDS s"
