// Files of the tool: measurement files read from disk with the tool's
// messages and warnings, and CGATS text of the tool's own. Outputs go
// through OutputFile.h.
#ifndef VELTMARQUIST_TOOL_FILES_H
#define VELTMARQUIST_TOOL_FILES_H

#include "Cgats.h"
#include "MeasurementFile.h"

#include <ostream>
#include <string>

namespace veltmarquist {

// Reads and parses a measurement file; errors become ToolErrors that name
// the file and line. Adds the warnings that need colorimetry: a paper with Y
// below 20, a paper darker than one of its solids.
MeasurementFile loadMeasurementFile(const std::string& path, const ReadOptions& options);

// The file's warnings, one line each: "veltmarquist: warning: PATH: ...".
void printWarnings(const MeasurementFile& file, const std::string& path);

// A CGATS.17 text of the tool's own (the reader's writer).
using CgatsTable = cgats::Document;
std::string cgatsText(const CgatsTable& table);

// "chart.txt" -> "chart"; "forms/press 4.cgats.txt" -> "press 4.cgats".
std::string fileStem(const std::string& path);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_FILES_H
