// Chart file conventions: number format whatever the host's locale, the XYZ
// layout bytes, the Y limit and the two-decimal cut.
#include "ChartFile.h"
#include "models/PrintModels.h"
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <random>
#include <locale>

using namespace testsupport;

namespace {
// Decimal comma and digit grouping, as a host might install globally.
struct CommaPunct : std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\3"; }
};
} // namespace

TEST(ChartFile, LayoutAndNumbersWhateverTheHostLocale)
{
    TempDir dir;
    const std::locale previous = std::locale::global(std::locale(std::locale::classic(), new CommaPunct));
    for (const bool plain : {true, false}) {
        SCOPED_TRACE(plain ? "plain writer" : "fast writer");
        chartfile::ChartStream stream(dir.path("c.txt").c_str(), plain);
        chartfile::writeXYZHeader(stream, 2);
        const double cmyk[4] = {100, 0.5, 0.0000123, -0.0};
        const double xyz[3] = {12.3456, 0.004, 1e6};
        chartfile::writeXYZLine(stream, 1234567, cmyk, xyz);
        stream << 100000.0 << ' ' << 1.0 / 3.0 << '\n';
        stream.finish();
        const std::string header = "IT8\r\nNUMBER_OF_SETS\t2\nNUMBER_OF_FIELDS\t8\nBEGIN_DATA_FORMAT\n"
                                   "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tXYZ_X\tXYZ_Y\tXYZ_Z\t\nEND_DATA_FORMAT\n";
        EXPECT_EQ(readFile(dir.path("c.txt")),
                  header + "BEGIN_DATA\n1234567\t100\t0.5\t1.23e-05\t-0\t12.34\t0\t1e+06\n100000 0.333333\nEND_DATA\n");
    }
    // The same line from values, Y limited (X and Z scaled by 100 / 1e6).
    const std::string fromValues = veltmarquist::xyzChartText({{100, 0.5, 0.0000123, -0.0}}, {{12.3456, 1e6, 0.004}});
    std::locale::global(previous);
    EXPECT_EQ(fromValues.substr(fromValues.find("BEGIN_DATA\n")), "BEGIN_DATA\n1\t100\t0.5\t1.23e-05\t-0\t0\t100\t0\nEND_DATA\n");

    try {
        chartfile::ChartStream unopenable(dir.path("no/folder/c.txt").c_str(), false);
        FAIL() << "expected Exceptions";
    } catch (const Exceptions& failure) {
        EXPECT_EQ(failure.code, 1);
    }
}

TEST(ChartFile, FastNumbersAreThePlainWritersTextForEveryDouble)
{
    // Random bit patterns cover every exponent, subnormals, NaN payloads and
    // both signs; the rest are where %g changes between fixed and exponent
    // form or rounds up to a new digit.
    std::vector<double> values = {0.0, -0.0, 1e-5, 9.999995e-5, 0.0001, 999999.5, 1e6, 123456.5, 0.5, 1e300,
                                  -1e-300, std::nan(""), -std::nan(""), HUGE_VAL, -HUGE_VAL, 4.9e-324};
    std::mt19937_64 random(11);
    for (int i = 0; i < 20000; ++i) {
        const std::uint64_t bits = random();
        double value;
        std::memcpy(&value, &bits, sizeof value);
        values.push_back(value);
        values.push_back(std::ldexp(static_cast<double>(bits >> 11), -40)); // ordinary magnitudes
    }
    TempDir dir;
    for (const bool plain : {true, false}) {
        chartfile::ChartStream stream(dir.path(plain ? "plain.txt" : "fast.txt").c_str(), plain);
        for (size_t i = 0; i < values.size(); ++i)
            stream << static_cast<int>(i * 2654435761u) << '\t' << values[i] << chartfile::endl;
        stream.finish();
    }
    EXPECT_EQ(readFile(dir.path("fast.txt")), readFile(dir.path("plain.txt")));
}

TEST(ChartFile, CutTowardMinusInfinityAndYLimit)
{
    EXPECT_EQ(chartfile::cut(5.0), 5.0);
    EXPECT_EQ(chartfile::cut(-0.001), -0.01);
    double bright[3] = {99.1, 104.3, 80.2};
    chartfile::limitY(bright);
    EXPECT_EQ(chartfile::cut(bright[0]), 95.01);
    EXPECT_EQ(bright[1], 100.0);
    EXPECT_EQ(chartfile::cut(bright[2]), 76.89);
    double scaled[3] = {100, 125, 50}, exact[3] = {90, 100, 80}, notANumber[3] = {1, std::nan(""), 2};
    chartfile::limitY(scaled);
    chartfile::limitY(exact);
    chartfile::limitY(notANumber);
    EXPECT_EQ(scaled[0], 80.0);
    EXPECT_EQ(scaled[2], 40.0);
    EXPECT_EQ(exact[0], 90.0) << "Y of 100 is not above the limit";
    EXPECT_EQ(notANumber[0], 1.0);
}
