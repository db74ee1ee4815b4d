// The four-colour charts and the chart conversion: the reference charts byte
// for byte, the 900-patch table, layout and cut rules, and the conversion's
// decisions on degenerate whites.
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <set>

using namespace testsupport;

namespace {

// Runs one CalculateChart call on a fresh profile and returns the chart text.
std::string chartOf(MeasurementBlock block, int process)
{
    TempDir dir;
    void* profile = CreateMathProfile("golden");
    const int status = CalculateChart(profile, static_cast<PrintProcess>(process), dir.path("c").c_str(),
                                      block.ints.data(), block.inputKind, block.firstWavelength,
                                      block.valuesPerPatch, block.count);
    EXPECT_EQ(status, VM_STATUS_OK) << "process " << process;
    DestroyMathProfile(profile);
    return status == VM_STATUS_OK ? readFile(dir.path("c")) : std::string();
}

std::string entry(size_t i)
{
    const auto& e = MathProfile::toBeCalculated[i];
    return std::to_string(e[0]) + "/" + std::to_string(e[1]) + "/" + std::to_string(e[2]) + "/" + std::to_string(e[3]);
}

// Spectral value v (5 + i) of data line i of a converted chart.
double valueOf(const std::vector<std::string>& chart, size_t line, size_t v)
{
    return std::stod(fields(chart.at(7 + line)).at(5 + v));
}

} // namespace

TEST(FourColourChart, ReferenceCharts)
{
    EXPECT_EQ(chartOf(readGoldenInput("offset-form.in"), VM_PROCESS_OFFSET),
              readFile(goldenPath("offset-form.p0.chart")));
    EXPECT_EQ(chartOf(readGoldenInput("offset-form-k20.in"), VM_PROCESS_OFFSET),
              readFile(goldenPath("offset-form-k20.p0.chart")));
    const std::string gravure = chartOf(readGoldenInput("offset-form.in"), VM_PROCESS_GRAVURE);
    EXPECT_EQ(gravure, readFile(goldenPath("offset-form.p1.chart")));
    // Processes outside the table run the offset job.
    EXPECT_EQ(chartOf(readGoldenInput("offset-form.in"), -1), readFile(goldenPath("offset-form.p0.chart")));

    // Layout: CR LF only after "IT8", 900 lines of eight values without a
    // trailing TAB, values cut to two decimals; patch 26 is the paper.
    const auto text = lines(gravure);
    ASSERT_EQ(text.size(), 908u);
    EXPECT_EQ(text[0], "IT8\r");
    EXPECT_EQ(text[907], "END_DATA");
    for (size_t i = 7; i < 907; ++i) {
        const auto values = fields(text[i]);
        ASSERT_EQ(values.size(), 8u) << text[i];
        EXPECT_EQ(values[0], std::to_string(i - 6));
        EXPECT_EQ(values[1] + "/" + values[2] + "/" + values[3] + "/" + values[4], entry(i - 7));
        for (size_t v = 5; v < 8; ++v)
            EXPECT_EQ(std::round(std::stod(values[v]) * 100.0) / 100.0, std::stod(values[v]));
    }
    auto xyz = [](const std::string& line) { return line.substr(line.find('\t', line.find('\t') + 1)); };
    EXPECT_EQ(xyz(text[7 + 94]), xyz(text[7 + 126])) << "patches 95 and 127 are the same combination";
}

