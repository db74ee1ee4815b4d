// Files of the tool: reading measurement files from disk, writing outputs so
// that no half-written file ever stands under the final name, and writing
// CGATS text of the tool's own.
#ifndef VELTMARQUIST_TOOL_FILES_H
#define VELTMARQUIST_TOOL_FILES_H

#include "MeasurementFile.h"

#include <string>
#include <utility>
#include <vector>

namespace veltmarquist {

// The whole file; InputUnreadable when it cannot be opened or read.
std::string readTextFile(const std::string& path);

// Reads and parses a measurement file; errors become ToolErrors that name
// the file and line.
MeasurementFile loadMeasurementFile(const std::string& path, const ReadOptions& options);

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

// A CGATS.17 text of the tool's own, written by LittleCMS's IT8 writer:
// keywords, field names, and rows of already formatted values.
struct CgatsTable {
    std::vector<std::pair<std::string, std::string>> keywords; // ORIGINATOR, DESCRIPTOR, ...
    std::vector<std::string> fields;
    std::vector<std::vector<std::string>> rows;
};
std::string cgatsText(const CgatsTable& table);

// "chart.txt" -> "chart"; "forms/press 4.cgats.txt" -> "press 4.cgats".
std::string fileStem(const std::string& path);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_FILES_H
