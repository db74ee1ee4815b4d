// Small bounded nonlinear least squares (Levenberg-Marquardt) and the dense
// symmetric solve it needs. Internal to the library; deterministic: fixed
// iteration rules, no threads, no randomness.
#ifndef VELTMARQUIST_MODELS_LEASTSQUARES_H
#define VELTMARQUIST_MODELS_LEASTSQUARES_H

#include <functional>
#include <vector>

namespace veltmarquist {
namespace models {

// The Gauss-Newton normal equations of residuals r(x) with Jacobian J at a
// point: JtJ (row-major, unknowns x unknowns) and the gradient Jtr.
struct NormalEquations {
    explicit NormalEquations(int unknowns)
        : size(unknowns), JtJ(static_cast<size_t>(unknowns) * static_cast<size_t>(unknowns)),
          Jtr(static_cast<size_t>(unknowns))
    {
    }
    void clear();
    // Adds one residual r whose Jacobian row is `row` (dense, `size` long).
    void addRow(const double* row, double r);
    double& at(int i, int j) { return JtJ[static_cast<size_t>(i) * static_cast<size_t>(size) + static_cast<size_t>(j)]; }

    int size;
    std::vector<double> JtJ;
    std::vector<double> Jtr;
};

// Fills `normal` at x (left cleared by the caller's evaluate) and returns the
// cost, half the sum of squared residuals.
using LeastSquaresProblem = std::function<double(const std::vector<double>& x, NormalEquations& normal)>;

// Residuals r(x) written to r (m values), for problems small enough to
// differentiate numerically.
using ResidualFunction = std::function<void(const std::vector<double>& x, double* r)>;

struct LeastSquaresOptions {
    int maxIterations = 200;
    double costTolerance = 1e-14; // stop when a step lowers the cost by less than this fraction
    double stepTolerance = 1e-12; // or moves no unknown by more than this (scaled by 1 + |x|)
};

struct LeastSquaresResult {
    std::vector<double> x;
    double cost = 0.0;
    int iterations = 0;
    bool converged = false; // false: stopped by maxIterations
};

// Minimises the cost within lower <= x <= upper from x0 (clamped into the box).
LeastSquaresResult minimizeBounded(const LeastSquaresProblem& problem, std::vector<double> x0,
                                   const std::vector<double>& lower, const std::vector<double>& upper,
                                   const LeastSquaresOptions& options = {});

// A problem from m residuals with a central-difference Jacobian (step h).
LeastSquaresProblem numericProblem(ResidualFunction residuals, int m, double h);

// Solves A x = b for symmetric positive definite A (n x n, row-major) by
// Cholesky; A and b are overwritten, b holds x. False when A is not
// numerically positive definite.
bool solveSymmetricPositive(std::vector<double>& A, std::vector<double>& b, int n);

} // namespace models
} // namespace veltmarquist

#endif // VELTMARQUIST_MODELS_LEASTSQUARES_H
