// Fast evaluation of the coarse grid of the grey fit: the colours of the two
// greys for many grid points at once, bit for bit the X, Y, Z that setSample
// and calcOffsetSample would give for each point (GrayFitFastPath.cpp tells
// why). Internal to the library and its tests.
#ifndef VELTMARQUIST_GRAYFITFASTPATH_H
#define VELTMARQUIST_GRAYFITFASTPATH_H

#include "GrayFitGrid.h"
#include "MathProfile.h"

#include <memory>

namespace grayfit {

// One candidate per lane, padded to a multiple of eight lanes; padding lanes
// repeat the last candidate and are never read.
const int kYellowLanes = 24;
const int kBlackLanes = 32;
static_assert(kYellowLanes >= kYellowAxis.count() && kBlackLanes >= kBlackAxis.count(), "one lane per candidate");

// Band sums of X, Y and Z of several candidates: the candidate's X is
// X[lane] * normFactor, as spec2XYZ forms it (likewise Y, Z).
template <int Lanes>
struct LaneSums {
    double X[Lanes], Y[Lanes], Z[Lanes];
};

class GridEvaluator {
public:
    // Takes the paper, the solids, the overprints and the tints that
    // setSample selects for the two greys from a profile whose form has been
    // read and sorted. Calls setSample on it (the four-colour grey stays selected).
    explicit GridEvaluator(MathProfile& profile);
    ~GridEvaluator();
    GridEvaluator(const GridEvaluator&) = delete;
    GridEvaluator& operator=(const GridEvaluator&) = delete;

    // True when the three-colour grey's black dot areas are the same, bit for
    // bit, for every black factor at every limit, so that one colour of it
    // serves all black factors.
    bool threeColourGreyIgnoresBlack() const;
    // Computes the dot-area tables of one coverage limit (index on kLimitAxis).
    void selectLimit(int limit);
    // Three-colour grey C40 M40 Y40 at the cyan and magenta factor indices,
    // one lane per yellow factor (lane = index on kYellowAxis).
    void threeColourSums(int cyan, int magenta, LaneSums<kYellowLanes>& out) const;
    // Four-colour grey C40 M40 Y40 K40 at the cyan, magenta and yellow factor
    // indices, one lane per black factor (lane = index on kBlackAxis).
    void fourColourSums(int cyan, int magenta, int yellow, LaneSums<kBlackLanes>& out) const;

private:
    // Exponent of an ink in grey 0 (three-colour) or 1 (four-colour).
    double exponent(int grey, int ink, int hundredths, int limit) const;

    struct Inputs;
    struct Tables;
    std::unique_ptr<Inputs> inputs_;
    std::unique_ptr<Tables> tables_;
};

} // namespace grayfit

#endif // VELTMARQUIST_GRAYFITFASTPATH_H
