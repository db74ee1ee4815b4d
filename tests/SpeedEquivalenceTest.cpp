// The fast grey fit against the straightforward one. On every form both must
// leave the same fields, the same profile state (slots, weights, tint lists)
// and, through it, the same chart bytes.
#include "GrayFitFastPath.h"
#include "ProfileSteps.h"
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <iomanip>
#include <limits>
#include <memory>

using namespace testsupport;

namespace {

using Form = std::vector<std::vector<double>>;

// One fit on its own profile and its own copy of the rows (readData may
// exchange rows), then the 900-patch offset chart from the fitted profile.
struct FitRun {
    MathProfile profile{"fit"};
    std::string chart;

    FitRun(const Form& form, bool straightforward, void (*prepare)(MathProfile&))
    {
        if (prepare != nullptr)
            prepare(profile);
        RowTable rows(form);
        if (straightforward)
            profile.calculateGrayDiffFactorStraightforward(rows.rows());
        else
            profile.calculateGrayDiffFactor(rows.rows());
        // The state that the fit leaves, before the chart adds to it.
        std::memcpy(slotsAfterFit, profile.patchSlots, sizeof slotsAfterFit);
        for (int list = 0; list < MathProfile::kChannels; ++list)
            listsAfterFit[list] = profile.tintLists[list];
        TempDir dir;
        profile.calculateChart(rows.rows(), VM_PROCESS_OFFSET, dir.path("chart").c_str());
        chart = readFile(dir.path("chart"));
    }

