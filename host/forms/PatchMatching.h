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
#include "models/PrintModels.h"

#include <array>
#include <cstdint>
#include <unordered_map>
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

// Indices of the sets measured with one combination, in file order: a view
// into the index that made it.
class SetList {
public:
    SetList() = default;
    SetList(const std::size_t* first, std::size_t count) : first_(first), count_(count) {}
    bool empty() const { return count_ == 0; }
    std::size_t size() const { return count_; }
    std::size_t operator[](std::size_t i) const { return first_[i]; }
    const std::size_t* begin() const { return first_; }
    const std::size_t* end() const { return first_ + count_; }

private:
    const std::size_t* first_ = nullptr;
    std::size_t count_ = 0;
};

// The sets of a file grouped by device values (to 0.1 %). A combination is a
// flat key of whole tenths of a percent, one per channel, so building the
// index allocates nothing per set: one hash entry per combination and one
// array of set indices grouped by combination.
class CombinationIndex {
public:
    static constexpr std::size_t kMaxChannels = 16;
    using Key = std::array<std::int32_t, kMaxChannels>;

    explicit CombinationIndex(const MeasurementFile& file);
    // The sets measured with these device values (percent); empty if none.
    SetList find(const std::vector<double>& device) const;
    size_t combinations() const { return first_.size() - 1; }

    // Device vectors of different lengths compare as if padded with zeros, so
    // a C, M, Y, K request finds a seven-channel set whose further inks are 0.
    static Key keyOf(const std::vector<double>& device);
    static Key keyOf(const MeasurementSet& set);
    static Key keyOf(const Cmyk& cmyk);

private:
    struct KeyHash {
        std::size_t operator()(const Key& key) const;
    };
    std::unordered_map<Key, std::uint32_t, KeyHash> groups_; // combination -> group number
    std::vector<std::size_t> members_;                       // set indices, group by group, in file order
    std::vector<std::size_t> first_;                         // group g: members_[first_[g] .. first_[g + 1])
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
