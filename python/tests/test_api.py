"""The package's arrays, exceptions, files and threads."""
import copy
import os
import pickle
import re
import signal
import threading
import warnings

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


def test_text_that_is_not_utf8_is_kept_escaped(tmp_path):
    sheet = tmp_path / "latin1.txt"
    sheet.write_bytes(b'CGATS.17\nDESCRIPTOR "Pr\xe9sse"\nBEGIN_DATA_FORMAT\nSAMPLE_ID SAMPLE_NAME CMYK_C CMYK_M '
                      b'CMYK_Y CMYK_K\nEND_DATA_FORMAT\nBEGIN_DATA\n1 caf\xe9 0 0 0 0\nEND_DATA\n')
    measurements = veltmarquist.read_measurements(sheet)
    assert measurements.sample_names == ["caf\\xe9"]
    assert measurements.keywords["DESCRIPTOR"] == "Pr\\xe9sse"


def test_sixteen_bands_and_files_without_spectra():
    sixteen = veltmarquist.read_measurements(SAMPLES / "offset_form_16band.txt")
    # The library widens 400-700 nm in 20 nm steps: 380-410 nm take the 420 nm value.
    assert sixteen.spectra.shape == (46, 36)
    np.testing.assert_array_equal(sixteen.spectra[:, 0], sixteen.spectra[:, 4])
    target = veltmarquist.read_measurements(SAMPLES / "target_paper.txt")
    assert target.device.shape == (1, 0)
    assert veltmarquist.read_measurements(SAMPLES / "offset_form.txt").xyz is None


FITTED = {  # model: attribute, what it holds
    "offset": [("gray_difference_factor", (4,)), ("full_correction", float), ("levels", (9,))],
    "gravure": [("ink_order", str), ("trapping_factors", (3,))],
    "ynsn": [("yule_nielsen_n", (36,)), ("ink_spreading", (4,)), ("dot_area_k", (9,)),
             ("tint_residual_rms", float), ("grey_delta_e_ab", (2,)), ("warnings", list), ("levels", None)],
}


@pytest.mark.parametrize("model, attribute, holds", [(model, *value) for model, values in FITTED.items()
                                                     for value in values], ids=lambda value: str(value))
def test_fitted_values_are_attributes(model, attribute, holds):
    value = getattr(veltmarquist.fit(SHEET, model=model), attribute)
    if isinstance(holds, tuple):
        assert value.shape == holds
    elif holds is None:
        assert value is None
    else:
        assert isinstance(value, holds)


def test_colour_differences_broadcast():
    assert veltmarquist.delta_e_ab([50, 0, 0], [53, 4, 0]) == 5.0
    assert veltmarquist.delta_e_2000(np.zeros((2, 3, 3)), [50, 0, 0]).shape == (2, 3)


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
    "not a number": (lambda m: m.predict([0, 0, float("nan"), 0]), ValueError, "Y nan is not a coverage"),
    "wrong shape": (lambda m: m.predict([1, 2, 3]), ValueError, "cmyk must hold 4 values per row"),
    "unknown format": (lambda m: m.chart("x", format="icc"), veltmarquist.UsageError, "unknown chart format 'icc'"),
    "grid off the levels": (lambda m: m.chart("x", layout="grid:7"), veltmarquist.UsageError, "predicts only"),
    "fit_gravure and ynsn": (lambda m: veltmarquist.fit(SHEET, model="ynsn", fit_gravure=True),
                             veltmarquist.UsageError, "cannot go with model='ynsn'"),
    "six inks from a four-colour form": (lambda m: veltmarquist.multichannel_chart(SHEET, 6, "x"),
                                         veltmarquist.ContentError, "6 inks need the device fields 6CLR_1"),
    "five inks": (lambda m: veltmarquist.multichannel_chart(SHEET, 5, "x"), veltmarquist.UsageError,
                  "a multi-channel form has 6 or 7 inks"),
    "a spreadsheet": (lambda m: veltmarquist.read_measurements(write("a.csv", "C;M;Y;K\n1;2;3;4\n")),
                      veltmarquist.FileFormatError, "save it as CGATS text"),
    "one id, two patches": (lambda m: veltmarquist.read_measurements(write("d.txt", DUPLICATE)),
                            veltmarquist.DuplicatePatchError, "d.txt:8: duplicate patch: sample 1"),
    "ink in channel 5": (lambda m: convert(np.full((1, 5), 10.0), "convert"), veltmarquist.ContentError,
                         "give cmyk_only=True"),
    "a white without reflectance": (lambda m: convert(np.zeros((1, 4)), "convert", from_white=np.zeros(36)),
                                    veltmarquist.ContentError, "the white from_white has no reflectance at 380 nm"),
    "percent for reflectance": (lambda m: convert(np.zeros((1, 4)), "copy", spectra=np.full((1, 36), 80.0)),
                                ValueError, "reflectance factors lie from 0 to 1"),
    "a blend without whites": (lambda m: convert(np.zeros((1, 4)), "blend", from_white=None),
                               veltmarquist.UsageError, "a blend needs both whites"),
    "a folder for a chart": (lambda m: m.chart("."), veltmarquist.UsageError, ".: is a folder"),
    "an empty path": (lambda m: m.chart(""), veltmarquist.UsageError, "an empty path names no file"),
    "a chart in a missing folder": (lambda m: m.chart("no/chart.txt"), veltmarquist.OutputError,
                                    "no/chart.txt: cannot create a file in no/"),
    "a scale for a file already read": (lambda m: veltmarquist.fit(m.form, scale=1), ValueError,
                                        "scale applies to a file read from a path"),
}

