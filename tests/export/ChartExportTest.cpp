// The exported chart: header and fields as our reader and LittleCMS read
// them, and every number exactly the model's.
#include "ChartExport.h"
#include "ExportTestForm.h"

#include "Cgats.h"

#include <gtest/gtest.h>
#include <lcms2.h>

#include <charconv>

using namespace exporttest;
using namespace veltmarquist::exporting;

namespace {

ExportOptions optionsOf(ChartFormat format, bool spectral, std::optional<double> inkLimit = std::nullopt)
{
    return {format, spectral, inkLimit, "2025-01-15T12:00:00Z"};
}

std::string exported(const PatchLayout& layout, const ExportOptions& options)
{
    return exportChart(anyCoverageModel(), provenanceOf(formFile(), kFormPath), layout, options);
}

double parsed(const std::string& text)
{
    double value = 0;
    EXPECT_EQ(std::from_chars(text.data(), text.data() + text.size(), value).ptr, text.data() + text.size()) << text;
    return value;
}

} // namespace

TEST(ChartExport, EveryNumberReadsBackAsTheModelPredictedIt)
{
    const PatchLayout layout = readLayout("grid:3");
    const auto [table, error] = cgats::readTable(exported(layout, optionsOf(ChartFormat::cti3, true)));
    ASSERT_FALSE(error) << error->message;
    ASSERT_EQ(table.rows.size(), 81u);
    std::vector<double> expected(81 * 42); // X, Y, Z of every patch, then L*, a*, b*, then the spectra
    anyCoverageModel().predict(81, layout.cmyk.data(), &expected[81 * 6], &expected[0], &expected[81 * 3]);
    for (size_t patch = 0; patch < 81; ++patch) {
        SCOPED_TRACE("patch " + std::to_string(patch));
        const std::vector<std::string>& row = table.rows[patch];
        EXPECT_EQ(row[0], layout.ids[patch]);
        for (size_t i = 0; i < 4; ++i)
            EXPECT_EQ(parsed(row[1 + i]), layout.cmyk[4 * patch + i]);
        for (size_t i = 0; i < 6; ++i) // X, Y, Z, then L*, a*, b*
            EXPECT_EQ(parsed(row[5 + i]), expected[81 * 3 * (i / 3) + 3 * patch + i % 3]);
        for (size_t band = 0; band < 36; ++band)
            EXPECT_EQ(parsed(row[11 + band]), 100.0 * expected[81 * 6 + 36 * patch + band]);
    }
}

TEST(ChartExport, HeaderAndFieldsOfEachFormatAsOurReaderAndLittleCmsReadThem)
{
    const struct {
        ExportOptions options;
        const char *sheetType, *lastField, *deviceClass, *inkLimit, *spectralNorm;
    } cases[] = {
        {optionsOf(ChartFormat::cti3, false), "CTI3", "LAB_B", "OUTPUT", nullptr, nullptr},
        {optionsOf(ChartFormat::cti3, true, 300), "CTI3", "SPEC_730", "OUTPUT", "300", "100"},
        {optionsOf(ChartFormat::cgats, true, 312.5), "CGATS.17", "SPECTRAL_NM730", nullptr, "312.5", nullptr},
    };
    const PatchLayout layout = readLayout("chart");
    for (const auto& c : cases) {
        SCOPED_TRACE(c.lastField);
        const std::string text = exported(layout, c.options);
        const auto [table, error] = cgats::readTable(text);
        ASSERT_FALSE(error) << error->message;
        EXPECT_EQ(table.header.sheetType, c.sheetType);
        EXPECT_EQ(table.header.fields[10], "LAB_B");
        EXPECT_EQ(table.header.fields.back(), c.lastField);
        const auto keyword = [&](const char* name) {
            const cgats::Keyword* found = table.header.find(name);
            return found != nullptr ? found->value.c_str() : nullptr;
        };
        EXPECT_STREQ(keyword("DEVICE_CLASS"), c.deviceClass);
        EXPECT_STREQ(keyword("TOTAL_INK_LIMIT"), c.inkLimit);
        EXPECT_STREQ(keyword("SPECTRAL_NORM"), c.spectralNorm);
        EXPECT_STREQ(keyword("INSTRUMENTATION"), "Synthetic: model of ink films on paper, no instrument");
        EXPECT_STREQ(keyword("PREDICTED_FROM"), "the 46-patch test form offset_form.txt, by the Yule-Nielsen model");
        EXPECT_EQ(std::string(keyword("FITTED_VALUE_1")).rfind("Yule-Nielsen n (380-730 nm): ", 0), 0u);
        EXPECT_EQ(readMeasurementText(text).file->sets.size(), 900u);

        cmsHANDLE it8 = cmsIT8LoadFromMem(nullptr, text.data(), static_cast<cmsUInt32Number>(text.size()));
        ASSERT_NE(it8, nullptr);
        EXPECT_STREQ(cmsIT8GetSheetType(it8), c.sheetType);
        EXPECT_EQ(cmsIT8GetDataDbl(it8, "900", "CMYK_K"), 10); // the chart's last patch is K 10
        EXPECT_EQ(cmsIT8GetPropertyDbl(it8, "TOTAL_INK_LIMIT"), c.options.inkLimit.value_or(0));
        cmsIT8Free(it8);
    }
}
