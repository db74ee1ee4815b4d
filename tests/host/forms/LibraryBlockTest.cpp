// The library's measurement block from spectra of other layouts, and
// values held as numbers taken as the reader takes them from a file.
#include "Failure.h"
#include "LibraryBlock.h"

#include <gtest/gtest.h>

#include <cmath>

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
    // widened as the library would.
    const MeasurementBlock mixed = buildBlock({{&narrow, &fine}, {&sixteen, &coarse}}, 100);
    const std::pair<size_t, int> ints[] = {{0, 100}, {2, 100}, {3, 110}, {35, 400}, {36, 220}, {41, 230}, {71, 500}};
    for (const auto& [index, value] : ints) // 380, 400, 410, 730 nm; 16 bands at 380 (takes 420), 430 (between), 730
        EXPECT_EQ(mixed.ints[index], value) << "int " << index;
    EXPECT_DOUBLE_EQ(libraryBands({&sixteen, &coarse})[5], 0.230);
}

TEST(LibraryBlock, NumbersAreTakenAsTheReaderTakesDecimals)
{
    // To the millionth first, then half away from zero: 0.1234995 is 0.1235 (not 0.123), as "0.1234995" in a file.
    const double bands[] = {0.1234995, 0.0005, -0.0005, 3.0};
    EXPECT_EQ(thousandthsOfFactors(bands, 4, "patch 1"), (std::vector<int>{124, 1, -1, 3000}));
    EXPECT_EQ(deviceUnitsOf(40.0000004, "C"), 40000000);
    EXPECT_EQ(deviceUnitsOf(-0.05, "C"), -50000); // the reader's noise margin
    const double refused[] = {3.0000006, -0.5000006, std::nan(""), 1e300};
    for (double value : refused)
        EXPECT_THROW(thousandthsOfFactors(&value, 1, "patch 1"), HostError) << value;
    for (double value : {100.0500006, -0.06, std::nan(""), -1e300})
        EXPECT_THROW(deviceUnitsOf(value, "C"), HostError) << value;
    try {
        thousandthsOfFactors(refused, 1, "patch 2");
    } catch (const HostError& error) {
        EXPECT_STREQ(error.what(), "patch 2 has reflectance 3.0000006 at 380 nm; reflectance factors lie from 0 to 1 "
                                   "(not percent)");
    }
}
