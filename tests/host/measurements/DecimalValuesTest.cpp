// Exact decimals: what the digits say, rounded once.
#include "DecimalValues.h"

#include <gtest/gtest.h>

using namespace veltmarquist;

TEST(DecimalValues, ParsesDigitsAsWrittenAndRoundsToOddBelowTheUnit)
{
    const std::pair<const char*, std::optional<std::int64_t>> cases[] = {
        {"0.8751", 875100}, {"87.51", 87510000}, {"+1.5e+01", 15000000}, {"-0", 0}, {".5", 500000}, {"5.", 5000000},
        {"0.0004995", 499},    // 499.5 cut: 499 is odd already, and the thousandth stays below the half
        {"0.00050000001", 501}, // 500.00001: made odd, so the thousandth rounds up as the exact value does
        {"1e-30", 1}, {"-2.5E-7", -1}, {"123456789012345678901", std::nullopt}, {"1,5", std::nullopt},
        {"nan", std::nullopt}, {"1e", std::nullopt}, {"", std::nullopt}, {"-", std::nullopt}, {"0x10", std::nullopt},
    };
    for (const auto& [text, units] : cases)
        EXPECT_EQ(parseDecimal(text, 6), units) << text;
}
