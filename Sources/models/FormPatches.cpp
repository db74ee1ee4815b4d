// Placing the 46 measured patches of the test form by their coverages.
#include "FormPatches.h"

#include "MathProfile.h"

#include <algorithm>
#include <stdexcept>

namespace veltmarquist {
namespace models {

FormPatches formPatchesFromRows(const double* const* rows)
{
    FormPatches form{};
    // Every place must be filled exactly once; the layout table guarantees it.
    std::array<int, kPrimaries + kInks * kTintLevels + 2> filled{};
    for (int patch = 0; patch < 46; ++patch) {
        const unsigned char* cmyk = MathProfile::dithering[patch];
        Bands bands;
        std::copy(rows[patch], rows[patch] + kBands, bands.begin());
        int solids = 0, printed = 0, tinted = -1;
        for (int ink = 0; ink < kInks; ++ink) {
            if (cmyk[ink] == 0)
                continue;
            ++printed;
            if (cmyk[ink] == 100)
                solids |= 1 << ink;
            else
                tinted = ink;
        }
        if (printed == 3 && tinted >= 0) {
            form.grey3 = bands; // C 40 M 40 Y 40
            ++filled[kPrimaries + kInks * kTintLevels];
        } else if (printed == 4 && tinted >= 0) {
            form.grey4 = bands; // C 40 M 40 Y 40 K 40
            ++filled[kPrimaries + kInks * kTintLevels + 1];
        } else if (tinted >= 0) {
            const auto level = std::find(kTintLevelPercent.begin(), kTintLevelPercent.end(), cmyk[tinted]);
            const int t = static_cast<int>(level - kTintLevelPercent.begin());
            form.tint[static_cast<size_t>(tinted)][static_cast<size_t>(t)] = bands;
            ++filled[static_cast<size_t>(kPrimaries + tinted * kTintLevels + t)];
        } else {
            form.primary[static_cast<size_t>(solids)] = bands;
            ++filled[static_cast<size_t>(solids)];
        }
    }
    if (std::any_of(filled.begin(), filled.end(), [](int count) { return count != 1; }))
        throw std::logic_error("the test-form layout does not fill every model patch once");
    return form;
}

} // namespace models
} // namespace veltmarquist
