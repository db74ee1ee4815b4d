// One colour separated under the A2B table: a small bounded least-squares
// problem, solved by Levenberg-Marquardt steps on the face of the active
// bounds and projected back into the feasible set.
#include "Separation.h"

#include <algorithm>
#include <cmath>

namespace veltmarquist::profile {

namespace {

// The feasible set of one node: bounds per ink and the total.
struct Box {
    std::array<double, 4> low{}, high{};
    double total = 4.0;

    std::array<double, 4> project(const std::array<double, 4>& x) const
    {
        std::array<double, 4> y;
        const auto clampAt = [&](double shift) {
            double sum = 0.0;
            for (size_t i = 0; i < 4; ++i) {
                y[i] = std::clamp(x[i] - shift, low[i], high[i]);
                sum += y[i];
            }
            return sum;
        };
        if (clampAt(0.0) <= total)
            return y;
        // Shift every ink down by the same amount until the total holds.
        double lowShift = 0.0, highShift = 4.0;
        for (int step = 0; step < 60; ++step) {
            const double middle = 0.5 * (lowShift + highShift);
            (clampAt(middle) > total ? lowShift : highShift) = middle;
        }
        clampAt(highShift);
        return y;
    }
};

// Residuals (dL*, da*, db*, sqrt(lambda) dK, then sqrt(mu) times each
// ink's distance from the neighbours' separation) and their Jacobian at x.
struct Residuals {
    std::array<double, 8> r{};
    std::array<std::array<double, 4>, 8> J{};
    double value() const
    {
        double sum = 0.0;
        for (double v : r)
            sum += v * v;
        return sum;
    }
};

Residuals residualsAt(const ForwardTable& a2b, const std::array<double, 4>& x, const Triple& target, double blackTarget,
                      const std::array<double, 4>* neighbours, bool withJacobian)
{
    Residuals out;
    std::array<std::array<double, 4>, 3> jacobian{};
    const Triple lab = a2b.lab(x.data(), withJacobian ? &jacobian : nullptr);
    const double weight = std::sqrt(kSeparationBlackWeight);
    for (size_t c = 0; c < 3; ++c) {
        out.r[c] = lab[c] - target[c];
        out.J[c] = jacobian[c];
    }
    out.r[3] = weight * (x[3] - blackTarget);
    out.J[3] = {0.0, 0.0, 0.0, weight};
    if (neighbours) {
        const double pull = std::sqrt(kSeparationNeighbourWeight);
        for (size_t i = 0; i < 4; ++i) {
            out.r[4 + i] = pull * (x[i] - (*neighbours)[i]);
            out.J[4 + i][i] = pull;
        }
    }
    return out;
}

// Solves A z = b for the variables marked free (the rest stay 0), with an
// optional equality sum(z over free) = 0, by Gaussian elimination on the
// bordered system. Returns false for a singular system.
bool solveStep(const std::array<std::array<double, 4>, 4>& A, const std::array<double, 4>& b,
               const std::array<bool, 4>& isFree, bool sumFixed, std::array<double, 4>& z)
{
    int index[4], n = 0;
    for (int i = 0; i < 4; ++i)
        if (isFree[static_cast<size_t>(i)])
            index[n++] = i;
    const int size = n + (sumFixed ? 1 : 0);
    if (n == 0)
        return false;
    double M[5][6] = {};
    for (int row = 0; row < n; ++row) {
        for (int col = 0; col < n; ++col)
            M[row][col] = A[static_cast<size_t>(index[row])][static_cast<size_t>(index[col])];
        if (sumFixed)
            M[row][n] = M[n][row] = 1.0;
        M[row][size] = b[static_cast<size_t>(index[row])];
    }
    for (int col = 0; col < size; ++col) {
        int pivot = col;
        for (int row = col + 1; row < size; ++row)
            if (std::fabs(M[row][col]) > std::fabs(M[pivot][col]))
                pivot = row;
        if (std::fabs(M[pivot][col]) < 1e-14)
            return false;
        for (int k = 0; k <= size; ++k)
            std::swap(M[col][k], M[pivot][k]);
        for (int row = 0; row < size; ++row) {
            if (row == col)
                continue;
            const double factor = M[row][col] / M[col][col];
            for (int k = col; k <= size; ++k)
                M[row][k] -= factor * M[col][k];
        }
    }
    z = {0.0, 0.0, 0.0, 0.0};
    for (int row = 0; row < n; ++row)
        z[static_cast<size_t>(index[row])] = M[row][size] / M[row][row];
    return true;
}

} // namespace

int InkLimits::totalCode() const
{
    return static_cast<int>(std::floor(total * 65535.0 + 1e-9)) - kRoundingRoom;
}

int InkLimits::blackCode() const
{
    return static_cast<int>(std::floor(black * 65535.0 + 1e-9));
}

std::array<double, 4> separateColour(const ForwardTable& a2b, const InkLimits& limits, const Triple& lab,
                                     double blackTarget, bool fixedBlack, const std::array<double, 4>& start,
                                     double& distance, double lowestBlack, const std::array<double, 4>* neighbours)
{
    Box box;
    box.high = {1.0, 1.0, 1.0, limits.black};
    box.total = limits.total;
    box.low[3] = std::min(lowestBlack, limits.black);
    if (fixedBlack)
        box.low[3] = box.high[3] = std::clamp(std::max(blackTarget, box.low[3]), 0.0, limits.black);
    box.low[3] = std::min(box.low[3], limits.total);
    box.high[3] = std::max(box.high[3], box.low[3]);

    std::array<double, 4> x = box.project(start);
    Residuals current = residualsAt(a2b, x, lab, blackTarget, neighbours, true);
    double damping = 1e-4;
    for (int iteration = 0; iteration < 80; ++iteration) {
        std::array<double, 4> gradient{};
        std::array<std::array<double, 4>, 4> H{};
        for (size_t i = 0; i < 4; ++i)
            for (size_t k = 0; k < 8; ++k) {
                gradient[i] += current.J[k][i] * current.r[k];
                for (size_t j = 0; j < 4; ++j)
                    H[i][j] += current.J[k][i] * current.J[k][j];
            }
        // Bounds the step may not leave: an ink at a bound whose gradient points out of the box.
        std::array<bool, 4> isFree{};
        double sum = 0.0;
        for (size_t i = 0; i < 4; ++i) {
            const bool atLow = x[i] <= box.low[i] + 1e-12 && gradient[i] > 0.0;
            const bool atHigh = x[i] >= box.high[i] - 1e-12 && gradient[i] < 0.0;
            isFree[i] = !(atLow || atHigh) && box.high[i] > box.low[i];
            sum += x[i];
        }
        std::array<std::array<double, 4>, 4> A = H;
        std::array<double, 4> b;
        for (size_t i = 0; i < 4; ++i) {
            A[i][i] += damping * (H[i][i] + 1e-6);
            b[i] = -gradient[i];
        }
        std::array<double, 4> step{};
        bool solved = solveStep(A, b, isFree, false, step);
        double stepSum = step[0] + step[1] + step[2] + step[3];
        if (solved && sum >= box.total - 1e-12 && stepSum > 0.0)
            solved = solveStep(A, b, isFree, true, step); // along the face of the total
        if (!solved)
            break;
        const std::array<double, 4> next = box.project({x[0] + step[0], x[1] + step[1], x[2] + step[2], x[3] + step[3]});
        const Residuals trial = residualsAt(a2b, next, lab, blackTarget, neighbours, true);
        if (trial.value() < current.value()) {
            double moved = 0.0;
            for (size_t i = 0; i < 4; ++i)
                moved = std::max(moved, std::fabs(next[i] - x[i]));
            x = next;
            current = trial;
            damping = std::max(damping / 4.0, 1e-9);
            if (moved < 1e-8)
                break;
        } else {
            damping *= 8.0;
            if (damping > 1e8)
                break;
        }
    }
    distance = std::sqrt(current.r[0] * current.r[0] + current.r[1] * current.r[1] + current.r[2] * current.r[2]);
    // Ink that prints nothing is no ink: the paper gets exactly none.
    for (double& ink : x)
        if (ink < 1e-7)
            ink = 0.0;
    return x;
}

} // namespace veltmarquist::profile
