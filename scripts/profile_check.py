#!/usr/bin/python3
"""What an ICC output profile's separation tables (B2A) do, through LittleCMS as a CMM runs them.

    profile_check.py PROFILE.icc --ink-limit 300 --black-limit 95 [--round-trip MEAN P95 MAX]

- the round trip: a device lattice (every 10 %, total at most 280 %) through A2B, B2A and A2B
  again, relative colorimetric: CIEDE2000 between the two colours (mean, 95th percentile, max);
- the limits: a wide CIELAB lattice, mostly outside the gamut, separated into 16-bit CMYK: no
  total above the ink limit and no K above the black limit, to the last code;
- paper white (L* 100, a* = b* = 0) separates into no ink at all;
- along the neutral axis K never falls as L* falls.
Prints the figures; exits 1 when one fails.
"""
import argparse
import ctypes
import ctypes.util
import itertools
import os
import sys

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
from profile_accuracy import delta_e2000  # noqa: E402


def _format(colour_space, channels, bytes_per_channel, floating):
    return (floating << 22) | (colour_space << 16) | (channels << 3) | bytes_per_channel


PT_CMYK, PT_LAB = 6, 10
CMYK_DBL, LAB_DBL = _format(PT_CMYK, 4, 0, 1), _format(PT_LAB, 3, 0, 1)
CMYK_16 = _format(PT_CMYK, 4, 2, 0)
RELATIVE = 1


class Cmm:
    """Transforms of one profile against LittleCMS's CIELAB (D50)."""

    def __init__(self, profile):
        self.lcms = ctypes.CDLL(ctypes.util.find_library("lcms2") or "liblcms2.so.2")
        self.lcms.cmsOpenProfileFromFile.restype = ctypes.c_void_p
        self.lcms.cmsOpenProfileFromFile.argtypes = [ctypes.c_char_p, ctypes.c_char_p]
        self.lcms.cmsCreateLab4Profile.restype = ctypes.c_void_p
        self.lcms.cmsCreateLab4Profile.argtypes = [ctypes.c_void_p]
        self.lcms.cmsCreateTransform.restype = ctypes.c_void_p
        self.lcms.cmsCreateTransform.argtypes = [ctypes.c_void_p, ctypes.c_uint32, ctypes.c_void_p,
                                                 ctypes.c_uint32, ctypes.c_uint32, ctypes.c_uint32]
        self.lcms.cmsDoTransform.argtypes = [ctypes.c_void_p, ctypes.c_void_p, ctypes.c_void_p, ctypes.c_uint32]
        self.profile = self.lcms.cmsOpenProfileFromFile(profile.encode(), b"r")
        if not self.profile:
            sys.exit(f"{profile}: LittleCMS cannot open it")
        self.lab = self.lcms.cmsCreateLab4Profile(None)

    def transform(self, values, source, target, per_in, per_out, out_type):
        """`values` (flat) through a transform; the results, flat."""
        if source == "cmyk":
            handle = self.lcms.cmsCreateTransform(self.profile, CMYK_DBL, self.lab, LAB_DBL, RELATIVE, 0)
        else:
            handle = self.lcms.cmsCreateTransform(self.lab, LAB_DBL, self.profile, target, RELATIVE, 0)
        if not handle:
            sys.exit("LittleCMS cannot make the transform")
        count = len(values) // per_in
        inputs = (ctypes.c_double * len(values))(*values)
        outputs = (out_type * (count * per_out))()
        self.lcms.cmsDoTransform(handle, inputs, outputs, count)
        return list(outputs)

    def to_lab(self, cmyk):
        return self.transform(cmyk, "cmyk", LAB_DBL, 4, 3, ctypes.c_double)

    def to_cmyk(self, lab):
        return self.transform(lab, "lab", CMYK_DBL, 3, 4, ctypes.c_double)

    def to_cmyk16(self, lab):
        return self.transform(lab, "lab", CMYK_16, 3, 4, ctypes.c_uint16)


def triples(flat):
    return [tuple(flat[i:i + 3]) for i in range(0, len(flat), 3)]


def statistics(values):
    ordered = sorted(values)
    rank = 0.95 * (len(ordered) - 1)
    low = int(rank)
    p95 = ordered[low] + (ordered[min(low + 1, len(ordered) - 1)] - ordered[low]) * (rank - low)
    return sum(values) / len(values), p95, ordered[-1]


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("profile")
    parser.add_argument("--ink-limit", type=float, required=True)
    parser.add_argument("--black-limit", type=float, required=True)
    parser.add_argument("--round-trip", type=float, nargs=3, metavar=("MEAN", "P95", "MAX"))
    args = parser.parse_args()
    cmm = Cmm(args.profile)
    failures = []

    lattice = [c for c in itertools.product(range(0, 101, 10), repeat=4) if sum(c) <= 280]
    first = cmm.to_lab([float(v) for c in lattice for v in c])
    second = cmm.to_lab(cmm.to_cmyk(first))
    mean, p95, largest = statistics(delta_e2000(zip(triples(first), triples(second))))
    print(f"round trip: {len(lattice)} device values (every 10 %, total at most 280 %), A2B > B2A > A2B: "
          f"CIEDE2000 mean {mean:.2f}, p95 {p95:.2f}, max {largest:.2f}")
    if args.round_trip and (mean > args.round_trip[0] or p95 > args.round_trip[1] or largest > args.round_trip[2]):
        failures.append(f"the round trip is above {args.round_trip}")

    wide = [(L, a, b) for L in range(0, 101, 2) for a in range(-128, 128, 4) for b in range(-128, 128, 4)]
    codes = cmm.to_cmyk16([float(v) for colour in wide for v in colour])
    totals = [sum(codes[i:i + 4]) for i in range(0, len(codes), 4)]
    blacks = codes[3::4]
    total, black = max(totals) * 100.0 / 65535, max(blacks) * 100.0 / 65535
    print(f"limits: {len(wide)} CIELAB colours separated at 16 bits: total ink at most {total:.4f} %, "
          f"black at most {black:.4f} %")
    if max(totals) > args.ink_limit * 65535 / 100 or max(blacks) > args.black_limit * 65535 / 100:
        failures.append(f"a separation passes the limits {args.ink_limit} % / {args.black_limit} %")

    white = cmm.to_cmyk16([100.0, 0.0, 0.0])
    print(f"paper white: C, M, Y, K codes {white}")
    if any(white):
        failures.append("paper white gets ink")

    neutral = cmm.to_cmyk16([float(v) for L in range(100, -1, -1) for v in (L, 0, 0)])
    ramp = neutral[3::4]
    falls = [100 - i for i in range(1, len(ramp)) if ramp[i] < ramp[i - 1]]
    print(f"neutral axis: K from {ramp[0] * 100 / 65535:.1f} % at L* 100 to {ramp[-1] * 100 / 65535:.1f} % at L* 0"
          + (f", falling at L* {falls}" if falls else ", never falling"))
    if falls:
        failures.append("K falls along the neutral axis")

    for failure in failures:
        print(f"profile_check: {failure}", file=sys.stderr)
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
