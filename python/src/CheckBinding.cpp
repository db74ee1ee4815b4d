// Checks of a model on measured combinations.
#include "Bindings.h"

#include "Arrays.h"

#include "PatchMatching.h"
#include "PredictionCheck.h"

#include "Numbers.h"

#include <pybind11/stl.h>

namespace veltmarquist::python {

namespace {

using CheckResult = ModelCheck;

const char* const kBlackRanges[] = {"K 0", "K 1-40", "K 41-85", "K 86-100"};

// The lines the tool prints about its check.
std::string report(const CheckResult& result)
{
    std::string text;
    for (const std::string& line : checkLines(result))
        text += line + "\n";
    return text;
}

// One column set of the patches as an N x `columns` array.
template <std::size_t columns, typename Member>
py::array_t<double> column(const CheckResult& result, Member member)
{
    std::vector<double> values;
    for (const CheckedPatch& patch : result.patches) {
        const auto& value = patch.*member;
        if constexpr (columns == 1)
            values.push_back(value);
        else
            for (std::size_t i = 0; i < columns; ++i)
                values.push_back(value[i]);
    }
    py::array_t<double> array = matrix(std::move(values), result.patches.size(), columns);
    return columns == 1 ? array.attr("reshape")(result.patches.size()).cast<py::array_t<double>>() : array;
}

py::array_t<double> lab(const CheckResult& result, Lab CheckedPatch::*member)
{
    std::vector<double> values;
    for (const CheckedPatch& patch : result.patches) {
        const Lab& value = patch.*member;
        values.insert(values.end(), {value.L, value.a, value.b});
    }
    return matrix(std::move(values), result.patches.size(), 3);
}

// ---- Pickling: every number as it is ----------------------------------------------------------

constexpr std::size_t kPatchNumbers = 19; // device 4, XYZ 3 + 3, Lab 3 + 3, dE*ab, dE00, on the chart

std::vector<double> numbersOf(const CheckedPatch& patch)
{
    std::vector<double> numbers(patch.device.begin(), patch.device.end());
    numbers.insert(numbers.end(), patch.measuredXYZ.begin(), patch.measuredXYZ.end());
    numbers.insert(numbers.end(), patch.predictedXYZ.begin(), patch.predictedXYZ.end());
    for (const Lab& lab : {patch.measuredLab, patch.predictedLab})
        numbers.insert(numbers.end(), {lab.L, lab.a, lab.b});
    numbers.insert(numbers.end(), {patch.deltaEab, patch.deltaE2000, patch.onChart ? 1.0 : 0.0});
    return numbers;
}

CheckedPatch patchOf(const double* n)
{
    CheckedPatch patch;
    std::copy_n(n, 4, patch.device.begin());
    std::copy_n(n + 4, 3, patch.measuredXYZ.begin());
    std::copy_n(n + 7, 3, patch.predictedXYZ.begin());
    patch.measuredLab = {n[10], n[11], n[12]};
    patch.predictedLab = {n[13], n[14], n[15]};
    patch.deltaEab = n[16];
    patch.deltaE2000 = n[17];
    patch.onChart = n[18] != 0.0;
    return patch;
}

py::tuple summaryState(const Summary& s)
{
    return py::make_tuple(s.count, s.mean, s.p95, s.max);
}

Summary summaryOf(const py::handle& state)
{
    const py::tuple t = state.cast<py::tuple>();
    return {t[0].cast<std::size_t>(), t[1].cast<double>(), t[2].cast<double>(), t[3].cast<double>()};
}

py::tuple checkSummaryState(const CheckSummary& s)
{
    py::list byBlack;
    for (const Summary& range : s.byBlack)
        byBlack.append(summaryState(range));
    return py::make_tuple(summaryState(s.deltaE2000), s.largest, byBlack);
}

CheckSummary checkSummaryOf(const py::handle& state)
{
    const py::tuple t = state.cast<py::tuple>();
    CheckSummary s;
    s.deltaE2000 = summaryOf(t[0]);
    s.largest = t[1].cast<std::size_t>();
    for (std::size_t range = 0; range < 4; ++range)
        s.byBlack[range] = summaryOf(t[2].cast<py::list>()[range]);
    return s;
}

py::tuple stateOf(const CheckResult& r)
{
    std::vector<double> patches;
    for (const CheckedPatch& patch : r.patches) {
        const std::vector<double> numbers = numbersOf(patch);
        patches.insert(patches.end(), numbers.begin(), numbers.end());
    }
    const LeftOut& out = r.leftOut;
    return py::make_tuple(patches, checkSummaryState(r.all), checkSummaryState(r.chart),
                          py::make_tuple(out.formPatches, out.offLevels, out.furtherInks, out.byBlack), r.levels,
                          r.model);
}

CheckResult fromState(const py::tuple& state)
{
    if (state.size() != 6)
        throw py::value_error("not a pickled CheckResult");
    CheckResult r;
    const std::vector<double> patches = state[0].cast<std::vector<double>>();
    for (std::size_t at = 0; at + kPatchNumbers <= patches.size(); at += kPatchNumbers)
        r.patches.push_back(patchOf(&patches[at]));
    r.all = checkSummaryOf(state[1]);
    r.chart = checkSummaryOf(state[2]);
    const py::tuple out = state[3].cast<py::tuple>();
    r.leftOut = {out[0].cast<std::size_t>(), out[1].cast<std::size_t>(), out[2].cast<std::size_t>(),
                 out[3].cast<std::array<std::size_t, 4>>()};
    r.levels = state[4].cast<std::vector<double>>();
    r.model = state[5].cast<std::string>();
    return r;
}

} // namespace

py::object checkModel(const Model& model, const py::object& measurements)
{
    std::shared_ptr<Measurements> other;
    if (!measurements.is_none())
        other = measurementsOf(measurements, std::nullopt, "measurements");
    const MeasurementFile& file = other ? other->file : model.found->file;
    CheckResult result;
    {
        py::gil_scoped_release released;
        result = veltmarquist::checkModel(file, *model.fit.model);
    }
    return py::cast(std::move(result));
}

void bindCheck(py::module_& module)
{
    py::class_<Summary>(module, "Summary", "Count, mean, 95th percentile (linear between ranks) and max of differences.")
        .def_readonly("count", &Summary::count)
        .def_readonly("mean", &Summary::mean)
        .def_readonly("p95", &Summary::p95)
        .def_readonly("max", &Summary::max)
        .def("__repr__",
             [](const Summary& s) {
                 return "Summary(count=" + std::to_string(s.count) + ", mean=" + fixedText(s.mean, 2) +
                        ", p95=" + fixedText(s.p95, 2) + ", max=" + fixedText(s.max, 2) + ")";
             })
        .def(py::pickle([](const Summary& s) { return summaryState(s); },
                        [](const py::tuple& state) { return summaryOf(state); }));

    py::class_<CheckResult>(module, "CheckResult", R"(
A model's predictions against the averaged measurements of the combinations
a file measured beyond the test form that the model predicts, one row per
combination: the chart's combinations in chart order, then the others in file
order. left_out counts the measured combinations the check could not take.
XYZ as the library's chart holds the prediction (Y limited, cut to two
decimals) and the measurement (Y limited); CIELAB, dE*ab and CIEDE2000 from
LittleCMS, as the tool computes them.)")
        .def_property_readonly("device", [](const CheckResult& r) { return column<4>(r, &CheckedPatch::device); },
                               "C, M, Y, K in percent (N x 4).")
        .def_property_readonly("measured_xyz",
                               [](const CheckResult& r) { return column<3>(r, &CheckedPatch::measuredXYZ); })
        .def_property_readonly("predicted_xyz",
                               [](const CheckResult& r) { return column<3>(r, &CheckedPatch::predictedXYZ); })
        .def_property_readonly("measured_lab", [](const CheckResult& r) { return lab(r, &CheckedPatch::measuredLab); })
        .def_property_readonly("predicted_lab",
                               [](const CheckResult& r) { return lab(r, &CheckedPatch::predictedLab); })
        .def_property_readonly("delta_e_ab", [](const CheckResult& r) { return column<1>(r, &CheckedPatch::deltaEab); })
        .def_property_readonly("delta_e_2000",
                               [](const CheckResult& r) { return column<1>(r, &CheckedPatch::deltaE2000); })
        .def_property_readonly(
            "on_chart",
            [](const CheckResult& r) {
                py::array_t<bool> flags(static_cast<py::ssize_t>(r.patches.size()));
                for (std::size_t i = 0; i < r.patches.size(); ++i)
                    flags.mutable_at(static_cast<py::ssize_t>(i)) = r.patches[i].onChart;
                return flags;
            },
            "True for the combinations of the library's 900-patch chart.")
        .def_property_readonly(
            "summary", [](const CheckResult& r) { return r.all.deltaE2000; }, "CIEDE2000 over every row.")
        .def_property_readonly(
            "chart_summary", [](const CheckResult& r) { return r.chart.deltaE2000; },
            "CIEDE2000 over the chart's combinations.")
        .def_property_readonly(
            "by_black",
            [](const CheckResult& r) {
                py::dict ranges;
                for (std::size_t range = 0; range < 4; ++range)
                    ranges[kBlackRanges[range]] = r.all.byBlack[range];
                return ranges;
            },
            "CIEDE2000 by black: 'K 0', 'K 1-40', 'K 41-85', 'K 86-100'.")
        .def_property_readonly(
            "largest",
            [](const CheckResult& r) -> py::object {
                return r.patches.empty() ? py::object(py::none()) : py::int_(r.all.largest);
            },
            "The row of the (first) largest CIEDE2000, or None.")
        .def_property_readonly(
            "left_out",
            [](const CheckResult& r) {
                py::dict why;
                why["off_levels"] = r.leftOut.offLevels;
                why["further_inks"] = r.leftOut.furtherInks;
                why["form_patches"] = r.leftOut.formPatches;
                return why;
            },
            "Measured combinations left out, by why: 'off_levels' (a coverage the model does not predict), "
            "'further_inks' (ink beyond C, M, Y, K), 'form_patches' (the test form's own, fitted).")
        .def("__len__", [](const CheckResult& r) { return r.patches.size(); })
        .def(py::pickle([](const CheckResult& r) { return stateOf(r); },
                        [](const py::tuple& state) { return fromState(state); }))
        .def("__str__", [](const CheckResult& r) {
            const std::string lines = report(r);
            return lines.substr(0, lines.size() - 1);
        });
}

} // namespace veltmarquist::python
