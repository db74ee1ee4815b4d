// Measured spectra as the library takes them: the integer block of the C
// entry points, and the 36 bands (380-730 nm) the library makes of a spectrum.
#ifndef VELTMARQUIST_FORMS_LIBRARYBLOCK_H
#define VELTMARQUIST_FORMS_LIBRARYBLOCK_H

#include "MeasurementFile.h"

#include "VeltmarquistDLL.h"

#include <cstdint>
#include <string>
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

// The layout of the library's own bands: 36, 380 to 730 nm in 10 nm steps.
SpectralLayout libraryLayout();

// Values a host holds as numbers (Python arrays) as the reader keeps file
// values: to the nearest millionth first, then rounded once more where the
// library takes coarser units, so that the same numbers give the same
// charts from a file and from an array.
// - Reflectance factors (0..1) as the library's thousandths; a value that is
//   not finite or lies outside -0.5..3 is refused (Failure::InputContent)
//   naming `what` and the band, as the reader refuses it in a file.
std::vector<int> thousandthsOfFactors(const double* bands, int count, const std::string& what);
// - A device value in percent as kDeviceUnits; a value that is not finite
//   or lies outside 0..100 % is refused naming `what`.
std::int32_t deviceUnitsOf(double percent, const std::string& what);

// The block of the spectra, padded with zeros to at least `minimumInts`.
// Spectra of 16 bands (all of them) go in as input kind 20; everything else as
// 36 bands, 380 to 730 nm: bands outside that range are dropped, and the
// bands in front of the first or behind the last measured band repeat it.
MeasurementBlock buildBlock(const std::vector<MeasuredSpectrum>& spectra, size_t minimumInts = 0);

// The 36-band spectrum (380..730 nm, reflectance factor) that the library
// makes of one spectrum: what its models and charts compute with.
std::vector<double> libraryBands(const MeasuredSpectrum& spectrum);

} // namespace veltmarquist

#endif // VELTMARQUIST_FORMS_LIBRARYBLOCK_H
