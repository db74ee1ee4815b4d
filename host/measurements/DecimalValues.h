// Decimal numbers as written, turned into integers without binary rounding.
//
// A measurement file holds decimals ("0.8751", "87.51", "1.5e+01"); read as
// doubles, the same reading written on a 0-1 or a percent scale, or averaged
// over identical repeats, can land on either side of an exact half before it
// is rounded to the library's thousandths. These functions keep the digits
// exact: a value becomes a count of fine units (10^-decimals), and every
// division rounds once with a stated rule.
#ifndef VELTMARQUIST_MEASUREMENTS_DECIMALVALUES_H
#define VELTMARQUIST_MEASUREMENTS_DECIMALVALUES_H

#include <cstdint>
#include <optional>
#include <string_view>

namespace veltmarquist {

// `text` x 10^decimals as an integer: [+-]digits[.digits][(e|E)[+-]digits].
// Digits beyond the unit round to odd (the kept last digit is made odd when
// anything non-zero was cut), so that one later rounding to a coarser unit
// gives the same result as rounding the exact value. Nullopt when the text
// is not such a number or its magnitude reaches 10^15 units.
std::optional<std::int64_t> parseDecimal(std::string_view text, int decimals);

// numerator / denominator (denominator > 0), rounded to odd as above.
std::int64_t divideToOdd(std::int64_t numerator, std::int64_t denominator);

// numerator / denominator (denominator > 0), rounded half away from zero:
// the rule by which fine units become the library's thousandths.
std::int64_t divideRounded(std::int64_t numerator, std::int64_t denominator);

} // namespace veltmarquist

#endif // VELTMARQUIST_MEASUREMENTS_DECIMALVALUES_H
