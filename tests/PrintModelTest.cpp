// Tint selection and the offset and gravure models on a realistic synthetic
// test form.
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>

using namespace testsupport;

namespace {

// A profile holding a read and ordered synthetic form.
class FormProfile : public ::testing::Test {
protected:
    void SetUp() override
    {
        profile.readData(rows.rows());
        for (int ink = 0; ink < 4; ++ink)
            profile.sortData(profile.tintLists[ink]);
    }
    const MathProfile::ColorPatch& slot(int i) const { return profile.patchSlots[i]; }
    const MathProfile::ColorPatch& sample() const { return profile.patchSlots[21]; }
    const MathProfile::ColorPatch& tintOf(int ink, double coverage) const
    {
        for (const auto& patch : profile.tintLists[ink])
            if (patch.channel[ink] == coverage)
                return patch;
        throw std::logic_error("no such tint");
    }
    static bool same(const MathProfile::ColorPatch& a, const MathProfile::ColorPatch& b)
    {
        return std::memcmp(&a, &b, sizeof a) == 0;
    }
    static bool sameSpectrum(const double* a, const double* b) { return std::memcmp(a, b, 36 * sizeof(double)) == 0; }

    RowTable rows{syntheticForm()};
    MathProfile profile{"model"};
};

} // namespace

TEST_F(FormProfile, SetSampleSelectsExactTints)
{
    profile.setSample(0, 70, 0, 0, 0, 0, 0);
    EXPECT_TRUE(same(slot(15), tintOf(1, 70)));
    EXPECT_EQ(sample().channel[1], 70.0);
    EXPECT_TRUE(sameSpectrum(sample().spectrum, tintOf(1, 70).spectrum)) << "one ink: the measured tint";
    for (int s : {14, 16, 17, 18, 19, 20})
        EXPECT_TRUE(same(slot(s), slot(13))) << "slot " << s << " holds the paper";

    profile.setSample(40, 40, 0, 0, 0, 0, 0);
    EXPECT_TRUE(same(slot(14), tintOf(0, 40)));
    EXPECT_TRUE(same(slot(15), tintOf(1, 40)));
    EXPECT_EQ(sample().channel[0], 40.0);
    EXPECT_EQ(sample().channel[1], 40.0);
    for (double band : sample().spectrum)
        EXPECT_EQ(band, 0.0) << "two inks: left to the model";

    profile.patchSlots[21].XYZ[0] = 12.5;
    profile.patchSlots[21].weight[3] = 0.5;
    for (double missing : {30.0, 39.5}) {
        profile.setSample(missing, 0, 0, 0, 0, 0, 0);
        EXPECT_TRUE(same(slot(14), slot(13))) << missing << " is not a measured step";
        EXPECT_EQ(sample().channel[0], 0.0);
        for (double band : sample().spectrum)
            EXPECT_EQ(band, 0.0);
    }
    EXPECT_EQ(sample().XYZ[0], 12.5) << "X, Y, Z and weights are left to the model";
    EXPECT_EQ(sample().weight[3], 0.5);

    profile.setSample(0, 0, 0, 0, 0, 0, 0);
    for (int s = 14; s <= 20; ++s)
        EXPECT_TRUE(same(slot(s), slot(13)));
}

TEST_F(FormProfile, SetSampleTakesTheFirstOfEqualCoverages)
{
    MathProfile::ColorPatch other = tintOf(3, 60);
    other.spectrum[0] = 0.999;
    profile.tintLists[3].push_back(other);
    profile.sortData(profile.tintLists[3]);
    profile.setSample(0, 0, 0, 60, 0, 0, 0);
    const auto& list = profile.tintLists[3];
    const auto first = std::find_if(list.begin(), list.end(), [](const auto& p) { return p.channel[3] == 60; });
    EXPECT_TRUE(same(slot(17), *first));
}

TEST_F(FormProfile, SetSampleWithZeroPercentPatchesTakesTheLastList)
{
    for (int ink = 0; ink < 7; ++ink) {
        MathProfile::ColorPatch zero = {};
        zero.spectrum[0] = 0.1 * (ink + 1);
        profile.tintLists[ink].insert(profile.tintLists[ink].begin(), zero);
    }
    profile.setSample(0, 0, 0, 0, 0, 0, 0);
    for (int ink = 0; ink < 7; ++ink)
        EXPECT_EQ(slot(14 + ink).spectrum[0], 0.1 * (ink + 1));
    EXPECT_EQ(sample().spectrum[0], 0.1 * 7) << "each later match overwrites the spectrum";
}

