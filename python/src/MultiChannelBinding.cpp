// Multi-channel charts from a form and from separations.
#include "Bindings.h"

#include "Arrays.h"
#include "LibraryHost.h"
#include "OutputFile.h"

#include "Files.h"
#include "LibraryBlock.h"
#include "PatchMatching.h"
#include "ToolError.h"

#include "MathProfile.h"

#include <pybind11/stl.h>
#include <pybind11/stl/filesystem.h>

#include <cmath>
#include <filesystem>
#include <memory>
#include <mutex>

namespace veltmarquist::python {

namespace {

// One profile through both steps: process 6 predicts with the ramps that
// process 3 or 5 left in it.
struct MultiChannelChart {
    int inks = 7;
    std::unique_ptr<Profile> profile;
    MeasurementBlock block;
    py::object combinations;
    std::mutex busy; // a profile runs one calculation at a time
};

std::shared_ptr<MultiChannelChart> writeMultiChannelChart(const py::object& given, int inks,
                                                          const std::filesystem::path& path,
                                                          std::optional<double> scale)
{
    if (inks != 6 && inks != 7)
        throw ToolError(Failure::Usage, "inks must be 6 or 7, not " + std::to_string(inks));
    const std::shared_ptr<Measurements> form = measurementsOf(given, scale);
    auto chart = std::make_shared<MultiChannelChart>();
    chart->inks = inks;
    {
        py::gil_scoped_release released;
        const MeasurementFile& file = form->file;
        const std::string family = std::to_string(inks) + "CLR_";
        if (file.deviceFields.size() != static_cast<size_t>(inks))
            throw ToolError(Failure::InputContent, form->path + ": " + std::to_string(inks) +
                                                       " inks need the device fields " + family + "1 ... " + family +
                                                       std::to_string(inks) + "; the file has " +
                                                       std::to_string(file.deviceFields.size()) + " device channels");
        const PickedPatches picked = pickPatches(file, multiChannelRequests(inks), form->path);
        std::vector<MeasuredSpectrum> spectra;
        for (const std::vector<int>& thousandths : picked.thousandths)
            spectra.push_back({&file.layout, &thousandths});
        chart->block = buildBlock(spectra, VM_EXCHANGE_BUFFER_INTS);
        chart->profile = std::make_unique<Profile>(fileStem(form->path));
        PendingOutput output(path.string());
        chart->profile->calculate(inks == 6 ? VM_PROCESS_SIX_COLOUR : VM_PROCESS_SEVEN_COLOUR, output, chart->block);
        output.commit();
    }
    std::vector<double> combinations;
    for (size_t record = 0; record < VM_EXCHANGE_RECORDS; ++record)
        for (size_t channel = 0; channel < 4; ++channel)
            combinations.push_back(chart->block.ints[7 * record + channel]);
    chart->combinations = matrix(std::move(combinations), VM_EXCHANGE_RECORDS, 4);
    return chart;
}

std::string combinationLabel(size_t record)
{
    const auto& cmyk = MathProfile::ZANExtended[record];
    return "combination " + std::to_string(record + 1) + " (" +
           describeDevice({double(cmyk[0]), double(cmyk[1]), double(cmyk[2]), double(cmyk[3])}) + ")";
}

void writeSeparatedChart(MultiChannelChart& chart, const py::object& separations, const std::filesystem::path& path)
{
    // Seven channels map one to one; six inks put ink B on the library's
    // channel 6 (channel 5 stays unprinted), as the six-colour model does.
    const py::array given = py::array::ensure(separations);
    const size_t channels = chart.inks == 6 && given && given.ndim() == 2 && given.shape(1) == 6 ? 6 : 7;
    const Rows rows(separations, channels, "separations");
    if (rows.count() != VM_EXCHANGE_RECORDS)
        throw ToolError(Failure::InputContent, std::to_string(rows.count()) + " separations for " +
                                                   std::to_string(VM_EXCHANGE_RECORDS) + " combinations");
    static const int sixInks[] = {0, 1, 2, 3, 4, 6};
    std::vector<int> exchange(VM_EXCHANGE_RECORDS * 7, 0);
    for (size_t record = 0; record < VM_EXCHANGE_RECORDS; ++record)
        for (size_t channel = 0; channel < channels; ++channel) {
            const double value = rows.row(record)[channel];
            if (!std::isfinite(value) || value < 0.0 || value > 100.0)
                throw py::value_error("the separation of " + combinationLabel(record) + " has channel " +
                                      std::to_string(channel + 1) + " = " + py::repr(py::float_(value)).cast<std::string>() +
                                      ", not a coverage from 0 to 100 %");
            // The exchange buffer takes thousandths of a percent.
            exchange[7 * record + static_cast<size_t>(channels == 6 ? sixInks[channel] : channel)] =
                static_cast<int>(roundedUnits(value, 1000));
        }
    py::gil_scoped_release released;
    const std::lock_guard<std::mutex> lock(chart.busy);
    std::copy(exchange.begin(), exchange.end(), chart.block.ints.begin());
    PendingOutput output(path.string());
    chart.profile->calculate(VM_PROCESS_SEPARATED_SET, output, chart.block);
    output.commit();
}

} // namespace

void bindMultiChannel(py::module_& module)
{
    py::class_<MultiChannelChart, std::shared_ptr<MultiChannelChart>>(module, "MultiChannelChart", R"(
The six- or seven-colour chart just written, and the library profile that
holds its ink ramps for the separated set. Make one with multichannel_chart().)")
        .def_readonly("inks", &MultiChannelChart::inks)
        .def_readonly("combinations", &MultiChannelChart::combinations,
                      "The 3499 extended C, M, Y, K combinations (3499 x 4, percent) for the separation software.")
        .def("separated_chart", &writeSeparatedChart, py::arg("separations"), py::arg("path"), R"(
Writes the XYZ chart of the separation software's answer (process 6),
atomically: separations holds one row per combination in the order of
combinations, the seven channels in percent (six inks: 3499 x 6 or x 7,
ink A and ink B in columns 5 and 6). Values are taken to a thousandth of a
percent, as the tool takes them from a file.)");

    module.def("multichannel_chart", &writeMultiChannelChart, py::arg("form"), py::arg("inks"), py::arg("path"),
               py::kw_only(), py::arg("scale") = py::none(), R"(
Writes the six-colour (inks=6, 128 patches) or seven-colour (inks=7, 159
patches) spectral chart of a form, as the tool's multichannel command does,
byte for byte and atomically.

form: Measurements or a path of a file with fields 6CLR_1 ... 6CLR_6 (or
7CLR_1 ... 7CLR_7) that holds the paper and each solid. Returns a
MultiChannelChart whose combinations go to the separation software and whose
separated_chart() writes the chart of its answer.)");
}

} // namespace veltmarquist::python
