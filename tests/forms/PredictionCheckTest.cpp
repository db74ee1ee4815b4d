// The Yule-Nielsen model checked on a real press measurement: its chart as
// written (Y limited, cut to two decimals) against the chart combinations
// that were measured, and against every combination beyond the test form.
#include "../TestSupport.h"
#include "PredictionCheck.h"
#include "TestForm.h"

#include <gtest/gtest.h>

using namespace veltmarquist;

TEST(PredictionCheck, YuleNielsenModelOnTheRealDataSet)
{
    const std::string path = VELTMARQUIST_SHARED_DATA_DIR "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt";
    if (!testsupport::fileExists(path))
        GTEST_SKIP() << "no evaluation data set at " << path << " (the real press data set is not beside the project)";
    const FoundForm form = findTestForm(path, ReadOptions{});
    const auto model = fitYuleNielsenModel(form.measuredForm());
    std::vector<Cmyk> coverages = characterisationChart();
    const std::vector<CheckedPatch> chart = checkPredictions(form.file, coverages, *model);
    const std::vector<Cmyk> measured = measuredCombinations(form.file);
    coverages.insert(coverages.end(), measured.begin(), measured.end());
    const std::vector<CheckedPatch> all = checkPredictions(form.file, coverages, *model);
    // The data set measures 720 chart combinations beyond the form, and 1542 combinations in all.
    EXPECT_EQ(chart.size(), 720u);
    EXPECT_EQ(all.size(), 1542u);
    EXPECT_EQ(std::count_if(all.begin(), all.end(), [](const CheckedPatch& patch) { return patch.onChart; }), 720);
    const CheckSummary onChart = summariseChecks(chart), beyond = summariseChecks(all);
    EXPECT_LE(onChart.deltaE2000.mean, 0.95);
    EXPECT_LE(onChart.deltaE2000.max, 3.4);
    EXPECT_LE(beyond.deltaE2000.mean, 0.85);
}