TEST_F(FormProfile, DotArea)
{
    EXPECT_EQ(profile.getDotarea(0.3, 0.5, 0.5), 0.0) << "solid equals paper";
    EXPECT_EQ(profile.getDotarea(0.5, 0.1, 0.9), 0.5);
    EXPECT_EQ(profile.getDotarea(0.05, 0.1, 0.9), 1.0) << "beyond the solid";
    EXPECT_EQ(profile.getDotarea(0.95, 0.1, 0.9), 0.0) << "brighter than the paper";
}

TEST_F(FormProfile, OffsetModelReproducesMeasuredPatches)
{
    // Paper, solids and overprints: every 0/100 combination is a primary.
    profile.setSample(0, 0, 0, 0, 0, 0, 0);
    profile.calcOffsetSample();
    EXPECT_TRUE(sameSpectrum(sample().spectrum, slot(13).spectrum));
    profile.setSample(100, 100, 100, 100, 0, 0, 0);
    profile.calcOffsetSample();
    EXPECT_TRUE(sameSpectrum(sample().spectrum, slot(10).spectrum));
    profile.setSample(0, 100, 100, 0, 0, 0, 0);
    profile.calcOffsetSample();
    EXPECT_TRUE(sameSpectrum(sample().spectrum, slot(0).spectrum));
    profile.setSample(0, 0, 0, 100, 0, 0, 0);
    profile.calcOffsetSample();
    EXPECT_TRUE(sameSpectrum(sample().spectrum, profile.tintLists[3].back().spectrum));

    // A single tint: W (1 - d) + S d = T wherever d is not clamped.
    profile.setSample(40, 0, 0, 0, 0, 0, 0);
    profile.calcOffsetSample();
    const auto& tint = tintOf(0, 40);
    const auto& solid = profile.tintLists[0].back();
    for (int j = 0; j < 36; ++j) {
        const double d = (tint.spectrum[j] - slot(13).spectrum[j]) / (solid.spectrum[j] - slot(13).spectrum[j]);
        if (d > 0.0 && d < 1.0) {
            EXPECT_NEAR(sample().spectrum[j], tint.spectrum[j], 1e-12) << "band " << j;
        }
    }
    MathProfile::ColorPatch check = sample();
    profile.spec2XYZ(&check);
    EXPECT_EQ(check.XYZ[1], sample().XYZ[1]) << "X, Y, Z belong to the predicted spectrum";
}

TEST_F(FormProfile, OffsetWeightsSumToOneInEveryBand)
{
    profile.grayDiffFactor[0] = 0.3;
    profile.grayDiffFactor[3] = -0.2;
    profile.setSample(70, 20, 40, 60, 0, 0, 0);
    profile.calcOffsetSample();
    for (int j = 0; j < 36; ++j) {
        double sum = 0.0;
        for (int s = 0; s <= 10; ++s)
            sum += slot(s).weight[j];
        sum += slot(13).weight[j];
        for (int ink = 0; ink < 4; ++ink)
            sum += profile.tintLists[ink].back().weight[j];
        EXPECT_NEAR(sum, 1.0, 1e-14) << "band " << j;
    }
}

TEST_F(FormProfile, OffsetExponentFollowsTheOtherInksCoverage)
{
    profile.grayDiffFactor[0] = 0.5;
    profile.coverageLimit = 200.0;
    auto cyanArea = [&](int j) {
        const auto& solid = profile.tintLists[0].back();
        return profile.getDotarea(tintOf(0, 40).spectrum[j], solid.spectrum[j], slot(13).spectrum[j]);
    };
    // M 100 + Y 100: the others cover exactly the limit, q = 1; magenta and
    // yellow have a dot area of 1, so slot 9 (C+M+Y) carries a_C alone.
    profile.setSample(40, 100, 100, 0, 0, 0, 0);
    profile.calcOffsetSample();
    for (int j = 0; j < 36; ++j)
        EXPECT_EQ(slot(9).weight[j], std::pow(cyanArea(j), 1.0 - 0.5 * std::sqrt(0.4))) << j;
    // M 40 + Y 60: q = 100 / 200.
    profile.setSample(40, 40, 60, 0, 0, 0, 0);
    profile.calcOffsetSample();
    for (int j = 0; j < 36; ++j) {
        const double withCyan = profile.tintLists[0].back().weight[j] + slot(1).weight[j] + slot(2).weight[j] +
                                slot(9).weight[j];
        EXPECT_NEAR(withCyan, std::pow(cyanArea(j), 1.0 - 0.5 * std::sqrt(0.5 * 0.4)), 1e-14) << j;
    }
}

