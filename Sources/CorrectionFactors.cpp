// Correction factors: direct searches that fit the free parameters of the two
// four-colour models to measured control patches by CIELAB colour difference
// (CIE 1976 dE*ab).
//
// Offset: grayDiffFactor (C, M, Y, K) and coverageLimit are fitted so that the
// model reproduces the three-colour grey C40 M40 Y40 (form row 44) and the
// four-colour grey C40 M40 Y40 K40 (row 45):
//     score = sqrt(dE(grey3)^2 + dE(grey4)^2).
// Gravure: the ink order and rgbFactor are fitted to the red, green and blue
// two-ink solids (rows 6, 8, 28).
//
// Every search compares strictly (a candidate wins only when the best so far
// is greater), so ties go to the candidate met first; best scores start at 10000.
#include "GrayFitGrid.h"
#include "LiteralBuild.h"
#include "MathProfile.h"
#include "ProfileSteps.h"
#include "models/InkAreaMemo.h"

#include <cmath>
#include <cstring>

using namespace grayfit;
using namespace profilesteps;

namespace {

const double kNoScore = 10000.0;

// A search point of the grey fit: the four factors in hundredths, then the
// coverage limit in percent.
struct GrayPoint {
    int p[5];
};

void setGrayFitFields(MathProfile& profile, const int point[5])
{
    for (int x = 0; x < 4; ++x)
        profile.grayDiffFactor[x] = point[x] / 100.0;
    profile.coverageLimit = point[kPL];
}

} // namespace

void MathProfile::calculateGrayDiffFactor(double** rows)
{
    fitGrayDiffFactor(*this, rows, kLiteralBuild);
}

void MathProfile::calculateGrayDiffFactorStraightforward(double** rows)
{
    fitGrayDiffFactor(*this, rows, true);
}

double profilesteps::scoreGrayPoint(MathProfile& profile, const lab& grey3, const lab& grey4, const int point[5],
                                    veltmarquist::models::InkAreaMemo* memo)
{
    setGrayFitFields(profile, point);
    const ColorPatch& sample = profile.patchSlots[MathProfile::kSlotCurrentSample];
    profile.setSample(40.0, 40.0, 40.0, 0.0, 0.0, 0.0, 0.0);
    calcOffsetSample(profile, memo);
    const double dE3 = deltaE(grey3, labOf(profile, sample));
    profile.setSample(40.0, 40.0, 40.0, 40.0, 0.0, 0.0, 0.0);
    calcOffsetSample(profile, memo);
    const double dE4 = deltaE(grey4, labOf(profile, sample));
    return std::sqrt(dE3 * dE3 + dE4 * dE4);
}

void profilesteps::scanGrayGridStraightforward(MathProfile& profile, const lab& grey3, const lab& grey4,
                                               int bestPoint[5], double& bestScore)
{
    // Limit outermost and black innermost, every point scored in full.
    GrayPoint point;
    for (point.p[kPL] = kLimitAxis.first; point.p[kPL] <= kLimitAxis.last; point.p[kPL] += kLimitAxis.step)
        for (point.p[kPC] = kCyanAxis.first; point.p[kPC] <= kCyanAxis.last; point.p[kPC] += kCyanAxis.step)
            for (point.p[kPM] = kMagentaAxis.first; point.p[kPM] <= kMagentaAxis.last;
                 point.p[kPM] += kMagentaAxis.step)
                for (point.p[kPY] = kYellowAxis.first; point.p[kPY] <= kYellowAxis.last;
                     point.p[kPY] += kYellowAxis.step)
                    for (point.p[kPK] = kBlackAxis.first; point.p[kPK] <= kBlackAxis.last;
                         point.p[kPK] += kBlackAxis.step) {
                        const double s = scoreGrayPoint(profile, grey3, grey4, point.p);
                        if (bestScore > s) {
                            bestScore = s;
                            std::memcpy(bestPoint, point.p, sizeof point.p);
                        }
                    }
}

