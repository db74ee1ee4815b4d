// The Yule-Nielsen spectral Neugebauer model with a measured n per band and
// ink spreading, fitted to the 46 patches of the four-colour test form.
// Internal to the library: the installed prediction interface wraps it.
#ifndef VELTMARQUIST_MODELS_YULENIELSEN_H
#define VELTMARQUIST_MODELS_YULENIELSEN_H

#include "FormPatches.h"

#include <string>
#include <vector>

namespace veltmarquist {
namespace models {

// Everything a prediction needs, and what the fit found out about the form.
// A value: copyable, immutable once fitted, safe to read from many threads.
struct YuleNielsenFit {
    Bands n{};                         // Yule-Nielsen n per band, in [1, 10]
    // Dot-area curve of each ink: nodes at 0, the seven tint levels and 100 %
    // (non-decreasing, in [0, 1]) and their Fritsch-Carlson slopes.
    std::array<std::array<double, kTintLevels + 2>, kInks> curveArea{};
    std::array<std::array<double, kTintLevels + 2>, kInks> curveSlope{};
    std::array<double, kInks> spreading{}; // s_i, |s_i| <= 0.3
    std::array<Bands, kPrimaries> primaryRoot{}; // P_b^(1/n) per band

    // Quality of the fit.
    double tintResidualRms = 0.0;      // RMS reflectance residual over the 28 tints' bands
    std::array<double, 2> greyDeltaE{}; // CIE 1976 dE*ab of the three- and four-colour grey after the fit
    std::vector<std::string> warnings; // for example a factor at its bound or a large grey residual
};

// Fits n(lambda), the dot-area curves and the spreading factors. Deterministic.
YuleNielsenFit fitYuleNielsen(const FormPatches& form);

// Reflectance (36 bands) of coverages c, m, y, k in percent, each in [0, 100].
void predictYuleNielsen(const YuleNielsenFit& fit, const double cmyk[kInks], double* spectrum);

} // namespace models
} // namespace veltmarquist

#endif // VELTMARQUIST_MODELS_YULENIELSEN_H
