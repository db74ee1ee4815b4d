// The four-colour charts and the chart conversion: golden bytes of the
// reference charts, the 900-patch table, layout and cut rules, statuses.
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <set>
#include <sstream>

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
    for (int process : {4, -1})
        EXPECT_EQ(chartOf(readGoldenInput("offset-form.in"), process), offset) << "process " << process;
}

TEST(ChartConversion, ProcessesSevenEightNineMatchGolden)
{
    for (int process : {7, 8, 9})
        EXPECT_EQ(chartOf(readGoldenInput("conversion.in"), process),
                  readFile(goldenPath("conversion.p" + std::to_string(process) + ".chart")))
            << "process " << process;
}

namespace {

std::string chartEntry(size_t i)
{
    const auto& e = MathProfile::toBeCalculated[i];
    return std::to_string(e[0]) + "/" + std::to_string(e[1]) + "/" + std::to_string(e[2]) + "/" + std::to_string(e[3]);
}

} // namespace

TEST(FourColourChart, TableTellingRows)
{
    const auto& table = MathProfile::toBeCalculated;
    ASSERT_EQ(table.size(), 900u);
    EXPECT_EQ(chartEntry(0), "100/0/0/0");
    EXPECT_EQ(chartEntry(6), "100/100/100/0");
    EXPECT_EQ(chartEntry(25), "0/0/0/0");
    EXPECT_EQ(chartEntry(26), "90/0/0/0");
    EXPECT_EQ(chartEntry(47), "0/0/0/90");
    EXPECT_EQ(chartEntry(52), "0/0/0/20");
    EXPECT_EQ(chartEntry(53), "40/100/0/0");
    EXPECT_EQ(chartEntry(95), "70/40/40/0");
    EXPECT_EQ(chartEntry(96), "100/90/90/100");
    EXPECT_EQ(chartEntry(122), "10/10/10/20");
    EXPECT_EQ(chartEntry(128), "10/10/10/0");
    EXPECT_EQ(chartEntry(138), "100/100/0/40");
    EXPECT_EQ(chartEntry(143), "0/40/40/40");
    EXPECT_EQ(chartEntry(152), "0/40/40/60");
    EXPECT_EQ(chartEntry(153), "0/0/0/0") << "first grid: yellow, cyan, magenta from 0";
    EXPECT_EQ(chartEntry(154), "0/10/0/0") << "magenta is the inner loop";
    EXPECT_EQ(chartEntry(159), "10/0/0/0") << "then cyan";
    EXPECT_EQ(chartEntry(368), "100/100/100/0");
    EXPECT_EQ(chartEntry(369), "0/0/0/20");
    EXPECT_EQ(chartEntry(585), "0/0/0/40");
    EXPECT_EQ(chartEntry(710), "0/0/0/60");
    EXPECT_EQ(chartEntry(835), "0/0/0/80");
    EXPECT_EQ(chartEntry(898), "100/100/100/80");
    EXPECT_EQ(chartEntry(899), "0/0/0/10");
    EXPECT_EQ(chartEntry(94), chartEntry(126)) << "patches 95 and 127 repeat";
    // Only levels the test form measures.
    const std::set<int> levels = {0, 10, 20, 40, 60, 70, 80, 90, 100};
    for (const auto& entry : table)
        for (unsigned char v : entry)
            EXPECT_TRUE(levels.count(v)) << int(v);
}

TEST(FourColourChart, LayoutCutAndRepeatedPatches)
{
    const std::string chart = readFile(goldenPath("offset-form.p1.chart"));
    const auto text = lines(chartOf(readGoldenInput("offset-form.in"), VM_PROCESS_GRAVURE));
    ASSERT_EQ(text.size(), 908u);
    EXPECT_EQ(text[0], "IT8\r");
    for (size_t i = 1; i < text.size(); ++i)
        EXPECT_EQ(text[i].find('\r'), std::string::npos) << "only the first line ends in CR LF";
    EXPECT_EQ(text[1], "NUMBER_OF_SETS\t900");
    EXPECT_EQ(text[907], "END_DATA");
    for (size_t i = 7; i < 907; ++i) {
        const auto values = fields(text[i]);
        ASSERT_EQ(values.size(), 8u) << "no trailing TAB: " << text[i];
        EXPECT_EQ(values[0], std::to_string(i - 6));
        EXPECT_EQ(values[1] + "/" + values[2] + "/" + values[3] + "/" + values[4], chartEntry(i - 7));
        for (size_t v = 5; v < 8; ++v) {
            const double value = std::stod(values[v]);
            EXPECT_EQ(std::floor(value * 100.0 + 0.5) / 100.0, value) << "two decimals at most";
        }
    }
    auto tail = [](const std::string& line) { return line.substr(line.find('\t')); };
    EXPECT_EQ(tail(text[7 + 94]), tail(text[7 + 126]));
}

