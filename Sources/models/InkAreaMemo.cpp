// Effective dot areas remembered by their exact arguments.
#include "InkAreaMemo.h"

#include "FourColourKernels.h"

#include <cstring>

namespace veltmarquist {
namespace models {

namespace {

// A multiply-xor hash of the exponent and five bands spread over the
// spectrum: equal bits, equal hash; the full arguments are compared on a hit.
std::uint64_t hashOf(const double* dot, double exponent)
{
    auto mix = [](std::uint64_t hash, double value) {
        std::uint64_t word;
        std::memcpy(&word, &value, sizeof word);
        hash = (hash ^ word) * 0x9E3779B97F4A7C15ull;
        return hash ^ (hash >> 29);
    };
    std::uint64_t hash = mix(0, exponent);
    for (int j = 3; j < kBands; j += 8)
        hash = mix(hash, dot[j]);
    return hash;
}

} // namespace

const double* InkAreaMemo::areas(const double* dot, double exponent)
{
    const std::uint64_t hash = hashOf(dot, exponent);
    const auto [first, last] = byHash_.equal_range(hash);
    for (auto it = first; it != last; ++it) {
        const Row& row = *it->second;
        if (std::memcmp(&row.exponent, &exponent, sizeof exponent) == 0 &&
            std::memcmp(row.dot, dot, sizeof row.dot) == 0)
            return row.area;
    }
    Row& row = rows_.emplace_back();
    row.exponent = exponent;
    std::memcpy(row.dot, dot, sizeof row.dot);
    inkAreas(dot, exponent, row.area);
    byHash_.emplace(hash, &row);
    return row.area;
}

} // namespace models
} // namespace veltmarquist
