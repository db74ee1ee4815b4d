// The ICC output profile file: the tables and the tags around them, written
// with LittleCMS.
//
// Tags: A2B0 (A2B1 and A2B2 linked to it), B2A0 (B2A1 and B2A2 linked), gamt,
// wtpt (the paper), desc, cprt, targ (the measured form as CGATS text) and
// the profile ID. Version 2.4 writes lut16Type tables with the version 2
// CIELAB encoding, version 4.3 lutAToBType / lutBToAType with version 4's.
#ifndef VELTMARQUIST_PROFILE_ICCPROFILE_H
#define VELTMARQUIST_PROFILE_ICCPROFILE_H

#include "ForwardTable.h"
#include "Separation.h"

#include <ctime>
#include <optional>
#include <string>

namespace veltmarquist::profile {

struct ProfileTexts {
    std::string description;
    std::string copyright;
    std::string characterisation; // the targ tag: measurement data as CGATS text
};

// The profile's bytes. `created` replaces the clock in the header's date.
std::string iccProfileBytes(const ForwardTable& a2b, const SeparationTable& b2a, const ProfileTexts& texts,
                            std::optional<std::time_t> created);

} // namespace veltmarquist::profile

#endif // VELTMARQUIST_PROFILE_ICCPROFILE_H
