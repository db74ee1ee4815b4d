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

// Reflectances at or below this (zero, negative, not finite) are raised to it
// before the model takes their roots.
constexpr double kReflectanceFloor = 1e-4;
constexpr double kMinN = 1.0, kMaxN = 10.0; // bounds of the Yule-Nielsen n
constexpr double kMaxSpreading = 0.3;       // bound of |s_i|

// Everything a prediction needs, and what the fit found out about the form.
// A value: copyable, immutable once fitted, safe to read from many threads.
struct YuleNielsenFit {
    Bands n{};                         // Yule-Nielsen n per band, in [1, 10]
    // Dot-area curve of each ink: nodes at 0, the seven tint levels and 100 %
    // (non-decreasing, in [0, 1]) and their Fritsch-Carlson slopes.
    std::array<std::array<double, kTintLevels + 2>, kInks> curveArea{};
    std::array<std::array<double, kTintLevels + 2>, kInks> curveSlope{};
    std::array<double, kInks> spreading{}; // s_i, |s_i| <= 0.3
    std::array<Bands, kPrimaries> primary{};     // the primaries as measured (floored), returned as they are
    std::array<Bands, kPrimaries> primaryRoot{}; // P_b^(1/n) per band

    // Quality of the fit.
    double startN = 0.0;               // the best single n of the scan the fit of n(lambda) started from
    double tintResidualRms = 0.0;      // RMS reflectance residual over the 28 tints' bands
    std::array<double, 2> greyDeltaE{}; // CIE 1976 dE*ab of the three- and four-colour grey after the fit
    std::vector<std::string> warnings; // for example a factor at its bound or a large grey residual
};

// Fits n(lambda), the dot-area curves and the spreading factors. Deterministic.
YuleNielsenFit fitYuleNielsen(const FormPatches& form);

// A model from given parameters: primaries (floored here), n per band, the
// dot area of each ink's seven tints (clamped to [0, 1] and levelled to be
// non-decreasing, with a warning) and the spreading factors. The fit ends
// with this; it also rebuilds a model from stored parameters. The quality
// fields stay zero.
YuleNielsenFit yuleNielsenModel(const std::array<Bands, kPrimaries>& primaries, const Bands& n,
                                const std::array<std::array<double, kTintLevels>, kInks>& tintArea,
                                const std::array<double, kInks>& spreading);

// Reflectance (36 bands) of coverages c, m, y, k in percent, each in [0, 100]
// (values outside are clamped, NaN counts as 0). A pure function of the fit.
void predictYuleNielsen(const YuleNielsenFit& fit, const double cmyk[kInks], double* spectrum);

} // namespace models
} // namespace veltmarquist

#endif // VELTMARQUIST_MODELS_YULENIELSEN_H
