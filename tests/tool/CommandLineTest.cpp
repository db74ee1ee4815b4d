// Every command of the built tool end to end: on the golden inputs written as
// CGATS files (the outputs must equal the library's reference charts byte for
// byte), on the bundled samples, on the real measured data set when it is
// there, and on every kind of failure.
#include "PatchMatching.h"
#include "ToolTestSupport.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <random>
#include <sstream>
#include <tuple>

#include <sys/stat.h>

using namespace tooltest;
using veltmarquist::MeasurementFile;

namespace {

bool contains(const std::string& text, const std::string& part)
{
    return text.find(part) != std::string::npos;
}

std::vector<std::string> lines(const std::string& text)
{
    std::vector<std::string> result;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);)
        result.push_back(line);
    return result;
}

void expectSuccess(const ToolRun& run)
{
    EXPECT_EQ(run.exitCode, 0) << run.err;
    EXPECT_EQ(run.err, "");
}

void expectSameFile(const std::string& written, const std::string& golden)
{
    EXPECT_TRUE(readFile(written) == readFile(goldenPath(golden))) << written << " differs from " << golden;
}

// The golden multi-channel patches as a form with nCLR fields: C, M, Y, K
// solids, paper, three tints the processes do not read, further ink solids.
std::string multiChannelForm(int inks, bool withLastSolid = true)
{
    const GoldenBlock block = readGolden("multichannel.in");
    std::vector<std::string> fields{"SAMPLE_ID"};
    for (int k = 1; k <= inks; ++k)
        fields.push_back(std::to_string(inks) + "CLR_" + std::to_string(k));
    for (const std::string& name : block.spectralFields())
        fields.push_back(name);
    const int solidOf[11] = {0, 1, 2, 3, -1, -2, -3, -4, 4, 5, 6};
    std::vector<Row> rows;
    for (int patch = 0; patch < inks + 4; ++patch) {
        if (patch == inks + 3 && !withLastSolid)
            break;
        Row row{std::to_string(patch + 1)};
        for (int channel = 0; channel < inks; ++channel)
            row.push_back(channel == solidOf[patch] ? "100" : solidOf[patch] == -channel - 2 ? "50" : "0");
        for (int j = 0; j < block.valuesPerPatch; ++j)
            row.push_back(block.value(patch, j));
        rows.push_back(row);
    }
    return cgats(fields, rows);
}

// The golden separations (thousandths of a percent) as a CGATS file in
// percent, values outside 0-100 % clamped (the tool rejects them). `channels`
// picks the golden channels that become nCLR_1, nCLR_2, ...
struct Separations {
    std::string text;
    std::vector<bool> exact; // per record: nothing clamped or dropped
};
Separations separationsFile(const std::vector<int>& channels, size_t records = 3499, int lastId = 0)
{
    std::ifstream in(goldenPath("multichannel.separations"));
    const std::string family = std::to_string(channels.size()) + "CLR_";
    std::vector<std::string> fields{"SAMPLE_ID"};
    for (size_t k = 1; k <= channels.size(); ++k)
        fields.push_back(family + std::to_string(k));
    Separations result;
    std::vector<Row> rows;
    for (size_t record = 0; record < records; ++record) {
        int values[7];
        for (int& value : values)
            in >> value;
        bool exact = true;
        for (int channel = 0; channel < 7; ++channel) {
            const bool used = std::find(channels.begin(), channels.end(), channel) != channels.end();
            exact = exact && values[channel] >= 0 && values[channel] <= 100000 && (used || values[channel] == 0);
        }
        Row row{std::to_string(record + 1 == records && lastId ? lastId : static_cast<int>(record + 1))};
        for (int channel : channels) {
            char text[32];
            std::snprintf(text, sizeof text, "%.3f", std::clamp(values[channel], 0, 100000) / 1000.0);
            row.push_back(text);
        }
        rows.push_back(row);
        result.exact.push_back(exact);
    }
    result.text = cgats(fields, rows);
    return result;
}

// Lines of an XYZ chart of the separated set that must equal the golden
// chart: the header, the records that went in unchanged, the end.
void expectSeparatedChart(const std::string& written, const std::string& golden, const std::vector<bool>& exact)
{
    const std::vector<std::string> ours = lines(readFile(written)), theirs = lines(readFile(goldenPath(golden)));
    ASSERT_EQ(ours.size(), theirs.size());
    size_t compared = 0;
    for (size_t line = 0; line < ours.size(); ++line) {
        const bool record = line >= 7 && line < 7 + exact.size();
        if (record && !exact[line - 7])
            continue;
        EXPECT_EQ(ours[line], theirs[line]) << "line " << line + 1;
        compared += record ? 1 : 0;
    }
    EXPECT_GT(compared, 1000u);
}

