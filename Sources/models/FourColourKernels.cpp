// The offset and gravure models.
//
// Offset: spectral Neugebauer over the sixteen primaries with Demichel
// weights. Per band, the effective dot area of ink X is its Murray-Davies area
//     d_X = (T_X - W) / (S_X - W), clamped to [0, 1]
// (T tint, S solid, W paper), raised to an exponent that grows the area the
// more the other inks cover:
//     a_X = d_X ^ e_X,  e_X = 1 - grayDiffFactor[X] * sqrt(q_X * x / 100),
//     q_X = 1 if O_X > coverageLimit else O_X / coverageLimit,
// O_X the sum of the other three coverages, x the ink's own coverage.
//
// Gravure: ordered multiplicative trapping (see gravureSpectrum): an ink
// printed over earlier inks darkens less.
//
// The evaluation orders below are part of the results: charts are compared
// byte for byte, so sums and products are formed exactly in the order written.
#include "FourColourKernels.h"

#include <cmath>

namespace veltmarquist {
namespace models {

void otherCoverages(const double cmyk[4], double others[4])
{
    const double c = cmyk[0], m = cmyk[1], y = cmyk[2], k = cmyk[3];
    others[0] = m + k + y;
    others[1] = k + y + c;
    others[2] = c + m + k;
    others[3] = y + m + c;
}

double offsetExponent(double factor, double others, double coverage, double limit)
{
    const double q = others > limit ? 1.0 : others / limit;
    return 1.0 - factor * std::sqrt(q * (coverage / 100.0));
}

void inkAreas(const double* dot, double exponent, double* area)
{
    for (int j = 0; j < kBands; ++j)
        area[j] = std::pow(dot[j], exponent);
}

void offsetSpectrumFromAreas(const double* const primary[kOffsetPrimaries], const double* const area[4],
                             double* spectrum, double* const* weight)
{
    for (int j = 0; j < kBands; ++j) {
        const double aC = area[0][j], aM = area[1][j], aY = area[2][j], aK = area[3][j];
        const double nC = 1.0 - aC, nM = 1.0 - aM, nY = 1.0 - aY, nK = 1.0 - aK;

        // Demichel weights in primary order, each product formed left to right.
        const double w[kOffsetPrimaries] = {
            aC * nM * nY * nK,  // cyan
            aM * nC * nY * nK,  // magenta
            aY * nC * nM * nK,  // yellow
            aK * nC * nM * nY,  // black
            aM * aY * nC * nK,  // magenta + yellow
            aC * aY * nM * nK,  // cyan + yellow
            aC * aM * nY * nK,  // cyan + magenta
            aC * aK * nM * nY,  // cyan + black
            aM * aK * nC * nY,  // magenta + black
            aY * aK * nC * nM,  // yellow + black
            aM * aY * aK * nC,  // magenta + yellow + black
            aC * aY * aK * nM,  // cyan + yellow + black
            aC * aM * aK * nY,  // cyan + magenta + black
            aC * aM * aY * nK,  // cyan + magenta + yellow
            aC * aM * aY * aK,  // all four
            nC * nM * nY * nK,  // paper
        };
        double R = 0.0;
        for (int p = 0; p < kOffsetPrimaries; ++p) {
            if (weight != nullptr)
                weight[p][j] = w[p];
            R += w[p] * primary[p][j];
        }
        spectrum[j] = std::fabs(R);
    }
}

void offsetSpectrum(const double* const primary[kOffsetPrimaries], const double* const dot[4],
                    const double exponent[4], double* spectrum, double* const* weight)
{
    double area[4][kBands];
    for (int x = 0; x < 4; ++x)
        inkAreas(dot[x], exponent[x], area[x]);
    const double* const areas[4] = {area[0], area[1], area[2], area[3]};
    offsetSpectrumFromAreas(primary, areas, spectrum, weight);
}

const InkOrder& gravureInkOrder(int inkOrder)
{
    static const InkOrder orders[5] = {
        {{0, 1, 2, 3}, "CMYK"}, {{3, 0, 1, 2}, "KCMY"}, {{2, 0, 1, 3}, "YCMK"},
        {{2, 1, 3, 0}, "YMKC"}, {{2, 3, 1, 0}, "YKMC"},
    };
    return inkOrder >= 1 && inkOrder <= 4 ? orders[inkOrder] : orders[0];
}

void gravureSpectrum(const double* paper, const double* const tint[4], const double coverage[3],
                     const double factor[3], double* spectrum)
{
    // The fourth ink's coverage enters no exponent.
    auto f = [](double c, double p) { return (100.0 - c) * (1.0 - p) / 100.0 + p; };
    const double e2 = f(coverage[0], factor[0]);
    const double e3 = e2 * f(coverage[1], factor[1]);
    const double e4 = e3 * f(coverage[2], factor[2]);

    const double *W = paper, *T1 = tint[0], *T2 = tint[1], *T3 = tint[2], *T4 = tint[3];
    for (int j = 0; j < kBands; ++j) {
        // No clamp and no absolute value: a zero paper band passes inf/nan on.
        double R = std::pow(T2[j] / W[j], e2) * T1[j];
        R = R * std::pow(T3[j] / W[j], e3);
        R = R * std::pow(T4[j] / W[j], e4);
        spectrum[j] = R;
    }
}

} // namespace models
} // namespace veltmarquist
