// Fast evaluation of the coarse grid of the grey fit.
//
// The straightforward scan (scanGrayGridStraightforward) scores each of the
// 419,328 grid points with two offset predictions: setSample, calcOffsetSample and
// XYZ2LAB for the three-colour grey C40 M40 Y40 and for the four-colour grey
// C40 M40 Y40 K40. Most of that work repeats from point to point:
//
//  - both greys always select the same tints, so the dot area
//    d = getDotarea(T, S, W) of every ink in every band is fixed;
//  - an ink's exponent depends only on its own factor, the limit and the grey,
//    so a = pow(d, e) is computed once per (grey, ink, factor, limit) and read
//    from a table afterwards;
//  - the three-colour grey prints no black, so black's exponent there is
//    exactly 1 whatever its factor (checked on the tables, not assumed): its
//    colour is computed once per (limit, cyan, magenta, yellow) and serves all
//    26 black factors;
//  - in the four-colour grey with the limit and the C, M, Y factors fixed,
//    only black's dot areas change, so every product that is complete before
//    black's term enters a Demichel weight is formed once per band.
//
// Why the bits are the same: every value is produced by the operations of
// calcOffsetSample, spec2XYZ and XYZ2LAB on the same operands in the same
// order. Products stay left to right as written there (((aC nM) nY) nK reuses
// (aC nM) nY; aK nC nM nY, where black comes first, is formed in full per
// black factor), R is summed over the sixteen primaries in the same order
// starting from 0, and X, Y, Z are summed band by band from 380 nm. The power
// function gets the same arguments, so a cached value is the value it would
// return again. One lane of the loops below is one candidate; lanes never mix,
// so the compiler may run them side by side in vector registers without
// changing any lane's result. Nothing is reassociated, and the build forbids
// contraction into fused multiply-add. Candidates are compared in the order of
// the straightforward loop, so ties resolve the same way.
#include "GrayFitFastPath.h"
#include "LaneLoops.h"
#include "ProfileSteps.h"
#include "models/FourColourKernels.h"

#include <cmath>
#include <cstring>
#include <limits>


