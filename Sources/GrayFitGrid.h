// The coarse grid of the grey fit, shared by the straightforward search
// (CorrectionFactors.cpp) and its fast evaluation (GrayFitFastPath.cpp), so
// that both visit exactly the same points in the same order.
#ifndef VELTMARQUIST_GRAYFITGRID_H
#define VELTMARQUIST_GRAYFITGRID_H

namespace grayfit {

// One coordinate of the grid: first, first + step, ..., last.
struct Axis {
    int first, last, step;
    constexpr int count() const { return (last - first) / step + 1; }
    constexpr int at(int index) const { return first + index * step; }
};

// Outermost first: coverage limit in percent, then the factors of cyan,
// magenta, yellow and black in hundredths. 3 x 16 x 16 x 21 x 26 points.
constexpr Axis kLimitAxis = {100, 300, 100};
constexpr Axis kCyanAxis = {-100, 50, 10};
constexpr Axis kMagentaAxis = {-100, 50, 10};
constexpr Axis kYellowAxis = {0, 200, 10};
constexpr Axis kBlackAxis = {-200, 50, 10};

// Coordinates of a search point: the four factors, then the limit.
enum { kPC, kPM, kPY, kPK, kPL };

} // namespace grayfit

#endif // VELTMARQUIST_GRAYFITGRID_H
