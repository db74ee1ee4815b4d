// The Yule-Nielsen spectral Neugebauer model and its monotone dot-area
// curves. The bounded solver is checked through the fits: known parameters
// recovered, spreading factors stopped exactly at their bound.
#include "TestSupport.h"
#include "models/MonotoneCurve.h"
#include "models/YuleNielsen.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <limits>

using namespace veltmarquist::models;
using ::testing::Contains;
using ::testing::HasSubstr;

namespace {

FormPatches syntheticPatches(int variant = 0)
{
    testsupport::RowTable rows(testsupport::syntheticForm(variant));
    return formPatchesFromRows(rows.rows());
}

const YuleNielsenFit& syntheticFit()
{
    static const YuleNielsenFit fit = fitYuleNielsen(syntheticPatches());
    return fit;
}

using Coverages = std::array<double, kInks>;

Bands predict(const YuleNielsenFit& fit, const Coverages& cmyk)
{
    Bands spectrum;
    predictYuleNielsen(fit, cmyk.data(), spectrum.data());
    return spectrum;
}

Coverages only(int ink, double coverage)
{
    Coverages cmyk{};
    cmyk[ink] = coverage;
    return cmyk;
}

// Non-finite values in the spectra of every combination of awkward coverages.
int nonFinitePredictions(const YuleNielsenFit& fit)
{
    const double values[] = {-1, 0, 0.001, 50, 99.999, 100, 101, std::numeric_limits<double>::quiet_NaN()};
    int bad = 0;
    for (int i = 0; i < 8 * 8 * 8 * 8; ++i)
        for (double r : predict(fit, {values[i & 7], values[i >> 3 & 7], values[i >> 6 & 7], values[i >> 9]}))
            bad += !std::isfinite(r);
    return bad;
}

// A model with chosen parameters: n rising from 1.6 to 2.2, a dot gain
// peaking near 50 %, and overprints that multiply the inks' transmittances
// (so every primary is darker than those it contains).
YuleNielsenFit chosenModel(const std::array<double, kInks>& spreading)
{
    const FormPatches form = syntheticPatches();
    std::array<Bands, kPrimaries> primaries;
    Bands n;
    for (int b = 0; b < kBands; ++b) {
        n[b] = 1.6 + 0.6 * std::tanh(b / 4.0);
        for (int p = 0; p < kPrimaries; ++p) {
            primaries[p][b] = form.paper()[b];
            for (int ink = 0; ink < kInks; ++ink)
                if (p >> ink & 1)
                    primaries[p][b] *= std::max(form.solid(ink)[b], 0.01) / form.paper()[b];
        }
    }
    std::array<std::array<double, kTintLevels>, kInks> area;
    for (int ink = 0; ink < kInks; ++ink)
        for (int t = 0; t < kTintLevels; ++t) {
            const double x = kTintLevelPercent[t] / 100.0;
            area[ink][t] = x + (0.15 + 0.03 * ink) * x * (1 - x);
        }
    return yuleNielsenModel(primaries, n, area, spreading);
}

} // namespace

TEST(YuleNielsen, PrimariesComeBackExactlyAndSingleInksIgnoreSpreading)
{
    const FormPatches form = syntheticPatches();
    for (int b = 0; b < kPrimaries; ++b) {
        SCOPED_TRACE("primary " + std::to_string(b));
        Bands floored = form.primary[b];
        for (double& r : floored)
            r = std::max(r, kReflectanceFloor);
        EXPECT_EQ(predict(syntheticFit(), {b & 1 ? 100.0 : 0, b & 2 ? 100.0 : 0, b & 4 ? 100.0 : 0, b & 8 ? 100.0 : 0}),
                  floored);
    }
    YuleNielsenFit unspread = syntheticFit();
    unspread.spreading = {};
    for (int ink = 0; ink < kInks; ++ink) {
        SCOPED_TRACE("ink " + std::to_string(ink));
        EXPECT_EQ(predict(syntheticFit(), only(ink, 33.3)), predict(unspread, only(ink, 33.3)));
    }
}

TEST(YuleNielsen, EveryBandDarkensAsAnyInkGrows)
{
    const YuleNielsenFit spread = chosenModel({0.1, -0.1, 0.1, -0.1});
    for (int ink = 0; ink < kInks; ++ink) {
        for (double others : {0.0, 40.0, 100.0}) {
            SCOPED_TRACE("ink " + std::to_string(ink) + ", others at " + std::to_string(others));
            int rises = 0;
            Bands before{};
            for (int step = 0; step <= 400; ++step) {
                Coverages cmyk = {others, others, others, others};
                cmyk[ink] = step / 4.0;
                const Bands now = predict(spread, cmyk);
                for (int b = 0; step > 0 && b < kBands; ++b)
                    rises += now[b] > before[b];
                before = now;
            }
            EXPECT_EQ(rises, 0);
        }
    }
}

