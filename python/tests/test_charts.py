"""The package against the veltmarquist tool: the same inputs give byte-identical files, and the
arrays hold the numbers the charts hold."""
import subprocess

import numpy as np
import pytest

import veltmarquist
from conftest import REAL_DATA, SAMPLES

no_real_data = pytest.mark.skipif(not REAL_DATA.is_file(), reason=f"the real data set is not at {REAL_DATA}")

# name: (form, fit() arguments, chart() arguments)
FOUR_COLOUR = {
    "offset, library chart": ("offset_press_sheet.txt", {}, {}),
    "gravure fitted": ("offset_form.txt", {"fit_gravure": True}, {}),
    "gravure defaults, 16 bands": ("offset_form_16band.txt", {"model": "gravure"}, {}),
    "offset, 16 bands": ("offset_form_16band.txt", {}, {}),
    "ynsn, library chart": ("offset_press_sheet.txt", {"model": "ynsn"}, {}),
    "offset, cti3 grid spectral": ("offset_form.txt", {}, {"layout": "grid", "format": "cti3", "spectral": True,
                                                          "ink_limit": 300}),
    "ynsn, cgats grid:5": ("offset_press_sheet.txt", {"model": "ynsn"}, {"layout": "grid:5", "format": "cgats",
                                                                         "spectral": True}),
    "ynsn, layout from a file": ("offset_form.txt", {"model": "ynsn"},
                                 {"layout": str(SAMPLES / "offset_press_sheet.txt"), "format": "cti3"}),
    "ynsn, real data": pytest.param(REAL_DATA, {"model": "ynsn"}, {}, marks=no_real_data),
}


def tool_arguments(fitting, charting):
    arguments = []
    if fitting.get("model") == "ynsn":
        arguments += ["--model", "ynsn"]
    if fitting.get("model") == "gravure":
        arguments += ["--process", "gravure"]
    if fitting.get("fit_gravure"):
        arguments.append("--fit-gravure")
    for option in ("layout", "format", "ink_limit"):
        if option in charting:
            arguments += ["--" + option.replace("_", "-"), str(charting[option])]
    return arguments + (["--spectral"] if charting.get("spectral") else [])


def library_chart_rows(path):
    lines = path.read_text().splitlines()
    data = lines[lines.index("BEGIN_DATA") + 1:lines.index("END_DATA")]
    return np.array([[float(value) for value in line.split("\t")[1:8]] for line in data])


@pytest.mark.parametrize("form, fitting, charting", FOUR_COLOUR.values(), ids=FOUR_COLOUR.keys())
def test_four_colour_charts_and_checks_equal_the_tools(tool, tmp_path, monkeypatch, form, fitting, charting):
    monkeypatch.setenv("SOURCE_DATE_EPOCH", "1700000000")
    form = SAMPLES / form
    report = subprocess.run([tool, "chart", str(form), "-o", str(tmp_path / "tool.txt")]
                            + tool_arguments(fitting, charting), check=True, capture_output=True, text=True).stdout
    model = veltmarquist.fit(form, **fitting)
    model.chart(tmp_path / "python.txt", **charting)
    assert (tmp_path / "python.txt").read_bytes() == (tmp_path / "tool.txt").read_bytes()
    if model.name == "offset":
        factor = model.gray_difference_factor
        assert f"C {factor[0]:g}  M {factor[1]:g}  Y {factor[2]:g}  K {factor[3]:g}" in report
        assert f"full correction at      {model.full_correction:g} %" in report
    if model.name == "gravure":
        assert f"ink order               {model.ink_order} (" in report
    check = model.check()
    if len(check):
        assert str(check) in report
    if charting.get("format", "library") == "library" and charting.get("layout", "chart") == "chart":
        rows = library_chart_rows(tmp_path / "python.txt")
        np.testing.assert_array_equal(veltmarquist.chart_xyz(model.predict(rows[:, :4]).xyz), rows[:, 4:])


def cgats_rows(path, first_field):
    lines = path.read_text().splitlines()
    data = lines[lines.index("BEGIN_DATA") + 1:lines.index("END_DATA")]
    return np.array([[float(value) for value in line.split()[first_field:]] for line in data])


