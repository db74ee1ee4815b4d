// The exported chart: header and fields as our reader and LittleCMS read
// them, every number exactly the model's, the keywords each option writes,
// the same bytes under any locale, and the refusals.
#include "ChartExport.h"
#include "ExportTestForm.h"

#include "Cgats.h"

#include <gtest/gtest.h>
#include <lcms2.h>

#include <charconv>
#include <cmath>
#include <clocale>
#include <cstdlib>
#include <locale>

using namespace veltmarquist;
using namespace veltmarquist::exporting;

namespace {

ExportOptions optionsOf(ChartFormat format, bool spectral, std::optional<double> inkLimit = std::nullopt)
{
    ExportOptions options;
    options.format = format;
    options.spectral = spectral;
    options.inkLimit = inkLimit;
    options.created = "2025-01-15T12:00:00Z";
    return options;
}

std::string exported(const PatchLayout& layout, const ExportOptions& options)
{
    return exportChart(exporttest::anyCoverageModel(), provenanceOf(exporttest::formFile(), exporttest::kFormPath),
                       layout, options);
}

std::string keyword(const cgats::Table& table, const char* name)
{
    const cgats::Keyword* found = table.header.find(name);
    return found != nullptr ? found->value : "(absent)";
}

double parsed(const std::string& text)
{
    double value = 0;
    const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
    EXPECT_EQ(result.ptr, text.data() + text.size()) << text;
    return value;
}

struct CommaDecimals : std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
};

} // namespace

TEST(ChartExport, EveryNumberReadsBackAsTheModelPredictedIt)
{
    const PatchLayout layout = readLayout("grid:3");
    const auto [table, error] = cgats::readTable(exported(layout, optionsOf(ChartFormat::cti3, true)));
    ASSERT_FALSE(error) << error->message;
    ASSERT_EQ(table.rows.size(), 81u);
    std::vector<double> spectra(81 * 36), XYZ(81 * 3), Lab(81 * 3);
    exporttest::anyCoverageModel().predict(81, layout.cmyk.data(), spectra.data(), XYZ.data(), Lab.data());
    for (size_t patch = 0; patch < 81; ++patch) {
        SCOPED_TRACE("patch " + std::to_string(patch));
        const std::vector<std::string>& row = table.rows[patch];
        EXPECT_EQ(row[0], layout.ids[patch]);
        for (size_t i = 0; i < 4; ++i)
            EXPECT_EQ(parsed(row[1 + i]), layout.cmyk[4 * patch + i]);
        for (size_t i = 0; i < 3; ++i) {
            EXPECT_EQ(parsed(row[5 + i]), XYZ[3 * patch + i]);
            EXPECT_EQ(parsed(row[8 + i]), Lab[3 * patch + i]);
        }
        for (size_t band = 0; band < 36; ++band)
            EXPECT_EQ(parsed(row[11 + band]), 100.0 * spectra[36 * patch + band]);
    }
}

