// Files of the tool: reading measurement files from disk and writing CGATS
// text of the tool's own. Outputs go through OutputFile.h.
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
