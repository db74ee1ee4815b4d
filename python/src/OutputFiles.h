// Files the module writes: each appears under its name only when complete
// and checked, the way the tool delivers its outputs, but without the tool's
// signal handlers (Python keeps its own: Ctrl-C is a KeyboardInterrupt); and
// the library's profiles, which write the charts that only their processes make.
#ifndef VELTMARQUIST_PYTHON_OUTPUTFILES_H
#define VELTMARQUIST_PYTHON_OUTPUTFILES_H

#include "LibraryBlock.h"

#include "VeltmarquistDLL.h"

#include <string>

namespace veltmarquist::python {

// A temporary file ".NAME.tmp-XXXXXX" beside the target (symbolic links
// followed), filled by write() or by the library, then renamed over the
// target by commit(). A replaced file keeps its mode; a read-only file is
// refused as the tool refuses it. A target that exists but is no regular file
// (a FIFO, /dev/null) is written into once the text is complete. Without
// commit() the temporary file is removed and the target stays untouched.
// Failures are ToolErrors of kind OutputUnwritable naming the path.
class AtomicFile {
public:
    explicit AtomicFile(std::string path);
    ~AtomicFile();
    AtomicFile(const AtomicFile&) = delete;
    AtomicFile& operator=(const AtomicFile&) = delete;

    const std::string& temporaryPath() const { return temporary_; }
    // The text, refused when its data holds a value that is not finite.
    void write(const std::string& text);
    // Checks a chart the library wrote into the temporary file: complete
    // (ends with END_DATA) and finite.
    void checkLibraryChart() const;
    void commit();

private:
    std::string path_, target_, temporary_;
    bool intoTarget_ = false; // a FIFO or a device: copied into, never replaced
    bool committed_ = false;
};

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

#endif // VELTMARQUIST_PYTHON_OUTPUTFILES_H