    MathProfile::ColorPatch slotsAfterFit[MathProfile::kSlots];
    std::vector<MathProfile::ColorPatch> listsAfterFit[MathProfile::kChannels];
};

bool sameBytes(const void* first, const void* second, size_t size)
{
    return size == 0 || std::memcmp(first, second, size) == 0;
}

// Runs both fits and requires identical results; returns the fast run.
std::unique_ptr<FitRun> expectSameFit(const Form& form, const std::string& what,
                                      void (*prepare)(MathProfile&) = nullptr)
{
    SCOPED_TRACE(what);
    auto fast = std::make_unique<FitRun>(form, false, prepare);
    const FitRun reference(form, true, prepare);
    for (int x = 0; x < 4; ++x)
        EXPECT_EQ(fast->profile.grayDiffFactor[x], reference.profile.grayDiffFactor[x]) << "ink " << x;
    EXPECT_EQ(fast->profile.coverageLimit, reference.profile.coverageLimit);
    // Bytes, not values: NaN and signed zeros must match as well.
    const size_t patchSize = sizeof(MathProfile::ColorPatch);
    for (int slot = 0; slot < MathProfile::kSlots; ++slot)
        EXPECT_TRUE(sameBytes(&fast->slotsAfterFit[slot], &reference.slotsAfterFit[slot], patchSize))
            << "slot " << slot;
    for (int list = 0; list < MathProfile::kChannels; ++list) {
        const auto &a = fast->listsAfterFit[list], &b = reference.listsAfterFit[list];
        EXPECT_EQ(a.size(), b.size()) << "list " << list;
        EXPECT_TRUE(sameBytes(a.data(), b.data(), std::min(a.size(), b.size()) * patchSize)) << "list " << list;
    }
    EXPECT_FALSE(fast->chart.empty());
    EXPECT_EQ(fast->chart, reference.chart);
    return fast;
}

void multiChannelChartFirst(MathProfile& profile)
{
    TempDir dir;
    MeasurementBlock block = readGoldenInput("multichannel.in");
    ASSERT_EQ(calculateBlock(&profile, VM_PROCESS_SIX_COLOUR, dir.path("p3"), block), VM_STATUS_OK);
}

// Every lane of the fast grid against setSample + calcOffsetSample at the
// same point: X, Y and Z bit for bit, for every limit, cyan and yellow
// factor, every black factor, and every fifth magenta factor.
// The fitted fields alone would hide a fast path that is off by one unit in
// the last place: the float steps of the CIELAB cube root swallow it and the
// best point rarely moves.
void expectGridColoursMatch(const Form& form, const std::string& what, void (*prepare)(MathProfile&) = nullptr)
{
    SCOPED_TRACE(what);
    using namespace grayfit;
    MathProfile fast("grid"), reference("reference");
    RowTable fastRows(form), referenceRows(form);
    for (auto run : {std::make_pair(&fast, &fastRows), std::make_pair(&reference, &referenceRows)}) {
        if (prepare != nullptr)
            prepare(*run.first);
        run.first->readData(run.second->rows());
        for (int list = 0; list < 4; ++list)
            run.first->sortData(run.first->tintLists[list]);
    }
    GridEvaluator grid(fast);
    ASSERT_TRUE(grid.threeColourGreyIgnoresBlack());

    int compared = 0, mismatches = 0;
    // Predicts one grey at one point the straightforward way and compares; names the first mismatch.
    auto check = [&](const int point[5], double black, const double* sumX, const double* sumY, const double* sumZ,
                     int lane) {
        for (int x = 0; x < 4; ++x)
            reference.grayDiffFactor[x] = point[x] / 100.0;
        reference.coverageLimit = point[kPL];
        reference.setSample(40.0, 40.0, 40.0, black, 0.0, 0.0, 0.0);
        reference.calcOffsetSample();
        const double* expected = reference.patchSlots[MathProfile::kSlotCurrentSample].XYZ;
        const double got[3] = {sumX[lane] * fast.normFactor, sumY[lane] * fast.normFactor,
                               sumZ[lane] * fast.normFactor};
        ++compared;
        if (!sameBytes(got, expected, sizeof got) && mismatches++ == 0)
            ADD_FAILURE() << std::setprecision(17) << "K" << black << " grey, point " << point[0] << " " << point[1]
                          << " " << point[2] << " " << point[3] << " " << point[4] << ": X " << got[0]
                          << " instead of " << expected[0];
    };

    LaneSums<kYellowLanes> sums3;
    LaneSums<kBlackLanes> sums4;
    for (int li = 0; li < kLimitAxis.count(); ++li) {
        grid.selectLimit(li);
        for (int ci = 0; ci < kCyanAxis.count(); ++ci)
            for (int mi = 0; mi < kMagentaAxis.count(); mi += 5) {
                grid.threeColourSums(ci, mi, sums3);
                for (int yi = 0; yi < kYellowAxis.count(); ++yi) {
                    // Any black factor: the three-colour grey must not depend on it.
                    const int point[5] = {kCyanAxis.at(ci), kMagentaAxis.at(mi), kYellowAxis.at(yi),
                                          kBlackAxis.at(yi % kBlackAxis.count()), kLimitAxis.at(li)};
                    check(point, 0.0, sums3.X, sums3.Y, sums3.Z, yi);
                }
                for (int yi = 0; yi < kYellowAxis.count(); ++yi) {
                    grid.fourColourSums(ci, mi, yi, sums4);
                    for (int ki = 0; ki < kBlackAxis.count(); ++ki) {
                        const int point[5] = {kCyanAxis.at(ci), kMagentaAxis.at(mi), kYellowAxis.at(yi),
                                              kBlackAxis.at(ki), kLimitAxis.at(li)};
                        check(point, 40.0, sums4.X, sums4.Y, sums4.Z, ki);
                    }
                }
            }
    }
    EXPECT_GT(compared, 0);
    EXPECT_EQ(mismatches, 0) << "of " << compared << " predictions";
}

} // namespace

TEST(GrayFitFastPath, GridColoursAreThoseOfTheOffsetModelBitForBit)
{
    expectGridColoursMatch(spectraOf(readGoldenInput("offset-form.in")), "offset-form");
    expectGridColoursMatch(syntheticForm(0), "synthetic variant 0");
    expectGridColoursMatch(syntheticForm(2), "synthetic variant 2");
    expectGridColoursMatch(syntheticForm(1), "synthetic variant 1 after process 3", multiChannelChartFirst);
}

TEST(GrayFitFastPath, GoldenAndSyntheticFormsFitAndChartAsTheStraightforwardSearch)
{
    EXPECT_EQ(expectSameFit(spectraOf(readGoldenInput("offset-form.in")), "offset-form")->chart,
              readFile(goldenPath("offset-form.p0.chart")));
    for (int variant : {1, 3})
        expectSameFit(syntheticForm(variant), "synthetic variant " + std::to_string(variant));
}

