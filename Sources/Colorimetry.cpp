// Colorimetry: 36-band reflectance spectra to CIE XYZ (D50, 2 degree observer)
// and XYZ to CIELAB with the ICC D50 white.
//
//   X = normFactor * sum_b R(b) * Wx(b)        (likewise Y, Z; b from 380 nm up)
//   normFactor = 100 / sum_b Wy(b)              (a perfect white gets Y = 100)
//
//   L* = 116 f(Y) - 16
//   a* = 500 (f(X / Xn) - f(Y))
//   b* = 200 (f(Y) - f(Z / Zn))
//   f(t) = 7.787 t + 16/116        for t <= 0.008856
//        = t^(1/3)                 otherwise
//
// Between 0.008856 and 1 the cube root is read from a 1025-entry single
// precision table with linear interpolation; charts that hosts already hold
// were computed that way, so the table and its float steps are kept exactly.
#include "Colorimetry.h"
#include "MathProfile.h"
#include "ProfileSteps.h"

#include <cmath>

// ICC profile connection space white (D50). The weighting table's own column
// ratios (0.96448, 0.82486) are deliberately not used.
static const double kIccD50WhiteX = 0.9642;
static const double kIccD50WhiteZ = 0.8249;

// CIE 1931 2 degree observer weighted by illuminant D50, 10 nm steps, three
// decimals; column sums X 96.392, Y 99.942, Z 82.438.
const double MathProfile::Gewichtsfaktoren_XYZ_D50[36][3] = {
    //   X        Y       Z          nm
    {0.003, 0.0, 0.015},       // 380
    {0.012, 0.0, 0.057},       // 390
    {0.067, 0.002, 0.319},     // 400
    {0.234, 0.006, 1.116},     // 410
    {0.768, 0.023, 3.691},     // 420
    {1.563, 0.064, 7.628},     // 430
    {2.481, 0.164, 12.444},    // 440
    {2.792, 0.316, 14.717},    // 450
    {2.508, 0.517, 14.396},    // 460
    {1.699, 0.791, 11.198},    // 470
    {0.864, 1.256, 7.344},     // 480
    {0.28, 1.821, 4.072},      // 490
    {0.045, 2.943, 2.478},     // 500
    {0.086, 4.625, 1.455},     // 510
    {0.585, 6.564, 0.723},     // 520
    {1.608, 8.377, 0.41},      // 530
    {2.785, 9.148, 0.195},     // 540
    {4.221, 9.69, 0.085},      // 550
    {5.659, 9.417, 0.037},     // 560
    {7.09, 8.857, 0.02},       // 570
    {8.627, 8.191, 0.016},     // 580
    {9.135, 6.738, 0.01},      // 590
    {9.879, 5.868, 0.007},     // 600
    {9.476, 4.754, 0.003},     // 610
    {8.057, 3.593, 0.002},     // 620
    {5.855, 2.415, 0.0},       // 630
    {4.217, 1.648, 0.0},       // 640
    {2.583, 0.975, 0.0},       // 650
    {1.542, 0.57, 0.0},        // 660
    {0.857, 0.314, 0.0},       // 670
    {0.442, 0.161, 0.0},       // 680
    {0.189, 0.068, 0.0},       // 690
    {0.099, 0.036, 0.0},       // 700
    {0.051, 0.019, 0.0},       // 710
    {0.021, 0.007, 0.0},       // 720
    {0.012, 0.004, 0.0},       // 730
};
static_assert(sizeof(MathProfile::Gewichtsfaktoren_XYZ_D50) == 36 * 3 * sizeof(double),
              "one row of weights per 10 nm band from 380 to 730 nm");

