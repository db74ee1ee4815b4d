#!/usr/bin/env python3
"""Generates the bundled sample measurement files.

Nothing here is measured: every file is computed from a simple physical model
of ink films on paper and says so in its header (DESCRIPTOR and
INSTRUMENTATION start with "Synthetic"). The output is deterministic; run

    python3 samples/make_samples.py            # rewrites samples/*.txt

after changing the model, and commit the files it writes.

The model
---------
Paper      A coated sheet: flat reflectance of about 0.88, a dip in the violet
           where the coating absorbs, and the fluorescence bump of an optical
           brightener near 440 nm. A second, uncoated and warmer sheet without
           brightener is the target white of the conversion sample.
Ink films  Each ink has a density spectrum D(l) built from a few smooth bands.
           A solid reflects  R = s + (R_paper - s) * 10^(-D(l)): the light
           crosses the film twice, and s = 0.004 is what the film surface
           reflects before any light enters it.
Trapping   An ink printed onto wet ink takes only part of its film: printed
           over k wet inks, its density counts trap^k (trap = 0.9). Print
           order K, C, M, Y, then the further inks.
Dot gain   A nominal dot area a prints as a + g * 4a(1 - a): the largest gain
           g (0.12 to 0.16 per ink) at 50 %, none at 0 and 100 %.
Halftones  Yule-Nielsen spectral Neugebauer, n = 1.8: R^(1/n) is the
           Demichel-weighted sum of R_p^(1/n) over every overprint p of the
           printed inks.
Instrument Gaussian noise of 0.3 % of the value plus 0.0006, from a fixed
           seed, rounded to 4 decimals (2 on the 0-100 scale).

Files
-----
offset_form.txt          the 46-patch four-colour test form in measuring
                         order: clean CGATS.17, SPECTRAL_NM380..730, 0-1 scale
offset_press_sheet.txt   a full press-sheet measurement as instrument software
                         writes it: first line ISO28178, CR LF, trailing TABs,
                         unquoted multi-word keyword values, SPECTRAL_NM_380
                         fields, 0-100 scale; the test form, two grids of chart
                         combinations and repeated patches, shuffled
offset_form_16band.txt   the test form with 16 bands, 400-700 nm in 20 nm
                         steps (nm400 ...), SAMPLE_NAME only, device fields last
six_ink_form.txt         C, M, Y, K, orange, green (6CLR_1..6CLR_6): paper,
                         solids, tints and a few overprints; SPECTRAL_380
                         fields on the 0-100 scale
seven_ink_form.txt       C, M, Y, K, orange, green, violet (7CLR_1..7CLR_7)
chart_two_whites.txt     a spectral chart printed on the coated sheet with two
                         named reference whites, PAPER_PRINTED and PAPER_TARGET
target_paper.txt         the target white alone, one spectrum
"""

import math
import os
import random

NM = list(range(380, 740, 10))
HERE = os.path.dirname(os.path.abspath(__file__))


def gauss(x, centre, width):
    return math.exp(-0.5 * ((x - centre) / width) ** 2)


def step(x, edge, width):
    """Smooth step from 0 (x well below edge) to 1 (x well above)."""
    return 1.0 / (1.0 + math.exp(-(x - edge) / width))


# ---- Paper ----------------------------------------------------------------------

def coated_paper(nm):
    base = 0.872 + 0.012 * (nm - 560) / 170
    coating = 1.0 - 0.42 * step(-nm, -408, 9)        # absorbs below about 410 nm
    brightener = 0.075 * gauss(nm, 438, 17)          # fluorescence, re-emitted in the blue
    return base * coating + brightener


def uncoated_warm_paper(nm):
    base = 0.815 + 0.05 * step(nm, 470, 35) + 0.015 * (nm - 560) / 170
    return base * (1.0 - 0.30 * step(-nm, -430, 14))


# ---- Inks: density spectra of a solid film ------------------------------------------

