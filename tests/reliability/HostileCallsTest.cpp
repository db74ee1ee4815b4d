// Hostile calls through CalculateChart: every documented rejection, paths
// that cannot be opened, degenerate reflectances, and process 6 without its
// tone ramps. A rejected call must write no file, leave the host's block and
// the profile untouched, and leave the profile serving the next call.
#include "ReliabilitySupport.h"

#include <sys/stat.h>
#include <unistd.h>

#include <climits>
#include <fstream>

using namespace testsupport;
using namespace reliability;

namespace {

const int kEveryProcess[] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, -1, 10, INT_MIN, INT_MAX};
const int kFourColourProcesses[] = {0, 1, 2, 4, -1, 10, INT_MIN, INT_MAX};

enum : unsigned { kNullProfile = 1, kNullPath = 2, kNullMeasurements = 4, kNullAll = 7 };

struct HostileCall {
    const char* name;
    int inputKind, firstWavelength, valuesPerPatch, count;
    unsigned nulls;
    int expected;
    std::vector<int> processes; // empty: every process
};

std::ostream& operator<<(std::ostream& out, const HostileCall& call)
{
    return out << call.name;
}

const std::vector<HostileCall>& hostileCalls()
{
    static const std::vector<HostileCall> calls = {
        // Status 2 comes first, whatever else is wrong.
        {"kind0", 0, 380, 36, 46, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kind11", 11, 380, 36, 46, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kind15", 15, 380, 36, 46, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kind19", 19, 400, 16, 46, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kind21", 21, 400, 16, 46, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kindMinus10", -10, 380, 36, 46, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kindIntMin", INT_MIN, 380, 36, 46, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kindIntMax", INT_MAX, 380, 36, 46, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kind15BeforeNullPointers", 15, 380, 36, 46, kNullAll, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kind15BeforeBadCount", 15, 380, 36, 0, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        {"kind15BeforeBadBands", 15, 0, 1000, INT_MAX, 0, VM_STATUS_UNKNOWN_INPUT_KIND, {}},
        // Null pointers.
        {"nullProfile", 10, 380, 36, 46, kNullProfile, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"nullPath", 10, 380, 36, 46, kNullPath, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"nullMeasurements", 10, 380, 36, 46, kNullMeasurements, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"nullEverything", 10, 380, 36, 46, kNullAll, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"nullMeasurementsKind20", 20, 0, 16, 46, kNullMeasurements, VM_STATUS_INVALID_MEASUREMENTS, {}},
        // Counts outside what the row table holds or the process reads.
        {"count2000", 10, 380, 36, 2000, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"countIntMax", 10, 380, 36, INT_MAX, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"count0", 10, 380, 36, 0, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"countMinus1", 10, 380, 36, -1, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"countIntMin", 10, 380, 36, INT_MIN, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"count2000Kind20", 20, 0, 16, 2000, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"count0Kind20", 20, 0, 16, 0, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"count45FourColour", 10, 380, 36, 45, 0, VM_STATUS_INVALID_MEASUREMENTS,
         {std::begin(kFourColourProcesses), std::end(kFourColourProcesses)}},
        {"count45FourColourKind20", 20, 0, 16, 45, 0, VM_STATUS_INVALID_MEASUREMENTS,
         {std::begin(kFourColourProcesses), std::end(kFourColourProcesses)}},
        {"count9SixColour", 10, 380, 36, 9, 0, VM_STATUS_INVALID_MEASUREMENTS, {VM_PROCESS_SIX_COLOUR}},
        {"count10SevenColour", 10, 380, 36, 10, 0, VM_STATUS_INVALID_MEASUREMENTS, {VM_PROCESS_SEVEN_COLOUR}},
        {"count1Conversion", 10, 380, 36, 1, 0, VM_STATUS_INVALID_MEASUREMENTS, {7, 8, 9}},
        // Kind 10: values per patch outside 1 to 100.
        {"bands0", 10, 380, 0, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"bandsMinus1", 10, 380, -1, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"bands101", 10, 380, 101, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"bandsIntMax", 10, 380, INT_MAX, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"bandsIntMin", 10, 380, INT_MIN, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        // Kind 10 starting above 380 nm: at most 36 bands, first band at most 740 nm.
        {"from390With37Bands", 10, 390, 37, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"from500With100Bands", 10, 500, 100, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"from741", 10, 741, 36, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"from750OneBand", 10, 750, 1, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"fromIntMax", 10, INT_MAX, 36, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        // Kind 10 with no band at its own wavelength between 380 and 730 nm.
        {"from740", 10, 740, 36, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"from0", 10, 0, 36, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"from200With18Bands", 10, 200, 18, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"from370OneBand", 10, 370, 1, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"fromMinus10With39Bands", 10, -10, 39, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"fromMinus1000", 10, -1000, 100, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"fromIntMin", 10, INT_MIN, 100, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        // Kind 20 takes exactly 16 values per patch.
        {"kind20Bands0", 20, 0, 0, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"kind20Bands15", 20, 400, 15, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"kind20Bands17", 20, 400, 17, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"kind20Bands36", 20, 380, 36, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"kind20BandsMinus16", 20, 400, -16, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
        {"kind20BandsIntMax", 20, 400, INT_MAX, 46, 0, VM_STATUS_INVALID_MEASUREMENTS, {}},
    };
    return calls;
}

class HostileCallTest : public ::testing::TestWithParam<HostileCall> {};

// The base block is a valid 46-patch call for every process (processes 3, 5
// and 6 get the whole exchange buffer); each row changes one thing about it.
TEST_P(HostileCallTest, ReturnsItsStatusAndTouchesNothing)
{
    const HostileCall& call = GetParam();
    std::vector<int> processes = call.processes;
    if (processes.empty())
        processes.assign(std::begin(kEveryProcess), std::end(kEveryProcess));

    TempDir dir;
    for (int process : processes) {
        SCOPED_TRACE("process " + std::to_string(process));
        const std::string path = dir.path("chart" + std::to_string(process) + ".txt");
        MeasurementBlock block = readGoldenInput(call.inputKind == 20 ? "offset-form-k20.in" : "offset-form.in");
        block.inputKind = call.inputKind;
        block.firstWavelength = call.firstWavelength;
        block.valuesPerPatch = call.valuesPerPatch;
        block.count = call.count;
        const std::vector<int> blockBefore = block.ints;

        // Process 6 gets a profile with ramps, so that only the row's fault can reject it.
        void* profile = (call.nulls & kNullProfile) != 0 ? nullptr
                        : process == VM_PROCESS_SEPARATED_SET ? primedProfile(dir.path("primed.txt"))
                                                              : CreateMathProfile("hostile");
        const ProfileState before = profile != nullptr ? stateOf(profile) : ProfileState{};
        auto hostile = [&] {
            return CalculateChart((call.nulls & kNullProfile) != 0 ? nullptr : profile,
                                  static_cast<PrintProcess>(process),
                                  (call.nulls & kNullPath) != 0 ? nullptr : path.c_str(),
                                  (call.nulls & kNullMeasurements) != 0 ? nullptr : block.ints.data(),
                                  block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
        };

        EXPECT_EQ(hostile(), call.expected);
        EXPECT_FALSE(fileExists(path)) << "a rejected call created its chart file";
        // An existing chart at the path is neither truncated nor rewritten.
        std::ofstream(path) << "previous chart\n";
        EXPECT_EQ(hostile(), call.expected);
        EXPECT_EQ(readFile(path), "previous chart\n");
        EXPECT_TRUE(block.ints == blockBefore) << "a rejected call wrote into the host's block";

        if (profile != nullptr) {
            EXPECT_TRUE(stateOf(profile) == before) << "a rejected call changed the profile";
            EXPECT_TRUE(servesFollowUp(profile,
                                       process == VM_PROCESS_SEPARATED_SET ? FollowUp::SeparatedSet
                                                                           : FollowUp::ChartCopy,
                                       dir.path("follow-up.txt")));
            DestroyMathProfile(profile);
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Documented, HostileCallTest, ::testing::ValuesIn(hostileCalls()),
                         [](const ::testing::TestParamInfo<HostileCall>& info) { return info.param.name; });

// The calls next to the rejected ones are accepted: the band placement's
// limits are where the documentation puts them.
TEST(HostileCall, BandLayoutsAtTheEdgeOfTheRowAreAccepted)
{
    struct Layout {
        int firstWavelength, valuesPerPatch;
    } const layouts[] = {{370, 2}, {739, 36}, {730, 36}, {390, 36}, {-10, 40}, {-610, 100}, {380, 100}, {381, 1}};
    TempDir dir;
    for (const Layout& layout : layouts) {
        SCOPED_TRACE(std::to_string(layout.firstWavelength) + " nm, " + std::to_string(layout.valuesPerPatch));
        MeasurementBlock block = readGoldenInput("conversion.in");
        block.firstWavelength = layout.firstWavelength;
        block.valuesPerPatch = layout.valuesPerPatch;
        void* profile = CreateMathProfile("edge");
        ASSERT_EQ(calculate(profile, VM_PROCESS_CHART_COPY, dir.path("chart.txt"), block), VM_STATUS_OK);
        EXPECT_EQ(dataLines(readFile(dir.path("chart.txt"))), block.count - 2);
        DestroyMathProfile(profile);
    }
}

// ---- Unopenable paths ------------------------------------------------------------

// Paths that no process can open, even for root.
std::vector<std::string> unopenablePaths(const TempDir& dir)
{
    std::ofstream(dir.path("plain-file")) << "x";
    mkdir(dir.path("folder").c_str(), 0755);
    return {
        dir.path("missing-folder/chart.txt"),
        dir.path("folder"),
        dir.path("plain-file/chart.txt"),
        "",
        dir.path(std::string(5000, 'n')),
    };
}

TEST(UnopenablePath, EveryProcessReturnsStatusOneAndCreatesNothing)
{
    const int processes[] = {VM_PROCESS_GRAVURE, VM_PROCESS_SIX_COLOUR, VM_PROCESS_SEVEN_COLOUR,
                             VM_PROCESS_SEPARATED_SET, VM_PROCESS_CHART_COPY, VM_PROCESS_CHART_CONVERT,
                             VM_PROCESS_CHART_BLEND};
    TempDir dir;
    for (const std::string& path : unopenablePaths(dir)) {
        for (int process : processes) {
            SCOPED_TRACE("process " + std::to_string(process) + " on '" + path.substr(0, 80) + "'");
            const bool multiChannel = process >= VM_PROCESS_SIX_COLOUR && process <= VM_PROCESS_SEPARATED_SET;
            MeasurementBlock block = readGoldenInput(process >= VM_PROCESS_CHART_COPY ? "conversion.in"
                                                     : multiChannel              ? "multichannel.in"
                                                                                 : "offset-form.in");
            const std::vector<int> blockBefore = block.ints;
            void* profile = process == VM_PROCESS_SEPARATED_SET ? primedProfile(dir.path("primed.txt"))
                                                                : CreateMathProfile("path");
            // Status 1 destroys the profile: it is not touched afterwards.
            EXPECT_EQ(calculate(profile, process, path, block), VM_STATUS_FILE_NOT_OPENED);
            EXPECT_TRUE(block.ints == blockBefore) << "the exchange buffer was written without a chart";
        }
    }
    EXPECT_FALSE(fileExists(dir.path("missing-folder")));
    EXPECT_FALSE(fileExists(dir.path("plain-file/chart.txt")));
    EXPECT_EQ(readFile(dir.path("plain-file")), "x");
    struct stat info {};
    ASSERT_EQ(stat(dir.path("folder").c_str(), &info), 0);
    EXPECT_TRUE(S_ISDIR(info.st_mode));
}

TEST(UnopenablePath, OffsetProcessReturnsStatusOneAfterItsFit)
{
    TempDir dir;
    MeasurementBlock block = readGoldenInput("offset-form.in");
    EXPECT_EQ(calculate(CreateMathProfile("path"), VM_PROCESS_OFFSET, dir.path("missing/chart.txt"), block),
              VM_STATUS_FILE_NOT_OPENED);
    EXPECT_FALSE(fileExists(dir.path("missing")));
}

TEST(UnopenablePath, ReadOnlyFileIsLeftAsItWas)
{
    if (geteuid() == 0)
        GTEST_SKIP() << "root may write to a read-only file";
    TempDir dir;
    const std::string path = dir.path("read-only.txt");
    std::ofstream(path) << "kept\n";
    ASSERT_EQ(chmod(path.c_str(), 0444), 0);
    MeasurementBlock block = readGoldenInput("conversion.in");
    EXPECT_EQ(calculate(CreateMathProfile("path"), VM_PROCESS_CHART_COPY, path, block), VM_STATUS_FILE_NOT_OPENED);
    EXPECT_EQ(readFile(path), "kept\n");
}

// Write errors after a successful open are documented as not detected.
TEST(UnopenablePath, FullDeviceIsOpenedAndTheCallStillReturns)
{
    if (!fileExists("/dev/full"))
        GTEST_SKIP() << "no /dev/full";
    MeasurementBlock block = readGoldenInput("conversion.in");
    void* profile = CreateMathProfile("full");
    EXPECT_EQ(calculate(profile, VM_PROCESS_CHART_BLEND, "/dev/full", block), VM_STATUS_OK);
    TempDir dir;
    EXPECT_TRUE(servesFollowUp(profile, FollowUp::ChartCopy, dir.path("follow-up.txt")));
    DestroyMathProfile(profile);
}

// ---- Degenerate reflectances -------------------------------------------------------

void fill(MeasurementBlock& block, int patch, int value)
{
    for (int b = 0; b < block.valuesPerPatch; ++b)
        block.ints[static_cast<size_t>(patch * block.valuesPerPatch + b)] = value;
}

void forEachMeasured(MeasurementBlock& block, int (*change)(int patch, int band, int value))
{
    for (int i = 0; i < block.count; ++i)
        for (int b = 0; b < block.valuesPerPatch; ++b) {
            int& value = block.ints[static_cast<size_t>(i * block.valuesPerPatch + b)];
            value = change(i, b, value);
        }
}

struct Degenerate {
    const char* name;
    int (*change)(int patch, int band, int value);
    int paperPatchZeroBand; // -1: none; else the paper patch whose band 20 becomes 0
};

const Degenerate kDegenerate[] = {
    {"all zero", [](int, int, int) { return 0; }, -1},
    {"all negative", [](int, int, int value) { return -value - 1; }, -1},
    {"alternating sign", [](int patch, int band, int value) { return (patch + band) % 2 ? -value : value; }, -1},
    {"extreme integers", [](int patch, int band, int) { return (patch + band) % 2 ? INT_MAX : INT_MIN; }, -1},
    {"zero paper band", [](int, int, int value) { return value; }, 0},
};

// Runs `process` on `block` and checks that a complete chart was written.
void expectCompleteChart(void* profile, int process, MeasurementBlock& block, int sets, const std::string& path)
{
    ASSERT_EQ(calculate(profile, process, path, block), VM_STATUS_OK);
    EXPECT_EQ(dataLines(readFile(path)), sets);
}

TEST(DegenerateReflectance, FourColourGravureWritesAFullChart)
{
    TempDir dir;
    for (const Degenerate& degenerate : kDegenerate) {
        SCOPED_TRACE(degenerate.name);
        MeasurementBlock block = readGoldenInput("offset-form.in");
        forEachMeasured(block, degenerate.change);
        if (degenerate.paperPatchZeroBand >= 0)
            block.ints[1 * 36 + 20] = 0; // patch 1 is the paper
        void* profile = CreateMathProfile("degenerate");
        expectCompleteChart(profile, VM_PROCESS_GRAVURE, block, 900, dir.path("chart.txt"));
        DestroyMathProfile(profile);
    }
}

TEST(DegenerateReflectance, MultiChannelChartsAndSeparatedSetWriteFullCharts)
{
    TempDir dir;
    for (const Degenerate& degenerate : kDegenerate) {
        for (int process : {VM_PROCESS_SIX_COLOUR, VM_PROCESS_SEVEN_COLOUR}) {
            SCOPED_TRACE(std::string(degenerate.name) + ", process " + std::to_string(process));
            MeasurementBlock block = readGoldenInput("multichannel.in");
            forEachMeasured(block, degenerate.change);
            if (degenerate.paperPatchZeroBand >= 0)
                block.ints[4 * 36 + 20] = 0; // patch 4 is the paper
            void* profile = CreateMathProfile("degenerate");
            expectCompleteChart(profile, process, block, process == VM_PROCESS_SIX_COLOUR ? 128 : 159,
                                dir.path("chart.txt"));
            putSeparations(block);
            expectCompleteChart(profile, VM_PROCESS_SEPARATED_SET, block, VM_EXCHANGE_RECORDS, dir.path("p6.txt"));
            DestroyMathProfile(profile);
        }
    }
}

TEST(DegenerateReflectance, ConversionsWriteEveryPatch)
{
    TempDir dir;
    for (const Degenerate& degenerate : kDegenerate) {
        for (int process : {VM_PROCESS_CHART_COPY, VM_PROCESS_CHART_CONVERT, VM_PROCESS_CHART_BLEND}) {
            SCOPED_TRACE(std::string(degenerate.name) + ", process " + std::to_string(process));
            MeasurementBlock block = readGoldenInput("conversion.in");
            forEachMeasured(block, degenerate.change);
            if (degenerate.paperPatchZeroBand >= 0)
                fill(block, block.count - 2, 0); // the first reference white reflects nothing
            void* profile = CreateMathProfile("degenerate");
            expectCompleteChart(profile, process, block, block.count - 2, dir.path("chart.txt"));
            DestroyMathProfile(profile);
        }
    }
}

// The one slow case: the grey fit over a form whose paper reflects nothing and
// whose patches are all negative finds no finite score.
TEST(DegenerateReflectance, OffsetFitOnAZeroPaperAndNegativePatches)
{
    MeasurementBlock block = readGoldenInput("offset-form.in");
    forEachMeasured(block, [](int, int, int value) { return -value; });
    fill(block, 1, 0);
    void* profile = CreateMathProfile("degenerate");
    TempDir dir;
    expectCompleteChart(profile, VM_PROCESS_OFFSET, block, 900, dir.path("chart.txt"));
    EXPECT_TRUE(servesFollowUp(profile, FollowUp::ChartCopy, dir.path("follow-up.txt")));
    DestroyMathProfile(profile);
}

// ---- Process 6 without tone ramps ----------------------------------------------------

TEST(SeparatedSet, WithoutRampsOfProcessThreeOrFiveIsRejected)
{
    TempDir dir;
    const std::string path = dir.path("p6.txt");
    MeasurementBlock tenNm = readGoldenInput("multichannel.in");
    putSeparations(tenNm);
    MeasurementBlock sixteenBands = readGoldenInput("offset-form-k20.in");
    putSeparations(sixteenBands);
    MeasurementBlock conversion = readGoldenInput("conversion.in");

    void* profile = CreateMathProfile("no ramps");
    EXPECT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, tenNm), VM_STATUS_INVALID_MEASUREMENTS);
    EXPECT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, sixteenBands), VM_STATUS_INVALID_MEASUREMENTS);
    ASSERT_EQ(calculate(profile, VM_PROCESS_CHART_COPY, dir.path("p7.txt"), conversion), VM_STATUS_OK);
    EXPECT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, tenNm), VM_STATUS_INVALID_MEASUREMENTS);
    // A rejected six-colour chart builds no ramps either.
    MeasurementBlock short3 = readGoldenInput("multichannel.in");
    short3.count = 9;
    ASSERT_EQ(calculate(profile, VM_PROCESS_SIX_COLOUR, dir.path("p3.txt"), short3), VM_STATUS_INVALID_MEASUREMENTS);
    EXPECT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, tenNm), VM_STATUS_INVALID_MEASUREMENTS);
    EXPECT_FALSE(fileExists(path));

    // The same profile then runs the documented exchange unchanged.
    MeasurementBlock seven = readGoldenInput("multichannel.in");
    ASSERT_EQ(calculate(profile, VM_PROCESS_SEVEN_COLOUR, dir.path("p5.txt"), seven), VM_STATUS_OK);
    putSeparations(seven);
    ASSERT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, path, seven), VM_STATUS_OK);
    EXPECT_EQ(readFile(path), readFile(goldenPath("multichannel.p5-p6.chart")));
    DestroyMathProfile(profile);
}

