// Print model: tint selection and the two four-colour spectral models.
//
// Every prediction starts with setSample, which places the requested coverages
// in the current sample (slot 21) and selects for each channel the measured
// tint of exactly that coverage (slots 14..20). A model method then writes the
// current sample's spectrum and X, Y, Z.
//
// Offset: spectral Neugebauer over 16 primaries with Demichel weights. Per
// band j, the effective dot area of ink X is the Murray-Davies area
//     d_X = (T_X - W) / (S_X - W), clamped to [0, 1]
// (T tint, S solid, W paper), raised to an exponent that grows the area the
// more the other inks cover:
//     e_X = 1 - grayDiffFactor[X] * sqrt(q_X * x / 100),
//     q_X = 1 if O_X > coverageLimit else O_X / coverageLimit,
// O_X the sum of the other three coverages, x the ink's own coverage.
//
// Gravure: ordered multiplicative trapping, for the ink order I1..I4
//     R = T1 * (T2/W)^e2 * (T3/W)^e3 * (T4/W)^e4,
//     f(c, p) = (100 - c) (1 - p) / 100 + p,
//     e2 = f(c1, p1), e3 = e2 f(c2, p2), e4 = e3 f(c3, p3),
// with p1..p3 = rgbFactor: an ink printed over earlier inks darkens less.
//
// The evaluation orders below are part of the results: charts are compared
// byte for byte, so sums and products are formed exactly in the order written.
#include "MathProfile.h"

#include <cmath>
#include <cstring>

void MathProfile::setSample(double c, double m, double y, double k, double e1, double e2, double e3)
{
    const double requested[kChannels] = {c, m, y, k, e1, e2, e3};
    const ColorPatch& paper = patchSlots[kSlotPaper];
    for (int i = 0; i < kChannels; ++i)
        patchSlots[kSlotFirstTint + i] = paper;

    ColorPatch& sample = patchSlots[kSlotCurrentSample];
    std::memset(sample.channel, 0, sizeof sample.channel);
    std::memset(sample.spectrum, 0, sizeof sample.spectrum);

    for (int i = 0; i < kChannels; ++i) {
        for (const ColorPatch& tint : tintLists[i]) {
            if (tint.channel[i] != requested[i])
                continue; // exact match only: 39.5 does not select a 40 % tint
            patchSlots[kSlotFirstTint + i] = tint;
            sample.channel[i] = requested[i];
            double others = 0.0;
            for (int j = 0; j < kChannels; ++j)
                if (j != i)
                    others += requested[j];
            // A single printed channel takes the measured tint's spectrum directly.
            if (others == 0.0)
                std::memcpy(sample.spectrum, tint.spectrum, sizeof sample.spectrum);
            break;
        }
    }
}

double MathProfile::getDotarea(double tint, double solid, double paper)
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

MathProfile::ColorPatch& MathProfile::solidOf(int ink)
{
    // Without a measured tint of this ink the paper stands in for its solid,
    // so that the ink prints nothing.
    return tintLists[ink].empty() ? patchSlots[kSlotPaper] : tintLists[ink].back();
}

double MathProfile::offsetExponent(double factor, double others, double coverage, double limit)
{
    const double q = others > limit ? 1.0 : others / limit;
    return 1.0 - factor * std::sqrt(q * (coverage / 100.0));
}

