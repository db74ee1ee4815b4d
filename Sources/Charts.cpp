// Charts of the four-colour processes and the chart conversion.
//
// calculateChart predicts the 900 C, M, Y, K combinations of the
// characterisation chart with the offset or gravure model; calculateChart46
// writes the 46 patches of the test form itself, measured or modelled;
// convertChart rewrites a measured chart as a spectral chart, optionally moved
// from one paper white to another.
#include "ChartFile.h"
#include "MathProfile.h"
#include "ProfileSteps.h"
#include "models/InkAreaMemo.h"
#include "models/PrintModels.h"

#include <cmath>
#include <cstring>
#include <stdexcept>

namespace {

using Cmyk = std::array<unsigned char, 4>;

// Patches 1 to 26 of the chart: solids, overprints and the paper.
constexpr Cmyk kSolidsAndOverprints[] = {
    {100, 0, 0, 0}, {0, 100, 0, 0}, {0, 0, 100, 0}, {100, 100, 0, 0}, {100, 0, 100, 0}, {0, 100, 100, 0},
    {100, 100, 100, 0},                                                                 // 1..7
    {70, 70, 0, 0}, {70, 0, 70, 0}, {0, 70, 70, 0}, {40, 40, 0, 0}, {0, 40, 40, 0}, {40, 40, 40, 0},
    {40, 0, 40, 0}, {20, 20, 0, 0}, {20, 0, 20, 0}, {0, 20, 20, 0},                     // 8..17
    {100, 0, 0, 100}, {0, 100, 0, 100}, {0, 0, 100, 100}, {100, 100, 0, 100}, {100, 0, 100, 100},
    {0, 100, 100, 100}, {100, 100, 100, 100}, {0, 0, 0, 100},                           // 18..25
    {0, 0, 0, 0},                                                                       // 26
};
static_assert(sizeof kSolidsAndOverprints / sizeof kSolidsAndOverprints[0] == 26, "patches 1 to 26");

// Patches 54 to 96: three-colour combinations without black.
constexpr Cmyk kChromaticMixes[] = {
    {40, 100, 0, 0}, {40, 100, 40, 0}, {0, 100, 40, 0}, {40, 100, 100, 0}, {0, 40, 100, 0},
    {40, 40, 100, 0}, {70, 70, 70, 0}, {40, 0, 100, 0}, {100, 40, 100, 0}, {100, 0, 40, 0},
    {100, 40, 40, 0}, {100, 40, 0, 0}, {100, 100, 40, 0}, {70, 100, 20, 0}, {20, 70, 20, 0},
    {20, 70, 40, 0}, {20, 100, 70, 0}, {20, 70, 70, 0}, {20, 70, 100, 0}, {20, 20, 70, 0},
    {70, 20, 100, 0}, {70, 20, 70, 0}, {100, 20, 70, 0}, {70, 20, 20, 0}, {100, 70, 20, 0},
    {70, 70, 20, 0}, {70, 100, 70, 0}, {40, 70, 40, 0}, {20, 40, 20, 0}, {70, 100, 100, 0},
    {20, 40, 40, 0}, {70, 70, 100, 0}, {40, 40, 70, 0}, {20, 20, 40, 0}, {20, 20, 20, 0},
    {100, 70, 100, 0}, {70, 40, 70, 0}, {40, 20, 40, 0}, {100, 70, 70, 0}, {40, 40, 20, 0},
    {100, 100, 70, 0}, {40, 20, 20, 0}, {70, 40, 40, 0},
};
static_assert(sizeof kChromaticMixes / sizeof kChromaticMixes[0] == 43, "patches 54 to 96");

// Patches 130 to 138 (with K 20) and 145 to 153 (with K 60).
constexpr Cmyk kBlackOverprints[] = {
    {100, 0, 0, 0}, {0, 100, 0, 0}, {0, 0, 100, 0}, {100, 100, 0, 0}, {100, 0, 100, 0},
    {0, 100, 100, 0}, {40, 40, 0, 0}, {40, 0, 40, 0}, {0, 40, 40, 0},
};

// The 900 combinations, built at compile time.
struct ChartRows {
    std::array<Cmyk, 900> rows{};
    size_t size = 0;

