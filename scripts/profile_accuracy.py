#!/usr/bin/python3
"""How well an ICC output profile reproduces a measured CMYK characterisation data set.

    profile_accuracy.py PROFILE.icc MEASURED.txt [--max-mean 0.92] [--max-max 4.0]

MEASURED is a CGATS file with CMYK_C..CMYK_K and 10 nm reflectance spectra
(SPECTRAL_NM380.., SPEC_380.. or nm380..). Each distinct C, M, Y, K
combination counts once. The measured colours come from argyll's spec2cie
(D50, 2 degree observer); the profile's from xicclu (forward, absolute
colorimetric, CMYK -> Lab); the difference is LittleCMS's CIEDE2000. Prints
count, mean, 95th percentile and max, the same for the patches with 86 % black
or more, and the worst patch; exits 1 when the mean or the max is above its
limit.
"""
import argparse
import ctypes
import ctypes.util
import os
import re
import subprocess
import sys
import tempfile


def read_cgats(path):
    """Fields and rows of the first table of a CGATS text (cells split on blanks)."""
    fields, rows, section = [], [], None
    with open(path, encoding="utf-8", errors="replace") as text:
        for line in text:
            cells = line.split()
            if not cells:
                continue
            if cells[0] in ("BEGIN_DATA_FORMAT", "BEGIN_DATA"):
                section = cells[0]
            elif cells[0] in ("END_DATA_FORMAT", "END_DATA"):
                if cells[0] == "END_DATA":
                    break
                section = None
            elif section == "BEGIN_DATA_FORMAT":
                fields += cells
            elif section == "BEGIN_DATA":
                rows.append(cells)
    return fields, rows


