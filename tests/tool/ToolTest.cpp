// Every command end to end against the library's charts.
#include "../TestSupport.h"
#include "MeasurementFile.h"

#include <gtest/gtest.h>

#include <sys/wait.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <functional>
#include <tuple>

using namespace veltmarquist;
namespace ts = testsupport;

namespace {

using Row = std::vector<std::string>;

// `row` followed by the names prefix + first, prefix + (first + step), ...
Row names(const std::string& prefix, int first, int step, size_t count, Row row = {})
{
    for (size_t j = 0; j < count; ++j)
        row.push_back(prefix + std::to_string(first + step * static_cast<int>(j)));
    return row;
}

std::string cgats(const Row& fields, const std::vector<Row>& rows)
{
    const auto line = [](const Row& items) {
        std::string text;
        for (const std::string& item : items)
            text += "\t" + item;
        return text.substr(1) + "\n";
    };
    std::string text = "CGATS.17\nNUMBER_OF_FIELDS\t" + std::to_string(fields.size()) + "\nBEGIN_DATA_FORMAT\n" +
                       line(fields) + "END_DATA_FORMAT\nNUMBER_OF_SETS\t" + std::to_string(rows.size()) +
                       "\nBEGIN_DATA\n";
    for (const Row& row : rows)
        text += line(row);
    return text + "END_DATA\n";
}

struct Form {
    Row fields;
    std::vector<Row> rows;
    std::string text() const { return cgats(fields, rows); }
};

// Patches [first, last) of a golden block: SAMPLE_ID, `device` (filled by `values`), the bands.
Form goldenForm(const ts::MeasurementBlock& block, int first, int last, Row device,
                const std::function<void(int, Row&)>& values)
{
    const int n = block.valuesPerPatch;
    device.insert(device.begin(), "SAMPLE_ID");
    Form form{block.inputKind == 20 ? names("nm", 400, 20, n, device)
                                    : names("SPECTRAL_NM", block.firstWavelength, 10, n, device), {}};
    for (int patch = first; patch < last; ++patch) {
        form.rows.push_back({std::to_string(patch + 1)});
        values(patch, form.rows.back());
        for (int j = 0; j < n; ++j)
            form.rows.back().push_back(std::to_string(block.ints[patch * n + j] / 1e3));
    }
    return form;
}

// A golden four-colour form: its 46 patches in measuring order with CMYK fields.
Form goldenForm(const char* name)
{
    return goldenForm(ts::readGoldenInput(name), 0, 46, {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"}, [](int patch, Row& row) {
        for (int channel = 0; channel < 4; ++channel)
            row.push_back(std::to_string(MathProfile::dithering[patch][channel]));
    });
}

struct ToolRun { int exitCode; std::string out, err; };

// Runs the built tool in `folder` (no argument holds a quote); what it prints lands beside the folder.
ToolRun runTool(const std::vector<std::string>& arguments, const std::string& folder)
{
    std::string command = "cd '" + folder + "' && '" VELTMARQUIST_TOOL "'";
    for (const std::string& argument : arguments)
        command += " '" + argument + "'";
    const int status = std::system((command + " >'" + folder + ".out' 2>'" + folder + ".err'").c_str());
    ToolRun run{WIFEXITED(status) ? WEXITSTATUS(status) : -1, ts::readFile(folder + ".out"), ts::readFile(folder + ".err")};
    std::filesystem::remove(folder + ".out");
    std::filesystem::remove(folder + ".err");
    return run;
}

long files(const std::string& dir) // hidden ones included
{ return std::distance(std::filesystem::directory_iterator(dir), std::filesystem::directory_iterator()); }

bool contains(const std::string& text, const std::string& part) { return text.find(part) != std::string::npos; }

// A run that succeeded and wrote `written` equal to the `golden` chart (when one is named).
void expectSuccess(const ToolRun& run, const std::string& written = "", const std::string& golden = "")
{
    EXPECT_TRUE(run.exitCode == 0 && run.err.empty()) << run.exitCode << ": " << run.err;
    EXPECT_TRUE(golden.empty() || ts::readFile(written) == ts::readFile(ts::goldenPath(golden))) << written;
}

Row clrFields(size_t inks, Row before = {}) { return names(std::to_string(inks) + "CLR_", 1, 1, inks, before); }

// Golden patches: C, M, Y, K solids, paper, three tints the processes ignore, further ink solids.
std::string multiChannelForm(int inks)
{
    return goldenForm(ts::readGoldenInput("multichannel.in"), 0, inks + 4, clrFields(inks), [inks](int patch, Row& row) {
        const int solidOf[11] = {0, 1, 2, 3, -1, -2, -3, -4, 4, 5, 6};
        for (int channel = 0; channel < inks; ++channel)
            row.push_back(channel == solidOf[patch] ? "100" : solidOf[patch] == -channel - 2 ? "50" : "0");
    }).text();
}

// Golden separations, `channels` as nCLR_1, ... in percent clamped to 0-100; `exact` marks records unchanged.
std::string separations(const std::vector<int>& channels, std::vector<bool>& exact)
{
    std::ifstream in(ts::goldenPath("multichannel.separations"));
    std::vector<Row> rows;
    for (int record = 1; record <= 3499; ++record) {
        int values[7];
        bool unchanged = true;
        for (int channel = 0; channel < 7 && in >> values[channel]; ++channel)
            unchanged &= values[channel] == (std::count(channels.begin(), channels.end(), channel) ? std::clamp(values[channel], 0, 100000) : 0);
        rows.push_back({std::to_string(record)});
        for (int channel : channels)
            rows.back().push_back(std::to_string(std::clamp(values[channel], 0, 100000) / 1000.0));
        exact.push_back(unchanged);
    }
    return cgats(clrFields(channels.size(), {"SAMPLE_ID"}), rows);
}

// Patches [first, last) of the golden conversion input: 30 in 7 channels, PAPER_PRINTED, PAPER_TARGET.
std::string conversionChart(int first, int last)
{
    const ts::MeasurementBlock block = ts::readGoldenInput("conversion.in");
    return goldenForm(block, first, last, clrFields(7, {"SAMPLE_NAME"}), [&block](int patch, Row& row) {
        row.push_back(patch == 30 ? "PAPER_PRINTED" : patch == 31 ? "PAPER_TARGET" : "P" + std::to_string(patch + 1));
        for (size_t channel = 0; channel < 7; ++channel)
            row.push_back(std::to_string(block.ints[static_cast<size_t>(block.count * 36 + 7 * patch) + channel]));
    }).text();
}

} // namespace