DUPLICATE = """CGATS.17
BEGIN_DATA_FORMAT
SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K
END_DATA_FORMAT
BEGIN_DATA
1 0 0 0 0
2 10 0 0 0
1 20 0 0 0
END_DATA
"""


def write(name, text):
    with open(name, "w") as file:
        file.write(text)
    return name


def convert(channels, mode, spectra=np.full((1, 36), 0.5), from_white=np.full(36, 0.9)):
    return veltmarquist.convert_chart(spectra, channels, from_white, np.full(36, 0.8), mode, "out.txt")


@pytest.mark.parametrize("call, error, message", ERRORS.values(), ids=ERRORS.keys())
def test_failures_raise_the_tools_messages_and_write_nothing(offset, tmp_path, monkeypatch, call, error, message):
    monkeypatch.chdir(tmp_path)
    with pytest.raises(error, match=re.escape(message)):
        call(offset)
    assert [name for name in os.listdir(tmp_path) if name not in ("a.csv", "d.txt")] == []


@pytest.mark.parametrize("separations, message", [
    (np.zeros((3498, 7)), "3498 separations for 3499 combinations"),
    (np.full((3499, 7), 100.5), "the separation of combination 1 (C 0 M 0 Y 0 K 0), channel 1 is 100.5"),
    (np.zeros((3499, 6)), "separations must hold 7 values per row"),
], ids=["too few", "above 100 %", "six columns for seven inks"])
def test_bad_separations_are_refused(tmp_path, separations, message):
    chart = veltmarquist.multichannel_chart(SAMPLES / "seven_ink_form.txt", 7, tmp_path / "chart.txt")
    with pytest.raises(ValueError, match=re.escape(message)):
        chart.separated_chart(separations, tmp_path / "separated.txt")
    assert os.listdir(tmp_path) == ["chart.txt"]


def test_a_failed_chart_leaves_the_existing_file(offset, tmp_path):
    target = tmp_path / "chart.txt"
    target.write_text("before")
    target.chmod(0o640)
    with pytest.raises(veltmarquist.UsageError):
        offset.chart(target, format="library", spectral=True)
    offset.chart(target, layout="grid:2", format="cgats", created="2025-01-02T03:04:05Z")
    assert 'CREATED\t"2025-01-02T03:04:05Z"' in target.read_text()
    offset.chart(target)
    assert oct(target.stat().st_mode & 0o777) == oct(0o640)
    assert sorted(os.listdir(tmp_path)) == ["chart.txt"]
    assert target.read_text().endswith("END_DATA\n")
    assert signal.getsignal(signal.SIGINT) is signal.default_int_handler  # Ctrl-C stays Python's


