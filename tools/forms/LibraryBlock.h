// Measured spectra as the library takes them: the integer block of the C
// entry points, and the 36 bands (380-730 nm) the library makes of a spectrum.
#ifndef VELTMARQUIST_FORMS_LIBRARYBLOCK_H
#define VELTMARQUIST_FORMS_LIBRARYBLOCK_H

#include "MeasurementFile.h"

#include "VeltmarquistDLL.h"

#include <vector>

namespace veltmarquist {

// Integers as CalculateChart takes them: reflectance x 1000, patch after patch.
struct MeasurementBlock {
    int inputKind = VM_INPUT_10NM;
    int firstWavelength = 380;
    int valuesPerPatch = 36;
    int count = 0;
    std::vector<int> ints;
};

// A spectrum in the library's thousandths and the layout of its bands.
struct MeasuredSpectrum {
    const SpectralLayout* layout;
    const std::vector<int>* thousandths;
};
// The thousandths of one set.
std::vector<int> thousandthsOf(const MeasurementSet& set);

// The block of the spectra, padded with zeros to at least `minimumInts`.
// Spectra of 16 bands (all of them) go in as input kind 20; everything else as
// 36 bands, 380 to 730 nm: bands outside that range are dropped, and the
// bands in front of the first or behind the last measured band repeat it.
MeasurementBlock buildBlock(const std::vector<MeasuredSpectrum>& spectra, size_t minimumInts = 0);

// The 36-band spectrum (380..730 nm, reflectance factor) that the library
// makes of one spectrum: what its models and charts compute with.
std::vector<double> libraryBands(const MeasuredSpectrum& spectrum);

// A row table as CalculateChart builds it from a block: 2000 entries, rows
// 0 to count - 1 present, 36 values each. For the class methods that no entry
// point reaches (the gravure fit on a profile).
class RowTable {
public:
    explicit RowTable(const MeasurementBlock& block);
    double** rows() { return table_.data(); }

private:
    std::vector<std::vector<double>> storage_;
    std::vector<double*> table_;
};

} // namespace veltmarquist

#endif // VELTMARQUIST_FORMS_LIBRARYBLOCK_H
