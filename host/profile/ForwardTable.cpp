// The A2B table: sampled from the model, encoded, and interpolated as a CMM does.
#include "ForwardTable.h"

#include "ColourDifference.h"

#include <algorithm>
#include <cmath>
#include <numeric>
#include <stdexcept>

namespace veltmarquist::profile {

Triple relativeLab(const Triple& XYZ, const Triple& paper)
{
    static const double white[3] = {96.42, 100.0, 82.49}; // D50, the PCS white
    const Lab lab = labOfXYZ({XYZ[0] * white[0] / paper[0], XYZ[1] * white[1] / paper[1], XYZ[2] * white[2] / paper[2]});
    return {lab.L, lab.a, lab.b};
}

ForwardTable::ForwardTable(const PrintModel& model, std::vector<double> levels, LabEncoding encoding)
    : encoding_(encoding)
{
    const int n = static_cast<int>(levels.size());
    if (n < 2 || levels.front() != 0.0 || levels.back() != 100.0 ||
        std::adjacent_find(levels.begin(), levels.end(), std::greater_equal<double>()) != levels.end())
        throw std::invalid_argument("the grid's levels rise from 0 to 100 %");
    for (int i = 0; i < n; ++i) {
        levels_.push_back(levels[static_cast<size_t>(i)] / 100.0);
        even_ = even_ && std::fabs(levels_.back() - static_cast<double>(i) / (n - 1)) < 1e-12;
    }
    const size_t count = static_cast<size_t>(n) * n * n * n;
    std::vector<double> cmyk;
    cmyk.reserve(4 * count);
    for (int c = 0; c < n; ++c)
        for (int m = 0; m < n; ++m)
            for (int y = 0; y < n; ++y)
                for (int k = 0; k < n; ++k)
                    for (int ink : {c, m, y, k})
                        cmyk.push_back(levels[static_cast<size_t>(ink)]);
    std::vector<double> XYZ(3 * count);
    model.predict(count, cmyk.data(), nullptr, XYZ.data(), nullptr);
    paper_ = {XYZ[0], XYZ[1], XYZ[2]}; // node 0: no ink
    entries_.resize(3 * count);
    decoded_.resize(3 * count);
    for (size_t node = 0; node < count; ++node) {
        const Triple lab = relativeLab({XYZ[3 * node], XYZ[3 * node + 1], XYZ[3 * node + 2]}, paper_);
        for (int channel = 0; channel < 3; ++channel) {
            const std::uint16_t code = encoding_.encode(channel, lab[static_cast<size_t>(channel)]);
            entries_[3 * node + static_cast<size_t>(channel)] = code;
            decoded_[3 * node + static_cast<size_t>(channel)] = encoding_.decode(channel, code);
        }
    }
}

double ForwardTable::gridPosition(double device) const
{
    const double d = std::clamp(device, 0.0, 1.0);
    const int n = nodes();
    if (even_)
        return d;
    const int segment = std::min<int>(
        n - 2, static_cast<int>(std::upper_bound(levels_.begin(), levels_.end(), d) - levels_.begin()) - 1);
    const double low = levels_[static_cast<size_t>(segment)], high = levels_[static_cast<size_t>(segment) + 1];
    return (segment + (d - low) / (high - low)) / (n - 1);
}

const double* ForwardTable::node(int c, int m, int y, int k) const
{
    const int n = nodes();
    return &decoded_[3 * static_cast<size_t>(((c * n + m) * n + y) * n + k)];
}

Triple ForwardTable::tetrahedral(int c, const int index[3], const double fraction[3],
                                 std::array<std::array<double, 3>, 3>* d) const
{
    // The corners walked from the cell's origin, one axis at a time in the
    // order of falling fractions: the value is
    //     v0 + (v1 - v0) f_first + (v2 - v1) f_second + (v3 - v2) f_third.
    int order[3] = {0, 1, 2};
    std::stable_sort(order, order + 3, [&](int a, int b) { return fraction[a] > fraction[b]; });
    int corner[3] = {index[0], index[1], index[2]};
    const double* previous = node(c, corner[0], corner[1], corner[2]);
    Triple value{previous[0], previous[1], previous[2]};
    for (int step = 0; step < 3; ++step) {
        const int axis = order[step];
        ++corner[axis];
        const double* next = node(c, corner[0], corner[1], corner[2]);
        for (int channel = 0; channel < 3; ++channel) {
            const double rise = next[channel] - previous[channel];
            value[static_cast<size_t>(channel)] += rise * fraction[axis];
            if (d != nullptr)
                (*d)[static_cast<size_t>(channel)][static_cast<size_t>(axis)] = rise;
        }
        previous = next;
    }
    return value;
}

Triple ForwardTable::lab(const double device[4], std::array<std::array<double, 4>, 3>* jacobian) const
{
    const int n = nodes();
    int index[4];
    double fraction[4], slope[4];
    for (int ink = 0; ink < 4; ++ink) {
        const double d = std::clamp(device[ink], 0.0, 1.0);
        const double position = gridPosition(d) * (n - 1);
        // The last cell holds the upper bound (fraction 1): the same value,
        // and a slope that points back into the grid.
        index[ink] = std::min(static_cast<int>(std::floor(position)), n - 2);
        fraction[ink] = position - index[ink];
        // d position / d device: each level segment spans one cell.
        slope[ink] = 1.0 / (levels_[static_cast<size_t>(index[ink]) + 1] - levels_[static_cast<size_t>(index[ink])]);
    }
    std::array<std::array<double, 3>, 3> d0{}, d1{};
    const bool want = jacobian != nullptr;
    const Triple low = tetrahedral(index[0], index + 1, fraction + 1, want ? &d0 : nullptr);
    const Triple high = tetrahedral(index[0] + 1, index + 1, fraction + 1, want ? &d1 : nullptr);
    Triple lab;
    for (size_t channel = 0; channel < 3; ++channel) {
        lab[channel] = low[channel] + (high[channel] - low[channel]) * fraction[0];
        if (!want)
            continue;
        (*jacobian)[channel][0] = (high[channel] - low[channel]) * slope[0];
        for (size_t axis = 0; axis < 3; ++axis)
            (*jacobian)[channel][axis + 1] =
                (d0[channel][axis] + (d1[channel][axis] - d0[channel][axis]) * fraction[0]) * slope[axis + 1];
    }
    return lab;
}

} // namespace veltmarquist::profile
