// Six- and seven-colour processes: tone ramps, the seven-ink predictions, the
// patch tables and the two-call exchange with the host.
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <sstream>

using namespace testsupport;

namespace {

template <size_t N>
std::vector<int> asInts(const std::array<unsigned char, N>& row)
{
    return std::vector<int>(row.begin(), row.end());
}

// A profile with paper and seven solids in place and its ramps built.
class RampProfile : public ::testing::Test {
protected:
    void SetUp() override
    {
        for (int j = 0; j < 36; ++j) {
            profile.patchSlots[13].spectrum[j] = 0.9;
            for (int c = 0; c < 7; ++c)
                profile.patchSlots[14 + c].spectrum[j] = 0.1 + 0.02 * c + 0.005 * (j % 5);
        }
        std::memcpy(solids, profile.patchSlots + 14, sizeof solids);
        profile.buildTintRamps();
    }
    const MathProfile::ColorPatch& sample() const { return profile.patchSlots[21]; }

    MathProfile profile{"ramps"};
    MathProfile::ColorPatch solids[7];
};

void loadSeparations(std::vector<int>& buffer)
{
    std::istringstream in(readFile(goldenPath("multichannel.separations")));
    for (int i = 0; i < VM_EXCHANGE_BUFFER_INTS; ++i)
        in >> buffer[static_cast<size_t>(i)];
    ASSERT_TRUE(in) << "3499 records of seven ints";
}

int calculate(void* profile, int process, const std::string& path, MeasurementBlock& block)
{
    return CalculateChart(profile, static_cast<PrintProcess>(process), path.c_str(), block.ints.data(),
                          block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
}

} // namespace

TEST(PatchSets, TellingRowsAndCounts)
{
    const auto& clr7 = MathProfile::toBeCalculatedCLR7;
    const auto& clr6 = MathProfile::toBeCalculatedCLR6;
    const auto& zan = MathProfile::ZANExtended;
    EXPECT_EQ(asInts(clr7[11]), (std::vector<int>{0, 0, 0, 0, 0, 0, 100}));
    EXPECT_EQ(asInts(clr7[33]), (std::vector<int>{0, 0, 0, 0, 100, 0, 0}));
    EXPECT_EQ(asInts(clr7[77]), (std::vector<int>{100, 100, 0, 0, 0, 0, 0}));
    EXPECT_EQ(asInts(clr7[108]), (std::vector<int>{100, 0, 0, 0, 0, 0, 100}));
    EXPECT_EQ(asInts(clr7[158]), (std::vector<int>{0, 0, 0, 0, 50, 50, 50}));
    EXPECT_EQ(asInts(clr6[22]), (std::vector<int>{0, 0, 0, 0, 100, 0}));
    EXPECT_EQ(asInts(clr6[106]), (std::vector<int>{0, 0, 0, 0, 100, 100}));
    EXPECT_EQ(asInts(clr6[127]), (std::vector<int>{50, 50, 50, 50, 0, 0}));
    EXPECT_EQ(asInts(clr6[137]), (std::vector<int>{0, 0, 0, 0, 0, 0}));
    int paper6 = 0, paper7 = 0;
    for (size_t r = 0; r < 128; ++r)
        paper6 += asInts(clr6[r]) == std::vector<int>(6, 0);
    for (size_t r = 0; r < 159; ++r)
        paper7 += asInts(clr7[r]) == std::vector<int>(7, 0);
    EXPECT_EQ(paper6, 5);
    EXPECT_EQ(paper7, 6);

    for (size_t i = 1; i < 3499; ++i)
        ASSERT_LT(zan[i - 1], zan[i]) << "strictly increasing at " << i;
    const std::pair<size_t, std::vector<int>> telling[] = {
        {1, {0, 0, 0, 2}},      {20, {0, 0, 0, 100}},     {21, {0, 0, 2, 0}},      {491, {0, 100, 100, 100}},
        {492, {2, 0, 0, 0}},    {1000, {20, 10, 70, 20}}, {2000, {50, 30, 100, 0}}, {3000, {90, 60, 50, 0}},
        {3498, {100, 100, 100, 100}}, {3499, {0, 0, 0, 0}}};
    for (const auto& row : telling)
        EXPECT_EQ(asInts(zan[row.first]), row.second) << "row " << row.first;
}

TEST_F(RampProfile, RampsInterpolateInTheCubeRootDomain)
{
    for (int c = 0; c < 7; ++c) {
        const auto& ramp = profile.tintLists[c];
        ASSERT_EQ(ramp.size(), 101u);
        for (int j = 0; j < 36; ++j) {
            EXPECT_NEAR(ramp[0].spectrum[j], 0.9, 1e-15);
            EXPECT_NEAR(ramp[100].spectrum[j], solids[c].spectrum[j], 1e-15);
            const double mid = (std::cbrt(0.9) + std::cbrt(solids[c].spectrum[j])) / 2;
            EXPECT_NEAR(ramp[50].spectrum[j], mid * mid * mid, 1e-15);
        }
    }
    const auto& thirty = profile.tintLists[4][30];
    EXPECT_EQ(std::vector<double>(thirty.channel, thirty.channel + 7), (std::vector<double>{0, 0, 0, 0, 30, 0, 0}));
}

TEST_F(RampProfile, TrappingAndSeparationPredictions)
{
    // R = T0 * product of (Tn / W)^En, En = 0.85 to the number of full inks
    // before ink n (trapping) or 0.95 for every ink (separated set).
    const struct {
        double request[7];
        int inks[5]; // printed inks in channel order, -1 ends
    } cases[] = {{{100, 0, 0, 0, 0, 0, 0}, {0, -1}},        {{0, 0, 0, 0, 100, 0, 0}, {4, -1}},
                 {{100, 100, 0, 0, 0, 0, 0}, {0, 1, -1}},   {{100, 100, 100, 100, 0, 0, 100}, {0, 1, 2, 3, 6}},
                 {{0, 0, 0, 0, 0, 0, 0}, {-1}}};
    for (const auto& c : cases) {
        const double* r = c.request;
        profile.setSample(r[0], r[1], r[2], r[3], r[4], r[5], r[6]);
        profile.calcMultiChannelSample();
        const MathProfile::ColorPatch trapped = sample();
        profile.calcSeparationSample();
        for (int j = 0; j < 36; ++j) {
            double expected = 0.9, separated = 0.9;
            for (int n = 0; n < 5 && c.inks[n] >= 0; ++n) {
                const double ratio = solids[c.inks[n]].spectrum[j] / 0.9;
                expected *= std::pow(ratio, n == 0 ? 1.0 : std::pow(0.85, n));
                separated *= std::pow(ratio, c.inks[n] == 0 ? 1.0 : 0.95); // T0 enters as it is
            }
            EXPECT_NEAR(trapped.spectrum[j], expected, 1e-13) << "ink " << c.inks[0] << " band " << j;
            EXPECT_NEAR(sample().spectrum[j], separated, 1e-13) << "ink " << c.inks[0] << " band " << j;
        }
    }
}

TEST(MultiChannelChart, GoldenChartsAndTheExchange)
{
    for (int process : {3, 5}) {
        TempDir dir;
        MeasurementBlock block = readGoldenInput("multichannel.in");
        const std::vector<int> before = block.ints;
        void* profile = CreateMathProfile("exchange");
        ASSERT_EQ(calculate(profile, process, dir.path("spectral.txt"), block), VM_STATUS_OK);
        EXPECT_EQ(readFile(dir.path("spectral.txt")),
                  readFile(goldenPath("multichannel.p" + std::to_string(process) + ".chart")));
        for (int i = 0; i < VM_EXCHANGE_RECORDS; ++i) {
            const auto& cmyk = MathProfile::ZANExtended[static_cast<size_t>(i)];
            for (int c = 0; c < 4; ++c)
                ASSERT_EQ(block.ints[static_cast<size_t>(7 * i + c)], cmyk[static_cast<size_t>(c)]);
            for (int c = 4; c < 7; ++c)
                ASSERT_EQ(block.ints[static_cast<size_t>(7 * i + c)], before[static_cast<size_t>(7 * i + c)]);
        }
        // The host separates the combinations; process 6 predicts them.
        loadSeparations(block.ints);
        ASSERT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, dir.path("xyz.txt"), block), VM_STATUS_OK);
        EXPECT_EQ(readFile(dir.path("xyz.txt")),
                  readFile(goldenPath("multichannel.p" + std::to_string(process) + "-p6.chart")));
        DestroyMathProfile(profile);
    }
}

