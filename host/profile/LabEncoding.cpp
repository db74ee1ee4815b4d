// The ICC versions' CIELAB encodings.
#include "LabEncoding.h"

#include <algorithm>
#include <cmath>

namespace veltmarquist::profile {

std::uint16_t LabEncoding::encode(int channel, double value) const
{
    const double code = channel == 0 ? value * lightnessScale() : (value + 128.0) * chromaScale();
    return static_cast<std::uint16_t>(std::lround(std::clamp(code, 0.0, 65535.0)));
}

double LabEncoding::decode(int channel, double code) const
{
    return channel == 0 ? code / lightnessScale() : code / chromaScale() - 128.0;
}

} // namespace veltmarquist::profile