TEST(SeparatedSet, FourColourTintsAloneAreNotRamps)
{
    TempDir dir;
    MeasurementBlock form = readGoldenInput("offset-form.in");
    void* profile = CreateMathProfile("four colour");
    ASSERT_EQ(calculate(profile, VM_PROCESS_GRAVURE, dir.path("p1.txt"), form), VM_STATUS_OK);
    putSeparations(form);
    EXPECT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, dir.path("p6.txt"), form),
              VM_STATUS_INVALID_MEASUREMENTS);
    EXPECT_FALSE(fileExists(dir.path("p6.txt")));
    DestroyMathProfile(profile);
}

// ---- Regressions ---------------------------------------------------------------------

// Kind 20 is widened to 36 bands per row, but the host's channel values still
// stand right behind its 16-value patches. The block below is exactly as long
// as the host's data: reading behind 36-value patches overruns it.
TEST(Regression, SixteenBandConversionReadsChannelValuesBehindTheSixteenBands)
{
    const int count = 3;
    MeasurementBlock block;
    block.inputKind = VM_INPUT_16BAND;
    block.firstWavelength = 0;
    block.valuesPerPatch = 16;
    block.count = count;
    block.ints.assign(static_cast<size_t>(count * 16 + 7 * count), 800);
    const int channels[7] = {100, 0, 40, 0, 5, 6, 7};
    std::copy(std::begin(channels), std::end(channels), block.ints.begin() + count * 16);

    TempDir dir;
    void* profile = CreateMathProfile("k20 conversion");
    ASSERT_EQ(calculate(profile, VM_PROCESS_CHART_COPY, dir.path("chart.txt"), block), VM_STATUS_OK);
    const auto chart = lines(readFile(dir.path("chart.txt")));
    ASSERT_GT(chart.size(), 7u);
    EXPECT_EQ(chart[7].substr(0, 16), "1\t100\t0\t40\t0\t0.8");
    DestroyMathProfile(profile);
}

TEST(ProfileName, NullAndOverlongNamesGiveWorkingProfiles)
{
    TempDir dir;
    const std::string longName(5000, 'a');
    for (const char* name : {static_cast<const char*>(nullptr), "", longName.c_str()}) {
        void* profile = CreateMathProfile(name);
        ASSERT_NE(profile, nullptr);
        EXPECT_EQ(std::string(static_cast<MathProfile*>(profile)->profileName),
                  name == nullptr ? std::string() : std::string(name).substr(0, 1023));
        EXPECT_TRUE(servesFollowUp(profile, FollowUp::Gravure, dir.path("follow-up.txt")));
        DestroyMathProfile(profile);
    }
}

} // namespace
