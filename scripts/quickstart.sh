#!/usr/bin/env bash
# The main job on a fresh machine: install whatever is missing, build the
# library and the tool (release, nothing else), and make the 900-patch
# characterisation chart of the bundled offset test form. The tool prints the
# fitted model values and where the chart went (out/offset_form.chart.txt).
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
log=build/quickstart.log
mkdir -p build out
echo "quickstart: building the library and the tool (log: $log)"
if ! { cmake --preset tool &&
       cmake --build --preset tool; } >"$log" 2>&1; then
  tail -n 30 "$log" >&2
  echo "quickstart: the build failed; the whole log is in $log" >&2
  exit 1
fi
build/tool/tools/veltmarquist chart samples/offset_form.txt -o out/offset_form.chart.txt