void profilesteps::fitGrayDiffFactor(MathProfile& profile, double** rows, bool straightforward)
{
    readForm(profile, rows);

    auto measuredLab = [&profile](const double* row) {
        ColorPatch patch = {};
        std::memcpy(patch.spectrum, row, sizeof patch.spectrum);
        profile.spec2XYZ(&patch);
        return labOf(profile, patch);
    };
    // Rows 44 and 45 are read after readData, which may have exchanged rows.
    const lab grey3 = measuredLab(rows[44]);
    const lab grey4 = measuredLab(rows[45]);
    // A move changes one ink's exponent (the limit: all four), so the fine
    // search meets most d^e rows again.
    veltmarquist::models::InkAreaMemo memo;
    auto score = [&](const GrayPoint& point) {
        return scoreGrayPoint(profile, grey3, grey4, point.p, straightforward ? nullptr : &memo);
    };

    // Coarse grid. The fast evaluation finds the same best point and score as
    // the point-by-point loop (GrayFitFastPath.cpp tells why); the loop stays
    // as the reference and for a profile that the fast evaluation declines.
    double best = kNoScore;
    GrayPoint current = {{0, 0, 0, 0, 0}};
    const bool scannedFast = !straightforward && scanGrayGridFast(profile, grey3, grey4, current.p, best);
    if (!scannedFast)
        scanGrayGridStraightforward(profile, grey3, grey4, current.p, best);
    // Scores start at 10000 and only a smaller one is taken, so the best
    // score is below 10000 exactly when some point scored.
    if (!(best < kNoScore)) {
        if (scannedFast) {
            // Leave the prediction of the last grid point in the current
            // sample and the primaries' weights, as the point-by-point loop does.
            score(GrayPoint{{kCyanAxis.last, kMagentaAxis.last, kYellowAxis.last, kBlackAxis.last, kLimitAxis.last}});
        }
        // Non-finite measurements: no point scores at all. Keep the
        // uncorrected model rather than a zero coverage limit.
        for (double& factor : profile.grayDiffFactor)
            factor = 0.0;
        profile.coverageLimit = 200.0;
        return;
    }
    setGrayFitFields(profile, current.p);

    // Fine search: greedy coordinate moves with a shrinking step, every move
    // scored in full. A move is tried only when the value before it is inside
    // its bound, so a factor can end up to 0.09 beyond +-10 and the limit
    // between 91 and 407.
    struct Move {
        int coordinate, sign, bound;
    };
    const Move moves[10] = {{kPC, +1, 1000}, {kPM, +1, 1000}, {kPY, +1, 1000}, {kPK, +1, 1000}, {kPL, +1, 398},
                            {kPC, -1, -1000}, {kPM, -1, -1000}, {kPY, -1, -1000}, {kPK, -1, -1000}, {kPL, -1, 100}};
    for (int step = 9; step >= 1; --step) {
        double passStart;
        do {
            passStart = best;
            for (const Move& move : moves) {
                const int value = current.p[move.coordinate];
                if (move.sign > 0 ? value > move.bound : value < move.bound)
                    continue;
                GrayPoint moved = current;
                moved.p[move.coordinate] = value + move.sign * step;
                const double s = score(moved);
                if (best > s) {
                    best = s;
                    current = moved;
                }
            }
        } while (best < passStart);
        setGrayFitFields(profile, current.p);
    }
}

void MathProfile::calculateRGBFactors(double** rows)
{
    readForm(*this, rows);

    // Red, green and blue two-ink solids and their measured colours.
    const double requests[3][4] = {{0, 100, 100, 0}, {100, 0, 100, 0}, {100, 100, 0, 0}};
    const int measuredRow[3] = {6, 8, 28};
    lab reference[3];
    for (int p = 0; p < 3; ++p) {
        ColorPatch patch = {};
        std::memcpy(patch.spectrum, rows[measuredRow[p]], sizeof patch.spectrum);
        spec2XYZ(&patch);
        reference[p] = labOf(*this, patch);
    }

    const ColorPatch& sample = patchSlots[kSlotCurrentSample];
    // Colour differences of red, green and blue predicted with an ink order.
    auto differences = [&](int order, double dE[3]) {
        for (int p = 0; p < 3; ++p) {
            setSample(requests[p][0], requests[p][1], requests[p][2], requests[p][3], 0.0, 0.0, 0.0);
            calcGravureSampleByOrder(*this, order);
            dE[p] = deltaE(reference[p], labOf(*this, sample));
        }
    };

    double best = kNoScore;
    int bestOrder = 0;
    for (int order = 0; order <= 4; ++order) {
        double dE[3];
        differences(order, dE);
        const double s = dE[0] + dE[1] + dE[2];
        if (best > s) {
            best = s;
            bestOrder = order;
        }
    }
    inkOrder = bestOrder;

    for (int j = 0; j < 3; ++j) {
        best = kNoScore;
        double bestValue = 0.0;
        for (int v = 100; v >= 2; --v) {
            rgbFactor[j] = v / 100.0;
            double dE[3];
            differences(inkOrder, dE);
            // The first factor search scores the plain sum, like the order
            // search. The second and third score
            //     sqrt(sqrt(dEr^2 + dEg^2) + dEb^2)
            // a deliberate compatibility choice: it is 0 when all three match
            // and grows with each difference, and it keeps the fitted factors,
            // and so the charts, identical to those hosts already hold.
            const double s = j == 0 ? dE[0] + dE[1] + dE[2]
                                    : std::sqrt(std::sqrt(dE[0] * dE[0] + dE[1] * dE[1]) + dE[2] * dE[2]);
            if (best > s) {
                best = s;
                bestValue = v / 100.0;
            }
        }
        rgbFactor[j] = bestValue;
    }
}
