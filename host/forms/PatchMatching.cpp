// Patch matching by device values.
#include "PatchMatching.h"

#include "DecimalValues.h"
#include "Failure.h"
#include "Numbers.h"

#include "models/PrintModels.h"

#include <algorithm>
#include <cmath>

namespace veltmarquist {

namespace {

std::string plural(const std::string& noun)
{
    return noun + (noun.size() > 2 && noun.compare(noun.size() - 2, 2, "ch") == 0 ? "es" : "s");
}

// "test-form patch 18 (C 0 M 90 Y 0 K 0) is missing", or all of them in one
// line: "3 test-form patches are missing: 18 (...), 19 (...), 20 (...)"; the
// first twelve are named.
std::string missingPatches(const std::vector<const PatchRequest*>& missing)
{
    if (missing.size() == 1)
        return missing[0]->kind + " " + missing[0]->label + " is missing";
    const bool oneKind = std::all_of(missing.begin(), missing.end(),
                                     [&](const PatchRequest* request) { return request->kind == missing[0]->kind; });
    std::string text = std::to_string(missing.size()) + " " + (oneKind ? plural(missing[0]->kind) : "patches") +
                       " are missing: ";
    for (size_t i = 0; i < missing.size() && i < 12; ++i)
        text += (i == 0 ? "" : ", ") + (oneKind ? "" : missing[i]->kind + " ") + missing[i]->label;
    return missing.size() > 12 ? text + ", ... (" + std::to_string(missing.size() - 12) + " more)" : text;
}

} // namespace

std::vector<PatchRequest> testFormRequests()
{
    std::vector<PatchRequest> requests;
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch) {
        const Cmyk coverage = MeasuredForm::coverageOf(patch);
        std::vector<double> device(coverage.begin(), coverage.end());
        const std::string label = std::to_string(patch + 1) + " (" + describeDevice(device) + ")";
        requests.push_back({std::move(device), "test-form patch", label});
    }
    return requests;
}

std::vector<PatchRequest> multiChannelRequests(int inks)
{
    auto solid = [inks](int channel) {
        std::vector<double> device(static_cast<size_t>(inks), 0.0);
        if (channel >= 0)
            device[static_cast<size_t>(channel)] = 100.0;
        return device;
    };
    static const char* const names[] = {"cyan", "magenta", "yellow", "black"};
    std::vector<PatchRequest> requests;
    for (int channel = 0; channel < 4; ++channel)
        requests.push_back({solid(channel), "solid", std::string(names[channel]) + " (" + describeDevice(solid(channel)) + ")"});
    for (int place = 0; place < 4; ++place) // the paper, and three places the processes do not read
        requests.push_back({solid(-1), "paper", "(all channels 0)"});
    for (int channel = 4; channel < inks; ++channel)
        requests.push_back({solid(channel), "solid", "of ink " + std::to_string(channel + 1) + " (" +
                                                         describeDevice(solid(channel)) + ")"});
    return requests;
}

std::string describeDevice(const std::vector<double>& device)
{
    static const char* const names[] = {"C", "M", "Y", "K"};
    std::string text;
    for (size_t channel = 0; channel < device.size(); ++channel) {
        if (channel >= 4 && device[channel] == 0.0)
            continue;
        if (!text.empty())
            text += ' ';
        text += channel < 4 ? names[channel] : "ink" + std::to_string(channel + 1);
        text += ' ' + shortText(device[channel]);
    }
    return text;
}

// ---- Matching ------------------------------------------------------------------------------------

std::size_t CombinationIndex::KeyHash::operator()(const Key& key) const
{
    std::uint64_t hash = 0;
    for (std::int32_t value : key)
        hash = (hash ^ static_cast<std::uint32_t>(value)) * 0x9E3779B97F4A7C15ull;
    return static_cast<std::size_t>(hash ^ (hash >> 32));
}

