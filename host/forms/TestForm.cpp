// The test form found in a measurement file.
#include "TestForm.h"

#include "Failure.h"
#include "MeasurementLoading.h"

#include <algorithm>
#include <stdexcept>

namespace veltmarquist {

namespace {

// Header keywords that say what was measured, by whom and how.
const char* const kProvenanceKeywords[] = {
    "DESCRIPTOR",     "ORIGINATOR",         "CREATED",           "PRINT_CONDITIONS", "TARGET_TYPE",
    "INSTRUMENTATION", "TARGET_INSTRUMENT", "MEASUREMENT_CONDITION", "MEASUREMENT_SOURCE", "ILLUMINATION_NAME",
    "OBSERVER_ANGLE",  "FILTER",            "POLARIZATION",      "WEIGHTING_FUNCTION", "SAMPLE_BACKING",
    "MEASUREMENT_GEOMETRY",
};

bool isProvenance(const std::string& keyword)
{
    return std::any_of(std::begin(kProvenanceKeywords), std::end(kProvenanceKeywords),
                       [&](const char* name) { return keyword == name; });
}

} // namespace

std::vector<std::pair<std::string, std::string>> provenanceOf(const MeasurementFile& file)
{
    std::vector<std::pair<std::string, std::string>> provenance;
    for (const auto& [keyword, value] : file.keywords)
        if (isProvenance(keyword))
            provenance.emplace_back(keyword, value);
    return provenance;
}

FoundForm findTestForm(const std::string& path, const ReadOptions& options)
{
    return findTestForm(loadMeasurementFile(path, options), path);
}

FoundForm findTestForm(MeasurementFile file, const std::string& path)
{
    FoundForm found{path, std::move(file), {}, {}, {}, {}};
    found.picked = pickPatches(found.file, testFormRequests(), path);
    std::vector<MeasuredSpectrum> spectra;
    for (const std::vector<int>& thousandths : found.picked.thousandths) {
        spectra.push_back({&found.file.layout, &thousandths});
        const std::vector<double> bands = libraryBands(spectra.back());
        found.spectra.emplace_back();
        std::copy_n(bands.begin(), kSpectrumBands, found.spectra.back().begin());
    }
    found.block = buildBlock(spectra);
    found.provenance = provenanceOf(found.file);
    try {
        found.measuredForm(); // what no model may be fitted to is refused here, naming the file
    } catch (const std::invalid_argument& refused) {
        throw HostError(Failure::InputContent, path + ": the test form cannot be a measurement: " + refused.what());
    }
    return found;
}

} // namespace veltmarquist
