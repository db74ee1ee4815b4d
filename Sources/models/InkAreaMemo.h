// Effective dot areas a = dot^exponent remembered by their exact arguments.
// A chart predicts hundreds of coverages from a few dot-area rows and a few
// exponents (the 900-patch chart: 431 distinct rows among 3,600), so most
// rows repeat; a remembered row is the row std::pow gave for the same bits.
// One memo serves one calculation on one thread. Internal to the library.
#ifndef VELTMARQUIST_MODELS_INKAREAMEMO_H
#define VELTMARQUIST_MODELS_INKAREAMEMO_H

#include "FormPatches.h"

#include <cstdint>
#include <deque>
#include <unordered_map>

namespace veltmarquist {
namespace models {

class InkAreaMemo {
public:
    // dot[j]^exponent for every band: from the memo when these 36 dot areas
    // and this exponent (bit for bit) were asked before, else computed.
    const double* areas(const double* dot, double exponent);

    std::size_t rows() const { return rows_.size(); }

private:
    struct Row {
        double exponent;
        double dot[kBands];
        double area[kBands];
    };
    std::deque<Row> rows_; // addresses stay put as rows are added
    std::unordered_multimap<std::uint64_t, const Row*> byHash_;
};

} // namespace models
} // namespace veltmarquist

#endif // VELTMARQUIST_MODELS_INKAREAMEMO_H
