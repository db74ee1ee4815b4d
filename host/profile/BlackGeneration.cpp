// The black generation presets and target.
#include "BlackGeneration.h"

#include <algorithm>
#include <cmath>

namespace veltmarquist::profile {

double BlackGeneration::target(double L, double C, double darkestL, double blackLimit) const
{
    const double t = std::clamp((100.0 - L) / std::max(100.0 - darkestL, 1e-9), 0.0, 1.0);
    const double s = std::clamp((t - start) / std::max(1.0 - start, 1e-9), 0.0, 1.0);
    return blackLimit * amount * std::pow(s, shape) * std::exp(-(C / width) * (C / width));
}

std::optional<BlackGeneration> blackGenerationNamed(std::string_view name)
{
    //        name       start amount shape width  fixed
    static const BlackGeneration presets[] = {
        {"none",    1.0,  0.0,  1.0,  40.0, false},
        {"light",   0.5,  0.6,  1.5,  30.0, false},
        {"medium",  0.3,  0.85, 1.2,  40.0, false},
        {"heavy",   0.15, 1.0,  1.0,  50.0, false},
        {"maximum", 0.0,  1.0,  1.0,  60.0, false},
        {"ucr",     0.6,  1.0,  1.0,  12.0, true},
    };
    for (const BlackGeneration& preset : presets)
        if (preset.name == name)
            return preset;
    return std::nullopt;
}

const char* blackGenerationNames()
{
    return "none, light, medium, heavy, maximum, ucr";
}

} // namespace veltmarquist::profile
