// Hostile calls through CalculateChart: each documented rejection, paths that
// cannot be opened, degenerate reflectances, process 6 without tone ramps,
// and the faults the fuzzer found.
#include "ReliabilitySupport.h"

#include <gtest/gtest.h>

#include <sys/stat.h>
#include <unistd.h>

#include <climits>
#include <fstream>
#include <tuple>

using namespace reliability;

namespace {

enum : unsigned { kNullProfile = 1, kNullPath = 2, kNullMeasurements = 4 };
const int kInvalid = VM_STATUS_INVALID_MEASUREMENTS;
const std::vector<int> kFamilies = {0, 1, 3, 5, 6, 7, 9, -1, INT_MAX};

// Each row breaks one rule of a valid 46-patch call.
const struct HostileCall {
    const char* rule;
    int inputKind, firstWavelength, valuesPerPatch, count;
    unsigned nulls;
    int expected;
    std::vector<int> processes;
} kHostileCalls[] = {
    {"kind 15 before any other fault", 15, 0, 0, 0, kNullProfile | kNullPath | kNullMeasurements,
     VM_STATUS_UNKNOWN_INPUT_KIND, kFamilies},
    {"null profile", 10, 380, 36, 46, kNullProfile, kInvalid, kFamilies},
    {"null path", 10, 380, 36, 46, kNullPath, kInvalid, kFamilies},
    {"null measurements", 20, 0, 16, 46, kNullMeasurements, kInvalid, kFamilies},
    {"count above 1999", 10, 380, 36, 2000, 0, kInvalid, kFamilies},
    {"45 patches for the test form", 10, 380, 36, 45, 0, kInvalid, {0, 1, 2, 4, -1, 10, INT_MIN, INT_MAX}},
    {"9 patches for six colours", 10, 380, 36, 9, 0, kInvalid, {VM_PROCESS_SIX_COLOUR}},
    {"10 patches for seven colours", 10, 380, 36, 10, 0, kInvalid, {VM_PROCESS_SEVEN_COLOUR}},
    {"1 patch for a conversion", 10, 380, 36, 1, 0, kInvalid, {7, 8, 9}},
    {"no values per patch", 10, 380, 0, 46, 0, kInvalid, kFamilies},
    {"101 values per patch", 10, 380, 101, 46, 0, kInvalid, kFamilies},
    {"37 bands from 390 nm", 10, 390, 37, 46, 0, kInvalid, kFamilies},
    {"no band at its own wavelength up to 730 nm", 10, 740, 36, 46, 0, kInvalid, kFamilies},
    {"every band below 380 nm", 10, 200, 18, 46, 0, kInvalid, kFamilies},
    {"kind 20 with 36 values per patch", 20, 380, 36, 46, 0, kInvalid, kFamilies},
};

// Status, no file, no buffer, the block untouched; afterwards the profile
// (primed, so that process 6 fails only for the row's fault) still writes
// the reference chart of process 6.
TEST(HostileCalls, EachRuleGivesItsStatusAndLeavesNoTrace)
{
    TempDir dir;
    void* profile = primedProfile(dir);
    const std::string path = dir.path("hostile.txt");
    for (const HostileCall& call : kHostileCalls)
        for (int process : call.processes) {
            SCOPED_TRACE(std::string(call.rule) + ", process " + std::to_string(process));
            MeasurementBlock block = readGoldenInput(call.inputKind == 20 ? "offset-form-k20.in" : "offset-form.in");
            const std::vector<int> before = block.ints;
            FailingAllocation counting(0);
            EXPECT_EQ(CalculateChart((call.nulls & kNullProfile) != 0 ? nullptr : profile,
                                     static_cast<PrintProcess>(process),
                                     (call.nulls & kNullPath) != 0 ? nullptr : path.c_str(),
                                     (call.nulls & kNullMeasurements) != 0 ? nullptr : block.ints.data(),
                                     call.inputKind, call.firstWavelength, call.valuesPerPatch, call.count),
                      call.expected);
            EXPECT_FALSE(fileExists(path));
            EXPECT_EQ(counting.seen(), 0);
            EXPECT_TRUE(block.ints == before);
        }
    MeasurementBlock separated = withSeparations("multichannel.in");
    ASSERT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, separated), VM_STATUS_OK);
    EXPECT_TRUE(readFile(path) == readFile(goldenPath("multichannel.p3-p6.chart")));
    DestroyMathProfile(profile);
}

