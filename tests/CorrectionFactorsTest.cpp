// Correction factors: the grey fit of the offset model and the ink-order and
// trapping fit of the gravure model, with the 46-step comparison charts.
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace testsupport;

namespace {

bool wholeHundredths(double value)
{
    return std::fabs(value * 100.0 - std::round(value * 100.0)) < 1e-9;
}

// The 46 gravure-modelled spectra of a form with a known ink order and
// factors: a form that the gravure fit must recover.
std::vector<std::vector<double>> gravureForm(int order, const double factors[3])
{
    RowTable measured(syntheticForm(1));
    MathProfile model("truth");
    model.readData(measured.rows());
    for (int ink = 0; ink < 4; ++ink)
        model.sortData(model.tintLists[ink]);
    model.inkOrder = order;
    for (int j = 0; j < 3; ++j)
        model.rgbFactor[j] = factors[j];
    void (MathProfile::*methods[5])() = {&MathProfile::calcGravureSampleCMYK, &MathProfile::calcGravureSampleKCMY,
                                         &MathProfile::calcGravureSampleYCMK, &MathProfile::calcGravureSampleYMKC,
                                         &MathProfile::calcGravureSampleYKMC};
    std::vector<std::vector<double>> form;
    for (int i = 0; i < 46; ++i) {
        const auto& p = MathProfile::dithering[i];
        model.setSample(p[0], p[1], p[2], p[3], 0, 0, 0);
        (model.*methods[order])();
        form.emplace_back(model.patchSlots[21].spectrum, model.patchSlots[21].spectrum + 36);
    }
    return form;
}

} // namespace

TEST(GrayFit, WholeHundredthsWithinBoundsRepeatableAndCloser)
{
    RowTable rows(syntheticForm(2));
    MathProfile profile("grey");
    // The greys' colour difference, model against measurement.
    auto greyError = [&] {
        double sum = 0.0;
        for (int row : {44, 45}) {
            const auto& p = MathProfile::dithering[row];
            profile.setSample(p[0], p[1], p[2], p[3], 0, 0, 0);
            profile.calcOffsetSample();
            MathProfile::ColorPatch measured = {};
            std::copy(rows.row(row).begin(), rows.row(row).end(), measured.spectrum);
            profile.spec2XYZ(&measured);
            const auto& s = profile.patchSlots[21];
            const auto a = profile.XYZ2LAB({s.XYZ[0] / 100, s.XYZ[1] / 100, s.XYZ[2] / 100});
            const auto b = profile.XYZ2LAB({measured.XYZ[0] / 100, measured.XYZ[1] / 100, measured.XYZ[2] / 100});
            sum += (a.L - b.L) * (a.L - b.L) + (a.a - b.a) * (a.a - b.a) + (a.b - b.b) * (a.b - b.b);
        }
        return std::sqrt(sum);
    };
    profile.readData(rows.rows());
    for (int ink = 0; ink < 4; ++ink)
        profile.sortData(profile.tintLists[ink]);
    const double uncorrected = greyError();
    profile.calculateGrayDiffFactor(rows.rows());
    EXPECT_LT(greyError(), uncorrected);
    const double first[5] = {profile.grayDiffFactor[0], profile.grayDiffFactor[1], profile.grayDiffFactor[2],
                             profile.grayDiffFactor[3], profile.coverageLimit};
    for (int x = 0; x < 4; ++x) {
        EXPECT_TRUE(wholeHundredths(first[x])) << first[x];
        EXPECT_LE(std::fabs(first[x]), 10.09);
    }
    EXPECT_EQ(first[4], std::round(first[4]));
    EXPECT_TRUE(first[4] >= 91.0 && first[4] <= 407.0) << first[4];
    // Start values do not matter: every score sets all five fields.
    profile.grayDiffFactor[0] = 3.0;
    profile.coverageLimit = 150.0;
    profile.calculateGrayDiffFactor(rows.rows());
    const double second[5] = {profile.grayDiffFactor[0], profile.grayDiffFactor[1], profile.grayDiffFactor[2],
                              profile.grayDiffFactor[3], profile.coverageLimit};
    EXPECT_TRUE(std::equal(first, first + 5, second));
}