def test_outputs_follow_links_and_write_into_devices(offset, tmp_path):
    (tmp_path / "charts").mkdir()
    link = tmp_path / "latest.txt"
    link.symlink_to("charts/chart.txt")
    # A link that names no file is refused: written through, it would make a file nobody asked for.
    with pytest.raises(veltmarquist.UsageError, match="is a symbolic link to .*, which does not exist"):
        offset.chart(link)
    (tmp_path / "charts" / "chart.txt").write_text("old")
    offset.chart(link)
    assert link.is_symlink()
    assert (tmp_path / "charts" / "chart.txt").read_text().endswith("END_DATA\n")
    assert offset.chart("/dev/null", layout="grid") == 6561
    assert sorted(os.listdir(tmp_path / "charts")) == ["chart.txt"]


def test_one_multichannel_chart_separates_in_two_threads(tmp_path):
    chart = veltmarquist.multichannel_chart(SAMPLES / "seven_ink_form.txt", 7, tmp_path / "chart.txt")
    answers = [np.hstack([chart.combinations, np.full((3499, 3), share)]) for share in (0.0, 50.0)]
    for index, separations in enumerate(answers):
        chart.separated_chart(separations, tmp_path / f"serial{index}.txt")
    threads = [threading.Thread(target=chart.separated_chart, args=(separations, tmp_path / f"threads{index}.txt"))
               for index, separations in enumerate(answers) for _ in range(3)]
    for thread in threads:
        thread.start()
    for thread in threads:
        thread.join()
    for index in range(len(answers)):
        assert (tmp_path / f"threads{index}.txt").read_bytes() == (tmp_path / f"serial{index}.txt").read_bytes()


def test_two_models_fit_and_predict_in_two_threads(offset, ynsn):
    coverages = np.array(np.meshgrid(*[[0, 10, 20, 40, 60, 70, 80, 90, 100]] * 4)).reshape(4, -1).T
    expected = {model.name: model.predict(coverages).xyz for model in (offset, ynsn)}
    results = {}

    def predict(name):
        model = veltmarquist.fit(SHEET, model=name)
        results[name] = [model.predict(coverages).xyz for _ in range(5)]

    threads = [threading.Thread(target=predict, args=(name,)) for name in expected]
    for thread in threads:
        thread.start()
    for thread in threads:
        thread.join()
    assert results.keys() == expected.keys()
    for name, runs in results.items():
        for xyz in runs:
            np.testing.assert_array_equal(xyz, expected[name])


TYPES = {  # call: the argument the TypeError names
    "fit(None)": (lambda m: veltmarquist.fit(None), "form must be Measurements or a path"),
    "fit(model=3)": (lambda m: veltmarquist.fit(SHEET, model=3), "model must be a str"),
    "fit(scale=True)": (lambda m: veltmarquist.fit(SHEET, scale=True), "scale must be a number or None"),
    "chart(layout=array)": (lambda m: m.chart("x", layout=np.zeros(3)), "layout must be a path"),
    "chart(None)": (lambda m: m.chart(None), "path must be a path"),
    "chart(spectral=1)": (lambda m: m.chart("x", format="cti3", spectral=1), "spectral must be True or False"),
    "chart(ink_limit='300')": (lambda m: m.chart("x", format="cti3", ink_limit="300"), "ink_limit must be a number"),
    "predict(strings)": (lambda m: m.predict(["40", "40", "40", "0"]), "cmyk must hold numbers"),
    "predict(bools)": (lambda m: m.predict([True, False, False, False]), "cmyk must hold numbers"),
    "predict(complex)": (lambda m: m.predict([40j, 0, 0, 0]), "cmyk must hold numbers"),
    "predict(None)": (lambda m: m.predict(None), "cmyk must hold numbers (int or float), not NoneType"),
    "multichannel_chart(inks=7.0)": (lambda m: veltmarquist.multichannel_chart(SHEET, 7.0, "x"), "inks must be an int"),
    "convert_chart(mode=None)": (lambda m: veltmarquist.convert_chart(np.full((1, 36), .5), np.zeros((1, 4)), None,
                                                                       None, None, "x"), "mode must be a str"),
}


@pytest.mark.parametrize("call, message", TYPES.values(), ids=TYPES.keys())
def test_arguments_of_the_wrong_type_raise_type_error_naming_them(offset, tmp_path, monkeypatch, call, message):
    monkeypatch.chdir(tmp_path)
    with pytest.raises(TypeError, match=re.escape(message)):
        call(offset)
    assert os.listdir(tmp_path) == []