    constexpr void add(int c, int m, int y, int k)
    {
        rows[size++] = Cmyk{static_cast<unsigned char>(c), static_cast<unsigned char>(m),
                            static_cast<unsigned char>(y), static_cast<unsigned char>(k)};
    }
    template <size_t Levels>
    constexpr void grid(int k, const int (&levels)[Levels]) // yellow outermost, magenta innermost
    {
        for (int y : levels)
            for (int c : levels)
                for (int m : levels)
                    add(c, m, y, k);
    }
};

constexpr ChartRows buildChart()
{
    ChartRows chart;
    for (const Cmyk& e : kSolidsAndOverprints)
        chart.add(e[0], e[1], e[2], e[3]);
    // 27..53: single-ink steps; black has no 10 % step here.
    const int steps[] = {90, 80, 70, 60, 40, 20, 10};
    for (int ink = 0; ink < 4; ++ink)
        for (int s : steps)
            if (!(ink == 3 && s == 10))
                chart.add(ink == 0 ? s : 0, ink == 1 ? s : 0, ink == 2 ? s : 0, ink == 3 ? s : 0);
    for (const Cmyk& e : kChromaticMixes)
        chart.add(e[0], e[1], e[2], e[3]);
    // 97..123: near-neutral tones with black, 124..129 the same tones without.
    const int tones[6][3] = {{100, 90, 90}, {80, 70, 70}, {60, 40, 40}, {40, 20, 20}, {20, 10, 10}, {10, 10, 10}};
    const int toneBlacks[6][5] = {{100, 80, 60, -1, -1}, {100, 80, 60, 40, -1}, {100, 80, 60, 40, 20},
                                  {100, 80, 60, 40, 20}, {100, 80, 60, 40, 20}, {100, 80, 60, 40, 20}};
    for (int t = 0; t < 6; ++t)
        for (int k : toneBlacks[t])
            if (k >= 0)
                chart.add(tones[t][0], tones[t][1], tones[t][2], k);
    for (const auto& tone : tones)
        chart.add(tone[0], tone[1], tone[2], 0);
    // 130..153: overprints with black 20, 40 and 60.
    for (const Cmyk& e : kBlackOverprints)
        chart.add(e[0], e[1], e[2], 20);
    for (size_t e = 3; e < 9; ++e) // black 40 only under the six two-ink overprints
        chart.add(kBlackOverprints[e][0], kBlackOverprints[e][1], kBlackOverprints[e][2], 40);
    for (const Cmyk& e : kBlackOverprints)
        chart.add(e[0], e[1], e[2], 60);
    // 154..899: one full grid per black level.
    const int fine[] = {0, 10, 20, 40, 70, 100}, medium[] = {0, 20, 40, 70, 100}, coarse[] = {0, 40, 70, 100};
    chart.grid(0, fine);
    chart.grid(20, fine);
    chart.grid(40, medium);
    chart.grid(60, medium);
    chart.grid(80, coarse);
    chart.add(0, 0, 0, 10); // 900
    return chart;
}

constexpr ChartRows kChart = buildChart();
static_assert(kChart.size == 900, "the characterisation chart holds 900 combinations");

} // namespace

// Constant-initialised: nothing is built when the library loads.
const std::array<std::array<unsigned char, 4>, 900> MathProfile::toBeCalculated = kChart.rows;

void profilesteps::predictFourColour(MathProfile& profile, PrintProcess process, veltmarquist::models::InkAreaMemo* memo)
{
    if (process == VM_PROCESS_GRAVURE)
        calcGravureSampleByOrder(profile, profile.inkOrder);
    else
        calcOffsetSample(profile, memo);
}

void MathProfile::calculateChart(double** rows, PrintProcess process, const char* path)
{
    if (process != VM_PROCESS_OFFSET && process != VM_PROCESS_GRAVURE)
        throw std::invalid_argument("the 900-patch chart is made with process 0 (offset) or 1 (gravure)");

    chartfile::ChartStream stream(path);
    profilesteps::readForm(*this, rows);
    chartfile::writeXYZHeader(stream, 900);

    ColorPatch& sample = patchSlots[kSlotCurrentSample];
    veltmarquist::models::InkAreaMemo memo;
    for (size_t i = 0; i < toBeCalculated.size(); ++i) {
        const auto& entry = toBeCalculated[i];
        setSample(entry[0], entry[1], entry[2], entry[3], 0.0, 0.0, 0.0);
        profilesteps::predictFourColour(*this, process, kLiteralBuild ? nullptr : &memo);
        chartfile::limitY(sample.XYZ);
        chartfile::writeXYZLine(stream, static_cast<int>(i) + 1, sample.channel, sample.XYZ);
    }
    stream.finish();
}

