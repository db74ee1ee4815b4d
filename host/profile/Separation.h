// The PCS-to-device tables of an output profile (its B2A tags): for every
// CIELAB node, the C, M, Y, K that reproduce it under the profile's own A2B
// table, within the press's ink limits and with the chosen black generation.
//
// Each node is a small bounded least-squares problem,
//     minimise  |Lab(x) - Lab_node|^2 + 4 (x_K - K_target)^2
//     over      0 <= C, M, Y <= 1,  0 <= K <= black limit,  C + M + Y + K <= ink limit
// with Lab(x) the A2B table as a CMM interpolates it (so that the two tables
// agree), Lab in dE*ab units and K as a fraction: the black target only
// decides between separations that print the same colour. A colour outside
// the press's gamut gets the reproducible colour nearest to it in dE*ab
// (the black target as tie-breaker); perceptual rendering uses the same
// table. Nodes are solved from white to black and from neutral outward,
// each started from its solved neighbours, so that neighbouring nodes take
// neighbouring separations; along the neutral axis K never falls as L*
// falls.
//
// The Lab axes have input curves that put nodes exactly on L* = 100 (the
// paper) and on a* = b* = 0 (the neutral axis), with the a* and b* nodes
// closer together near neutral, where a press's colours lie. The paper's
// node and its neighbours on L* = 100 get no ink, so that paper white
// separates into no ink even in a CMM that resamples the table on a grid of
// its own. Every node's ink is rounded
// to 16 bits so that the rounded values hold both limits, with room for a
// CMM's rounding of interpolated channels: since tables interpolate their
// nodes convexly, limits held at every node hold everywhere.
#ifndef VELTMARQUIST_PROFILE_SEPARATION_H
#define VELTMARQUIST_PROFILE_SEPARATION_H

#include "BlackGeneration.h"
#include "ForwardTable.h"

#include <array>
#include <cstdint>
#include <functional>
#include <vector>

namespace veltmarquist::profile {

struct InkLimits {
    double total = 3.0;  // C + M + Y + K, as fractions (3.0 is 300 %)
    double black = 0.95; // K

    // The limits as the 16-bit codes of a table: the largest code sum and
    // K code whose values do not pass them, the sum with kRoundingRoom to spare.
    int totalCode() const;
    int blackCode() const;
};
// lambda of the objective: (K - target as a fraction)^2 against dE*ab^2.
constexpr double kSeparationBlackWeight = 4.0;
// mu: (ink - the neighbours' ink, as fractions)^2 per ink against dE*ab^2.
// It keeps a node on its neighbours' way of printing a colour where two
// ways fit the target about equally, so that interpolating between nodes
// never crosses from one to the other; in gamut it moves the colour by
// less than 0.01 dE*ab.
constexpr double kSeparationNeighbourWeight = 8.0;

// Codes a node's ink sum keeps below the limit: a 16-bit CMM rounds each
// interpolated channel (twice, in a 4-input table), which can add up to
// half a code per channel and step.
constexpr int kRoundingRoom = 4;

struct SeparationTable {
    int nodes = 33;                               // per Lab axis
    std::vector<std::uint16_t> entries;           // C, M, Y, K per node; L* slowest, b* fastest
    std::vector<std::uint16_t> gamut;             // per node: 0 reproduced, 65535 out of gamut
    std::array<std::vector<std::uint16_t>, 3> curves; // the input curves of L*, a*, b* (4096 entries)
    double darkestL = 0.0;                        // L* of the darkest neutral within the limits
    std::size_t outOfGamut = 0;                   // nodes whose colour is more than 1 dE*ab away
};

// The CIELAB that the CMM maps onto node `index` (0..nodes-1) of axis `channel`.
double nodeLab(int channel, int index, int nodes, const LabEncoding& encoding);

// Separates every node. `progress` (may be empty) hears the share done, 0..1.
SeparationTable separate(const ForwardTable& a2b, const InkLimits& limits, const BlackGeneration& black, int nodes,
                         const std::function<void(double)>& progress = {});

// A separation's 16-bit codes within the limits (InkLimits::totalCode and
// blackCode): each ink rounded, any excess taken back from the inks that
// rounded up most.
std::array<std::uint16_t, 4> inkCodes(const std::array<double, 4>& ink, const InkLimits& limits);

// The separation of one colour under the table: the solver every node runs,
// from `start` (fractions). Returns C, M, Y, K (fractions) and the colour's
// dE*ab from the target in `distance`. With `neighbours` (the mean of the
// neighbouring nodes' separations) the solver also stays near them, with
// weight kSeparationNeighbourWeight.
std::array<double, 4> separateColour(const ForwardTable& a2b, const InkLimits& limits, const Triple& lab,
                                     double blackTarget, bool fixedBlack, const std::array<double, 4>& start,
                                     double& distance, double lowestBlack = 0.0,
                                     const std::array<double, 4>* neighbours = nullptr);

} // namespace veltmarquist::profile

#endif // VELTMARQUIST_PROFILE_SEPARATION_H
