// An ICC output profile of a press from its measured test form, in one call:
// the fitted model's A2B table, the separation tables inverted from it within
// the ink limits and with the chosen black generation, and the file.
//
//     ProfileOptions options;                      // 300 % total, 95 % black, heavy black generation
//     ProfileSummary summary;
//     std::string icc = printProfile(fit, form, options, summary);
//
// The tool's profile command and the Python package both call it, so the
// same form, model and options give the same bytes.
#ifndef VELTMARQUIST_PROFILE_PRINTPROFILE_H
#define VELTMARQUIST_PROFILE_PRINTPROFILE_H

#include "BlackGeneration.h"
#include "FourColourForm.h"
#include "LabEncoding.h"

#include <cstddef>
#include <ctime>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace veltmarquist::profile {

struct ProfileOptions {
    double inkLimit = 300.0;   // total area coverage, percent: 100 to 400
    double blackLimit = 95.0;  // the most K, percent: 0 to 100, at most the ink limit
    BlackGeneration black;     // heavy
    std::optional<int> a2bNodes; // per ink; default 17, or the levels of a model bound to them
    int b2aNodes = 33;         // per Lab axis, odd (a node on the neutral axis): 9 to 65
    IccVersion version = IccVersion::v2;
    std::string description;   // empty: the form's DESCRIPTOR (else its file name) and the model
    std::string copyright;     // empty: a line saying who made it with what
    std::optional<std::time_t> created; // the header's date; empty: SOURCE_DATE_EPOCH, else now
};

// Refuses options no press or profile can have (Failure::Usage), naming the
// option as front ends call it: "ink limit", "black limit", "A2B grid".
// Without a model, all but what the model decides (an A2B grid off the
// levels of a model bound to them): front ends check before they read.
void checkProfileOptions(const ProfileOptions& options, const PrintModel* model = nullptr);

struct ProfileSummary {
    std::vector<double> a2bLevels; // per ink, percent
    int b2aNodes = 0;
    std::size_t b2aCount = 0, outOfGamut = 0; // B2A nodes, and those more than 1 dE*ab away
    double darkestL = 0.0;         // the darkest neutral within the limits
    std::string description;
    std::size_t bytes = 0;
};

// The profile's bytes. `progress` (may be empty) hears each step's name and
// the share of the whole done.
std::string printProfile(const FittedModel& fit, const FoundForm& form, const ProfileOptions& options,
                         ProfileSummary& summary,
                         const std::function<void(const char* step, double done)>& progress = {});

} // namespace veltmarquist::profile

#endif // VELTMARQUIST_PROFILE_PRINTPROFILE_H