// The golden conversion input: 30 patches with seven channels, then the two
// whites, named PAPER_PRINTED and PAPER_TARGET.
std::string conversionChart(bool targetTwice = false, bool withTarget = true)
{
    const GoldenBlock block = readGolden("conversion.in");
    std::vector<std::string> fields{"SAMPLE_ID", "SAMPLE_NAME"};
    for (int k = 1; k <= 7; ++k)
        fields.push_back("7CLR_" + std::to_string(k));
    for (const std::string& name : block.spectralFields())
        fields.push_back(name);
    std::vector<Row> rows;
    for (int patch = 0; patch < (withTarget ? block.count : block.count - 1); ++patch) {
        const std::string name = patch == 30 ? "PAPER_PRINTED" : patch == 31 || (targetTwice && patch == 2)
                                                                      ? "PAPER_TARGET"
                                                                      : "P" + std::to_string(patch + 1);
        Row row{std::to_string(patch + 1), name};
        for (int channel = 0; channel < 7; ++channel)
            row.push_back(std::to_string(block.ints[static_cast<size_t>(block.count * 36 + 7 * patch + channel)]));
        for (int j = 0; j < 36; ++j)
            row.push_back(block.value(patch, j));
        rows.push_back(row);
    }
    return cgats(fields, rows);
}

// A one-spectrum white file from patch `patch` of the conversion input.
std::string whiteFile(int patch, bool zeroBand = false)
{
    const GoldenBlock block = readGolden("conversion.in");
    std::vector<std::string> fields{"SAMPLE_NAME"};
    Row row{"WHITE"};
    for (int j = 0; j < 36; ++j) {
        fields.push_back("SPECTRAL_NM" + std::to_string(380 + 10 * j));
        row.push_back(zeroBand && j == 3 ? "0" : block.value(patch, j));
    }
    return cgats(fields, {row});
}

std::string goldenForm(const std::string& name)
{
    const GoldenBlock block = readGolden(name);
    return cgats(testFormFields(block), testFormRows(block));
}

} // namespace

TEST(CommandLine, ChartOfAShuffledFormEqualsTheLibrarysChart)
{
    TempDir dir;
    const GoldenBlock golden = readGolden("offset-form.in");
    std::vector<Row> rows = testFormRows(golden);
    Row repeat = rows[0], other = rows[0];
    repeat[0] = "47"; // the cyan solid measured twice, identically
    other[0] = "48";
    other[1] = "55"; // a patch the form does not have
    rows.push_back(repeat);
    rows.push_back(other);
    std::shuffle(rows.begin(), rows.end(), std::mt19937(7));
    writeFile(dir.path("form.txt"), cgats(testFormFields(golden), rows));

    ToolRun run = runTool({"chart", "form.txt", "-o", "chart.txt"}, dir.dir());
    expectSuccess(run);
    expectSameFile(dir.path("chart.txt"), "offset-form.p0.chart");
    EXPECT_TRUE(contains(run.out, "46 test-form patches found in 47 measurements (repeated measurements averaged "
                                  "for 1 of them); 1 other measurements ignored"))
        << run.out;
    EXPECT_TRUE(contains(run.out, "gray difference factor  C -0.04  M -0.03  Y -0.02  K 0.03")) << run.out;
    EXPECT_TRUE(contains(run.out, "coverage limit          96 %")) << run.out;
    EXPECT_TRUE(contains(run.out, "chart: 900 patches (offset model) written to chart.txt")) << run.out;
    EXPECT_FALSE(contains(run.out, "check:")) << "no chart combination beyond the test form was measured";
    EXPECT_EQ(dir.files(), (std::vector<std::string>{"chart.txt", "form.txt"}));

    run = runTool({"chart", "form.txt", "-o", "fitted.txt", "--fit-gravure"}, dir.dir());
    expectSuccess(run);
    expectSameFile(dir.path("fitted.txt"), "offset-form.rgb-p1.chart");
    EXPECT_TRUE(contains(run.out, "ink order               YMKC (3)")) << run.out;
    EXPECT_TRUE(contains(run.out, "trapping factors        red 0.95  green 0.95  blue 1")) << run.out;

    run = runTool({"chart", "form.txt", "-o", "gravure.txt", "--process", "gravure"}, dir.dir());
    expectSuccess(run);
    expectSameFile(dir.path("gravure.txt"), "offset-form.p1.chart");
    EXPECT_TRUE(contains(run.out, "(defaults; --fit-gravure fits them)")) << run.out;
}