TEST(YuleNielsen, RecoversTheParametersOfAFormItPrinted)
{
    const std::array<double, kInks> spreading = {0.1, -0.05, 0.1, -0.06};
    const YuleNielsenFit truth = chosenModel(spreading);
    FormPatches form{};
    form.primary = truth.primary;
    for (int ink = 0; ink < kInks; ++ink)
        for (int t = 0; t < kTintLevels; ++t)
            form.tint[ink][t] = predict(truth, only(ink, kTintLevelPercent[t]));
    form.grey3 = predict(truth, {40, 40, 40, 0});
    form.grey4 = predict(truth, {40, 40, 40, 40});
    const YuleNielsenFit fit = fitYuleNielsen(form);
    for (int b = 0; b < kBands; ++b) {
        SCOPED_TRACE("band " + std::to_string(b));
        EXPECT_NEAR(fit.n[b], truth.n[b], 1e-6);
    }
    for (int ink = 0; ink < kInks; ++ink) {
        SCOPED_TRACE("ink " + std::to_string(ink));
        for (int node = 0; node < kTintLevels + 2; ++node)
            EXPECT_NEAR(fit.curveArea[ink][node], truth.curveArea[ink][node], 1e-7) << "node " << node;
        EXPECT_NEAR(fit.spreading[ink], spreading[ink], 1e-6);
    }
    EXPECT_LT(fit.tintResidualRms, 1e-9);
    EXPECT_EQ(fit.warnings, std::vector<std::string>{});

    const YuleNielsenFit again = fitYuleNielsen(form); // the same bits every time
    EXPECT_EQ(again.n, fit.n);
    EXPECT_EQ(again.curveSlope, fit.curveSlope);
    EXPECT_EQ(again.spreading, fit.spreading);
}

TEST(YuleNielsen, DegenerateFormsGiveFiniteModelsAndSayWhy)
{
    FormPatches form = syntheticPatches(1);
    auto spoil = [](Bands& p) {
        p[0] = 0.0;   // a dead band
        p[1] = -0.02; // a negative one
        p[20] = 0.5;  // paper equals every solid
    };
    std::for_each(form.primary.begin(), form.primary.end(), spoil);
    for (auto& tints : form.tint)
        std::for_each(tints.begin(), tints.end(), spoil);
    spoil(form.grey3);
    std::swap(form.tint[kMagenta][2], form.tint[kMagenta][4]); // 40 % and 60 % exchanged
    form.grey4 = form.primary[15];                             // a grey measured on the wrong patch

    const YuleNielsenFit fit = fitYuleNielsen(form);
    EXPECT_EQ(std::count_if(fit.n.begin(), fit.n.end(), [](double n) { return !(n >= kMinN && n <= kMaxN); }), 0);
    EXPECT_EQ(nonFinitePredictions(fit), 0);
    EXPECT_EQ(nonFinitePredictions(syntheticFit()), 0);
    EXPECT_THAT(fit.warnings, Contains(HasSubstr("were raised to it")).Times(1));
    EXPECT_THAT(fit.warnings, Contains(HasSubstr("The magenta tint at 60 %")).Times(1));
    EXPECT_THAT(fit.warnings, Contains(HasSubstr("four-colour grey")).Times(1));
    EXPECT_THAT(fit.warnings, Contains(HasSubstr("at its bound")));
}

TEST(MonotoneCurve, StaysWithinEachIntervalWhereACubicWouldOvershoot)
{
    // A steep rise into a plateau: an unlimited cubic overshoots both ends.
    const double x[] = {0, 0.1, 0.2, 0.4, 0.6, 0.7, 0.8, 0.9, 1};
    const double y[] = {0, 0.45, 0.46, 0.47, 0.9, 0.9, 0.95, 1, 1};
    double slope[9];
    monotoneSlopes(x, y, 9, slope);
    for (int k = 0; k < 8; ++k) {
        SCOPED_TRACE("interval " + std::to_string(k));
        EXPECT_EQ(monotoneCurveAt(x, y, slope, 9, x[k]), y[k]);
        double before = y[k];
        int outside = 0;
        for (int i = 1; i <= 100; ++i) {
            const double v = monotoneCurveAt(x, y, slope, 9, x[k] + (x[k + 1] - x[k]) * i / 100.0);
            outside += v < before || v > y[k + 1];
            before = v;
        }
        EXPECT_EQ(outside, 0);
    }
}
