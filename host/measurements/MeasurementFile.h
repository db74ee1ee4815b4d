// Measurement files: what the sets of a CGATS / IT8 file mean.
//
// The grammar is Cgats.h's; this layer finds the device fields (CMYK_C ...
// or nCLR_1 ... nCLR_n), the spectral fields (SpectralBands.h), SAMPLE_ID /
// SAMPLE_NAME and XYZ, decides the reflectance scale, and keeps every value
// as an exact integer (DecimalValues.h): device values in millionths of a
// percent, reflectance in millionths of the reflectance factor. The file's
// paper (its sets with every device value 0) decides the scale and which
// end bands were never measured. Readings that are valid but almost
// certainly wrong become warnings, one line each.
//
// readMeasurementText never throws, never touches the disk and keeps no
// state, so it can be called on arbitrary bytes (a fuzzer does exactly that).
#ifndef VELTMARQUIST_MEASUREMENTS_MEASUREMENTFILE_H
#define VELTMARQUIST_MEASUREMENTS_MEASUREMENTFILE_H

#include "SpectralBands.h"

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace veltmarquist {

constexpr std::int64_t kDeviceUnits = 1000000;      // per percent of a device value
constexpr std::int64_t kReflectanceUnits = 1000000; // per reflectance factor 1

// A device value lies from 0 to 100 %; up to 0.05 % beyond either end is
// taken as the noise of a value written with too few digits.
constexpr bool deviceValueInRange(std::int64_t units)
{
    return units >= -kDeviceUnits / 20 && units <= 100 * kDeviceUnits + kDeviceUnits / 20;
}

// One data set (one measured patch).
struct MeasurementSet {
    int line = 0;                          // line of its data row in the file
    std::string id;                        // SAMPLE_ID, else SAMPLE_NAME, else ""
    std::string name;                      // SAMPLE_NAME, "" when the file has none
    std::vector<std::int32_t> device;      // kDeviceUnits per percent, in deviceFields order
    std::vector<std::int32_t> reflectance; // kReflectanceUnits per 1, one per band of the layout
    std::array<double, 3> XYZ{};           // XYZ_X, XYZ_Y, XYZ_Z when the file has them

    std::vector<double> devicePercent() const;
    // "sample 17 (line 25)", or "line 25" for a set without identifier.
    std::string where() const;
};

struct MeasurementFile {
    std::string fileType;                  // the first line: CGATS.17, ISO28178, IT8.7/4, CTI3, ...
    std::vector<std::pair<std::string, std::string>> keywords; // header keywords, in file order
    std::vector<std::string> fields;       // all field names as the file writes them
    std::vector<std::string> deviceFields; // CMYK_C..CMYK_K, or nCLR_1..nCLR_n
    SpectralLayout fileLayout;             // the spectral fields as the file has them
    SpectralLayout layout;                 // the bands of MeasurementSet::reflectance
    double scale = 1.0;                    // what reflectance was divided by: 1 or 100
    bool scaleDetected = true;             // false when the caller fixed the scale
    bool hasXYZ = false;
    std::vector<MeasurementSet> sets;
    std::vector<std::string> warnings;     // "line 12: ..." or a bare line, no newline

    // Value of a header keyword, "" when absent.
    std::string keyword(const std::string& name) const;
    // "36 bands 380-730 nm in 10 nm steps", with the resampling when there was one.
    std::string describeSpectra() const;
    // "its fields: SAMPLE_ID, CMYK_C, ..." cut to about 100 characters, for messages.
    std::string describeFields() const;
    // The sets measured on paper: every device value 0; in a file without
    // device fields that holds one set, that set.
    std::vector<size_t> paperSets() const;
};

// Mean reflectance of `sets` in the library's thousandths, per band: the sum
// of the exact readings divided once, half away from zero, so identical
// readings give exactly that reading.
std::vector<int> averageThousandths(const MeasurementFile& file, const size_t* sets, size_t count);
inline std::vector<int> averageThousandths(const MeasurementFile& file, const std::vector<size_t>& sets)
{
    return averageThousandths(file, sets.data(), sets.size());
}

struct ReadOptions {
    // Reflectance scale: 0 decides it from the paper and the bulk of the
    // values, 1 or 100 fixes it (and must not contradict them).
    double scale = 0.0;
};

enum class ReadFailure {
    Unreadable, // the file cannot be opened or read
    Syntax,     // not readable CGATS text
    Content,    // fields, values or layout the reader cannot take
    Duplicate   // one sample identifier names two different patches
};

struct ReadError {
    ReadFailure kind = ReadFailure::Syntax;
    int line = 0; // 0 when the error concerns no single line
    std::string message;

    // "line 12: ..." or the bare message.
    std::string describe() const;
};

struct ReadResult {
    std::optional<MeasurementFile> file;
    ReadError error; // meaningful when file is empty

    bool ok() const { return file.has_value(); }
};

ReadResult readMeasurementText(std::string_view text, const ReadOptions& options = {});

// Reads a file from disk as it streams in. Only regular files, at most
// kMaxFileBytes: a FIFO, a device or a folder is refused before it is read.
constexpr std::int64_t kMaxFileBytes = std::int64_t(1) << 30;
ReadResult readMeasurementFile(const std::string& path, const ReadOptions& options = {});

// Device channel count named by a field of the nCLR family ("6CLR_3" gives
// {6, 3}), or {0, 0}.
std::pair<int, int> colorFieldOf(const std::string& name);

} // namespace veltmarquist

#endif // VELTMARQUIST_MEASUREMENTS_MEASUREMENTFILE_H
