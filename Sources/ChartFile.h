// Chart file conventions shared by every chart writer: how a stream is opened,
// the XYZ chart layout, the Y limit and the two-decimal cut.
#ifndef VELTMARQUIST_CHARTFILE_H
#define VELTMARQUIST_CHARTFILE_H

#include "LiteralBuild.h"
#include "MathProfile.h"

#include <fstream>
#include <ostream>
#include <string>

namespace chartfile {

// Ends a chart line: LF, and with the plain writer a flush.
struct EndLine {};
constexpr EndLine endl{};

inline std::ostream& operator<<(std::ostream& stream, EndLine)
{
    return stream << std::endl;
}

// A chart file being written. The plain writer formats each value through
// the stream (classic locale) and flushes every line, as charts were always
// written; the fast one formats with std::to_chars into memory, the same
// text (%d, and %g with six significant digits), and writes the file once at
// finish(). Either way the file is opened first, so an unopenable path
// throws Exceptions(1) before any work is done.
class ChartStream {
public:
    explicit ChartStream(const char* path, bool plain = kLiteralBuild);

    ChartStream& operator<<(const char* text);
    ChartStream& operator<<(char c);
    ChartStream& operator<<(int value);
    ChartStream& operator<<(double value);
    ChartStream& operator<<(EndLine);

    // "END_DATA" and close; a failing close is not reported.
    void finish();

private:
    std::ofstream file_;
    std::string text_;
    bool plain_;
};

// Opens `path` for writing (truncating, bytes unchanged, classic locale so a
// host's decimal-comma locale cannot turn 0.5 into 0,5). Throws Exceptions(1)
// when the file cannot be opened; nothing is written then.
void open(std::ofstream& stream, const char* path);

// Header of the XYZ chart layout: "IT8" CR LF, the set count, 8 fields, the
// field names, up to "BEGIN_DATA".
template <typename Stream>
void writeXYZHeader(Stream& stream, int sets)
{
    stream << "IT8\r\nNUMBER_OF_SETS\t" << sets << endl;
    stream << "NUMBER_OF_FIELDS\t" << 8 << endl;
    stream << "BEGIN_DATA_FORMAT" << endl;
    stream << "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tXYZ_X\tXYZ_Y\tXYZ_Z\t" << endl;
    stream << "END_DATA_FORMAT" << endl;
    stream << "BEGIN_DATA" << endl;
}

// Limits Y to 100: when Y > 100, X and Z are scaled by 100 / Y (old Y,
// multiplied before dividing) and Y becomes 100. NaN is left alone.
void limitY(double XYZ[3]);

// Cuts a value toward minus infinity at the second decimal: floor(v * 100) / 100.
double cut(double value);

// Data line of the XYZ layout: number, C, M, Y, K, then the cut X, Y, Z,
// separated by TAB, no TAB at the end.
template <typename Stream>
void writeXYZLine(Stream& stream, int number, const double channel[4], const double XYZ[3])
{
    stream << number << '\t' << channel[0] << '\t' << channel[1] << '\t' << channel[2] << '\t' << channel[3]
           << '\t' << cut(XYZ[0]) << '\t' << cut(XYZ[1]) << '\t' << cut(XYZ[2]) << endl;
}

} // namespace chartfile

#endif // VELTMARQUIST_CHARTFILE_H
