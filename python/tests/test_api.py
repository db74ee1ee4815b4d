"""The package's arrays, exceptions, files and threads."""
import os
import re
import threading

import numpy as np
import pytest

import veltmarquist
from conftest import SAMPLES

SHEET = SAMPLES / "offset_press_sheet.txt"


@pytest.fixture(scope="module")
def offset():
    return veltmarquist.fit(SHEET)


@pytest.fixture(scope="module")
def ynsn():
    return veltmarquist.fit(SHEET, model="ynsn")


def test_measurements_are_the_readers_sets_as_arrays():
    sheet = veltmarquist.read_measurements(SHEET)
    assert sheet.device.shape == (302, 4)
    assert sheet.spectra.shape == (302, 36)
    assert sheet.device.dtype == sheet.spectra.dtype == np.float64
    assert not sheet.spectra.flags.writeable
    # A percent file becomes the library's reflectance factors, in thousandths.
    assert sheet.scale == 100
    np.testing.assert_array_equal(sheet.spectra, np.round(sheet.spectra * 1000) / 1000)
    np.testing.assert_array_equal(sheet.wavelengths, np.arange(380, 740, 10))
    assert len(sheet.sample_ids) == len(sheet)


@pytest.mark.parametrize("cmyk, shape", [([40, 40, 40, 0], ()), ([[40, 40, 40, 0]] * 3, (3,)),
                                         (np.zeros((2, 5, 4)), (2, 5))], ids=["one row", "rows", "grid"])
def test_predictions_keep_the_shape_and_the_librarys_colorimetry(offset, cmyk, shape):
    spectra, xyz, lab = offset.predict(cmyk)
    assert spectra.shape == shape + (36,)
    assert xyz.shape == lab.shape == shape + (3,)
    np.testing.assert_array_equal(veltmarquist.spectra_to_xyz(spectra), xyz)
    np.testing.assert_array_equal(veltmarquist.xyz_to_lab(xyz), lab)


def test_the_check_is_the_tools_colour_difference(ynsn):
    check = ynsn.check()
    assert len(check) == check.summary.count == 230
    np.testing.assert_array_equal(veltmarquist.delta_e_2000(check.measured_lab, check.predicted_lab),
                                  check.delta_e_2000)
    assert check.delta_e_2000[check.largest] == check.summary.max
    assert ynsn.check(SAMPLES / "offset_form.txt").summary.count == 0  # the form alone measures nothing beyond


ERRORS = {
    "missing file": (lambda m: veltmarquist.read_measurements(SAMPLES / "absent.txt"), FileNotFoundError,
                     "absent.txt: cannot open"),
    "missing patches": (lambda m: veltmarquist.fit(SAMPLES / "chart_two_whites.txt"), veltmarquist.MissingPatchError,
                        "27 test-form patches are missing: 3 (C 100 M 100 Y 0 K 100), 6"),
    "contradicted scale": (lambda m: veltmarquist.read_measurements(SHEET, scale=1), ValueError, "scale"),
    "off the form's levels": (lambda m: m.predict([35, 0, 0, 0]), ValueError,
                              "predicts only the form's levels 0, 10, 20, 40, 60, 70, 80, 90, 100 %; C 35 is not one"),
    "outside 0-100": (lambda m: m.predict([[0, 0, 0, 0], [0, 100.5, 0, 0]]), ValueError,
                      "patch 1: M 100.5 is not a coverage from 0 to 100 %"),
    "wrong shape": (lambda m: m.predict([1, 2, 3]), ValueError, "cmyk must hold 4 values per row"),
    "unknown format": (lambda m: m.chart("x", format="icc"), veltmarquist.UsageError, "unknown chart format 'icc'"),
    "grid off the levels": (lambda m: m.chart("x", layout="grid:7"), veltmarquist.UsageError, "predicts only"),
    "fit_gravure and ynsn": (lambda m: veltmarquist.fit(SHEET, model="ynsn", fit_gravure=True),
                             veltmarquist.UsageError, "cannot go with model='ynsn'"),
    "six inks from a four-colour form": (lambda m: veltmarquist.multichannel_chart(SHEET, 6, "x"),
                                         veltmarquist.ContentError, "6 inks need the device fields 6CLR_1"),
}


@pytest.mark.parametrize("call, error, message", ERRORS.values(), ids=ERRORS.keys())
def test_failures_raise_the_tools_messages_and_write_nothing(offset, tmp_path, monkeypatch, call, error, message):
    monkeypatch.chdir(tmp_path)
    with pytest.raises(error, match=re.escape(message)):
        call(offset)
    assert os.listdir(tmp_path) == []


def test_a_failed_chart_leaves_the_existing_file(offset, tmp_path):
    target = tmp_path / "chart.txt"
    target.write_text("before")
    target.chmod(0o640)
    with pytest.raises(veltmarquist.UsageError):
        offset.chart(target, format="library", spectral=True)
    offset.chart(target)
    assert oct(target.stat().st_mode & 0o777) == oct(0o640)
    assert sorted(os.listdir(tmp_path)) == ["chart.txt"]
    assert target.read_text().endswith("END_DATA\n")


def test_two_models_predict_in_two_threads(offset, ynsn):
    coverages = np.array(np.meshgrid(*[[0, 10, 20, 40, 60, 70, 80, 90, 100]] * 4)).reshape(4, -1).T
    expected = {model.name: model.predict(coverages).xyz for model in (offset, ynsn)}
    results = {}

    def predict(model):
        results[model.name] = [model.predict(coverages).xyz for _ in range(5)]

    threads = [threading.Thread(target=predict, args=(model,)) for model in (offset, ynsn)]
    for thread in threads:
        thread.start()
    for thread in threads:
        thread.join()
    for name, runs in results.items():
        for xyz in runs:
            np.testing.assert_array_equal(xyz, expected[name])
