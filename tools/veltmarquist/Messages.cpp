// Escaped one-line messages and the report's line writer.
#include "Messages.h"

#include "OutputFile.h"
#include "Text.h"

#include <unistd.h>

#include <cerrno>

namespace veltmarquist {

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