TEST(CommandLine, SixteenBandFormRunsAsInputKind20)
{
    TempDir dir;
    writeFile(dir.path("form16.txt"), goldenForm("offset-form-k20.in"));
    const ToolRun run = runTool({"chart", "form16.txt", "-o", "chart.txt"}, dir.dir());
    expectSuccess(run);
    EXPECT_TRUE(contains(run.out, "16 bands 400-700 nm in 20 nm steps")) << run.out;
    expectSameFile(dir.path("chart.txt"), "offset-form-k20.p0.chart");
}

TEST(CommandLine, CompareWritesTheMeasuredAndModelledCharts)
{
    TempDir dir;
    writeFile(dir.path("form.txt"), goldenForm("offset-form.in"));
    ASSERT_EQ(::mkdir(dir.path("out").c_str(), 0755), 0);
    const ToolRun run = runTool({"compare", "form.txt", "--process", "gravure", "-o", "out"}, dir.dir());
    expectSuccess(run);
    expectSameFile(dir.path("out/form.measured46.txt"), "offset-form.c46-measured.chart");
    expectSameFile(dir.path("out/form.gravure46.txt"), "offset-form.c46-gravure.chart");

    // One line per patch; the largest CIEDE2000 of the lines is the summary's max.
    double largest = 0.0;
    int patches = 0;
    for (const std::string& line : lines(run.out)) {
        int number;
        double c, m, y, k, ab, de2000;
        if (std::sscanf(line.c_str(), "%d %lf %lf %lf %lf %lf %lf", &number, &c, &m, &y, &k, &ab, &de2000) != 7)
            continue;
        ++patches;
        largest = std::max(largest, de2000);
        if (number == 2) { // the paper: the model reproduces it
            EXPECT_EQ(ab + de2000, 0.0) << line;
        }
    }
    EXPECT_EQ(patches, 46);
    char max[32];
    std::snprintf(max, sizeof max, "max %.2f\n", largest);
    EXPECT_TRUE(contains(run.out, std::string("CIEDE2000 over 46 patches: mean ")) && contains(run.out, max))
        << run.out;
}

TEST(CommandLine, ChartOfTheBundledPressSheetChecksTheModel)
{
    TempDir dir;
    const ToolRun run = runTool({"chart", samplePath("offset_press_sheet.txt"), "-o", "chart.txt"}, dir.dir());
    expectSuccess(run);
    EXPECT_TRUE(contains(run.out, "reflectance 0-100 (detected)")) << run.out;
    const MeasurementFile chart = parse(dir.path("chart.txt"));
    EXPECT_EQ(chart.fields, (std::vector<std::string>{"Sample_Name", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "XYZ_X",
                                                      "XYZ_Y", "XYZ_Z"}));
    EXPECT_EQ(chart.sets.size(), 900u);
    double mean = 99.0;
    const size_t at = run.out.find("check: 230 chart combinations measured beyond the test form, CIEDE2000 mean ");
    ASSERT_NE(at, std::string::npos) << run.out;
    std::sscanf(run.out.c_str() + run.out.find("mean ", at), "mean %lf", &mean);
    EXPECT_LT(mean, 1.5) << "the offset model should predict the synthetic press closely";
}

