// The library's measurement block and band placement.
#include "LibraryBlock.h"

#include "DecimalValues.h"

#include "MathProfile.h"

#include <algorithm>
#include <cmath>

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

RowTable::RowTable(const MeasurementBlock& block) : table_(2000, nullptr)
{
    MathProfile widening("rows");
    for (int patch = 0; patch < block.count; ++patch) {
        const int* values = block.ints.data() + static_cast<size_t>(patch) * static_cast<size_t>(block.valuesPerPatch);
        std::vector<double> row(MathProfile::kBands);
        if (block.inputKind == VM_INPUT_16BAND) {
            double sixteen[16];
            for (int j = 0; j < 16; ++j)
                sixteen[j] = values[j] / 1000.0;
            for (int band = 0; band < MathProfile::kBands; ++band)
                row[static_cast<size_t>(band)] = widening.InterpolateSpectralValue(band, sixteen);
        } else {
            for (int band = 0; band < MathProfile::kBands; ++band)
                row[static_cast<size_t>(band)] = values[band] / 1000.0;
        }
        storage_.push_back(std::move(row));
    }
    for (size_t patch = 0; patch < storage_.size(); ++patch)
        table_[patch] = storage_[patch].data();
}

} // namespace veltmarquist