TEST(MultiChannelChart, SixColourChartNeverPrintsChannelFive)
{
    TempDir dir;
    MeasurementBlock block = readGoldenInput("multichannel.in");
    void* profile = CreateMathProfile("six");
    ASSERT_EQ(calculate(profile, VM_PROCESS_SIX_COLOUR, dir.path("six.txt"), block), VM_STATUS_OK);
    DestroyMathProfile(profile);
    const auto all = lines(readFile(dir.path("six.txt")));
    ASSERT_EQ(all.size(), 10u + 128u + 1u);
    for (size_t i = 10; i < 138; ++i) {
        const auto values = fields(all[i]);
        ASSERT_EQ(values.size(), 44u) << "43 values, each followed by TAB";
        EXPECT_EQ(values[5], "0");
    }
    EXPECT_EQ(all[10 + 22].substr(0, 16), "0\t0\t0\t0\t100\t0\t0\t") << "ink A is channel 4";
    EXPECT_EQ(all[10 + 44].substr(0, 16), "0\t0\t0\t0\t0\t0\t100\t") << "ink B is channel 6";
}

TEST(MultiChannelChart, SeparatedSetReadsThousandthsOfAPercent)
{
    TempDir dir;
    MeasurementBlock block = readGoldenInput("multichannel.in");
    void* profile = CreateMathProfile("thousandths");
    ASSERT_EQ(calculate(profile, VM_PROCESS_SEVEN_COLOUR, dir.path("s.txt"), block), VM_STATUS_OK);
    // Record r carries a cyan value only; all other records are paper.
    // (u + 900) / 1000 truncated: 99 -> 0, 100 -> 1, 50099 -> 50, 50100 -> 51,
    // -1899 -> 0, -1900 -> -1 and 100100 -> 101 (no ramp patch: unprinted).
    const int hostValues[] = {99, 100, 50099, 50100, -1899, -1900, 100100, 50000, 1000};
    std::fill(block.ints.begin(), block.ints.end(), 0);
    for (int r = 0; r < 9; ++r)
        block.ints[static_cast<size_t>(7 * r)] = hostValues[r];
    ASSERT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, dir.path("x.txt"), block), VM_STATUS_OK);
    DestroyMathProfile(profile);
    const auto chart = lines(readFile(dir.path("x.txt")));
    ASSERT_EQ(chart.size(), 7u + 3499u + 1u);
    auto xyzOf = [&](int record) {
        const auto v = fields(chart.at(static_cast<size_t>(7 + record)));
        return v.at(5) + " " + v.at(6) + " " + v.at(7);
    };
    const std::string paper = xyzOf(100);
    for (int r : {0, 4, 5, 6})
        EXPECT_EQ(xyzOf(r), paper) << hostValues[r];
    EXPECT_EQ(xyzOf(1), xyzOf(8)) << "100 and 1000 are both 1 %";
    EXPECT_EQ(xyzOf(2), xyzOf(7)) << "50099 is 50 %";
    EXPECT_NE(xyzOf(3), xyzOf(2)) << "50100 is 51 %";
    EXPECT_NE(xyzOf(1), paper);
    // Labels are the extended combinations, whatever the host wrote.
    const auto record1 = fields(chart[8]);
    EXPECT_EQ(record1[0] + " " + record1[4], "2 2") << "record 2 is C 0 M 0 Y 0 K 2";
}

TEST(MultiChannelChart, OtherProcessesWriteOnlyTheEnd)
{
    TempDir dir;
    RowTable rows(syntheticForm());
    MathProfile profile("other");
    std::vector<int> buffer(VM_EXCHANGE_BUFFER_INTS, 7);
    profile.calculateChartMCH(rows.rows(), VM_PROCESS_OFFSET, dir.path("e.txt").c_str(), buffer.data());
    EXPECT_EQ(readFile(dir.path("e.txt")), "END_DATA\n");
    EXPECT_EQ(buffer, std::vector<int>(VM_EXCHANGE_BUFFER_INTS, 7));
    for (const auto& list : profile.tintLists)
        EXPECT_TRUE(list.empty());
}

