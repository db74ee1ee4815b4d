#!/usr/bin/env bash
# Fuzzes CalculateChart and the tool's measurement-file reader with libFuzzer
# under AddressSanitizer + UndefinedBehaviorSanitizer, each for a bounded time
# (VELTMARQUIST_FUZZ_SECONDS, default 60), both at once on two cores. The
# library is built with coverage instrumentation in build/fuzz. A crash, a
# leak, undefined behaviour or a broken promise fails the stage and leaves
# the input in build/fuzz/artifacts: add it under fuzz/regressions/<fuzzer>/
# and as a named test in tests/reliability.
set -euo pipefail
cd "$(dirname "$0")/../.."

build=build/fuzz
seconds=${VELTMARQUIST_FUZZ_SECONDS:-60}
# Comparison tracing is left out of the library: its model loops compare
# doubles millions of times per input and would halve the execution rate.
flags="-fsanitize=fuzzer-no-link,address,undefined -fno-sanitize-coverage=trace-cmp -fno-sanitize-recover=all"
flags+=" -fno-omit-frame-pointer"

cmake -S . -B "$build" -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo \
  -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ \
  -DCMAKE_C_FLAGS="$flags" -DCMAKE_CXX_FLAGS="$flags" \
  -DVELTMARQUIST_BUILD_TOOLS=OFF -DVELTMARQUIST_BUILD_BENCH=OFF >/dev/null
cmake --build "$build" -j2 --target fuzz_calculate_chart fuzz_measurement_file

export ASAN_OPTIONS=detect_leaks=1:abort_on_error=1
export UBSAN_OPTIONS=print_stacktrace=1:halt_on_error=1
mkdir -p "$build/artifacts"

# fuzz <name> <seed folder>...: fuzzes into a working corpus kept in the
# build folder, so that later runs start where earlier ones stopped; words
# in fuzz/<name>.dict guide the mutations.
fuzz() {
  local name=$1; shift
  local corpus="$build/corpus/$name"
  local seeds=()
  for folder in "$@" "fuzz/regressions/$name"; do
    [ -d "$folder" ] && [ -n "$(ls -A "$folder")" ] && seeds+=("$folder")
  done
  local options=()
  [ -e "fuzz/$name.dict" ] && options+=("-dict=fuzz/$name.dict")
  mkdir -p "$corpus"
  "$build/fuzz/fuzz_$(tr - _ <<<"$name")" "$corpus" "${seeds[@]}" "${options[@]}" \
    -max_total_time="$seconds" -timeout=60 -rss_limit_mb=2048 -max_len=65536 \
    -print_final_stats=1 -artifact_prefix="$build/artifacts/$name-" >"$build/$name.log" 2>&1
}

fuzz calculate-chart fuzz/corpus/calculate-chart & chart=$!
fuzz measurement-file fuzz/corpus/measurement-file tests/golden samples & reader=$!

failed=0
wait "$chart" || failed=1
wait "$reader" || failed=1
for log in "$build"/*.log; do
  echo "-- ${log##*/}"
  grep -E '^(stat::|INFO: Seed|Done|==[0-9]+==ERROR|SUMMARY|broken promise|artifact_prefix|Test unit written)' "$log" || true
done
if [ "$failed" -ne 0 ]; then
  echo "fuzz: a fuzzer found a problem; see the logs above and $build/artifacts" >&2
  exit 1
fi
