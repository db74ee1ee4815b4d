"""Small result types of the package."""
from collections import namedtuple

Prediction = namedtuple("Prediction", "spectra xyz lab")
Prediction.__doc__ = """What Model.predict returns for N coverages (or one, without the first axis).

spectra: reflectance factors 0-1 at 380, 390, ..., 730 nm (N x 36); xyz: X, Y, Z (D50, 2 degree,
0-100, Y not limited to 100); lab: the library's CIELAB (N x 3)."""

Conversion = namedtuple("Conversion", "patches whites_apart blend_weight")
Conversion.__doc__ = """What convert_chart wrote: the number of chart patches, the CIE 1976 distance of the two
whites (dE*ab, 0 without whites) and the weight of the converted spectra in a blend."""
