"""How long Model.predict takes for 10,000 coverages, with timeit (best of 5 runs).

    python bench/bench_predict.py [FORM]

FORM defaults to the project's samples/offset_press_sheet.txt. The offset model predicts
coverages on the form's levels, the Yule-Nielsen model any coverage.
"""
import sys
import timeit
from pathlib import Path

import numpy as np

import veltmarquist

PATCHES = 10_000


def main():
    form = sys.argv[1] if len(sys.argv) > 1 else Path(__file__).resolve().parents[2] / "samples" / "offset_press_sheet.txt"
    generator = np.random.default_rng(7)
    levels = np.array([0, 10, 20, 40, 60, 70, 80, 90, 100], dtype=float)
    cases = {
        "offset": (veltmarquist.fit(form), generator.choice(levels, size=(PATCHES, 4))),
        "ynsn": (veltmarquist.fit(form, model="ynsn"), generator.uniform(0, 100, size=(PATCHES, 4))),
    }
    for name, (model, cmyk) in cases.items():
        seconds = min(timeit.repeat(lambda: model.predict(cmyk), number=1, repeat=5))
        print(f"predict {PATCHES} coverages, {name} model: {seconds * 1000:.1f} ms "
              f"({seconds / PATCHES * 1e6:.2f} us per patch)")


if __name__ == "__main__":
    main()
