#!/usr/bin/env bash
# The veltmarquist tool on every sample under valgrind memcheck, and the
# reliability tests, which take the library through its failing paths
# (statuses 1, 2, 4 and 5, degenerate input): every run must end with zero
# memcheck errors and no lost block (definite, indirect, possible).
# Uses the dev preset's build (VELTMARQUIST_STAGE_BUILD to use another).
set -euo pipefail
cd "$(dirname "$0")/../.."

build=${VELTMARQUIST_STAGE_BUILD:-build/dev}
tool="$build/tools/veltmarquist"
reliability="$build/tests/reliability/VeltmarquistReliabilityTests"
for binary in "$tool" "$reliability"; do
  [ -x "$binary" ] || { echo "valgrind: $binary is missing; build $build first" >&2; exit 1; }
done

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
mkdir -p "$work/logs" "$work/compare"

# The golden separations (thousandths of a percent) as the separation
# software's CGATS answer in percent, seven and six channels (six: ink B).
separations() { # <channels> <awk list of golden columns>
  awk -v n="$1" -v cols="$2" 'BEGIN {
      split(cols, c, " ");
      print "CGATS.17"; printf "NUMBER_OF_FIELDS\t%d\nBEGIN_DATA_FORMAT\nSAMPLE_ID", n + 1;
      for (k = 1; k <= n; ++k) printf "\t%dCLR_%d", n, k;
      print "\nEND_DATA_FORMAT\nNUMBER_OF_SETS\t3499\nBEGIN_DATA" }
    { printf "%d", NR;
      for (k = 1; k <= n; ++k) { v = $(c[k]); v = v < 0 ? 0 : v > 100000 ? 100000 : v; printf "\t%.3f", v / 1000 }
      print "" }
    END { print "END_DATA" }' tests/golden/multichannel.separations
}
separations 7 "1 2 3 4 5 6 7" >"$work/sep7.txt"
separations 6 "1 2 3 4 5 7" >"$work/sep6.txt"

# Each line: name, expected exit code, command. A failing command is run too:
# the error paths must free what they took.
runs=$(cat <<RUNS
chart-offset 0 $tool chart samples/offset_form.txt -o $work/offset.txt
chart-gravure-fitted 0 $tool chart samples/offset_form.txt --fit-gravure -o $work/gravure.txt
compare 0 $tool compare samples/offset_form.txt -o $work/compare
chart-16-band 0 $tool chart samples/offset_form_16band.txt -o $work/offset16.txt
chart-press-sheet 0 $tool chart samples/offset_press_sheet.txt -o $work/sheet.txt
chart-ynsn-grid-report 0 $tool chart samples/offset_press_sheet.txt --model ynsn --format cti3 --layout grid:6 --spectral -o $work/grid.ti3 --report $work/sheet.html
report-seven-ink 0 $tool report samples/seven_ink_form.txt --inks 7 -o $work/seven.html
six-ink 0 $tool multichannel samples/six_ink_form.txt --inks 6 -o $work/p3.txt --combinations $work/comb6.txt --separations $work/sep6.txt --separated-out $work/p3-p6.txt
seven-ink 0 $tool multichannel samples/seven_ink_form.txt --inks 7 -o $work/p5.txt --combinations $work/comb7.txt --separations $work/sep7.txt --separated-out $work/p5-p6.txt
convert-blend 0 $tool convert samples/chart_two_whites.txt --from PAPER_PRINTED --to PAPER_TARGET --mode blend -o $work/blend.txt
convert-target-file 0 $tool convert samples/chart_two_whites.txt --from PAPER_PRINTED --to samples/target_paper.txt -o $work/convert.txt
convert-copy 0 $tool convert samples/chart_two_whites.txt --mode copy -o $work/copy.txt
unwritable-output 8 $tool chart samples/offset_form.txt -o $work/missing-folder/chart.txt
missing-patches 6 $tool chart samples/chart_two_whites.txt -o $work/none.txt
no-device-fields 5 $tool chart samples/target_paper.txt -o $work/none.txt
reliability-tests 0 $reliability
RUNS
)

# Every sample must be read by at least one run.
for sample in samples/*.txt; do
  grep -q " $sample " <<<"$runs" || { echo "valgrind: no run reads $sample; add one above" >&2; exit 1; }
done

export VALGRIND_OPTS="--error-exitcode=99 --leak-check=full --show-leak-kinds=definite,indirect,possible
  --errors-for-leak-kinds=definite,indirect,possible --num-callers=30"
memcheck() { # <name> <expected exit> <command...>
  local name=$1 expected=$2; shift 2
  local status=0
  valgrind "$@" >"$work/logs/$name.log" 2>&1 || status=$?
  if [ "$status" -ne "$expected" ]; then
    echo "valgrind: $name exited with $status, expected $expected (99: memcheck errors)"
    tail -n 40 "$work/logs/$name.log"
    return 1
  fi
  echo "valgrind: $name clean ($(grep -o 'ERROR SUMMARY: [0-9]* errors' "$work/logs/$name.log"))"
}
export -f memcheck
export work

# Two runs at a time, one per core.
failed=0
xargs -P 2 -L 1 bash -c 'memcheck "$@"' _ <<<"$runs" || failed=1
[ "$failed" -eq 0 ] || { echo "valgrind: memcheck found errors or leaks" >&2; exit 1; }
echo "valgrind: $(wc -l <<<"$runs") runs clean"
