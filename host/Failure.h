// Failures of the host tier and the front ends, one kind per exit code.
//
// Every failure of host code is a HostError. The tool prints its message as
// one line on stderr and exits with the code of its kind; the Python package
// raises the exception class of the same kind. Scripts can so tell a missing
// patch from a full disk without reading the message.
#ifndef VELTMARQUIST_HOST_FAILURE_H
#define VELTMARQUIST_HOST_FAILURE_H

#include <stdexcept>
#include <string>

namespace veltmarquist {

enum class Failure {
    Internal = 1,         // an unexpected error inside the tool
    Usage = 2,            // bad command line or arguments
    InputUnreadable = 3,  // an input file cannot be opened or read
    InputSyntax = 4,      // an input file is not readable CGATS / IT8 text
    InputContent = 5,     // unknown spectral layout, missing fields, bad values
    MissingPatch = 6,     // a patch the calculation needs is not in the file
    DuplicatePatch = 7,   // one sample identifier names two different patches
    OutputUnwritable = 8, // an output file cannot be created or completed
    Calculation = 9       // the library rejected or failed the calculation
};

inline int exitCodeOf(Failure failure)
{
    return static_cast<int>(failure);
}

// A failure with a message that says what is wrong and where (file, line or
// patch). The message has no trailing full stop and no newline.
class HostError : public std::runtime_error {
public:
    HostError(Failure failure, const std::string& message) : std::runtime_error(message), failure_(failure) {}
    Failure failure() const { return failure_; }

private:
    Failure failure_;
};

} // namespace veltmarquist

#endif // VELTMARQUIST_HOST_FAILURE_H
