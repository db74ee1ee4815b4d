// How much black a separation puts into a colour: the black target that the
// profile's separation tables (B2A) follow.
//
// The target rises with darkness and fades with chroma:
//     t = clamp((100 - L*) / (100 - L*_min), 0, 1)           how dark, 0 paper .. 1 darkest neutral
//     s = clamp((t - start) / (1 - start), 0, 1)            past the start of black
//     K = black limit * amount * s^shape * exp(-(C* / width)^2)
// with L*_min the darkest neutral the press reaches within the limits. A
// smooth ramp, never "as little black as possible": the least black jumps
// between CMY and K branches from one colour to the next, which the tables
// would show as steps.
#ifndef VELTMARQUIST_PROFILE_BLACKGENERATION_H
#define VELTMARQUIST_PROFILE_BLACKGENERATION_H

#include <optional>
#include <string>
#include <string_view>

namespace veltmarquist::profile {

struct BlackGeneration {
    std::string name = "heavy";  // the preset, or "custom, from" the preset
    double start = 0.15;         // share of the lightness range, from paper down, before black begins
    double amount = 1.0;         // black at the darkest neutral, as a share of the black limit
    double shape = 1.0;          // > 0; 1 is linear, more holds black back in the mid-tones
    double width = 50.0;         // C* over which black fades away from neutral
    // Hold K at the target exactly (the solver moves C, M, Y only) instead
    // of trading it against the colour: fixed black, as under-colour removal.
    bool fixed = false;

    // K (fraction 0..1) for a colour of lightness L* and chroma C*.
    double target(double L, double C, double darkestL, double blackLimit) const;
};

// The presets: none, light, medium, heavy (the default), maximum and ucr
// (black only in the darkest neutrals, held fixed); nothing for another
// name. Heavy is the default: black that reaches its limit at the darkest
// neutral keeps the dark colours' C, M and Y away from their bounds, where
// separations bend sharply, so that a table's interpolation between nodes
// stays accurate (on a real offset sheet the round trip A2B > B2A > A2B
// comes out near 0.24 mean CIEDE2000 with heavy, 0.31 with medium).
std::optional<BlackGeneration> blackGenerationNamed(std::string_view name);
// "none, light, medium, heavy, maximum, ucr": for messages and help texts.
const char* blackGenerationNames();

} // namespace veltmarquist::profile

#endif // VELTMARQUIST_PROFILE_BLACKGENERATION_H
