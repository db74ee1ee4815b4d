// Predicted charts as CGATS text for profile builders: header, provenance and rows.
#include "ChartExport.h"

#include "Cgats.h"
#include "ColourDifference.h"
#include "Failure.h"
#include "Numbers.h"
#include "ParallelPrediction.h"

#include "models/PrintModels.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdlib>
#include <ctime>
#include <set>
#include <sstream>

namespace veltmarquist::exporting {

namespace {

// Keywords that CGATS.17 defines; every other keyword is declared with a
// KEYWORD line before its first use, as strict readers want.
const std::set<std::string> kStandardKeywords = {
    "DESCRIPTOR", "ORIGINATOR", "CREATED", "INSTRUMENTATION", "MEASUREMENT_SOURCE", "MEASUREMENT_GEOMETRY",
    "PRINT_CONDITIONS", "SAMPLE_BACKING", "FILTER", "POLARIZATION", "WEIGHTING_FUNCTION", "TARGET_TYPE"};

// The form's keywords that say how it was measured, copied in this order
// when the form has them. The form's colorimetry keywords (illuminant and
// observer of its own XYZ) are not among them: the exported values are
// computed from spectra under D50 and the 2 degree observer, and the header
// says so itself.
const char* const kMeasurementConditions[] = {
    "INSTRUMENTATION", "MEASUREMENT_SOURCE", "MEASUREMENT_CONDITION", "FILTER",
    "POLARIZATION", "MEASUREMENT_GEOMETRY", "SAMPLE_BACKING", "PRINT_CONDITIONS"};

// The instrument names profile builders know, as the form may write them
// (any case, blanks ignored), and the name to write.
const std::pair<const char*, const char*> kInstruments[] = {
    {"i1pro3", "X-Rite i1 Pro 3"}, {"i1pro2", "X-Rite i1 Pro 2"}, {"i1pro", "X-Rite i1 Pro"},
    {"spectrolino", "GretagMacbeth Spectrolino"}};

// The instrument the form was measured with, for the builder's compensation
// of optical brighteners: the form's TARGET_INSTRUMENT, else an instrument
// its INSTRUMENTATION names, else kDefaultInstrument.
std::string targetInstrument(const FormProvenance& form);

constexpr int kFirstNm = 380, kStepNm = 10;

bool sameName(const std::string& a, const std::string& b)
{
    return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) {
               return std::toupper(static_cast<unsigned char>(x)) == std::toupper(static_cast<unsigned char>(y));
           });
}

// A form's value as a CGATS value can hold it: no double quote, no line end.
std::string writable(std::string value)
{
    for (char& c : value)
        c = c == '"' ? '\'' : (c == '\r' || c == '\n') ? ' ' : c;
    return value;
}

class KeywordList {
public:
    void add(const std::string& name, const std::string& value)
    {
        if (kStandardKeywords.count(name) == 0 && declared_.insert(name).second)
            keywords_.emplace_back("KEYWORD", name);
        keywords_.emplace_back(name, value);
    }
    std::vector<std::pair<std::string, std::string>> take() { return std::move(keywords_); }

private:
    std::vector<std::pair<std::string, std::string>> keywords_;
    std::set<std::string> declared_;
};

const std::string* formKeyword(const FormProvenance& form, const std::string& name)
{
    for (const auto& [key, value] : form.keywords)
        if (sameName(key, name))
            return &value;
    return nullptr;
}

std::string fittedValueText(const FittedValue& value)
{
    std::string text = value.name + ":";
    for (double number : value.numbers)
        text += " " + roundTripText(number);
    if (!value.text.empty())
        text += " " + value.text;
    return writable(text);
}

