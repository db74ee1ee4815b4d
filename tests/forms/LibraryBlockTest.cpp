// The library's measurement block and rows, from spectra of other layouts.
#include "LibraryBlock.h"

#include <gtest/gtest.h>

using namespace veltmarquist;

TEST(LibraryBlock, OtherLayoutsAreWidenedAsTheLibraryWould)
{
    const SpectralLayout narrow{400, 10, 31}, sixteen{400, 20, 16};
    std::vector<int> fine(31), coarse(16);
    for (int j = 0; j < 31; ++j)
        fine[j] = 100 + 10 * j;
    for (int j = 0; j < 16; ++j)
        coarse[j] = 200 + 20 * j;
    // 400-700 nm in 10 nm steps, alone (bands outside repeat the first and last one) and mixed with 16 bands
    // widened as the library would, as they are in the rows of the class methods.
    const MeasurementBlock mixed = buildBlock({{&narrow, &fine}, {&sixteen, &coarse}}, 100);
    RowTable rows(buildBlock({{&sixteen, &coarse}}));
    const std::pair<size_t, int> ints[] = {{0, 100}, {2, 100}, {3, 110}, {35, 400}, {36, 220}, {41, 230}, {71, 500}};
    for (const auto& [index, value] : ints) // 380, 400, 410, 730 nm; 16 bands at 380 (takes 420), 430 (between), 730
        EXPECT_EQ(mixed.ints[index], value) << "int " << index;
    EXPECT_DOUBLE_EQ(rows.rows()[0][5], 0.230);
    EXPECT_EQ(rows.rows()[1], nullptr);
}
