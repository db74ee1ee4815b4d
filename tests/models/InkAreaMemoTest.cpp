// Remembered d^e rows: the bits std::pow gives, kept apart by every bit of
// their arguments (signed zeros, NaN payloads, neighbouring doubles).
#include "models/FourColourKernels.h"
#include "models/InkAreaMemo.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <limits>
#include <random>

using namespace veltmarquist::models;

namespace {

bool sameBits(const double* a, const double* b)
{
    return std::memcmp(a, b, kBands * sizeof(double)) == 0;
}

} // namespace

TEST(InkAreaMemo, GivesThePowerOfEveryDistinctRowAndOnlyComputesItOnce)
{
    std::mt19937 random(17);
    std::uniform_real_distribution<double> unit(0.0, 1.0);
    std::vector<std::array<double, kBands>> dots(5);
    for (auto& row : dots)
        for (double& d : row)
            d = unit(random);
    dots[1] = dots[0];
    dots[1][35] = std::nextafter(dots[0][35], 2.0); // one band one unit apart
    dots[2] = dots[0];
    dots[2][0] = 0.0;
    dots[3] = dots[2];
    dots[3][0] = -0.0; // pow(-0, e) keeps the sign for odd integers: the memo must too
    dots[4] = dots[0];
    dots[4][7] = std::numeric_limits<double>::quiet_NaN();
    const double exponents[] = {1.0, 0.731, std::nextafter(0.731, 1.0), 3.0, -0.2};

    InkAreaMemo memo;
    for (int pass = 0; pass < 3; ++pass)
        for (const auto& row : dots)
            for (double e : exponents) {
                double expected[kBands];
                inkAreas(row.data(), e, expected);
                EXPECT_TRUE(sameBits(memo.areas(row.data(), e), expected)) << "pass " << pass << ", exponent " << e;
            }
    EXPECT_EQ(memo.rows(), dots.size() * std::size(exponents)) << "each row once, whatever the passes";
    // A remembered row stays where it was while more are added.
    const double* first = memo.areas(dots[0].data(), 1.0);
    for (int i = 0; i < 1000; ++i) {
        std::array<double, kBands> row{};
        row[0] = i;
        memo.areas(row.data(), 0.5);
    }
    EXPECT_EQ(memo.areas(dots[0].data(), 1.0), first);
}