TEST(ChartExport, HeaderAndFieldsOfEachFormatAsOurReaderAndLittleCmsReadThem)
{
    const struct {
        ExportOptions options;
        const char* sheetType;
        const char* lastField;
        const char* deviceClass;
        const char* inkLimit;
        const char* spectralNorm;
    } cases[] = {
        {optionsOf(ChartFormat::cti3, false), "CTI3", "LAB_B", "OUTPUT", "(absent)", "(absent)"},
        {optionsOf(ChartFormat::cti3, true, 300), "CTI3", "SPEC_730", "OUTPUT", "300", "100"},
        {optionsOf(ChartFormat::cgats, true, 312.5), "CGATS.17", "SPECTRAL_NM730", "(absent)", "312.5", "(absent)"},
    };
    const PatchLayout layout = readLayout("chart");
    for (const auto& c : cases) {
        SCOPED_TRACE(c.lastField + std::string(" ") + c.inkLimit);
        const std::string text = exported(layout, c.options);
        const auto [table, error] = cgats::readTable(text);
        ASSERT_FALSE(error) << error->message;
        EXPECT_EQ(table.header.sheetType, c.sheetType);
        EXPECT_EQ(table.header.fields.front(), "SAMPLE_ID");
        EXPECT_EQ(table.header.fields[10], "LAB_B");
        EXPECT_EQ(table.header.fields.back(), c.lastField);
        EXPECT_EQ(keyword(table, "DEVICE_CLASS"), c.deviceClass);
        EXPECT_EQ(keyword(table, "TOTAL_INK_LIMIT"), c.inkLimit);
        EXPECT_EQ(keyword(table, "SPECTRAL_NORM"), c.spectralNorm);
        EXPECT_EQ(keyword(table, "CREATED"), "2025-01-15T12:00:00Z");
        EXPECT_EQ(keyword(table, "INSTRUMENTATION"), "Synthetic: model of ink films on paper, no instrument");
        EXPECT_EQ(keyword(table, "PREDICTED_FROM"), "the 46-patch test form offset_form.txt, by the Yule-Nielsen model");
        EXPECT_EQ(keyword(table, "FITTED_VALUE_1").rfind("Yule-Nielsen n (380-730 nm): ", 0), 0u);

        const ReadResult read = readMeasurementText(text);
        ASSERT_TRUE(read.ok()) << read.error.describe();
        EXPECT_EQ(read.file->sets.size(), 900u);
        EXPECT_TRUE(read.file->hasXYZ);

        cmsHANDLE it8 = cmsIT8LoadFromMem(nullptr, text.data(), static_cast<cmsUInt32Number>(text.size()));
        ASSERT_NE(it8, nullptr);
        EXPECT_STREQ(cmsIT8GetSheetType(it8), c.sheetType);
        EXPECT_EQ(cmsIT8GetPropertyDbl(it8, "NUMBER_OF_SETS"), 900);
        EXPECT_EQ(cmsIT8GetDataDbl(it8, "900", "CMYK_K"), 10); // the chart's last patch is K 10
        EXPECT_EQ(cmsIT8GetPropertyDbl(it8, "TOTAL_INK_LIMIT"), c.options.inkLimit.value_or(0));
        cmsIT8Free(it8);
    }
}

TEST(ChartExport, GivesTheSameBytesUnderACommaLocaleAndFromTheSourceDateEpoch)
{
    const PatchLayout layout = readLayout("grid:2");
    const std::string before = exported(layout, optionsOf(ChartFormat::cgats, true, 300));
    const std::locale global = std::locale::global(std::locale(std::locale::classic(), new CommaDecimals));
    const bool german = std::setlocale(LC_ALL, "de_DE.UTF-8") != nullptr;
    const std::string after = exported(layout, optionsOf(ChartFormat::cgats, true, 300));
    std::setlocale(LC_ALL, "C");
    std::locale::global(global);
    EXPECT_EQ(after, before) << (german ? "with de_DE.UTF-8" : "without de_DE.UTF-8");

    ::setenv("SOURCE_DATE_EPOCH", "86399", 1);
    EXPECT_EQ(createdNow(), "1970-01-01T23:59:59Z");
    ::unsetenv("SOURCE_DATE_EPOCH");
}

TEST(ChartExport, RefusesTheLibraryFormatAnInkLimitOutOfRangeAndOffLevelPatches)
{
    const PatchLayout grid = readLayout("grid:11");
    const FormProvenance form = provenanceOf(exporttest::formFile(), exporttest::kFormPath);
    const struct {
        const char* what;
        const PrintModel& model;
        ExportOptions options;
        ExportError::Kind kind;
    } cases[] = {
        {"library format", exporttest::anyCoverageModel(), optionsOf(ChartFormat::library, false), ExportError::Kind::Usage},
        {"ink limit 0", exporttest::anyCoverageModel(), optionsOf(ChartFormat::cti3, false, 0), ExportError::Kind::Usage},
        {"ink limit 401", exporttest::anyCoverageModel(), optionsOf(ChartFormat::cti3, false, 401), ExportError::Kind::Usage},
        {"ink limit NaN", exporttest::anyCoverageModel(), optionsOf(ChartFormat::cti3, false, std::nan("")),
         ExportError::Kind::Usage},
        {"off-level grid", exporttest::levelModel(), optionsOf(ChartFormat::cti3, false), ExportError::Kind::NotPredicted},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        try {
            exportChart(c.model, form, grid, c.options);
            ADD_FAILURE() << "exported";
        } catch (const ExportError& error) {
            EXPECT_EQ(error.kind(), c.kind) << error.what();
        }
    }
}
