// Colours on screen: CIE X, Y, Z (D50) as sRGB.
//
// The measurements and predictions are D50 colours; sRGB is defined for a
// D65 white. X, Y, Z are adapted from the ICC D50 white to D65 with the
// Bradford transform, converted to linear sRGB (IEC 61966-2-1) and encoded
// with the sRGB curve. The colours are absolute: a paper with Y = 88 shows a
// little darker than the white of the page. A colour outside the sRGB gamut
// is clipped channel by channel, and says so, so that the report can mark it.
#ifndef VELTMARQUIST_TOOL_SRGB_H
#define VELTMARQUIST_TOOL_SRGB_H

#include "models/PrintModels.h"

#include <array>
#include <string>

namespace veltmarquist {

struct DisplayColour {
    std::array<int, 3> rgb{}; // 0..255
    bool clipped = false;     // a channel lay outside 0..255 before clipping
    std::string hex() const;  // "#rrggbb"
    double luminance() const; // relative luminance 0..1 of the clipped colour
};

// X, Y, Z (D50, 0..100) as sRGB.
DisplayColour srgbOfXYZ(const Triple& XYZ);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_SRGB_H
