// Measured combinations against predictions.
#include "PredictionCheck.h"

#include "LibraryBlock.h"
#include "Numbers.h"
#include "PatchMatching.h"

#include <algorithm>
#include <set>

namespace veltmarquist {

namespace {

using Key = CombinationIndex::Key;


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

std::vector<CheckedPatch> checkPredictions(const MeasurementFile& file, const std::vector<Cmyk>& coverages,
                                           const PrintModel& model)
{
    std::set<Key> skip, chart;
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch)
        skip.insert(CombinationIndex::keyOf(MeasuredForm::coverageOf(patch)));
    for (const Cmyk& cmyk : characterisationChart())
        chart.insert(CombinationIndex::keyOf(cmyk));
    const CombinationIndex measured(file);
    std::vector<Cmyk> found;
    std::vector<Triple> measuredXYZ;
    for (const Cmyk& coverage : coverages) {
        const SetList sets = measured.find(std::vector<double>(coverage.begin(), coverage.end()));
        if (sets.empty() || !skip.insert(CombinationIndex::keyOf(coverage)).second)
            continue;
        const std::vector<int> thousandths = averageThousandths(file, sets.begin(), sets.size());
        found.push_back(coverage);
        measuredXYZ.push_back(XYZOfBands(libraryBands({&file.layout, &thousandths})));
    }
    const std::vector<Triple> predicted = predictXYZ(model, found);
    std::vector<CheckedPatch> checked;
    for (size_t i = 0; i < found.size(); ++i) {
        checked.push_back(checkedPatch(found[i], measuredXYZ[i], chartXYZ(predicted[i])));
        checked.back().onChart = chart.count(CombinationIndex::keyOf(found[i])) > 0;
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

namespace {

const char* const kBlackRanges[] = {"K 0", "K 1-40", "K 41-85", "K 86-100"};

std::string summaryText(const Summary& summary)
{
    return "mean " + fixedText(summary.mean, 2) + ", 95th percentile " + fixedText(summary.p95, 2) + ", max " +
           fixedText(summary.max, 2);
}

std::string levelsText(const std::vector<double>& levels)
{
    std::string text;
    for (double level : levels)
        text += (text.empty() ? "" : ", ") + shortText(level);
    return text + " %";
}

std::string combinations(std::size_t count)
{
    return std::to_string(count) + (count == 1 ? " combination" : " combinations");
}

} // namespace

ModelCheck checkModel(const MeasurementFile& file, const PrintModel& model)
{
    ModelCheck check;
    check.levels = model.levels();
    check.model = model.name();
    std::set<Key> form, seen;
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch)
        form.insert(CombinationIndex::keyOf(MeasuredForm::coverageOf(patch)));
    const CombinationIndex index(file);
    const auto predicted = [&](double coverage) {
        return check.levels.empty() || std::find(check.levels.begin(), check.levels.end(), coverage) != check.levels.end();
    };
    std::vector<Cmyk> coverages;
    const auto consider = [&](const std::vector<double>& device) {
        const Key key = CombinationIndex::keyOf(device);
        if (index.find(device).empty() || !seen.insert(key).second)
            return;
        Cmyk cmyk{};
        std::copy_n(device.begin(), std::min<std::size_t>(4, device.size()), cmyk.begin());
        const bool further = std::any_of(device.begin() + std::min<std::ptrdiff_t>(4, device.size()), device.end(),
                                         [](double value) { return value != 0.0; });
        if (!further && form.count(key) > 0) {
            ++check.leftOut.formPatches;
        } else if (further || !std::all_of(cmyk.begin(), cmyk.end(), predicted)) {
            ++(further ? check.leftOut.furtherInks : check.leftOut.offLevels);
            ++check.leftOut.byBlack[blackRangeOf(cmyk[3])];
        } else {
            coverages.push_back(cmyk);
        }
    };
    for (const Cmyk& cmyk : characterisationChart())
        consider(std::vector<double>(cmyk.begin(), cmyk.end()));
    for (const MeasurementSet& set : file.sets)
        consider(set.devicePercent());
    check.patches = checkPredictions(file, coverages, model);
    check.all = summariseChecks(check.patches);
    std::vector<CheckedPatch> onChart;
    for (const CheckedPatch& patch : check.patches)
        if (patch.onChart)
            onChart.push_back(patch);
    check.chart = summariseChecks(onChart);
    return check;
}

std::vector<std::string> checkLines(const ModelCheck& check)
{
    std::string leftOut;
    if (check.leftOut.offLevels > 0)
        leftOut += combinations(check.leftOut.offLevels) + " with a coverage off the " + check.model +
                   " model's levels (" + levelsText(check.levels) + ")";
    if (check.leftOut.furtherInks > 0)
        leftOut += (leftOut.empty() ? "" : ", ") + combinations(check.leftOut.furtherInks) +
                   " with ink beyond C, M, Y, K";
    if (check.patches.empty())
        return {"check: no combination measured beyond the test form that the model predicts" +
                (leftOut.empty() ? std::string() : "; left out: " + leftOut)};
    std::vector<std::string> lines{"check: " + combinations(check.all.deltaE2000.count) +
                                   " measured beyond the test form, CIEDE2000 " + summaryText(check.all.deltaE2000)};
    if (check.chart.deltaE2000.count > 0)
        lines.push_back("  " + std::to_string(check.chart.deltaE2000.count) + " of them on the chart: " +
                        summaryText(check.chart.deltaE2000));
    std::string means;
    for (std::size_t range = 0; range < 4; ++range)
        if (check.all.byBlack[range].count > 0)
            means += (means.empty() ? "" : ", ") + std::string(kBlackRanges[range]) + " " +
                     fixedText(check.all.byBlack[range].mean, 2) + " (" +
                     std::to_string(check.all.byBlack[range].count) + ")";
    lines.push_back("  means by black (combinations): " + means);
    const Cmyk& largest = check.patches[check.all.largest].device;
    lines.push_back("  largest difference at " + describeDevice({largest.begin(), largest.end()}));
    if (!leftOut.empty())
        lines.push_back("  left out: " + leftOut);
    return lines;
}

} // namespace veltmarquist
