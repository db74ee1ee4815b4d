// Chart file conventions.
//
// Charts are tab-separated CGATS-style text. Every line ends in LF; CR LF
// appears only where a header literal holds it ("IT8\r\n", "LGOROWLENGTH\t54\r\n",
// the multi-channel header), so a file mixes both line ends on purpose:
// profile builders that read these charts expect exactly these bytes. Doubles
// use the stream's default format, the same text as printf's %g with six
// significant digits.
#include "ChartFile.h"

#include "models/PrintModels.h"

#include <charconv>
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

ChartStream::ChartStream(const char* path, bool plain) : plain_(plain)
{
    open(file_, path);
}

ChartStream& ChartStream::operator<<(const char* text)
{
    if (plain_)
        file_ << text;
    else
        text_ += text;
    return *this;
}

ChartStream& ChartStream::operator<<(char c)
{
    if (plain_)
        file_ << c;
    else
        text_ += c;
    return *this;
}

ChartStream& ChartStream::operator<<(int value)
{
    if (plain_) {
        file_ << value;
    } else {
        char digits[16];
        text_.append(digits, std::to_chars(digits, digits + sizeof digits, value).ptr);
    }
    return *this;
}

ChartStream& ChartStream::operator<<(double value)
{
    if (plain_) {
        file_ << value;
    } else {
        // The stream's default: %g with six significant digits.
        char digits[32];
        text_.append(digits, std::to_chars(digits, digits + sizeof digits, value, std::chars_format::general, 6).ptr);
    }
    return *this;
}

ChartStream& ChartStream::operator<<(EndLine)
{
    if (plain_)
        file_ << std::endl;
    else
        text_ += '\n';
    return *this;
}

void ChartStream::finish()
{
    *this << "END_DATA" << endl;
    file_.write(text_.data(), static_cast<std::streamsize>(text_.size()));
    file_.close();
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
    stream << "END_DATA" << chartfile::endl;
    return stream.str();
}

} // namespace veltmarquist