TEST(CommandLine, MultiChannelExchangeEqualsTheLibrary)
{
    TempDir dir;
    writeFile(dir.path("form7.txt"), multiChannelForm(7));
    const Separations seven = separationsFile({0, 1, 2, 3, 4, 5, 6});
    writeFile(dir.path("sep7.txt"), seven.text);
    ToolRun run = runTool({"multichannel", "form7.txt", "--inks", "7", "-o", "p5.txt", "--combinations", "comb.txt",
                       "--separations", "sep7.txt", "--separated-out", "p6.txt"},
                      dir.dir());
    expectSuccess(run);
    expectSameFile(dir.path("p5.txt"), "multichannel.p5.chart");
    expectSeparatedChart(dir.path("p6.txt"), "multichannel.p5-p6.chart", seven.exact);
    const MeasurementFile combinations = parse(dir.path("comb.txt"));
    EXPECT_EQ(combinations.fields, (std::vector<std::string>{"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"}));
    ASSERT_EQ(combinations.sets.size(), 3499u);
    EXPECT_EQ(combinations.sets[1].device, (std::vector<double>{0, 0, 0, 2}));
    EXPECT_EQ(combinations.sets[3498].device, (std::vector<double>{100, 100, 100, 100}));

    // Six inks: ink B is the model's channel 6, channel 5 stays unprinted.
    writeFile(dir.path("form6.txt"), multiChannelForm(6));
    const Separations six = separationsFile({0, 1, 2, 3, 4, 6});
    writeFile(dir.path("sep6.txt"), six.text);
    run = runTool({"multichannel", "form6.txt", "--inks", "6", "-o", "p3.txt", "--separations", "sep6.txt",
                   "--separated-out", "p6.txt"},
                  dir.dir());
    expectSuccess(run);
    expectSameFile(dir.path("p3.txt"), "multichannel.p3.chart");
    expectSeparatedChart(dir.path("p6.txt"), "multichannel.p3-p6.chart", six.exact);
}

TEST(CommandLine, MultiChannelSamples)
{
    TempDir dir;
    for (const auto& [inks, sample, sets, target] :
         {std::make_tuple("6", "six_ink_form.txt", 128u, "5.11"), std::make_tuple("7", "seven_ink_form.txt", 159u, "7.11")}) {
        const ToolRun run = runTool({"multichannel", samplePath(sample), "--inks", inks, "-o", "chart.txt"}, dir.dir());
        expectSuccess(run);
        const MeasurementFile chart = parse(dir.path("chart.txt"));
        EXPECT_EQ(chart.keyword("TARGET_ID"), target);
        EXPECT_EQ(chart.fields.size(), 43u);
        EXPECT_EQ(chart.sets.size(), sets);
    }
}

TEST(CommandLine, ConvertEqualsTheLibraryWithWhitesByNameOrFile)
{
    TempDir dir;
    writeFile(dir.path("chart.txt"), conversionChart());
    writeFile(dir.path("without-target.txt"), conversionChart(false, false));
    writeFile(dir.path("target.txt"), whiteFile(31));
    const std::pair<const char*, const char*> modes[] = {
        {"copy", "conversion.p7.chart"}, {"convert", "conversion.p8.chart"}, {"blend", "conversion.p9.chart"}};
    for (const auto& [mode, golden] : modes) {
        const ToolRun run = runTool({"convert", "without-target.txt", "--from", "PAPER_PRINTED", "--to", "target.txt", "--mode",
                                 mode, "-o", std::string(mode) + ".txt"},
                                dir.dir());
        expectSuccess(run);
        expectSameFile(dir.path(std::string(mode) + ".txt"), golden);
    }
    // By name, the target white is no chart patch either.
    const ToolRun run = runTool({"convert", "chart.txt", "--from", "31", "--to", "PAPER_TARGET", "--mode", "blend", "-o",
                             "named.txt"},
                            dir.dir());
    expectSuccess(run);
    expectSameFile(dir.path("named.txt"), "conversion.p9.chart");
    EXPECT_TRUE(contains(run.out, "19.99 dE*ab apart")) << run.out;
    EXPECT_TRUE(contains(run.out, "converted spectra weighted 0.826, measured spectra 0.174")) << run.out;

    const ToolRun sample = runTool({"convert", samplePath("chart_two_whites.txt"), "--from", "PAPER_PRINTED", "--to",
                                samplePath("target_paper.txt"), "-o", "sample.txt"},
                               dir.dir());
    expectSuccess(sample);
    const MeasurementFile converted = parse(dir.path("sample.txt"));
    EXPECT_EQ(converted.sets.size(), 37u); // PAPER_TARGET stays a chart patch when the white comes from a file
    EXPECT_EQ(converted.layout.describe(), "36 bands 380-730 nm in 10 nm steps");
}

