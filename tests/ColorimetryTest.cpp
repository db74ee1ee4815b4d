// Spectra to XYZ and CIELAB: the weighting sum, the tabulated cube root and
// the companding function at its break points.
#include "TestSupport.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <charconv>
#include <cmath>

using ::testing::AnyOf;

TEST(Colorimetry, ReferenceSpectraAndWhites)
{
    MathProfile profile("white");
    // The Y weights summed from 380 nm upward give 99.94200000000001.
    EXPECT_EQ(profile.normFactor, 1.0005803365952251);
    MathProfile::ColorPatch white = {}, black = {};
    std::fill(std::begin(white.spectrum), std::end(white.spectrum), 1.0);
    white.channel[2] = 42.0;
    profile.spec2XYZ(&white);
    profile.spec2XYZ(&black);
    EXPECT_EQ(white.XYZ[0], 96.44793980508693);
    EXPECT_EQ(white.XYZ[1], 99.99999999999999);
    EXPECT_EQ(white.XYZ[2], 82.48584178823715);
    EXPECT_EQ(white.channel[2], 42.0) << "only X, Y, Z change";
    EXPECT_EQ(black.XYZ[1], 0.0);

    const MathProfile::lab zero = profile.XYZ2LAB({0.0, 0.0, 0.0});
    const MathProfile::lab d50 = profile.XYZ2LAB({0.9642, 1.0, 0.8249});
    EXPECT_EQ(zero.L, 0.0);
    EXPECT_EQ(zero.a, 0.0);
    EXPECT_EQ(zero.b, 0.0);
    EXPECT_EQ(d50.L, 100.0);
    EXPECT_EQ(d50.a, 0.0);
    EXPECT_EQ(d50.b, 0.0);
}

TEST(Colorimetry, CubeRootTableTellingRows)
{
    const auto& table = MathProfile::cuberoot_samples;
    EXPECT_EQ(table[0], 0.0f);
    EXPECT_EQ(table[1024], 1.0f);
    EXPECT_EQ(table[512], 0.7937005162239075);
    // Rounding to nine decimals first differs from the correctly rounded
    // float cube root at exactly these indices, by one unit in the last place.
    const int differing[] = {37, 86, 135, 285, 339, 555, 787, 804};
    std::vector<int> found;
    for (int i = 0; i <= 1024; ++i) {
        const float stored = table[static_cast<size_t>(i)];
        const float exact = static_cast<float>(std::cbrt(static_cast<long double>(i) / 1024.0L));
        if (stored != exact) {
            found.push_back(i);
            EXPECT_THAT(stored, AnyOf(std::nextafter(exact, 2.0f), std::nextafter(exact, -2.0f))) << i;
        }
    }
    EXPECT_EQ(found, std::vector<int>(std::begin(differing), std::end(differing)));
    // The compile-time table is the rule's: cbrt in long double, nine decimals as text, read back as a float.
    for (int i = 0; i <= 1024; ++i) {
        char text[32];
        const auto printed = std::to_chars(text, text + sizeof text, std::cbrt(static_cast<long double>(i) / 1024.0L),
                                           std::chars_format::fixed, 9);
        float value = 0.0f;
        std::from_chars(text, printed.ptr, value, std::chars_format::fixed);
        EXPECT_EQ(table[static_cast<size_t>(i)], value) << i;
    }
}

TEST(Colorimetry, CompandingBreakPoints)
{
    MathProfile profile("f");
    EXPECT_EQ(profile.icc_f(0.008856), 0.2068927064827586) << "linear up to and including the break";
    EXPECT_TRUE(std::isnan(profile.icc_f(std::nan("")))) << "NaN takes the linear branch";
    // The next double takes the table: v = t * 1024 in float, f = v - i in float.
    const double next = std::nextafter(0.008856, 1.0);
    const float v = static_cast<float>(next * 1024.0);
    const float f = v - 9.0f;
    const auto& table = MathProfile::cuberoot_samples;
    EXPECT_EQ(profile.icc_f(next), (1.0 - f) * table[9] + static_cast<double>(f * table[10]));
    EXPECT_EQ(profile.icc_f(0.5), 0.7937005162239075) << "the table sample, not cbrt(0.5)";
    EXPECT_EQ(profile.icc_f(1.0), 1.0);
    EXPECT_EQ(profile.icc_f(std::nextafter(1.0, 0.0)), 1.0) << "rounds to the last sample";
    EXPECT_EQ(profile.icc_f(2.0), std::pow(2.0, 1.0 / 3.0));
}