namespace grayfit {

namespace {

const int kBands = MathProfile::kBands;
const int kCyanCount = kCyanAxis.count();
const int kMagentaCount = kMagentaAxis.count();
const int kYellowCount = kYellowAxis.count();
const int kBlackCount = kBlackAxis.count();

// a = d^e and 1 - a of one ink for one factor, band by band.
struct InkRow {
    double a[kBands];
    double n[kBands];
};

// The same for one ink and several factors, lane by lane within a band.
template <int Lanes>
struct InkLanes {
    double a[kBands][Lanes];
    double n[kBands][Lanes];
};

// Per band, what the four-colour grey's weights share across black factors:
// the C, M, Y areas and every product formed before black's term enters.
struct BandTerms {
    double aC, aM, aY, nC, nM, nY;
    double aC_nM_nY, aM_nC_nY, aY_nC_nM, aM_aY_nC, aC_aY_nM, aC_aM_nY;
    double aM_aY, aC_aY, aC_aM, aC_aM_aY, nC_nM_nY;
};

BandTerms bandTerms(double aC, double aM, double aY, double nC, double nM, double nY)
{
    BandTerms t;
    t.aC = aC, t.aM = aM, t.aY = aY, t.nC = nC, t.nM = nM, t.nY = nY;
    t.aC_nM_nY = aC * nM * nY;
    t.aM_nC_nY = aM * nC * nY;
    t.aY_nC_nM = aY * nC * nM;
    t.aM_aY_nC = aM * aY * nC;
    t.aC_aY_nM = aC * aY * nM;
    t.aC_aM_nY = aC * aM * nY;
    t.aM_aY = aM * aY;
    t.aC_aY = aC * aY;
    t.aC_aM = aC * aM;
    t.aC_aM_aY = aC * aM * aY;
    t.nC_nM_nY = nC * nM * nY;
    return t;
}

// The sixteen primaries per band in the order of the Neugebauer sum: the
// solids of C, M, Y, K, the overprint slots 0 to 10, the paper.
using Primaries = double[kBands][16];

const double (*const kXYZWeights)[3] = MathProfile::Gewichtsfaktoren_XYZ_D50;

// One band of one lane: the Neugebauer sum in primary order, its absolute
// value, and its share of X, Y and Z added in band order, as spec2XYZ adds.
template <typename Sums>
inline void addBand(const double (&w)[16], const double* S, int j, int l, Sums& sums)
{
    double R = 0.0;
    for (int p = 0; p < 16; ++p)
        R += w[p] * S[p];
    const double s = std::fabs(R);
    sums.X[l] += s * kXYZWeights[j][0];
    sums.Y[l] += s * kXYZWeights[j][1];
    sums.Z[l] += s * kXYZWeights[j][2];
}

// Three-colour grey at one band for yellow lanes first..last-1. The weights
// are written as calcOffsetSample writes them.
template <typename Sums>
inline void yellowLanesAtBand(const Primaries& primaries, const InkRow& cyan, const InkRow& magenta,
                              const InkRow& black, const InkLanes<kYellowLanes>& yellow, int j, int first, int last,
                              Sums& sums)
{
    const double* S = primaries[j];
    const double aC = cyan.a[j], aM = magenta.a[j], aK = black.a[j];
    const double nC = cyan.n[j], nM = magenta.n[j], nK = black.n[j];
    for (int l = first; l < last; ++l) {
        const double aY = yellow.a[j][l], nY = yellow.n[j][l];
        const double w[16] = {aC * nM * nY * nK, aM * nC * nY * nK, aY * nC * nM * nK, aK * nC * nM * nY,
                              aM * aY * nC * nK, aC * aY * nM * nK, aC * aM * nY * nK, aC * aK * nM * nY,
                              aM * aK * nC * nY, aY * aK * nC * nM, aM * aY * aK * nC, aC * aY * aK * nM,
                              aC * aM * aK * nY, aC * aM * aY * nK, aC * aM * aY * aK, nC * nM * nY * nK};
        addBand(w, S, j, l, sums);
    }
}

// Three-colour grey, one yellow factor per lane.
VELTMARQUIST_LANE_LOOP
void yellowLaneSums(const Primaries& primaries, const InkRow& cyan, const InkRow& magenta, const InkRow& black,
                    const InkLanes<kYellowLanes>& yellow, LaneSums<kYellowLanes>& out)
{
    LaneSums<kYellowLanes> sums = {};
    for (int j = 0; j < kBands; ++j)
        yellowLanesAtBand(primaries, cyan, magenta, black, yellow, j, 0, kYellowLanes, sums);
    out = sums;
}

// The same for one lane alone, bit for bit (lanes never mix).
void yellowLaneSum(const Primaries& primaries, const InkRow& cyan, const InkRow& magenta, const InkRow& black,
                   const InkLanes<kYellowLanes>& yellow, int lane, LaneSums<kYellowLanes>& out)
{
    out.X[lane] = out.Y[lane] = out.Z[lane] = 0.0;
    for (int j = 0; j < kBands; ++j)
        yellowLanesAtBand(primaries, cyan, magenta, black, yellow, j, lane, lane + 1, out);
}

// The same when black prints nothing (aK = 0, nK = 1 in every band) and no
// product of C, M, Y areas overflows: each weight with aK is a zero whose
// term adds nothing to R (x + 0 = x, and the sum starts at +0), and each with
// nK is x * 1 = x, so the eight primaries without black give the same R bit
// for bit with half the work.
VELTMARQUIST_LANE_LOOP
void yellowLaneSumsWithoutBlack(const Primaries& primaries, const InkRow& cyan, const InkRow& magenta,
                                const InkLanes<kYellowLanes>& yellow, LaneSums<kYellowLanes>& out)
{
    LaneSums<kYellowLanes> sums = {};
    for (int j = 0; j < kBands; ++j) {
        const double* S = primaries[j];
        const double aC = cyan.a[j], aM = magenta.a[j];
        const double nC = cyan.n[j], nM = magenta.n[j];
        for (int l = 0; l < kYellowLanes; ++l) {
            const double aY = yellow.a[j][l], nY = yellow.n[j][l];
            double R = 0.0;
            R += aC * nM * nY * S[0];  // cyan
            R += aM * nC * nY * S[1];  // magenta
            R += aY * nC * nM * S[2];  // yellow
            R += aM * aY * nC * S[4];  // magenta + yellow
            R += aC * aY * nM * S[5];  // cyan + yellow
            R += aC * aM * nY * S[6];  // cyan + magenta
            R += aC * aM * aY * S[13]; // cyan + magenta + yellow
            R += nC * nM * nY * S[15]; // paper
            const double s = std::fabs(R);
            sums.X[l] += s * kXYZWeights[j][0];
            sums.Y[l] += s * kXYZWeights[j][1];
            sums.Z[l] += s * kXYZWeights[j][2];
        }
    }
    out = sums;
}

// Four-colour grey, one black factor per lane. The straightforward form of
// each weight stands on the right; the products left of black's term come
// from `terms`, formed in the same order.
VELTMARQUIST_LANE_LOOP
void blackLaneSums(const Primaries& primaries, const BandTerms* terms, const InkLanes<kBlackLanes>& black,
                   LaneSums<kBlackLanes>& out)
{
    LaneSums<kBlackLanes> sums = {};
    for (int j = 0; j < kBands; ++j) {
        const double* S = primaries[j];
        const BandTerms& t = terms[j];
        for (int l = 0; l < kBlackLanes; ++l) {
            const double aK = black.a[j][l], nK = black.n[j][l];
            const double w[16] = {
                t.aC_nM_nY * nK,         // aC * nM * nY * nK
                t.aM_nC_nY * nK,         // aM * nC * nY * nK
                t.aY_nC_nM * nK,         // aY * nC * nM * nK
                aK * t.nC * t.nM * t.nY, // aK * nC * nM * nY
                t.aM_aY_nC * nK,         // aM * aY * nC * nK
                t.aC_aY_nM * nK,         // aC * aY * nM * nK
                t.aC_aM_nY * nK,         // aC * aM * nY * nK
                t.aC * aK * t.nM * t.nY, // aC * aK * nM * nY
                t.aM * aK * t.nC * t.nY, // aM * aK * nC * nY
                t.aY * aK * t.nC * t.nM, // aY * aK * nC * nM
                t.aM_aY * aK * t.nC,     // aM * aY * aK * nC
                t.aC_aY * aK * t.nM,     // aC * aY * aK * nM
                t.aC_aM * aK * t.nY,     // aC * aM * aK * nY
                t.aC_aM_aY * nK,         // aC * aM * aY * nK
                t.aC_aM_aY * aK,         // aC * aM * aY * aK
                t.nC_nM_nY * nK,         // nC * nM * nY * nK
            };
            addBand(w, S, j, l, sums);
        }
    }
    out = sums;
}

} // namespace

// What calcOffsetSample reads for the two greys (0: three-colour, 1: four-colour).
struct GridEvaluator::Inputs {
    double coverage[2][4], others[2][4];
    double dot[2][4][kBands];
    Primaries primaries;
};

// Dot-area tables of the selected limit.
struct GridEvaluator::Tables {
    // Three-colour grey: yellow varies across lanes, black is one row.
    InkRow cyan3[kCyanCount], magenta3[kMagentaCount], black3;
    InkLanes<kYellowLanes> yellow3;
    // Four-colour grey: black varies across lanes.
    InkRow cyan4[kCyanCount], magenta4[kMagentaCount], yellow4[kYellowCount];
    InkLanes<kBlackLanes> black4;
    // yellowLaneSumsWithoutBlack serves the three-colour grey at this limit
    // for the cyan and magenta rows marked bounded and the yellow lanes
    // marked bounded; a lane with an infinite area is NaN (see threeColourSums),
    // any other is summed in full.
    enum class Lane { bounded, infinite, other };
    bool threeColourWithoutBlack = false;
    bool cyan3Bounded[kCyanCount] = {}, magenta3Bounded[kMagentaCount] = {};
    Lane yellow3Lane[kYellowLanes] = {};
};

namespace {

// Black prints nothing in this row: aK = 0 (either sign) and nK = 1 in every band.
bool printsNothing(const InkRow& row)
{
    for (int j = 0; j < kBands; ++j)
        if (!(row.a[j] == 0.0 && row.n[j] == 1.0))
            return false;
    return true;
}

// Every area of the rows lies in [0, 1e100] and every 1 - a in [-1e100, 1]:
// a product of three stays finite, so a product with a zero factor is zero.
bool bounded(const double* a, const double* n, int count)
{
    for (int i = 0; i < count; ++i)
        if (!(a[i] >= 0.0 && a[i] <= 1e100 && n[i] >= -1e100 && n[i] <= 1.0))
            return false;
    return true;
}

} // namespace

GridEvaluator::GridEvaluator(MathProfile& profile) : inputs_(new Inputs), tables_(new Tables)
{
    const MathProfile::ColorPatch& paper = profile.patchSlots[MathProfile::kSlotPaper];
    const MathProfile::ColorPatch* solid[4] = {&profilesteps::solidOf(profile, 0), &profilesteps::solidOf(profile, 1),
                                               &profilesteps::solidOf(profile, 2), &profilesteps::solidOf(profile, 3)};
    const double requestedBlack[2] = {0.0, 40.0};
    for (int g = 0; g < 2; ++g) {
        profile.setSample(40.0, 40.0, 40.0, requestedBlack[g], 0.0, 0.0, 0.0);
        // The coverages and their sums as calcOffsetSample forms them.
        const double* coverage = profile.patchSlots[MathProfile::kSlotCurrentSample].channel;
        veltmarquist::models::otherCoverages(coverage, inputs_->others[g]);
        for (int x = 0; x < 4; ++x) {
            inputs_->coverage[g][x] = coverage[x];
            const double* tint = profile.patchSlots[MathProfile::kSlotFirstTint + x].spectrum;
            for (int j = 0; j < kBands; ++j)
                inputs_->dot[g][x][j] = profile.getDotarea(tint[j], solid[x]->spectrum[j], paper.spectrum[j]);
        }
    }
    for (int j = 0; j < kBands; ++j) {
        for (int x = 0; x < 4; ++x)
            inputs_->primaries[j][x] = solid[x]->spectrum[j];
        for (int s = 0; s <= 10; ++s)
            inputs_->primaries[j][4 + s] = profile.patchSlots[s].spectrum[j];
        inputs_->primaries[j][15] = paper.spectrum[j];
    }
}

GridEvaluator::~GridEvaluator() = default;

namespace {

// a = d^e and 1 - a in every band, as calcOffsetSample forms them.
void fillRow(InkRow& row, const double* dot, double exponent)
{
    for (int j = 0; j < kBands; ++j) {
        row.a[j] = std::pow(dot[j], exponent);
        row.n[j] = 1.0 - row.a[j];
    }
}

} // namespace

double GridEvaluator::exponent(int grey, int ink, int hundredths, int limit) const
{
    // As calcOffsetSample forms it, with the factor and the limit as the fit
    // stores them in the profile (hundredths / 100.0, whole percent).
    return veltmarquist::models::offsetExponent(hundredths / 100.0, inputs_->others[grey][ink],
                                                inputs_->coverage[grey][ink], limit);
}

bool GridEvaluator::threeColourGreyIgnoresBlack() const
{
    for (int li = 0; li < kLimitAxis.count(); ++li) {
        InkRow first, other;
        fillRow(first, inputs_->dot[0][3], exponent(0, 3, kBlackAxis.at(0), kLimitAxis.at(li)));
        for (int ki = 1; ki < kBlackCount; ++ki) {
            fillRow(other, inputs_->dot[0][3], exponent(0, 3, kBlackAxis.at(ki), kLimitAxis.at(li)));
            if (std::memcmp(&first, &other, sizeof first) != 0)
                return false;
        }
    }
    return true;
}

void GridEvaluator::selectLimit(int limit)
{
    const int percent = kLimitAxis.at(limit);
    Tables& t = *tables_;
    for (int ci = 0; ci < kCyanCount; ++ci) {
        fillRow(t.cyan3[ci], inputs_->dot[0][0], exponent(0, 0, kCyanAxis.at(ci), percent));
        fillRow(t.cyan4[ci], inputs_->dot[1][0], exponent(1, 0, kCyanAxis.at(ci), percent));
    }
    for (int mi = 0; mi < kMagentaCount; ++mi) {
        fillRow(t.magenta3[mi], inputs_->dot[0][1], exponent(0, 1, kMagentaAxis.at(mi), percent));
        fillRow(t.magenta4[mi], inputs_->dot[1][1], exponent(1, 1, kMagentaAxis.at(mi), percent));
    }
    for (int yi = 0; yi < kYellowCount; ++yi)
        fillRow(t.yellow4[yi], inputs_->dot[1][2], exponent(1, 2, kYellowAxis.at(yi), percent));
    // Any black factor will do: threeColourGreyIgnoresBlack.
    fillRow(t.black3, inputs_->dot[0][3], exponent(0, 3, kBlackAxis.at(0), percent));

    // Lane tables; padding lanes repeat the last factor.
    InkRow row;
    for (int l = 0; l < kYellowLanes; ++l) {
        const int factor = kYellowAxis.at(l < kYellowCount ? l : kYellowCount - 1);
        fillRow(row, inputs_->dot[0][2], exponent(0, 2, factor, percent));
        for (int j = 0; j < kBands; ++j) {
            t.yellow3.a[j][l] = row.a[j];
            t.yellow3.n[j][l] = row.n[j];
        }
    }
    t.threeColourWithoutBlack = printsNothing(t.black3);
    for (int l = 0; l < kYellowLanes; ++l) {
        bool inBounds = true, infinite = false;
        for (int j = 0; j < kBands; ++j) {
            inBounds = inBounds && bounded(&t.yellow3.a[j][l], &t.yellow3.n[j][l], 1);
            infinite = infinite || t.yellow3.a[j][l] == HUGE_VAL;
        }
        t.yellow3Lane[l] = inBounds ? Tables::Lane::bounded : infinite ? Tables::Lane::infinite : Tables::Lane::other;
    }
    for (int i = 0; i < kCyanCount; ++i)
        t.cyan3Bounded[i] = bounded(t.cyan3[i].a, t.cyan3[i].n, kBands);
    for (int i = 0; i < kMagentaCount; ++i)
        t.magenta3Bounded[i] = bounded(t.magenta3[i].a, t.magenta3[i].n, kBands);
    for (int l = 0; l < kBlackLanes; ++l) {
        const int factor = kBlackAxis.at(l < kBlackCount ? l : kBlackCount - 1);
        fillRow(row, inputs_->dot[1][3], exponent(1, 3, factor, percent));
        for (int j = 0; j < kBands; ++j) {
            t.black4.a[j][l] = row.a[j];
            t.black4.n[j][l] = row.n[j];
        }
    }
}

void GridEvaluator::threeColourSums(int cyan, int magenta, LaneSums<kYellowLanes>& out) const
{
    const Tables& t = *tables_;
    if (!(t.threeColourWithoutBlack && t.cyan3Bounded[cyan] && t.magenta3Bounded[magenta])) {
        yellowLaneSums(inputs_->primaries, t.cyan3[cyan], t.magenta3[magenta], t.black3, t.yellow3, out);
        return;
    }
    yellowLaneSumsWithoutBlack(inputs_->primaries, t.cyan3[cyan], t.magenta3[magenta], t.yellow3, out);
    for (int l = 0; l < kYellowLanes; ++l) {
        if (t.yellow3Lane[l] == Tables::Lane::infinite) {
            // aY = inf makes nY = -inf, and black's weight aK nC nM nY is
            // 0 * -inf: the default NaN, which every later sum carries and
            // fabs makes positive. X, Y and Z are that NaN.
            out.X[l] = out.Y[l] = out.Z[l] = std::numeric_limits<double>::quiet_NaN();
        } else if (t.yellow3Lane[l] == Tables::Lane::other) {
            yellowLaneSum(inputs_->primaries, t.cyan3[cyan], t.magenta3[magenta], t.black3, t.yellow3, l, out);
        }
    }
}

void GridEvaluator::fourColourSums(int cyan, int magenta, int yellow, LaneSums<kBlackLanes>& out) const
{
    const Tables& t = *tables_;
    const InkRow &c = t.cyan4[cyan], &m = t.magenta4[magenta], &y = t.yellow4[yellow];
    BandTerms terms[kBands];
    for (int j = 0; j < kBands; ++j)
        terms[j] = bandTerms(c.a[j], m.a[j], y.a[j], c.n[j], m.n[j], y.n[j]);
    blackLaneSums(inputs_->primaries, terms, t.black4, out);
}

} // namespace grayfit