TEST(CommandLine, FailuresExitWithTheirCodeAndLeaveNoOutput)
{
    TempDir dir;
    const GoldenBlock golden = readGolden("offset-form.in");
    writeFile(dir.path("form.txt"), goldenForm("offset-form.in"));
    std::vector<Row> rows = testFormRows(golden);
    rows.erase(rows.begin() + 17);
    writeFile(dir.path("missing.txt"), cgats(testFormFields(golden), rows));
    rows = testFormRows(golden);
    rows[40][0] = "5"; // sample 5 twice, with two different patches
    writeFile(dir.path("duplicate.txt"), cgats(testFormFields(golden), rows));
    std::vector<std::string> fields = testFormFields(golden);
    fields[10] = "SPECTRAL_NM435";
    writeFile(dir.path("layout.txt"), cgats(fields, testFormRows(golden)));
    writeFile(dir.path("junk.txt"), "Report of 12 March\nall good\n");
    writeFile(dir.path("plain"), "a file, not a folder\n");
    writeFile(dir.path("keep.txt"), "old chart\n");
    ASSERT_EQ(::mkdir(dir.path("sub").c_str(), 0755), 0);
    writeFile(dir.path("form7.txt"), multiChannelForm(7));
    writeFile(dir.path("form7-short.txt"), multiChannelForm(7, false));
    writeFile(dir.path("sep-short.txt"), separationsFile({0, 1, 2, 3, 4, 5, 6}, 3498).text);
    writeFile(dir.path("sep-twice.txt"), separationsFile({0, 1, 2, 3, 4, 5, 6}, 3499, 5).text);
    writeFile(dir.path("conv.txt"), conversionChart());
    writeFile(dir.path("conv-twice.txt"), conversionChart(true));
    writeFile(dir.path("zero-white.txt"), whiteFile(30, true));
    const std::vector<std::string> before = dir.files();

    struct Case {
        std::vector<std::string> arguments;
        int exitCode;
        std::string message;
    } cases[] = {
        {{"chart", "missing.txt", "-o", "keep.txt"}, 6, "missing.txt: test-form patch 18 (C 0 M 90 Y 0 K 0) is missing"},
        {{"chart", "duplicate.txt", "-o", "out.txt"}, 7, "duplicate.txt:49: duplicate patch: sample 5 is also on line 13"},
        {{"chart", "layout.txt", "-o", "out.txt"}, 5, "layout.txt: unknown spectral layout: bands 420 and 435 nm"},
        {{"chart", "nothere.txt", "-o", "out.txt"}, 3, "nothere.txt: cannot open: No such file or directory"},
        {{"chart", "sub", "-o", "out.txt"}, 3, "sub: is a folder, not a file"},
        {{"chart", "junk.txt", "-o", "out.txt"}, 4, "junk.txt: no BEGIN_DATA_FORMAT line"},
        {{"chart", "form.txt", "-o", "no-folder/out.txt"}, 8, "no-folder/out.txt: cannot create a file in no-folder/"},
        {{"chart", "form.txt", "-o", "plain/out.txt"}, 8, "plain/out.txt: cannot create a file in plain/"},
        {{"chart", "form.txt", "-o", "sub"}, 8, "sub: is a folder; give a file name"},
        {{"chart", "form.txt"}, 2, "--output is required"},
        {{"chart", "form.txt", "-o", "out.txt", "--process", "offset", "--fit-gravure"}, 2, "--fit-gravure"},
        {{"chart", "form.txt", "-o", "out.txt", "--scale", "50"}, 2, "--scale"},
        {{"compare", "form.txt", "-o", "no-folder"}, 8, "no-folder/form.measured46.txt: cannot create"},
        {{"multichannel", "form7.txt", "--inks", "5", "-o", "out.txt"}, 2, "--inks"},
        {{"multichannel", "form7.txt", "--inks", "7", "-o", "out.txt", "--separations", "sep-short.txt"}, 2,
         "--separated-out"},
        {{"multichannel", "form7.txt", "--inks", "6", "-o", "out.txt"}, 5, "6 inks need the device fields 6CLR_1"},
        {{"multichannel", "form7-short.txt", "--inks", "7", "-o", "out.txt"}, 6,
         "form7-short.txt: solid of ink 7 (C 0 M 0 Y 0 K 0 ink7 100) is missing"},
        {{"multichannel", "form7.txt", "--inks", "7", "-o", "out.txt", "--separations", "sep-short.txt",
          "--separated-out", "p6.txt"},
         6, "sep-short.txt: the separation of combination 3499 (C 100 M 100 Y 100 K 100) is missing"},
        {{"multichannel", "form7.txt", "--inks", "7", "-o", "out.txt", "--separations", "sep-twice.txt",
          "--separated-out", "p6.txt"},
         7, "sep-twice.txt:3507: duplicate patch: sample 5 is also on line 13"},
        {{"convert", "conv.txt", "--from", "NOPE", "--to", "PAPER_TARGET", "-o", "out.txt"}, 6,
         "conv.txt: the --from white 'NOPE' is neither a file nor a sample name in the chart"},
        {{"convert", "conv-twice.txt", "--from", "PAPER_PRINTED", "--to", "PAPER_TARGET", "-o", "out.txt"}, 7,
         "duplicate patch: the --to white 'PAPER_TARGET'"},
        {{"convert", "conv.txt", "--from", "zero-white.txt", "--to", "PAPER_TARGET", "-o", "out.txt"}, 5,
         "has no reflectance at 410 nm"},
        {{"convert", "conv.txt", "-o", "out.txt"}, 2, "--mode convert needs --from and --to"},
    };
    for (const Case& case_ : cases) {
        const ToolRun run = runTool(case_.arguments, dir.dir());
        const std::string command = case_.arguments[0] + " " + case_.arguments[1] + " ...";
        EXPECT_EQ(run.exitCode, case_.exitCode) << command << ": " << run.err;
        EXPECT_EQ(run.err.rfind("veltmarquist: error: ", 0), 0u) << run.err;
        EXPECT_TRUE(contains(run.err, case_.message)) << command << ": " << run.err;
        EXPECT_EQ(std::count(run.err.begin(), run.err.end(), '\n'), 1) << run.err;
        EXPECT_EQ(dir.files(), before) << command << " left a file behind";
    }
    EXPECT_EQ(readFile(dir.path("keep.txt")), "old chart\n");
}

