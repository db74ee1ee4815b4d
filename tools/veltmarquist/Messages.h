// What the tool prints: the report of a run and one-line messages on stderr.
// Text from a file or a path can hold anything; every character that would
// steer a terminal or reorder the line is shown escaped (Text.h).
#ifndef VELTMARQUIST_TOOL_MESSAGES_H
#define VELTMARQUIST_TOOL_MESSAGES_H

#include <streambuf>
#include <string>

namespace veltmarquist {

// One line on stderr: "veltmarquist: KIND: MESSAGE", the message escaped.
void printMessage(const char* kind, const std::string& message);

// The report's stream buffer: writes whole lines to a file descriptor, each
// escaped. When the reader of a pipe has gone (EPIPE, as with `| head`) the
// rest of the report is dropped quietly and the run goes on; the first other
// failure is kept for main to report.
class ReportBuffer : public std::streambuf {
public:
    explicit ReportBuffer(int descriptor) : descriptor_(descriptor) {}
    ~ReportBuffer() override { sync(); }
    ReportBuffer(const ReportBuffer&) = delete;
    ReportBuffer& operator=(const ReportBuffer&) = delete;

    // The error number of the first failed write other than EPIPE, or 0.
    int error() const { return error_; }

protected:
    int_type overflow(int_type character) override;
    int sync() override;

private:
    void emit();

    int descriptor_;
    std::string line_;
    int error_ = 0;
    bool readerGone_ = false;
};

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_MESSAGES_H
