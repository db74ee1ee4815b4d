// CIELAB as an ICC profile's 16-bit tables hold it.
//
// The two ICC versions encode the PCS differently, and a CMM reads each
// table in its profile's encoding:
//     version 2 (lut16Type):   L* = v / 652.8   (0xFF00 is 100),  a*, b* = v / 256 - 128
//     version 4 (lutAToBType): L* = v / 655.35  (0xFFFF is 100),  a*, b* = v / 257 - 128
// so a* = b* = 0 is 0x8000 in version 2 and 0x8080 in version 4.
#ifndef VELTMARQUIST_PROFILE_LABENCODING_H
#define VELTMARQUIST_PROFILE_LABENCODING_H

#include <cstdint>

namespace veltmarquist::profile {

enum class IccVersion { v2, v4 };

struct LabEncoding {
    IccVersion version = IccVersion::v2;

    double lightnessScale() const { return version == IccVersion::v2 ? 652.8 : 655.35; }
    double chromaScale() const { return version == IccVersion::v2 ? 256.0 : 257.0; }

    // One channel (0 L*, 1 a*, 2 b*) to its 16-bit code, rounded and clipped.
    std::uint16_t encode(int channel, double value) const;
    double decode(int channel, double code) const;
};

} // namespace veltmarquist::profile

#endif // VELTMARQUIST_PROFILE_LABENCODING_H
