// Measurement intake: where each patch of the test form goes, the check for a
// form read in swapped order, and the ordering of the tint lists.
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <algorithm>

using namespace testsupport;

namespace {

std::vector<double> keysOf(const std::vector<MathProfile::ColorPatch>& list, int channel)
{
    std::vector<double> keys;
    for (const auto& patch : list)
        keys.push_back(patch.channel[channel]);
    return keys;
}

MathProfile::ColorPatch tint(int channel, double coverage, double tag = 0.0)
{
    MathProfile::ColorPatch patch = {};
    patch.channel[channel] = coverage;
    patch.spectrum[0] = tag;
    return patch;
}

} // namespace

TEST(ReadData, EveryPatchOfTheFormLandsInItsPlace)
{
    const auto form = syntheticForm();
    RowTable rows(form);
    MathProfile profile("intake");
    profile.patchSlots[13].XYZ[1] = 77.0; // slots keep X, Y, Z and weights
    profile.readData(rows.rows());
    EXPECT_EQ(profile.patchSlots[13].XYZ[1], 77.0);
    const int slotSource[14] = {6, 8, 28, 20, 22, 24, 26, 42, 2, 12, 18, 44, 45, 1};
    for (int slot = 0; slot < 14; ++slot) {
        const auto& patch = profile.patchSlots[slot];
        EXPECT_EQ(std::vector<double>(patch.spectrum, patch.spectrum + 36), form[slotSource[slot]]) << slot;
        for (int c = 0; c < 7; ++c)
            EXPECT_EQ(patch.channel[c], c < 4 ? MathProfile::dithering[slotSource[slot]][c] : 0) << slot;
    }
    // Tints in reading order; the cyan list holds rows 0, 5, 10, 29, 30, 33, 37, 40.
    EXPECT_EQ(keysOf(profile.tintLists[0], 0), (std::vector<double>{100, 10, 90, 20, 80, 40, 60, 70}));
    EXPECT_EQ(profile.tintLists[0][3].spectrum[7], form[29][7]);
    for (int ink = 0; ink < 7; ++ink)
        EXPECT_EQ(profile.tintLists[ink].size(), ink < 4 ? 8u : 0u);
}

TEST(ReadData, SwappedHalvesAreExchangedBack)
{
    const auto form = syntheticForm(1);
    // 46 rows: rows 0-21 and 24-45 were read in swapped order; 22 and 23 stay.
    auto swapped = form;
    for (size_t i = 0; i <= 21; ++i)
        std::swap(swapped[i], swapped[i + 24]);
    RowTable rows(swapped);
    MathProfile profile("swapped");
    profile.readData(rows.rows());
    profile.readData(rows.rows()); // the second reading exchanges nothing
    for (int i = 0; i < 46; ++i)
        EXPECT_EQ(rows.row(i), form[i]) << "row " << i;

    // 47 rows: all 23 pairs, row 22 with row 46 included.
    auto longer = form;
    longer.push_back(std::vector<double>(36, 0.333));
    auto swappedLonger = longer;
    for (size_t i = 0; i <= 22; ++i)
        std::swap(swappedLonger[i], swappedLonger[i + 24]);
    RowTable longRows(swappedLonger);
    profile.readData(longRows.rows());
    for (int i = 0; i < 47; ++i)
        EXPECT_EQ(longRows.row(i), longer[i]) << "row " << i;

    // Only the first comparison true: no exchange.
    auto oneYellower = form;
    std::swap(oneYellower[0], oneYellower[24]);
    RowTable oneRows(oneYellower);
    profile.readData(oneRows.rows());
    EXPECT_EQ(oneRows.row(0), form[24]);
}

TEST(SortData, AscendingWholeRecordExchangesNotStable)
{
    MathProfile profile("sort");
    std::vector<MathProfile::ColorPatch> cyan, empty, withZero = {tint(6, 5), tint(6, 0), tint(6, 3)};
    for (double key : {100, 10, 90, 20, 80, 40, 60, 70})
        cyan.push_back(tint(0, key, key));
    profile.sortData(cyan);
    profile.sortData(empty);
    profile.sortData(withZero);
    EXPECT_EQ(keysOf(cyan, 0), (std::vector<double>{10, 20, 40, 60, 70, 80, 90, 100}));
    EXPECT_EQ(cyan.back().spectrum[0], 100.0) << "whole records move";
    EXPECT_EQ(keysOf(withZero, 6), (std::vector<double>{0, 3, 5}));
    // Equal keys are never exchanged with each other, but an exchange with a
    // third patch reverses them: 2a 2b 1 -> 1 2b 2a.
    std::vector<MathProfile::ColorPatch> ties = {tint(2, 2, 0.1), tint(2, 2, 0.2), tint(2, 1, 0.3)};
    profile.sortData(ties);
    EXPECT_EQ(ties[1].spectrum[0], 0.2);
    EXPECT_EQ(ties[2].spectrum[0], 0.1);
}

TEST(SortData, ReadingTwiceKeepsCopiesSideBySideUntilCleared)
{
    RowTable rows(syntheticForm());
    MathProfile profile("twice");
    profile.readData(rows.rows());
    profile.readData(rows.rows());
    profile.sortData(profile.tintLists[3]);
    EXPECT_EQ(keysOf(profile.tintLists[3], 3),
              (std::vector<double>{10, 10, 20, 20, 40, 40, 60, 60, 70, 70, 80, 80, 90, 90, 100, 100}));
    profile.clearTintLists();
    for (const auto& list : profile.tintLists)
        EXPECT_TRUE(list.empty());
}
