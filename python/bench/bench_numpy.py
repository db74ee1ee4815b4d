"""Model.predict against a plain-numpy version of the same Yule-Nielsen model, best of 5 runs.

    python bench/bench_numpy.py [FORM]

The numpy version takes the model's fitted values (n per band, spreading factors, dot-area
curves) and its Neugebauer primaries, and predicts in about 25 lines: monotone cubic dot-area
curves, the spreading stage, Demichel weights, one matrix product and one power. It agrees
with the library to about 1e-15; the ratio of the two times is printed per batch size.
"""
import sys
import timeit
from pathlib import Path

import numpy as np

import veltmarquist

LEVELS = np.array([0, 10, 20, 40, 60, 70, 80, 90, 100]) / 100


def monotone_curve(y):
    """Fritsch-Carlson slopes of the nodes; returns the curve as a function of coverage 0-1."""
    h, d = np.diff(LEVELS), np.diff(y) / np.diff(LEVELS)
    m = np.concatenate([[d[0]], np.where(d[:-1] * d[1:] <= 0, 0, (d[:-1] + d[1:]) / 2), [d[-1]]])
    for k in range(len(d)):
        if d[k] == 0:
            m[k] = m[k + 1] = 0
        elif (length := (m[k] / d[k]) ** 2 + (m[k + 1] / d[k]) ** 2) > 9:
            tau = 3 / np.sqrt(length)
            m[k], m[k + 1] = tau * m[k], tau * m[k + 1]

    def at(c):
        k = np.clip(np.searchsorted(LEVELS, c, side="right") - 1, 0, len(d) - 1)
        t = (c - LEVELS[k]) / h[k]
        return y[k] + (y[k + 1] - y[k]) * (3 * t**2 - 2 * t**3) + h[k] * ((t**3 - 2 * t**2 + t) * m[k] + (t**3 - t**2) * m[k + 1])
    return at


def numpy_model(model):
    fitted = model.fitted_values
    n = np.array(fitted["Yule-Nielsen n (380-730 nm)"])
    spreading = np.array(fitted["ink spreading (C, M, Y, K)"])
    curves = [monotone_curve(np.array(fitted[f"dot area {ink} (0, 10, 20, 40, 60, 70, 80, 90, 100 %)"])) for ink in "CMYK"]
    solid = np.array([[(b >> ink) & 1 for ink in range(4)] for b in range(16)], dtype=bool)
    roots = model.predict(solid * 100.0).spectra ** (1 / n)

    def predict(cmyk):
        a = np.stack([curves[ink](np.clip(cmyk[:, ink], 0, 100) / 100) for ink in range(4)], axis=1)
        others = 1 - np.stack([np.prod(np.delete(1 - a, ink, axis=1), axis=1) for ink in range(4)], axis=1)
        a = np.clip(a + spreading * others * a * (1 - a), 0, 1)
        weights = np.prod(np.where(solid[None], a[:, None, :], 1 - a[:, None, :]), axis=2)
        return (weights @ roots) ** n
    return predict


def main():
    form = sys.argv[1] if len(sys.argv) > 1 else Path(__file__).resolve().parents[2] / "samples" / "offset_press_sheet.txt"
    model = veltmarquist.fit(form, model="ynsn")
    plain = numpy_model(model)
    generator = np.random.default_rng(7)
    for count in (1_000, 10_000, 100_000):
        cmyk = generator.uniform(0, 100, size=(count, 4))
        ours = min(timeit.repeat(lambda: model.predict(cmyk), number=1, repeat=5))
        theirs = min(timeit.repeat(lambda: plain(cmyk), number=1, repeat=5))
        difference = np.abs(plain(cmyk) - model.predict(cmyk).spectra).max()
        print(f"{count:>7} coverages: library {ours * 1e3:7.2f} ms, plain numpy {theirs * 1e3:7.2f} ms: "
              f"{theirs / ours:.1f} x (largest difference {difference:.1e})")


if __name__ == "__main__":
    main()
