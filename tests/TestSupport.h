// Helpers shared by the unit tests: golden inputs, row tables, synthetic test
// forms with realistic inks, temporary folders and file comparison.
#ifndef VELTMARQUIST_TESTSUPPORT_H
#define VELTMARQUIST_TESTSUPPORT_H

#include "MathProfile.h"

#include <memory>
#include <string>
#include <vector>

namespace testsupport {

// A measurement block as a host passes it to CalculateChart.
struct MeasurementBlock {
    int inputKind = 10;
    int firstWavelength = 380;
    int valuesPerPatch = 36;
    int count = 0;
    std::vector<int> ints; // at least VM_EXCHANGE_BUFFER_INTS long
};

// Reads a golden "*.in" file: "kind first valuesPerPatch count ints", then the ints.
MeasurementBlock readGoldenInput(const std::string& name);
std::string goldenPath(const std::string& name);
std::string readFile(const std::string& path);
bool fileExists(const std::string& path);

// A row table as CalculateChart builds it: 2000 entries, rows 0..n-1 present.
class RowTable {
public:
    explicit RowTable(const std::vector<std::vector<double>>& spectra);
    // Rows from a kind-10, 380 nm, 36-band block (values / 1000).
    static RowTable fromBlock(const MeasurementBlock& block);
    double** rows() { return table_.data(); }
    std::vector<double>& row(int i) { return storage_[static_cast<size_t>(i)]; }

private:
    std::vector<std::vector<double>> storage_;
    std::vector<double*> table_;
};

// A synthetic four-colour test form: spectra of the 46 patches in measuring
// order, made from a simple model of ink films on paper (ink absorption
// spectra, Yule-Nielsen halftones with dot gain, imperfect trapping).
// `variant` changes dot gain and trapping so several realistic forms exist.
std::vector<std::vector<double>> syntheticForm(int variant = 0);
// The same form as a kind-10 block (reflectance x 1000, rounded).
MeasurementBlock syntheticBlock(int variant = 0);

// A fresh temporary folder, removed with the object.
class TempDir {
public:
    TempDir();
    ~TempDir();
    std::string path(const std::string& name) const { return dir_ + "/" + name; }
    const std::string& dir() const { return dir_; }

private:
    std::string dir_;
};

// Lines of a text, split at LF (a CR before the LF stays in the line).
std::vector<std::string> lines(const std::string& text);
// Tab-separated fields of one line.
std::vector<std::string> fields(const std::string& line);

} // namespace testsupport

#endif // VELTMARQUIST_TESTSUPPORT_H