TEST(RGBFactors, RecoversTheOrderAndFactorsOfAGravureForm)
{
    // Y M K C: red and green follow the first factor, blue the second; the
    // third is unconstrained.
    const double factors[3] = {0.83, 0.91, 0.6};
    RowTable rows(gravureForm(3, factors));
    MathProfile profile("recover");
    profile.calculateRGBFactors(rows.rows());
    EXPECT_EQ(profile.inkOrder, 3);
    EXPECT_EQ(profile.rgbFactor[0], 0.83);
    EXPECT_EQ(profile.rgbFactor[1], 0.91);
    EXPECT_EQ(profile.rgbFactor[2], 1.0) << "no candidate changes the score: the first, 1.00, stays";
}

TEST(RGBFactors, FactorsAreWholeHundredthsAndBlackLastLeavesTheThirdAtOne)
{
    for (int variant : {0, 2}) {
        RowTable rows(syntheticForm(variant));
        MathProfile profile("fit");
        profile.calculateRGBFactors(rows.rows());
        EXPECT_GE(profile.inkOrder, 0);
        EXPECT_LE(profile.inkOrder, 4);
        for (double factor : profile.rgbFactor) {
            EXPECT_TRUE(wholeHundredths(factor)) << factor;
            EXPECT_GE(factor, 0.02);
            EXPECT_LE(factor, 1.0);
        }
        if (profile.inkOrder == 0 || profile.inkOrder == 2) {
            EXPECT_EQ(profile.rgbFactor[2], 1.0) << "black prints last and is in none of the three patches";
        }
    }
}

TEST(Chart46, GoldenChartsMeasuredOffsetAndGravure)
{
    const struct {
        const char* golden;
        int process;
        bool measured;
    } charts[] = {{"offset-form.c46-measured.chart", VM_PROCESS_OFFSET, true},
                  {"offset-form.c46-offset.chart", VM_PROCESS_OFFSET, false},
                  {"offset-form.c46-gravure.chart", VM_PROCESS_GRAVURE, false}};
    for (const auto& chart : charts) {
        TempDir dir;
        RowTable rows = RowTable::fromBlock(readGoldenInput("offset-form.in"));
        MathProfile profile("46");
        profile.calculateChart46(rows.rows(), static_cast<PrintProcess>(chart.process), dir.path("c.txt").c_str(),
                                 chart.measured);
        EXPECT_EQ(readFile(dir.path("c.txt")), readFile(goldenPath(chart.golden))) << chart.golden;
    }
}

TEST(Chart46, MeasuredChartIgnoresProcessAndFactorsAndModelMatchesPrimaries)
{
    TempDir dir;
    RowTable rows(syntheticForm(1));
    MathProfile profile("compare");
    profile.calculateChart46(rows.rows(), VM_PROCESS_OFFSET, dir.path("m0.txt").c_str(), true);
    profile.rgbFactor[0] = 0.3;
    profile.inkOrder = 4;
    profile.grayDiffFactor[2] = 2.0;
    profile.calculateChart46(rows.rows(), VM_PROCESS_GRAVURE, dir.path("m1.txt").c_str(), true);
    const std::string measured = readFile(dir.path("m0.txt"));
    EXPECT_EQ(measured, readFile(dir.path("m1.txt")));

    MathProfile fresh("model");
    fresh.calculateChart46(rows.rows(), VM_PROCESS_OFFSET, dir.path("o.txt").c_str(), false);
    const auto a = lines(measured), b = lines(readFile(dir.path("o.txt")));
    ASSERT_EQ(a.size(), 54u);
    EXPECT_EQ(a[1], "NUMBER_OF_SETS\t46");
    EXPECT_EQ(fields(a[52])[0], "46");
    // Paper, solids and overprint solids: every ink at 0 or 100 %.
    for (int i = 0; i < 46; ++i) {
        const auto& p = MathProfile::dithering[i];
        const bool primary = std::all_of(p, p + 4, [](unsigned char v) { return v == 0 || v == 100; });
        if (primary) {
            EXPECT_EQ(a[static_cast<size_t>(7 + i)], b[static_cast<size_t>(7 + i)]) << "patch " << i + 1;
        }
    }
    EXPECT_NE(a[7 + 44], b[7 + 44]) << "the three-colour grey shows the model's deviation";
}
