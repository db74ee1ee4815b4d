// Spectral field names, layouts and the resampling to 10 nm.
#include "SpectralBands.h"

#include "Cgats.h"
#include "DecimalValues.h"

#include <algorithm>
#include <cctype>
#include <map>

namespace veltmarquist {

namespace {

const char* const kSupported = "; supported: 1, 2, 5, 10 or 20 nm steps covering at least 400-700 nm";

std::string upper(std::string text)
{
    for (char& c : text)
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return text;
}

int roundUpTo10(int nm)
{
    return nm % 10 == 0 ? nm : nm + (10 - ((nm % 10) + 10) % 10);
}

} // namespace

std::string SpectralLayout::describe() const
{
    if (!present())
        return "no spectra";
    return std::to_string(bands) + " bands " + std::to_string(firstNm) + "-" + std::to_string(lastNm()) + " nm in " +
           std::to_string(stepNm) + " nm steps";
}

int wavelengthOfField(const std::string& name)
{
    const std::string field = upper(name);
    for (const char* prefix : {"SPECTRAL_NM_", "SPECTRAL_NM", "SPECTRAL_", "SPEC_", "NM"}) {
        const std::string p(prefix);
        if (field.compare(0, p.size(), p) != 0)
            continue;
        const std::string digits = field.substr(p.size());
        if (digits.size() < 3 || digits.size() > 4 ||
            !std::all_of(digits.begin(), digits.end(), [](char c) { return std::isdigit(static_cast<unsigned char>(c)); }))
            return 0;
        const int nm = std::stoi(digits);
        return nm >= 300 && nm <= 1100 ? nm : 0;
    }
    return 0;
}

std::optional<std::string> findSpectralFields(const std::vector<std::string>& fields, SpectralFields& found)
{
    std::map<int, int> byWavelength;
    for (size_t i = 0; i < fields.size(); ++i) {
        const int nm = wavelengthOfField(fields[i]);
        if (nm == 0)
            continue;
        if (!byWavelength.emplace(nm, static_cast<int>(i)).second)
            return "unknown spectral layout: fields " + cgats::excerpt(fields[static_cast<size_t>(byWavelength[nm])]) +
                   " and " + cgats::excerpt(fields[i]) + " both name " + std::to_string(nm) + " nm";
    }
    if (byWavelength.empty())
        return std::nullopt;
    std::vector<int> nm;
    for (const auto& [wavelength, column] : byWavelength) {
        nm.push_back(wavelength);
        found.columns.push_back(column);
    }
    const std::string seen = " (fields " + cgats::excerpt(fields[static_cast<size_t>(found.columns.front())]) +
                             (nm.size() > 1 ? " ... " + cgats::excerpt(fields[static_cast<size_t>(found.columns.back())]) : "") +
                             ")";
    if (nm.size() < 2)
        return "unknown spectral layout: a single band at " + std::to_string(nm[0]) + " nm" + seen + kSupported;
    const int step = nm[1] - nm[0];
    for (size_t i = 1; i < nm.size(); ++i)
        if (nm[i] - nm[i - 1] != step)
            return "unknown spectral layout: bands " + std::to_string(nm[i - 1]) + " and " + std::to_string(nm[i]) +
                   " nm break the " + std::to_string(step) + " nm steps" + seen + kSupported;
    found.file = SpectralLayout{nm.front(), step, static_cast<int>(nm.size())};
    const int first10 = roundUpTo10(nm.front()), last10 = nm.back() - ((nm.back() % 10) + 10) % 10;
    const bool stepSupported = step == 1 || step == 2 || step == 5 || step == 10 || step == 20;
    if (!stepSupported || first10 > 400 || last10 < 700)
        return "unknown spectral layout: " + found.file.describe() + seen + kSupported;
    found.delivered = found.file.sixteenBand() ? found.file : SpectralLayout{first10, 10, (last10 - first10) / 10 + 1};
    return std::nullopt;
}

std::vector<std::int32_t> resample(const SpectralFields& fields, const std::vector<std::int32_t>& values)
{
    const SpectralLayout& from = fields.file;
    const SpectralLayout& to = fields.delivered;
    if (from.firstNm == to.firstNm && from.stepNm == to.stepNm && from.bands == to.bands)
        return values;
    std::vector<std::int32_t> result(static_cast<size_t>(to.bands));
    for (int band = 0; band < to.bands; ++band) {
        const int nm = to.firstNm + to.stepNm * band;
        const int below = (nm - from.firstNm) / from.stepNm;
        const int offset = (nm - from.firstNm) % from.stepNm;
        const std::int64_t lower = values[static_cast<size_t>(below)];
        if (offset == 0) {
            result[static_cast<size_t>(band)] = static_cast<std::int32_t>(lower);
            continue;
        }
        // Linear between the bands at (below) and (below + 1), weights by distance.
        const std::int64_t upper = values[static_cast<size_t>(below) + 1];
        result[static_cast<size_t>(band)] = static_cast<std::int32_t>(
            divideToOdd(lower * (from.stepNm - offset) + upper * offset, from.stepNm));
    }
    return result;
}

} // namespace veltmarquist
