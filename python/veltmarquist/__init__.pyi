# Types of the veltmarquist package (the compiled module and its Python parts).
from os import PathLike
from typing import Any, NamedTuple, Optional, Union

import numpy as np
from numpy.typing import ArrayLike, NDArray

_Path = Union[str, PathLike[str]]
_Array = NDArray[np.float64]

__version__: str

class Error(Exception):
    exit_code: int

class UsageError(Error, ValueError): ...
class UnreadableFileError(Error, OSError): ...
class MissingFileError(UnreadableFileError, FileNotFoundError): ...
class FileFormatError(Error, ValueError): ...
class ContentError(Error, ValueError): ...
class MissingPatchError(Error, ValueError): ...
class DuplicatePatchError(Error, ValueError): ...
class OutputError(Error, OSError): ...
class CalculationError(Error): ...

class Prediction(NamedTuple):
    spectra: _Array
    xyz: _Array
    lab: _Array

class Conversion(NamedTuple):
    patches: int
    whites_apart: float
    blend_weight: float

class Measurements:
    path: str
    device: _Array
    spectra: Optional[_Array]
    xyz: Optional[_Array]
    wavelengths: _Array
    sample_ids: list[str]
    sample_names: list[str]
    keywords: dict[str, str]
    device_fields: list[str]
    warnings: list[str]
    scale: float
    spectral_layout: str
    def __len__(self) -> int: ...

class Summary:
    count: int
    mean: float
    p95: float
    max: float

class CheckResult:
    device: _Array
    measured_xyz: _Array
    predicted_xyz: _Array
    measured_lab: _Array
    predicted_lab: _Array
    delta_e_ab: _Array
    delta_e_2000: _Array
    on_chart: NDArray[np.bool_]
    summary: Summary
    chart_summary: Summary
    by_black: dict[str, Summary]
    largest: Optional[int]
    def __len__(self) -> int: ...

class Model:
    name: str
    form: Measurements
    fitted_values: dict[str, Union[float, str, _Array]]
    levels: Optional[_Array]
    warnings: list[str]
    def predict(self, cmyk: ArrayLike) -> Prediction: ...
    def chart(self, path: _Path, layout: Union[str, PathLike[str]] = "chart", format: str = "library",
              spectral: bool = False, ink_limit: Optional[float] = None, created: Optional[str] = None) -> int: ...
    def check(self, measurements: Union[Measurements, _Path, None] = None) -> CheckResult: ...
    def __getattr__(self, name: str) -> Any: ...  # the fitted values

class MultiChannelChart:
    inks: int
    combinations: _Array
    def separated_chart(self, separations: ArrayLike, path: _Path) -> None: ...

def read_measurements(path: _Path, scale: Optional[float] = None) -> Measurements: ...
def fit(form: Union[Measurements, _Path], model: Optional[str] = None, fit_gravure: bool = False,
        scale: Optional[float] = None) -> Model: ...
def multichannel_chart(form: Union[Measurements, _Path], inks: int, path: _Path, *,
                       scale: Optional[float] = None) -> MultiChannelChart: ...
def convert_chart(spectra: ArrayLike, channels: ArrayLike, from_white: Optional[ArrayLike],
                  to_white: Optional[ArrayLike], mode: str, path: _Path, *, cmyk_only: bool = False) -> Conversion: ...
def spectra_to_xyz(spectra: ArrayLike) -> _Array: ...
def xyz_to_lab(xyz: ArrayLike) -> _Array: ...
def chart_xyz(xyz: ArrayLike) -> _Array: ...
def delta_e_2000(lab1: ArrayLike, lab2: ArrayLike) -> Union[float, _Array]: ...
def delta_e_ab(lab1: ArrayLike, lab2: ArrayLike) -> Union[float, _Array]: ...
