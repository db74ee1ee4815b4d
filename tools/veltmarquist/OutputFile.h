// Outputs of the tool: no half-written file ever stands under the final name.
#ifndef VELTMARQUIST_TOOL_OUTPUTFILE_H
#define VELTMARQUIST_TOOL_OUTPUTFILE_H

#include <string>

namespace veltmarquist {

// An output that appears only when complete. The constructor creates a
// temporary file in the target's folder (so that the final rename stays on
// one file system); writers fill the temporary file, and commit() renames it
// over the target. Without commit the temporary file is removed.
class PendingOutput {
public:
    explicit PendingOutput(std::string path); // OutputUnwritable when the folder cannot take it
    ~PendingOutput();
    PendingOutput(const PendingOutput&) = delete;
    PendingOutput& operator=(const PendingOutput&) = delete;

    const std::string& path() const { return path_; }
    const std::string& temporaryPath() const { return temporary_; }

    // Writes `text` to the temporary file (for the tool's own files).
    void write(const std::string& text);
    // Checks that the temporary file is complete: a library chart ends with
    // "END_DATA" and a newline. The library does not see write errors (a
    // full disk, say), so this is where they surface.
    void expectCompleteChart() const;
    void commit();

private:
    std::string path_;
    std::string temporary_;
    bool committed_ = false;
};

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_OUTPUTFILE_H
