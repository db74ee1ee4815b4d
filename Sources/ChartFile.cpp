// Chart file conventions.
//
// Charts are tab-separated CGATS-style text. Every line written with std::endl
// ends in LF and flushes the stream; CR LF appears only where a header literal
// holds it ("IT8\r\n", "LGOROWLENGTH\t54\r\n", the multi-channel header), so a
// file mixes both line ends on purpose: profile builders that read these charts
// expect exactly these bytes. Doubles use the stream's default format, the
// same text as printf's %g with six significant digits.
#include "ChartFile.h"

#include "models/PrintModels.h"

#include <cmath>
#include <locale>
#include <sstream>
#include <stdexcept>

namespace chartfile {

void open(std::ofstream& stream, const char* path)
{
    stream.open(path, std::ios::out | std::ios::trunc | std::ios::binary);
    if (!stream.is_open())
        throw Exceptions(1);
    stream.imbue(std::locale::classic());
}

void writeXYZHeader(std::ostream& stream, int sets)
{
    stream << "IT8\r\nNUMBER_OF_SETS\t" << sets << std::endl;
    stream << "NUMBER_OF_FIELDS\t" << 8 << std::endl;
    stream << "BEGIN_DATA_FORMAT" << std::endl;
    stream << "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tXYZ_X\tXYZ_Y\tXYZ_Z\t" << std::endl;
    stream << "END_DATA_FORMAT" << std::endl;
    stream << "BEGIN_DATA" << std::endl;
}

void limitY(double XYZ[3])
{
    const double Y = XYZ[1];
    if (Y > 100.0) {
        XYZ[0] = XYZ[0] * 100.0 / Y;
        XYZ[2] = XYZ[2] * 100.0 / Y;
        XYZ[1] = 100.0;
    }
}

double cut(double value)
{
    return std::floor(value * 100.0) / 100.0;
}

void writeXYZLine(std::ostream& stream, int number, const double channel[4], const double XYZ[3])
{
    stream << number << '\t' << channel[0] << '\t' << channel[1] << '\t' << channel[2] << '\t' << channel[3]
           << '\t' << cut(XYZ[0]) << '\t' << cut(XYZ[1]) << '\t' << cut(XYZ[2]) << std::endl;
}

void finish(std::ofstream& stream)
{
    stream << "END_DATA" << std::endl;
    stream.close();
}

} // namespace chartfile

// ---- The same conventions for hosts that hold values -----------------------------------

namespace veltmarquist {

Triple limitToChartY(const Triple& XYZ)
{
    Triple limited = XYZ;
    chartfile::limitY(limited.data());
    return limited;
}

Triple chartXYZ(const Triple& XYZ)
{
    const Triple limited = limitToChartY(XYZ);
    return Triple{chartfile::cut(limited[0]), chartfile::cut(limited[1]), chartfile::cut(limited[2])};
}

std::string xyzChartText(const std::vector<Cmyk>& coverages, const std::vector<Triple>& XYZ)
{
    if (coverages.size() != XYZ.size())
        throw std::invalid_argument("an XYZ chart needs one X, Y, Z per coverage: " + std::to_string(coverages.size()) +
                                    " coverages, " + std::to_string(XYZ.size()) + " X, Y, Z");
    std::ostringstream stream;
    stream.imbue(std::locale::classic());
    chartfile::writeXYZHeader(stream, static_cast<int>(coverages.size()));
    for (size_t i = 0; i < coverages.size(); ++i) {
        Triple limited = limitToChartY(XYZ[i]);
        chartfile::writeXYZLine(stream, static_cast<int>(i) + 1, coverages[i].data(), limited.data());
    }
    stream << "END_DATA" << std::endl;
    return stream.str();
}

} // namespace veltmarquist
