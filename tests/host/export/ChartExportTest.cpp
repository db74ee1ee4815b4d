// The exported chart: header and fields as our reader and LittleCMS read
// them, and every number exactly the model's.
#include "ChartExport.h"
#include "ExportTestForm.h"

#include "Cgats.h"

#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>

using namespace exporttest;
using namespace veltmarquist::exporting;

namespace {

ExportOptions optionsOf(ChartFormat format, bool spectral, std::optional<double> inkLimit = std::nullopt,
                        std::optional<double> blackLimit = std::nullopt)
{
    return {format, spectral, inkLimit, blackLimit, "2025-01-15T12:00:00Z"};
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

// CIELAB of X, Y, Z (0..100) by the CIE formula, ICC D50 white.
std::array<double, 3> cieLab(const double* XYZ)
{
    const double white[3] = {96.42, 100.0, 82.49};
    double f[3];
    for (int i = 0; i < 3; ++i) {
        const double t = XYZ[i] / white[i];
        f[i] = t > 216.0 / 24389.0 ? std::cbrt(t) : (24389.0 / 27.0 * t + 16.0) / 116.0;
    }
    return {116.0 * f[1] - 16.0, 500.0 * (f[0] - f[1]), 200.0 * (f[1] - f[2])};
}

} // namespace

TEST(ChartExport, EveryNumberReadsBackAsTheModelPredictedIt)
{
    const PatchLayout layout = readLayout("grid:3");
    const auto [table, error] = cgats::readTable(exported(layout, optionsOf(ChartFormat::cti3, true)));
    ASSERT_FALSE(error) << error->message;
    ASSERT_EQ(table.rows.size(), 81u);
    std::vector<double> expected(81 * 42); // X, Y, Z of every patch, the library's L*, a*, b*, then the spectra
    anyCoverageModel().predict(81, layout.cmyk.data(), &expected[81 * 6], &expected[0], &expected[81 * 3]);
    double apart = 0.0;
    for (size_t patch = 0; patch < 81; ++patch) {
        SCOPED_TRACE("patch " + std::to_string(patch));
        const std::vector<std::string>& row = table.rows[patch];
        EXPECT_EQ(row[0], layout.ids[patch]);
        for (size_t i = 0; i < 4; ++i)
            EXPECT_EQ(parsed(row[1 + i]), layout.cmyk[4 * patch + i]);
        for (size_t i = 0; i < 3; ++i)
            EXPECT_EQ(parsed(row[5 + i]), expected[3 * patch + i]);
        // L*, a*, b*: the CIE formula on the X, Y, Z the row holds, not the library's tabulated cube root.
        const double XYZ[3] = {parsed(row[5]), parsed(row[6]), parsed(row[7])};
        const std::array<double, 3> lab = cieLab(XYZ);
        for (size_t i = 0; i < 3; ++i) {
            EXPECT_NEAR(parsed(row[8 + i]), lab[i], 1e-12);
            apart = std::max(apart, std::fabs(parsed(row[8 + i]) - expected[81 * 3 + 3 * patch + i]));
        }
        for (size_t band = 0; band < 36; ++band)
            EXPECT_EQ(parsed(row[11 + band]), 100.0 * expected[81 * 6 + 36 * patch + band]);
    }
    EXPECT_GT(apart, 1e-4) << "the export's CIELAB is the library's";
}

TEST(ChartExport, HeaderAndFieldsOfEachFormatAsOurReaderAndLittleCmsReadThem)
{
    const struct {
        ExportOptions options;
        const char *sheetType, *lastField, *deviceClass, *inkLimit, *spectralNorm;
    } cases[] = {
        {optionsOf(ChartFormat::cti3, false), "CTI3", "LAB_B", "OUTPUT", nullptr, nullptr},
        {optionsOf(ChartFormat::cti3, true, 300, 95), "CTI3", "SPEC_730", "OUTPUT", "300", "100"},
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
        // The form names no instrument a profile builder knows: the default one, for its brightener compensation.
        EXPECT_STREQ(keyword("TARGET_INSTRUMENT"), kDefaultInstrument);
        EXPECT_STREQ(keyword("BLACK_INK_LIMIT"), c.options.blackLimit ? "95" : nullptr);
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

TEST(ChartExport, TheTargetInstrumentIsTheFormsOrOneItsInstrumentationNames)
{
    const PatchLayout layout = readLayout("grid:2");
    const std::pair<std::vector<std::pair<std::string, std::string>>, const char*> cases[] = {
        {{{"TARGET_INSTRUMENT", "GretagMacbeth Spectrolino"}}, "GretagMacbeth Spectrolino"},
        {{{"INSTRUMENTATION", "X-Rite i1Pro 3, M1, white backing"}}, "X-Rite i1 Pro 3"},
        {{{"INSTRUMENTATION", "i1 Pro2 (M2)"}}, "X-Rite i1 Pro 2"},
        {{{"INSTRUMENTATION", "D50, 2 degree, 45/0"}}, kDefaultInstrument},
    };
    for (const auto& [keywords, instrument] : cases) {
        const std::string text = exportChart(anyCoverageModel(), FormProvenance{"form.txt", keywords}, layout,
                                             optionsOf(ChartFormat::cti3, false));
        EXPECT_STREQ(cgats::readTable(text).first.header.find("TARGET_INSTRUMENT")->value.c_str(), instrument);
    }
}