void addHeader(KeywordList& header, const PrintModel& model, const FormProvenance& form, const PatchLayout& layout,
               const ExportOptions& options)
{
    const std::string* formDescriptor = formKeyword(form, "DESCRIPTOR");
    header.add("DESCRIPTOR", writable((formDescriptor != nullptr && !formDescriptor->empty() ? *formDescriptor : form.name) +
                                      ", predicted: " + layout.description));
    header.add("ORIGINATOR", "VeltmarquistDLL " + roundTripText(VeltmarquistDLLVersionNumber));
    header.add("CREATED", options.created.empty() ? createdNow() : writable(options.created));
    if (options.format == ChartFormat::cti3) {
        header.add("DEVICE_CLASS", "OUTPUT");
        // Profile builders take one colour representation: XYZ, which the
        // model computes (CIELAB is derived from it).
        header.add("COLOR_REP", "CMYK_XYZ");
    }
    if (options.inkLimit)
        header.add("TOTAL_INK_LIMIT", roundTripText(*options.inkLimit));
    if (options.blackLimit)
        header.add("BLACK_INK_LIMIT", roundTripText(*options.blackLimit));
    if (options.spectral && options.format == ChartFormat::cti3) {
        header.add("SPECTRAL_BANDS", std::to_string(kSpectrumBands));
        header.add("SPECTRAL_START_NM", std::to_string(kFirstNm));
        header.add("SPECTRAL_END_NM", std::to_string(kFirstNm + kStepNm * (kSpectrumBands - 1)));
        // Profile builders read CTI3 spectra in percent whatever the norm says.
        header.add("SPECTRAL_NORM", "100");
    }
    header.add("TARGET_INSTRUMENT", targetInstrument(form));
    for (const char* name : kMeasurementConditions)
        if (const std::string* value = formKeyword(form, name))
            header.add(name, writable(*value));
    header.add("ILLUMINATION_NAME", "D50");
    header.add("OBSERVER_ANGLE", "2");
    header.add("WEIGHTING_FUNCTION", "ILLUMINANT, D50");
    header.add("WEIGHTING_FUNCTION", "OBSERVER, 2 degree");
    header.add("PREDICTED_FROM", writable("the 46-patch test form " + form.name + ", by the " + model.name() + " model"));
    const std::vector<FittedValue>& values = model.fittedValues();
    for (std::size_t i = 0; i < values.size(); ++i)
        header.add("FITTED_VALUE_" + std::to_string(i + 1), fittedValueText(values[i]));
}

std::string targetInstrument(const FormProvenance& form)
{
    if (const std::string* given = formKeyword(form, "TARGET_INSTRUMENT"))
        if (!given->empty())
            return writable(*given);
    if (const std::string* instrumentation = formKeyword(form, "INSTRUMENTATION")) {
        std::string squeezed;
        for (char c : *instrumentation)
            if (c != ' ' && c != '-')
                squeezed += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        for (const auto& [key, name] : kInstruments)
            if (squeezed.find(key) != std::string::npos)
                return name;
    }
    return kDefaultInstrument;
}

std::vector<std::string> fieldsOf(const ExportOptions& options)
{
    std::vector<std::string> fields = {"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "XYZ_X",
                                       "XYZ_Y",     "XYZ_Z",  "LAB_L",  "LAB_A",  "LAB_B"};
    if (options.spectral)
        for (int band = 0; band < kSpectrumBands; ++band)
            fields.push_back((options.format == ChartFormat::cti3 ? "SPEC_" : "SPECTRAL_NM") +
                             std::to_string(kFirstNm + kStepNm * band));
    return fields;
}

void requireFinite(const double* values, int count, const PatchLayout& layout, std::size_t patch)
{
    for (int i = 0; i < count; ++i)
        if (!std::isfinite(values[i]))
            throw HostError(Failure::Calculation,
                              "the model predicted a value that is not a number for " + layout.describePatch(patch));
}

void appendNumbers(std::string& line, const double* values, int count, const PatchLayout& layout, std::size_t patch)
{
    requireFinite(values, count, layout, patch);
    for (int i = 0; i < count; ++i) {
        line += '\t';
        line += roundTripText(values[i]);
    }
}

// Patches predicted (on every core) and written per step: memory stays that
// of one batch whatever the layout's size.
constexpr std::size_t kBatch = 4 * kParallelBatch;

// The library's own XYZ chart of the layout's patches, numbered from 1 (a
// file layout's SAMPLE_IDs do not survive: the format has no place for them),
// written by the library's writer from the model's predictions.
std::string libraryChartText(const PrintModel& model, const PatchLayout& layout)
{
    const std::size_t count = layout.size();
    std::vector<Cmyk> coverages(count);
    std::vector<Triple> XYZ(count);
    for (std::size_t patch = 0; patch < count; ++patch)
        std::copy_n(&layout.cmyk[4 * patch], 4, coverages[patch].begin());
    model.predict(count, layout.cmyk.data(), nullptr, XYZ.front().data(), nullptr);
    for (std::size_t patch = 0; patch < count; ++patch)
        requireFinite(XYZ[patch].data(), 3, layout, patch);
    return xyzChartText(coverages, XYZ);
}

} // namespace

