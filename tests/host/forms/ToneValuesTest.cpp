// Tone values as a densitometer reads them: each ink on its own channel, and
// the offset model's tints (which are the measured tints) read back the same.
#include "TestForm.h"
#include "ToneValues.h"

#include <gtest/gtest.h>

using namespace veltmarquist;

TEST(ToneValues, EachInkIsReadOnItsOwnChannel)
{
    // Paper 0.9 everywhere; a solid that absorbs only in one band; a tint
    // halfway there. A flat solid and tint for black (read on Y).
    const auto spectrum = [](int first, int last, double inside) {
        Spectrum s;
        s.fill(0.9);
        for (int b = first; b <= last; ++b)
            s[static_cast<size_t>(b)] = inside;
        return s;
    };
    const struct {
        int ink, first, last; // the band (380 + 10 b nm) the ink absorbs in
        double toneValue;
    } cases[] = {
        {0, 22, 32, 50.0}, // cyan: red filter, 600-700 nm
        {1, 12, 21, 50.0}, // magenta: green, 500-590 nm
        {2, 2, 11, 50.0},  // yellow: blue, 400-490 nm
        {3, 0, 35, 50.0},  // black: visual
        {0, 12, 21, 0.0},  // cyan's channel does not see a change in the green
        {2, 22, 32, 0.0},  // nor yellow's in the red
    };
    const Spectrum paper = spectrum(0, -1, 0.0);
    for (const auto& c : cases) {
        SCOPED_TRACE(std::string(densitometerChannel(c.ink)) + ", bands " + std::to_string(c.first) + "-" +
                     std::to_string(c.last));
        const Spectrum solid = spectrum(c.first, c.last, 0.1), tint = spectrum(c.first, c.last, 0.5);
        EXPECT_NEAR(toneValue(tint, paper, solid, c.ink), c.toneValue, 1e-9);
    }
}

TEST(ToneValues, TheOffsetModelsTintsReadAsTheMeasuredOnes)
{
    const FoundForm form = findTestForm(VELTMARQUIST_SAMPLES_DIR "/offset_form.txt", ReadOptions{});
    const MeasuredForm measured = form.measuredForm();
    const auto curves = toneValueCurves(measured, *fitOffsetModel(measured));
    for (size_t ink = 0; ink < 4; ++ink) {
        SCOPED_TRACE(densitometerChannel(static_cast<int>(ink)));
        const ToneValueCurve& curve = curves[ink];
        ASSERT_EQ(curve.nominal, (std::vector<double>{0, 10, 20, 40, 60, 70, 80, 90, 100}));
        ASSERT_EQ(curve.modelNominal, curve.nominal);
        EXPECT_DOUBLE_EQ(curve.measured.front(), 0.0);
        EXPECT_DOUBLE_EQ(curve.measured.back(), 100.0);
        for (size_t level = 0; level < curve.nominal.size(); ++level)
            EXPECT_NEAR(curve.modelled[level], curve.measured[level], 1e-9) << curve.nominal[level] << " %";
    }
}