void MathProfile::calculateChart46(double** rows, PrintProcess process, const char* path, bool measured)
{
    if (!measured && process != VM_PROCESS_OFFSET && process != VM_PROCESS_GRAVURE)
        throw std::invalid_argument("the modelled 46-step chart is made with process 0 (offset) or 1 (gravure)");

    chartfile::ChartStream stream(path);
    profilesteps::readForm(*this, rows);
    chartfile::writeXYZHeader(stream, 46);

    ColorPatch& sample = patchSlots[kSlotCurrentSample];
    for (int i = 0; i < 46; ++i) {
        setSample(dithering[i][0], dithering[i][1], dithering[i][2], dithering[i][3], 0.0, 0.0, 0.0);
        if (measured) {
            // The rows as readData left them (exchanged when the form was read swapped).
            std::memcpy(sample.spectrum, rows[i], sizeof sample.spectrum);
            spec2XYZ(&sample);
        } else {
            profilesteps::predictFourColour(*this, process);
        }
        chartfile::limitY(sample.XYZ);
        chartfile::writeXYZLine(stream, i + 1, sample.channel, sample.XYZ);
    }
    stream.finish();
}

namespace veltmarquist {

// 0.33 up to dE 11, then 0.33 / ((dE - 10) / 25). The jump to 8.25 just above
// 11 and the negative measured share (1 - w) that follows are long-standing
// behaviour that existing converted charts depend on.
double chartConversionBlendWeight(double deltaE)
{
    if (deltaE <= 11.0)
        return 0.33;
    return 0.33 / ((deltaE - 10.0) / 25.0);
}

std::vector<Cmyk> characterisationChart()
{
    std::vector<Cmyk> coverages;
    for (const auto& entry : MathProfile::toBeCalculated)
        coverages.push_back(Cmyk{double(entry[0]), double(entry[1]), double(entry[2]), double(entry[3])});
    return coverages;
}

} // namespace veltmarquist

void MathProfile::convertChart(double** rows, int count, const char* path, double* channels, PrintProcess process)
{
    chartfile::ChartStream stream(path);
    stream << "LGOROWLENGTH\t54\r\nNUMBER_OF_SETS\t" << count - 2 << chartfile::endl;
    stream << "NUMBER_OF_FIELDS\t" << 41 << chartfile::endl;
    stream << "BEGIN_DATA_FORMAT" << chartfile::endl;
    stream << "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K";
    for (int nm = 380; nm <= 730; nm += 10)
        stream << "\tnm" << nm;
    stream << '\t' << chartfile::endl;
    stream << "END_DATA_FORMAT" << chartfile::endl;
    stream << "BEGIN_DATA" << chartfile::endl;

    const bool converting = process == VM_PROCESS_CHART_CONVERT || process == VM_PROCESS_CHART_BLEND;
    double w = 0.0;
    if (converting) {
        // The two reference whites, each limited to Y = 100 before its CIELAB
        // values are taken (the spectrum itself stays as measured).
        lab white[2];
        const int slot[2] = {kSlotPaper, kSlotSecondWhite};
        for (int r = 0; r < 2; ++r) {
            ColorPatch& reference = patchSlots[slot[r]];
            const int patch = count - 2 + r;
            for (int k = 0; k < kChannels; ++k)
                reference.channel[k] = channels[patch * 7 + k];
            std::memcpy(reference.spectrum, rows[patch], sizeof reference.spectrum);
            spec2XYZ(&reference);
            chartfile::limitY(reference.XYZ);
            white[r] = profilesteps::labOf(*this, reference);
        }
        w = veltmarquist::chartConversionBlendWeight(profilesteps::deltaE(white[0], white[1]));
    }

    ColorPatch& sample = patchSlots[kSlotCurrentSample];
    const double* A = patchSlots[kSlotPaper].spectrum;
    const double* B = patchSlots[kSlotSecondWhite].spectrum;
    for (int i = 0; i < count - 2; ++i) {
        for (int k = 0; k < kChannels; ++k)
            sample.channel[k] = channels[i * 7 + k];
        const double* r = rows[i];
        for (int b = 0; b < kBands; ++b) {
            if (!converting) {
                sample.spectrum[b] = r[b];
                continue;
            }
            // A band where the first white reflects nothing cannot be
            // converted: the measured value stands for the converted one.
            const double converted = A[b] == 0.0 ? r[b] : r[b] / A[b] * B[b];
            if (process == VM_PROCESS_CHART_CONVERT)
                sample.spectrum[b] = converted < 0.0 ? 0.0 : converted;
            else
                sample.spectrum[b] = converted * w + (1.0 - w) * r[b];
        }
        stream << i + 1 << '\t';
        for (int k = 0; k < 4; ++k)
            stream << sample.channel[k] << '\t';
        for (int b = 0; b < kBands; ++b)
            stream << sample.spectrum[b] << '\t';
        stream << chartfile::endl;
    }
    stream.finish();
}
