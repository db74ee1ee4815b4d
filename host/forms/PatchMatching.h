// Picking the patches a calculation needs out of a measurement file by their
// device values.
//
// A measured test form and a full characterisation measurement both work: a
// patch is found by its C, M, Y, K (and further channel) values wherever it
// stands in the file; repeated measurements of one combination are averaged;
// everything else in the file is ignored.
#ifndef VELTMARQUIST_FORMS_PATCHMATCHING_H
#define VELTMARQUIST_FORMS_PATCHMATCHING_H

#include "MeasurementFile.h"

#include <map>
#include <string>
#include <vector>

namespace veltmarquist {

// A patch that a calculation needs: its device values in percent (channels in
// file order: C, M, Y, K, then further inks; missing channels count as 0).
struct PatchRequest {
    std::vector<double> device;
    std::string kind;  // "test-form patch"; requests of one kind are listed together
    std::string label; // "18 (C 0 M 90 Y 0 K 0)"
};

// The 46 patches of the four-colour test form, in measuring order.
std::vector<PatchRequest> testFormRequests();
// The patches of the six- or seven-ink form in the order the multi-channel
// processes read them: C, M, Y, K solids, paper, three unused places (filled
// with the paper), then the solids of the further inks.
std::vector<PatchRequest> multiChannelRequests(int inks);
// "C 0 M 90 Y 0 K 0" or, beyond four channels, "ink5 100".
std::string describeDevice(const std::vector<double>& device);

// The sets of a file grouped by device values (to 0.1 %).
class CombinationIndex {
public:
    explicit CombinationIndex(const MeasurementFile& file);
    // Indices of the sets measured with these device values (percent); empty if none.
    const std::vector<size_t>& find(const std::vector<double>& device) const;
    size_t combinations() const { return sets_.size(); }

    using Key = std::vector<long>;
    static Key keyOf(const std::vector<double>& device);
    static Key keyOf(const MeasurementSet& set);

private:
    std::map<Key, std::vector<size_t>> sets_;
};

struct PickedPatches {
    std::vector<std::vector<int>> thousandths;    // one averaged spectrum per request
    size_t averaged = 0;                          // requests with more than one measurement
    size_t setsUsed = 0;                          // sets of the file that went into them
    size_t setsIgnored = 0;                       // sets of the file that no request uses
};

// Finds every request in the file. Requests that are not there are one
// MissingPatch error naming the file and every missing patch.
PickedPatches pickPatches(const MeasurementFile& file, const std::vector<PatchRequest>& requests,
                          const std::string& fileName);

} // namespace veltmarquist

#endif // VELTMARQUIST_FORMS_PATCHMATCHING_H
