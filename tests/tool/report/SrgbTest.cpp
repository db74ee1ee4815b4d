// D50 colours on screen: white stays white, greys stay neutral through the
// adaptation, and what sRGB cannot show is clipped and says so.
#include "report/Srgb.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltmarquist;

TEST(Srgb, AdaptsD50ToTheScreenAndMarksWhatItClips)
{
    const double nan = std::nan("");
    const struct {
        const char* what;
        Triple XYZ;
        const char* hex;
        bool clipped;
    } cases[] = {
        {"ICC D50 white", {96.42, 100.0, 82.49}, "#ffffff", false},
        {"black", {0.0, 0.0, 0.0}, "#000000", false},
        {"L* 50 neutral grey", {17.81, 18.42, 15.19}, "#777777", false},
        {"a saturated green beyond sRGB", {15.0, 40.0, 5.0}, "#00cf00", true},
        {"brighter than white", {110.0, 115.0, 95.0}, "#ffffff", true},
        {"not a number", {nan, 50.0, 40.0}, "#000000", true},
    };
    for (const auto& colour : cases) {
        SCOPED_TRACE(colour.what);
        const DisplayColour shown = srgbOfXYZ(colour.XYZ);
        EXPECT_EQ(shown.hex(), colour.hex);
        EXPECT_EQ(shown.clipped, colour.clipped);
    }
}
