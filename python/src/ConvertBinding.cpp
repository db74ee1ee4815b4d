// Chart conversion between paper whites on arrays.
#include "Bindings.h"

#include "Arrays.h"
#include "LibraryHost.h"
#include "OutputFile.h"

#include "ColourDifference.h"
#include "Files.h"
#include "ToolError.h"

#include "models/PrintModels.h"

#include <pybind11/stl.h>
#include <pybind11/stl/filesystem.h>

#include <cmath>
#include <filesystem>
#include <map>

namespace veltmarquist::python {

namespace {

constexpr std::size_t kChannels = 7;   // channel values the library takes per patch
constexpr std::size_t kMaxPatches = 1997; // the block holds 1999 patches with the two whites

const std::map<std::string, PrintProcess> kModes = {
    {"copy", VM_PROCESS_CHART_COPY}, {"convert", VM_PROCESS_CHART_CONVERT}, {"blend", VM_PROCESS_CHART_BLEND}};

// A spectrum's 36 bands in the library's thousandths.
std::vector<int> thousandthsOf(const double* bands, const std::string& what)
{
    std::vector<int> thousandths;
    for (int band = 0; band < kSpectrumBands; ++band) {
        if (!std::isfinite(bands[band]) || bands[band] < -0.5 || bands[band] > 3.0)
            throw py::value_error(what + " has reflectance " + py::repr(py::float_(bands[band])).cast<std::string>() +
                                  " at " + std::to_string(380 + 10 * band) +
                                  " nm; reflectance factors lie from 0 to 1 (not percent)");
        thousandths.push_back(static_cast<int>(roundedUnits(bands[band], 1000)));
    }
    return thousandths;
}

std::vector<double> bandsOf(const std::vector<int>& thousandths)
{
    std::vector<double> bands;
    for (int value : thousandths)
        bands.push_back(value / 1000.0);
    return bands;
}

py::object convertChart(const py::object& spectraGiven, const py::object& channelsGiven, const py::object& fromGiven,
                        const py::object& toGiven, const std::string& modeName, const std::filesystem::path& path,
                        bool cmykOnly)
{
    const py::object conversion = py::module_::import("veltmarquist._results").attr("Conversion");
    const auto mode = kModes.find(modeName);
    if (mode == kModes.end())
        throw ToolError(Failure::Usage, "unknown mode '" + modeName + "'; modes: copy, convert, blend");
    const Rows spectra(spectraGiven, kSpectrumBands, "spectra");
    const py::array channelArray = py::array::ensure(channelsGiven);
    const std::size_t channelCount =
        channelArray && channelArray.ndim() == 2 ? static_cast<std::size_t>(channelArray.shape(1)) : 0;
    if (channelCount < 4 || channelCount > kChannels)
        throw py::value_error("channels must be an N x 4 to N x 7 array of channel values in percent");
    const Rows channels(channelsGiven, channelCount, "channels");
    if (spectra.count() != channels.count() || spectra.count() == 0 || spectra.count() > kMaxPatches)
        throw py::value_error("spectra and channels must hold the same number of patches, 1 to 1997; they hold " +
                              std::to_string(spectra.count()) + " and " + std::to_string(channels.count()));
    const bool copy = mode->second == VM_PROCESS_CHART_COPY;
    if (!copy && (fromGiven.is_none() || toGiven.is_none()))
        throw ToolError(Failure::Usage, "mode '" + modeName + "' needs both whites");

    MeasurementBlock block;
    for (std::size_t patch = 0; patch < spectra.count(); ++patch) {
        const std::vector<int> thousandths = thousandthsOf(spectra.row(patch), "patch " + std::to_string(patch));
        block.ints.insert(block.ints.end(), thousandths.begin(), thousandths.end());
    }
    // A copy reads no white; two copies of the first patch stand in for absent ones.
    const std::vector<int> first(block.ints.begin(), block.ints.begin() + kSpectrumBands);
    std::vector<int> whites[2] = {first, first};
    const py::handle given[2] = {fromGiven, toGiven};
    for (int white = 0; white < 2; ++white)
        if (!given[white].is_none())
            whites[white] = thousandthsOf(Rows(given[white], kSpectrumBands, white == 0 ? "from_white" : "to_white")
                                              .row(0),
                                          white == 0 ? "the from white" : "the to white");
    for (const std::vector<int>& white : whites)
        block.ints.insert(block.ints.end(), white.begin(), white.end());
    double whitesApart = 0.0;
    if (!fromGiven.is_none() && !toGiven.is_none()) {
        for (int band = 0; band < kSpectrumBands && !copy; ++band)
            if (whites[0][static_cast<std::size_t>(band)] <= 0)
                throw ToolError(Failure::InputContent, "the from white has no reflectance at " +
                                                           std::to_string(380 + 10 * band) +
                                                           " nm; the conversion divides by it");
        whitesApart = deltaEab(labOfXYZ(XYZOfBands(bandsOf(whites[0]))), labOfXYZ(XYZOfBands(bandsOf(whites[1]))));
    }
    // Channel values follow the spectra, seven whole percentages per patch;
    // the converted chart holds C, M, Y, K only.
    for (std::size_t patch = 0; patch < channels.count(); ++patch)
        for (std::size_t channel = 0; channel < kChannels; ++channel) {
            const double value = channel < channelCount ? channels.row(patch)[channel] : 0.0;
            if (!std::isfinite(value) || value < 0.0 || value > 100.0)
                throw py::value_error("patch " + std::to_string(patch) + " has channel " + std::to_string(channel + 1) +
                                      " = " + py::repr(py::float_(value)).cast<std::string>() +
                                      ", not a coverage from 0 to 100 %");
            if (channel >= 4 && value != 0.0 && !cmykOnly)
                throw ToolError(Failure::InputContent,
                                "patch " + std::to_string(patch) + " has ink in channel " +
                                    std::to_string(channel + 1) +
                                    ", but the converted chart holds C, M, Y, K only; give cmyk_only=True to drop "
                                    "channels 5-7");
            block.ints.push_back(static_cast<int>(roundedUnits(value, 1)));
        }
    block.ints.insert(block.ints.end(), 2 * kChannels, 0);
    block.count = static_cast<int>(spectra.count() + 2);
    {
        py::gil_scoped_release released;
        PendingOutput output(path.string());
        Profile profile(fileStem(path.string()));
        profile.calculate(mode->second, output, block);
        output.commit();
    }
    return conversion(spectra.count(), whitesApart, chartConversionBlendWeight(whitesApart));
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
as the tool takes file values. Ink in channels 5-7 is refused unless
cmyk_only=True. Returns Conversion(patches, whites_apart, blend_weight).)");
}

} // namespace veltmarquist::python
