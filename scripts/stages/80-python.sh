#!/usr/bin/env bash
# Builds the Python package the way a user installs it (pip, no package index,
# CMake driven by setup.py), installs it into a fresh virtual environment that
# sees Debian's numpy and pytest, and runs python/tests against the installed
# package and the dev build's tool, whose chart files it must reproduce byte
# for byte; checks the type stub against the module (mypy's stubtest). Then
# times predict (python/bench/bench_predict.py).
set -euo pipefail
cd "$(dirname "$0")/../.."
project=$PWD

build=${VELTMARQUIST_STAGE_BUILD:-build/dev} # the dev preset's build unless told otherwise
[ -f "$build/CMakeCache.txt" ] || cmake --preset dev >/dev/null
cmake --build "$build" --target veltmarquist >/dev/null
venv=$(mktemp -d)
trap 'rm -rf "$venv"' EXIT

/usr/bin/python3 -m venv --system-site-packages "$venv"
"$venv/bin/python" -m pip install --quiet --no-build-isolation --no-index ./python
# From outside the tree, so that the tests import the installed package.
cd "$venv"
# The type stub against the module it describes.
"$venv/bin/python" -m mypy.stubtest veltmarquist --allowlist "$project/python/stubtest-allowlist.txt"
VELTMARQUIST_TOOL="$project/$build/tools/veltmarquist" \
  "$venv/bin/python" -m pytest -p no:cacheprovider "$project/python/tests"
"$venv/bin/python" "$project/python/bench/bench_predict.py"