TEST(GrayFitFastPath, SwappedHalvesAndAProfileReusedAfterAMultiChannelChart)
{
    // The two halves of the form measured in swapped order: readData
    // exchanges the rows back before either fit reads rows 44 and 45.
    Form swapped = syntheticForm(2);
    for (size_t i = 0; i + 24 < swapped.size(); ++i)
        std::swap(swapped[i], swapped[i + 24]);
    expectSameFit(swapped, "synthetic variant 2, halves swapped");
    // The multi-channel chart leaves 0 % tone-ramp patches in every tint
    // list, so the three-colour grey selects a 0 % black patch instead of
    // the paper, and each list's last patch is another solid.
    expectSameFit(syntheticForm(1), "after process 3", multiChannelChartFirst);
}

TEST(GrayFitFastPath, TiedAndUnscorableForms)
{
    // Black printed as paper: its dot area is 0 in every band, every black
    // factor of the grid predicts the same four-colour grey, and the first
    // one visited (-2.00) must win in both evaluations.
    Form blackAsPaper = syntheticForm(0);
    for (int row = 0; row < 46; ++row) {
        const auto& cmyk = MathProfile::dithering[row];
        if (cmyk[3] != 0 && cmyk[0] == 0 && cmyk[1] == 0 && cmyk[2] == 0)
            blackAsPaper[static_cast<size_t>(row)] = blackAsPaper[1];
    }
    EXPECT_EQ(expectSameFit(blackAsPaper, "black printed as paper")->profile.grayDiffFactor[3], -2.0);
    // A NaN paper band makes every score NaN: no point is taken, the fields
    // fall back to the construction values, and the current sample must
    // still hold the prediction of the last grid point, as in the
    // straightforward loop.
    Form nanPaper = syntheticForm(0);
    nanPaper[1][20] = std::numeric_limits<double>::quiet_NaN();
    const auto unscored = expectSameFit(nanPaper, "NaN paper band");
    for (int x = 0; x < 4; ++x)
        EXPECT_EQ(unscored->profile.grayDiffFactor[x], 0.0) << "ink " << x;
    EXPECT_EQ(unscored->profile.coverageLimit, 200.0);
}

TEST(GrayFitFastPath, FormsWhereTheGridsBoundCouldMislead)
{
    // The fast grid skips a block of black factors when the three-colour
    // grey alone cannot beat the best score. Greys measured far from what
    // the model can print keep every score high (the best near 20 dE), so
    // few blocks are skipped and near-ties decide; a NaN in a measured grey
    // makes every score NaN, every block is skipped, and the fit must fall
    // back exactly as the point-by-point loop does.
    Form farGreys = syntheticForm(0);
    farGreys[44] = farGreys[0]; // the cyan solid measured for C40 M40 Y40
    for (double& value : farGreys[45])
        value *= 0.35; // and C40 M40 Y40 K40 far darker
    const auto far = expectSameFit(farGreys, "greys far from the model");
    {
        MathProfile profile("score");
        RowTable rows(farGreys);
        profile.calculateGrayDiffFactor(rows.rows());
        auto measured = [&profile](const std::vector<double>& row) {
            MathProfile::ColorPatch patch = {};
            std::copy(row.begin(), row.end(), patch.spectrum);
            profile.spec2XYZ(&patch);
            return profilesteps::labOf(profile, patch);
        };
        const int point[5] = {int(std::lround(profile.grayDiffFactor[0] * 100)),
                              int(std::lround(profile.grayDiffFactor[1] * 100)),
                              int(std::lround(profile.grayDiffFactor[2] * 100)),
                              int(std::lround(profile.grayDiffFactor[3] * 100)), int(profile.coverageLimit)};
        const double best = profilesteps::scoreGrayPoint(profile, measured(farGreys[44]), measured(farGreys[45]), point);
        EXPECT_GT(best, 8.0) << "the greys are meant to fit badly";
    }

    Form nanGrey = syntheticForm(1);
    nanGrey[45][7] = std::numeric_limits<double>::quiet_NaN();
    const auto unscored = expectSameFit(nanGrey, "NaN in the four-colour grey");
    EXPECT_EQ(unscored->profile.coverageLimit, 200.0);
}
