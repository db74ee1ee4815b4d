// The device-to-PCS table of an output profile (its A2B tags): the fitted
// model's colour at every node of an n^4 grid of C, M, Y, K, as the profile
// holds it, and that table evaluated as a colour management system reads it.
//
// The table is media-relative, as an ICC output profile's colorimetric
// tables are: X, Y, Z are scaled channel by channel so that the paper becomes
// the D50 white (X * 96.42 / X_paper, ...), then turned into CIELAB by the
// CIE formula. The CMM gets absolute colorimetry back from the media white
// point, which is the paper's X, Y, Z.
//
// Grid nodes lie at even steps of the device value, or at the levels a model
// predicts (the offset and gravure models: the form's 9 levels), which an
// input curve per ink maps onto even grid positions.
#ifndef VELTMARQUIST_PROFILE_FORWARDTABLE_H
#define VELTMARQUIST_PROFILE_FORWARDTABLE_H

#include "LabEncoding.h"

#include "models/PrintModels.h"

#include <array>
#include <cstdint>
#include <vector>

namespace veltmarquist::profile {

// CIELAB (D50) of X, Y, Z (0..100) made media-relative to `paper`.
Triple relativeLab(const Triple& XYZ, const Triple& paper);

class ForwardTable {
public:
    // Samples `model` on `levels` (percent, rising from 0 to 100, the same
    // for each ink) and encodes the table in `encoding`.
    ForwardTable(const PrintModel& model, std::vector<double> levels, LabEncoding encoding);

    const std::vector<double>& levels() const { return levels_; }
    int nodes() const { return static_cast<int>(levels_.size()); }
    bool evenLevels() const { return even_; }
    const LabEncoding& encoding() const { return encoding_; }
    // The paper's X, Y, Z (D50, 0..100): the profile's media white point.
    const Triple& paper() const { return paper_; }
    // The table's entries: L*, a*, b* per node in the encoding, C slowest, K fastest.
    const std::vector<std::uint16_t>& entries() const { return entries_; }

    // The grid position (0..1) of a device value (0..1) of one ink: the
    // input curve, identity for even levels.
    double gridPosition(double device) const;

    // CIELAB of a device value (fractions 0..1) as a CMM interpolates the
    // table's decoded entries: linear in C, tetrahedral in M, Y and K (as
    // LittleCMS does). With `jacobian`, d Lab / d device of the piece the
    // point lies in.
    Triple lab(const double device[4], std::array<std::array<double, 4>, 3>* jacobian = nullptr) const;

private:
    // Decoded CIELAB of node (c, m, y, k).
    const double* node(int c, int m, int y, int k) const;
    // Tetrahedral interpolation over M, Y, K at C slice `c`; adds d/dM, d/dY, d/dK of each channel.
    Triple tetrahedral(int c, const int index[3], const double fraction[3], std::array<std::array<double, 3>, 3>* d) const;

    std::vector<double> levels_; // fractions 0..1
    bool even_ = true;
    LabEncoding encoding_;
    Triple paper_{};
    std::vector<std::uint16_t> entries_;
    std::vector<double> decoded_; // the entries as L*, a*, b*
};

} // namespace veltmarquist::profile

#endif // VELTMARQUIST_PROFILE_FORWARDTABLE_H
