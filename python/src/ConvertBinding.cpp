// Chart conversion between paper whites on arrays (ChartConversion.h).
#include "Bindings.h"

#include "Arrays.h"

#include "ChartConversion.h"
#include "Failure.h"
#include "Files.h"
#include "LibraryBlock.h"
#include "OutputFile.h"

#include "models/PrintModels.h"

#include <pybind11/stl.h>

#include <map>
#include <optional>

namespace veltmarquist::python {

namespace {

const std::map<std::string, PrintProcess> kModes = {
    {"copy", VM_PROCESS_CHART_COPY}, {"convert", VM_PROCESS_CHART_CONVERT}, {"blend", VM_PROCESS_CHART_BLEND}};

py::object convertChart(const py::object& spectraGiven, const py::object& channelsGiven, const py::object& fromGiven,
                        const py::object& toGiven, const py::object& modeGiven, const py::object& pathGiven,
                        const py::object& cmykOnlyGiven)
{
    const py::object conversionType = py::module_::import("veltmarquist._results").attr("Conversion");
    const std::string modeName = textOf(modeGiven, "mode"), path = pathOf(pathGiven, "path");
    const bool cmykOnly = flagOf(cmykOnlyGiven, "cmyk_only");
    const auto mode = kModes.find(modeName);
    if (mode == kModes.end())
        throw HostError(Failure::Usage, "unknown mode '" + modeName + "'; modes: copy, convert, blend");
    const Rows spectra(spectraGiven, kSpectrumBands, "spectra");
    const py::array channelArray = py::array::ensure(channelsGiven);
    const std::size_t channelCount =
        channelArray && channelArray.ndim() == 2 ? static_cast<std::size_t>(channelArray.shape(1)) : 0;
    if (channelCount < 4 || channelCount > 7)
        throw py::value_error("channels must be an N x 4 to N x 7 array of channel values in percent");
    const Rows channels(channelsGiven, channelCount, "channels");
    if (spectra.count() != channels.count())
        throw py::value_error("spectra and channels must hold the same number of patches; they hold " +
                              std::to_string(spectra.count()) + " and " + std::to_string(channels.count()));

    const SpectralLayout bands = libraryLayout();
    std::vector<std::vector<int>> thousandths;
    ChartConversion conversion;
    conversion.mode = mode->second;
    conversion.dropFurtherChannels = cmykOnly;
    conversion.dropOption = "cmyk_only=True";
    thousandths.reserve(spectra.count() + 2);
    for (std::size_t patch = 0; patch < spectra.count(); ++patch) {
        const std::string label = "patch " + std::to_string(patch);
        thousandths.push_back(thousandthsOfFactors(spectra.row(patch), kSpectrumBands, label));
        std::vector<std::int32_t> values;
        for (std::size_t channel = 0; channel < channelCount; ++channel)
            values.push_back(deviceUnitsOf(channels.row(patch)[channel],
                                           label + " channel " + std::to_string(channel + 1)));
        conversion.patches.push_back({{&bands, &thousandths.back()}, std::move(values), label});
    }
    const py::handle whites[2] = {fromGiven, toGiven};
    const char* const names[2] = {"from_white", "to_white"};
    for (int white = 0; white < 2; ++white) {
        if (whites[white].is_none())
            continue;
        thousandths.push_back(thousandthsOfFactors(Rows(whites[white], kSpectrumBands, names[white]).row(0),
                                                   kSpectrumBands, names[white]));
        (white == 0 ? conversion.from : conversion.to) = MeasuredSpectrum{&bands, &thousandths.back()};
        (white == 0 ? conversion.fromLabel : conversion.toLabel) = names[white];
    }
    ConversionOutcome outcome;
    {
        py::gil_scoped_release released;
        PendingOutput output(path);
        outcome = veltmarquist::convertChart(conversion, output, fileStem(path));
        output.commit();
    }
    return conversionType(outcome.patches, outcome.whitesApart, outcome.blendWeight);
}

} // namespace

void bindConvert(py::module_& module)
{
    module.def("convert_chart", &convertChart, py::arg("spectra"), py::arg("channels"), py::arg("from_white"),
               py::arg("to_white"), py::arg("mode"), py::arg("path"), py::kw_only(), py::arg("cmyk_only") = false,
               R"(
Writes a measured chart copied (mode='copy'), converted from one paper white
to another ('convert') or blended ('blend'), as the tool's convert command
does, byte for byte and atomically.

spectra: N x 36 reflectance factors 0-1 at 380-730 nm (Measurements.spectra);
channels: N x 4 to N x 7 channel values in percent; from_white, to_white: 36
bands each (None for a copy). Values are taken to the nearest millionth, then
to the library's thousandths (channels: whole percent) half away from zero,
as the tool takes file values. At most 1997 patches. Ink in channels 5-7 is
refused unless cmyk_only=True. Returns Conversion(patches, whites_apart,
blend_weight).)");
}

} // namespace veltmarquist::python
