// A profile of the library for the module's charts that only the profile's
// processes write (multi-channel and converted charts), written atomically.
#ifndef VELTMARQUIST_PYTHON_LIBRARYPROFILE_H
#define VELTMARQUIST_PYTHON_LIBRARYPROFILE_H

#include "AtomicFile.h"

#include "LibraryBlock.h"

#include "VeltmarquistDLL.h"

#include <string>

namespace veltmarquist::python {

// A profile made by CreateMathProfile; the library destroys it itself after
// statuses 1 and 3, and the handle never destroys it twice.
class LibraryProfile {
public:
    explicit LibraryProfile(const std::string& name);
    ~LibraryProfile();
    LibraryProfile(const LibraryProfile&) = delete;
    LibraryProfile& operator=(const LibraryProfile&) = delete;

    // CalculateChart into the file's temporary file, which is then checked;
    // a status other than 0 is a ToolError with the tool's message.
    void calculate(PrintProcess process, const AtomicFile& output, MeasurementBlock& block);

private:
    void* handle_;
};

} // namespace veltmarquist::python

#endif // VELTMARQUIST_PYTHON_LIBRARYPROFILE_H