void MathProfile::calcOffsetSample()
{
    ColorPatch& sample = patchSlots[kSlotCurrentSample];
    const double c = sample.channel[0], m = sample.channel[1], y = sample.channel[2], k = sample.channel[3];
    const double limit = coverageLimit;

    const double coverage[4] = {c, m, y, k};
    const double others[4] = {m + k + y, k + y + c, c + m + k, y + m + c};
    double exponent[4];
    for (int x = 0; x < 4; ++x)
        exponent[x] = offsetExponent(grayDiffFactor[x], others[x], coverage[x], limit);

    ColorPatch& paper = patchSlots[kSlotPaper];
    ColorPatch* solid[4] = {&solidOf(0), &solidOf(1), &solidOf(2), &solidOf(3)};
    ColorPatch* const overprint = patchSlots; // slots 0..10

    for (int j = 0; j < kBands; ++j) {
        const double W = paper.spectrum[j];
        double a[4];
        for (int x = 0; x < 4; ++x) {
            const double d = getDotarea(patchSlots[kSlotFirstTint + x].spectrum[j], solid[x]->spectrum[j], W);
            a[x] = std::pow(d, exponent[x]);
        }
        const double aC = a[0], aM = a[1], aY = a[2], aK = a[3];
        const double nC = 1.0 - aC, nM = 1.0 - aM, nY = 1.0 - aY, nK = 1.0 - aK;

        // Demichel weights, each product formed left to right as written.
        double w[16];
        w[0] = aC * nM * nY * nK;   // cyan
        w[1] = aM * nC * nY * nK;   // magenta
        w[2] = aY * nC * nM * nK;   // yellow
        w[3] = aK * nC * nM * nY;   // black
        w[4] = aM * aY * nC * nK;   // slot 0  magenta + yellow
        w[5] = aC * aY * nM * nK;   // slot 1  cyan + yellow
        w[6] = aC * aM * nY * nK;   // slot 2  cyan + magenta
        w[7] = aC * aK * nM * nY;   // slot 3  cyan + black
        w[8] = aM * aK * nC * nY;   // slot 4  magenta + black
        w[9] = aY * aK * nC * nM;   // slot 5  yellow + black
        w[10] = aM * aY * aK * nC;  // slot 6  magenta + yellow + black
        w[11] = aC * aY * aK * nM;  // slot 7  cyan + yellow + black
        w[12] = aC * aM * aK * nY;  // slot 8  cyan + magenta + black
        w[13] = aC * aM * aY * nK;  // slot 9  cyan + magenta + yellow
        w[14] = aC * aM * aY * aK;  // slot 10 all four
        w[15] = nC * nM * nY * nK;  // paper

        ColorPatch* primary[16] = {solid[0], solid[1], solid[2], solid[3]};
        for (int s = 0; s <= 10; ++s)
            primary[4 + s] = &overprint[s];
        primary[15] = &paper;

        double R = 0.0;
        for (int p = 0; p < 16; ++p) {
            primary[p]->weight[j] = w[p];
            R += w[p] * primary[p]->spectrum[j];
        }
        sample.spectrum[j] = std::fabs(R);
    }
    spec2XYZ(&sample);
}

void MathProfile::calcGravureSample(int i1, int i2, int i3, int i4)
{
    ColorPatch& sample = patchSlots[kSlotCurrentSample];
    // The fourth ink's coverage enters no exponent.
    const double c1 = sample.channel[i1], c2 = sample.channel[i2], c3 = sample.channel[i3];
    auto f = [](double coverage, double p) { return (100.0 - coverage) * (1.0 - p) / 100.0 + p; };
    const double e2 = f(c1, rgbFactor[0]);
    const double e3 = e2 * f(c2, rgbFactor[1]);
    const double e4 = e3 * f(c3, rgbFactor[2]);

    const double* W = patchSlots[kSlotPaper].spectrum;
    const double* T1 = patchSlots[kSlotFirstTint + i1].spectrum;
    const double* T2 = patchSlots[kSlotFirstTint + i2].spectrum;
    const double* T3 = patchSlots[kSlotFirstTint + i3].spectrum;
    const double* T4 = patchSlots[kSlotFirstTint + i4].spectrum;
    for (int j = 0; j < kBands; ++j) {
        // No clamp and no absolute value: a zero paper band passes inf/nan on.
        double R = std::pow(T2[j] / W[j], e2) * T1[j];
        R = R * std::pow(T3[j] / W[j], e3);
        R = R * std::pow(T4[j] / W[j], e4);
        sample.spectrum[j] = R;
    }
    spec2XYZ(&sample);
}

void MathProfile::calcGravureSampleKCMY() { calcGravureSample(3, 0, 1, 2); }
void MathProfile::calcGravureSampleYCMK() { calcGravureSample(2, 0, 1, 3); }
void MathProfile::calcGravureSampleYMKC() { calcGravureSample(2, 1, 3, 0); }
void MathProfile::calcGravureSampleYKMC() { calcGravureSample(2, 3, 1, 0); }
void MathProfile::calcGravureSampleCMYK() { calcGravureSample(0, 1, 2, 3); }

void MathProfile::calcGravureSampleByOrder(int order)
{
    switch (order) {
    case 1: calcGravureSampleKCMY(); break;
    case 2: calcGravureSampleYCMK(); break;
    case 3: calcGravureSampleYMKC(); break;
    case 4: calcGravureSampleYKMC(); break;
    default: calcGravureSampleCMYK(); break;
    }
}
