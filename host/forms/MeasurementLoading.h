// Measurement files read from disk for a calculation: the reader's failures
// as HostErrors that name the file and line, and the warnings that need the
// library's colorimetry.
#ifndef VELTMARQUIST_FORMS_MEASUREMENTLOADING_H
#define VELTMARQUIST_FORMS_MEASUREMENTLOADING_H

#include "MeasurementFile.h"

#include <string>

namespace veltmarquist {

// Reads and parses a measurement file; errors become HostErrors that name
// the file and line. Adds to the file's warnings: a paper with Y below 20, a
// paper darker than one of its solids.
// `path` "-" reads standard input; a CxF3 file (Cxf3.h) is read as the CGATS
// text of its data.
constexpr const char* kStandardInput = "-";
MeasurementFile loadMeasurementFile(const std::string& path, const ReadOptions& options);

} // namespace veltmarquist

#endif // VELTMARQUIST_FORMS_MEASUREMENTLOADING_H