bool profilesteps::scanGrayGridFast(MathProfile& profile, const lab& grey3, const lab& grey4, int bestPoint[5],
                                    double& bestScore)
{
    using namespace grayfit;
    GridEvaluator grid(profile);
    if (!grid.threeColourGreyIgnoresBlack())
        return false;

    // Colour difference from band sums, as spec2XYZ, labOf and deltaE form it.
    const double normFactor = profile.normFactor;
    auto difference = [&profile, normFactor](const lab& reference, double sumX, double sumY, double sumZ) {
        const double X = sumX * normFactor, Y = sumY * normFactor, Z = sumZ * normFactor;
        return deltaE(reference, profile.XYZ2LAB(MathProfile::xyz{X / 100.0, Y / 100.0, Z / 100.0}));
    };

    LaneSums<kYellowLanes> sums3;
    LaneSums<kBlackLanes> sums4;
    double dE3[kYellowLanes];
    // The order of the point-by-point loop: limit, cyan, magenta, yellow, black.
    for (int li = 0; li < kLimitAxis.count(); ++li) {
        grid.selectLimit(li);
        for (int ci = 0; ci < kCyanAxis.count(); ++ci)
            for (int mi = 0; mi < kMagentaAxis.count(); ++mi) {
                grid.threeColourSums(ci, mi, sums3);
                for (int yi = 0; yi < kYellowAxis.count(); ++yi)
                    dE3[yi] = difference(grey3, sums3.X[yi], sums3.Y[yi], sums3.Z[yi]);
                for (int yi = 0; yi < kYellowAxis.count(); ++yi) {
                    // Every score of this block is sqrt(dE3^2 + dE4^2) with
                    // dE4^2 >= 0, and rounded addition and sqrt never fall
                    // when an operand grows: no black factor can score below
                    // sqrt(dE3^2). When that cannot beat the best so far,
                    // the block cannot change it. A NaN dE3 (the grey cannot
                    // be printed at these factors) makes every score of the
                    // block NaN, which never beats anything either.
                    if (!(bestScore > std::sqrt(dE3[yi] * dE3[yi])))
                        continue;
                    grid.fourColourSums(ci, mi, yi, sums4);
                    for (int ki = 0; ki < kBlackAxis.count(); ++ki) {
                        const double dE4 = difference(grey4, sums4.X[ki], sums4.Y[ki], sums4.Z[ki]);
                        const double s = std::sqrt(dE3[yi] * dE3[yi] + dE4 * dE4);
                        if (bestScore > s) {
                            bestScore = s;
                            bestPoint[kPC] = kCyanAxis.at(ci);
                            bestPoint[kPM] = kMagentaAxis.at(mi);
                            bestPoint[kPY] = kYellowAxis.at(yi);
                            bestPoint[kPK] = kBlackAxis.at(ki);
                            bestPoint[kPL] = kLimitAxis.at(li);
                        }
                    }
                }
            }
    }
    return true;
}