TEST_F(FormProfile, OffsetModelWithoutAMeasuredInkUsesThePaper)
{
    profile.tintLists[3].clear();
    profile.setSample(100, 0, 0, 0, 0, 0, 0);
    profile.calcOffsetSample();
    EXPECT_TRUE(sameSpectrum(sample().spectrum, profile.tintLists[0].back().spectrum));
}

TEST_F(FormProfile, GravureOrdersAndExponents)
{
    profile.rgbFactor[0] = 0.9;
    profile.rgbFactor[1] = 0.8;
    profile.rgbFactor[2] = 0.7;
    const struct {
        void (MathProfile::*method)();
        int order[4];
    } methods[] = {{&MathProfile::calcGravureSampleCMYK, {0, 1, 2, 3}},
                   {&MathProfile::calcGravureSampleKCMY, {3, 0, 1, 2}},
                   {&MathProfile::calcGravureSampleYCMK, {2, 0, 1, 3}},
                   {&MathProfile::calcGravureSampleYMKC, {2, 1, 3, 0}},
                   {&MathProfile::calcGravureSampleYKMC, {2, 3, 1, 0}}};
    for (const auto& m : methods) {
        // First three inks of the order at 100 %, the fourth unprinted.
        double request[4] = {0, 0, 0, 0};
        for (int p = 0; p < 3; ++p)
            request[m.order[p]] = 100;
        profile.setSample(request[0], request[1], request[2], request[3], 0, 0, 0);
        (profile.*m.method)();
        const double* W = slot(13).spectrum;
        const double* T1 = slot(14 + m.order[0]).spectrum;
        const double* T2 = slot(14 + m.order[1]).spectrum;
        const double* T3 = slot(14 + m.order[2]).spectrum;
        for (int j = 0; j < 36; ++j) {
            const double expected = std::pow(T2[j] / W[j], 0.9) * T1[j] * std::pow(T3[j] / W[j], 0.9 * 0.8);
            EXPECT_EQ(sample().spectrum[j], expected) << "order " << m.order[0] << m.order[1] << " band " << j;
        }
        profile.setSample(0, 0, 0, 0, 0, 0, 0);
        (profile.*m.method)();
        EXPECT_TRUE(sameSpectrum(sample().spectrum, W)) << "nothing printed: the paper";
    }
}

TEST_F(FormProfile, GravureDefaultFactorsAndUnitFactors)
{
    profile.setSample(100, 100, 0, 0, 0, 0, 0);
    profile.calcGravureSampleCMYK();
    for (int j = 0; j < 36; ++j)
        EXPECT_EQ(sample().spectrum[j], std::pow(slot(15).spectrum[j] / slot(13).spectrum[j], 0.9) * slot(14).spectrum[j]);

    profile.rgbFactor[0] = profile.rgbFactor[1] = profile.rgbFactor[2] = 1.0;
    profile.setSample(40, 60, 20, 70, 0, 0, 0);
    profile.calcGravureSampleKCMY();
    const MathProfile::ColorPatch kcmy = sample();
    profile.calcGravureSampleYMKC();
    for (int j = 0; j < 36; ++j) {
        const double W = slot(13).spectrum[j];
        const double product = slot(14).spectrum[j] * (slot(15).spectrum[j] / W) * (slot(16).spectrum[j] / W) *
                               (slot(17).spectrum[j] / W);
        EXPECT_NEAR(kcmy.spectrum[j], product, 1e-15);
        EXPECT_NEAR(sample().spectrum[j], product, 1e-15);
    }
}
