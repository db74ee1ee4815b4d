#!/usr/bin/env bash
# The HTML report in a real browser: Debian's chromium, headless, renders
# the reports of the bundled test form, of the bundled press sheet (every
# section, the check included), of the seven-ink form and, when it lies
# beside the project, of the real data set:
# - as HTML to a PNG, which must not be blank (distinct colours, inked share);
# - with the page's console logged: any console message fails the stage (the
#   page has no script, so a message means a load or parse problem);
# - read as XHTML (the same bytes as .xhtml): the browser's XML parser must
#   take it and find every section;
# - the press sheet's report printed to PDF: the sections start on their own
#   A4 pages;
# - a sheet of over 100,000 checked combinations: at most 3 MB of HTML, and
#   the time chromium takes to render it.
# The pages stay in $build/report-pages for a look.
set -euo pipefail
cd "$(dirname "$0")/../.."

source scripts/stages/tool-build.sh
pages="$build/report-pages"
rm -rf "$pages" && mkdir -p "$pages"
profile=$(mktemp -d)
trap 'rm -rf "$profile"' EXIT

# chromium FILE ARGUMENTS...: a fresh, empty profile each time, nothing fetched.
browse() {
  local page=$1
  shift
  rm -rf "$profile" && mkdir -p "$profile"
  timeout 180 chromium --headless --no-sandbox --disable-gpu --no-first-run --disable-background-networking \
    --disable-component-update --disable-sync --disable-quic --user-data-dir="$profile" --hide-scrollbars \
    --enable-logging=stderr --v=0 "$@" "file://$(realpath "$page")"
}

# report NAME SECTIONS TOOL-ARGUMENTS...
report() {
  local name=$1 sections=$2
  shift 2
  "$tool" report "$@" -o "$pages/$name.html" >"$pages/$name.txt"
  local size
  size=$(stat -c %s "$pages/$name.html")
  [ "$size" -lt 2097152 ] || { echo "$name: the report has $size bytes, 2 MB at most"; exit 1; }

  browse "$pages/$name.html" --screenshot="$pages/$name.png" --window-size=1280,4000 2>"$pages/$name.log" >/dev/null
  if grep -q ':CONSOLE' "$pages/$name.log"; then
    echo "$name: the page logged to the console:"; grep ':CONSOLE' "$pages/$name.log"; exit 1
  fi
  /usr/bin/python3 scripts/png_colours.py "$pages/$name.png" --min-colours 200 --min-inked 0.05

  cp "$pages/$name.html" "$pages/$name.xhtml"
  browse "$pages/$name.xhtml" --dump-dom >"$pages/$name.xhtml.dom" 2>/dev/null
  if grep -q 'parsererror' "$pages/$name.xhtml.dom"; then
    echo "$name: the browser's XML parser refused the page:"; grep -A3 'parsererror' "$pages/$name.xhtml.dom"; exit 1
  fi
  for section in $sections; do
    grep -q "<section id=\"$section\"" "$pages/$name.xhtml.dom" ||
      { echo "$name: section '$section' is missing from the page the browser read"; exit 1; }
  done
  echo "$name: $size bytes, rendered, read as XHTML with sections: $sections"
}

four="summary form spectra tone-values"
report offset-form "$four" samples/offset_form.txt
report press-sheet "$four check" samples/offset_press_sheet.txt --model ynsn
report seven-inks "summary solids chart ramps" samples/seven_ink_form.txt --inks 7

# A sheet of the form and 104,976 further combinations (18 levels per ink) as
# the Yule-Nielsen model of the bundled form predicts them: the report stays
# small (the a*b* plane aggregates), and the time the browser takes is shown.
/usr/bin/python3 - "$pages/large-layout.txt" <<'PY'
import itertools, sys
text = open("samples/offset_form.txt").read().split("\n")
fields = text[text.index("BEGIN_DATA_FORMAT") + 1].split()
data = text[text.index("BEGIN_DATA") + 1:text.index("END_DATA")]
cmyk = [fields.index(f) for f in ("CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K")]
rows = [tuple(line.split()[i] for i in cmyk) for line in data]
rows += [tuple(f"{100 * v / 17:.3f}" for v in levels) for levels in itertools.product(range(18), repeat=4)]
with open(sys.argv[1], "w") as out:
    out.write("CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K\nEND_DATA_FORMAT\nBEGIN_DATA\n")
    out.writelines(f"{n} {' '.join(row)}\n" for n, row in enumerate(dict.fromkeys(rows), 1))
    out.write("END_DATA\n")
PY
"$tool" chart samples/offset_form.txt --model ynsn --format cgats --spectral --layout "$pages/large-layout.txt" \
  -o "$pages/large-sheet.txt" >/dev/null
"$tool" report "$pages/large-sheet.txt" --model ynsn -o "$pages/large-sheet.html" >"$pages/large-sheet.txt.report"
size=$(stat -c %s "$pages/large-sheet.html")
[ "$size" -le 3145728 ] || { echo "large-sheet: the report has $size bytes, 3 MB at most"; exit 1; }
started=$(date +%s.%N)
browse "$pages/large-sheet.html" --screenshot="$pages/large-sheet.png" --window-size=1280,4000 >/dev/null 2>&1
echo "large-sheet: $(grep -o 'check: [0-9]*' "$pages/large-sheet.txt.report" | cut -d' ' -f2) combinations checked, $size bytes," \
  "rendered by chromium in $(echo "$(date +%s.%N) - $started" | bc) s (browser start included)"

browse "$pages/press-sheet.html" --print-to-pdf="$pages/press-sheet.pdf" --no-pdf-header-footer >/dev/null 2>&1
pdfPages=$(grep -ao '/Count [0-9]*' "$pages/press-sheet.pdf" | awk '$2 > n { n = $2 } END { print n + 0 }')
[ "$pdfPages" -ge 5 ] || { echo "press-sheet: printed on $pdfPages pages; each of its 5 sections starts a page"; exit 1; }
echo "press-sheet: printed on $pdfPages A4 pages"

# Conformance of the bundled press sheet against itself (PASS, exit 0) and,
# when Debian's reference data sets are installed, against FOGRA39L.
"$tool" conformance samples/offset_press_sheet.txt --reference samples/offset_press_sheet.txt \
  --report "$pages/conformance-self.html" >"$pages/conformance-self.txt"
grep -q 'verdict: PASS' "$pages/conformance-self.txt" || { cat "$pages/conformance-self.txt"; exit 1; }
echo "conformance: the press sheet against itself passes"

data=../shared/data/APTEC_PC10_CardBoard_2023_v1_Spectral.txt
if [ ! -f "$data" ]; then
  echo "skipped: the report of a real measurement: no evaluation data set at $data (the real press data set is not beside the project)"
  exit 0
fi
report real-data "$four check" "$data" --model ynsn
status=0
"$tool" conformance "$data" --reference FOGRA39L --report "$pages/conformance-real.html" \
  >"$pages/conformance-real.txt" || status=$?
[ "$status" -eq 0 ] || [ "$status" -eq 10 ] || { cat "$pages/conformance-real.txt"; exit 1; }
echo "conformance of the real data set against FOGRA39L (exit $status):"
sed -n '/^reference:/,$p' "$pages/conformance-real.txt"