def test_coverages_within_0_to_1_warn_that_they_are_percent(ynsn):
    with pytest.warns(veltmarquist.CoverageScaleWarning, match="coverages are percent"):
        fractions = ynsn.predict([0.4, 0.4, 0.4, 0])
    assert fractions.xyz[1] > ynsn.predict([40, 40, 40, 0]).xyz[1]  # 0.4 % is taken as it is: almost paper
    with warnings.catch_warnings():
        warnings.simplefilter("error")
        ynsn.predict([[0, 0, 0, 0], [0, 0, 0, 0]])  # paper, not fractions
        ynsn.predict([1, 0, 0, 2])  # a value above 1: percent


def test_results_pickle_and_deep_copy(ynsn, tmp_path):
    check = ynsn.check()
    chart = veltmarquist.multichannel_chart(SAMPLES / "seven_ink_form.txt", 7, tmp_path / "chart.txt")
    for result in (ynsn.form, ynsn, check, check.summary, chart):
        for copied in (pickle.loads(pickle.dumps(result)), copy.deepcopy(result)):
            assert type(copied) is type(result) and copied is not result
    again = pickle.loads(pickle.dumps(ynsn))
    np.testing.assert_array_equal(again.predict([10, 20, 30, 40]).spectra, ynsn.predict([10, 20, 30, 40]).spectra)
    np.testing.assert_array_equal(pickle.loads(pickle.dumps(ynsn.form)).spectra, ynsn.form.spectra)
    restored = pickle.loads(pickle.dumps(check))
    assert str(restored) == str(check) and restored.left_out == check.left_out
    np.testing.assert_array_equal(restored.delta_e_2000, check.delta_e_2000)
    np.testing.assert_array_equal(pickle.loads(pickle.dumps(chart)).combinations, chart.combinations)
    assert os.listdir(tmp_path) == ["chart.txt"]  # an unpickled chart is made again, not written


def test_no_call_writes_over_a_file_it_read(tmp_path):
    form, seven, layout = tmp_path / "form.txt", tmp_path / "seven.txt", tmp_path / "layout.txt"
    for source, copy_to in ((SAMPLES / "offset_form.txt", form), (SAMPLES / "seven_ink_form.txt", seven),
                            (SAMPLES / "offset_form.txt", layout)):
        copy_to.write_bytes(source.read_bytes())
    model = veltmarquist.fit(form)
    chart = veltmarquist.multichannel_chart(seven, 7, tmp_path / "chart.txt")
    calls = [lambda: model.chart(form), lambda: model.chart(tmp_path / "." / "form.txt", format="cti3"),
             lambda: model.chart(layout, layout=layout, format="cti3"),
             lambda: veltmarquist.multichannel_chart(seven, 7, seven),
             lambda: chart.separated_chart(np.hstack([chart.combinations, np.zeros((3499, 3))]), seven)]
    for call in calls:
        with pytest.raises(veltmarquist.UsageError, match="is the same file as the input"):
            call()
    assert form.read_bytes() == (SAMPLES / "offset_form.txt").read_bytes()
    assert seven.read_bytes() == (SAMPLES / "seven_ink_form.txt").read_bytes()


def test_conformance_of_a_sheet_against_itself_and_against_another_condition(tmp_path):
    sheet = SAMPLES / "offset_press_sheet.txt"
    result = veltmarquist.conformance(sheet, sheet)
    assert result["verdict"] == "PASS" and result["passed"]
    assert [c["delta_e_2000"] for c in result["controls"]] == [0.0] * 12
    assert {c["tolerance_source"] for c in result["controls"]} == {
        "ISO 12647-2:2013, as cited in TAGA 2015", "this project's default"}
    assert len(result["tone_value_increase"]) == 28
    assert result["gamut"]["regions"]["all"]["count"] > 200
    # A reference measured under M2 while the form says M1: refused unless asked for.
    text = sheet.read_text()
    form = tmp_path / "m1.txt"
    form.write_text(text.replace("\n", "\nFILTER\t\"M1\"\n", 1))
    reference = tmp_path / "m2.txt"
    reference.write_text(text.replace("\n", "\nFILTER\t\"M2\"\n", 1))
    with pytest.raises(veltmarquist.UsageError, match="measurement condition M1 against the reference's M2"):
        veltmarquist.conformance(form, reference, gamut=False)
    allowed = veltmarquist.conformance(form, reference, any_condition=True, gamut=False)
    assert allowed["gamut"] is None and allowed["conditions"]
