// Helpers of the tool tests: running the built tool, temporary folders, the
// golden measurement blocks written as CGATS files, and reading outputs back
// with the tool's own reader.
#ifndef VELTMARQUIST_TOOLTESTSUPPORT_H
#define VELTMARQUIST_TOOLTESTSUPPORT_H

#include "MeasurementFile.h"

#include <string>
#include <vector>

namespace tooltest {

struct ToolRun {
    int exitCode = -1;
    std::string out;
    std::string err;
};

// Runs the tool with `arguments` in `folder` (the test's temporary folder).
ToolRun runTool(const std::vector<std::string>& arguments, const std::string& folder);

class TempDir {
public:
    TempDir();
    ~TempDir();
    std::string path(const std::string& name) const { return dir_ + "/" + name; }
    const std::string& dir() const { return dir_; }
    // Names of the files in the folder, hidden ones included, sorted.
    std::vector<std::string> files() const;

private:
    std::string dir_;
};

std::string readFile(const std::string& path);
void writeFile(const std::string& path, const std::string& text);
std::string goldenPath(const std::string& name);
std::string samplePath(const std::string& name);
// The evaluation data set beside the project, "" when it is absent.
std::string realDataPath();

// A golden "*.in" block: kind, first wavelength, values per patch, count, ints.
struct GoldenBlock {
    int inputKind = 0, firstWavelength = 0, valuesPerPatch = 0, count = 0;
    std::vector<int> ints;
    // Reflectance of value j of patch i, as the file writes it (ints / 1000).
    std::string value(int patch, int j) const;
    // Spectral field names of the block's layout (SPECTRAL_NM380 ..., or nm400 ... for 16 bands).
    std::vector<std::string> spectralFields() const;
};
GoldenBlock readGolden(const std::string& name);

// One CGATS data row.
using Row = std::vector<std::string>;
// A CGATS.17 text with these fields and rows.
std::string cgats(const std::vector<std::string>& fields, const std::vector<Row>& rows);

// The golden four-colour form as CGATS rows (SAMPLE_ID, CMYK_C..K, spectra), in measuring order.
std::vector<Row> testFormRows(const GoldenBlock& block);
std::vector<std::string> testFormFields(const GoldenBlock& block);

// Parses a file with the tool's reader; fails the test when it does not parse.
veltmarquist::MeasurementFile parse(const std::string& path);

} // namespace tooltest

#endif // VELTMARQUIST_TOOLTESTSUPPORT_H