TEST(FourColourChart, PaperAndSolidsComeOutAsMeasured)
{
    MeasurementBlock block = readGoldenInput("offset-form.in");
    RowTable rows = RowTable::fromBlock(block);
    auto xyzLine = [](const std::vector<double>& spectrum) {
        MathProfile probe("probe");
        MathProfile::ColorPatch patch = {};
        std::copy(spectrum.begin(), spectrum.end(), patch.spectrum);
        probe.spec2XYZ(&patch);
        std::ostringstream line;
        line.imbue(std::locale::classic());
        line << std::floor(patch.XYZ[0] * 100) / 100 << '\t' << std::floor(patch.XYZ[1] * 100) / 100 << '\t'
             << std::floor(patch.XYZ[2] * 100) / 100;
        return line.str();
    };
    const auto text = lines(readFile(goldenPath("offset-form.p0.chart")));
    const auto gravure = lines(chartOf(block, VM_PROCESS_GRAVURE));
    auto xyzOf = [](const std::string& line) {
        const auto v = fields(line);
        return v[5] + "\t" + v[6] + "\t" + v[7];
    };
    EXPECT_EQ(xyzOf(text[7 + 25]), xyzLine(rows.row(1))) << "patch 26 is the paper (offset)";
    EXPECT_EQ(xyzOf(gravure[7 + 25]), xyzLine(rows.row(1))) << "patch 26 is the paper (gravure)";
    EXPECT_EQ(xyzOf(text[7]), xyzLine(rows.row(0))) << "patch 1 is the cyan solid";
}

TEST(FourColourChart, OnlyOffsetOrGravureMakeTheChart)
{
    TempDir dir;
    RowTable rows(syntheticForm());
    MathProfile profile("other");
    EXPECT_THROW(profile.calculateChart(rows.rows(), VM_PROCESS_SIX_COLOUR, dir.path("c").c_str()),
                 std::invalid_argument);
    EXPECT_THROW(profile.calculateChart46(rows.rows(), VM_PROCESS_CHART_COPY, dir.path("c").c_str(), false),
                 std::invalid_argument);
    EXPECT_FALSE(fileExists(dir.path("c")));
    EXPECT_TRUE(profile.tintLists[0].empty()) << "nothing read";
    try {
        profile.calculateChart(rows.rows(), VM_PROCESS_OFFSET, dir.path("x/c").c_str());
        FAIL() << "expected Exceptions";
    } catch (const Exceptions& failure) {
        EXPECT_EQ(failure.code, 1);
    }
    EXPECT_TRUE(profile.tintLists[0].empty()) << "an unopenable file stops before reading";
}

TEST(FourColourChart, FreshProfilesAndClearedListsGiveIndependentCharts)
{
    // Two gravure charts of different forms on one profile: the second one
    // selects the first form's tints unless the lists are cleared.
    TempDir dir;
    RowTable first(syntheticForm(0)), second(syntheticForm(2));
    MathProfile reused("reused"), fresh("fresh");
    reused.calculateChart(first.rows(), VM_PROCESS_GRAVURE, dir.path("a").c_str());
    reused.calculateChart(second.rows(), VM_PROCESS_GRAVURE, dir.path("stale").c_str());
    reused.clearTintLists();
    reused.calculateChart(second.rows(), VM_PROCESS_GRAVURE, dir.path("cleared").c_str());
    fresh.calculateChart(second.rows(), VM_PROCESS_GRAVURE, dir.path("fresh").c_str());
    EXPECT_NE(readFile(dir.path("stale")), readFile(dir.path("fresh")));
    EXPECT_EQ(readFile(dir.path("cleared")), readFile(dir.path("fresh")));
}