def measured_patches(path):
    """{(c, m, y, k): (wavelengths, reflectances 0..1)}, the first measurement of each combination."""
    fields, rows = read_cgats(path)
    device = [fields.index(name) for name in ("CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K")]
    bands = [(int(m.group(1)), i) for i, f in enumerate(fields)
             if (m := re.fullmatch(r"(?:SPECTRAL_NM_?|SPEC_|nm)(\d+)", f))]
    if not bands:
        sys.exit(f"{path}: no spectral fields")
    scale = 100.0 if max(float(r[bands[len(bands) // 2][1]]) for r in rows) > 2 else 1.0
    patches = {}
    for row in rows:
        key = tuple(float(row[i]) for i in device)
        if key not in patches:
            patches[key] = [float(row[i]) / scale for _, i in bands]
    return [nm for nm, _ in bands], patches


def measured_lab(wavelengths, patches, folder):
    """Lab (D50, 2 degree) of each patch's spectrum through spec2cie."""
    source, converted = os.path.join(folder, "measured.ti3"), os.path.join(folder, "measured-lab.ti3")
    step = wavelengths[1] - wavelengths[0]
    with open(source, "w") as out:
        out.write("CTI3\n\nDESCRIPTOR \"measured patches\"\nKEYWORD \"DEVICE_CLASS\"\nDEVICE_CLASS \"OUTPUT\"\n"
                  "KEYWORD \"COLOR_REP\"\nCOLOR_REP \"CMYK_XYZ\"\n")
        out.write(f"KEYWORD \"SPECTRAL_BANDS\"\nSPECTRAL_BANDS \"{len(wavelengths)}\"\n"
                  f"KEYWORD \"SPECTRAL_START_NM\"\nSPECTRAL_START_NM \"{wavelengths[0]}\"\n"
                  f"KEYWORD \"SPECTRAL_END_NM\"\nSPECTRAL_END_NM \"{wavelengths[0] + step * (len(wavelengths) - 1)}\"\n"
                  "KEYWORD \"SPECTRAL_NORM\"\nSPECTRAL_NORM \"100\"\n")
        names = ["SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "XYZ_X", "XYZ_Y", "XYZ_Z"]
        names += [f"SPEC_{nm}" for nm in wavelengths]
        out.write(f"NUMBER_OF_FIELDS {len(names)}\nBEGIN_DATA_FORMAT\n{' '.join(names)}\nEND_DATA_FORMAT\n")
        out.write(f"NUMBER_OF_SETS {len(patches)}\nBEGIN_DATA\n")
        for n, (key, spectrum) in enumerate(patches.items(), 1):
            out.write(" ".join([str(n), *map(repr, key), "0", "0", "0", *(repr(100 * value) for value in spectrum)]) + "\n")
        out.write("END_DATA\n")
    subprocess.run(["spec2cie", "-n", source, converted], check=True, stdout=subprocess.DEVNULL)
    fields, rows = read_cgats(converted)
    columns = [fields.index(name) for name in ("LAB_L", "LAB_A", "LAB_B")]
    return [tuple(float(row[i]) for i in columns) for row in rows]


def profile_lab(profile, keys):
    """Lab of each C, M, Y, K (percent) from the profile's forward table, absolute colorimetric."""
    lookup = subprocess.run(["xicclu", "-v0", "-ff", "-ia", "-pl", "-s", "100", profile], check=True,
                            capture_output=True, text=True,
                            input="".join(" ".join(map(repr, key)) + "\n" for key in keys))
    labs = [tuple(map(float, line.split()[:3])) for line in lookup.stdout.splitlines() if line.strip()]
    if len(labs) != len(keys):
        sys.exit(f"xicclu gave {len(labs)} colours for {len(keys)} patches")
    return labs


class CIELab(ctypes.Structure):
    _fields_ = [("L", ctypes.c_double), ("a", ctypes.c_double), ("b", ctypes.c_double)]


def delta_e2000(pairs):
    lcms = ctypes.CDLL(ctypes.util.find_library("lcms2") or "liblcms2.so.2")
    lcms.cmsCIE2000DeltaE.restype = ctypes.c_double
    lcms.cmsCIE2000DeltaE.argtypes = [ctypes.POINTER(CIELab), ctypes.POINTER(CIELab),
                                      ctypes.c_double, ctypes.c_double, ctypes.c_double]
    return [lcms.cmsCIE2000DeltaE(CIELab(*a), CIELab(*b), 1.0, 1.0, 1.0) for a, b in pairs]


def summary(values):
    ordered = sorted(values)
    rank = 0.95 * (len(ordered) - 1)
    low = int(rank)
    p95 = ordered[low] + (ordered[min(low + 1, len(ordered) - 1)] - ordered[low]) * (rank - low)
    return f"{len(values)} patches, CIEDE2000 mean {sum(values) / len(values):.2f}, p95 {p95:.2f}, max {ordered[-1]:.2f}"


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("profile")
    parser.add_argument("measured")
    parser.add_argument("--max-mean", type=float)
    parser.add_argument("--max-max", type=float)
    args = parser.parse_args()
    wavelengths, patches = measured_patches(args.measured)
    keys = list(patches)
    with tempfile.TemporaryDirectory() as folder:
        truth = measured_lab(wavelengths, patches, folder)
    differences = delta_e2000(zip(truth, profile_lab(args.profile, keys)))
    print(f"{os.path.basename(args.profile)}: {summary(differences)}")
    dark = [d for key, d in zip(keys, differences) if key[3] >= 86]
    if dark:
        print(f"  black 86-100 %: {summary(dark)}")
    worst = max(range(len(keys)), key=differences.__getitem__)
    print("  worst: C {:g} M {:g} Y {:g} K {:g}, measured L* {:.1f}".format(*keys[worst], truth[worst][0]))
    mean, largest = sum(differences) / len(differences), max(differences)
    failed = (args.max_mean is not None and mean > args.max_mean) or (args.max_max is not None and largest > args.max_max)
    if failed:
        print(f"  above the limits (mean {args.max_mean}, max {args.max_max})")
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())
