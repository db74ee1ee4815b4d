// Every command end to end against the library's charts, and each kind of
// failure with its exit code, through the built executable.
#include "GoldenForms.h"
#include "MeasurementFile.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>
#include <tuple>

using namespace veltmarquist;
namespace ts = testsupport;
using ts::Row;
using ts::conversionChart;
using ts::multiChannelForm;
using ts::separations;
using ::testing::HasSubstr;
using ::testing::StartsWith;

namespace {

std::string goldenFormText(const char* name) { return cgats::write(ts::goldenForm(ts::readGoldenInput(name))); }

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

// A run that succeeded and wrote `written` equal to the `golden` chart (when one is named).
void expectSuccess(const ToolRun& run, const std::string& written = "", const std::string& golden = "")
{
    EXPECT_EQ(run.exitCode, 0) << run.err;
    EXPECT_EQ(run.err, "");
    if (!golden.empty()) {
        EXPECT_TRUE(ts::readFile(written) == ts::readFile(ts::goldenPath(golden))) << written << " is not " << golden;
    }
}

long entries(const std::string& dir) { return files(dir); }
namespace fs = std::filesystem;

// Starts the built tool on the sample form with TMPDIR=`tmp`, default signal actions, stdout to `out`.
pid_t startTool(const std::string& output, const std::string& tmp, const std::string& out)
{
    const pid_t pid = fork();
    if (pid == 0) {
        for (const int signal : {SIGINT, SIGTERM, SIGHUP})
            std::signal(signal, SIG_DFL);
        setenv("TMPDIR", tmp.c_str(), 1);
        if (std::freopen(out.c_str(), "w", stdout) != nullptr && std::freopen("/dev/null", "w", stderr) != nullptr)
            execl(VELTMARQUIST_TOOL, VELTMARQUIST_TOOL, "chart", VELTMARQUIST_SAMPLES_DIR "/offset_form.txt", "-o",
                  output.c_str(), static_cast<char*>(nullptr));
        _exit(127);
    }
    return pid;
}

} // namespace

