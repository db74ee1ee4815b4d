// The form found in a real press measurement and both print models checked
// on it: their charts as written (Y limited, cut to two decimals) against the
// chart combinations that were measured, and the Yule-Nielsen model against
// every combination beyond the test form.
#include "../TestSupport.h"
#include "PredictionCheck.h"
#include "TestForm.h"

#include <gtest/gtest.h>

using namespace veltmarquist;

TEST(PredictionCheck, BothModelsOnTheRealDataSet)
{
    const std::string path = VELTMARQUIST_SHARED_DATA_DIR "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt";
    if (!testsupport::fileExists(path))
        GTEST_SKIP() << "no evaluation data set at " << path << " (the real press data set is not beside the project)";
    const FoundForm form = findTestForm(path, ReadOptions{});
    // The file's quirks read, the 46 patches found among repeats.
    EXPECT_EQ(form.file.sets.size(), 1617u);
    EXPECT_EQ(form.file.layout.describe(), "36 bands 380-730 nm in 10 nm steps");
    EXPECT_EQ(form.file.scale, 1.0);
    EXPECT_EQ(form.picked.setsUsed, 68u);
    EXPECT_EQ(form.picked.averaged, 22u);

    std::vector<Cmyk> coverages = characterisationChart();
    const std::vector<CheckedPatch> offset = checkPredictions(form.file, coverages, *fitOffsetModel(form.measuredForm()));
    const auto model = fitYuleNielsenModel(form.measuredForm());
    const std::vector<CheckedPatch> chart = checkPredictions(form.file, coverages, *model);
    const std::vector<Cmyk> measured = measuredCombinations(form.file);
    coverages.insert(coverages.end(), measured.begin(), measured.end());
    const std::vector<CheckedPatch> all = checkPredictions(form.file, coverages, *model);
    // The data set measures 720 chart combinations beyond the form, and 1542 combinations in all.
    EXPECT_EQ(offset.size(), 720u);
    EXPECT_EQ(chart.size(), 720u);
    EXPECT_EQ(all.size(), 1542u);
    EXPECT_EQ(std::count_if(all.begin(), all.end(), [](const CheckedPatch& patch) { return patch.onChart; }), 720);
    const CheckSummary offsetOnChart = summariseChecks(offset), onChart = summariseChecks(chart),
                       beyond = summariseChecks(all);
    EXPECT_LE(offsetOnChart.deltaE2000.mean, 1.25);
    EXPECT_LE(offsetOnChart.deltaE2000.max, 3.8);
    EXPECT_LE(onChart.deltaE2000.mean, 0.95);
    EXPECT_LE(onChart.deltaE2000.max, 3.4);
    EXPECT_LE(beyond.deltaE2000.mean, 0.85);
}
