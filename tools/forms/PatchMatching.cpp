// Patch matching by device values and the measurement block.
#include "PatchMatching.h"

#include "DecimalValues.h"
#include "ToolError.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

namespace veltmarquist {

namespace {

// Device vectors of different lengths compare as if padded with zeros, so a
// C, M, Y, K request finds a seven-channel set whose further inks are 0.
const size_t kMaxChannels = 16;

std::string percent(double value)
{
    char text[32];
    std::snprintf(text, sizeof text, "%g", value);
    return text;
}

// The 36-band value at 380 + 10 b nm of a 10 nm spectrum: the band itself,
// or the nearest measured band outside the measured range.
int bandAt(const SpectralLayout& layout, const std::vector<int>& values, int band)
{
    const int nm = 380 + 10 * band;
    const int index = std::clamp((nm - layout.firstNm) / 10, 0, layout.bands - 1);
    return values[static_cast<size_t>(index)];
}

std::string plural(const std::string& noun)
{
    return noun + (noun.size() > 2 && noun.compare(noun.size() - 2, 2, "ch") == 0 ? "es" : "s");
}

// "test-form patch 18 (C 0 M 90 Y 0 K 0) is missing", or all of them in one
// line: "3 test-form patches are missing: 18 (...), 19 (...), 20 (...)"; the
// first twelve are named.
std::string missingPatches(const std::vector<const PatchRequest*>& missing)
{
    if (missing.size() == 1)
        return missing[0]->kind + " " + missing[0]->label + " is missing";
    const bool oneKind = std::all_of(missing.begin(), missing.end(),
                                     [&](const PatchRequest* request) { return request->kind == missing[0]->kind; });
    std::string text = std::to_string(missing.size()) + " " + (oneKind ? plural(missing[0]->kind) : "patches") +
                       " are missing: ";
    for (size_t i = 0; i < missing.size() && i < 12; ++i)
        text += (i == 0 ? "" : ", ") + (oneKind ? "" : missing[i]->kind + " ") + missing[i]->label;
    return missing.size() > 12 ? text + ", ... (" + std::to_string(missing.size() - 12) + " more)" : text;
}

} // namespace

std::vector<PatchRequest> testFormRequests()
{
    std::vector<PatchRequest> requests;
    for (int patch = 0; patch < 46; ++patch) {
        std::vector<double> device(MathProfile::dithering[patch], MathProfile::dithering[patch] + 4);
        const std::string label = std::to_string(patch + 1) + " (" + describeDevice(device) + ")";
        requests.push_back({std::move(device), "test-form patch", label});
    }
    return requests;
}

std::vector<PatchRequest> multiChannelRequests(int inks)
{
    auto solid = [inks](int channel) {
        std::vector<double> device(static_cast<size_t>(inks), 0.0);
        if (channel >= 0)
            device[static_cast<size_t>(channel)] = 100.0;
        return device;
    };
    static const char* const names[] = {"cyan", "magenta", "yellow", "black"};
    std::vector<PatchRequest> requests;
    for (int channel = 0; channel < 4; ++channel)
        requests.push_back({solid(channel), "solid", std::string(names[channel]) + " (" + describeDevice(solid(channel)) + ")"});
    for (int place = 0; place < 4; ++place) // the paper, and three places the processes do not read
        requests.push_back({solid(-1), "paper", "(all channels 0)"});
    for (int channel = 4; channel < inks; ++channel)
        requests.push_back({solid(channel), "solid", "of ink " + std::to_string(channel + 1) + " (" +
                                                         describeDevice(solid(channel)) + ")"});
    return requests;
}

std::string describeDevice(const std::vector<double>& device)
{
    static const char* const names[] = {"C", "M", "Y", "K"};
    std::string text;
    for (size_t channel = 0; channel < device.size(); ++channel) {
        if (channel >= 4 && device[channel] == 0.0)
            continue;
        if (!text.empty())
            text += ' ';
        text += channel < 4 ? names[channel] : "ink" + std::to_string(channel + 1);
        text += ' ' + percent(device[channel]);
    }
    return text;
}

// ---- Matching ------------------------------------------------------------------------------------

CombinationIndex::CombinationIndex(const MeasurementFile& file)
{
    for (size_t i = 0; i < file.sets.size(); ++i)
        sets_[keyOf(file.sets[i])].push_back(i);
}

CombinationIndex::Key CombinationIndex::keyOf(const std::vector<double>& device)
{
    Key key(kMaxChannels, 0);
    for (size_t channel = 0; channel < device.size() && channel < kMaxChannels; ++channel)
        key[channel] = std::lround(device[channel] * 10.0);
    return key;
}

CombinationIndex::Key CombinationIndex::keyOf(const MeasurementSet& set)
{
    Key key(kMaxChannels, 0);
    for (size_t channel = 0; channel < set.device.size() && channel < kMaxChannels; ++channel)
        key[channel] = static_cast<long>(divideRounded(set.device[channel], kDeviceUnits / 10));
    return key;
}

const std::vector<size_t>& CombinationIndex::find(const std::vector<double>& device) const
{
    static const std::vector<size_t> none;
    const auto found = sets_.find(keyOf(device));
    return found == sets_.end() ? none : found->second;
}

PickedPatches pickPatches(const MeasurementFile& file, const std::vector<PatchRequest>& requests,
                          const std::string& fileName)
{
    if (!file.layout.present())
        throw ToolError(Failure::InputContent, fileName + ": no spectral fields (SPECTRAL_NM380, SPEC_380 or nm380 ...); " +
                                                   file.describeFields());
    if (file.deviceFields.empty())
        throw ToolError(Failure::InputContent, fileName + ": no device fields (CMYK_C ... CMYK_K or nCLR_1 ... nCLR_n); " +
                                                   file.describeFields());
    const CombinationIndex index(file);
    PickedPatches picked;
    std::vector<bool> used(file.sets.size(), false);
    std::vector<const PatchRequest*> missing;
    for (const PatchRequest& request : requests) {
        const std::vector<size_t>& sets = index.find(request.device);
        if (sets.empty()) {
            const bool listed = std::any_of(missing.begin(), missing.end(), [&](const PatchRequest* other) {
                return other->kind == request.kind && other->label == request.label;
            });
            if (!listed)
                missing.push_back(&request);
            continue;
        }
        picked.thousandths.push_back(averageThousandths(file, sets));
        picked.averaged += sets.size() > 1 ? 1 : 0;
        for (size_t set : sets)
            used[set] = true;
    }
    if (!missing.empty())
        throw ToolError(Failure::MissingPatch, fileName + ": " + missingPatches(missing));
    picked.setsUsed = static_cast<size_t>(std::count(used.begin(), used.end(), true));
    picked.setsIgnored = file.sets.size() - picked.setsUsed;
    return picked;
}

std::vector<int> thousandthsOf(const MeasurementSet& set)
{
    std::vector<int> values;
    for (std::int32_t value : set.reflectance)
        values.push_back(static_cast<int>(divideRounded(value, kReflectanceUnits / 1000)));
    return values;
}

// ---- Measurement block ------------------------------------------------------------------------------

std::vector<double> libraryBands(const Spectrum& spectrum)
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

MeasurementBlock buildBlock(const std::vector<Spectrum>& spectra, size_t minimumInts)
{
    MeasurementBlock block;
    block.count = static_cast<int>(spectra.size());
    const bool sixteen = !spectra.empty() && std::all_of(spectra.begin(), spectra.end(), [](const Spectrum& s) {
        return s.layout->sixteenBand();
    });
    if (sixteen) {
        block.inputKind = VM_INPUT_16BAND;
        block.firstWavelength = 400;
        block.valuesPerPatch = 16;
        for (const Spectrum& spectrum : spectra)
            block.ints.insert(block.ints.end(), spectrum.thousandths->begin(), spectrum.thousandths->end());
    } else {
        for (const Spectrum& spectrum : spectra) {
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
