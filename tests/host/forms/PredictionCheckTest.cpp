// The form found in a real press measurement and both print models checked
// on it: their charts as written (Y limited, cut to two decimals) against the
// chart combinations that were measured, and the Yule-Nielsen model against
// every combination beyond the test form.
#include "TestSupport.h"
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

    const ModelCheck offset = checkModel(form.file, *fitOffsetModel(form.measuredForm()));
    const ModelCheck yuleNielsen = checkModel(form.file, *fitYuleNielsenModel(form.measuredForm()));
    // The data set measures 1542 combinations beyond the form, 720 of them on the chart. The offset model
    // predicts the 878 whose coverages are all on the form's levels (158 of them off the chart) and leaves
    // out 664; the Yule-Nielsen model predicts every one.
    EXPECT_EQ(yuleNielsen.patches.size(), 1542u);
    EXPECT_EQ(yuleNielsen.chart.deltaE2000.count, 720u);
    EXPECT_EQ(yuleNielsen.leftOut.total() - yuleNielsen.leftOut.formPatches, 0u);
    EXPECT_EQ(offset.patches.size(), 878u);
    EXPECT_EQ(offset.chart.deltaE2000.count, 720u);
    EXPECT_EQ(offset.leftOut.offLevels, 664u);
    EXPECT_EQ(offset.leftOut.formPatches, yuleNielsen.leftOut.formPatches);
    EXPECT_GT(offset.all.byBlack[3].count, 0u); // K 90 and 100 are on the form's levels
    EXPECT_LE(offset.chart.deltaE2000.mean, 1.25);
    EXPECT_LE(offset.chart.deltaE2000.max, 3.8);
    EXPECT_LE(yuleNielsen.chart.deltaE2000.mean, 0.95);
    EXPECT_LE(yuleNielsen.chart.deltaE2000.max, 3.4);
    EXPECT_LE(yuleNielsen.all.deltaE2000.mean, 0.85);
}
