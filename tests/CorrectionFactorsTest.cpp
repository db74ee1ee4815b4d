// Correction factors: the grey fit of the offset model and the ink-order and
// trapping fit of the gravure model, with the 46-step comparison charts. (The
// fitted values of the golden form are pinned by tests/models/PrintModelsTest.cpp.)
#include "TestSupport.h"

#include <gtest/gtest.h>

using namespace testsupport;

namespace {

// The 46 gravure-modelled spectra of a form with a known ink order and
// factors: a form that the gravure fit must recover.
std::vector<std::vector<double>> gravureForm(int order, const double factors[3])
{
    RowTable measured(syntheticForm(1));
    MathProfile model("truth");
    model.readData(measured.rows());
    for (int ink = 0; ink < 4; ++ink)
        model.sortData(model.tintLists[ink]);
    std::copy(factors, factors + 3, model.rgbFactor);
    void (MathProfile::*methods[5])() = {&MathProfile::calcGravureSampleCMYK, &MathProfile::calcGravureSampleKCMY,
                                         &MathProfile::calcGravureSampleYCMK, &MathProfile::calcGravureSampleYMKC,
                                         &MathProfile::calcGravureSampleYKMC};
    std::vector<std::vector<double>> form;
    for (const auto& p : MathProfile::dithering) {
        model.setSample(p[0], p[1], p[2], p[3], 0, 0, 0);
        (model.*methods[order])();
        form.emplace_back(model.patchSlots[21].spectrum, model.patchSlots[21].spectrum + 36);
    }
    return form;
}

} // namespace

TEST(GrayFit, EveryScoreSetsAllFiveFieldsWhateverTheStartValues)
{
    RowTable rows(syntheticForm(2));
    MathProfile fresh("fresh"), preset("preset");
    preset.grayDiffFactor[0] = 3.0;
    preset.coverageLimit = 150.0;
    fresh.calculateGrayDiffFactor(rows.rows());
    preset.calculateGrayDiffFactor(rows.rows());
    for (int x = 0; x < 4; ++x)
        EXPECT_EQ(preset.grayDiffFactor[x], fresh.grayDiffFactor[x]) << "ink " << x;
    EXPECT_EQ(preset.coverageLimit, fresh.coverageLimit);
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

TEST(Chart46, GoldenChartsMeasuredOffsetAndGravure)
{
    const struct {
        const char* golden;
        int process;
        bool measured;
    } charts[] = {{"offset-form.c46-measured.chart", VM_PROCESS_OFFSET, true},
                  {"offset-form.c46-measured.chart", VM_PROCESS_GRAVURE, true}, // the process plays no part
                  {"offset-form.c46-offset.chart", VM_PROCESS_OFFSET, false},
                  {"offset-form.c46-gravure.chart", VM_PROCESS_GRAVURE, false}};
    TempDir dir;
    for (const auto& chart : charts) {
        SCOPED_TRACE(std::string(chart.golden) + ", process " + std::to_string(chart.process));
        RowTable rows = RowTable::fromBlock(readGoldenInput("offset-form.in"));
        MathProfile profile("46");
        profile.calculateChart46(rows.rows(), static_cast<PrintProcess>(chart.process), dir.path("c.txt").c_str(),
                                 chart.measured);
        EXPECT_EQ(readFile(dir.path("c.txt")), readFile(goldenPath(chart.golden)));
    }
}
