// Helpers shared by the unit tests: golden inputs, CalculateChart calls, row
// tables, synthetic test forms with realistic inks, a failing scratch
// allocator, temporary folders and chart lines.
#ifndef VELTMARQUIST_TESTSUPPORT_H
#define VELTMARQUIST_TESTSUPPORT_H

#include "MathProfile.h"
#include "ScratchAllocation.h"

#include <cstdlib>
#include <filesystem>
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
// The block with the host's golden separations in its exchange records (process 6).
MeasurementBlock withSeparations(MeasurementBlock block);
std::string goldenPath(const std::string& name);
std::string readFile(const std::string& path);
inline bool fileExists(const std::string& path) { std::error_code e; return std::filesystem::exists(path, e); }

// CalculateChart with the block's layout.
int calculateBlock(void* profile, int process, const std::string& path, MeasurementBlock& block);
// The chart of one call on a fresh profile; a test failure and "" when the status is not 0.
std::string chartOf(MeasurementBlock block, int process);

// The spectra of a kind-10, 380 nm, 36-band block (values / 1000).
std::vector<std::vector<double>> spectraOf(const MeasurementBlock& block);

// A row table as CalculateChart builds it: 2000 entries, rows 0..n-1 present.
class RowTable {
public:
    explicit RowTable(const std::vector<std::vector<double>>& spectra);
    static RowTable fromBlock(const MeasurementBlock& block) { return RowTable(spectraOf(block)); }
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

// While it lives, the scratch allocator counts the buffers and fails the nth (none for 0).
struct FailingAllocation {
    explicit FailingAllocation(int nth) : previous(scratch::setAllocator(allocate)) { seen = 0, failing = nth; }
    ~FailingAllocation() { scratch::setAllocator(previous); }
    static void* allocate(std::size_t n, std::size_t s) { return ++seen == failing ? nullptr : std::calloc(n, s); }
    static inline int seen = 0, failing = 0;
    scratch::Allocator previous;
};

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
