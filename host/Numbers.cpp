// Locale-free number text through std::to_chars.
#include "Numbers.h"

#include <charconv>
#include <cmath>

namespace veltmarquist {

namespace {

std::string written(const char* begin, const char* end)
{
    std::string text(begin, end);
    // A negative value that shows as zero is zero.
    if (text[0] == '-' && text.find_first_not_of("-0.") == std::string::npos)
        text.erase(0, 1);
    return text;
}

std::string nonFinite(double value)
{
    return std::isnan(value) ? "nan" : value > 0 ? "inf" : "-inf";
}

} // namespace

std::string roundTripText(double value)
{
    if (!std::isfinite(value))
        return nonFinite(value);
    char text[32];
    const auto result = std::to_chars(text, text + sizeof text, value);
    return written(text, result.ptr);
}

std::string fixedText(double value, int decimals)
{
    if (!std::isfinite(value))
        return nonFinite(value);
    char text[400]; // 1e308 in fixed notation
    const auto result = std::to_chars(text, text + sizeof text, value, std::chars_format::fixed, decimals);
    return written(text, result.ptr);
}

std::string signedFixedText(double value, int decimals)
{
    const std::string out = fixedText(value, decimals);
    return out[0] == '-' || out.find_first_not_of("0.") == std::string::npos ? out : "+" + out;
}

std::string shortText(double value)
{
    if (!std::isfinite(value))
        return nonFinite(value);
    char text[32];
    const auto result = std::to_chars(text, text + sizeof text, value, std::chars_format::general, 6);
    return written(text, result.ptr);
}

} // namespace veltmarquist
