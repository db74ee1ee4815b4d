// Chart conversion between paper whites.
#include "ChartConversion.h"

#include "ColourDifference.h"
#include "DecimalValues.h"
#include "Failure.h"
#include "LibraryHost.h"

#include "MathProfile.h"
#include "models/PrintModels.h"

#include <algorithm>
#include <cmath>

namespace veltmarquist {

namespace {

constexpr std::size_t kLibraryChannels = 7;

std::string inChart(const ChartConversion& conversion)
{
    return conversion.source.empty() ? std::string() : conversion.source + ": ";
}

void refuseUnconvertible(const ChartConversion& conversion)
{
    const bool copy = conversion.mode == VM_PROCESS_CHART_COPY;
    if (!copy && conversion.mode != VM_PROCESS_CHART_CONVERT && conversion.mode != VM_PROCESS_CHART_BLEND)
        throw HostError(Failure::Usage, "a chart is copied, converted or blended; process " +
                                            std::to_string(static_cast<int>(conversion.mode)) + " is none of them");
    if (!copy && (!conversion.from || !conversion.to))
        throw HostError(Failure::Usage, std::string(conversion.mode == VM_PROCESS_CHART_BLEND ? "a blend" : "a conversion") +
                                            " needs both whites: the paper the chart was printed on and the paper "
                                            "to convert to");
    const std::size_t count = conversion.patches.size();
    if (count == 0 || count > kMaxConvertedPatches)
        throw HostError(Failure::InputContent, inChart(conversion) + std::to_string(count) +
                                                   " patches; a chart to convert holds 1 to 1997");
    std::size_t inked = 0;
    const ConversionPatch* first = nullptr;
    for (const ConversionPatch& patch : conversion.patches) {
        if (patch.channels.size() > kLibraryChannels)
            throw HostError(Failure::InputContent, inChart(conversion) + patch.label + ": " +
                                                       std::to_string(patch.channels.size()) +
                                                       " channels; the library converts charts of up to 7");
        for (std::int32_t value : patch.channels)
            if (!deviceValueInRange(value))
                throw HostError(Failure::InputContent, inChart(conversion) + patch.label +
                                                           ": a channel value lies outside 0..100 %");
        const bool further = patch.channels.size() > 4 &&
                             std::any_of(patch.channels.begin() + 4, patch.channels.end(),
                                         [](std::int32_t value) { return value != 0; });
        if (further && inked++ == 0)
            first = &patch;
    }
    if (inked > 0 && !conversion.dropFurtherChannels)
        throw HostError(Failure::InputContent,
                        inChart(conversion) + std::to_string(inked) + (inked == 1 ? " patch has" : " patches have") +
                            " ink in channels 5-7 (the first: " + first->label +
                            "), but the converted chart holds C, M, Y, K only; give " + conversion.dropOption +
                            " to drop those channels");
}

} // namespace

ConversionOutcome convertChart(const ChartConversion& conversion, const PendingOutput& output,
                               const std::string& profileName)
{
    refuseUnconvertible(conversion);
    const bool copy = conversion.mode == VM_PROCESS_CHART_COPY;
    std::vector<MeasuredSpectrum> spectra;
    for (const ConversionPatch& patch : conversion.patches)
        spectra.push_back(patch.spectrum);
    // A copy reads no white; the first patch stands in for one that is absent.
    spectra.push_back(conversion.from.value_or(spectra.front()));
    spectra.push_back(conversion.to.value_or(spectra.front()));
    MeasurementBlock block = buildBlock(spectra);

    ConversionOutcome outcome;
    outcome.patches = conversion.patches.size();
    if (conversion.from && conversion.to) {
        const std::vector<double> from = libraryBands(*conversion.from);
        if (!copy)
            for (int band = 0; band < MathProfile::kBands; ++band)
                if (std::lround(from[static_cast<std::size_t>(band)] * 1000.0) <= 0)
                    throw HostError(Failure::InputContent,
                                    "the white " + conversion.fromLabel + " has no reflectance at " +
                                        std::to_string(380 + 10 * band) + " nm; the conversion divides by it");
        outcome.whitesApart =
            deltaEab(labOfXYZ(XYZOfBands(from)), labOfXYZ(XYZOfBands(libraryBands(*conversion.to))));
    }
    outcome.blendWeight = chartConversionBlendWeight(outcome.whitesApart);

    // Channel values follow the spectra, seven whole percentages per patch,
    // then seven zeros for each white.
    for (const ConversionPatch& patch : conversion.patches)
        for (std::size_t channel = 0; channel < kLibraryChannels; ++channel)
            block.ints.push_back(channel < patch.channels.size()
                                     ? static_cast<int>(divideRounded(patch.channels[channel], kDeviceUnits))
                                     : 0);
    block.ints.insert(block.ints.end(), 2 * kLibraryChannels, 0);

    Profile profile(profileName);
    profile.calculate(conversion.mode, output, block);
    return outcome;
}

} // namespace veltmarquist
