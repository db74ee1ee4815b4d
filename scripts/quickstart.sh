#!/usr/bin/env bash
# The main job on a fresh machine: install whatever is missing, build the
# release preset, and make the 900-patch characterisation chart of the bundled
# offset test form. The tool prints the fitted model values and where the
# chart went (out/offset_form.chart.txt).
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
cmake --preset release
cmake --build --preset release
mkdir -p out
build/release/tools/veltmarquist chart samples/offset_form.txt -o out/offset_form.chart.txt
