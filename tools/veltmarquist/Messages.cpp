// Escaped one-line messages and the report's line writer.
#include "Messages.h"

#include "OutputFile.h"

#include <unistd.h>

#include <cerrno>

namespace veltmarquist {

namespace {

void appendEscaped(std::string& out, unsigned char byte)
{
    static const char digits[] = "0123456789abcdef";
    out += "\\x";
    out += digits[byte >> 4];
    out += digits[byte & 15];
}

// Length of the well-formed UTF-8 sequence at `at` (shortest form, no
// surrogates, at most U+10FFFF), or 0. Sets `codePoint`.
size_t sequenceAt(const std::string& text, size_t at, unsigned& codePoint)
{
    const unsigned char lead = static_cast<unsigned char>(text[at]);
    const size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : lead >= 0xC0 ? 2 : 0;
    if (length == 0 || lead > 0xF4 || at + length > text.size())
        return 0;
    codePoint = lead & (0x7Fu >> length);
    for (size_t next = 1; next < length; ++next) {
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

} // namespace

std::string escapeControls(const std::string& text)
{
    std::string out;
    out.reserve(text.size());
    for (size_t at = 0; at < text.size();) {
        const unsigned char byte = static_cast<unsigned char>(text[at]);
        if (byte >= 0x20 && byte < 0x7F) {
            out += text[at++];
        } else if (byte == '\t' || byte == '\n' || byte == '\r') {
            out += byte == '\t' ? "\\t" : byte == '\n' ? "\\n" : "\\r";
            ++at;
        } else {
            unsigned codePoint = 0;
            const size_t length = byte < 0x80 ? 0 : sequenceAt(text, at, codePoint);
            if (length > 0 && codePoint > 0x9F) {
                out.append(text, at, length);
                at += length;
            } else {
                // A C0 or C1 control, DEL, or a byte that is not UTF-8.
                for (const size_t end = at + (length > 0 ? length : 1); at < end; ++at)
                    appendEscaped(out, static_cast<unsigned char>(text[at]));
            }
        }
    }
    return out;
}

void printMessage(const char* kind, const std::string& message)
{
    const std::string line = std::string("veltmarquist: ") + kind + ": " + escapeControls(message) + "\n";
    writeFully(STDERR_FILENO, line.data(), line.size());
}

ReportBuffer::int_type ReportBuffer::overflow(int_type character)
{
    if (traits_type::eq_int_type(character, traits_type::eof()))
        return traits_type::not_eof(character);
    line_ += traits_type::to_char_type(character);
    if (line_.back() == '\n')
        emit();
    return character;
}

int ReportBuffer::sync()
{
    emit();
    return 0;
}

void ReportBuffer::emit()
{
    if (line_.empty())
        return;
    const bool ended = line_.back() == '\n';
    if (ended)
        line_.pop_back();
    const std::string text = escapeControls(line_) + (ended ? "\n" : "");
    line_.clear();
    if (readerGone_ || error_ != 0)
        return;
    const int failure = writeFully(descriptor_, text.data(), text.size());
    if (failure == EPIPE)
        readerGone_ = true;
    else
        error_ = failure;
}

} // namespace veltmarquist
