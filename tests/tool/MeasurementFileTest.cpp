// The measurement-file reader on messy real-world text, on the spectral
// layouts it accepts, and on the defects it must name with kind and line.
#include "ToolTestSupport.h"

#include <gtest/gtest.h>

using namespace veltmarquist;

namespace {

std::vector<std::string> bands(const char* prefix, int first, int step, int count)
{
    std::vector<std::string> names;
    for (int j = 0; j < count; ++j)
        names.push_back(prefix + std::to_string(first + step * j));
    return names;
}

// Samples 1 and 2 with CMYK and these spectral fields, every band `value`.
std::string spectralFile(const char* value = "0.5", const std::vector<std::string>& spectral = bands("nm", 380, 10, 36))
{
    std::vector<std::string> fields{"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    fields.insert(fields.end(), spectral.begin(), spectral.end());
    std::vector<tooltest::Row> rows{{"1", "0", "0", "0", "0"}, {"2", "10", "0", "0", "0"}};
    for (tooltest::Row& row : rows)
        row.insert(row.end(), spectral.size(), value);
    return tooltest::cgats(fields, rows);
}

std::string replaced(std::string text, const std::string& from, const std::string& to)
{
    return text.replace(text.find(from), from.size(), to);
}

} // namespace

TEST(MeasurementFile, ReadsWhatInstrumentSoftwareWrites)
{
    // First line ISO28178, CR LF, trailing TABs, a line of TABs only, unquoted
    // multi-word values, a quoted value with a TAB inside, no NUMBER_OF_FIELDS,
    // SPECTRAL_NM_ names, percent reflectance, exponent and signed numbers.
    std::string text = "ISO28178\t\t\r\n\t\t\t\r\nDESCRIPTOR\tPress 4 coated (front)\t\t\r\nCREATED\tJuly 2023\t\r\n"
                       "MEASUREMENT_SOURCE\t\"Condition=M1\tFilter=D50\"\t\r\nBEGIN_DATA_FORMAT\t\t\r\n"
                       "SAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K";
    for (const std::string& name : bands("SPECTRAL_NM_", 380, 10, 36))
        text += "\t" + name;
    text += "\t\r\nEND_DATA_FORMAT\r\nNUMBER_OF_SETS\t2\r\nBEGIN_DATA\r\n";
    for (const char* set : {"A1\t100\t0\t0\t0", "A2\t0\t0\t0\t0"}) {
        text += set;
        for (int band = 0; band < 36; ++band)
            text += band == 0 ? "\t1.5e+01" : band == 1 ? "\t+20" : "\t87.5";
        text += "\t\r\n";
    }
    const ReadResult result = readMeasurementText(text + "END_DATA\t\t\r\n");
    ASSERT_TRUE(result.ok()) << result.error.describe();
    const MeasurementFile& file = *result.file;
    EXPECT_EQ(file.keyword("DESCRIPTOR"), "Press 4 coated (front)");
    EXPECT_EQ(file.keyword("MEASUREMENT_SOURCE"), "Condition=M1\tFilter=D50");
    ASSERT_EQ(file.sets.size(), 2u);
    EXPECT_EQ(file.sets[1].where(), "sample A2 (line 12)");
    EXPECT_EQ(file.sets[0].device, (std::vector<double>{100, 0, 0, 0}));
    EXPECT_DOUBLE_EQ(file.sets[1].reflectance[0], 0.15);
    EXPECT_DOUBLE_EQ(file.sets[1].reflectance[1], 0.20);
    EXPECT_DOUBLE_EQ(file.sets[1].reflectance[35], 0.875);
}

TEST(MeasurementFile, SpectralLayoutsAndReflectanceScale)
{
    const std::pair<std::vector<std::string>, const char*> layouts[] = {
        {bands("nm", 380, 10, 36), "36 bands 380-730 nm in 10 nm steps"},
        {bands("SPECTRAL_", 400, 10, 31), "31 bands 400-700 nm in 10 nm steps"},
        {bands("SPECTRAL_NM", 340, 10, 50), "50 bands 340-830 nm in 10 nm steps"},
        {bands("nm", 400, 20, 16), "16 bands 400-700 nm in 20 nm steps"},
        {bands("nm", 380, 5, 71), "unknown spectral layout"},
        {bands("nm", 420, 20, 15), "unknown spectral layout"},
        {bands("nm", 410, 10, 32), "unknown spectral layout"},
        {bands("nm", 385, 10, 36), "unknown spectral layout"},
    };
    for (const auto& [fields, layout] : layouts) {
        const ReadResult result = readMeasurementText(spectralFile("0.5", fields));
        EXPECT_EQ(result.ok() ? result.file->layout.describe() : result.error.message.substr(0, 23), layout);
    }
    EXPECT_EQ(readMeasurementText(spectralFile("1.2")).file->scale, 1.0); // brightened paper above 1
    EXPECT_EQ(readMeasurementText(spectralFile("2.5")).file->scale, 100.0);
    EXPECT_DOUBLE_EQ(readMeasurementText(spectralFile("1.2"), {100.0}).file->sets[0].reflectance[0], 0.012);
}

TEST(MeasurementFile, DefectsAreNamedWithKindAndLine)
{
    const std::string good = spectralFile();
    EXPECT_TRUE(readMeasurementText(replaced(good, "\n2\t10\t", "\n1\t0\t")).ok()) << "sample 1 measured twice";
    const struct {
        std::string text;
        Failure kind;
        int line;
        const char* message;
        double scale = 0.0;
    } cases[] = {
        {replaced(good, "\t0.5\n", "\n"), Failure::InputSyntax, 8, "40 values, but 41 fields"},
        {replaced(good, "SETS\t2", "SETS\t3"), Failure::InputSyntax, 6, "says 3, but the data holds 2 sets"},
        {replaced(good, "0.5\nEND", "n/a\nEND"), Failure::InputContent, 9, "field nm730: 'n/a' is not a number"},
        {replaced(good, "\n2\t10\t", "\n2\t110\t"), Failure::InputContent, 9, "CMYK_C: 110 is outside 0-100 %"},
        {replaced(good, "\n2\t10\t", "\n1\t10\t"), Failure::DuplicatePatch, 9, "sample 1 is also on line 8 with other"},
        {replaced(good, "CMYK_Y", "CMYK_G"), Failure::InputContent, 0, "CMYK_Y is missing"},
        {spectralFile("87.5"), Failure::InputContent, 8, "see --scale", 1.0},
        {"CGATS.17\nBEGIN_DATA\n1\nEND_DATA\n", Failure::InputSyntax, 2, "before any BEGIN_DATA_FORMAT"},
        // The CGATS parser would open the named file; the reader takes no file names.
        {".INCLUDE \"/etc/passwd\"\n" + good, Failure::InputSyntax, 1, "not a CGATS keyword"},
    };
    for (const auto& case_ : cases) {
        const ReadResult result = readMeasurementText(case_.text, {case_.scale});
        ASSERT_FALSE(result.ok()) << "accepted: " << case_.message;
        EXPECT_EQ(result.error.kind, case_.kind) << result.error.describe();
        EXPECT_EQ(result.error.line, case_.line) << result.error.describe();
        EXPECT_NE(result.error.describe().find(case_.message), std::string::npos) << result.error.describe();
    }
}