TEST(CommandLine, EveryCommandEqualsTheLibrarysCharts)
{
    ts::TempDir dir;
    std::ofstream(dir.path("form.txt")) << goldenForm("offset-form.in").text();
    const std::tuple<Row, const char*, const char*> cases[] = {
        {{"chart", "form.txt", "-o", "c.txt"}, "offset-form.p0.chart", "gray difference factor  C -0.04  M -0.03  Y -0.02  K 0.03"},
        {{"chart", "form.txt", "-o", "c.txt", "--fit-gravure"}, "offset-form.rgb-p1.chart", "red 0.95  green 0.95  blue 1"},
        {{"chart", "form.txt", "-o", "c.txt", "--process", "gravure"}, "offset-form.p1.chart", "(defaults; --fit-gravure"},
        // Percent reflectance; the chart combinations measured beyond the test form check the model.
        {{"chart", VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt", "-o", "c.txt"}, "",
         "check: 230 chart combinations measured beyond the test form, CIEDE2000 mean 0."},
        {{"chart", VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt", "-o", "c.txt", "--model", "ynsn"}, "",
         "chart: 900 patches (Yule-Nielsen model) written to c.txt\ncheck: 230 combinations measured beyond"},
    };
    for (const auto& [arguments, golden, printed] : cases) {
        const ToolRun run = runTool(arguments, dir.dir());
        expectSuccess(run, dir.path("c.txt"), golden);
        EXPECT_TRUE(contains(run.out, printed)) << run.out;
    }
    // A chart for profile builders: the grid of the form's levels, read back by our reader.
    expectSuccess(runTool({"chart", "form.txt", "-o", "c.ti3", "--format", "cti3", "--layout", "grid", "--ink-limit", "300"},
                          dir.dir()));
    const auto grid = readMeasurementText(ts::readFile(dir.path("c.ti3")));
    ASSERT_TRUE(grid.ok()) << grid.error.describe();
    EXPECT_EQ(grid.file->fileType, "CTI3");
    EXPECT_EQ(grid.file->sets.size(), 6561u);
    EXPECT_EQ(grid.file->keyword("TOTAL_INK_LIMIT"), "300");
    std::filesystem::remove(dir.path("c.ti3"));
    // The 46-step charts, measured and modelled, land in the current folder.
    const ToolRun run = runTool({"compare", "form.txt", "--process", "gravure"}, dir.dir());
    expectSuccess(run, dir.path("form.measured46.txt"), "offset-form.c46-measured.chart");
    expectSuccess(run, dir.path("form.gravure46.txt"), "offset-form.c46-gravure.chart");
    // Per patch; the paper is the second and the model reproduces it.
    EXPECT_TRUE(contains(run.out, "\n    2  0    0    0    0      0.00   0.00\n") &&
                contains(run.out, "CIEDE2000 over 46 patches: mean ")) << run.out;
    EXPECT_EQ(files(dir.dir()), 4) << "only the form and the three charts";
    // Seven inks map one to one; six put ink B on the library's channel 6.
    const std::tuple<int, std::vector<int>, const char*, const char*> multiChannelCases[] = {
        {7, {0, 1, 2, 3, 4, 5, 6}, "multichannel.p5.chart", "multichannel.p5-p6.chart"},
        {6, {0, 1, 2, 3, 4, 6}, "multichannel.p3.chart", "multichannel.p3-p6.chart"}};
    for (const auto& [inks, channels, chart, separated] : multiChannelCases) {
        std::vector<bool> exact;
        std::ofstream(dir.path("form.txt")) << multiChannelForm(inks);
        std::ofstream(dir.path("sep.txt")) << separations(channels, exact);
        expectSuccess(runTool({"multichannel", "form.txt", "--inks", std::to_string(inks), "-o", "chart.txt",
                               "--combinations", "comb.txt", "--separations", "sep.txt", "--separated-out", "xyz.txt"},
                              dir.dir()),
                      dir.path("chart.txt"), chart);
        const auto combinations = readMeasurementText(ts::readFile(dir.path("comb.txt")));
        ASSERT_TRUE(combinations.ok() && combinations.file->sets.size() == 3499u) << combinations.error.describe();
        EXPECT_EQ(combinations.file->sets[1].devicePercent(), (std::vector<double>{0, 0, 0, 2}));
        // The separated chart: header, every record that went in unchanged, end.
        const auto ours = ts::lines(ts::readFile(dir.path("xyz.txt"))),
                   theirs = ts::lines(ts::readFile(ts::goldenPath(separated)));
        ASSERT_TRUE(ours.size() == theirs.size() && std::count(exact.begin(), exact.end(), true) > 1000);
        for (size_t line = 0; line < ours.size(); ++line)
            EXPECT_TRUE((line >= 7 && line < 7 + exact.size() && !exact[line - 7]) || ours[line] == theirs[line])
                << separated << " line " << line + 1 << ": " << ours[line];
    }
    std::ofstream(dir.path("chart.txt")) << conversionChart(0, 32);
    std::ofstream(dir.path("without-target.txt")) << conversionChart(0, 31);
    std::ofstream(dir.path("target.txt")) << conversionChart(31, 32);
    // A white named inside the chart is a reference, not a chart patch.
    const std::tuple<const char*, const char*, const char*, const char*, const char*> convertCases[] = {
        {"without-target.txt", "PAPER_PRINTED", "target.txt", "copy", "conversion.p7.chart"},
        {"chart.txt", "31", "PAPER_TARGET", "convert", "conversion.p8.chart"},
        {"chart.txt", "PAPER_PRINTED", "PAPER_TARGET", "blend", "conversion.p9.chart"}};
    // The chart's channels 5-7 hold ink, which the library's converted chart drops.
    for (const auto& [chart, from, to, mode, golden] : convertCases)
        expectSuccess(runTool({"convert", chart, "--from", from, "--to", to, "--mode", mode, "-o", "out.txt", "--cmyk-only"},
                              dir.dir()),
                      dir.path("out.txt"), golden);
}

TEST(CommandLine, EachKindOfFailureHasItsExitCodeAndLeavesNoOutput)
{
    ts::TempDir dir;
    Form missing = goldenForm("offset-form.in"), duplicate = missing, layout = missing;
    missing.rows.erase(missing.rows.begin() + 17);
    duplicate.rows[40][0] = "5"; // sample 5 twice, with two different patches
    layout.fields[10] = "SPECTRAL_NM435";
    const std::pair<const char*, std::string> inputs[] = {
        {"short.txt", missing.text()}, {"twice.txt", duplicate.text()}, {"layout.txt", layout.text()},
        {"junk.txt", "Report of 12 March\nall good\n"}, {"form7.txt", multiChannelForm(7)}, {"keep.txt", "old chart\n"},
        {"form.txt", goldenForm("offset-form.in").text()}};
    for (const auto& [name, text] : inputs)
        std::ofstream(dir.path(name)) << text;
    const std::tuple<Row, int, const char*> cases[] = {
        {{"chart", "layout.txt"}, 2, "--output is required"},
        {{"chart", "nothere.txt", "-o", "out.txt"}, 3, "nothere.txt: cannot open: No such file or directory"},
        {{"chart", "junk.txt", "-o", "out.txt"}, 4, "junk.txt: no BEGIN_DATA_FORMAT line"},
        {{"chart", "layout.txt", "-o", "out.txt"}, 5, "layout.txt:3: unknown spectral layout: bands 420 and 435 nm"},
        {{"chart", "short.txt", "-o", "keep.txt"}, 6, "short.txt: test-form patch 18 (C 0 M 90 Y 0 K 0) is missing"},
        {{"chart", "twice.txt", "-o", "out.txt"}, 7, "twice.txt:48: duplicate patch: sample 5 is also on line 12"},
        // The chart's temporary file exists when the second output fails.
        {{"multichannel", "form7.txt", "--inks", "7", "-o", "keep.txt", "--combinations", "no-folder/c.txt"}, 8,
         "no-folder/c.txt: cannot create a file in no-folder/"},
        {{"chrat", "form7.txt"}, 2, "unknown command 'chrat'; commands: chart, compare, multichannel, convert"},
        {{"chart", "keep.txt", "-o", "./keep.txt"}, 2, "./keep.txt: is the same file as the input keep.txt"},
        {{"compare", "keep.txt", "--model", "ynsn", "--fit-gravure"}, 2, "--fit-gravure chooses among the library's"},
        {{"chart", "form.txt", "-o", "out.txt", "--spectral"}, 2, "--spectral needs a chart for profile builders"},
        {{"chart", "form.txt", "-o", "out.txt", "--layout", "grid:11"}, 2,
         "sample 4 (C 0 M 0 Y 0 K 30) has K 30, which the offset model cannot predict: it predicts only the form's "
         "levels 0, 10, 20, 40, 60, 70, 80, 90, 100 %"},
        // Control characters from a path or a file are shown escaped.
        {{"chart", "in\x1b[2J\t.txt", "-o", "out.txt"}, 3, "in\\x1b[2J\\t.txt: cannot open"},
    };
    for (const auto& [arguments, exitCode, message] : cases) {
        const ToolRun run = runTool(arguments, dir.dir());
        EXPECT_TRUE(run.exitCode == exitCode && run.err.rfind("veltmarquist: error: ", 0) == 0 &&
                    contains(run.err, message) && std::count(run.err.begin(), run.err.end(), '\n') == 1)
            << run.exitCode << " " << run.err;
        EXPECT_EQ(files(dir.dir()), 7) << message << ": a file was left behind";
    }
    EXPECT_EQ(ts::readFile(dir.path("keep.txt")), "old chart\n");
    const ToolRun help = runTool({"chart", "--help"}, dir.dir()); // documents the exit codes
    EXPECT_TRUE(help.exitCode == 0 && contains(help.out, "6  a patch the calculation needs is missing")) << help.out;
}

TEST(CommandLine, RealMeasuredDataSet)
{
    const std::string path = VELTMARQUIST_SHARED_DATA_DIR "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt";
    if (!ts::fileExists(path))
        GTEST_SKIP() << "no evaluation data set at " << path << " (the real press data set is not beside the project)";
    ts::TempDir dir;
    const ToolRun run = runTool({"chart", path, "-o", "chart.txt"}, dir.dir());
    expectSuccess(run);
    // The file's quirks read, the patches found among repeats, the model checked on 720 measured combinations.
    EXPECT_TRUE(contains(run.out, "1617 measurements, 36 bands 380-730 nm in 10 nm steps, reflectance 0-1 (detected)\n"
                                  "  46 test-form patches found in 68 measurements (repeated measurements averaged "
                                  "for 22 of them)") &&
                contains(run.out, "check: 720 chart combinations measured beyond the test form, CIEDE2000 mean 1."))
        << run.out;
}
