// The arithmetic of the offset and gravure models on plain band arrays: the
// one place where their formulas are evaluated. The profile's methods
// (calcOffsetSample, calcGravureSample) and the print models that return
// values call these functions, so both give the same bits. Internal to the
// library.
#ifndef VELTMARQUIST_MODELS_FOURCOLOURKERNELS_H
#define VELTMARQUIST_MODELS_FOURCOLOURKERNELS_H

#include "FormPatches.h"

namespace veltmarquist {
namespace models {

// -- Offset model ----------------------------------------------------------------

// Murray-Davies dot area (tint - paper) / (solid - paper), clamped to [0, 1];
// 0 where the solid equals the paper.
inline double dotArea(double tint, double solid, double paper)
{
    if (solid == paper)
        return 0.0;
    const double d = (tint - paper) / (solid - paper);
    if (d > 1.0)
        return 1.0;
    if (d < 0.0)
        return 0.0;
    return d;
}

// For each of C, M, Y, K the sum of the other three coverages, each sum formed
// in the order the model has always formed it.
void otherCoverages(const double cmyk[4], double others[4]);

// Exponent of one ink: 1 - factor * sqrt(q * coverage / 100), q = others / limit up to 1.
double offsetExponent(double factor, double others, double coverage, double limit);

// The sixteen Neugebauer primaries in the order of the sum: the solids of C,
// M, Y and K; the overprints M+Y, C+Y, C+M, C+K, M+K, Y+K, M+Y+K, C+Y+K,
// C+M+K, C+M+Y and C+M+Y+K; the paper. Entry 4 + s is the profile's slot s.
constexpr int kOffsetPrimaries = 16;
constexpr int kPaperPrimary = 15;
// Bit i of a mask is set when ink i prints solid: the primaries above as masks.
constexpr unsigned char kOffsetPrimaryMask[kOffsetPrimaries] = {1, 2, 4, 8, 6, 5, 3, 9, 10, 12, 14, 13, 11, 7, 15, 0};

// Spectrum of one coverage band by band: the dot area a = dot^exponent of
// each ink, the Demichel weights of the primaries, and
//     R = |sum_p w_p * P_p|.
// When `weight` is not null, weight[p][band] receives w_p, written in primary
// order (a primary that stands twice keeps the later weight).
void offsetSpectrum(const double* const primary[kOffsetPrimaries], const double* const dot[4],
                    const double exponent[4], double* spectrum, double* const* weight);
// The two steps of offsetSpectrum: an ink's effective dot areas a = dot^exponent,
// then the spectrum from the four inks' areas.
void inkAreas(const double* dot, double exponent, double* area);
void offsetSpectrumFromAreas(const double* const primary[kOffsetPrimaries], const double* const area[4],
                             double* spectrum, double* const* weight);

// -- Gravure model ------------------------------------------------------------------

// The ink orders of the gravure model: inkOrder 1 KCMY, 2 YCMK, 3 YMKC, 4
// YKMC, any other value CMYK.
struct InkOrder {
    int ink[4];       // channels in print order
    const char* name; // for example "YMKC"
};
const InkOrder& gravureInkOrder(int inkOrder);

// Spectrum of one coverage, the inks 1..4 in print order:
//     R = T1 * (T2/W)^e2 * (T3/W)^e3 * (T4/W)^e4,
//     f(c, p) = (100 - c) (1 - p) / 100 + p,
//     e2 = f(c1, p1), e3 = e2 f(c2, p2), e4 = e3 f(c3, p3),
// T the selected tints (the paper for an unprinted ink), W the paper, c the
// coverages of the first three inks and p the three trapping factors.
void gravureSpectrum(const double* paper, const double* const tint[4], const double coverage[3],
                     const double factor[3], double* spectrum);

} // namespace models
} // namespace veltmarquist

#endif // VELTMARQUIST_MODELS_FOURCOLOURKERNELS_H
