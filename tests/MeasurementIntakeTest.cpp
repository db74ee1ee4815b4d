// Measurement intake: where each patch of the test form goes, the check for a
// form read in swapped order, and the ordering of the tint lists.
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <algorithm>

using namespace testsupport;

namespace {

std::vector<double> spectrumOf(const MathProfile::ColorPatch& patch)
{
    return std::vector<double>(patch.spectrum, patch.spectrum + 36);
}

std::vector<double> keysOf(const std::vector<MathProfile::ColorPatch>& list, int channel)
{
    std::vector<double> keys;
    for (const auto& patch : list)
        keys.push_back(patch.channel[channel]);
    return keys;
}

MathProfile::ColorPatch tint(int channel, double coverage, double tag)
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
    profile.readData(rows.rows());

    // Paper, overprints and greys: slot and source patch.
    const int slotSource[14] = {6, 8, 28, 20, 22, 24, 26, 42, 2, 12, 18, 44, 45, 1};
    for (int slot = 0; slot < 14; ++slot) {
        const int row = slotSource[slot];
        EXPECT_EQ(spectrumOf(profile.patchSlots[slot]), form[static_cast<size_t>(row)]) << "slot " << slot;
        for (int c = 0; c < 4; ++c)
            EXPECT_EQ(profile.patchSlots[slot].channel[c], MathProfile::dithering[row][c]) << "slot " << slot;
        for (int c = 4; c < 7; ++c)
            EXPECT_EQ(profile.patchSlots[slot].channel[c], 0.0);
    }
    // Tints in reading order, eight per ink.
    EXPECT_EQ(keysOf(profile.tintLists[0], 0), (std::vector<double>{100, 10, 90, 20, 80, 40, 60, 70}));
    const int cyanRows[8] = {0, 5, 10, 29, 30, 33, 37, 40};
    for (int i = 0; i < 8; ++i) {
        const auto& patch = profile.tintLists[0][static_cast<size_t>(i)];
        EXPECT_EQ(spectrumOf(patch), form[static_cast<size_t>(cyanRows[i])]);
        EXPECT_EQ(patch.XYZ[1], 0.0);
        EXPECT_EQ(patch.weight[0], 0.0);
    }
    for (int ink = 0; ink < 4; ++ink) {
        auto keys = keysOf(profile.tintLists[ink], ink);
        std::sort(keys.begin(), keys.end());
        EXPECT_EQ(keys, (std::vector<double>{10, 20, 40, 60, 70, 80, 90, 100})) << "ink " << ink;
    }
    for (int ink = 4; ink < 7; ++ink)
        EXPECT_TRUE(profile.tintLists[ink].empty());
}

TEST(ReadData, SlotsKeepTheirWeightsAndXYZ)
{
    RowTable rows(syntheticForm());
    MathProfile profile("keep");
    profile.patchSlots[13].XYZ[1] = 77.0;
    profile.patchSlots[0].weight[5] = 0.25;
    profile.readData(rows.rows());
    EXPECT_EQ(profile.patchSlots[13].XYZ[1], 77.0);
    EXPECT_EQ(profile.patchSlots[0].weight[5], 0.25);
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
    for (int i = 0; i < 46; ++i)
        EXPECT_EQ(rows.row(i), form[static_cast<size_t>(i)]) << "row " << i;
    EXPECT_EQ(spectrumOf(profile.patchSlots[13]), form[1]);

    // A second reading finds the rows in order and exchanges nothing.
    profile.readData(rows.rows());
    for (int i = 0; i < 46; ++i)
        EXPECT_EQ(rows.row(i), form[static_cast<size_t>(i)]) << "row " << i;

    // 47 rows: all 23 pairs are exchanged, row 22 with row 46 included.
    auto longer = form;
    longer.push_back(std::vector<double>(36, 0.333));
    auto swappedLonger = longer;
    for (size_t i = 0; i <= 22; ++i)
        std::swap(swappedLonger[i], swappedLonger[i + 24]);
    RowTable longRows(swappedLonger);
    MathProfile other("47");
    other.readData(longRows.rows());
    for (int i = 0; i < 47; ++i)
        EXPECT_EQ(longRows.row(i), longer[static_cast<size_t>(i)]) << "row " << i;
}

TEST(ReadData, OneYellowerRowIsNoSwap)
{
    auto form = syntheticForm();
    std::swap(form[0], form[24]); // only the first comparison holds
    RowTable rows(form);
    MathProfile profile("one");
    profile.readData(rows.rows());
    for (int i = 0; i < 46; ++i)
        EXPECT_EQ(rows.row(i), form[static_cast<size_t>(i)]);
}

TEST(SortData, OrdersByAscendingCoverage)
{
    MathProfile profile("sort");
    std::vector<MathProfile::ColorPatch> cyan;
    for (double key : {100, 10, 90, 20, 80, 40, 60, 70})
        cyan.push_back(tint(0, key, key));
    profile.sortData(cyan);
    EXPECT_EQ(keysOf(cyan, 0), (std::vector<double>{10, 20, 40, 60, 70, 80, 90, 100}));
    EXPECT_EQ(cyan.back().spectrum[0], 100.0) << "whole records move";

    std::vector<MathProfile::ColorPatch> three = {tint(4, 30, 0), tint(4, 10, 0), tint(4, 20, 0)};
    profile.sortData(three);
    EXPECT_EQ(keysOf(three, 4), (std::vector<double>{10, 20, 30}));

    std::vector<MathProfile::ColorPatch> empty, one = {tint(1, 50, 7)};
    profile.sortData(empty);
    profile.sortData(one);
    EXPECT_TRUE(empty.empty());
    EXPECT_EQ(one[0].channel[1], 50.0);

    std::vector<MathProfile::ColorPatch> withZero = {tint(6, 5, 0), tint(6, 0, 0), tint(6, 3, 0)};
    profile.sortData(withZero);
    EXPECT_EQ(withZero.front().channel[6], 0.0);
}

TEST(SortData, IsNotStable)
{
    // Equal keys are never exchanged with each other, but an exchange with a
    // third patch reverses them: 2a 2b 1 -> 1 2b 2a.
    MathProfile profile("unstable");
    std::vector<MathProfile::ColorPatch> list = {tint(2, 2, 0.1), tint(2, 2, 0.2), tint(2, 1, 0.3)};
    profile.sortData(list);
    EXPECT_EQ(list[0].spectrum[0], 0.3);
    EXPECT_EQ(list[1].spectrum[0], 0.2);
    EXPECT_EQ(list[2].spectrum[0], 0.1);
}

TEST(SortData, ReadingTwiceKeepsCopiesSideBySide)
{
    RowTable rows(syntheticForm());
    MathProfile profile("twice");
    profile.readData(rows.rows());
    profile.readData(rows.rows());
    for (int ink = 0; ink < 4; ++ink) {
        profile.sortData(profile.tintLists[ink]);
        const auto keys = keysOf(profile.tintLists[ink], ink);
        ASSERT_EQ(keys.size(), 16u);
        for (size_t i = 0; i < 16; i += 2)
            EXPECT_EQ(keys[i], keys[i + 1]);
        EXPECT_EQ(keys.back(), 100.0);
    }
    profile.clearTintLists();
    for (const auto& list : profile.tintLists)
        EXPECT_TRUE(list.empty());
}
