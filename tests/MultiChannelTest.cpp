// Six- and seven-colour processes: the golden charts and the two-call exchange
// with the host, and the processes the class method does not make. The golden
// charts pin the patch tables, the tone ramps, both seven-ink predictions and
// the host's thousandths of a percent (the golden separations hold values
// beside every rounding step, below 0 and above 100 %).
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
        ASSERT_EQ(calculateBlock(profile, process, dir.path("spectral.txt"), block), VM_STATUS_OK);
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
        ASSERT_EQ(calculateBlock(profile, VM_PROCESS_SEPARATED_SET, dir.path("xyz.txt"), block), VM_STATUS_OK);
        EXPECT_EQ(readFile(dir.path("xyz.txt")),
                  readFile(goldenPath("multichannel.p" + std::to_string(process) + "-p6.chart")));
        DestroyMathProfile(profile);
    }
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
