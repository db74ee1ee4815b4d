// JSON text for scripts.
#include "Json.h"

#include "Numbers.h"
#include "Text.h"

#include <cmath>
#include <cstdio>

namespace veltmarquist::json {

std::string quoted(std::string_view text)
{
    std::string out = "\"";
    for (size_t i = 0; i < text.size();) {
        unsigned codePoint = 0;
        const size_t length = static_cast<unsigned char>(text[i]) < 0x80 ? 1 : utf8SequenceAt(text, i, codePoint);
        if (length == 0) {
            out += "\xEF\xBF\xBD"; // U+FFFD for a byte that starts no character
            ++i;
            continue;
        }
        const unsigned char c = static_cast<unsigned char>(text[i]);
        if (c == '"' || c == '\\') {
            out += '\\';
            out += static_cast<char>(c);
        } else if (c < 0x20 || c == 0x7F) {
            char escaped[8];
            std::snprintf(escaped, sizeof escaped, "\\u%04x", c);
            out += escaped;
        } else {
            out.append(text.substr(i, length));
        }
        i += length;
    }
    return out + "\"";
}

void Writer::separate()
{
    if (afterKey_) {
        afterKey_ = false;
        return;
    }
    if (!first_.empty()) {
        if (!first_.back())
            text_ += ',';
        first_.back() = false;
    }
}

Writer& Writer::beginObject()
{
    separate();
    text_ += '{';
    first_.push_back(true);
    return *this;
}

Writer& Writer::endObject()
{
    text_ += '}';
    first_.pop_back();
    return *this;
}

Writer& Writer::beginArray()
{
    separate();
    text_ += '[';
    first_.push_back(true);
    return *this;
}

Writer& Writer::endArray()
{
    text_ += ']';
    first_.pop_back();
    return *this;
}

Writer& Writer::key(std::string_view name)
{
    separate();
    text_ += quoted(name) + ':';
    afterKey_ = true;
    return *this;
}

Writer& Writer::value(std::string_view text)
{
    separate();
    text_ += quoted(text);
    return *this;
}

Writer& Writer::value(double number)
{
    separate();
    text_ += std::isfinite(number) ? roundTripText(number) : "null";
    return *this;
}

Writer& Writer::value(long long number)
{
    separate();
    text_ += std::to_string(number);
    return *this;
}

Writer& Writer::value(bool flag)
{
    separate();
    text_ += flag ? "true" : "false";
    return *this;
}

Writer& Writer::null()
{
    separate();
    text_ += "null";
    return *this;
}

Writer& Writer::numbers(const std::vector<double>& values)
{
    beginArray();
    for (double v : values)
        value(v);
    return endArray();
}

} // namespace veltmarquist::json
