// Every command of the built tool end to end against the library's reference charts, and every kind of failure.
#include "ToolTestSupport.h"

#include <gtest/gtest.h>

#include <sys/wait.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <tuple>

using namespace tooltest;
using testsupport::readFile;
using veltmarquist::readMeasurementText;

namespace {

struct ToolRun { int exitCode; std::string out, err; };

// Runs the built tool in `folder` (no argument holds a quote); what it prints lands beside the folder.
ToolRun runTool(const std::vector<std::string>& arguments, const std::string& folder)
{
    std::string command = "cd '" + folder + "' && '" VELTMARQUIST_TOOL "'";
    for (const std::string& argument : arguments)
        command += " '" + argument + "'";
    const int status = std::system((command + " >'" + folder + ".out' 2>'" + folder + ".err'").c_str());
    ToolRun run{WIFEXITED(status) ? WEXITSTATUS(status) : -1, readFile(folder + ".out"), readFile(folder + ".err")};
    std::filesystem::remove(folder + ".out");
    std::filesystem::remove(folder + ".err");
    return run;
}

long files(const std::string& folder) // hidden ones included
{
    return std::distance(std::filesystem::directory_iterator(folder), std::filesystem::directory_iterator());
}

bool contains(const std::string& text, const std::string& part)
{
    return text.find(part) != std::string::npos;
}

// A run that succeeded and wrote `written` equal to the `golden` chart (when one is named).
void expectSuccess(const ToolRun& run, const std::string& written = "", const std::string& golden = "")
{
    EXPECT_TRUE(run.exitCode == 0 && run.err.empty()) << run.exitCode << ": " << run.err;
    EXPECT_TRUE(golden.empty() || readFile(written) == readFile(testsupport::goldenPath(golden))) << written;
}

Row clrFields(size_t inks, Row names = {})
{
    for (size_t k = 1; k <= inks; ++k)
        names.push_back(std::to_string(inks) + "CLR_" + std::to_string(k));
    return names;
}

// The golden multi-channel patches: C, M, Y, K solids, paper, three tints the
// processes do not read, the further ink solids.
std::string multiChannelForm(int inks)
{
    return goldenForm(testsupport::readGoldenInput("multichannel.in"), 0, inks + 4, clrFields(inks), [inks](int patch) {
        const int solidOf[11] = {0, 1, 2, 3, -1, -2, -3, -4, 4, 5, 6};
        Row row;
        for (int channel = 0; channel < inks; ++channel)
            row.push_back(channel == solidOf[patch] ? "100" : solidOf[patch] == -channel - 2 ? "50" : "0");
        return row;
    }).text();
}

// The golden separations in percent, golden `channels` as nCLR_1, nCLR_2, ...
// clamped to 0-100 % as the tool demands; `exact` marks the records unchanged.
std::string separations(const std::vector<int>& channels, std::vector<bool>& exact)
{
    std::ifstream in(testsupport::goldenPath("multichannel.separations"));
    std::vector<Row> rows;
    for (int record = 1; record <= 3499; ++record) {
        int values[7];
        bool unchanged = true;
        for (int channel = 0; channel < 7 && in >> values[channel]; ++channel)
            unchanged &= values[channel] >= 0 && values[channel] <= 100000 &&
                         (values[channel] == 0 || std::count(channels.begin(), channels.end(), channel) > 0);
        rows.push_back({std::to_string(record)});
        for (int channel : channels)
            rows.back().push_back(std::to_string(std::clamp(values[channel], 0, 100000) / 1000.0));
        exact.push_back(unchanged);
    }
    return cgats(clrFields(channels.size(), {"SAMPLE_ID"}), rows);
}

// Patches [first, last) of the golden conversion input: 30 with seven
// channels, then the whites PAPER_PRINTED and PAPER_TARGET.
std::string conversionChart(int first, int last)
{
    const testsupport::MeasurementBlock block = testsupport::readGoldenInput("conversion.in");
    return goldenForm(block, first, last, clrFields(7, {"SAMPLE_NAME"}), [&block](int patch) {
        Row row{patch == 30 ? "PAPER_PRINTED" : patch == 31 ? "PAPER_TARGET" : "P" + std::to_string(patch + 1)};
        for (size_t channel = 0; channel < 7; ++channel)
            row.push_back(std::to_string(block.ints[static_cast<size_t>(block.count * 36 + 7 * patch) + channel]));
        return row;
    }).text();
}

} // namespace