// The layouts next to the rejected ones are accepted; a profile's name may
// be null or longer than the 1023 characters it keeps.
TEST(HostileCalls, CallsAtTheLimitsAreAccepted)
{
    const std::pair<int, int> layouts[] = {{370, 2}, {739, 36}, {730, 36}, {390, 36}, {-10, 40}, {-610, 100}, {381, 1}};
    TempDir dir;
    void* profile = CreateMathProfile(nullptr);
    for (const auto& [first, bands] : layouts) {
        SCOPED_TRACE(std::to_string(first) + " nm, " + std::to_string(bands) + " bands");
        MeasurementBlock block = readGoldenInput("conversion.in");
        block.firstWavelength = first;
        block.valuesPerPatch = bands;
        ASSERT_EQ(calculate(profile, VM_PROCESS_CHART_COPY, dir.path("chart.txt"), block), VM_STATUS_OK);
        EXPECT_EQ(dataLines(readFile(dir.path("chart.txt"))), block.count - 2);
    }
    DestroyMathProfile(profile);
    DestroyMathProfile(CreateMathProfile(std::string(5000, 'a').c_str()));
}

// Status 1 destroys the profile: every call gets its own.
TEST(UnopenablePath, GivesStatusOneAndCreatesNothing)
{
    TempDir dir;
    for (const char* name : {"file", "read-only"})
        std::ofstream(dir.path(name)) << "kept";
    ASSERT_EQ(chmod(dir.path("read-only").c_str(), 0444), 0);
    ASSERT_EQ(mkdir(dir.path("folder").c_str(), 0755), 0);
    std::vector<std::string> paths = {dir.path("missing/chart.txt"), dir.path("folder"), dir.path("file/chart.txt"),
                                      "", dir.path(std::string(5000, 'n'))};
    if (geteuid() != 0) // root may write to a read-only file
        paths.push_back(dir.path("read-only"));
    const std::pair<int, const char*> calls[] = {
        {VM_PROCESS_GRAVURE, "offset-form.in"}, {VM_PROCESS_SEVEN_COLOUR, "multichannel.in"},
        {VM_PROCESS_SEPARATED_SET, "multichannel.in"}, {VM_PROCESS_CHART_BLEND, "conversion.in"}};
    for (const std::string& path : paths)
        for (const auto& [process, input] : calls) {
            SCOPED_TRACE("process " + std::to_string(process) + " on '" + path.substr(0, 80) + "'");
            const bool separated = process == VM_PROCESS_SEPARATED_SET;
            MeasurementBlock block = separated ? withSeparations(input) : readGoldenInput(input);
            const std::vector<int> before = block.ints;
            EXPECT_EQ(calculate(separated ? primedProfile(dir) : CreateMathProfile("path"), process, path, block),
                      VM_STATUS_FILE_NOT_OPENED);
            EXPECT_TRUE(block.ints == before);
        }
    // The offset fit runs before the file is opened.
    MeasurementBlock form = readGoldenInput("offset-form.in");
    EXPECT_EQ(calculate(CreateMathProfile("fit"), VM_PROCESS_OFFSET, paths[0], form), VM_STATUS_FILE_NOT_OPENED);
    EXPECT_FALSE(fileExists(dir.path("missing")));
    for (const char* name : {"file", "read-only"})
        EXPECT_EQ(readFile(dir.path(name)), "kept");
}

using Change = int (*)(int band, int value, bool paper);

void degrade(MeasurementBlock& block, Change change, int paper)
{
    for (int i = 0; i < block.count; ++i)
        for (int b = 0; b < block.valuesPerPatch; ++b) {
            int& value = block.ints[static_cast<size_t>(i * block.valuesPerPatch + b)];
            value = change(b, value, i == paper);
        }
}

