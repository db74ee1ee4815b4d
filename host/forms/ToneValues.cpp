// Murray-Davies tone values on each ink's densitometer channel.
#include "ToneValues.h"

#include "PredictionCheck.h"

#include <algorithm>

namespace veltmarquist {

namespace {

// The bands (380 + 10 b nm) of each chromatic ink's complementary filter.
struct Band {
    int first, last;
};
constexpr Band kFilterBands[3] = {{22, 32}, {12, 21}, {2, 11}}; // 600-700, 500-590, 400-490 nm

double channelReflectance(const Spectrum& spectrum, int ink)
{
    if (ink == 3)
        return spectrumToXYZ(spectrum)[1] / 100.0;
    const Band band = kFilterBands[ink];
    double sum = 0.0;
    for (int b = band.first; b <= band.last; ++b)
        sum += spectrum[static_cast<size_t>(b)];
    return sum / (band.last - band.first + 1);
}

Cmyk single(int ink, double coverage)
{
    Cmyk cmyk{};
    cmyk[static_cast<size_t>(ink)] = coverage;
    return cmyk;
}

} // namespace

const char* densitometerChannel(int ink)
{
    static const char* const channels[4] = {"red filter, 600-700 nm", "green filter, 500-590 nm",
                                            "blue filter, 400-490 nm", "visual, CIE Y"};
    return channels[ink];
}

double toneValue(const Spectrum& tint, const Spectrum& paper, const Spectrum& solid, int ink)
{
    const double white = channelReflectance(paper, ink), full = channelReflectance(solid, ink);
    if (white == full)
        return 0.0;
    return 100.0 * (white - channelReflectance(tint, ink)) / (white - full);
}

std::array<ToneValueCurve, 4> toneValueCurves(const MeasuredForm& form, const PrintModel& model)
{
    std::vector<double> levels = model.levels();
    if (levels.empty())
        for (int step = 0; step <= 20; ++step)
            levels.push_back(5.0 * step);
    std::array<ToneValueCurve, 4> curves;
    for (int ink = 0; ink < 4; ++ink) {
        ToneValueCurve& curve = curves[static_cast<size_t>(ink)];
        // The form's tints of this ink alone, in measuring order; sorted below.
        std::vector<std::pair<double, int>> tints;
        int paper = 0, solid = 0;
        for (int patch = 0; patch < MeasuredForm::kPatches; ++patch) {
            const Cmyk cmyk = MeasuredForm::coverageOf(patch);
            const double own = cmyk[static_cast<size_t>(ink)];
            if (cmyk == Cmyk{})
                paper = patch;
            else if (cmyk == single(ink, own))
                tints.emplace_back(own, patch);
            if (cmyk == single(ink, 100.0))
                solid = patch;
        }
        tints.emplace_back(0.0, paper);
        std::sort(tints.begin(), tints.end());
        for (const auto& [coverage, patch] : tints) {
            curve.nominal.push_back(coverage);
            curve.measured.push_back(toneValue(form.spectrum(patch), form.spectrum(paper), form.spectrum(solid), ink));
        }
        // The model's tints, then its paper and solid.
        std::vector<Cmyk> coverages;
        for (double level : levels)
            coverages.push_back(single(ink, level));
        coverages.push_back(Cmyk{});
        coverages.push_back(single(ink, 100.0));
        const std::vector<Spectrum> modelled = predictSpectra(model, coverages);
        const Spectrum& modelPaper = modelled[levels.size()];
        const Spectrum& modelSolid = modelled[levels.size() + 1];
        for (size_t i = 0; i < levels.size(); ++i) {
            curve.modelNominal.push_back(levels[i]);
            curve.modelled.push_back(toneValue(modelled[i], modelPaper, modelSolid, ink));
        }
    }
    return curves;
}

} // namespace veltmarquist
