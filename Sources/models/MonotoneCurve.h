// Monotone cubic interpolation through a few nodes (Fritsch-Carlson): the
// curve never overshoots its nodes, so non-decreasing nodes give a
// non-decreasing curve. Internal to the library.
#ifndef VELTMARQUIST_MODELS_MONOTONECURVE_H
#define VELTMARQUIST_MODELS_MONOTONECURVE_H

namespace veltmarquist {
namespace models {

// Slopes at `count` (>= 2) nodes with strictly increasing x.
void monotoneSlopes(const double* x, const double* y, int count, double* slope);

// The cubic Hermite curve through the nodes with those slopes at `at`; `at`
// outside [x[0], x[count - 1]] takes the end value. At a node it returns the
// node's y exactly.
double monotoneCurveAt(const double* x, const double* y, const double* slope, int count, double at);

} // namespace models
} // namespace veltmarquist

#endif // VELTMARQUIST_MODELS_MONOTONECURVE_H
