// Print model: tint selection and the two four-colour spectral models.
//
// Every prediction starts with setSample, which places the requested coverages
// in the current sample (slot 21) and selects for each channel the measured
// tint of exactly that coverage (slots 14..20). A model method then writes the
// current sample's spectrum and X, Y, Z; the models' formulas are evaluated in
// models/FourColourKernels.cpp.
#include "MathProfile.h"
#include "ProfileSteps.h"
#include "models/InkAreaMemo.h"
#include "models/FourColourKernels.h"

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
    return veltmarquist::models::dotArea(tint, solid, paper);
}

MathProfile::ColorPatch& profilesteps::solidOf(MathProfile& profile, int ink)
{
    // Without a measured tint of this ink the paper stands in for its solid,
    // so that the ink prints nothing.
    return profile.tintLists[ink].empty() ? profile.patchSlots[MathProfile::kSlotPaper] : profile.tintLists[ink].back();
}

void MathProfile::calcOffsetSample()
{
    profilesteps::calcOffsetSample(*this, nullptr);
}

void profilesteps::calcOffsetSample(MathProfile& profile, veltmarquist::models::InkAreaMemo* memo)
{
    using namespace veltmarquist::models;
    ColorPatch* patchSlots = profile.patchSlots;
    const double* grayDiffFactor = profile.grayDiffFactor;
    const double coverageLimit = profile.coverageLimit;
    ColorPatch& sample = patchSlots[MathProfile::kSlotCurrentSample];
    const double* coverage = sample.channel; // C, M, Y, K
    double others[4], exponent[4];
    otherCoverages(coverage, others);
    for (int x = 0; x < 4; ++x)
        exponent[x] = offsetExponent(grayDiffFactor[x], others[x], coverage[x], coverageLimit);

    ColorPatch& paper = patchSlots[MathProfile::kSlotPaper];
    ColorPatch* primary[kOffsetPrimaries] = {&solidOf(profile, 0), &solidOf(profile, 1), &solidOf(profile, 2),
                                             &solidOf(profile, 3)};
    for (int s = 0; s <= 10; ++s)
        primary[4 + s] = &patchSlots[s];
    primary[kPaperPrimary] = &paper;

    double dot[4][kBands];
    const double* dots[4];
    for (int x = 0; x < 4; ++x) {
        for (int j = 0; j < kBands; ++j)
            dot[x][j] = dotArea(patchSlots[MathProfile::kSlotFirstTint + x].spectrum[j], primary[x]->spectrum[j],
                                paper.spectrum[j]);
        dots[x] = dot[x];
    }
    const double* spectra[kOffsetPrimaries];
    double* weights[kOffsetPrimaries];
    for (int p = 0; p < kOffsetPrimaries; ++p) {
        spectra[p] = primary[p]->spectrum;
        weights[p] = primary[p]->weight;
    }
    if (memo) {
        const double* areas[4];
        for (int x = 0; x < 4; ++x)
            areas[x] = memo->areas(dots[x], exponent[x]);
        offsetSpectrumFromAreas(spectra, areas, sample.spectrum, weights);
    } else {
        offsetSpectrum(spectra, dots, exponent, sample.spectrum, weights);
    }
    profile.spec2XYZ(&sample);
}

void profilesteps::calcGravureSample(MathProfile& profile, int i1, int i2, int i3, int i4)
{
    MathProfile::ColorPatch* slots = profile.patchSlots;
    ColorPatch& sample = slots[MathProfile::kSlotCurrentSample];
    const double coverage[3] = {sample.channel[i1], sample.channel[i2], sample.channel[i3]};
    const int first = MathProfile::kSlotFirstTint;
    const double* tint[4] = {slots[first + i1].spectrum, slots[first + i2].spectrum, slots[first + i3].spectrum,
                             slots[first + i4].spectrum};
    veltmarquist::models::gravureSpectrum(slots[MathProfile::kSlotPaper].spectrum, tint, coverage, profile.rgbFactor,
                                          sample.spectrum);
    profile.spec2XYZ(&sample);
}

void MathProfile::calcGravureSampleKCMY() { profilesteps::calcGravureSampleByOrder(*this, 1); }
void MathProfile::calcGravureSampleYCMK() { profilesteps::calcGravureSampleByOrder(*this, 2); }
void MathProfile::calcGravureSampleYMKC() { profilesteps::calcGravureSampleByOrder(*this, 3); }
void MathProfile::calcGravureSampleYKMC() { profilesteps::calcGravureSampleByOrder(*this, 4); }
void MathProfile::calcGravureSampleCMYK() { profilesteps::calcGravureSampleByOrder(*this, 0); }

void profilesteps::calcGravureSampleByOrder(MathProfile& profile, int order)
{
    const int* ink = veltmarquist::models::gravureInkOrder(order).ink;
    calcGravureSample(profile, ink[0], ink[1], ink[2], ink[3]);
}
