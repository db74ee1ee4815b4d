// Exact decimal parsing and the two rounding rules.
#include "DecimalValues.h"

namespace veltmarquist {

namespace {

constexpr std::int64_t kLimit = 1000000000000000; // 10^15 units
constexpr int kMaxDigits = 18;                    // significant digits kept exactly in an int64

bool isDigit(char c)
{
    return c >= '0' && c <= '9';
}

std::int64_t power10(int exponent)
{
    std::int64_t value = 1;
    while (exponent-- > 0)
        value *= 10;
    return value;
}

} // namespace

std::int64_t divideToOdd(std::int64_t numerator, std::int64_t denominator)
{
    std::int64_t quotient = numerator / denominator;
    if (numerator % denominator != 0 && quotient % 2 == 0)
        quotient += numerator < 0 ? -1 : 1;
    return quotient;
}

std::int64_t divideRounded(std::int64_t numerator, std::int64_t denominator)
{
    const std::int64_t quotient = numerator / denominator, remainder = numerator % denominator;
    if (2 * (remainder < 0 ? -remainder : remainder) >= denominator)
        return quotient + (numerator < 0 ? -1 : 1);
    return quotient;
}

std::optional<std::int64_t> parseDecimal(std::string_view text, int decimals)
{
    size_t i = 0;
    const bool negative = i < text.size() && text[i] == '-';
    if (i < text.size() && (text[i] == '-' || text[i] == '+'))
        ++i;
    // Significant digits in `mantissa`, value = mantissa x 10^scale, `cut`
    // when a non-zero digit did not fit.
    std::int64_t mantissa = 0;
    int digits = 0, scale = 0, seen = 0;
    bool cut = false, fraction = false;
    for (; i < text.size() && (isDigit(text[i]) || (text[i] == '.' && !fraction)); ++i) {
        if (text[i] == '.') {
            fraction = true;
            continue;
        }
        ++seen;
        const int digit = text[i] - '0';
        if (digits == 0 && digit == 0) {
            scale -= fraction ? 1 : 0;
            continue;
        }
        if (digits < kMaxDigits) {
            mantissa = mantissa * 10 + digit;
            ++digits;
            scale -= fraction ? 1 : 0;
        } else {
            cut = cut || digit != 0;
            scale += fraction ? 0 : 1;
        }
    }
    if (seen == 0)
        return std::nullopt;
    if (i < text.size() && (text[i] == 'e' || text[i] == 'E')) {
        ++i;
        const bool negativeExponent = i < text.size() && text[i] == '-';
        if (i < text.size() && (text[i] == '-' || text[i] == '+'))
            ++i;
        int exponent = 0, exponentDigits = 0;
        for (; i < text.size() && isDigit(text[i]); ++i, ++exponentDigits)
            exponent = exponent < 10000 ? exponent * 10 + (text[i] - '0') : exponent;
        if (exponentDigits == 0)
            return std::nullopt;
        scale += negativeExponent ? -exponent : exponent;
    }
    if (i != text.size())
        return std::nullopt;
    if (mantissa == 0)
        return cut ? std::nullopt : std::optional<std::int64_t>(0);

    std::int64_t units = 0;
    const int shift = scale + decimals;
    if (shift >= 0) {
        if (shift > 15 || mantissa >= kLimit / power10(shift))
            return std::nullopt;
        units = mantissa * power10(shift); // exact; a cut digit lies above the unit only when shift > 0
        if (cut)
            return std::nullopt;
    } else if (-shift > kMaxDigits) {
        units = 1; // far below the unit, yet not zero
    } else {
        const std::int64_t divisor = power10(-shift);
        units = mantissa / divisor;
        if (mantissa % divisor != 0 || cut)
            units += units % 2 == 0 ? 1 : 0;
    }
    if (units >= kLimit)
        return std::nullopt;
    return negative ? -units : units;
}

} // namespace veltmarquist
