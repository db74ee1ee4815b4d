// Tint selection, an ink without tints in the offset model, and the five
// gravure ink orders, on a realistic synthetic test form. (The models' numbers
// at the golden form's fitted values are pinned by the golden charts.)
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>

using namespace testsupport;

namespace {

class FormProfile : public ::testing::Test {
protected:
    void SetUp() override
    {
        profile.readData(rows.rows());
        for (int ink = 0; ink < 4; ++ink)
            profile.sortData(profile.tintLists[ink]);
    }
    const MathProfile::ColorPatch& slot(int i) const { return profile.patchSlots[i]; }
    const double* predicted() const { return profile.patchSlots[21].spectrum; }
    const MathProfile::ColorPatch& tintOf(int ink, double coverage) const
    {
        for (const auto& patch : profile.tintLists[ink])
            if (patch.channel[ink] == coverage)
                return patch;
        throw std::logic_error("no such tint");
    }
    static bool same(const void* a, const void* b, size_t size = sizeof(MathProfile::ColorPatch))
    {
        return std::memcmp(a, b, size) == 0;
    }
    static constexpr size_t kSpectrum = 36 * sizeof(double);

    RowTable rows{syntheticForm()};
    MathProfile profile{"model"};
};

} // namespace

TEST_F(FormProfile, SetSampleSelectsExactTints)
{
    profile.setSample(0, 70, 0, 0, 0, 0, 0);
    EXPECT_TRUE(same(&slot(15), &tintOf(1, 70)));
    EXPECT_TRUE(same(predicted(), tintOf(1, 70).spectrum, kSpectrum)) << "one ink: the measured tint";
    EXPECT_TRUE(same(&slot(14), &slot(13))) << "unprinted channels hold the paper";
    EXPECT_TRUE(same(&slot(20), &slot(13))) << "unprinted channels hold the paper";

    profile.setSample(40, 40, 0, 0, 0, 0, 0);
    EXPECT_TRUE(same(&slot(14), &tintOf(0, 40)));
    EXPECT_TRUE(same(&slot(15), &tintOf(1, 40)));
    EXPECT_EQ(predicted()[10], 0.0) << "two inks: the spectrum is left to the model";

    for (double missing : {30.0, 39.5}) {
        SCOPED_TRACE(missing);
        profile.setSample(missing, 0, 0, 0, 0, 0, 0);
        EXPECT_TRUE(same(&slot(14), &slot(13))) << "no measured step: unprinted";
        EXPECT_EQ(slot(21).channel[0], 0.0);
    }

    // Two tints of one coverage: the first in the list's order is selected.
    MathProfile::ColorPatch other = tintOf(3, 60);
    other.spectrum[0] = 0.999;
    profile.tintLists[3].push_back(other);
    profile.sortData(profile.tintLists[3]);
    profile.setSample(0, 0, 0, 60, 0, 0, 0);
    EXPECT_TRUE(same(&slot(17), &tintOf(3, 60)));
}

TEST_F(FormProfile, ZeroPercentPatchesAllMatchAndTheLastListWins)
{
    for (int ink = 0; ink < 7; ++ink) {
        MathProfile::ColorPatch zero = {};
        zero.spectrum[0] = ink + 1.0;
        profile.tintLists[ink].insert(profile.tintLists[ink].begin(), zero);
    }
    profile.setSample(0, 0, 0, 0, 0, 0, 0);
    EXPECT_EQ(slot(14).spectrum[0], 1.0);
    EXPECT_EQ(slot(20).spectrum[0], 7.0);
    EXPECT_EQ(predicted()[0], 7.0);
}

TEST_F(FormProfile, OffsetModelTakesThePaperAsTheSolidOfAnInkWithoutTints)
{
    profile.tintLists[3].clear();
    profile.setSample(100, 0, 0, 0, 0, 0, 0);
    profile.calcOffsetSample();
    EXPECT_TRUE(same(predicted(), profile.tintLists[0].back().spectrum, kSpectrum)) << "cyan solid alone";
}

TEST_F(FormProfile, GravureOrdersAndExponents)
{
    profile.rgbFactor[1] = 0.8;
    const struct {
        void (MathProfile::*method)();
        int order[3];
    } methods[] = {{&MathProfile::calcGravureSampleCMYK, {0, 1, 2}}, {&MathProfile::calcGravureSampleKCMY, {3, 0, 1}},
                   {&MathProfile::calcGravureSampleYCMK, {2, 0, 1}}, {&MathProfile::calcGravureSampleYMKC, {2, 1, 3}},
                   {&MathProfile::calcGravureSampleYKMC, {2, 3, 1}}};
    for (const auto& m : methods) {
        SCOPED_TRACE("inks " + std::to_string(m.order[0]) + std::to_string(m.order[1]) + std::to_string(m.order[2]));
        // The first three inks of the order at 100 %, the fourth unprinted.
        double request[4] = {0, 0, 0, 0};
        for (int ink : m.order)
            request[ink] = 100;
        profile.setSample(request[0], request[1], request[2], request[3], 0, 0, 0);
        (profile.*m.method)();
        const double *W = slot(13).spectrum, *T1 = slot(14 + m.order[0]).spectrum,
                     *T2 = slot(14 + m.order[1]).spectrum, *T3 = slot(14 + m.order[2]).spectrum;
        for (int j = 0; j < 36; ++j)
            EXPECT_EQ(predicted()[j], std::pow(T2[j] / W[j], 0.9) * T1[j] * std::pow(T3[j] / W[j], 0.9 * 0.8))
                << "band " << j;
        profile.setSample(0, 0, 0, 0, 0, 0, 0);
        (profile.*m.method)();
        EXPECT_TRUE(same(predicted(), W, kSpectrum)) << "nothing printed: the paper";
    }
}
