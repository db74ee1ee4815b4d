// Files the module writes: each appears under its name only when complete
// and checked, the way the tool delivers its outputs, but without the tool's
// signal handlers (Python keeps its own: Ctrl-C is a KeyboardInterrupt).
#ifndef VELTMARQUIST_PYTHON_ATOMICFILE_H
#define VELTMARQUIST_PYTHON_ATOMICFILE_H

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

} // namespace veltmarquist::python

#endif // VELTMARQUIST_PYTHON_ATOMICFILE_H