TEST(ChartConversion, LayoutAndReferenceHandling)
{
    MeasurementBlock block = readGoldenInput("conversion.in");
    const auto copy = lines(chartOf(block, VM_PROCESS_CHART_COPY));
    ASSERT_EQ(copy.size(), static_cast<size_t>(block.count - 2 + 8));
    EXPECT_EQ(copy[0], "LGOROWLENGTH\t54\r");
    EXPECT_EQ(copy[1], "NUMBER_OF_SETS\t" + std::to_string(block.count - 2));
    EXPECT_EQ(copy[2], "NUMBER_OF_FIELDS\t41");
    EXPECT_EQ(fields(copy[4]).size(), 42u) << "41 names, each followed by TAB";
    for (size_t i = 7; i + 1 < copy.size(); ++i) {
        const auto values = fields(copy[i]);
        ASSERT_EQ(values.size(), 42u);
        EXPECT_EQ(values.back(), "") << "data lines end with TAB";
    }

    // Both whites equal: process 8 gives the measured rows, process 9 blends
    // with w = 0.33 (r 0.33 + 0.67 r), equal up to rounding.
    MeasurementBlock same = block;
    const int stride = block.valuesPerPatch;
    for (int j = 0; j < stride; ++j)
        same.ints[static_cast<size_t>((block.count - 1) * stride + j)] =
            same.ints[static_cast<size_t>((block.count - 2) * stride + j)];
    const auto converted = lines(chartOf(same, VM_PROCESS_CHART_CONVERT));
    for (size_t i = 7; i + 1 < converted.size(); ++i) {
        const auto a = fields(converted[i]), b = fields(copy[i]);
        for (size_t v = 5; v < 41; ++v)
            EXPECT_EQ(std::stod(a[v]), std::max(std::stod(b[v]), 0.0)) << "negative values become 0";
    }
    const auto blended = lines(chartOf(same, VM_PROCESS_CHART_BLEND));
    for (size_t i = 7; i + 1 < blended.size(); ++i) {
        const auto a = fields(blended[i]), b = fields(copy[i]);
        for (size_t v = 5; v < 41; ++v)
            EXPECT_NEAR(std::stod(a[v]), std::stod(b[v]), 1e-5 + 1e-5 * std::stod(b[v]));
    }
}

TEST(ChartConversion, ZeroOrNegativeWhiteBands)
{
    // First white 0 in band 0: the measured value stands for the converted
    // one (no inf or nan). A negative first white makes the conversion
    // negative: written as 0 by process 8.
    MeasurementBlock block = readGoldenInput("conversion.in");
    const int stride = block.valuesPerPatch;
    const size_t firstWhite = static_cast<size_t>((block.count - 2) * stride);
    block.ints[firstWhite + 0] = 0;
    block.ints[firstWhite + 1] = -500;
    const auto converted = lines(chartOf(block, VM_PROCESS_CHART_CONVERT));
    const auto measured = lines(chartOf(block, VM_PROCESS_CHART_COPY));
    const auto blended = lines(chartOf(block, VM_PROCESS_CHART_BLEND));
    for (size_t i = 7; i + 1 < converted.size(); ++i) {
        EXPECT_EQ(fields(converted[i])[5], fields(measured[i])[5]);
        EXPECT_EQ(std::stod(fields(converted[i])[6]), 0.0);
        EXPECT_EQ(blended[i].find("nan"), std::string::npos);
        EXPECT_EQ(blended[i].find("inf"), std::string::npos);
    }
}

TEST(ChartConversion, BlendWeightAroundTheJumpAtEleven)
{
    // The whites' distance in CIELAB sets the weight of the converted
    // spectrum: 0.33 up to 11, then 0.33 / ((dE - 10) / 25).
    MeasurementBlock block = readGoldenInput("conversion.in");
    const int stride = block.valuesPerPatch;
    const size_t first = static_cast<size_t>((block.count - 2) * stride);
    const size_t second = first + static_cast<size_t>(stride);
    for (int j = 0; j < stride; ++j)
        block.ints[first + static_cast<size_t>(j)] = 900;
    MathProfile lab("lab");
    auto deltaEFor = [&](int level) {
        MathProfile::ColorPatch a = {}, b = {};
        for (int j = 0; j < 36; ++j) {
            a.spectrum[j] = 0.9;
            b.spectrum[j] = level / 1000.0;
        }
        lab.spec2XYZ(&a);
        lab.spec2XYZ(&b);
        const auto la = lab.XYZ2LAB({a.XYZ[0] / 100, a.XYZ[1] / 100, a.XYZ[2] / 100});
        const auto lb = lab.XYZ2LAB({b.XYZ[0] / 100, b.XYZ[1] / 100, b.XYZ[2] / 100});
        return std::fabs(la.L - lb.L);
    };
    // Grey second whites just below and above a distance of 11.
    int below = 900, above = 900;
    while (deltaEFor(below - 1) <= 11.0)
        --below;
    above = below - 1;
    ASSERT_LE(deltaEFor(below), 11.0);
    ASSERT_GT(deltaEFor(above), 11.0);
    auto firstValue = [&](int level) {
        for (int j = 0; j < stride; ++j)
            block.ints[second + static_cast<size_t>(j)] = level;
        return std::stod(fields(lines(chartOf(block, VM_PROCESS_CHART_BLEND))[7])[5]);
    };
    const double r = block.ints[0] / 1000.0;
    EXPECT_NEAR(firstValue(below), r / 0.9 * (below / 1000.0) * 0.33 + 0.67 * r, 1e-5);
    const double w = 0.33 / ((deltaEFor(above) - 10) / 25);
    EXPECT_GT(w, 7.0);
    EXPECT_NEAR(firstValue(above), r / 0.9 * (above / 1000.0) * w + (1 - w) * r, 1e-4);
}
