// The measurement-file reader on messy real-world text, on every spectral
// layout and device family it accepts, and on the defects it must name.
#include "MeasurementFile.h"
#include "ToolTestSupport.h"

#include <gtest/gtest.h>

using namespace veltmarquist;
using tooltest::Row;

namespace {

std::vector<std::string> bands(const std::string& prefix, int first, int step, int count)
{
    std::vector<std::string> names;
    for (int j = 0; j < count; ++j)
        names.push_back(prefix + std::to_string(first + step * j));
    return names;
}

// A file of `sets` patches with CMYK and the given spectral fields, all bands 0.5.
std::string spectralFile(const std::vector<std::string>& spectral, int sets = 2, const std::string& value = "0.5")
{
    std::vector<std::string> fields{"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    fields.insert(fields.end(), spectral.begin(), spectral.end());
    std::vector<Row> rows;
    for (int i = 0; i < sets; ++i) {
        Row row{std::to_string(i + 1), std::to_string(10 * i), "0", "0", "0"};
        row.insert(row.end(), spectral.size(), value);
        rows.push_back(row);
    }
    return tooltest::cgats(fields, rows);
}

ReadResult read(const std::string& text, double scale = 0.0)
{
    ReadOptions options;
    options.scale = scale;
    return readMeasurementText(text, options);
}

void expectError(const std::string& text, Failure kind, int line, const std::string& fragment)
{
    const ReadResult result = read(text);
    ASSERT_FALSE(result.ok()) << "accepted: " << fragment;
    EXPECT_EQ(result.error.kind, kind) << result.error.describe();
    EXPECT_EQ(result.error.line, line) << result.error.describe();
    EXPECT_NE(result.error.describe().find(fragment), std::string::npos) << result.error.describe();
}

} // namespace

TEST(MeasurementFile, ReadsWhatInstrumentSoftwareWrites)
{
    // First line ISO28178, CR LF, trailing TABs, a line of TABs only, unquoted
    // multi-word values, a quoted value with a TAB inside, no NUMBER_OF_FIELDS,
    // SPECTRAL_NM_ names, percent reflectance, exponent and signed numbers.
    std::string text = "ISO28178\t\t\r\n\t\t\t\r\nDESCRIPTOR\tPress 4 coated (front)\t\t\r\n"
                       "CREATED\tJuly 2023\t\r\nMEASUREMENT_SOURCE\t\"Condition=M1\tFilter=D50\"\t\r\n"
                       "KEYWORD\t\"SHEET\"\r\nSHEET\t2\r\nBEGIN_DATA_FORMAT\t\t\r\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K";
    for (const std::string& name : bands("SPECTRAL_NM_", 380, 10, 36))
        text += "\t" + name;
    text += "\t\r\nEND_DATA_FORMAT\r\nNUMBER_OF_SETS\t2\r\nBEGIN_DATA\r\n";
    for (int set = 0; set < 2; ++set) {
        text += set == 0 ? "A1\t100\t0\t0\t0" : "A2\t0\t0\t0\t0";
        for (int band = 0; band < 36; ++band)
            text += band == 0 ? "\t1.5e+01" : band == 1 ? "\t+20" : "\t87.5";
        text += "\t\r\n";
    }
    text += "END_DATA\t\t\r\n";

    const ReadResult result = read(text);
    ASSERT_TRUE(result.ok()) << result.error.describe();
    const MeasurementFile& file = *result.file;
    EXPECT_EQ(file.fileType, "ISO28178");
    EXPECT_EQ(file.keyword("DESCRIPTOR"), "Press 4 coated (front)");
    EXPECT_EQ(file.keyword("CREATED"), "July 2023");
    EXPECT_EQ(file.keyword("MEASUREMENT_SOURCE"), "Condition=M1\tFilter=D50");
    EXPECT_EQ(file.deviceFields, (std::vector<std::string>{"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"}));
    EXPECT_EQ(file.layout.describe(), "36 bands 380-730 nm in 10 nm steps");
    EXPECT_EQ(file.scale, 100.0);
    EXPECT_TRUE(file.scaleDetected);
    ASSERT_EQ(file.sets.size(), 2u);
    EXPECT_EQ(file.sets[0].id, "A1");
    EXPECT_EQ(file.sets[0].line, 13);
    EXPECT_EQ(file.sets[1].line, 14);
    EXPECT_EQ(file.sets[0].device, (std::vector<double>{100, 0, 0, 0}));
    EXPECT_DOUBLE_EQ(file.sets[1].reflectance[0], 0.15);
    EXPECT_DOUBLE_EQ(file.sets[1].reflectance[1], 0.20);
    EXPECT_DOUBLE_EQ(file.sets[1].reflectance[35], 0.875);
    EXPECT_EQ(file.sets[1].where(), "sample A2 (line 14)");
}

TEST(MeasurementFile, SpectralFieldNamesAndLayouts)
{
    EXPECT_EQ(wavelengthOfField("SPECTRAL_NM380"), 380);
    EXPECT_EQ(wavelengthOfField("SPECTRAL_NM_390"), 390);
    EXPECT_EQ(wavelengthOfField("SPECTRAL_400"), 400);
    EXPECT_EQ(wavelengthOfField("nm730"), 730);
    EXPECT_EQ(wavelengthOfField("SPECTRAL_PCT"), 0);
    EXPECT_EQ(wavelengthOfField("NM_380"), 0);
    EXPECT_EQ(wavelengthOfField("nm38"), 0);

    struct Accepted {
        std::vector<std::string> fields;
        const char* layout;
    } accepted[] = {
        {bands("nm", 380, 10, 36), "36 bands 380-730 nm in 10 nm steps"},
        {bands("SPECTRAL_", 400, 10, 31), "31 bands 400-700 nm in 10 nm steps"},
        {bands("SPECTRAL_NM", 340, 10, 50), "50 bands 340-830 nm in 10 nm steps"},
        {bands("nm", 400, 20, 16), "16 bands 400-700 nm in 20 nm steps"},
    };
    for (const Accepted& case_ : accepted) {
        const ReadResult result = read(spectralFile(case_.fields));
        ASSERT_TRUE(result.ok()) << case_.layout << ": " << result.error.describe();
        EXPECT_EQ(result.file->layout.describe(), case_.layout);
    }
    EXPECT_TRUE(read(spectralFile(bands("nm", 400, 20, 16))).file->layout.sixteenBand());

    std::vector<std::string> gap = bands("nm", 380, 10, 36);
    gap.erase(gap.begin() + 8);
    std::vector<std::string> twice = bands("nm", 380, 10, 36);
    twice.push_back("SPECTRAL_NM380");
    const std::vector<std::string> unknown[] = {bands("nm", 380, 5, 71), gap, bands("nm", 420, 20, 15),
                                                bands("nm", 410, 10, 32), bands("nm", 385, 10, 36), twice,
                                                {"nm550"}};
    for (const std::vector<std::string>& fields : unknown) {
        const ReadResult result = read(spectralFile(fields));
        ASSERT_FALSE(result.ok()) << fields.front() << " ... " << fields.back();
        EXPECT_EQ(result.error.kind, Failure::InputContent);
        EXPECT_NE(result.error.message.find("unknown spectral layout"), std::string::npos) << result.error.message;
    }
}

TEST(MeasurementFile, DeviceChannelFamilies)
{
    EXPECT_EQ(colorFieldOf("6CLR_3"), std::make_pair(6, 3));
    EXPECT_EQ(colorFieldOf("7clr_7"), std::make_pair(7, 7));
    EXPECT_EQ(colorFieldOf("7CLR_8"), std::make_pair(0, 0));
    EXPECT_EQ(colorFieldOf("CLR_1"), std::make_pair(0, 0));
    EXPECT_EQ(colorFieldOf("CMYK_C"), std::make_pair(0, 0));

    // Names that start with a digit reach the CGATS parser under an alias,
    // and come back under their own names with their own values.
    std::vector<std::string> fields{"SAMPLE_NAME", "6CLR_1", "6CLR_2", "6CLR_3", "6CLR_4", "6CLR_5", "6CLR_6"};
    for (const std::string& name : bands("nm", 380, 10, 36))
        fields.push_back(name);
    Row row{"\"paper white\"", "0", "10", "0", "0", "55.5", "100"};
    row.insert(row.end(), 36, "0.9");
    const ReadResult result = read(tooltest::cgats(fields, {row}));
    ASSERT_TRUE(result.ok()) << result.error.describe();
    EXPECT_EQ(result.file->fields[1], "6CLR_1");
    EXPECT_EQ(result.file->deviceFields.size(), 6u);
    EXPECT_EQ(result.file->sets[0].device, (std::vector<double>{0, 10, 0, 0, 55.5, 100}));
    EXPECT_EQ(result.file->sets[0].id, "paper white");

    fields.erase(fields.begin() + 6); // 6CLR_6 gone
    row.erase(row.begin() + 6);
    expectError(tooltest::cgats(fields, {row}), Failure::InputContent, 0, "6CLR_6 is missing");
    expectError(tooltest::cgats({"CMYK_C", "CMYK_M", "nm400"}, {{"0", "0", "0.5"}}), Failure::InputContent, 0,
                "CMYK_Y is missing");
}

TEST(MeasurementFile, ReflectanceScaleDetectedOrGiven)
{
    const std::vector<std::string> spectral = bands("nm", 380, 10, 36);
    EXPECT_EQ(read(spectralFile(spectral, 2, "1.2")).file->scale, 1.0); // brightened paper above 1
    EXPECT_EQ(read(spectralFile(spectral, 2, "2.5")).file->scale, 100.0);
    const ReadResult given = read(spectralFile(spectral, 2, "1.2"), 100.0);
    EXPECT_FALSE(given.file->scaleDetected);
    EXPECT_DOUBLE_EQ(given.file->sets[0].reflectance[0], 0.012);
    const ReadResult wrong = read(spectralFile(spectral, 2, "87.5"), 1.0);
    ASSERT_FALSE(wrong.ok());
    EXPECT_EQ(wrong.error.line, 9);
    EXPECT_NE(wrong.error.message.find("see --scale"), std::string::npos) << wrong.error.message;
}

TEST(MeasurementFile, DefectsAreNamedWithTheirLine)
{
    const std::string good = spectralFile(bands("nm", 380, 10, 36));
    std::string shortRow = good;
    shortRow.replace(shortRow.find("\t0.5\n"), 5, "\n");
    expectError(shortRow, Failure::InputSyntax, 9, "40 values, but 41 fields");
    std::string miscounted = good;
    miscounted.replace(miscounted.find("NUMBER_OF_SETS\t2"), 16, "NUMBER_OF_SETS\t3");
    expectError(miscounted, Failure::InputSyntax, 7, "NUMBER_OF_SETS says 3, but the data holds 2 sets");
    std::string word = good;
    word.replace(word.rfind("0.5"), 3, "n/a");
    expectError(word, Failure::InputContent, 10, "field nm730: 'n/a' is not a number");
    std::string device = good;
    device.replace(device.find("\n2\t10\t"), 6, "\n2\t110\t");
    expectError(device, Failure::InputContent, 10, "CMYK_C: 110 is outside 0-100 %");

    expectError("", Failure::InputSyntax, 0, "no BEGIN_DATA_FORMAT");
    expectError("hello\nworld\n", Failure::InputSyntax, 0, "no BEGIN_DATA_FORMAT");
    expectError("CGATS.17\nBEGIN_DATA\n1\nEND_DATA\n", Failure::InputSyntax, 2, "before any BEGIN_DATA_FORMAT");
    expectError(std::string("CGATS.17\n\0\n", 11), Failure::InputSyntax, 0, "NUL");
    // The parser would open the named file; the reader takes no file names.
    expectError(".INCLUDE \"/etc/passwd\"\n" + good, Failure::InputSyntax, 1, "not a CGATS keyword");
    expectError("CGATS.17\n$INCLUDE x\n" + good.substr(9), Failure::InputSyntax, 2, "not a CGATS keyword");
    expectError(spectralFile(bands("nm", 380, 10, 36), 0), Failure::InputContent, 0, "the file holds no data sets");
}

TEST(MeasurementFile, RepeatedIdentifiers)
{
    const std::vector<std::string> spectral = bands("nm", 380, 10, 36);
    std::string repeat = spectralFile(spectral, 3);
    repeat.replace(repeat.find("\n3\t20\t"), 6, "\n1\t0\t"); // sample 1 measured again
    EXPECT_TRUE(read(repeat).ok());
    std::string conflict = spectralFile(spectral, 3);
    conflict.replace(conflict.find("\n3\t20\t"), 6, "\n1\t20\t");
    expectError(conflict, Failure::DuplicatePatch, 11, "sample 1 is also on line 9 with other device values");
    std::vector<std::string> fields{"SAMPLE_NAME"};
    for (const std::string& name : spectral)
        fields.push_back(name);
    Row white{"W"};
    white.insert(white.end(), 36, "0.8");
    expectError(tooltest::cgats(fields, {white, white}), Failure::DuplicatePatch, 10, "sample W is also on line 9");
}

TEST(MeasurementFile, ReadsTheLibrarysChartLayouts)
{
    const MeasurementFile xyz = tooltest::parse(tooltest::goldenPath("offset-form.p0.chart"));
    EXPECT_EQ(xyz.fileType, "IT8");
    EXPECT_TRUE(xyz.hasXYZ);
    EXPECT_FALSE(xyz.layout.present());
    ASSERT_EQ(xyz.sets.size(), 900u);
    EXPECT_EQ(xyz.sets[0].device, (std::vector<double>{100, 0, 0, 0}));
    EXPECT_DOUBLE_EQ(xyz.sets[0].XYZ[1], 54.67);

    const MeasurementFile converted = tooltest::parse(tooltest::goldenPath("conversion.p8.chart"));
    EXPECT_EQ(converted.keyword("LGOROWLENGTH"), "54");
    EXPECT_EQ(converted.layout.describe(), "36 bands 380-730 nm in 10 nm steps");
    EXPECT_EQ(converted.sets.size(), 30u);

    const MeasurementFile spectral = tooltest::parse(tooltest::goldenPath("multichannel.p5.chart"));
    EXPECT_EQ(spectral.keyword("TARGET_ID"), "7.11");
    EXPECT_EQ(spectral.sets.size(), 159u);
    EXPECT_EQ(spectral.deviceFields.size(), 4u); // RGB_R.. hold the further inks and are not device fields
}

TEST(MeasurementFile, RealMeasuredDataSet)
{
    const std::string path = tooltest::realDataPath();
    if (path.empty())
        GTEST_SKIP() << "the evaluation data set is not beside the project";
    const MeasurementFile file = tooltest::parse(path);
    EXPECT_EQ(file.fileType, "ISO28178");
    EXPECT_EQ(file.keyword("DESCRIPTOR"), "APTEC PC10_CardBoard_2023_v1");
    EXPECT_EQ(file.keyword("CREATED"), "July 2023");
    EXPECT_EQ(file.fields.size(), 41u);
    EXPECT_EQ(file.sets.size(), 1617u);
    EXPECT_EQ(file.layout.describe(), "36 bands 380-730 nm in 10 nm steps");
    EXPECT_EQ(file.scale, 1.0);
    EXPECT_EQ(file.sets.back().id, "1617");
    EXPECT_DOUBLE_EQ(file.sets.back().reflectance[0], 0.0796);
}
