// Chart file conventions shared by every chart writer: how a stream is opened,
// the XYZ chart layout, the Y limit and the two-decimal cut.
#ifndef VELTMARQUIST_CHARTFILE_H
#define VELTMARQUIST_CHARTFILE_H

#include "MathProfile.h"

#include <fstream>
#include <ostream>

namespace chartfile {

// Opens `path` for writing (truncating, bytes unchanged, classic locale so a
// host's decimal-comma locale cannot turn 0.5 into 0,5). Throws Exceptions(1)
// when the file cannot be opened; nothing is written then.
void open(std::ofstream& stream, const char* path);

// Header of the XYZ chart layout: "IT8" CR LF, the set count, 8 fields, the
// field names, up to "BEGIN_DATA".
void writeXYZHeader(std::ostream& stream, int sets);

// Limits Y to 100: when Y > 100, X and Z are scaled by 100 / Y (old Y,
// multiplied before dividing) and Y becomes 100. NaN is left alone.
void limitY(double XYZ[3]);

// Cuts a value toward minus infinity at the second decimal: floor(v * 100) / 100.
double cut(double value);

// Data line of the XYZ layout: number, C, M, Y, K, then the cut X, Y, Z,
// separated by TAB, no TAB at the end.
void writeXYZLine(std::ostream& stream, int number, const double channel[4], const double XYZ[3]);

// "END_DATA" and close; a failing close is not reported.
void finish(std::ofstream& stream);

} // namespace chartfile

#endif // VELTMARQUIST_CHARTFILE_H
