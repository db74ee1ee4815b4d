// The library's measurement block and band placement.
#include "LibraryBlock.h"

#include "DecimalValues.h"
#include "Failure.h"
#include "Numbers.h"

#include "MathProfile.h"

#include <algorithm>
#include <cmath>
#include <optional>

namespace veltmarquist {

namespace {

// The 36-band value at 380 + 10 b nm of a 10 nm spectrum: the band itself,
// or the nearest measured band outside the measured range.
int bandAt(const SpectralLayout& layout, const std::vector<int>& values, int band)
{
    const int nm = 380 + 10 * band;
    const int index = std::clamp((nm - layout.firstNm) / 10, 0, layout.bands - 1);
    return values[static_cast<size_t>(index)];
}

} // namespace

std::vector<int> thousandthsOf(const MeasurementSet& set)
{
    std::vector<int> values;
    for (std::int32_t value : set.reflectance)
        values.push_back(static_cast<int>(divideRounded(value, kReflectanceUnits / 1000)));
    return values;
}

SpectralLayout libraryLayout()
{
    return SpectralLayout{380, 10, MathProfile::kBands};
}

namespace {

// A double to the nearest millionth, as the reader keeps a decimal it reads;
// nothing for a value beyond what an int32 count of millionths holds.
std::optional<std::int64_t> millionths(double value)
{
    if (!std::isfinite(value) || std::fabs(value) > 2000.0)
        return std::nullopt;
    return static_cast<std::int64_t>(std::llround(value * 1e6));
}

} // namespace

std::vector<int> thousandthsOfFactors(const double* bands, int count, const std::string& what)
{
    std::vector<int> thousandths;
    for (int band = 0; band < count; ++band) {
        const std::optional<std::int64_t> value = millionths(bands[band]);
        if (!value || *value < -kReflectanceUnits / 2 || *value > 3 * kReflectanceUnits)
            throw HostError(Failure::InputContent, what + " has reflectance " + roundTripText(bands[band]) + " at " +
                                                       std::to_string(380 + 10 * band) +
                                                       " nm; reflectance factors lie from 0 to 1 (not percent)");
        thousandths.push_back(static_cast<int>(divideRounded(*value, kReflectanceUnits / 1000)));
    }
    return thousandths;
}

std::int32_t deviceUnitsOf(double percent, const std::string& what)
{
    const std::optional<std::int64_t> value = millionths(percent);
    if (!value || !deviceValueInRange(*value))
        throw HostError(Failure::InputContent, what + " is " + roundTripText(percent) + ", not a coverage from 0 to 100 %");
    return static_cast<std::int32_t>(*value);
}

std::vector<double> libraryBands(const MeasuredSpectrum& spectrum)
{
    std::vector<double> bands(MathProfile::kBands);
    if (spectrum.layout->sixteenBand()) {
        // The library's own widening of 16-band input (it reads no state).
        MathProfile widening("widening");
        std::vector<double> sixteen;
        for (int value : *spectrum.thousandths)
            sixteen.push_back(value / 1000.0);
        for (int band = 0; band < MathProfile::kBands; ++band)
            bands[static_cast<size_t>(band)] = widening.InterpolateSpectralValue(band, sixteen.data());
        return bands;
    }
    for (int band = 0; band < MathProfile::kBands; ++band)
        bands[static_cast<size_t>(band)] = bandAt(*spectrum.layout, *spectrum.thousandths, band) / 1000.0;
    return bands;
}

MeasurementBlock buildBlock(const std::vector<MeasuredSpectrum>& spectra, size_t minimumInts)
{
    MeasurementBlock block;
    block.count = static_cast<int>(spectra.size());
    const bool sixteen = !spectra.empty() && std::all_of(spectra.begin(), spectra.end(), [](const MeasuredSpectrum& s) {
        return s.layout->sixteenBand();
    });
    if (sixteen) {
        block.inputKind = VM_INPUT_16BAND;
        block.firstWavelength = 400;
        block.valuesPerPatch = 16;
        for (const MeasuredSpectrum& spectrum : spectra)
            block.ints.insert(block.ints.end(), spectrum.thousandths->begin(), spectrum.thousandths->end());
    } else {
        for (const MeasuredSpectrum& spectrum : spectra) {
            if (spectrum.layout->sixteenBand()) {
                // Mixed with 10 nm spectra: widen it as the library would.
                for (double value : libraryBands(spectrum))
                    block.ints.push_back(static_cast<int>(std::lround(value * 1000.0)));
                continue;
            }
            for (int band = 0; band < MathProfile::kBands; ++band)
                block.ints.push_back(bandAt(*spectrum.layout, *spectrum.thousandths, band));
        }
    }
    if (block.ints.size() < minimumInts)
        block.ints.resize(minimumInts, 0);
    return block;
}

} // namespace veltmarquist
