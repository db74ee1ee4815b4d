// Colour arithmetic of the checks: CIELAB and the CIE 1976 and CIEDE2000
// differences as LittleCMS computes them (what profile builders use), the
// library's X, Y, Z of a measured spectrum, and summaries of differences.
#ifndef VELTMARQUIST_FORMS_COLOURDIFFERENCE_H
#define VELTMARQUIST_FORMS_COLOURDIFFERENCE_H

#include "models/PrintModels.h"

#include <cstddef>
#include <vector>

namespace veltmarquist {

struct Lab {
    double L, a, b;
};

// CIELAB (D50) of X, Y, Z on the 0..100 scale.
Lab labOfXYZ(const Triple& XYZ);
// X, Y, Z (D50, 0..100) of a CIELAB colour, the inverse of labOfXYZ.
Triple XYZOfLab(const Lab& lab);
double deltaEab(const Lab& first, const Lab& second);
double deltaE2000(const Lab& first, const Lab& second);

// X, Y, Z (D50, 2 degree, 0..100) of 36 bands from 380 nm, as the library
// sums them, with Y limited to 100 the way the charts limit it.
Triple XYZOfBands(const std::vector<double>& bands);

struct Summary {
    size_t count = 0;
    double mean = 0.0;
    double p95 = 0.0; // 95th percentile, linear between ranks
    double max = 0.0;
};
Summary summarise(std::vector<double> values);

} // namespace veltmarquist

#endif // VELTMARQUIST_FORMS_COLOURDIFFERENCE_H
