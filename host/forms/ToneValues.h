// Tone values of the test form's tints, as a densitometer states them.
//
// The tone value of a tint is its Murray-Davies dot area on the channel a
// densitometer reads for the ink:
//     TV = (R_paper - R_tint) / (R_paper - R_solid)   (x 100 %)
// with R the reflectance of that channel. The channel of a chromatic ink is
// the band its complementary filter passes, as a broad-band status filter
// would (cyan: red 600-700 nm, magenta: green 500-590 nm, yellow: blue
// 400-490 nm), the mean reflectance over that band; black is read through
// the visual channel, CIE Y. The tone value increase of a tint is TV minus
// its nominal coverage.
#ifndef VELTMARQUIST_FORMS_TONEVALUES_H
#define VELTMARQUIST_FORMS_TONEVALUES_H

#include "models/PrintModels.h"

#include <array>
#include <vector>

namespace veltmarquist {

// Which channel an ink's tone value is read on (0 C, 1 M, 2 Y, 3 K), in a
// few words ("red filter, 600-700 nm").
const char* densitometerChannel(int ink);

// Tone value in percent of a tint printed with `ink` between paper and solid;
// 0 when paper and solid read the same on the ink's channel.
double toneValue(const Spectrum& tint, const Spectrum& paper, const Spectrum& solid, int ink);

// One ink's tone values at nominal coverages (0 and 100 % included).
struct ToneValueCurve {
    std::vector<double> nominal, measured;         // the form's tints as measured
    std::vector<double> modelNominal, modelled;    // the model's tints: its levels, or every 5 %
};

// Tone values of the form's measured tints of C, M, Y and K, and of the
// model's tints of the same inks (paper and solid as the model gives them).
std::array<ToneValueCurve, 4> toneValueCurves(const MeasuredForm& form, const PrintModel& model);

} // namespace veltmarquist

#endif // VELTMARQUIST_FORMS_TONEVALUES_H
