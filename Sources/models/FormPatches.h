// The patches of the four-colour test form as the spectral models read them:
// the sixteen Neugebauer primaries, the seven tints of each ink and the two
// greys. Internal to the library.
#ifndef VELTMARQUIST_MODELS_FORMPATCHES_H
#define VELTMARQUIST_MODELS_FORMPATCHES_H

#include <array>
#include <memory>

namespace veltmarquist {
namespace models {

constexpr int kBands = 36; // 380, 390, ..., 730 nm
using Bands = std::array<double, kBands>;

// Inks in channel order; bit i of a primary's index is set when ink i prints solid.
enum Ink { kCyan = 0, kMagenta = 1, kYellow = 2, kBlack = 3 };
constexpr int kInks = 4;
constexpr int kPrimaries = 16;

// The tint levels of each ink on the form, in percent.
constexpr int kTintLevels = 7;
constexpr std::array<double, kTintLevels> kTintLevelPercent = {10, 20, 40, 60, 70, 80, 90};

struct FormPatches {
    std::array<Bands, kPrimaries> primary;           // primary[0] paper, [1] cyan, [3] cyan + magenta, [15] all four
    std::array<std::array<Bands, kTintLevels>, kInks> tint; // tint[i][t]: ink i alone at kTintLevelPercent[t]
    Bands grey3;                                     // C 40 M 40 Y 40
    Bands grey4;                                     // C 40 M 40 Y 40 K 40

    const Bands& paper() const { return primary[0]; }
    const Bands& solid(int ink) const { return primary[1u << ink]; }
};

// The patches of a form given as 46 rows of 36 bands in measuring order (the
// order of MathProfile::dithering), each placed by its coverages. The rows are
// taken as they are: no orientation check.
FormPatches formPatchesFromRows(const double* const* rows);

} // namespace models

class PrintModel;
// A fitted model as a fit hands it over: checked on the 46 coverages of the
// form it was fitted to (std::domain_error when one is no colour).
std::unique_ptr<PrintModel> checkedOnForm(std::unique_ptr<PrintModel> model);
} // namespace veltmarquist

#endif // VELTMARQUIST_MODELS_FORMPATCHES_H