CombinationIndex::CombinationIndex(const MeasurementFile& file)
{
    // Each set's group, then the groups laid out one after the other.
    std::vector<std::uint32_t> groupOf(file.sets.size());
    std::vector<std::size_t> counts;
    groups_.reserve(file.sets.size() / 2 + 16);
    for (size_t i = 0; i < file.sets.size(); ++i) {
        const auto [at, added] = groups_.try_emplace(keyOf(file.sets[i]), static_cast<std::uint32_t>(counts.size()));
        if (added)
            counts.push_back(0);
        groupOf[i] = at->second;
        ++counts[at->second];
    }
    first_.assign(counts.size() + 1, 0);
    for (size_t g = 0; g < counts.size(); ++g)
        first_[g + 1] = first_[g] + counts[g];
    std::vector<std::size_t> next(first_.begin(), first_.end() - 1);
    members_.resize(file.sets.size());
    for (size_t i = 0; i < file.sets.size(); ++i)
        members_[next[groupOf[i]]++] = i;
}

CombinationIndex::Key CombinationIndex::keyOf(const std::vector<double>& device)
{
    Key key{};
    for (size_t channel = 0; channel < device.size() && channel < kMaxChannels; ++channel)
    {
        const double tenths = std::round(device[channel] * 10.0);
        key[channel] = std::isfinite(tenths) ? static_cast<std::int32_t>(std::clamp(tenths, -2e9, 2e9)) : INT32_MIN;
    }
    return key;
}

CombinationIndex::Key CombinationIndex::keyOf(const Cmyk& cmyk)
{
    return keyOf(std::vector<double>(cmyk.begin(), cmyk.end()));
}

CombinationIndex::Key CombinationIndex::keyOf(const MeasurementSet& set)
{
    Key key{};
    for (size_t channel = 0; channel < set.device.size() && channel < kMaxChannels; ++channel)
        key[channel] = static_cast<std::int32_t>(divideRounded(set.device[channel], kDeviceUnits / 10));
    return key;
}

SetList CombinationIndex::find(const std::vector<double>& device) const
{
    const auto found = groups_.find(keyOf(device));
    if (found == groups_.end())
        return {};
    return {members_.data() + first_[found->second], first_[found->second + 1] - first_[found->second]};
}

PickedPatches pickPatches(const MeasurementFile& file, const std::vector<PatchRequest>& requests,
                          const std::string& fileName)
{
    if (!file.layout.present())
        throw HostError(Failure::InputContent, fileName + ": no spectral fields (SPECTRAL_NM380, SPEC_380 or nm380 ...); " +
                                                   file.describeFields());
    if (file.deviceFields.empty())
        throw HostError(Failure::InputContent, fileName + ": no device fields (CMYK_C ... CMYK_K or nCLR_1 ... nCLR_n); " +
                                                   file.describeFields());
    const CombinationIndex index(file);
    PickedPatches picked;
    std::vector<bool> used(file.sets.size(), false);
    std::vector<const PatchRequest*> missing;
    for (const PatchRequest& request : requests) {
        const SetList sets = index.find(request.device);
        if (sets.empty()) {
            const bool listed = std::any_of(missing.begin(), missing.end(), [&](const PatchRequest* other) {
                return other->kind == request.kind && other->label == request.label;
            });
            if (!listed)
                missing.push_back(&request);
            continue;
        }
        picked.thousandths.push_back(averageThousandths(file, sets.begin(), sets.size()));
        picked.averaged += sets.size() > 1 ? 1 : 0;
        for (size_t set : sets)
            used[set] = true;
    }
    if (!missing.empty())
        throw HostError(Failure::MissingPatch, fileName + ": " + missingPatches(missing));
    picked.setsUsed = static_cast<size_t>(std::count(used.begin(), used.end(), true));
    picked.setsIgnored = file.sets.size() - picked.setsUsed;
    return picked;
}

} // namespace veltmarquist