INKS = {
    "cyan": lambda nm: 0.06 + 1.42 * step(nm, 575, 22) - 0.22 * step(nm, 690, 20) + 0.18 * gauss(nm, 390, 20),
    "magenta": lambda nm: 0.03 + 1.38 * gauss(nm, 545, 38) + 0.22 * gauss(nm, 430, 30),
    "yellow": lambda nm: 0.015 + 1.02 * step(-nm, -492, 11),
    "black": lambda nm: 1.68 - 0.12 * (nm - 380) / 350,
    "orange": lambda nm: 0.02 + 1.25 * step(-nm, -566, 13),
    "green": lambda nm: 0.03 + 1.15 * step(nm, 592, 16) + 0.85 * step(-nm, -474, 14),
    "violet": lambda nm: 0.04 + 1.20 * gauss(nm, 575, 48) + 0.30 * step(nm, 640, 25),
}
DOT_GAIN = {"cyan": 0.14, "magenta": 0.14, "yellow": 0.12, "black": 0.16,
            "orange": 0.15, "green": 0.15, "violet": 0.15}
PRINT_ORDER = ["black", "cyan", "magenta", "yellow", "orange", "green", "violet"]
TRAP = 0.9
SURFACE = 0.004
YULE_NIELSEN = 1.8


def overprint(paper, inks, nm):
    """Reflectance of solid films of `inks` on the paper at one wavelength."""
    density = 0.0
    for below, ink in enumerate(sorted(inks, key=PRINT_ORDER.index)):
        density += TRAP ** below * INKS[ink](nm)
    return SURFACE + (paper(nm) - SURFACE) * 10 ** -density


def printed(paper, coverage, nm):
    """Reflectance of a halftone patch; coverage maps ink -> nominal percent."""
    area = {}
    for ink, percent in coverage.items():
        a = percent / 100.0
        if a > 0:
            area[ink] = min(1.0, a + DOT_GAIN[ink] * 4 * a * (1 - a))
    inks = list(area)
    total = 0.0
    for mask in range(1 << len(inks)):
        on = [ink for bit, ink in enumerate(inks) if mask >> bit & 1]
        weight = 1.0
        for ink in inks:
            weight *= area[ink] if ink in on else 1.0 - area[ink]
        if weight > 0:
            total += weight * overprint(paper, on, nm) ** (1 / YULE_NIELSEN)
    return total ** YULE_NIELSEN


class Instrument:
    def __init__(self, seed):
        self.random = random.Random(seed)

    def measure(self, paper, coverage, wavelengths=NM):
        values = []
        for nm in wavelengths:
            r = printed(paper, coverage, nm)
            r += self.random.gauss(0, 0.003 * r + 0.0006)
            values.append(max(r, 0.0005))
        return values


# ---- Patch sets -----------------------------------------------------------------------

CMYK = ["cyan", "magenta", "yellow", "black"]

# The four-colour test form in measuring order: C, M, Y, K in percent.
TEST_FORM = [
    (100, 0, 0, 0), (0, 0, 0, 0), (100, 100, 0, 100), (0, 0, 40, 0), (0, 0, 0, 80), (10, 0, 0, 0),
    (0, 100, 100, 0), (0, 0, 20, 0), (100, 0, 100, 0), (0, 0, 10, 0), (90, 0, 0, 0), (0, 0, 80, 0),
    (100, 100, 100, 0), (0, 10, 0, 0), (0, 100, 0, 0), (0, 0, 90, 0), (0, 0, 0, 40), (0, 90, 0, 0),
    (100, 100, 100, 100), (0, 0, 100, 0), (100, 0, 0, 100), (0, 0, 0, 20), (0, 100, 0, 100), (0, 0, 60, 0),
    (0, 0, 100, 100), (0, 70, 0, 0), (0, 100, 100, 100), (0, 60, 0, 0), (100, 100, 0, 0), (20, 0, 0, 0),
    (80, 0, 0, 0), (0, 20, 0, 0), (0, 0, 0, 90), (40, 0, 0, 0), (0, 0, 0, 70), (0, 40, 0, 0),
    (0, 0, 0, 100), (60, 0, 0, 0), (0, 0, 70, 0), (0, 0, 0, 60), (70, 0, 0, 0), (0, 80, 0, 0),
    (100, 0, 100, 100), (0, 0, 0, 10), (40, 40, 40, 0), (40, 40, 40, 40),
]
assert len(TEST_FORM) == 46


