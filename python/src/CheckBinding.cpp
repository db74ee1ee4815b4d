// Checks of a model on measured combinations.
#include "Bindings.h"

#include "Arrays.h"

#include "PatchMatching.h"
#include "PredictionCheck.h"

#include <pybind11/stl.h>

#include <cstdio>

namespace veltmarquist::python {

namespace {

struct CheckResult {
    std::vector<CheckedPatch> patches;
    CheckSummary all, chart;
    bool everyCoverage = false; // the model was checked beyond the chart's combinations
};

const char* const kBlackRanges[] = {"K 0", "K 1-40", "K 41-85", "K 86-100"};

std::string fixed(double value)
{
    char text[64];
    std::snprintf(text, sizeof text, "%.2f", value);
    return text;
}

std::string summaryLine(const std::string& what, const Summary& summary)
{
    return what + " mean " + fixed(summary.mean) + ", 95th percentile " + fixed(summary.p95) + ", max " +
           fixed(summary.max) + "\n";
}

// The lines the tool's chart command prints about its check.
std::string report(const CheckResult& result)
{
    if (result.patches.empty())
        return "check: no combinations measured beyond the test form\n";
    const std::string count = std::to_string(result.all.deltaE2000.count);
    if (!result.everyCoverage)
        return summaryLine("check: " + count + " chart combinations measured beyond the test form, CIEDE2000",
                           result.all.deltaE2000) +
               "  largest difference at " + describeDevice({result.patches[result.all.largest].device.begin(),
                                                            result.patches[result.all.largest].device.end()}) +
               "\n";
    std::string text = summaryLine("check: " + count + " combinations measured beyond the test form, CIEDE2000",
                                   result.all.deltaE2000);
    if (result.chart.deltaE2000.count > 0)
        text += summaryLine("  " + std::to_string(result.chart.deltaE2000.count) + " of them on the chart:",
                            result.chart.deltaE2000);
    std::string means;
    for (std::size_t range = 0; range < 4; ++range)
        if (result.all.byBlack[range].count > 0)
            means += (means.empty() ? "" : ", ") + std::string(kBlackRanges[range]) + " " +
                     fixed(result.all.byBlack[range].mean) + " (" + std::to_string(result.all.byBlack[range].count) +
                     ")";
    const Cmyk& largest = result.patches[result.all.largest].device;
    return text + "  means by black (combinations): " + means + "\n  largest difference at " +
           describeDevice({largest.begin(), largest.end()}) + "\n";
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

} // namespace

py::object checkModel(const Model& model, const py::object& measurements)
{
    std::shared_ptr<Measurements> other;
    if (!measurements.is_none())
        other = measurementsOf(measurements, std::nullopt);
    const MeasurementFile& file = other ? other->file : model.found->file;
    CheckResult result;
    result.everyCoverage = model.fit.model->levels().empty();
    {
        py::gil_scoped_release released;
        std::vector<Cmyk> coverages = characterisationChart();
        if (result.everyCoverage) {
            const std::vector<Cmyk> measured = measuredCombinations(file);
            coverages.insert(coverages.end(), measured.begin(), measured.end());
        }
        result.patches = checkPredictions(file, coverages, *model.fit.model);
        std::vector<CheckedPatch> onChart;
        for (const CheckedPatch& patch : result.patches)
            if (patch.onChart)
                onChart.push_back(patch);
        result.all = summariseChecks(result.patches);
        result.chart = summariseChecks(onChart);
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
        .def("__repr__", [](const Summary& s) {
            return "Summary(count=" + std::to_string(s.count) + ", mean=" + fixed(s.mean) + ", p95=" + fixed(s.p95) +
                   ", max=" + fixed(s.max) + ")";
        });

    py::class_<CheckResult>(module, "CheckResult", R"(
A model's predictions against the averaged measurements of the combinations
a file measured beyond the test form, one row per combination: the chart's
combinations in chart order, then (Yule-Nielsen) the others in file order.
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
        .def("__len__", [](const CheckResult& r) { return r.patches.size(); })
        .def("__str__", [](const CheckResult& r) {
            const std::string lines = report(r);
            return lines.substr(0, lines.size() - 1);
        });
}

} // namespace veltmarquist::python
