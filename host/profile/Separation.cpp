// The B2A tables: every CIELAB node separated under the A2B table.
#include "Separation.h"

#include <algorithm>
#include <cmath>

namespace veltmarquist::profile {

namespace {

constexpr double kGamutDistance = 1.0; // dE*ab beyond which a node counts as out of gamut
constexpr int kCurveEntries = 4096;

double aMaximum(const LabEncoding& encoding)
{
    return encoding.decode(1, 65535.0);
}

// The a* and b* axes put their nodes closer together near neutral, where
// the press's colours lie, and further apart towards the encoding's ends,
// which no print reaches: node position s in -1..1 (0 neutral) stands for
// a* = 128 s^1.5 (the largest a* the encoding holds for s > 0).
constexpr double kChromaPower = 1.5;

double chromaAt(double u, const LabEncoding& encoding)
{
    const double s = 2.0 * u - 1.0;
    return s < 0.0 ? -128.0 * std::pow(-s, kChromaPower) : aMaximum(encoding) * std::pow(s, kChromaPower);
}

// Colours within this of the paper's L* take the paper's node: the curve
// reaches 1 there, so that a CMM's interpolation of the curve's table puts
// L* 100 on the top node exactly.
constexpr double kPaperLightness = 99.97;

// The grid position (0..1) the input curve gives a CIELAB value of one axis.
double curvePosition(int channel, double value, const LabEncoding& encoding)
{
    if (channel == 0)
        return value >= kPaperLightness ? 1.0 : std::clamp(value / 100.0, 0.0, 1.0);
    if (value < 0.0)
        return 0.5 - 0.5 * std::pow(std::min(-value / 128.0, 1.0), 1.0 / kChromaPower);
    return 0.5 + 0.5 * std::pow(std::min(value / aMaximum(encoding), 1.0), 1.0 / kChromaPower);
}

} // namespace

double nodeLab(int channel, int index, int nodes, const LabEncoding& encoding)
{
    const double u = static_cast<double>(index) / (nodes - 1);
    return channel == 0 ? 100.0 * u : chromaAt(u, encoding);
}

SeparationTable separate(const ForwardTable& a2b, const InkLimits& limits, const BlackGeneration& black, int nodes,
                         const std::function<void(double)>& progress)
{
    const LabEncoding& encoding = a2b.encoding();
    SeparationTable table;
    table.nodes = nodes;
    for (int channel = 0; channel < 3; ++channel)
        for (int j = 0; j < kCurveEntries; ++j) {
            const double value = encoding.decode(channel, 65535.0 * j / (kCurveEntries - 1));
            table.curves[static_cast<size_t>(channel)].push_back(
                static_cast<std::uint16_t>(std::lround(65535.0 * curvePosition(channel, value, encoding))));
        }

    // The darkest neutral: the darkest node of the A2B grid within the
    // limits, then separated towards black itself.
    const int n = a2b.nodes();
    std::array<double, 4> darkest{};
    double darkestL = 101.0;
    for (int c = 0; c < n; ++c)
        for (int m = 0; m < n; ++m)
            for (int y = 0; y < n; ++y)
                for (int k = 0; k < n; ++k) {
                    const std::array<double, 4> x = {a2b.levels()[static_cast<size_t>(c)], a2b.levels()[static_cast<size_t>(m)],
                                                     a2b.levels()[static_cast<size_t>(y)], a2b.levels()[static_cast<size_t>(k)]};
                    if (x[0] + x[1] + x[2] + x[3] > limits.total || x[3] > limits.black)
                        continue;
                    const double L = a2b.lab(x.data())[0];
                    if (L < darkestL) {
                        darkestL = L;
                        darkest = x;
                    }
                }
    double distance = 0.0;
    darkest = separateColour(a2b, limits, {0.0, 0.0, 0.0}, limits.black, false, darkest, distance);
    table.darkestL = a2b.lab(darkest.data())[0];

    // Nodes from white to black; in each L* slice from the neutral node
    // outward, each started from its neighbour towards neutral and from the
    // same node one slice lighter.
    const int centre = (nodes - 1) / 2;
    std::vector<std::pair<int, int>> order;
    for (int a = 0; a < nodes; ++a)
        for (int b = 0; b < nodes; ++b)
            order.emplace_back(a, b);
    std::stable_sort(order.begin(), order.end(), [centre](const auto& p, const auto& q) {
        return std::abs(p.first - centre) + std::abs(p.second - centre) <
               std::abs(q.first - centre) + std::abs(q.second - centre);
    });
    const size_t slice = static_cast<size_t>(nodes) * nodes;
    std::vector<std::array<double, 4>> solved(slice * nodes), lighter(slice);
    std::vector<double> distances(slice * nodes, 0.0);
    double neutralBlack = 0.0;
    for (int l = nodes - 1; l >= 0; --l) {
        const double L = nodeLab(0, l, nodes, encoding);
        std::vector<std::array<double, 4>> current(slice);
        for (const auto& [ia, ib] : order) {
            const Triple lab = {L, nodeLab(1, ia, nodes, encoding), nodeLab(2, ib, nodes, encoding)};
            const double target = black.target(L, std::hypot(lab[1], lab[2]), table.darkestL, limits.black);
            const bool neutral = ia == centre && ib == centre;
            // The neutral node and the nodes around it, between which a CMM
            // interpolates the neutral axis, keep at least the black of the
            // lighter neutral nodes.
            const bool nearNeutral = std::abs(ia - centre) <= 1 && std::abs(ib - centre) <= 1;
            // Towards neutral along the axis further from it.
            const int ta = std::abs(ia - centre) >= std::abs(ib - centre) && ia != centre ? ia + (ia > centre ? -1 : 1) : ia;
            const int tb = ta == ia && ib != centre ? ib + (ib > centre ? -1 : 1) : ib;
            std::vector<std::array<double, 4>> starts;
            if (!neutral)
                starts.push_back(current[static_cast<size_t>(ta) * nodes + tb]);
            if (l < nodes - 1)
                starts.push_back(lighter[static_cast<size_t>(ia) * nodes + ib]);
            if (starts.empty())
                starts.push_back({0.0, 0.0, 0.0, 0.0});
            std::array<double, 4> best{};
            double bestDistance = 0.0, bestScore = HUGE_VAL;
            if (l == nodes - 1 && std::abs(ia - centre) <= 1 && std::abs(ib - centre) <= 1) {
                // The paper and the colours next to it on its lightness
                // print as the paper: no ink, so that a CMM that resamples
                // the table on a grid of its own still separates paper
                // white into no ink at all.
                bestDistance = std::hypot(lab[1], lab[2]);
                starts.clear();
            }
            std::array<double, 4> neighbours{};
            for (const std::array<double, 4>& start : starts)
                for (size_t i = 0; i < 4; ++i)
                    neighbours[i] += start[i] / static_cast<double>(starts.size());
            for (const std::array<double, 4>& start : starts) {
                double d = 0.0;
                const std::array<double, 4> x = separateColour(a2b, limits, lab, target, black.fixed, start, d,
                                                               nearNeutral ? neutralBlack : 0.0, &neighbours);
                double score = d * d + kSeparationBlackWeight * (x[3] - target) * (x[3] - target);
                for (size_t i = 0; i < 4; ++i)
                    score += kSeparationNeighbourWeight * (x[i] - neighbours[i]) * (x[i] - neighbours[i]);
                if (score < bestScore) {
                    bestScore = score;
                    best = x;
                    bestDistance = d;
                }
            }
            if (neutral)
                neutralBlack = std::max(neutralBlack, best[3]);
            current[static_cast<size_t>(ia) * nodes + ib] = best;
            const size_t at = static_cast<size_t>(l) * slice + static_cast<size_t>(ia) * nodes + ib;
            solved[at] = best;
            distances[at] = bestDistance;
        }
        lighter = current;
        if (progress)
            progress(static_cast<double>(nodes - l) / nodes);
    }

    table.entries.resize(4 * solved.size());
    table.gamut.resize(solved.size());
    for (size_t node = 0; node < solved.size(); ++node) {
        const std::array<std::uint16_t, 4> codes = inkCodes(solved[node], limits);
        std::copy(codes.begin(), codes.end(), table.entries.begin() + static_cast<std::ptrdiff_t>(4 * node));
        const bool out = distances[node] > kGamutDistance;
        table.gamut[node] = out ? 65535 : 0;
        table.outOfGamut += out ? 1 : 0;
    }
    return table;
}

std::array<std::uint16_t, 4> inkCodes(const std::array<double, 4>& ink, const InkLimits& limits)
{
    // Round each ink, then take any excess back from the colour ink that
    // rounded up most; black gives only when C, M and Y have nothing left,
    // so that it keeps its course along the neutral axis to the last code.
    int code[4];
    double exact[4];
    int sum = 0;
    for (size_t i = 0; i < 4; ++i) {
        exact[i] = ink[i] * 65535.0;
        code[i] = static_cast<int>(std::lround(std::clamp(exact[i], 0.0, 65535.0)));
        if (i == 3)
            code[i] = std::min(code[i], limits.blackCode());
        sum += code[i];
    }
    while (sum > limits.totalCode()) {
        int most = -1;
        for (int i = 0; i < 3; ++i)
            if (code[i] > 0 && (most < 0 || code[i] - exact[i] > code[most] - exact[most]))
                most = i;
        if (most < 0)
            most = 3;
        --code[most];
        --sum;
    }
    return {static_cast<std::uint16_t>(code[0]), static_cast<std::uint16_t>(code[1]), static_cast<std::uint16_t>(code[2]),
            static_cast<std::uint16_t>(code[3])};
}

} // namespace veltmarquist::profile
