// Fritsch-Carlson monotone cubic interpolation.
//
// Each interval k (width h_k, secant d_k = (y_k+1 - y_k) / h_k) is a cubic
// Hermite piece. The slope at an inner node starts as the mean of its two
// secants, at an end node as the one secant; then
//   - a node between secants of opposite sign, or beside a flat interval,
//     gets slope 0 (a local extremum or plateau stays one);
//   - on each interval a = m_k / d_k, b = m_k+1 / d_k; where a^2 + b^2 > 9
//     both slopes are scaled by 3 / sqrt(a^2 + b^2).
// The second rule keeps every piece monotone between its two nodes, which is
// what a dot-area curve needs: more coverage never gives less area.
#include "MonotoneCurve.h"

#include <cmath>

namespace veltmarquist {
namespace models {

void monotoneSlopes(const double* x, const double* y, int count, double* slope)
{
    const int last = count - 1;
    auto secant = [&](int k) { return (y[k + 1] - y[k]) / (x[k + 1] - x[k]); };
    slope[0] = secant(0);
    slope[last] = secant(last - 1);
    for (int k = 1; k < last; ++k) {
        const double before = secant(k - 1), after = secant(k);
        slope[k] = (before * after <= 0.0) ? 0.0 : (before + after) / 2.0;
    }
    for (int k = 0; k < last; ++k) {
        const double d = secant(k);
        if (d == 0.0) {
            slope[k] = 0.0;
            slope[k + 1] = 0.0;
            continue;
        }
        const double a = slope[k] / d, b = slope[k + 1] / d;
        const double length = a * a + b * b;
        if (length > 9.0) {
            const double tau = 3.0 / std::sqrt(length);
            slope[k] = tau * a * d;
            slope[k + 1] = tau * b * d;
        }
    }
}

double monotoneCurveAt(const double* x, const double* y, const double* slope, int count, double at)
{
    const int last = count - 1;
    if (!(at > x[0]))
        return y[0];
    if (at >= x[last])
        return y[last];
    int k = 0;
    while (at >= x[k + 1])
        ++k;
    const double h = x[k + 1] - x[k];
    const double t = (at - x[k]) / h;
    const double t2 = t * t, t3 = t2 * t;
    // y_k + (y_k+1 - y_k) h01 + h (h10 m_k + h11 m_k+1), the Hermite basis
    // with h00 = 1 - h01 folded in: a flat interval stays exactly flat.
    const double h01 = -2.0 * t3 + 3.0 * t2;
    const double h10 = t3 - 2.0 * t2 + t;
    const double h11 = t3 - t2;
    return y[k] + (y[k + 1] - y[k]) * h01 + h * (h10 * slope[k] + h11 * slope[k + 1]);
}

} // namespace models
} // namespace veltmarquist