def coverage_of(values, inks):
    return {ink: value for ink, value in zip(inks, values) if value}


def multi_ink_patches(inks, tints, overprints):
    n = len(inks)
    patches = [tuple([0] * n)]
    for channel in range(n):
        for tint in tints + [100]:
            values = [0] * n
            values[channel] = tint
            patches.append(tuple(values))
    for pair in overprints:
        values = [0] * n
        for channel in pair:
            values[channel] = 100
        patches.append(tuple(values))
    return patches


# ---- Writing ----------------------------------------------------------------------------

def number(value, scale):
    return "%.2f" % (value * 100) if scale == 100 else "%.4f" % value


def write(name, header, fields, rows, line_end="\n", trailing_tabs=0):
    """Writes a CGATS file. header: (keyword, value, quote) triples."""
    pad = "\t" * trailing_tabs
    lines = [header[0][0]]
    for keyword, value, quoted in header[1:]:
        lines.append(keyword + "\t" + ('"%s"' % value if quoted else str(value)))
    lines += ["NUMBER_OF_FIELDS\t%d" % len(fields), "BEGIN_DATA_FORMAT", "\t".join(fields), "END_DATA_FORMAT",
              "NUMBER_OF_SETS\t%d" % len(rows), "BEGIN_DATA"]
    lines += ["\t".join(row) for row in rows]
    lines.append("END_DATA")
    text = "".join(line + (pad if not line or not line[0].isdigit() else "") + line_end for line in lines)
    with open(os.path.join(HERE, name), "w", newline="") as out:
        out.write(text)


def standard_header(kind, descriptor):
    return [(kind, None, False),
            ("ORIGINATOR", "samples/make_samples.py", True),
            ("DESCRIPTOR", "Synthetic " + descriptor, True),
            ("CREATED", "2025-01-15", True),
            ("INSTRUMENTATION", "Synthetic: model of ink films on paper, no instrument", True),
            ("MEASUREMENT_SOURCE", "Illumination=D50 ObserverAngle=2", True)]


def spectral_fields(prefix, wavelengths=NM):
    return [prefix + str(nm) for nm in wavelengths]