TEST(CommandLine, EveryCommandEqualsTheLibrarysCharts)
{
    ts::TempDir dir;
    std::ofstream(dir.path("form.txt")) << goldenFormText("offset-form.in");
    const std::tuple<Row, const char*, const char*> cases[] = {
        {{"chart", "form.txt", "-o", "c.txt"}, "offset-form.p0.chart", "gray difference factor  C -0.04  M -0.03  Y -0.02  K 0.03"},
        {{"chart", "form.txt", "-o", "c.txt", "--fit-gravure"}, "offset-form.rgb-p1.chart", "red 0.95  green 0.95  blue 1"},
        {{"chart", "form.txt", "-o", "c.txt", "--process", "gravure"}, "offset-form.p1.chart", "(defaults; --fit-gravure"},
        // Percent reflectance; the chart combinations measured beyond the test form check the model.
        {{"chart", VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt", "-o", "c.txt"}, "",
         "check: 230 combinations measured beyond the test form, CIEDE2000 mean 0."},
        {{"chart", VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt", "-o", "c.txt", "--model", "ynsn"}, "",
         "chart: 900 patches (Yule-Nielsen model) written to c.txt\ncheck: 230 combinations measured beyond"},
    };
    for (const auto& [arguments, golden, printed] : cases) {
        SCOPED_TRACE(printed);
        const ToolRun run = runTool(arguments, dir.dir());
        expectSuccess(run, dir.path("c.txt"), golden);
        EXPECT_THAT(run.out, HasSubstr(printed));
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
    EXPECT_THAT(run.out, HasSubstr("\n    2  0    0    0    0      0.00   0.00\n"));
    EXPECT_THAT(run.out, HasSubstr("CIEDE2000 over 46 patches: mean "));
    EXPECT_EQ(files(dir.dir()), 4) << "only the form and the three charts";
    // An ICC profile of the form: its header, and the report of what it holds.
    const ToolRun profiled = runTool({"profile", "form.txt", "-o", "press.icc", "--b2a-grid", "17", "--grid", "9"},
                                     dir.dir());
    EXPECT_EQ(profiled.exitCode, 0) << profiled.err;
    EXPECT_THAT(profiled.out, HasSubstr("profile: ICC 2.4 output profile '"));
    EXPECT_THAT(profiled.out, HasSubstr("ink limit 300 %, black limit 95 %, black generation heavy"));
    EXPECT_EQ(ts::readFile(dir.path("press.icc")).substr(36, 4), "acsp");
    std::filesystem::remove(dir.path("press.icc"));
    // The multi-channel run's outputs land where they are told (its rules: tests/host/MultiChannelRunTest).
    std::vector<bool> exact;
    std::ofstream(dir.path("form.txt")) << multiChannelForm(7);
    std::ofstream(dir.path("sep.txt")) << separations({0, 1, 2, 3, 4, 5, 6}, exact);
    expectSuccess(runTool({"multichannel", "form.txt", "--inks", "7", "-o", "chart.txt", "--combinations", "comb.txt",
                           "--separations", "sep.txt", "--separated-out", "xyz.txt"},
                          dir.dir()),
                  dir.path("chart.txt"), "multichannel.p5.chart");
    const auto combinations = readMeasurementText(ts::readFile(dir.path("comb.txt")));
    ASSERT_TRUE(combinations.ok()) << combinations.error.describe();
    ASSERT_EQ(combinations.file->sets.size(), 3499u);
    EXPECT_EQ(combinations.file->sets[1].devicePercent(), (std::vector<double>{0, 0, 0, 2}));
    ts::expectSeparatedChart(ts::readFile(dir.path("xyz.txt")), "multichannel.p5-p6.chart", exact);
    std::ofstream(dir.path("chart.txt")) << conversionChart(0, 32);
    std::ofstream(dir.path("without-target.txt")) << conversionChart(0, 31);
    std::ofstream(dir.path("target.txt")) << conversionChart(31, 32);
    // A white named inside the chart is a reference, not a chart patch.
    const std::tuple<const char*, const char*, const char*, const char*, const char*> convertCases[] = {
        {"without-target.txt", "PAPER_PRINTED", "target.txt", "copy", "conversion.p7.chart"},
        {"chart.txt", "31", "PAPER_TARGET", "convert", "conversion.p8.chart"},
        {"chart.txt", "PAPER_PRINTED", "PAPER_TARGET", "blend", "conversion.p9.chart"}};
    // The chart's channels 5-7 hold ink, which the library's converted chart drops.
    for (const auto& [chart, from, to, mode, golden] : convertCases) {
        SCOPED_TRACE(mode);
        expectSuccess(runTool({"convert", chart, "--from", from, "--to", to, "--mode", mode, "-o", "out.txt", "--cmyk-only"},
                              dir.dir()),
                      dir.path("out.txt"), golden);
    }
}

TEST(CommandLine, EachKindOfFailureHasItsExitCodeAndLeavesNoOutput)
{
    ts::TempDir dir;
    cgats::Document missing = ts::goldenForm(ts::readGoldenInput("offset-form.in")), duplicate = missing, layout = missing,
                    dark = missing;
    missing.rows.erase(missing.rows.begin() + 17);
    std::fill(dark.rows[1].begin() + 5, dark.rows[1].end(), "0.02"); // the paper
    duplicate.rows[40][0] = "5"; // sample 5 twice, with two different patches
    layout.fields[10] = "SPECTRAL_NM435";
    const std::pair<const char*, std::string> inputs[] = {
        {"short.txt", cgats::write(missing)}, {"twice.txt", cgats::write(duplicate)}, {"layout.txt", cgats::write(layout)},
        {"junk.txt", "Report of 12 March\nall good\n"}, {"form7.txt", multiChannelForm(7)}, {"keep.txt", "old chart\n"},
        {"dark.txt", cgats::write(dark)}};
    for (const auto& [name, text] : inputs)
        std::ofstream(dir.path(name)) << text;
    const std::tuple<Row, int, const char*> cases[] = {
        {{"chart", "nothere.txt", "-o", "out.txt"}, 3, "nothere.txt: cannot open: No such file or directory"},
        {{"chart", "junk.txt", "-o", "out.txt"}, 4, "junk.txt: no BEGIN_DATA_FORMAT line"},
        {{"chart", "layout.txt", "-o", "out.txt"}, 5, "layout.txt:3: unknown spectral layout: bands 420 and 435 nm"},
        {{"chart", "short.txt", "-o", "keep.txt"}, 6, "short.txt: test-form patch 18 (C 0 M 90 Y 0 K 0) is missing"},
        {{"chart", "twice.txt", "-o", "out.txt"}, 7, "twice.txt:48: duplicate patch: sample 5 is also on line 12"},
        {{"report", "dark.txt", "-o", "out.html", "--model", "ynsn"}, 5,
         "dark.txt: the test form cannot be a measurement: the paper (form patch 1, Y 2.0) is not brighter than the "
         "cyan solid (form patch 0, Y 54.7): a paper reflects more light than any ink on it; are they swapped?"},
        // The chart's temporary file exists when the second output fails.
        {{"multichannel", "form7.txt", "--inks", "7", "-o", "keep.txt", "--combinations", "no-folder/c.txt"}, 8,
         "no-folder/c.txt: cannot create a file in no-folder/"},
        {{"chrat", "form7.txt"}, 2, "unknown command 'chrat'; commands: profile, chart, report, conformance, compare, multichannel, convert"},
        {{"--frob", "chart"}, 2, "'--frob' is not a command or --help or --version; give the command first"},
        // An empty or unusable output, or an option value no press has, is refused before anything is read.
        {{"chart", "twice.txt", "-o", ""}, 2, "--output: an empty path names no file"},
        {{"chart", "twice.txt", "-o", "x.txt", "--report", ""}, 2, "--report: an empty path names no file"},
        {{"report", "twice.txt", "-o", ""}, 2, "--output: an empty path names no file"},
        {{"multichannel", "form7.txt", "--inks", "7", "-o", ""}, 2, "--output: an empty path names no file"},
        {{"chart", "twice.txt", "-o", "x.ti3", "--format", "cti3", "--ink-limit", ""}, 2, "--ink-limit: '' is not a "
         "total ink limit: give a percentage from 100 to 400, such as 300"},
        {{"chart", "twice.txt", "-o", "x.ti3", "--format", "cti3", "--ink-limit", "1"}, 2, "'1' is not a total ink"},
        {{"chart", "twice.txt", "-o", "x.ti3", "--format", "cti3", "--ink-limit", "0x12C"}, 2, "'0x12C' is not a"},
        {{"chart", "twice.txt", "-o", "keep.txt", "--model", "ynsn", "--process", "gravure"}, 2,
         "--process gravure contradicts --model ynsn"},
        {{"compare", "twice.txt", "-o", "-", "--json", "-q"}, 2, "--json excludes --quiet"},
        {{"profile", "twice.txt", "-o", "x.icc", "--b2a-grid", "32"}, 2, "B2A grid 32: a B2A table has an odd number"},
        {{"profile", "short.txt", "-o", "x.icc", "--black", "ripe"}, 2, "--black: ripe not in"},
        {{"profile", "dark.txt", "-o", "x.icc", "--ink-limit", "450"}, 2, "'450' is not a total ink limit"},
        {{"chart", "twice.txt", "-o", "."}, 2, ".: is a folder; give a file name"},
        {{"chart", "keep.txt", "-o", "./keep.txt"}, 2, "./keep.txt: is the same file as the input keep.txt"},
        // Control characters from a path or a file are shown escaped.
        {{"chart", "in\x1b[2J\t.txt", "-o", "out.txt"}, 3, "in\\x1b[2J\\t.txt: cannot open"},
    };
    for (const auto& [arguments, exitCode, message] : cases) {
        SCOPED_TRACE(message);
        const ToolRun run = runTool(arguments, dir.dir());
        EXPECT_EQ(run.exitCode, exitCode);
        // One error line, last; the file's warnings may stand before it.
        const std::vector<std::string> lines = ts::lines(run.err);
        ASSERT_FALSE(lines.empty());
        EXPECT_THAT(lines.back(), StartsWith("veltmarquist: error: "));
        EXPECT_THAT(lines.back(), HasSubstr(message));
        for (size_t line = 0; line + 1 < lines.size(); ++line)
            EXPECT_THAT(lines[line], StartsWith("veltmarquist: warning: "));
        EXPECT_EQ(files(dir.dir()), 7) << "a file was left behind";
    }
    EXPECT_EQ(ts::readFile(dir.path("keep.txt")), "old chart\n");
    const ToolRun help = runTool({"chart", "--help"}, dir.dir()); // documents the exit codes
    EXPECT_EQ(help.exitCode, 0);
    EXPECT_THAT(help.out, HasSubstr("6  a patch the calculation needs is missing"));
}

TEST(Outputs, ToolWritesStandardOutputAndRemovesItsTemporaryFileWhenStopped)
{
    ts::TempDir dir;
    fs::create_directory(dir.path("tmp"));
    int status = 0;
    waitpid(startTool(dir.path("file.txt"), dir.path("tmp"), "/dev/null"), &status, 0);
    waitpid(startTool("-", dir.path("tmp"), dir.path("out.txt")), &status, 0);
    EXPECT_EQ(ts::readFile(dir.path("out.txt")), ts::readFile(dir.path("file.txt"))) << "the chart alone";
    mkfifo(dir.path("fifo").c_str(), 0600);
    for (const int signal : {SIGTERM, SIGINT, SIGHUP}) {
        SCOPED_TRACE(strsignal(signal));
        // The chart waits in its temporary file for a reader of the FIFO that never comes.
        const pid_t pid = startTool(dir.path("fifo"), dir.path("tmp"), "/dev/null");
        for (int wait = 0; wait < 500 && entries(dir.path("tmp")) == 0; ++wait)
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        EXPECT_EQ(entries(dir.path("tmp")), 1) << "the temporary file did not appear";
        kill(pid, signal);
        waitpid(pid, &status, 0);
        EXPECT_EQ(WIFSIGNALED(status) ? WTERMSIG(status) : -1, signal) << "status " << status;
        EXPECT_EQ(entries(dir.path("tmp")), 0) << "a temporary file was left";
    }
}

TEST(Scripts, JsonOnEveryCommandQuietVerboseAndStandardStreams)
{
    ts::TempDir dir;
    const std::string samples = VELTMARQUIST_SAMPLES_DIR;
    const std::vector<std::vector<std::string>> commands = {
        {"chart", samples + "/offset_press_sheet.txt", "-o", "c.txt"},
        {"report", samples + "/offset_form.txt", "-o", "r.html"},
        {"compare", samples + "/offset_form.txt"},
        {"multichannel", samples + "/seven_ink_form.txt", "--inks", "7", "-o", "m.txt"},
        {"convert", samples + "/chart_two_whites.txt", "--from", "PAPER_PRINTED", "--to", samples + "/target_paper.txt",
         "-o", "v.txt"},
        {"profile", samples + "/offset_form.txt", "-o", "p.icc", "--grid", "5", "--b2a-grid", "9"},
        {"conformance", samples + "/offset_press_sheet.txt", "--reference", samples + "/offset_press_sheet.txt"}};
    for (std::vector<std::string> arguments : commands) {
        SCOPED_TRACE(arguments[0]);
        arguments.push_back("--json");
        const ToolRun run = runTool(arguments, dir.dir());
        EXPECT_EQ(run.exitCode, 0) << run.err;
        // One JSON object on one line, parsed by Python's own reader.
        EXPECT_EQ(std::count(run.out.begin(), run.out.end(), '\n'), 1);
        std::ofstream(dir.path("out.json")) << run.out;
        EXPECT_EQ(std::system(("python3 -c 'import json, sys; d = json.load(open(sys.argv[1])); "
                               "sys.exit(0 if d[\"schema_version\"] == 1 and d[\"command\"] == sys.argv[2] and d[\"ok\"] "
                               "and d[\"written\"] is not None else 1)' '" +
                               dir.path("out.json") + "' " + arguments[0])
                                  .c_str()),
                  0)
            << run.out;
        arguments.back() = "-q";
        const ToolRun quiet = runTool(arguments, dir.dir());
        EXPECT_EQ(quiet.exitCode, 0);
        EXPECT_EQ(quiet.out + quiet.err, "");
    }
    // -v adds the fitted values; a failure under --json: ok false, the error on stderr.
    const ToolRun verbose = runTool({"chart", samples + "/offset_form.txt", "-o", "c.txt", "-v"}, dir.dir());
    EXPECT_NE(verbose.out.find("fitted values:\n  gray difference factor (C, M, Y, K): "), std::string::npos);
    const ToolRun failed = runTool({"chart", "missing.txt", "-o", "c.txt", "--json"}, dir.dir());
    EXPECT_EQ(failed.exitCode, 3);
    EXPECT_THAT(failed.out, StartsWith("{\"schema_version\":1,\"command\":\"chart\",\"ok\":false"));
    EXPECT_NE(failed.err.find("missing.txt"), std::string::npos);
    // - reads the form from standard input; compare -o - writes both charts to standard output.
    const int piped = std::system(("cd '" + dir.dir() + "' && '" VELTMARQUIST_TOOL "' chart - -o - -q <'" + samples +
                                   "/offset_form.txt' >piped.txt")
                                      .c_str());
    EXPECT_EQ(piped, 0);
    EXPECT_EQ(runTool({"chart", samples + "/offset_form.txt", "-o", "direct.txt", "-q"}, dir.dir()).exitCode, 0);
    EXPECT_TRUE(ts::readFile(dir.path("piped.txt")) == ts::readFile(dir.path("direct.txt")));
    const ToolRun both = runTool({"compare", samples + "/offset_form.txt", "-o", "-", "-q"}, dir.dir());
    EXPECT_EQ(both.exitCode, 0) << both.err;
    EXPECT_EQ(both.out.substr(both.out.find("END_DATA\n") + 9).substr(0, 5), "IT8\r\n") << "the modelled chart follows";
}
