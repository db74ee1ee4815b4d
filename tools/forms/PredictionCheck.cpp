// Measured combinations against predictions.
#include "PredictionCheck.h"

#include "LibraryBlock.h"
#include "PatchMatching.h"

#include <algorithm>
#include <set>

namespace veltmarquist {

namespace {

using Key = CombinationIndex::Key;

Key keyOf(const Cmyk& cmyk)
{
    return CombinationIndex::keyOf(std::vector<double>(cmyk.begin(), cmyk.end()));
}

// One batch of predictions: the X, Y, Z (N = 3) or the spectra (N = 36).
template <size_t N>
std::vector<std::array<double, N>> predictBatch(const PrintModel& model, const std::vector<Cmyk>& coverages)
{
    std::vector<double> cmyk, values(N * coverages.size());
    for (const Cmyk& coverage : coverages)
        cmyk.insert(cmyk.end(), coverage.begin(), coverage.end());
    model.predict(coverages.size(), cmyk.data(), N == 3 ? nullptr : values.data(), N == 3 ? values.data() : nullptr,
                  nullptr);
    std::vector<std::array<double, N>> patches(coverages.size());
    for (size_t i = 0; i < coverages.size(); ++i)
        std::copy_n(values.begin() + static_cast<std::ptrdiff_t>(N * i), N, patches[i].begin());
    return patches;
}

} // namespace

CheckedPatch checkedPatch(const Cmyk& device, const Triple& measuredXYZ, const Triple& predictedXYZ)
{
    CheckedPatch patch;
    patch.device = device;
    patch.measuredXYZ = measuredXYZ;
    patch.predictedXYZ = predictedXYZ;
    patch.measuredLab = labOfXYZ(measuredXYZ);
    patch.predictedLab = labOfXYZ(predictedXYZ);
    patch.deltaEab = deltaEab(patch.measuredLab, patch.predictedLab);
    patch.deltaE2000 = deltaE2000(patch.measuredLab, patch.predictedLab);
    return patch;
}

std::vector<Triple> predictXYZ(const PrintModel& model, const std::vector<Cmyk>& coverages)
{
    return predictBatch<3>(model, coverages);
}

std::vector<Spectrum> predictSpectra(const PrintModel& model, const std::vector<Cmyk>& coverages)
{
    return predictBatch<kSpectrumBands>(model, coverages);
}

std::vector<Cmyk> measuredCombinations(const MeasurementFile& file)
{
    std::vector<Cmyk> combinations;
    std::set<Key> seen;
    for (const MeasurementSet& set : file.sets) {
        const std::vector<double> device = set.devicePercent();
        bool further = false;
        for (size_t channel = 4; channel < device.size(); ++channel)
            further = further || device[channel] != 0.0;
        if (device.empty() || further)
            continue;
        Cmyk cmyk{};
        for (size_t channel = 0; channel < 4 && channel < device.size(); ++channel)
            cmyk[channel] = device[channel];
        if (seen.insert(keyOf(cmyk)).second)
            combinations.push_back(cmyk);
    }
    return combinations;
}

std::vector<CheckedPatch> checkPredictions(const MeasurementFile& file, const std::vector<Cmyk>& coverages,
                                           const PrintModel& model)
{
    std::set<Key> skip, chart;
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch)
        skip.insert(keyOf(MeasuredForm::coverageOf(patch)));
    for (const Cmyk& cmyk : characterisationChart())
        chart.insert(keyOf(cmyk));
    const CombinationIndex measured(file);
    std::vector<Cmyk> found;
    std::vector<Triple> measuredXYZ;
    for (const Cmyk& coverage : coverages) {
        const std::vector<size_t>& sets = measured.find(std::vector<double>(coverage.begin(), coverage.end()));
        if (sets.empty() || !skip.insert(keyOf(coverage)).second)
            continue;
        const std::vector<int> thousandths = averageThousandths(file, sets);
        found.push_back(coverage);
        measuredXYZ.push_back(XYZOfBands(libraryBands({&file.layout, &thousandths})));
    }
    const std::vector<Triple> predicted = predictXYZ(model, found);
    std::vector<CheckedPatch> checked;
    for (size_t i = 0; i < found.size(); ++i) {
        checked.push_back(checkedPatch(found[i], measuredXYZ[i], chartXYZ(predicted[i])));
        checked.back().onChart = chart.count(keyOf(found[i])) > 0;
    }
    return checked;
}

size_t blackRangeOf(double black)
{
    return black <= 0.0 ? 0 : black <= 40.0 ? 1 : black <= 85.0 ? 2 : 3;
}

CheckSummary summariseChecks(const std::vector<CheckedPatch>& patches)
{
    CheckSummary summary;
    std::vector<double> all;
    std::array<std::vector<double>, 4> byBlack;
    for (size_t i = 0; i < patches.size(); ++i) {
        all.push_back(patches[i].deltaE2000);
        byBlack[blackRangeOf(patches[i].device[3])].push_back(patches[i].deltaE2000);
        if (all.back() > all[summary.largest])
            summary.largest = i;
    }
    summary.deltaE2000 = summarise(all);
    for (size_t range = 0; range < byBlack.size(); ++range)
        summary.byBlack[range] = summarise(byBlack[range]);
    return summary;
}

} // namespace veltmarquist
