// Bounded Levenberg-Marquardt.
//
// Each iteration solves (JtJ + mu D) step = -Jtr over the free unknowns, with
// D the diagonal of JtJ (Marquardt's scaling, so an n near 2 and an area near
// 0.5 are damped alike), moves, and clamps the result into the box. An
// unknown sitting on a bound whose gradient points out of the box is held
// there for the iteration: projecting its unconstrained step would only bend
// the step of the others. A step that lowers the cost is taken and mu falls
// tenfold; otherwise mu rises tenfold and the step is solved again. Zero
// entries of D (an unknown no residual depends on, such as n in a band where
// paper and solids are equal) get a small floor, so the system stays solvable
// and such an unknown keeps its start value.
#include "LeastSquares.h"

#include <algorithm>
#include <cmath>

namespace veltmarquist {
namespace models {

void NormalEquations::clear()
{
    std::fill(JtJ.begin(), JtJ.end(), 0.0);
    std::fill(Jtr.begin(), Jtr.end(), 0.0);
}

void NormalEquations::addRow(const double* row, double r)
{
    for (int i = 0; i < size; ++i) {
        if (row[i] == 0.0)
            continue;
        Jtr[static_cast<size_t>(i)] += row[i] * r;
        for (int j = 0; j < size; ++j)
            at(i, j) += row[i] * row[j];
    }
}

bool solveSymmetricPositive(std::vector<double>& A, std::vector<double>& b, int n)
{
    auto a = [&](int i, int j) -> double& { return A[static_cast<size_t>(i * n + j)]; };
    // A = L Lt, L stored in the lower triangle.
    for (int j = 0; j < n; ++j) {
        double diagonal = a(j, j);
        for (int k = 0; k < j; ++k)
            diagonal -= a(j, k) * a(j, k);
        if (!(diagonal > 0.0) || !std::isfinite(diagonal))
            return false;
        const double root = std::sqrt(diagonal);
        a(j, j) = root;
        for (int i = j + 1; i < n; ++i) {
            double sum = a(i, j);
            for (int k = 0; k < j; ++k)
                sum -= a(i, k) * a(j, k);
            a(i, j) = sum / root;
        }
    }
    for (int i = 0; i < n; ++i) { // L y = b
        double sum = b[static_cast<size_t>(i)];
        for (int k = 0; k < i; ++k)
            sum -= a(i, k) * b[static_cast<size_t>(k)];
        b[static_cast<size_t>(i)] = sum / a(i, i);
    }
    for (int i = n - 1; i >= 0; --i) { // Lt x = y
        double sum = b[static_cast<size_t>(i)];
        for (int k = i + 1; k < n; ++k)
            sum -= a(k, i) * b[static_cast<size_t>(k)];
        b[static_cast<size_t>(i)] = sum / a(i, i);
    }
    return true;
}

LeastSquaresResult minimizeBounded(const LeastSquaresProblem& problem, std::vector<double> x0,
                                   const std::vector<double>& lower, const std::vector<double>& upper,
                                   const LeastSquaresOptions& options)
{
    const int n = static_cast<int>(x0.size());
    LeastSquaresResult result;
    result.x = std::move(x0);
    std::vector<double>& x = result.x;
    for (size_t i = 0; i < x.size(); ++i)
        x[i] = std::min(std::max(x[i], lower[i]), upper[i]);

    NormalEquations normal(n), trial(n);
    normal.clear();
    result.cost = problem(x, normal);
    double damping = 1e-3;
    std::vector<int> free;
    std::vector<double> A, step, candidate;
    for (; result.iterations < options.maxIterations; ++result.iterations) {
        free.clear();
        double largestDiagonal = 0.0;
        for (int i = 0; i < n; ++i) {
            const size_t u = static_cast<size_t>(i);
            const double g = normal.Jtr[u];
            if ((x[u] <= lower[u] && g > 0.0) || (x[u] >= upper[u] && g < 0.0))
                continue;
            free.push_back(i);
            largestDiagonal = std::max(largestDiagonal, normal.at(i, i));
        }
        const int f = static_cast<int>(free.size());
        const bool flat = std::all_of(free.begin(), free.end(), [&](int i) { return normal.Jtr[static_cast<size_t>(i)] == 0.0; });
        if (flat || !(largestDiagonal > 0.0) || !(result.cost > 0.0)) {
            result.converged = true;
            return result;
        }
        const double floor = 1e-12 * largestDiagonal;
        bool taken = false;
        double drop = 0.0, moved = 0.0;
        while (!taken && damping <= 1e16) {
            A.assign(static_cast<size_t>(f * f), 0.0);
            step.assign(static_cast<size_t>(f), 0.0);
            for (int i = 0; i < f; ++i) {
                const int row = free[static_cast<size_t>(i)];
                for (int j = 0; j < f; ++j)
                    A[static_cast<size_t>(i * f + j)] = normal.at(row, free[static_cast<size_t>(j)]);
                A[static_cast<size_t>(i * f + i)] += damping * std::max(normal.at(row, row), floor);
                step[static_cast<size_t>(i)] = -normal.Jtr[static_cast<size_t>(row)];
            }
            if (!solveSymmetricPositive(A, step, f)) {
                damping *= 10.0;
                continue;
            }
            candidate = x;
            moved = 0.0;
            for (int i = 0; i < f; ++i) {
                const size_t u = static_cast<size_t>(free[static_cast<size_t>(i)]);
                candidate[u] = std::min(std::max(x[u] + step[static_cast<size_t>(i)], lower[u]), upper[u]);
                moved = std::max(moved, std::fabs(candidate[u] - x[u]) / (1.0 + std::fabs(x[u])));
            }
            trial.clear();
            const double cost = problem(candidate, trial);
            if (std::isfinite(cost) && cost < result.cost) {
                drop = result.cost - cost;
                x.swap(candidate);
                std::swap(normal, trial);
                result.cost = cost;
                taken = true;
                damping = std::max(damping / 10.0, 1e-15);
            } else {
                damping *= 10.0;
            }
        }
        if (!taken || drop <= options.costTolerance * (result.cost + drop) || moved <= options.stepTolerance) {
            result.converged = true;
            ++result.iterations;
            return result;
        }
    }
    return result;
}

LeastSquaresProblem numericProblem(ResidualFunction residuals, int m, double h)
{
    return [residuals = std::move(residuals), m, h](const std::vector<double>& x, NormalEquations& normal) {
        const size_t n = x.size();
        std::vector<double> r(static_cast<size_t>(m)), plus(r), minus(r), jacobian(n * static_cast<size_t>(m));
        residuals(x, r.data());
        std::vector<double> shifted = x;
        for (size_t j = 0; j < n; ++j) {
            shifted[j] = x[j] + h;
            residuals(shifted, plus.data());
            shifted[j] = x[j] - h;
            residuals(shifted, minus.data());
            shifted[j] = x[j];
            for (size_t i = 0; i < static_cast<size_t>(m); ++i)
                jacobian[i * n + j] = (plus[i] - minus[i]) / (2.0 * h);
        }
        double cost = 0.0;
        for (size_t i = 0; i < static_cast<size_t>(m); ++i) {
            normal.addRow(&jacobian[i * n], r[i]);
            cost += r[i] * r[i];
        }
        return cost / 2.0;
    };
}

} // namespace models
} // namespace veltmarquist