ChartFormat chartFormatNamed(std::string_view name)
{
    if (name == "library")
        return ChartFormat::library;
    if (name == "cti3")
        return ChartFormat::cti3;
    if (name == "cgats")
        return ChartFormat::cgats;
    throw HostError(Failure::Usage, "unknown chart format '" + std::string(name) + "'; formats: library, cti3, cgats");
}

FormProvenance provenanceOf(const MeasurementFile& form, const std::string& path)
{
    const std::size_t slash = path.find_last_of('/');
    return {slash == std::string::npos ? path : path.substr(slash + 1), form.keywords};
}

std::string createdNow()
{
    std::time_t now = std::time(nullptr);
    if (const char* epoch = std::getenv("SOURCE_DATE_EPOCH")) {
        char* end = nullptr;
        const long long seconds = std::strtoll(epoch, &end, 10);
        if (end != epoch && *end == '\0' && seconds >= 0)
            now = static_cast<std::time_t>(seconds);
    }
    std::tm utc{};
    gmtime_r(&now, &utc);
    char text[32];
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &utc);
    return text;
}

void checkOptions(const ExportOptions& options)
{
    if (options.format == ChartFormat::library && (options.spectral || options.inkLimit || options.blackLimit))
        throw HostError(Failure::Usage, std::string(options.spectral ? "spectra" : "ink limits") +
                                            " need a chart for profile builders: format cti3 or cgats, not library");
    if (options.blackLimit && !(*options.blackLimit >= 0.0 && *options.blackLimit <= 100.0))
        throw HostError(Failure::Usage, "the black ink limit is a percentage from 0 to 100, not " +
                                            roundTripText(*options.blackLimit));
    if (options.inkLimit && !(*options.inkLimit >= kMinInkLimit && *options.inkLimit <= kMaxInkLimit))
        throw HostError(Failure::Usage, "the total ink limit is a percentage from 100 (one solid) to 400 (four), not " +
                                            roundTripText(*options.inkLimit));
}

void exportChart(const PrintModel& model, const FormProvenance& form, const PatchLayout& layout,
                 const ExportOptions& options, std::ostream& out)
{
    checkOptions(options);
    checkPredictable(layout, model);

    if (options.format == ChartFormat::library) {
        out << libraryChartText(model, layout);
        return;
    }

    const std::size_t count = layout.size();
    KeywordList header;
    addHeader(header, model, form, layout, options);
    out << cgats::headerText(options.format == ChartFormat::cti3 ? "CTI3" : "CGATS.17", header.take(),
                             fieldsOf(options), count);
    std::vector<double> spectra(options.spectral ? kBatch * kSpectrumBands : 0), XYZ(kBatch * 3);
    std::string text;
    for (std::size_t first = 0; first < count; first += kBatch) {
        const std::size_t size = std::min(kBatch, count - first);
        predictInParallel(model, size, &layout.cmyk[4 * first], options.spectral ? spectra.data() : nullptr,
                          XYZ.data(), nullptr);
        text.clear();
        for (std::size_t i = 0; i < size; ++i) {
            const std::size_t patch = first + i;
            cgats::appendCell(text, layout.ids[patch], true);
            appendNumbers(text, &layout.cmyk[4 * patch], 4, layout, patch);
            const double* xyz = &XYZ[3 * i];
            appendNumbers(text, xyz, 3, layout, patch);
            // The exact CIELAB of the X, Y, Z just written; the library's
            // tabulated cube root belongs to its own charts.
            const Lab exact = labOfXYZ({xyz[0], xyz[1], xyz[2]});
            const double lab[3] = {exact.L, exact.a, exact.b};
            appendNumbers(text, lab, 3, layout, patch);
            if (options.spectral) {
                double* bands = &spectra[kSpectrumBands * i];
                if (options.format == ChartFormat::cti3)
                    for (int band = 0; band < kSpectrumBands; ++band)
                        bands[band] *= 100.0;
                appendNumbers(text, bands, kSpectrumBands, layout, patch);
            }
            text += '\n';
        }
        out << text;
    }
    out << cgats::kEndText;
}

std::string exportChart(const PrintModel& model, const FormProvenance& form, const PatchLayout& layout,
                        const ExportOptions& options)
{
    std::ostringstream out;
    exportChart(model, form, layout, options, out);
    return out.str();
}

} // namespace veltmarquist::exporting