TEST(CommandLine, ChartAndCompareEqualTheLibrarysCharts)
{
    testsupport::TempDir dir;
    std::ofstream(dir.path("form.txt")) << goldenForm("offset-form.in").text();
    const std::tuple<std::vector<std::string>, const char*, const char*> cases[] = {
        {{"form.txt"}, "offset-form.p0.chart", "gray difference factor  C -0.04  M -0.03  Y -0.02  K 0.03"},
        {{"form.txt", "--fit-gravure"}, "offset-form.rgb-p1.chart", "red 0.95  green 0.95  blue 1"},
        {{"form.txt", "--process", "gravure"}, "offset-form.p1.chart", "(defaults; --fit-gravure fits them)"},
        // Percent reflectance; the chart combinations measured beyond the test form check the model.
        {{VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt"}, "", "check: 230 chart combinations measured beyond "
                                                                   "the test form, CIEDE2000 mean 0."},
    };
    for (const auto& [options, golden, printed] : cases) {
        std::vector<std::string> arguments{"chart", "-o", "chart.txt"};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const ToolRun run = runTool(arguments, dir.dir());
        expectSuccess(run, dir.path("chart.txt"), golden);
        EXPECT_TRUE(contains(run.out, printed)) << run.out;
    }
    // The 46-step charts, measured and modelled, land in the current folder.
    const ToolRun run = runTool({"compare", "form.txt", "--process", "gravure"}, dir.dir());
    expectSuccess(run, dir.path("form.measured46.txt"), "offset-form.c46-measured.chart");
    expectSuccess(run, dir.path("form.gravure46.txt"), "offset-form.c46-gravure.chart");
    // Per patch; the paper is the second and the model reproduces it.
    EXPECT_TRUE(contains(run.out, "\n    2  0    0    0    0      0.00   0.00\n")) << run.out;
    EXPECT_TRUE(contains(run.out, "CIEDE2000 over 46 patches: mean ")) << run.out;
    EXPECT_EQ(files(dir.dir()), 4) << "only the form and the three charts";
}

TEST(CommandLine, MultiChannelChartsEqualTheLibrarys)
{
    testsupport::TempDir dir;
    // Seven inks map one to one; six put ink B on the library's channel 6.
    const std::tuple<int, std::vector<int>, const char*, const char*> cases[] = {
        {7, {0, 1, 2, 3, 4, 5, 6}, "multichannel.p5.chart", "multichannel.p5-p6.chart"},
        {6, {0, 1, 2, 3, 4, 6}, "multichannel.p3.chart", "multichannel.p3-p6.chart"}};
    for (const auto& [inks, channels, chart, separated] : cases) {
        std::vector<bool> exact;
        std::ofstream(dir.path("form.txt")) << multiChannelForm(inks);
        std::ofstream(dir.path("sep.txt")) << separations(channels, exact);
        const ToolRun run = runTool({"multichannel", "form.txt", "--inks", std::to_string(inks), "-o", "chart.txt",
                                     "--combinations", "comb.txt", "--separations", "sep.txt", "--separated-out",
                                     "xyz.txt"},
                                    dir.dir());
        expectSuccess(run, dir.path("chart.txt"), chart);
        const auto combinations = readMeasurementText(readFile(dir.path("comb.txt")));
        ASSERT_TRUE(combinations.ok() && combinations.file->sets.size() == 3499u) << combinations.error.describe();
        EXPECT_EQ(combinations.file->sets[1].device, (std::vector<double>{0, 0, 0, 2}));
        // The separated chart: header, every record that went in unchanged, end.
        const auto ours = testsupport::lines(readFile(dir.path("xyz.txt"))),
                   theirs = testsupport::lines(readFile(testsupport::goldenPath(separated)));
        ASSERT_TRUE(ours.size() == theirs.size() && std::count(exact.begin(), exact.end(), true) > 1000);
        for (size_t line = 0; line < ours.size(); ++line)
            EXPECT_TRUE((line >= 7 && line < 7 + exact.size() && !exact[line - 7]) || ours[line] == theirs[line])
                << separated << " line " << line + 1 << ": " << ours[line];
    }
}

TEST(CommandLine, ConvertEqualsTheLibraryWithWhitesByNameIdOrFile)
{
    testsupport::TempDir dir;
    std::ofstream(dir.path("chart.txt")) << conversionChart(0, 32);
    std::ofstream(dir.path("without-target.txt")) << conversionChart(0, 31);
    std::ofstream(dir.path("target.txt")) << conversionChart(31, 32);
    // A white named inside the chart is a reference, not a chart patch.
    const std::tuple<const char*, const char*, const char*, const char*, const char*> cases[] = {
        {"without-target.txt", "PAPER_PRINTED", "target.txt", "copy", "conversion.p7.chart"},
        {"chart.txt", "31", "PAPER_TARGET", "convert", "conversion.p8.chart"},
        {"chart.txt", "PAPER_PRINTED", "PAPER_TARGET", "blend", "conversion.p9.chart"}};
    for (const auto& [chart, from, to, mode, golden] : cases) {
        const ToolRun run = runTool({"convert", chart, "--from", from, "--to", to, "--mode", mode, "-o", "out.txt"},
                                    dir.dir());
        expectSuccess(run, dir.path("out.txt"), golden);
    }
}

TEST(CommandLine, EachKindOfFailureHasItsExitCodeAndLeavesNoOutput)
{
    testsupport::TempDir dir;
    Form missing = goldenForm("offset-form.in"), duplicate = missing, layout = missing;
    missing.rows.erase(missing.rows.begin() + 17);
    duplicate.rows[40][0] = "5"; // sample 5 twice, with two different patches
    layout.fields[10] = "SPECTRAL_NM435";
    std::ofstream(dir.path("short.txt")) << missing.text();
    std::ofstream(dir.path("twice.txt")) << duplicate.text();
    std::ofstream(dir.path("layout.txt")) << layout.text();
    std::ofstream(dir.path("junk.txt")) << "Report of 12 March\nall good\n";
    std::ofstream(dir.path("form7.txt")) << multiChannelForm(7);
    std::ofstream(dir.path("keep.txt")) << "old chart\n";
    const long before = files(dir.dir());
    const std::tuple<std::vector<std::string>, int, const char*> cases[] = {
        {{"chart", "layout.txt"}, 2, "--output is required"},
        {{"chart", "nothere.txt", "-o", "out.txt"}, 3, "nothere.txt: cannot open: No such file or directory"},
        {{"chart", "junk.txt", "-o", "out.txt"}, 4, "junk.txt: no BEGIN_DATA_FORMAT line"},
        {{"chart", "layout.txt", "-o", "out.txt"}, 5, "layout.txt: unknown spectral layout: bands 420 and 435 nm"},
        {{"chart", "short.txt", "-o", "keep.txt"}, 6, "short.txt: test-form patch 18 (C 0 M 90 Y 0 K 0) is missing"},
        {{"chart", "twice.txt", "-o", "out.txt"}, 7, "twice.txt:48: duplicate patch: sample 5 is also on line 12"},
        // The chart's temporary file exists when the second output fails.
        {{"multichannel", "form7.txt", "--inks", "7", "-o", "keep.txt", "--combinations", "no-folder/c.txt"}, 8,
         "no-folder/c.txt: cannot create a file in no-folder/"},
    };
    for (const auto& [arguments, exitCode, message] : cases) {
        const ToolRun run = runTool(arguments, dir.dir());
        EXPECT_EQ(run.exitCode, exitCode) << message;
        EXPECT_TRUE(run.err.rfind("veltmarquist: error: ", 0) == 0 && contains(run.err, message) &&
                    std::count(run.err.begin(), run.err.end(), '\n') == 1)
            << run.err;
        EXPECT_EQ(files(dir.dir()), before) << message << ": a file was left behind";
    }
    EXPECT_EQ(readFile(dir.path("keep.txt")), "old chart\n");
    const ToolRun help = runTool({"chart", "--help"}, dir.dir()); // documents the exit codes
    EXPECT_TRUE(help.exitCode == 0 && contains(help.out, "6  a patch the calculation needs is missing")) << help.out;
}

TEST(CommandLine, RealMeasuredDataSet)
{
    const std::string path = VELTMARQUIST_SHARED_DATA_DIR "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt";
    if (!testsupport::fileExists(path))
        GTEST_SKIP() << "the evaluation data set is not beside the project";
    testsupport::TempDir dir;
    const ToolRun run = runTool({"chart", path, "-o", "chart.txt"}, dir.dir());
    expectSuccess(run);
    // The quirks of the file read; the 46 patches found among repeats and chart combinations.
    EXPECT_TRUE(contains(run.out, "1617 measurements, 36 bands 380-730 nm in 10 nm steps, reflectance 0-1 (detected)\n"
                                  "  46 test-form patches found in 68 measurements (repeated measurements averaged "
                                  "for 22 of them)"))
        << run.out;
    // The model predicted from 46 patches against the press's 720 measured chart combinations.
    EXPECT_TRUE(contains(run.out, "check: 720 chart combinations measured beyond the test form, CIEDE2000 mean 1."))
        << run.out;
}
