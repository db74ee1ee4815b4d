// Multi-channel charts from a form and from separations.
#include "Bindings.h"

#include "Arrays.h"

#include "Failure.h"
#include "LibraryBlock.h"
#include "MultiChannelRun.h"
#include "OutputFile.h"

#include <pybind11/stl.h>

#include <memory>
#include <mutex>

namespace veltmarquist::python {

namespace {

// One run through both steps: process 6 predicts with the ramps that
// process 3 or 5 left in its profile.
struct MultiChannelChart {
    py::object form; // the Measurements the chart was made from
    std::string formPath;
    std::unique_ptr<MultiChannelRun> run;
    py::object combinations;
    std::mutex busy; // a profile runs one calculation at a time
};

// Runs the chart of `form` into `path`; an empty path keeps the chart in a
// temporary file that is never delivered (an unpickled chart needs only
// the ramps it leaves).
std::shared_ptr<MultiChannelChart> makeChart(const std::shared_ptr<Measurements>& form, int inks,
                                             const std::string& path)
{
    auto chart = std::make_shared<MultiChannelChart>();
    chart->form = py::cast(form);
    chart->formPath = form->path;
    {
        py::gil_scoped_release released;
        chart->run = std::make_unique<MultiChannelRun>(form->file, form->path, inks);
        refuseClashingOutputs({form->path}, {path});
        PendingOutput output(path.empty() ? "/dev/null" : path);
        chart->run->writeChart(output);
        if (!path.empty())
            output.commit();
    }
    std::vector<double> combinations;
    for (const Cmyk& cmyk : chart->run->combinations())
        combinations.insert(combinations.end(), cmyk.begin(), cmyk.end());
    chart->combinations = matrix(std::move(combinations), VM_EXCHANGE_RECORDS, 4);
    return chart;
}

std::shared_ptr<MultiChannelChart> writeMultiChannelChart(const py::object& given, const py::object& inks,
                                                          const py::object& path, const py::object& scale)
{
    const std::shared_ptr<Measurements> form = measurementsOf(given, scaleOf(scale), "form");
    if (!py::isinstance<py::int_>(inks) || py::isinstance<py::bool_>(inks))
        throw py::type_error("inks must be an int (6 or 7), not " +
                             std::string(py::str(py::type::handle_of(inks).attr("__name__"))));
    const long long count = inks.cast<long long>();
    return makeChart(form, count == 6 || count == 7 ? static_cast<int>(count) : 0, pathOf(path, "path"));
}

void writeSeparatedChart(MultiChannelChart& chart, const py::object& separations, const py::object& pathGiven)
{
    const std::string path = pathOf(pathGiven, "path");
    // Six inks may give six columns (ink A and ink B in columns 5 and 6).
    const py::array given = py::array::ensure(separations);
    const std::size_t channels = chart.run->inks() == 6 && given && given.ndim() == 2 && given.shape(1) == 6 ? 6 : 7;
    const Rows rows(separations, channels, "separations");
    Separations values;
    values.channels = channels;
    for (std::size_t record = 0; record < rows.count(); ++record)
        for (std::size_t channel = 0; channel < channels; ++channel)
            values.values.push_back(deviceUnitsOf(rows.row(record)[channel],
                                                  "the separation of " + MultiChannelRun::combinationLabel(record) +
                                                      ", channel " + std::to_string(channel + 1)));
    py::gil_scoped_release released;
    const std::lock_guard<std::mutex> lock(chart.busy);
    refuseClashingOutputs({chart.formPath}, {path});
    PendingOutput output(path);
    chart.run->writeSeparated(values, output);
    output.commit();
}

} // namespace

void bindMultiChannel(py::module_& module)
{
    py::class_<MultiChannelChart, std::shared_ptr<MultiChannelChart>>(module, "MultiChannelChart", R"(
The six- or seven-colour chart just written, and the library profile that
holds its ink ramps for the separated set. Make one with multichannel_chart().)")
        .def_property_readonly("inks", [](const MultiChannelChart& chart) { return chart.run->inks(); })
        .def_readonly("combinations", &MultiChannelChart::combinations,
                      "The 3499 extended C, M, Y, K combinations (3499 x 4, percent) for the separation software.")
        .def("separated_chart", &writeSeparatedChart, py::arg("separations"), py::arg("path"), R"(
Writes the XYZ chart of the separation software's answer (process 6),
atomically: separations holds one row per combination in the order of
combinations, the seven channels in percent (six inks: 3499 x 6 or x 7,
ink A and ink B in columns 5 and 6). Values are taken to a thousandth of a
percent, as the tool takes them from a file.)")
        // A pickled chart is its form and its ink count: unpickled, the chart
        // is made again (not written) for its ramps and combinations.
        .def(py::pickle(
            [](const MultiChannelChart& chart) { return py::make_tuple(chart.form, chart.run->inks()); },
            [](const py::tuple& state) {
                if (state.size() != 2)
                    throw py::value_error("not a pickled MultiChannelChart");
                return makeChart(state[0].cast<std::shared_ptr<Measurements>>(), state[1].cast<int>(), "");
            }));

    module.def("multichannel_chart", &writeMultiChannelChart, py::arg("form"), py::arg("inks"), py::arg("path"),
               py::kw_only(), py::arg("scale") = py::none(), R"(
Writes the six-colour (inks=6, 128 patches) or seven-colour (inks=7, 159
patches) spectral chart of a form, as the tool's multichannel command does,
byte for byte and atomically; the form's own file is never overwritten.

form: Measurements or a path of a file with fields 6CLR_1 ... 6CLR_6 (or
7CLR_1 ... 7CLR_7) that holds the paper and each solid. Returns a
MultiChannelChart whose combinations go to the separation software and whose
separated_chart() writes the chart of its answer.)");
}

} // namespace veltmarquist::python
