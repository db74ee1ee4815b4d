#!/usr/bin/env python3
"""A Python host of the library through ctypes (standard library only): reads
the bundled offset test form and writes the 900-patch offset characterisation
chart (process 0).

    python3 examples/python-host/python_host.py \\
        --library /usr/local/lib/libVeltmarquistDLL.so samples/offset_form.txt chart.txt

The form must list its 46 patches in measuring order with fields SAMPLE_ID,
SAMPLE_NAME, CMYK_C..CMYK_K and 36 bands 380-730 nm (0-1 scale), as
samples/offset_form.txt does. For measurement files in any order, layout or
dialect use the veltmarquist tool, which picks the patches by their C, M, Y, K
values.
"""
import argparse
import ctypes
import ctypes.util
from decimal import ROUND_HALF_UP, Decimal
import sys

PATCHES, BANDS, LEADING_FIELDS = 46, 36, 6
PROCESS_OFFSET, INPUT_10NM = 0, 10
STATUS_OK, STATUS_FILE_NOT_OPENED, STATUS_CALCULATION_FAILED = 0, 1, 3


def load_library(path):
    library = ctypes.CDLL(path or ctypes.util.find_library("VeltmarquistDLL") or "libVeltmarquistDLL.so.1")
    library.CreateMathProfile.restype = ctypes.c_void_p
    library.CreateMathProfile.argtypes = [ctypes.c_char_p]
    library.CalculateChart.restype = ctypes.c_int
    library.CalculateChart.argtypes = [ctypes.c_void_p, ctypes.c_int, ctypes.c_char_p, ctypes.POINTER(ctypes.c_int),
                                       ctypes.c_int, ctypes.c_int, ctypes.c_int, ctypes.c_int]
    library.DestroyMathProfile.restype = None
    library.DestroyMathProfile.argtypes = [ctypes.c_void_p]
    return library


def thousandths(text):
    """Reflectance x 1000 of a decimal text, rounded half away from zero on the
    digits as written (float("0.1235") * 1000 would round down to 123)."""
    return int(Decimal(text).scaleb(3).quantize(Decimal(1), rounding=ROUND_HALF_UP))


def read_form(path):
    """Reflectance x 1000 of the 46 patches, patch after patch."""
    values, in_data = [], False
    with open(path) as form:
        for line in form:
            fields = line.rstrip("\r\n").split("\t")
            if fields[0] == "BEGIN_DATA":
                in_data = True
            elif fields[0] == "END_DATA":
                break
            elif in_data and len(fields) >= LEADING_FIELDS + BANDS:
                values += [thousandths(v) for v in fields[LEADING_FIELDS:LEADING_FIELDS + BANDS]]
    if len(values) != PATCHES * BANDS:
        sys.exit("%s: expected %d patches of %d bands in measuring order" % (path, PATCHES, BANDS))
    return values


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--library", help="path of libVeltmarquistDLL.so (default: the system's search path)")
    parser.add_argument("form")
    parser.add_argument("chart")
    arguments = parser.parse_args()

    library = load_library(arguments.library)
    values = read_form(arguments.form)
    measurements = (ctypes.c_int * len(values))(*values)
    profile = library.CreateMathProfile(b"Python host")
    if not profile:
        sys.exit("the library could not create a profile")
    status = library.CalculateChart(profile, PROCESS_OFFSET, arguments.chart.encode(), measurements, INPUT_10NM, 380,
                                    BANDS, PATCHES)
    # After statuses 1 and 3 the library has destroyed the profile itself.
    if status not in (STATUS_FILE_NOT_OPENED, STATUS_CALCULATION_FAILED):
        library.DestroyMathProfile(profile)
    if status != STATUS_OK:
        sys.exit("CalculateChart returned status %d" % status)
    version = ctypes.c_double.in_dll(library, "VeltmarquistDLLVersionNumber").value
    print("library version %.1f: offset chart of %s written to %s" % (version, arguments.form, arguments.chart))


if __name__ == "__main__":
    main()
