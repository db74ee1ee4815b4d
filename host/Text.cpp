// Escaped text.
#include "Text.h"

namespace veltmarquist {

namespace {

void appendByte(std::string& out, unsigned char byte)
{
    static const char digits[] = "0123456789abcdef";
    out += "\\x";
    out += digits[byte >> 4];
    out += digits[byte & 15];
}

void appendCodePoint(std::string& out, unsigned codePoint)
{
    const int digits = codePoint > 0xFFFF ? 8 : 4;
    out += digits == 8 ? "\\U" : "\\u";
    for (int shift = 4 * (digits - 1); shift >= 0; shift -= 4)
        out += "0123456789ABCDEF"[(codePoint >> shift) & 15];
}

} // namespace

std::size_t utf8SequenceAt(std::string_view text, std::size_t at, unsigned& codePoint)
{
    const unsigned char lead = static_cast<unsigned char>(text[at]);
    const std::size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : lead >= 0xC0 ? 2 : 0;
    if (length == 0 || lead > 0xF4 || at + length > text.size())
        return 0;
    codePoint = lead & (0x7Fu >> length);
    for (std::size_t next = 1; next < length; ++next) {
        const unsigned char byte = static_cast<unsigned char>(text[at + next]);
        if ((byte & 0xC0) != 0x80)
            return 0;
        codePoint = codePoint << 6 | (byte & 0x3Fu);
    }
    const unsigned shortest[] = {0, 0, 0x80, 0x800, 0x10000};
    if (codePoint < shortest[length] || codePoint > 0x10FFFF || (codePoint >= 0xD800 && codePoint <= 0xDFFF))
        return 0;
    return length;
}

bool reordersOrHides(unsigned c)
{
    return (c >= 0x202A && c <= 0x202E) || (c >= 0x2066 && c <= 0x2069) || c == 0x200E || c == 0x200F ||
           c == 0x061C || (c >= 0x200B && c <= 0x200D) || (c >= 0x2060 && c <= 0x2064) || c == 0xFEFF ||
           c == 0x00AD || c == 0x180E || c == 0x115F || c == 0x1160 || c == 0x3164 || c == 0xFFA0 ||
           (c >= 0xFFF9 && c <= 0xFFFB) || (c >= 0xE0000 && c <= 0xE007F);
}

std::string escapeControls(std::string_view text)
{
    std::string out;
    out.reserve(text.size());
    for (std::size_t at = 0; at < text.size();) {
        const unsigned char byte = static_cast<unsigned char>(text[at]);
        if (byte >= 0x20 && byte < 0x7F) {
            out += text[at++];
            continue;
        }
        if (byte == '\t' || byte == '\n' || byte == '\r') {
            out += byte == '\t' ? "\\t" : byte == '\n' ? "\\n" : "\\r";
            ++at;
            continue;
        }
        unsigned codePoint = 0;
        const std::size_t length = byte < 0x80 ? 0 : utf8SequenceAt(text, at, codePoint);
        if (length > 0 && codePoint > 0x9F && !reordersOrHides(codePoint)) {
            out.append(text, at, length);
            at += length;
        } else if (length > 0 && codePoint > 0x9F) {
            appendCodePoint(out, codePoint);
            at += length;
        } else {
            // A C0 or C1 control, DEL, or a byte that is not UTF-8.
            for (const std::size_t end = at + (length > 0 ? length : 1); at < end; ++at)
                appendByte(out, static_cast<unsigned char>(text[at]));
        }
    }
    return out;
}

bool isPlainText(std::string_view text)
{
    return escapeControls(text) == text;
}

} // namespace veltmarquist
