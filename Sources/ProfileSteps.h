// Steps of the profile's calculations that hosts never call: free functions
// on the profile, so that the installed class declares its public interface
// and nothing else. Internal to the library.
#ifndef VELTMARQUIST_PROFILESTEPS_H
#define VELTMARQUIST_PROFILESTEPS_H

#include "MathProfile.h"

namespace veltmarquist::models {
class InkAreaMemo;
}

namespace profilesteps {

using ColorPatch = MathProfile::ColorPatch;
using lab = MathProfile::lab;

// readData, then the four ink lists ordered: how every four-colour
// calculation takes in the test form.
void readForm(MathProfile& profile, double** rows);

// The solid of channel `ink` for the offset model: the last patch of its list.
ColorPatch& solidOf(MathProfile& profile, int ink);
// The gravure model for one ink order, channels i1..i4 of the current sample.
void calcGravureSample(MathProfile& profile, int i1, int i2, int i3, int i4);
// Runs the gravure method that an ink order selects (as inkOrder does).
void calcGravureSampleByOrder(MathProfile& profile, int order);
// The offset model for the current sample, as calcOffsetSample; with a memo,
// its d^e rows come from there (the same bits).
void calcOffsetSample(MathProfile& profile, veltmarquist::models::InkAreaMemo* memo);
// The model of a four-colour process: 1 gravure in inkOrder, else offset.
void predictFourColour(MathProfile& profile, PrintProcess process, veltmarquist::models::InkAreaMemo* memo = nullptr);

// CIELAB of a patch's X, Y, Z (divided by 100 first).
lab labOf(MathProfile& profile, const ColorPatch& patch);
// CIE 1976 colour difference sqrt(dL^2 + da^2 + db^2).
double deltaE(const lab& first, const lab& second);

// The grey fit; `straightforward` scores the coarse grid point by point.
void fitGrayDiffFactor(MathProfile& profile, double** rows, bool straightforward);
// Score of one point (pC, pM, pY, pK, pL) of the grey fit against the
// measured greys: sets the fields and predicts both greys.
// With a memo, the d^e rows come from there (the same bits).
double scoreGrayPoint(MathProfile& profile, const lab& grey3, const lab& grey4, const int point[5],
                      veltmarquist::models::InkAreaMemo* memo = nullptr);
// The coarse grid of the grey fit, every point through scoreGrayPoint.
// Improves on the best point and score passed in (a tie keeps the earlier).
void scanGrayGridStraightforward(MathProfile& profile, const lab& grey3, const lab& grey4, int bestPoint[5],
                                 double& bestScore);
// The same grid scored from cached dot areas, with the black factors as
// lanes of one loop: the same best point and score, bit for bit. Returns
// false without scoring when the three-colour grey would depend on the
// black factor.
bool scanGrayGridFast(MathProfile& profile, const lab& grey3, const lab& grey4, int bestPoint[5], double& bestScore);

} // namespace profilesteps

#endif // VELTMARQUIST_PROFILESTEPS_H
