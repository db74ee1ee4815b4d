// The four-colour charts and the chart conversion: the reference charts byte
// for byte (they pin the 900-patch table, the layout and the two-decimal cut),
// the processes the class methods refuse, reused profiles, and the
// conversion's decisions on degenerate whites.
#include "TestSupport.h"
#include "models/PrintModels.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace testsupport;

namespace {

// Spectral value v (5 + v) of data line i of a converted chart.
double valueOf(const std::vector<std::string>& chart, size_t line, size_t v)
{
    return std::stod(fields(chart.at(7 + line)).at(5 + v));
}

} // namespace

TEST(FourColourChart, ReferenceCharts)
{
    const struct {
        const char* input;
        int process; // processes outside the table run the offset job
        const char* chart;
    } cases[] = {{"offset-form.in", VM_PROCESS_OFFSET, "offset-form.p0.chart"},
                 {"offset-form-k20.in", VM_PROCESS_OFFSET, "offset-form-k20.p0.chart"},
                 {"offset-form.in", VM_PROCESS_GRAVURE, "offset-form.p1.chart"},
                 {"offset-form.in", -1, "offset-form.p0.chart"}};
    for (const auto& c : cases) {
        SCOPED_TRACE(std::string(c.input) + ", process " + std::to_string(c.process));
        EXPECT_EQ(chartOf(readGoldenInput(c.input), c.process), readFile(goldenPath(c.chart)));
    }
}

TEST(FourColourChart, OnlyOffsetOrGravureAndIndependentProfiles)
{
    TempDir dir;
    RowTable first(syntheticForm(0)), second(syntheticForm(2));
    MathProfile reused("reused"), fresh("fresh");
    EXPECT_THROW(reused.calculateChart(first.rows(), VM_PROCESS_SIX_COLOUR, dir.path("x").c_str()),
                 std::invalid_argument);
    EXPECT_THROW(reused.calculateChart46(first.rows(), VM_PROCESS_CHART_COPY, dir.path("x").c_str(), false),
                 std::invalid_argument);
    EXPECT_FALSE(fileExists(dir.path("x")));
    EXPECT_TRUE(reused.tintLists[0].empty()) << "rejected before anything was read";
    // A second form on one profile selects the first form's tints until the
    // lists are cleared.
    reused.calculateChart(first.rows(), VM_PROCESS_GRAVURE, dir.path("a").c_str());
    reused.calculateChart(second.rows(), VM_PROCESS_GRAVURE, dir.path("stale").c_str());
    reused.clearTintLists();
    reused.calculateChart(second.rows(), VM_PROCESS_GRAVURE, dir.path("cleared").c_str());
    fresh.calculateChart(second.rows(), VM_PROCESS_GRAVURE, dir.path("fresh").c_str());
    EXPECT_NE(readFile(dir.path("stale")), readFile(dir.path("fresh")));
    EXPECT_EQ(readFile(dir.path("cleared")), readFile(dir.path("fresh")));
}

TEST(ChartConversion, ReferenceCharts)
{
    for (int process : {7, 8, 9}) {
        SCOPED_TRACE("process " + std::to_string(process));
        EXPECT_EQ(chartOf(readGoldenInput("conversion.in"), process),
                  readFile(goldenPath("conversion.p" + std::to_string(process) + ".chart")));
    }
}

TEST(ChartConversion, ZeroOrNegativeFirstWhite)
{
    // A zero band in the first white: the measured value stands for the
    // converted one. A negative band makes the conversion negative: 0.
    MeasurementBlock block = readGoldenInput("conversion.in");
    const size_t firstWhite = static_cast<size_t>(block.count - 2) * 36;
    block.ints[firstWhite] = 0;
    block.ints[firstWhite + 1] = -500;
    const auto converted = lines(chartOf(block, 8)), measured = lines(chartOf(block, 7));
    const std::string blended = chartOf(block, 9);
    for (size_t i = 0; i + 2 < static_cast<size_t>(block.count); ++i) {
        SCOPED_TRACE("patch " + std::to_string(i + 1));
        EXPECT_EQ(valueOf(converted, i, 0), valueOf(measured, i, 0));
        EXPECT_EQ(valueOf(converted, i, 1), 0.0);
    }
    EXPECT_EQ(blended.find("nan"), std::string::npos);
    EXPECT_EQ(blended.find("inf"), std::string::npos);
}

TEST(ChartConversion, BlendWeightJumpsJustAboveEleven)
{
    EXPECT_EQ(veltmarquist::chartConversionBlendWeight(11.0), 0.33);
    EXPECT_GT(veltmarquist::chartConversionBlendWeight(std::nextafter(11.0, 12.0)), 8.0);
    EXPECT_EQ(veltmarquist::chartConversionBlendWeight(35.0), 0.33);
}
