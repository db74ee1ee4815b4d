// Measurement intake: the check for a form read in swapped order, and the
// order of equal coverages in the tint lists. (Where each patch of the form
// goes is pinned by the golden charts, which read every slot and list.)
#include "TestSupport.h"

#include <gtest/gtest.h>

using namespace testsupport;

namespace {

// The form with rows i and i + 24 exchanged for i = 0 .. last.
std::vector<std::vector<double>> swapped(std::vector<std::vector<double>> form, size_t last)
{
    for (size_t i = 0; i <= last; ++i)
        std::swap(form[i], form[i + 24]);
    return form;
}

MathProfile::ColorPatch tint(int channel, double coverage, double tag)
{
    MathProfile::ColorPatch patch = {};
    patch.channel[channel] = coverage;
    patch.spectrum[0] = tag;
    return patch;
}

} // namespace

TEST(ReadData, SwappedHalvesAreExchangedBack)
{
    auto form = syntheticForm(1);
    MathProfile profile("swapped");
    // 46 rows: rows 0-21 and 24-45 were read in swapped order; 22 and 23 stay.
    RowTable rows(swapped(form, 21));
    profile.readData(rows.rows());
    profile.readData(rows.rows()); // the second reading exchanges nothing
    for (int i = 0; i < 46; ++i)
        EXPECT_EQ(rows.row(i), form[i]) << "row " << i;
    // 47 rows: all 23 pairs, row 22 with row 46 included.
    form.push_back(std::vector<double>(36, 0.333));
    RowTable longRows(swapped(form, 22));
    profile.readData(longRows.rows());
    for (int i = 0; i < 47; ++i)
        EXPECT_EQ(longRows.row(i), form[i]) << "47 rows, row " << i;
    // Only the first comparison true: no exchange.
    RowTable oneRows(swapped(form, 0));
    profile.readData(oneRows.rows());
    EXPECT_EQ(oneRows.row(0), form[24]);
}

TEST(SortData, EqualKeysAreReversedByAnExchangeWithAThird)
{
    // Equal keys are never exchanged with each other, but an exchange with a
    // third patch reverses them: 2a 2b 1 -> 1 2b 2a.
    MathProfile profile("sort");
    std::vector<MathProfile::ColorPatch> ties = {tint(2, 2, 0.1), tint(2, 2, 0.2), tint(2, 1, 0.3)};
    profile.sortData(ties);
    EXPECT_EQ(ties[0].spectrum[0], 0.3);
    EXPECT_EQ(ties[1].spectrum[0], 0.2);
    EXPECT_EQ(ties[2].spectrum[0], 0.1);
}
