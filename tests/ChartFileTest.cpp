// Chart file conventions: number format, locale independence, the Y limit,
// the two-decimal cut and the XYZ layout bytes.
#include "ChartFile.h"
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <locale>

using namespace testsupport;

namespace {

// A decimal-comma, digit-grouping numeric punctuation, as a host in a
// German-speaking locale would install globally.
struct CommaPunct : std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\3"; }
};

std::string written(void (*write)(std::ofstream&))
{
    TempDir dir;
    std::ofstream stream;
    chartfile::open(stream, dir.path("c.txt").c_str());
    write(stream);
    stream.close();
    return readFile(dir.path("c.txt"));
}

} // namespace

TEST(ChartFile, DoublesUseSixSignificantDigitsWhateverTheHostLocale)
{
    const std::locale previous = std::locale::global(std::locale(std::locale::classic(), new CommaPunct));
    const std::string text = written([](std::ofstream& s) {
        const int number = 1234567;
        s << 100.0 << ' ' << 0.5 << ' ' << 0.0000123 << ' ' << 100000.0 << ' ' << 1e6 << ' ' << -0.0 << ' '
          << 0.00001 << ' ' << 1.0 / 3.0 << ' ' << 95.01 << ' ' << number;
    });
    std::locale::global(previous);
    EXPECT_EQ(text, "100 0.5 1.23e-05 100000 1e+06 -0 1e-05 0.333333 95.01 1234567");
}

TEST(ChartFile, XYZLayoutBytes)
{
    const std::string text = written([](std::ofstream& s) {
        chartfile::writeXYZHeader(s, 2);
        const double cmyk[4] = {100, 40, 0, 0};
        const double xyz[3] = {12.3456, 0.004, 5};
        chartfile::writeXYZLine(s, 1, cmyk, xyz);
        chartfile::finish(s);
    });
    EXPECT_EQ(text, "IT8\r\nNUMBER_OF_SETS\t2\nNUMBER_OF_FIELDS\t8\nBEGIN_DATA_FORMAT\n"
                    "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tXYZ_X\tXYZ_Y\tXYZ_Z\t\nEND_DATA_FORMAT\n"
                    "BEGIN_DATA\n1\t100\t40\t0\t0\t12.34\t0\t5\nEND_DATA\n");
}

TEST(ChartFile, CutTowardMinusInfinityAndYLimit)
{
    EXPECT_EQ(chartfile::cut(12.3456), 12.34);
    EXPECT_EQ(chartfile::cut(0.004), 0.0);
    EXPECT_EQ(chartfile::cut(5.0), 5.0);
    EXPECT_EQ(chartfile::cut(-0.001), -0.01);

    double bright[3] = {99.1, 104.3, 80.2};
    chartfile::limitY(bright);
    EXPECT_EQ(chartfile::cut(bright[0]), 95.01);
    EXPECT_EQ(bright[1], 100.0);
    EXPECT_EQ(chartfile::cut(bright[2]), 76.89);

    double scaled[3] = {100, 125, 50};
    chartfile::limitY(scaled);
    EXPECT_EQ(scaled[0], 80.0);
    EXPECT_EQ(scaled[2], 40.0);

    double exact[3] = {90, 100, 80};
    chartfile::limitY(exact);
    EXPECT_EQ(exact[0], 90.0) << "100 is not above the limit";

    double notANumber[3] = {1, std::nan(""), 2};
    chartfile::limitY(notANumber);
    EXPECT_TRUE(std::isnan(notANumber[1]));
    EXPECT_EQ(notANumber[0], 1.0);
}

TEST(ChartFile, UnopenablePathThrowsCodeOne)
{
    TempDir dir;
    std::ofstream stream;
    try {
        chartfile::open(stream, dir.path("no/such/folder/c.txt").c_str());
        FAIL() << "expected Exceptions";
    } catch (const Exceptions& failure) {
        EXPECT_EQ(failure.code, 1);
    }
    EXPECT_FALSE(fileExists(dir.path("no")));
}
