// convert: a measured chart copied, converted from one paper white to
// another, or blended (processes 7-9).
#include "Commands.h"

#include "DecimalValues.h"
#include "Files.h"
#include "LibraryBlock.h"
#include "LibraryHost.h"
#include "MeasurementLoading.h"
#include "OutputFile.h"
#include "ToolError.h"

#include "MathProfile.h"
#include "models/PrintModels.h"

#include <sys/stat.h>

#include <algorithm>
#include <cmath>
#include <cstdint>

namespace veltmarquist {

namespace {

// ---- Reference whites ------------------------------------------------------------------------

bool isRegularFile(const std::string& path)
{
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

struct White {
    std::string label;
    MeasurementFile file;              // when read from a file of its own
    const MeasurementSet* set = nullptr;
    const SpectralLayout* layout = nullptr;
    std::vector<int> thousandths;
    size_t chartIndex = SIZE_MAX;      // position in the chart when named there
};

// A white given as a file with one measurement, or as a sample name inside
// the chart (SAMPLE_ID or SAMPLE_NAME).
void resolveWhite(const std::string& given, const char* option, const MeasurementFile& chart,
                  const std::string& chartPath, const ReadOptions& read, White& white,
                  std::vector<FileWarnings>& warnings)
{
    if (isRegularFile(given)) {
        white.file = loadMeasurementFile(given, read);
        warnings.push_back({given, white.file.warnings});
        if (white.file.sets.size() != 1)
            throw ToolError(Failure::InputContent, given + ": a white file holds one measurement, this one " +
                                                       std::to_string(white.file.sets.size()));
        if (!white.file.layout.present())
            throw ToolError(Failure::InputContent, given + ": the white has no spectral fields; " +
                                                       white.file.describeFields());
        white.set = &white.file.sets[0];
        white.layout = &white.file.layout;
        white.thousandths = thousandthsOf(*white.set);
        white.label = given;
        return;
    }
    for (size_t i = 0; i < chart.sets.size(); ++i) {
        const MeasurementSet& set = chart.sets[i];
        if (set.id != given && set.name != given)
            continue;
        if (white.set != nullptr)
            throw ToolError(Failure::DuplicatePatch, chartPath + ":" + std::to_string(set.line) +
                                                         ": duplicate patch: the " + option + " white '" + given +
                                                         "' is also on line " + std::to_string(white.set->line));
        white.set = &set;
        white.chartIndex = i;
    }
    if (white.set == nullptr)
        throw ToolError(Failure::MissingPatch, chartPath + ": the " + std::string(option) + " white '" + given +
                                                   "' is neither a file nor a sample name in the chart");
    white.layout = &chart.layout;
    white.thousandths = thousandthsOf(*white.set);
    white.label = "'" + given + "'";
}

// The converted chart holds C, M, Y, K only: a chart with ink in further
// channels is refused unless the user says they may go.
void refuseDroppedChannels(const MeasurementFile& chart, const std::string& path)
{
    size_t inked = 0;
    for (const MeasurementSet& set : chart.sets)
        inked += std::any_of(set.device.begin() + std::min<std::ptrdiff_t>(4, static_cast<std::ptrdiff_t>(set.device.size())),
                             set.device.end(), [](std::int32_t value) { return value != 0; });
    if (inked > 0)
        throw ToolError(Failure::InputContent,
                        path + ": " + std::to_string(inked) + " patches have ink in channels 5-" +
                            std::to_string(chart.deviceFields.size()) + " (" + chart.deviceFields[4] + " ...), but the "
                            "converted chart holds C, M, Y, K only; give --cmyk-only to drop those channels");
}

} // namespace

void runConvert(const ConvertOptions& options, ConvertResult& result)
{
    refuseClashingOutputs({options.chart, options.from, options.to}, {options.output});
    const MeasurementFile chart = loadMeasurementFile(options.chart, options.read);
    result.mode = options.mode;
    result.warnings.push_back({options.chart, chart.warnings});
    if (!chart.layout.present() || chart.deviceFields.empty())
        throw ToolError(Failure::InputContent, options.chart + ": a chart needs device fields (CMYK_C ... or "
                                                               "nCLR_1 ...) and spectral fields; " +
                                                   chart.describeFields());
    if (!options.cmykOnly)
        refuseDroppedChannels(chart, options.chart);
    const bool copy = options.mode == VM_PROCESS_CHART_COPY;
    White from, to;
    if (!options.from.empty())
        resolveWhite(options.from, "--from", chart, options.chart, options.read, from, result.warnings);
    if (!options.to.empty())
        resolveWhite(options.to, "--to", chart, options.chart, options.read, to, result.warnings);

    // Whites named inside the chart are references, not chart patches.
    std::vector<const MeasurementSet*> patches;
    for (size_t i = 0; i < chart.sets.size(); ++i)
        if (i != from.chartIndex && i != to.chartIndex)
            patches.push_back(&chart.sets[i]);
    if (patches.size() > 1997)
        throw ToolError(Failure::InputContent, options.chart + ": " + std::to_string(patches.size()) +
                                                   " patches; at most 1997 can be converted in one chart");

    std::vector<std::vector<int>> thousandths;
    for (const MeasurementSet* patch : patches)
        thousandths.push_back(thousandthsOf(*patch));
    if (thousandths.empty())
        thousandths.push_back(thousandthsOf(chart.sets[0]));
    std::vector<MeasuredSpectrum> spectra;
    for (size_t i = 0; i < patches.size(); ++i)
        spectra.push_back({&chart.layout, &thousandths[i]});
    // A copy reads no white; two copies of the first patch stand in for them.
    const MeasuredSpectrum first{&chart.layout, &thousandths[0]};
    spectra.push_back(from.set != nullptr ? MeasuredSpectrum{from.layout, &from.thousandths} : first);
    spectra.push_back(to.set != nullptr ? MeasuredSpectrum{to.layout, &to.thousandths} : first);
    MeasurementBlock block = buildBlock(spectra);

    double whitesApart = 0.0;
    if (from.set != nullptr && to.set != nullptr) {
        const std::vector<double> fromBands = libraryBands(spectra[spectra.size() - 2]);
        if (!copy)
            for (int band = 0; band < MathProfile::kBands; ++band)
                if (std::lround(fromBands[static_cast<size_t>(band)] * 1000.0) <= 0)
                    throw ToolError(Failure::InputContent, "the --from white " + from.label + " has no reflectance at " +
                                                               std::to_string(380 + 10 * band) +
                                                               " nm; the conversion divides by it");
        whitesApart = deltaEab(labOfXYZ(XYZOfBands(fromBands)),
                               labOfXYZ(XYZOfBands(libraryBands(spectra.back()))));
    }
    // Channel values follow the spectra, seven whole percentages per patch.
    for (const MeasurementSet* patch : patches)
        for (size_t channel = 0; channel < 7; ++channel)
            block.ints.push_back(channel < patch->device.size()
                                     ? static_cast<int>(divideRounded(patch->device[channel], kDeviceUnits))
                                     : 0);
    block.ints.insert(block.ints.end(), 14, 0);

    PendingOutput output(options.output);
    Profile profile(fileStem(options.chart));
    profile.calculate(options.mode, output, block);
    output.commit();
    result.fromLabel = from.label;
    result.toLabel = to.label;
    result.whitesApart = whitesApart;
    result.blendWeight = chartConversionBlendWeight(whitesApart);
    result.patches = patches.size();
    result.written = output.name();
}

} // namespace veltmarquist
