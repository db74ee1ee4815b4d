#!/usr/bin/env bash
# Two profiles and two print models in two threads at once under
# ThreadSanitizer: a clang build of the library and the reliability tests, of
# which only the threads tests run.
set -euo pipefail
cd "$(dirname "$0")/../.."

build=build/tsan
flags="-fsanitize=thread -fno-omit-frame-pointer"
cmake -S . -B "$build" -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo \
  -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ \
  -DCMAKE_C_FLAGS="$flags" -DCMAKE_CXX_FLAGS="$flags" \
  -DVELTMARQUIST_BUILD_TOOLS=OFF -DVELTMARQUIST_BUILD_BENCH=OFF >/dev/null
cmake --build "$build" -j2 --target VeltmarquistReliabilityTests

TSAN_OPTIONS="halt_on_error=1 second_deadlock_stack=1" \
  "$build/tests/reliability/VeltmarquistReliabilityTests" --gtest_filter="TwoProfiles.*:TwoModels.*"
