"""Small result types of the package."""
from collections import namedtuple

Prediction = namedtuple("Prediction", "spectra xyz lab")
Prediction.__doc__ = """What Model.predict returns for N coverages (or one, without the first axis).

spectra: reflectance factors 0-1 at 380, 390, ..., 730 nm (N x 36); xyz: X, Y, Z (D50, 2 degree,
0-100, Y not limited to 100); lab: the library's CIELAB (N x 3)."""

Conversion = namedtuple("Conversion", "patches whites_apart blend_weight")
Conversion.__doc__ = """What convert_chart wrote: the number of chart patches, the CIE 1976 distance of the two
whites (dE*ab, 0 without whites) and the weight of the converted spectra in a blend."""

Profile = namedtuple("Profile", "description a2b_levels b2a_nodes b2a_count out_of_gamut darkest_lightness bytes")
Profile.__doc__ = """What Model.profile wrote: the profile's description, the A2B table's levels per ink (percent),
the B2A table's nodes per Lab axis and in all, how many B2A nodes lie out of gamut (more than 1 dE*ab
from the press's nearest colour), the darkest neutral's L* within the limits, and the file's size."""