TEST(FourColourChart, TableTellingRows)
{
    const std::pair<size_t, const char*> telling[] = {
        {0, "100/0/0/0"},    {25, "0/0/0/0"},       {26, "90/0/0/0"},      {52, "0/0/0/20"},
        {53, "40/100/0/0"},  {95, "70/40/40/0"},    {96, "100/90/90/100"}, {128, "10/10/10/0"},
        {138, "100/100/0/40"}, {152, "0/40/40/60"}, {153, "0/0/0/0"},      {154, "0/10/0/0"},
        {159, "10/0/0/0"},   {369, "0/0/0/20"},     {585, "0/0/0/40"},     {710, "0/0/0/60"},
        {835, "0/0/0/80"},   {898, "100/100/100/80"}, {899, "0/0/0/10"}};
    for (const auto& row : telling)
        EXPECT_EQ(entry(row.first), row.second) << "patch " << row.first + 1;
    const std::set<int> levels = {0, 10, 20, 40, 60, 70, 80, 90, 100}; // the form's measured steps
    for (const auto& e : MathProfile::toBeCalculated)
        for (unsigned char v : e)
            ASSERT_TRUE(levels.count(v)) << int(v);
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

TEST(ChartConversion, ReferenceChartsAndEqualWhites)
{
    for (int process : {7, 8, 9})
        EXPECT_EQ(chartOf(readGoldenInput("conversion.in"), process),
                  readFile(goldenPath("conversion.p" + std::to_string(process) + ".chart")));
    // Both whites equal: process 8 gives the measured rows (negatives as 0),
    // process 9 blends with w = 0.33: r 0.33 + 0.67 r.
    MeasurementBlock same = readGoldenInput("conversion.in");
    const size_t stride = 36, second = static_cast<size_t>(same.count - 1) * stride;
    std::copy_n(same.ints.begin() + static_cast<long>(second - stride), stride, same.ints.begin() + static_cast<long>(second));
    const auto copy = lines(chartOf(same, 7)), converted = lines(chartOf(same, 8)), blended = lines(chartOf(same, 9));
    for (size_t i = 0; i + 2 < static_cast<size_t>(same.count); ++i)
        for (size_t v = 0; v < 36; ++v) {
            const double r = valueOf(copy, i, v);
            EXPECT_EQ(valueOf(converted, i, v), std::max(r, 0.0));
            EXPECT_NEAR(valueOf(blended, i, v), r, 1e-5 + 1e-5 * std::fabs(r));
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
        EXPECT_EQ(valueOf(converted, i, 0), valueOf(measured, i, 0));
        EXPECT_EQ(valueOf(converted, i, 1), 0.0);
    }
    EXPECT_EQ(blended.find("nan"), std::string::npos);
    EXPECT_EQ(blended.find("inf"), std::string::npos);
}

TEST(ChartConversion, BlendWeightJumpsAboveEleven)
{
    // Grey whites: the first at 0.9, the second just below / above a CIELAB
    // distance of 11. w = 0.33 up to 11, then 0.33 / ((dE - 10) / 25).
    MeasurementBlock block = readGoldenInput("conversion.in");
    const size_t first = static_cast<size_t>(block.count - 2) * 36, second = first + 36;
    std::fill_n(block.ints.begin() + static_cast<long>(first), 36, 900);
    MathProfile lab("lab");
    auto deltaE = [&](int level) {
        MathProfile::lab ends[2];
        for (int k = 0; k < 2; ++k) {
            MathProfile::ColorPatch patch = {};
            std::fill(std::begin(patch.spectrum), std::end(patch.spectrum), (k == 0 ? 900 : level) / 1000.0);
            lab.spec2XYZ(&patch);
            ends[k] = lab.XYZ2LAB({patch.XYZ[0] / 100, patch.XYZ[1] / 100, patch.XYZ[2] / 100});
        }
        const double dL = ends[0].L - ends[1].L, da = ends[0].a - ends[1].a, db = ends[0].b - ends[1].b;
        return std::sqrt(dL * dL + da * da + db * db);
    };
    int below = 900;
    while (deltaE(below - 1) <= 11.0)
        --below;
    const double r = block.ints[0] / 1000.0;
    for (int level : {below, below - 1}) {
        std::fill_n(block.ints.begin() + static_cast<long>(second), 36, level);
        const double dE = deltaE(level);
        const double w = dE <= 11.0 ? 0.33 : 0.33 / ((dE - 10) / 25);
        EXPECT_NEAR(valueOf(lines(chartOf(block, 9)), 0, 0), r / 0.9 * (level / 1000.0) * w + (1 - w) * r, 1e-4)
            << "dE " << dE << " w " << w;
        EXPECT_EQ(w > 7.0, level < below) << "the weight jumps to about 8 just above 11";
    }
}
