// Files of the tool: names derived from inputs, and CGATS text of the tool's
// own. Measurement files are read through MeasurementLoading.h, outputs go
// through OutputFile.h.
#ifndef VELTMARQUIST_TOOL_FILES_H
#define VELTMARQUIST_TOOL_FILES_H

#include "Cgats.h"

#include <string>

namespace veltmarquist {

// A CGATS.17 text of the tool's own (the reader's writer).
using CgatsTable = cgats::Document;
std::string cgatsText(const CgatsTable& table);

// "chart.txt" -> "chart"; "forms/press 4.cgats.txt" -> "press 4.cgats".
std::string fileStem(const std::string& path);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_FILES_H
