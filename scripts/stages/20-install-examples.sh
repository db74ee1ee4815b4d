#!/usr/bin/env bash
# Installs the dev build into a temporary prefix, builds the C host example
# against the installed CMake package (and once more through pkg-config), and
# runs the C host, the Python host and the installed tool on the bundled
# offset form. All three hand the library the same measurements, so their
# charts must be identical.
set -euo pipefail
cd "$(dirname "$0")/../.."

build=${VELTMARQUIST_STAGE_BUILD:-build/dev} # the dev preset's build unless told otherwise
[ -f "$build/CMakeCache.txt" ] || cmake --preset dev >/dev/null
cmake --build "$build" >/dev/null
prefix=$(mktemp -d)
trap 'rm -rf "$prefix"' EXIT

cmake --install "$build" --prefix "$prefix" >/dev/null
library=$(find "$prefix" -name 'libVeltmarquistDLL.so' | head -n 1)
[ -n "$library" ] || { echo "install: no libVeltmarquistDLL.so under $prefix"; exit 1; }
for file in include/veltmarquist/VeltmarquistDLL.h include/veltmarquist/MathProfile.h \
            include/veltmarquist/PrintModels.h bin/veltmarquist \
            share/veltmarquist/samples/offset_form.txt; do
  [ -e "$prefix/$file" ] || { echo "install: $file missing"; exit 1; }
done

# The C host through the CMake package ...
cmake -S examples/c-host -B "$prefix/c-host" -G Ninja -DCMAKE_PREFIX_PATH="$prefix" >/dev/null
cmake --build "$prefix/c-host" >/dev/null
"$prefix/c-host/c_host" samples/offset_form.txt "$prefix/c-host.chart"
# ... and through pkg-config (the .pc file finds its prefix from where it lies).
pc=$(dirname "$(find "$prefix" -name VeltmarquistDLL.pc | head -n 1)")
libdir=$(dirname "$library")
# shellcheck disable=SC2046
cc -std=c99 -Wall -Wextra -Werror examples/c-host/main.c -o "$prefix/c-host-pkg" \
  $(PKG_CONFIG_PATH="$pc" pkg-config --cflags --libs VeltmarquistDLL) -lm -Wl,-rpath,"$libdir"
"$prefix/c-host-pkg" samples/offset_form.txt "$prefix/c-host-pkg.chart"

# A C++ host of the installed print-model header: a flat form (paper 0.9, every
# other patch 0.5) gives back its paper for 0 %.
cat >"$prefix/models.cpp" <<'CPP'
#include <PrintModels.h>
#include <cstdio>
int main()
{
    std::vector<veltmarquist::Spectrum> spectra(46);
    for (size_t p = 0; p < spectra.size(); ++p)
        spectra[p].fill(p == 1 ? 0.9 : 0.5);
    const auto model = veltmarquist::fitGravureModel(veltmarquist::MeasuredForm(spectra),
                                                     veltmarquist::GravureFactors::defaults);
    return model->predict({0, 0, 0, 0})[20] == 0.9 && model->levels().size() == 9 ? 0 : 1;
}
CPP
# shellcheck disable=SC2046
c++ -std=c++17 -Wall -Wextra -Werror "$prefix/models.cpp" -o "$prefix/models" \
  $(PKG_CONFIG_PATH="$pc" pkg-config --cflags --libs VeltmarquistDLL) -Wl,-rpath,"$libdir"
"$prefix/models" || { echo "install: the C++ print-model host failed"; exit 1; }

python3 examples/python-host/python_host.py --library "$library" samples/offset_form.txt "$prefix/python-host.chart"
"$prefix/bin/veltmarquist" chart "$prefix/share/veltmarquist/samples/offset_form.txt" -o "$prefix/tool.chart" >/dev/null

for chart in c-host-pkg python-host tool; do
  cmp "$prefix/c-host.chart" "$prefix/$chart.chart" || { echo "install: the $chart chart differs"; exit 1; }
done
[ "$(grep -c . "$prefix/c-host.chart")" -eq 908 ] || { echo "install: the chart is not 900 patches"; exit 1; }
echo "install-examples: 4 passed, 0 failed"
