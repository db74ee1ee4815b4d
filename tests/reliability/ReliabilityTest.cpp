// Hostile calls through CalculateChart, faults the fuzzer found, allocation
// failure, two profiles and two print models in two threads (ThreadSanitizer:
// scripts/stages/40-tsan.sh).
#include "TestSupport.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <malloc.h>
#include <sys/stat.h>
#include <unistd.h>

#include <climits>
#include <cstdlib>
#include <fstream>
#include <stdexcept>
#include <thread>
#include <tuple>

using namespace testsupport;
using ::testing::HasSubstr;

namespace {

// A golden input; for process 6 its exchange records hold the host's golden separations.
MeasurementBlock input(const std::string& name, int process = -1)
{
    return process == VM_PROCESS_SEPARATED_SET ? withSeparations(readGoldenInput(name)) : readGoldenInput(name);
}

// A profile holding the tone ramps of the golden six-colour chart.
void* primedProfile(const TempDir& dir)
{
    MeasurementBlock block = readGoldenInput("multichannel.in");
    void* profile = CreateMathProfile("primed");
    return calculateBlock(profile, 3, dir.path("primed.txt"), block) == 0 ? profile : throw std::runtime_error("process 3");
}

// Data lines of a chart ending with "END_DATA" and a line feed; -1 otherwise.
int dataLines(const std::string& chart)
{
    const size_t data = chart.find("BEGIN_DATA\n");
    if (data == std::string::npos || chart.rfind("END_DATA\n") + 9 != chart.size())
        return -1;
    return static_cast<int>(std::count(chart.begin() + static_cast<long>(data), chart.end(), '\n')) - 2;
}

enum : unsigned { kNullProfile = 1, kNullPath = 2, kNullMeasurements = 4 };
const int kInvalid = VM_STATUS_INVALID_MEASUREMENTS;
const std::vector<int> kAll = {0, 1, 3, 5, 6, 7, 9, -1, INT_MAX};

// Each row breaks one rule of a valid 46-patch call: kind, first wavelength, values per patch, count, nulls.
const struct HostileCall { const char* rule; int kind, first, values, count; unsigned nulls; int expected;
                          std::vector<int> processes; } kHostileCalls[] = {
    {"kind 15 before any other fault", 15, 0, 0, 0, 7, VM_STATUS_UNKNOWN_INPUT_KIND, kAll},
    {"null profile", 10, 380, 36, 46, kNullProfile, kInvalid, kAll}, {"null path", 10, 380, 36, 46, 2, kInvalid, kAll},
    {"null measurements", 20, 0, 16, 46, 4, kInvalid, kAll}, {"count above 1999", 10, 380, 36, 2000, 0, kInvalid, kAll},
    {"45 patches for the test form", 10, 380, 36, 45, 0, kInvalid, {0, 1, 2, 4, -1, 10, INT_MIN, INT_MAX}},
    {"9 for six colours", 10, 380, 36, 9, 0, kInvalid, {3}}, {"10 for seven", 10, 380, 36, 10, 0, kInvalid, {5}},
    {"1 patch for a conversion", 10, 380, 36, 1, 0, kInvalid, {7, 8, 9}},
    {"no values per patch", 10, 380, 0, 46, 0, kInvalid, kAll}, {"101 values", 10, 380, 101, 46, 0, kInvalid, kAll},
    {"37 bands from 390 nm", 10, 390, 37, 46, 0, kInvalid, kAll},
    {"no band at its own wavelength up to 730 nm", 10, 740, 36, 46, 0, kInvalid, kAll},
    {"every band below 380 nm", 10, 200, 18, 46, 0, kInvalid, kAll},
    {"kind 20 with 36 values per patch", 20, 380, 36, 46, 0, kInvalid, kAll},
};

// Status, no file, no buffer, the block untouched; afterwards the profile
// (primed, so that process 6 fails only for the row's fault) still writes the
// reference chart of process 6. Beside the rejected layouts, the limits pass.
TEST(HostileCalls, EachRuleGivesItsStatusAndLeavesNoTraceWhileTheLimitsPass)
{
    TempDir dir;
    void* profile = primedProfile(dir);
    const std::string path = dir.path("hostile.txt");
    for (const HostileCall& c : kHostileCalls)
        for (int process : c.processes) {
            SCOPED_TRACE(std::string(c.rule) + ", process " + std::to_string(process));
            MeasurementBlock block = readGoldenInput(c.kind == 20 ? "offset-form-k20.in" : "offset-form.in");
            const std::vector<int> before = block.ints;
            FailingAllocation counting(0);
            EXPECT_EQ(CalculateChart(c.nulls & kNullProfile ? nullptr : profile, static_cast<PrintProcess>(process),
                                     c.nulls & kNullPath ? nullptr : path.c_str(),
                                     c.nulls & kNullMeasurements ? nullptr : block.ints.data(), c.kind, c.first,
                                     c.values, c.count), c.expected);
            EXPECT_FALSE(fileExists(path));
            EXPECT_EQ(counting.seen, 0) << "scratch buffers allocated";
            EXPECT_TRUE(block.ints == before) << "the block changed";
        }
    MeasurementBlock separated = input("multichannel.in", VM_PROCESS_SEPARATED_SET);
    ASSERT_EQ(calculateBlock(profile, VM_PROCESS_SEPARATED_SET, path, separated), VM_STATUS_OK);
    EXPECT_TRUE(readFile(path) == readFile(goldenPath("multichannel.p3-p6.chart")));
    DestroyMathProfile(profile);
    // A profile's name may be null or longer than the 1023 characters it keeps.
    DestroyMathProfile(CreateMathProfile(std::string(5000, 'a').c_str()));
    profile = CreateMathProfile(nullptr);
    for (const auto& [first, bands] : {std::pair{370, 2}, {739, 36}, {730, 36}, {390, 36}, {-10, 40}, {-610, 100},
                                        {381, 1}}) {
        MeasurementBlock block = readGoldenInput("conversion.in");
        block.firstWavelength = first, block.valuesPerPatch = bands;
        ASSERT_EQ(calculateBlock(profile, VM_PROCESS_CHART_COPY, path, block), VM_STATUS_OK) << first << " nm, " << bands;
        EXPECT_EQ(dataLines(readFile(path)), block.count - 2) << first << " nm, " << bands;
    }
    DestroyMathProfile(profile);
}

// Status 1 destroys the profile: every call gets its own. The offset fit of
// process 0 runs before the file is opened.
TEST(UnopenablePath, GivesStatusOneAndCreatesNothing)
{
    TempDir dir;
    for (const char* name : {"file", "read-only"})
        std::ofstream(dir.path(name)) << "kept";
    ASSERT_EQ(chmod(dir.path("read-only").c_str(), 0444) | mkdir(dir.path("folder").c_str(), 0755), 0);
    std::vector<std::string> paths = {dir.path("missing/chart.txt"), dir.path("folder"), dir.path("file/chart.txt"),
                                      "", dir.path(std::string(5000, 'n'))};
    if (geteuid() != 0) // root may write to a read-only file
        paths.push_back(dir.path("read-only"));
    for (const std::string& path : paths)
        for (const auto& [process, name] : {std::pair{1, "offset-form.in"}, {5, "multichannel.in"},
                                            {6, "multichannel.in"}, {9, "conversion.in"}, {0, "offset-form.in"}}) {
            if (process == 0 && path != paths[0])
                continue;
            MeasurementBlock block = input(name, process);
            const std::vector<int> before = block.ints;
            EXPECT_EQ(calculateBlock(process == 6 ? primedProfile(dir) : CreateMathProfile("path"), process, path, block),
                      VM_STATUS_FILE_NOT_OPENED) << "process " << process << " on '" << path.substr(0, 80) << "'";
            EXPECT_TRUE(block.ints == before);
        }
    EXPECT_FALSE(fileExists(dir.path("missing")));
    EXPECT_EQ(readFile(dir.path("file")), "kept");
    EXPECT_EQ(readFile(dir.path("read-only")), "kept");
}

// The models divide by the paper: whatever they print, the chart is complete;
// the grey fit of process 0 finds no finite score on a zero paper and
// negative patches. Patch values become change(band, value, is paper).
TEST(DegenerateReflectance, GivesACompleteChart)
{
    using Change = int (*)(int, int, bool);
    const Change changes[] = {[](int, int, bool) { return 0; }, [](int, int value, bool) { return -value - 1; },
                              [](int band, int value, bool paper) { return paper && band == 20 ? 0 : value; }};
    // Input, process, data lines (0: all patches but the two whites), paper patch (< 0: from the end).
    const std::tuple<const char*, int, int, int, Change> charts[] = {
        {"offset-form.in", 1, 900, 1, {}}, {"multichannel.in", 3, 128, 4, {}}, {"multichannel.in", 5, 159, 4, {}},
        {"conversion.in", 8, 0, -2, {}}, {"conversion.in", 9, 0, -2, {}},
        {"offset-form.in", 0, 900, 1, [](int, int value, bool paper) { return paper ? 0 : -value; }}};
    TempDir dir;
    const std::string path = dir.path("chart.txt");
    for (int c = 0; c < 3; ++c)
        for (const auto& [name, process, sets, paper, only] : charts) {
            SCOPED_TRACE("change " + std::to_string(c) + ", process " + std::to_string(process));
            if (only != nullptr && c > 0)
                continue;
            MeasurementBlock block = readGoldenInput(name);
            for (int i = 0, n = block.valuesPerPatch; i < block.count * n; ++i)
                block.ints[size_t(i)] = (only ? only : changes[c])(i % n, block.ints[size_t(i)],
                                                                   i / n == (paper >= 0 ? paper : block.count + paper));
            void* profile = CreateMathProfile("degenerate");
            ASSERT_EQ(calculateBlock(profile, process, path, block), VM_STATUS_OK);
            EXPECT_EQ(dataLines(readFile(path)), sets > 0 ? sets : block.count - 2);
            if (MeasurementBlock separated = input("multichannel.in", 6); process == 3 || process == 5) {
                ASSERT_EQ(calculateBlock(profile, VM_PROCESS_SEPARATED_SET, path, separated), VM_STATUS_OK);
                EXPECT_EQ(dataLines(readFile(path)), VM_EXCHANGE_RECORDS);
            }
            DestroyMathProfile(profile);
        }
}

// Regression (16-band input skipped the ramp check and wrote a chart of NaN):
// four-colour tints, a fresh profile or a rejected six-colour chart give no ramps.
TEST(SeparatedSet, WithoutRampsOfProcessThreeOrFiveGivesStatusFour)
{
    TempDir dir;
    const std::string path = dir.path("p6.txt");
    MeasurementBlock tenNm = input("multichannel.in", 6), sixteenBands = input("offset-form-k20.in", 6);
    MeasurementBlock form = readGoldenInput("offset-form.in"), seven = readGoldenInput("multichannel.in"), six = seven;
    six.count = 9;
    auto rejected = [&](void* profile) {
        EXPECT_EQ(calculateBlock(profile, 6, path, tenNm), kInvalid);
        EXPECT_EQ(calculateBlock(profile, 6, path, sixteenBands), kInvalid);
        EXPECT_FALSE(fileExists(path));
    };
    void* fourColour = CreateMathProfile("four colour");
    ASSERT_EQ(calculateBlock(fourColour, VM_PROCESS_GRAVURE, dir.path("p1.txt"), form), VM_STATUS_OK);
    rejected(fourColour);
    DestroyMathProfile(fourColour);
    void* profile = CreateMathProfile("no ramps");
    rejected(profile);
    ASSERT_EQ(calculateBlock(profile, VM_PROCESS_SIX_COLOUR, dir.path("p3.txt"), six), kInvalid);
    rejected(profile);
    ASSERT_EQ(calculateBlock(profile, VM_PROCESS_SEVEN_COLOUR, dir.path("p5.txt"), seven), VM_STATUS_OK);
    ASSERT_EQ(calculateBlock(profile, VM_PROCESS_SEPARATED_SET, path, tenNm), VM_STATUS_OK);
    EXPECT_TRUE(readFile(path) == readFile(goldenPath("multichannel.p5-p6.chart")));
    DestroyMathProfile(profile);
}

// Regression: the seven channel values of 16-band patches stand right behind
// them, and the block ends there (they were read behind 36-value rows).
TEST(Regression, SixteenBandConversionsReadTheChannelValuesBehindThePatches)
{
    MeasurementBlock block{VM_INPUT_16BAND, 0, 16, 3, std::vector<int>(3 * 16, 800)};
    block.ints.insert(block.ints.end(), {100, 0, 40, 0, 5, 6, 7});
    TempDir dir;
    for (int process : {VM_PROCESS_CHART_COPY, VM_PROCESS_CHART_CONVERT, VM_PROCESS_CHART_BLEND}) {
        void* profile = CreateMathProfile("16-band conversion");
        ASSERT_EQ(calculateBlock(profile, process, dir.path("chart.txt"), block), VM_STATUS_OK);
        EXPECT_THAT(readFile(dir.path("chart.txt")), HasSubstr("BEGIN_DATA\n1\t100\t0\t40\t0\t")) << "process " << process;
        DestroyMathProfile(profile);
    }
}

// Allocation failure: the first, second, ... scratch buffer of a call fails
// until the call allocates no more. Each failing call gives status 5, no file,
// the block and heap as they were; the call that finally runs through on the
// same profile writes the reference chart. heapInUse: bytes in use, or 0 where
// glibc does not count them exactly (a chunk in its per-thread cache, which
// CTest turns off); under a sanitizer or memcheck the leak check does it.
std::size_t heapInUse()
{
    static void* volatile probe = nullptr;
    static const bool exact = [] {
        const std::size_t held = (probe = std::malloc(200), mallinfo2().uordblks);
        std::free(probe);
        return mallinfo2().uordblks < held;
    }();
    return exact ? mallinfo2().uordblks : 0;
}

TEST(AllocationFailure, EachFailingBufferGivesStatusFiveAndReleasesTheOthers)
{
    const std::tuple<const char*, int, const char*> cases[] = {
        {"offset-form.in", 1, "offset-form.p1.chart"}, {"offset-form-k20.in", 0, "offset-form-k20.p0.chart"},
        {"multichannel.in", 3, "multichannel.p3.chart"}, {"multichannel.in", 6, "multichannel.p3-p6.chart"},
        {"conversion.in", 9, "conversion.p9.chart"}};
    TempDir dir;
    for (const auto& [name, process, reference] : cases) {
        const std::string path = dir.path(reference);
        MeasurementBlock block = input(name, process);
        const std::vector<int> before = block.ints;
        void* profile = process == VM_PROCESS_SEPARATED_SET ? primedProfile(dir) : CreateMathProfile("allocation");
        for (int n = 1;; ++n) {
            SCOPED_TRACE(std::string(reference) + ", failing buffer " + std::to_string(n));
            const std::size_t heapBefore = heapInUse();
            int status = [&, p = process] { FailingAllocation f(n); return calculateBlock(profile, p, path, block); }();
            if (FailingAllocation::seen < n) { // nothing failed
                ASSERT_EQ(status, VM_STATUS_OK);
                EXPECT_GT(n, block.count) << "fewer buffers than patches: the seam is not used";
                EXPECT_TRUE(readFile(path) == readFile(goldenPath(reference)));
                break;
            }
            ASSERT_EQ(status, VM_STATUS_OUT_OF_MEMORY);
            EXPECT_EQ(heapInUse(), heapBefore) << "buffers of the failed call leaked";
            EXPECT_FALSE(fileExists(path));
            EXPECT_TRUE(block.ints == before) << "the block changed";
        }
        DestroyMathProfile(profile);
    }
}

// Two profiles used from two threads at once write the same bytes as one after
// the other; each sequence carries state (ramps for 6, four-colour tints).
using Sequence = std::vector<std::pair<const char*, int>>;
const Sequence kSequences[2] = {
    {{"multichannel.in", 3}, {"multichannel.in", 6}, {"conversion.in", 8}, {"offset-form.in", 1}},
    {{"offset-form-k20.in", 1}, {"multichannel.in", 5}, {"conversion.in", 9}, {"multichannel.in", 6}}};

std::vector<std::string> run(const Sequence& sequence)
{
    TempDir dir;
    void* profile = CreateMathProfile("thread");
    std::vector<std::string> charts;
    for (const auto& [name, process] : sequence)
        if (MeasurementBlock block = input(name, process); calculateBlock(profile, process, dir.path("c"), block) == 0)
            charts.push_back(readFile(dir.path("c")));
    DestroyMathProfile(profile);
    return charts;
}

TEST(TwoProfiles, TwoThreadsAtOnceWriteTheSameBytesAsOneAfterTheOther)
{
    const std::vector<std::string> alone[2] = {run(kSequences[0]), run(kSequences[1])};
    std::vector<std::string> concurrent[2];
    std::thread one([&] { concurrent[0] = run(kSequences[0]); }), two([&] { concurrent[1] = run(kSequences[1]); });
    one.join(), two.join();
    EXPECT_EQ(alone[0].size() + alone[1].size(), 8u) << "a call failed";
    for (int t = 0; t < 2; ++t)
        EXPECT_TRUE(concurrent[t] == alone[t]) << "thread " << t;
}

// Two print models fitted and used in two threads at once give the bytes they
// give one after the other, while a third model serves both threads.
TEST(TwoModels, TwoThreadsAtOnceGiveTheSameBytesAsOneAfterTheOther)
{
    MeasurementBlock block = readGoldenInput("offset-form.in");
    std::vector<double> cmyk;
    for (const auto& entry : MathProfile::toBeCalculated)
        cmyk.insert(cmyk.end(), entry.begin(), entry.end());
    void* shared = nullptr;
    ASSERT_EQ(FitPrintModel(VM_MODEL_GRAVURE, block.ints.data(), 10, 380, 36, 46, &shared), VM_STATUS_OK);
    auto run = [&](int selector) { // spectra of its own model, then of the shared one; -1 where a call failed
        void* model = nullptr;
        std::vector<double> spectra(900 * 72, -1.0);
        FitPrintModel(selector, block.ints.data(), 10, 380, 36, 46, &model);
        PredictPrintModel(model, 900, cmyk.data(), spectra.data(), nullptr, nullptr);
        PredictPrintModel(shared, 900, cmyk.data(), spectra.data() + 900 * 36, nullptr, nullptr);
        DestroyPrintModel(model);
        return spectra;
    };
    const int selectors[2] = {VM_MODEL_OFFSET, VM_MODEL_GRAVURE_FITTED};
    const std::vector<double> alone[2] = {run(selectors[0]), run(selectors[1])};
    std::vector<double> concurrent[2];
    std::thread one([&] { concurrent[0] = run(selectors[0]); }), two([&] { concurrent[1] = run(selectors[1]); });
    one.join(), two.join();
    DestroyPrintModel(shared);
    for (int t = 0; t < 2; ++t) {
        EXPECT_EQ(std::count(alone[t].begin(), alone[t].end(), -1.0), 0) << "a call failed";
        EXPECT_TRUE(concurrent[t] == alone[t]) << "thread " << t;
    }
}

} // namespace
