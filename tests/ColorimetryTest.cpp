// Spectra to XYZ and CIELAB: the weighting table, the tabulated cube root and
// the companding function at its break points.
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>

namespace {

MathProfile::ColorPatch flatPatch(double value)
{
    MathProfile::ColorPatch patch = {};
    for (double& band : patch.spectrum)
        band = value;
    return patch;
}

// Correctly rounded single-precision cube root of i / 1024.
float correctlyRoundedCubeRoot(int i)
{
    return static_cast<float>(std::cbrt(static_cast<long double>(i) / 1024.0L));
}

} // namespace

TEST(Colorimetry, NormFactorFollowsTheAscendingSumOfTheYWeights)
{
    MathProfile profile("norm");
    EXPECT_EQ(profile.normFactor, 1.0005803365952251);
    double sum = 0.0;
    for (const auto& row : MathProfile::Gewichtsfaktoren_XYZ_D50)
        sum += row[1];
    EXPECT_EQ(sum, 99.94200000000001);
}

TEST(Colorimetry, PerfectWhiteAndBlackSpectra)
{
    MathProfile profile("white");
    MathProfile::ColorPatch white = flatPatch(1.0);
    white.channel[2] = 42.0;
    profile.spec2XYZ(&white);
    EXPECT_EQ(white.XYZ[0], 96.44793980508693);
    EXPECT_EQ(white.XYZ[1], 99.99999999999999);
    EXPECT_EQ(white.XYZ[2], 82.48584178823715);
    EXPECT_EQ(white.channel[2], 42.0) << "only XYZ changes";
    EXPECT_EQ(white.spectrum[0], 1.0);

    MathProfile::ColorPatch black = flatPatch(0.0);
    profile.spec2XYZ(&black);
    EXPECT_EQ(black.XYZ[0], 0.0);
    EXPECT_EQ(black.XYZ[1], 0.0);
    EXPECT_EQ(black.XYZ[2], 0.0);
    const MathProfile::lab lab = profile.XYZ2LAB({0.0, 0.0, 0.0});
    EXPECT_EQ(lab.L, 0.0);
    EXPECT_EQ(lab.a, 0.0);
    EXPECT_EQ(lab.b, 0.0);
}

TEST(Colorimetry, IccWhiteIsNeutral)
{
    MathProfile profile("d50");
    const MathProfile::lab lab = profile.XYZ2LAB({0.9642, 1.0, 0.8249});
    EXPECT_EQ(lab.L, 100.0);
    EXPECT_EQ(lab.a, 0.0);
    EXPECT_EQ(lab.b, 0.0);
}

TEST(Colorimetry, CubeRootTableTellingRows)
{
    const auto& table = MathProfile::cuberoot_samples;
    ASSERT_EQ(table.size(), 1025u);
    EXPECT_EQ(table[0], 0.0f);
    EXPECT_EQ(table[1024], 1.0f);
    EXPECT_EQ(table[512], 0.7937005162239075);
    // The nine-decimal rounding differs from the correctly rounded float cube
    // root at exactly these indices, by one unit in the last place.
    const int differing[] = {37, 86, 135, 285, 339, 555, 787, 804};
    int found = 0;
    for (int i = 0; i <= 1024; ++i) {
        const float stored = table[static_cast<size_t>(i)];
        const float exact = correctlyRoundedCubeRoot(i);
        if (stored != exact) {
            ++found;
            EXPECT_TRUE(std::find(std::begin(differing), std::end(differing), i) != std::end(differing))
                << "index " << i;
            EXPECT_TRUE(std::nextafter(exact, 2.0f) == stored || std::nextafter(exact, -2.0f) == stored)
                << "index " << i;
        }
        if (i > 0) {
            EXPECT_GT(stored, table[static_cast<size_t>(i) - 1]) << "table ascends";
        }
    }
    EXPECT_EQ(found, 8);
}

TEST(Colorimetry, CompandingBreakPoints)
{
    MathProfile profile("f");
    // Linear branch up to and including 0.008856, also for NaN.
    EXPECT_EQ(profile.icc_f(0.008856), 0.2068927064827586);
    EXPECT_EQ(profile.icc_f(0.0), 16.0 / 116.0);
    EXPECT_EQ(profile.icc_f(-1.0), 7.787 * -1.0 + 16.0 / 116.0);
    EXPECT_TRUE(std::isnan(profile.icc_f(std::nan(""))));
    // The next larger double takes the table branch: v = t * 1024 in float.
    const double next = std::nextafter(0.008856, 1.0);
    const float v = static_cast<float>(next * 1024.0);
    const float f = v - 9.0f;
    const double expected =
        (1.0 - f) * MathProfile::cuberoot_samples[9] + static_cast<double>(f * MathProfile::cuberoot_samples[10]);
    EXPECT_EQ(profile.icc_f(next), expected);
    // Table samples themselves, not the double cube root.
    EXPECT_EQ(profile.icc_f(0.5), 0.7937005162239075);
    EXPECT_NE(profile.icc_f(0.5), std::cbrt(0.5));
    EXPECT_EQ(profile.icc_f(1.0), 1.0);
    // Just below 1 the float product rounds to 1024: still the last sample.
    EXPECT_EQ(profile.icc_f(std::nextafter(1.0, 0.0)), 1.0);
    // Above 1 the power function.
    EXPECT_EQ(profile.icc_f(2.0), std::pow(2.0, 1.0 / 3.0));
}