TEST(CommandLine, HelpAndVersion)
{
    TempDir dir;
    for (const char* command : {"", "chart", "compare", "multichannel", "convert"}) {
        std::vector<std::string> arguments{"--help"};
        if (*command)
            arguments.insert(arguments.begin(), command);
        const ToolRun run = runTool(arguments, dir.dir());
        EXPECT_EQ(run.exitCode, 0) << command;
        EXPECT_TRUE(contains(run.out, std::string("Usage: veltmarquist ") + (*command ? command : ""))) << run.out;
        EXPECT_TRUE(contains(run.out, "6  a patch the calculation needs is missing")) << run.out;
    }
    const ToolRun version = runTool({"--version"}, dir.dir());
    EXPECT_EQ(version.exitCode, 0);
    EXPECT_EQ(version.out.rfind("veltmarquist ", 0), 0u) << version.out;
    EXPECT_TRUE(contains(version.out, "(library VeltmarquistDLL 1.0)")) << version.out;
}

TEST(CommandLine, RealMeasuredDataSet)
{
    const std::string path = realDataPath();
    if (path.empty())
        GTEST_SKIP() << "the evaluation data set is not beside the project";

    // The patches found by device values are the ones the data set's notes
    // list for each test-form patch.
    const MeasurementFile file = parse(path);
    const veltmarquist::CombinationIndex index(file);
    std::ifstream table(path.substr(0, path.rfind('/')) + "/testform46_aptec_sample_ids.tsv");
    std::string line;
    std::getline(table, line);
    const std::vector<veltmarquist::PatchRequest> requests = veltmarquist::testFormRequests();
    for (int patch = 0; patch < 46 && std::getline(table, line); ++patch) {
        std::string ids;
        for (size_t set : index.find(requests[static_cast<size_t>(patch)].device))
            ids += (ids.empty() ? "" : ",") + file.sets[set].id;
        EXPECT_EQ(line.substr(line.rfind('\t') + 1), ids) << requests[static_cast<size_t>(patch)].label;
    }

    TempDir dir;
    const ToolRun run = runTool({"chart", path, "-o", "chart.txt"}, dir.dir());
    expectSuccess(run);
    EXPECT_TRUE(contains(run.out, "1617 measurements")) << run.out;
    EXPECT_TRUE(contains(run.out, "46 test-form patches found in 68 measurements (repeated measurements averaged "
                                  "for 22 of them)"))
        << run.out;
    EXPECT_EQ(parse(dir.path("chart.txt")).sets.size(), 900u);
    // The model predicted from 46 patches against 720 measured chart
    // combinations of the same press (APTEC PC10 data).
    double mean = 99.0;
    const size_t at = run.out.find("check: 720 chart combinations measured beyond the test form, CIEDE2000 mean ");
    ASSERT_NE(at, std::string::npos) << run.out;
    std::sscanf(run.out.c_str() + run.out.find("mean ", at), "mean %lf", &mean);
    EXPECT_LT(mean, 2.5);
}
