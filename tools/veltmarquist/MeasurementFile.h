// Measurement files: CGATS.17 / IT8 text as spectrophotometer software and
// profiling tools write it.
//
// readMeasurementText takes the whole text of a file and returns either the
// parsed measurements or one error with the line it concerns. It never
// throws, never touches the disk and keeps no state, so it can be called on
// arbitrary bytes (a fuzzer does exactly that).
//
// Real files are messy, and the CGATS library (LittleCMS's IT8 parser) is
// strict, so the text is first normalised line by line: CR LF and CR become
// LF, trailing blanks and TABs go, unquoted keyword values get quotes, field
// names that start with a digit (6CLR_1) get an alias, numbers in exponent
// form are written out in plain decimals, and a missing NUMBER_OF_FIELDS or
// NUMBER_OF_SETS is added. Lines keep their numbers for messages.
#ifndef VELTMARQUIST_TOOL_MEASUREMENTFILE_H
#define VELTMARQUIST_TOOL_MEASUREMENTFILE_H

#include "ToolError.h"

#include <array>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace veltmarquist {

// Where the reflectance bands of a file lie.
struct SpectralLayout {
    int firstNm = 0; // wavelength of the first band
    int stepNm = 0;  // 10, or 20 for the 16-band layout
    int bands = 0;   // 0: the file holds no spectra

    bool present() const { return bands > 0; }
    // 16 bands at 400, 420, ..., 700 nm (the library's input kind 20).
    bool sixteenBand() const { return stepNm == 20; }
    int lastNm() const { return firstNm + stepNm * (bands - 1); }
    std::string describe() const; // "380-730 nm in 10 nm steps"
};

// One data set (one measured patch).
struct MeasurementSet {
    int line = 0;                   // line of its data row in the file
    std::string id;                 // SAMPLE_ID, else SAMPLE_NAME, else ""
    std::string name;               // SAMPLE_NAME, "" when the file has none
    std::vector<double> device;     // device values in percent, in deviceFields order
    std::vector<double> reflectance; // layout.bands values on the 0..1 scale
    std::array<double, 3> XYZ{};    // XYZ_X, XYZ_Y, XYZ_Z when the file has them

    // "sample 17 (line 25)", or "line 25" for a set without identifier.
    std::string where() const;
};

struct MeasurementFile {
    std::string fileType;                  // the sheet type: CGATS.17, ISO28178, IT8.7/4, ...
    std::vector<std::pair<std::string, std::string>> keywords; // header keywords, in file order
    std::vector<std::string> fields;       // all field names as the file writes them
    std::vector<std::string> deviceFields; // CMYK_C..CMYK_K, or nCLR_1..nCLR_n
    SpectralLayout layout;
    double scale = 1.0;                    // what reflectance was divided by: 1 or 100
    bool scaleDetected = true;             // false when the caller fixed the scale
    bool hasXYZ = false;
    std::vector<MeasurementSet> sets;

    // Value of a header keyword, "" when absent.
    std::string keyword(const std::string& name) const;
};

struct ReadOptions {
    // Reflectance scale: 0 detects it from the values (anything above 2
    // means percent), 1 or 100 fixes it.
    double scale = 0.0;
};

struct ReadError {
    Failure kind = Failure::InputSyntax; // InputSyntax, InputContent or DuplicatePatch
    int line = 0;                        // 0 when the error concerns no single line
    std::string message;

    // "line 12: ..." or the bare message.
    std::string describe() const;
};

struct ReadResult {
    std::optional<MeasurementFile> file;
    ReadError error; // meaningful when file is empty

    bool ok() const { return file.has_value(); }
};

ReadResult readMeasurementText(const std::string& text, const ReadOptions& options = {});

// ---- Pieces of the reader, exposed for tests --------------------------------

// The normalised text that goes to the CGATS library, with the original line
// number of every normalised line and the original field names.
struct NormalisedText {
    std::string text;
    std::vector<int> originalLine;    // index: normalised line - 1
    std::vector<std::string> fields;  // field names as the file writes them
    std::vector<int> dataLines;       // original line of each data row
    std::optional<ReadError> error;   // a defect found while normalising
};
NormalisedText normaliseCgatsText(const std::string& text);

// Wavelength named by a spectral field (SPECTRAL_NM380, SPECTRAL_NM_380,
// SPECTRAL_380, nm380, any case), or 0 when the name is not spectral.
int wavelengthOfField(const std::string& name);

// Device channel count named by a field of the nCLR family ("6CLR_3" gives
// {6, 3}), or {0, 0}.
std::pair<int, int> colorFieldOf(const std::string& name);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_MEASUREMENTFILE_H
