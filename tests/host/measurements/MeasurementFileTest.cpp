// What the sets of a measurement file mean: scale, exact values, unmeasured bands, repeats, warnings.
#include "Cgats.h"
#include "MeasurementFile.h"

#include <gtest/gtest.h>

#include <cctype>
#include <filesystem>
#include <fstream>
#include <sstream>

using namespace veltmarquist;

namespace {

// A file of SAMPLE_ID, CMYK_C..CMYK_K and nm380..nm730. Each row: "C M Y K", then one value for every band,
// or "value@band" for one band and the first value for the others.
std::string form(const std::vector<std::pair<std::string, std::string>>& rows)
{
    cgats::Document document;
    document.fields = {"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    for (int nm = 380; nm <= 730; nm += 10)
        document.fields.push_back("nm" + std::to_string(nm));
    for (const auto& [device, spectrum] : rows) {
        std::istringstream words(device + " " + spectrum);
        std::vector<std::string> row{std::to_string(document.rows.size() + 1)}, values;
        for (std::string word; words >> word;)
            row.size() < 5 ? row.push_back(word) : values.push_back(word);
        row.insert(row.end(), 36, values[0]);
        for (size_t i = 1; i < values.size(); ++i)
            row[5 + std::stoul(values[i].substr(values[i].find('@') + 1))] = values[i].substr(0, values[i].find('@'));
        document.rows.push_back(std::move(row));
    }
    return cgats::write(document);
}

const std::string kPaper = "0 0 0 0", kTint = "40 0 0 0";

std::string outcome(const std::string& text, double scale = 0.0)
{
    const ReadResult read = readMeasurementText(text, {scale});
    return read.ok() ? "scale " + std::to_string(int(read.file->scale)) : read.error.describe();
}

} // namespace

TEST(MeasurementFile, DecidesTheScaleFromRobustEvidenceAndRefusesContradictions)
{
    const std::tuple<const char*, std::string, double, const char*> cases[] = {
        {"StrayValueInA01File", form({{kPaper, "0.9"}, {kTint, "0.4 2.5@3"}}), 0, "scale 1"},
        {"PercentPaper", form({{kPaper, "90"}, {kTint, "1.5"}}), 0, "scale 100"},
        {"BulkWithoutPaper", form({{kTint, "40"}, {"0 40 0 0", "30 1.5@2"}}), 0, "scale 100"},
        {"AmbiguousWithoutPaper", form({{kTint, "0.4 2.5@3 2.5@4 2.5@5"}}), 0, "cannot tell the reflectance scale"},
        {"PaperAgainstBulk", form({{kPaper, "0.9"}, {kTint, "40"}, {"0 40 0 0", "40"}}), 0,
         "the paper peaks at 0.9 (a 0-1 scale), but 72 of 108 values are above 2"},
        {"GivenPercentFor01", form({{kPaper, "0.9"}}), 100, "--scale 100 contradicts the data: the paper peaks at 0.9"},
        {"Given01ForPercent", form({{kPaper, "90"}}), 1, "--scale 1 contradicts the data: the paper peaks at 90"},
        {"OutOfRange", form({{kPaper, "0.9"}, {kTint, "0.4 3.5@2"}}), 0, "line 9: field nm400: reflectance 3.5 is out"},
        {"DeviceFractions", form({{kPaper, "0.9"}, {"0.4 0 0 0", "0.5"}}), 0, "every device value lies within 0-1"},
        {"NotANumber", form({{kPaper, "0.9 n/a@35"}}), 0, "line 8: field nm730: 'n/a' is not a number"},
        {"DeviceOutside", form({{"110 0 0 0", "0.9"}}), 0, "line 8: field CMYK_C: 110 is outside 0-100 %"},
        {"MiddleZeroBand", form({{kPaper, "0.9 0@17"}}), 0, "the paper is 0 at 550 nm, inside the measured range"},
    };
    for (const auto& [name, text, scale, expected] : cases) {
        SCOPED_TRACE(name);
        EXPECT_EQ(outcome(text, scale).substr(0, std::string(expected).size()), expected);
    }
}

TEST(MeasurementFile, EqualReadingsGiveEqualThousandthsWhateverTheScaleOrRepeats)
{
    // 0.0005 is exactly half a thousandth: up, on both scales and as the mean of identical repeats.
    const std::pair<std::string, double> cases[] = {
        {form({{kPaper, "0.9 0.0005@3"}}), 1}, {form({{kPaper, "90 0.05@3"}}), 1},
        {form({{kPaper, "0.9 0.0005@3"}, {kPaper, "0.9 0.0005@3"}, {kPaper, "0.9 0.0005@3"}}), 1},
        {form({{kPaper, "0.9 0.0004@3"}, {kPaper, "0.9 0.0006@3"}}), 1}, // mean 0.0005
        {form({{kPaper, "0.9 0.00049999@3"}}), 0}};
    for (const auto& [text, thousandths] : cases) {
        const ReadResult read = readMeasurementText(text);
        ASSERT_TRUE(read.ok()) << read.error.describe();
        std::vector<size_t> all(read.file->sets.size());
        for (size_t i = 0; i < all.size(); ++i)
            all[i] = i;
        EXPECT_EQ(averageThousandths(*read.file, all)[3], thousandths) << text.substr(text.find("BEGIN_DATA\n"));
    }
}

TEST(MeasurementFile, RealDataSetReadsAlikeInPercent)
{
    const std::string path = VELTMARQUIST_SHARED_DATA_DIR "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt";
    std::ifstream in(path);
    if (!in)
        GTEST_SKIP() << "no evaluation data set at " << path << " (the real press data set is not beside the project)";
    const std::string text((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    // Percent by moving the decimal point of every 0.ddd reading two places: the same digits.
    std::string percent;
    for (size_t i = 0; i < text.size(); ++i) {
        size_t end = i + 2;
        while (end < text.size() && std::isdigit(static_cast<unsigned char>(text[end])))
            ++end;
        if (i == 0 || text[i - 1] != '\t' || text.compare(i, 2, "0.") != 0 || end == i + 2) {
            percent += text[i];
            continue;
        }
        std::string digits = text.substr(i + 2, end - i - 2);
        digits.resize(std::max<size_t>(digits.size(), 2), '0');
        percent += std::to_string(std::stoi(digits.substr(0, 2))) + (digits.size() > 2 ? "." + digits.substr(2) : "");
        i = end - 1;
    }
    const ReadResult unit = readMeasurementText(text), hundred = readMeasurementText(percent);
    ASSERT_TRUE(unit.ok()) << unit.error.describe();
    ASSERT_TRUE(hundred.ok()) << hundred.error.describe();
    EXPECT_EQ(hundred.file->scale, 100.0);
    ASSERT_EQ(unit.file->sets.size(), hundred.file->sets.size());
    for (size_t i = 0; i < unit.file->sets.size(); ++i)
        ASSERT_EQ(unit.file->sets[i].reflectance, hundred.file->sets[i].reflectance) << unit.file->sets[i].where();
}

TEST(MeasurementFile, WidensUnmeasuredEndBandsAndWarnsAboutImplausibleReadings)
{
    const ReadResult read = readMeasurementText(
        form({{kPaper, "0.9 0@0 0@1"}, {kTint, "0.5 0@0 0.2@1"}, {"0 40 0 0", "-0.001 0@5"}, {"0 0 40 0", "0.5 -0.01@3"}}));
    ASSERT_TRUE(read.ok()) << read.error.describe();
    EXPECT_EQ(read.file->sets[1].reflectance[0], 500000) << "380 nm widened from 400 nm";
    const std::vector<std::string> warnings = {
        "the paper is 0 at 380-390 nm: taken as unmeasured and widened from 400 nm in every set",
        "1 set(s) read zero or negative in every band, the first sample 3 (line 10): no instrument reads that on paper or ink"};
    EXPECT_EQ(read.file->warnings, warnings);
}

TEST(MeasurementFile, ReadsTheChartAndSpectralFilesOfDebianColourPackages)
{
    // argyll-ref (.ti1 .ti2 .sp .cie) and icc-profiles-free (.ti3): read, or refused for their content only.
    size_t files = 0;
    for (const char* folder : {"/usr/share/color/argyll/ref", "/usr/share/color/icc"}) {
        std::error_code absent;
        for (const auto& entry : std::filesystem::directory_iterator(folder, absent)) {
            const std::string name = entry.path().filename(), type = entry.path().extension();
            if (type != ".ti1" && type != ".ti2" && type != ".ti3" && type != ".sp" && type != ".cie")
                continue;
            ++files;
            const ReadResult read = readMeasurementFile(entry.path());
            if (!read.ok()) {
                EXPECT_EQ(read.error.kind, ReadFailure::Content) << name << ": " << read.error.describe();
            }
        }
    }
    if (files == 0)
        GTEST_SKIP() << "argyll-ref and icc-profiles-free are not installed (scripts/setup.sh installs them)";
}
