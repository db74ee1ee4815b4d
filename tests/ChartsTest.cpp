// The four-colour charts and the chart conversion: golden bytes of the
// reference charts, the 900-patch table, layout and cut rules, statuses.
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <set>

using namespace testsupport;

namespace {

// Runs one CalculateChart call on a fresh profile and returns the chart text.
std::string chartOf(MeasurementBlock block, int process, MathProfile** keep = nullptr)
{
    TempDir dir;
    const std::string out = dir.path("chart.txt");
    void* profile = CreateMathProfile("golden");
    const int status = CalculateChart(profile, static_cast<PrintProcess>(process), out.c_str(), block.ints.data(),
                                      block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
    EXPECT_EQ(status, VM_STATUS_OK) << "process " << process;
    if (keep != nullptr)
        *keep = static_cast<MathProfile*>(profile);
    else
        DestroyMathProfile(profile);
    return status == VM_STATUS_OK ? readFile(out) : std::string();
}

} // namespace

TEST(FourColourChart, OffsetProcessMatchesGoldenAndFitsTheGreys)
{
    MathProfile* profile = nullptr;
    EXPECT_EQ(chartOf(readGoldenInput("offset-form.in"), VM_PROCESS_OFFSET, &profile),
              readFile(goldenPath("offset-form.p0.chart")));
    ASSERT_NE(profile, nullptr);
    EXPECT_EQ(profile->grayDiffFactor[0], -0.04);
    EXPECT_EQ(profile->grayDiffFactor[1], -0.03);
    EXPECT_EQ(profile->grayDiffFactor[2], -0.02);
    EXPECT_EQ(profile->grayDiffFactor[3], 0.03);
    EXPECT_EQ(profile->coverageLimit, 96.0);
    DestroyMathProfile(profile);
}

TEST(FourColourChart, SixteenBandInputMatchesGolden)
{
    EXPECT_EQ(chartOf(readGoldenInput("offset-form-k20.in"), VM_PROCESS_OFFSET),
              readFile(goldenPath("offset-form-k20.p0.chart")));
}

TEST(FourColourChart, GravureProcessMatchesGolden)
{
    EXPECT_EQ(chartOf(readGoldenInput("offset-form.in"), VM_PROCESS_GRAVURE),
              readFile(goldenPath("offset-form.p1.chart")));
}

TEST(FourColourChart, ProcessesOutsideTheTableRunTheOffsetJob)
{
    const std::string offset = readFile(goldenPath("offset-form.p0.chart"));
    for (int process : {2, 4, -1, 10})
        EXPECT_EQ(chartOf(readGoldenInput("offset-form.in"), process), offset) << "process " << process;
}

TEST(ChartConversion, ProcessesSevenEightNineMatchGolden)
{
    for (int process : {7, 8, 9})
        EXPECT_EQ(chartOf(readGoldenInput("conversion.in"), process),
                  readFile(goldenPath("conversion.p" + std::to_string(process) + ".chart")))
            << "process " << process;
}