@pytest.mark.parametrize("inks", [6, 7])
def test_multichannel_charts_equal_the_tools(tool, tmp_path, inks):
    form = SAMPLES / {6: "six_ink_form.txt", 7: "seven_ink_form.txt"}[inks]
    chart = veltmarquist.multichannel_chart(form, inks, tmp_path / "python.chart")
    # A separation software's answer: the C, M, Y, K and three further inks, with digits beyond the
    # thousandth of a percent that the library takes (rounded half away from zero, as from a file).
    record = np.arange(3499)[:, None]
    further = np.round((record * np.array([7.1235, 13.4575, 29.0015])) % 100, 4)
    separations = np.hstack([chart.combinations * 0.9, further])[:, :inks if inks == 7 else 6]
    fields = "\t".join(f"{inks}CLR_{channel}" for channel in range(1, separations.shape[1] + 1))
    rows = "\n".join(f"{i + 1}\t" + "\t".join(f"{v:.4f}" for v in row) for i, row in enumerate(separations))
    (tmp_path / "separations.txt").write_text(f"CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID\t{fields}\nEND_DATA_FORMAT\n"
                                              f"BEGIN_DATA\n{rows}\nEND_DATA\n")
    subprocess.run([tool, "multichannel", str(form), "--inks", str(inks), "-o", str(tmp_path / "tool.chart"),
                    "--combinations", str(tmp_path / "combinations.txt"), "--separations",
                    str(tmp_path / "separations.txt"), "--separated-out", str(tmp_path / "tool.separated")],
                   check=True, capture_output=True)
    chart.separated_chart(separations, tmp_path / "python.separated")
    assert (tmp_path / "python.chart").read_bytes() == (tmp_path / "tool.chart").read_bytes()
    np.testing.assert_array_equal(chart.combinations, cgats_rows(tmp_path / "combinations.txt", 1))
    assert (tmp_path / "python.separated").read_bytes() == (tmp_path / "tool.separated").read_bytes()


@pytest.mark.parametrize("mode", ["copy", "convert", "blend"])
def test_converted_charts_equal_the_tools(tool, tmp_path, mode):
    chart = veltmarquist.read_measurements(SAMPLES / "chart_two_whites.txt")
    target = veltmarquist.read_measurements(SAMPLES / "target_paper.txt")
    white = chart.sample_names.index("PAPER_PRINTED")
    patches = [i for i in range(len(chart)) if i != white]
    result = veltmarquist.convert_chart(chart.spectra[patches], chart.device[patches], chart.spectra[white],
                                        target.spectra[0], mode, tmp_path / "python.txt")
    report = subprocess.run([tool, "convert", str(SAMPLES / "chart_two_whites.txt"), "--from", "PAPER_PRINTED",
                             "--to", str(SAMPLES / "target_paper.txt"), "--mode", mode, "-o",
                             str(tmp_path / "tool.txt")], check=True, capture_output=True, text=True).stdout
    assert (tmp_path / "python.txt").read_bytes() == (tmp_path / "tool.txt").read_bytes()
    assert result.patches == len(patches)
    if mode != "copy":
        assert f"{result.whites_apart:.2f} dE*ab apart" in report


# The accuracy the README states for the real sheet-fed offset data set (APTEC PC10):
# model: (combinations checked, mean, 95th percentile, max CIEDE2000; the same on the chart's combinations)
REAL_ACCURACY = {"offset": ((878, 1.13, 2.51, 3.75), (720, 1.21, 2.55, 3.75)),
                 "ynsn": ((1542, 0.78, 1.59, 3.34), (720, 0.89, 1.79, 3.16))}


@no_real_data
@pytest.mark.parametrize("model", REAL_ACCURACY)
def test_accuracy_on_the_real_data_set(model):
    check = veltmarquist.fit(REAL_DATA, model=model).check()
    for summary, expected in zip((check.summary, check.chart_summary), REAL_ACCURACY[model]):
        assert (summary.count, *(round(value, 2) for value in (summary.mean, summary.p95, summary.max))) == expected


# name: (form, fit() arguments, profile() arguments, the tool's options)
PROFILES = {
    "ynsn, defaults": ("offset_press_sheet.txt", {"model": "ynsn"}, {}, []),
    "offset, version 4, medium black": ("offset_form.txt", {}, {"icc_version": 4, "black": "medium", "b2a_grid": 17},
                                        ["--model", "offset", "--icc-version", "4", "--black", "medium",
                                         "--b2a-grid", "17"]),
}


@pytest.mark.parametrize("form, fitting, profiling, options", PROFILES.values(), ids=PROFILES.keys())
def test_profiles_equal_the_tools(tool, tmp_path, monkeypatch, form, fitting, profiling, options):
    monkeypatch.setenv("SOURCE_DATE_EPOCH", "1700000000")
    written = veltmarquist.fit(SAMPLES / form, **fitting).profile(tmp_path / "python.icc", **profiling)
    subprocess.run([tool, "profile", str(SAMPLES / form), "-o", str(tmp_path / "tool.icc"), "-q", *options],
                   check=True, env={"SOURCE_DATE_EPOCH": "1700000000"})
    assert (tmp_path / "python.icc").read_bytes() == (tmp_path / "tool.icc").read_bytes()
    assert written.bytes == (tmp_path / "python.icc").stat().st_size
    assert written.b2a_count == written.b2a_nodes ** 3 and 0 < written.out_of_gamut < written.b2a_count
    assert len(written.a2b_levels) == (9 if fitting.get("model") is None else 17)