// The models divide by the paper: whatever they print, the chart is complete.
TEST(DegenerateReflectance, GivesACompleteChart)
{
    const std::pair<const char*, Change> changes[] = {
        {"all zero", [](int, int, bool) { return 0; }},
        {"all negative", [](int, int value, bool) { return -value - 1; }},
        {"zero paper band", [](int band, int value, bool paper) { return paper && band == 20 ? 0 : value; }},
    };
    // Input, process, data lines (0: all patches but the two whites), paper patch (< 0: from the end).
    const std::tuple<const char*, int, int, int> charts[] = {{"offset-form.in", VM_PROCESS_GRAVURE, 900, 1},
                                                             {"multichannel.in", VM_PROCESS_SIX_COLOUR, 128, 4},
                                                             {"multichannel.in", VM_PROCESS_SEVEN_COLOUR, 159, 4},
                                                             {"conversion.in", VM_PROCESS_CHART_CONVERT, 0, -2},
                                                             {"conversion.in", VM_PROCESS_CHART_BLEND, 0, -2}};
    TempDir dir;
    const std::string path = dir.path("chart.txt");
    for (const auto& [name, change] : changes)
        for (const auto& [input, process, sets, paper] : charts) {
            SCOPED_TRACE(std::string(name) + ", process " + std::to_string(process));
            MeasurementBlock block = readGoldenInput(input);
            degrade(block, change, paper >= 0 ? paper : block.count + paper);
            void* profile = CreateMathProfile("degenerate");
            ASSERT_EQ(calculate(profile, process, path, block), VM_STATUS_OK);
            EXPECT_EQ(dataLines(readFile(path)), sets > 0 ? sets : block.count - 2);
            if (process == VM_PROCESS_SIX_COLOUR || process == VM_PROCESS_SEVEN_COLOUR) {
                MeasurementBlock separated = withSeparations("multichannel.in");
                ASSERT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, separated), VM_STATUS_OK);
                EXPECT_EQ(dataLines(readFile(path)), VM_EXCHANGE_RECORDS);
            }
            DestroyMathProfile(profile);
        }
    // The grey fit finds no finite score on a zero paper and negative patches.
    MeasurementBlock form = readGoldenInput("offset-form.in");
    degrade(form, [](int, int value, bool paper) { return paper ? 0 : -value; }, 1);
    void* profile = CreateMathProfile("degenerate fit");
    ASSERT_EQ(calculate(profile, VM_PROCESS_OFFSET, path, form), VM_STATUS_OK);
    EXPECT_EQ(dataLines(readFile(path)), 900);
    DestroyMathProfile(profile);
}

// Regression (16-band input skipped the ramp check and wrote a chart of NaN).
TEST(SeparatedSet, WithoutRampsOfProcessThreeOrFiveGivesStatusFour)
{
    TempDir dir;
    const std::string path = dir.path("p6.txt");
    MeasurementBlock tenNm = withSeparations("multichannel.in"), sixteenBands = withSeparations("offset-form-k20.in");
    MeasurementBlock form = readGoldenInput("offset-form.in"), shortSix = readGoldenInput("multichannel.in");
    MeasurementBlock seven = shortSix;
    shortSix.count = 9;
    auto rejected = [&](void* profile, const char* after) {
        SCOPED_TRACE(after);
        EXPECT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, tenNm), kInvalid);
        EXPECT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, sixteenBands), kInvalid);
        EXPECT_FALSE(fileExists(path));
    };
    void* fourColour = CreateMathProfile("four colour");
    ASSERT_EQ(calculate(fourColour, VM_PROCESS_GRAVURE, dir.path("p1.txt"), form), VM_STATUS_OK);
    rejected(fourColour, "four-colour tints");
    DestroyMathProfile(fourColour);

    void* profile = CreateMathProfile("no ramps");
    rejected(profile, "a fresh profile");
    ASSERT_EQ(calculate(profile, VM_PROCESS_SIX_COLOUR, dir.path("p3.txt"), shortSix), kInvalid);
    rejected(profile, "a rejected six-colour chart");
    ASSERT_EQ(calculate(profile, VM_PROCESS_SEVEN_COLOUR, dir.path("p5.txt"), seven), VM_STATUS_OK);
    ASSERT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, tenNm), VM_STATUS_OK);
    EXPECT_TRUE(readFile(path) == readFile(goldenPath("multichannel.p5-p6.chart")));
    DestroyMathProfile(profile);
}

// Regression: the seven channel values of 16-band patches stand right behind
// them, and the block ends there (they were read behind 36-value rows).
TEST(Regression, SixteenBandConversionsReadTheChannelValuesBehindThePatches)
{
    MeasurementBlock block{VM_INPUT_16BAND, 0, 16, 3, std::vector<int>(3 * (16 + 7), 800)};
    const int channels[7] = {100, 0, 40, 0, 5, 6, 7};
    std::copy(std::begin(channels), std::end(channels), block.ints.begin() + 3 * 16);
    TempDir dir;
    for (int process : {VM_PROCESS_CHART_COPY, VM_PROCESS_CHART_CONVERT, VM_PROCESS_CHART_BLEND}) {
        void* profile = CreateMathProfile("16-band conversion");
        ASSERT_EQ(calculate(profile, process, dir.path("chart.txt"), block), VM_STATUS_OK);
        const auto chart = lines(readFile(dir.path("chart.txt")));
        ASSERT_GT(chart.size(), 7u);
        EXPECT_EQ(chart[7].substr(0, 13), "1\t100\t0\t40\t0\t") << "process " << process;
        DestroyMathProfile(profile);
    }
}

} // namespace