def offset_form():
    instrument = Instrument(46)
    rows = []
    for number_, cmyk in enumerate(TEST_FORM, 1):
        values = instrument.measure(coated_paper, coverage_of(cmyk, CMYK))
        rows.append([str(number_), "F%02d" % number_] + [str(v) for v in cmyk] + [number(v, 1) for v in values])
    write("offset_form.txt", standard_header("CGATS.17", "offset test form, 46 patches, coated paper"),
          ["SAMPLE_ID", "SAMPLE_NAME", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"] + spectral_fields("SPECTRAL_NM"), rows)


def offset_press_sheet():
    instrument = Instrument(2025)
    combos = list(TEST_FORM)
    levels = [0, 20, 40, 70, 100]
    combos += [(c, m, y, k) for k in (0, 40) for y in levels for c in levels for m in levels]
    combos += [(0, 0, 0, 0)] * 2 + [(100, 0, 0, 0), (0, 100, 0, 0), (0, 0, 100, 0), (0, 0, 0, 100)]  # repeats
    shuffled = random.Random(7)
    shuffled.shuffle(combos)
    rows = []
    for number_, cmyk in enumerate(combos, 1):
        values = instrument.measure(coated_paper, coverage_of(cmyk, CMYK))
        rows.append([str(number_)] + [str(v) for v in cmyk] + [number(v, 100) for v in values])
    header = [("ISO28178", None, False),
              ("ORIGINATOR", "samples/make_samples.py", False),
              ("DESCRIPTOR", "Synthetic press sheet: test form and chart grids, coated paper", False),
              ("CREATED", "January 2025", False),
              ("INSTRUMENTATION", "Synthetic (model of ink films on paper), no instrument", False),
              ("KEYWORD", "SHEET_SIDE", True), ("SHEET_SIDE", "front", True)]
    write("offset_press_sheet.txt", header, ["SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"] +
          spectral_fields("SPECTRAL_NM_"), rows, line_end="\r\n", trailing_tabs=3)


def offset_form_16band():
    instrument = Instrument(16)
    wavelengths = list(range(400, 720, 20))
    rows = []
    for number_, cmyk in enumerate(TEST_FORM, 1):
        values = instrument.measure(coated_paper, coverage_of(cmyk, CMYK), wavelengths)
        rows.append(["A%d" % number_] + [number(v, 1) for v in values] + [str(v) for v in cmyk])
    write("offset_form_16band.txt",
          standard_header("CGATS.17", "offset test form, 46 patches, 16 bands 400-700 nm"),
          ["SAMPLE_NAME"] + spectral_fields("nm", wavelengths) + ["CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"], rows)


def multi_ink_form(name, inks, prefix, scale, overprints, seed):
    instrument = Instrument(seed)
    n = len(inks)
    patches = multi_ink_patches(inks, [10, 20, 40, 60, 80], overprints)
    rows = []
    for number_, values in enumerate(patches, 1):
        spectrum = instrument.measure(coated_paper, coverage_of(values, inks))
        rows.append([str(number_)] + [str(v) for v in values] + [number(v, scale) for v in spectrum])
    write(name, standard_header("CGATS.17", "%d-ink form (%s): paper, solids, tints, overprints" %
                                (n, ", ".join(inks))),
          ["SAMPLE_ID"] + ["%dCLR_%d" % (n, k) for k in range(1, n + 1)] + spectral_fields(prefix), rows)


def chart_two_whites():
    instrument = Instrument(99)
    levels = [0, 40, 100]
    combos = [(c, m, y, 0) for c in levels for m in levels for y in levels]
    combos += [(0, 0, 0, k) for k in (20, 40, 60, 80, 100)]
    combos += [(40, 40, 40, 40), (60, 40, 40, 20), (100, 100, 100, 100), (20, 10, 10, 0)]
    rows = []
    for number_, cmyk in enumerate(combos, 1):
        spectrum = instrument.measure(coated_paper, coverage_of(cmyk, CMYK))
        rows.append([str(number_), "C%02d" % number_] + [str(v) for v in cmyk] + [number(v, 1) for v in spectrum])
    for name, paper in (("PAPER_PRINTED", coated_paper), ("PAPER_TARGET", uncoated_warm_paper)):
        spectrum = instrument.measure(paper, {})
        rows.append([str(len(rows) + 1), name, "0", "0", "0", "0"] + [number(v, 1) for v in spectrum])
    write("chart_two_whites.txt",
          standard_header("CGATS.17", "chart on coated paper with two reference whites (PAPER_PRINTED, "
                                      "PAPER_TARGET: uncoated, no brightener)"),
          ["SAMPLE_ID", "SAMPLE_NAME", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"] + spectral_fields("nm"), rows)


def target_paper():
    spectrum = Instrument(100).measure(uncoated_warm_paper, {})
    write("target_paper.txt", standard_header("CGATS.17", "paper white: uncoated, no optical brightener"),
          ["SAMPLE_NAME"] + spectral_fields("SPECTRAL_NM"), [["PAPER_TARGET"] + [number(v, 1) for v in spectrum]])


def main():
    offset_form()
    offset_press_sheet()
    offset_form_16band()
    multi_ink_form("six_ink_form.txt", CMYK + ["orange", "green"], "SPECTRAL_", 100,
                   [(0, 4), (1, 4), (2, 4), (0, 5), (2, 5), (4, 5)], 6)
    multi_ink_form("seven_ink_form.txt", CMYK + ["orange", "green", "violet"], "SPECTRAL_NM", 1,
                   [(0, 4), (1, 4), (0, 5), (2, 5), (0, 6), (1, 6)], 7)
    chart_two_whites()
    target_paper()


if __name__ == "__main__":
    main()