// Entry i is the cube root of i/1024 rounded to nine decimals, then to the
// nearest float. Nine decimals (not the correctly rounded float cube root)
// are what the published table holds: at indices 37, 86, 135, 285, 339, 555,
// 787 and 804 the two differ by one unit in the last place. The table is
// built at compile time: the root by Newton steps in long double, the nine
// decimals as an integer rounded to nearest, the float from that integer over
// 10^9. A test rebuilds it from std::cbrt and decimal text and compares.
namespace {

constexpr long double cubeRoot(long double x)
{
    if (x <= 0.0L)
        return 0.0L;
    long double root = 1.0L; // x <= 1: Newton falls monotonically onto the root from above
    for (int step = 0; step < 200; ++step) {
        const long double next = root - (root * root * root - x) / (3.0L * root * root);
        if (next >= root)
            break;
        root = next;
    }
    return root;
}

constexpr std::array<float, 1025> buildCubeRootSamples()
{
    std::array<float, 1025> table{};
    for (int i = 0; i <= 1024; ++i) {
        const long double scaled = cubeRoot(static_cast<long double>(i) / 1024.0L) * 1e9L;
        auto decimals = static_cast<long long>(scaled);
        if (scaled - static_cast<long double>(decimals) >= 0.5L)
            ++decimals;
        table[static_cast<size_t>(i)] = static_cast<float>(static_cast<long double>(decimals) / 1e9L);
    }
    return table;
}

constexpr std::array<float, 1025> kCubeRootSamples = buildCubeRootSamples();
static_assert(kCubeRootSamples[0] == 0.0f && kCubeRootSamples[128] == 0.5f && kCubeRootSamples[1024] == 1.0f,
              "exact cube roots stay exact");

} // namespace

const std::array<float, 1025> MathProfile::cuberoot_samples = kCubeRootSamples;

namespace colorimetry {

double defaultNormFactor()
{
    // Summed from 380 nm upward: 99.94200000000001, so the factor is
    // 1.0005803365952251 and a perfect white gets Y = 100 up to rounding.
    double sum = 0.0;
    for (const auto& weights : MathProfile::Gewichtsfaktoren_XYZ_D50)
        sum += weights[1];
    return 100.0 / sum;
}

void spectrumToXYZ(const double* spectrum, double normFactor, double* XYZ)
{
    // The three sums side by side, each still added band by band from 380 nm.
    double sum[3] = {0.0, 0.0, 0.0};
    for (int band = 0; band < MathProfile::kBands; ++band)
        for (int column = 0; column < 3; ++column)
            sum[column] += spectrum[band] * MathProfile::Gewichtsfaktoren_XYZ_D50[band][column];
    for (int column = 0; column < 3; ++column)
        XYZ[column] = sum[column] * normFactor;
}

double iccF(double t)
{
    const std::array<float, 1025>& samples = MathProfile::cuberoot_samples;
    // The negated test also sends NaN to the linear branch.
    if (!(t > 0.008856))
        return 7.787 * t + 16.0 / 116.0;
    if (t > 1.0)
        return std::pow(t, 1.0 / 3.0);

    const float v = static_cast<float>(t * 1024.0);
    const int i = static_cast<int>(v);
    if (i >= 1024)
        return samples[1024]; // t rounds to 1: f is 0, the upper sample is not needed
    const float f = v - static_cast<float>(i);
    const float upper = f * samples[static_cast<size_t>(i) + 1]; // single-precision product
    return (1.0 - f) * samples[static_cast<size_t>(i)] + upper;
}

void XYZToLab(double X, double Y, double Z, double* Lab)
{
    const double fy = iccF(Y);
    Lab[0] = 116.0 * fy - 16.0;
    Lab[1] = 500.0 * (iccF(X / kIccD50WhiteX) - fy);
    Lab[2] = 200.0 * (fy - iccF(Z / kIccD50WhiteZ));
}

} // namespace colorimetry

void MathProfile::spec2XYZ(ColorPatch* patch)
{
    colorimetry::spectrumToXYZ(patch->spectrum, normFactor, patch->XYZ);
}

double MathProfile::icc_f(double t)
{
    return colorimetry::iccF(t);
}

MathProfile::lab MathProfile::XYZ2LAB(xyz value)
{
    double L[3];
    colorimetry::XYZToLab(value.X, value.Y, value.Z, L);
    return lab{L[0], L[1], L[2]};
}

MathProfile::lab profilesteps::labOf(MathProfile& profile, const ColorPatch& patch)
{
    return profile.XYZ2LAB(MathProfile::xyz{patch.XYZ[0] / 100.0, patch.XYZ[1] / 100.0, patch.XYZ[2] / 100.0});
}

double profilesteps::deltaE(const lab& first, const lab& second)
{
    const double dL = first.L - second.L, da = first.a - second.a, db = first.b - second.b;
    return std::sqrt(dL * dL + da * da + db * db);
}
