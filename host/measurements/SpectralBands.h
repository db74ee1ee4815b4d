// Spectral fields of a measurement file and their bands.
//
// Files name a band SPECTRAL_NM380, SPECTRAL_NM_380, SPECTRAL_380, SPEC_380
// or nm380 (any case), in 1, 2, 5, 10 or 20 nm steps. The library reads 10 nm
// bands, or 16 bands 400-700 nm in 20 nm steps (its input kind 20, kept as
// it is). Every other layout is resampled once, here, to the 10 nm points
// within its range: a 10 nm point the file measured is taken as it is
// (decimation), one between two measured bands is interpolated linearly
// between them. The range must reach from 400 nm or below to 700 nm or above.
#ifndef VELTMARQUIST_MEASUREMENTS_SPECTRALBANDS_H
#define VELTMARQUIST_MEASUREMENTS_SPECTRALBANDS_H

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace veltmarquist {

// Where the reflectance bands lie.
struct SpectralLayout {
    int firstNm = 0; // wavelength of the first band
    int stepNm = 0;
    int bands = 0;   // 0: no spectra

    bool present() const { return bands > 0; }
    // 16 bands at 400, 420, ..., 700 nm (the library's input kind 20).
    bool sixteenBand() const { return stepNm == 20 && firstNm == 400 && bands == 16; }
    int lastNm() const { return firstNm + stepNm * (bands - 1); }
    std::string describe() const; // "36 bands 380-730 nm in 10 nm steps"
};

// Wavelength named by a spectral field, or 0 when the name is not spectral.
int wavelengthOfField(const std::string& name);

// The spectral fields of a file: their columns in wavelength order, the
// layout as the file has it and the layout the reader delivers.
struct SpectralFields {
    std::vector<int> columns;
    SpectralLayout file;
    SpectralLayout delivered; // the file's own, or 10 nm steps after resampling
};

// Finds the spectral fields; an error message (naming the fields seen) when
// their layout cannot be read.
std::optional<std::string> findSpectralFields(const std::vector<std::string>& fields, SpectralFields& found);

// Resamples one spectrum in fine units from the file's layout to the
// delivered one; interpolated values round to odd (see DecimalValues.h).
std::vector<std::int32_t> resample(const SpectralFields& fields, const std::vector<std::int32_t>& values);

} // namespace veltmarquist

#endif // VELTMARQUIST_MEASUREMENTS_SPECTRALBANDS_H
