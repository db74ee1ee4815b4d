// Six- and seven-colour processes: the golden charts and the two-call exchange
// with the host (they pin the patch tables, the tone ramps and both seven-ink
// predictions), the host's thousandths of a percent, and the processes the
// class method does not make.
#include "TestSupport.h"

#include <gtest/gtest.h>

using namespace testsupport;

TEST(MultiChannelChart, GoldenChartsAndTheExchange)
{
    for (int process : {3, 5}) {
        SCOPED_TRACE("process " + std::to_string(process));
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
                ASSERT_EQ(block.ints[static_cast<size_t>(7 * i + c)], cmyk[static_cast<size_t>(c)]) << "record " << i;
            for (int c = 4; c < 7; ++c)
                ASSERT_EQ(block.ints[static_cast<size_t>(7 * i + c)], before[static_cast<size_t>(7 * i + c)])
                    << "record " << i;
        }
        // The host separates the combinations; process 6 predicts them.
        block = withSeparations(block);
        ASSERT_EQ(calculate(profile, VM_PROCESS_SEPARATED_SET, dir.path("xyz.txt"), block), VM_STATUS_OK);
        EXPECT_EQ(readFile(dir.path("xyz.txt")),
                  readFile(goldenPath("multichannel.p" + std::to_string(process) + "-p6.chart")));
        DestroyMathProfile(profile);
    }
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
