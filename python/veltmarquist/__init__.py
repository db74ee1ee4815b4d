"""Spectral print models and characterisation charts of the VeltmarquistDLL library.

Measurements in, numpy arrays out: the package runs the code of the ``veltmarquist`` tool (its
measurement reader, form finding, models, checks and chart writers), so the same form gives the
same numbers and byte-identical chart files::

    import veltmarquist
    form = veltmarquist.read_measurements("samples/offset_press_sheet.txt")
    model = veltmarquist.fit(form)                        # the library's offset model
    spectra, xyz, lab = model.predict([[40, 40, 40, 0], [100, 0, 0, 0]])
    model.chart("press.chart.txt")                        # the tool's 900-patch chart
    print(model.check())                                  # CIEDE2000 against the sheet

Every calculation releases the GIL; a model may predict in several threads at once. Failures
raise the tool's one-line messages (see ``veltmarquist.Error`` and its subclasses).
"""
from ._errors import (CalculationError, ContentError, CoverageScaleWarning, DuplicatePatchError, Error,
                      FileFormatError, MissingFileError, MissingPatchError, OutputError, UnreadableFileError,
                      UsageError)
from ._results import Conversion, Prediction, Profile
from ._veltmarquist import (CheckResult, Measurements, Model, MultiChannelChart, Summary, chart_xyz,
                            conformance, convert_chart, delta_e_2000, delta_e_ab, fit, multichannel_chart,
                            read_measurements, spectra_to_xyz, xyz_to_lab)

__version__ = "1.0.0"

__all__ = [
    "CalculationError", "CheckResult", "ContentError", "Conversion", "CoverageScaleWarning", "DuplicatePatchError",
    "Error", "FileFormatError", "Measurements", "MissingFileError", "MissingPatchError", "Model",
    "MultiChannelChart", "OutputError", "Prediction", "Profile", "Summary", "UnreadableFileError", "UsageError",
    "chart_xyz", "conformance", "convert_chart", "delta_e_2000", "delta_e_ab", "fit", "multichannel_chart",
    "read_measurements", "spectra_to_xyz", "xyz_to_lab",
]
