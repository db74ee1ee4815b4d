// The Yule-Nielsen spectral Neugebauer model: fit and prediction.
//
// Prediction for coverages c_i (percent):
//   a_i  = f_i(c_i / 100)                         the ink's dot-area curve
//   q_i  = 1 - prod_{j != i} (1 - a_j)            area the other inks cover
//   a'_i = clamp01(a_i + s_i q_i a_i (1 - a_i))   ink spreading over other inks
//   w_b  = prod_i (bit i of b ? a'_i : 1 - a'_i)  Demichel weights
//   R(l) = [sum_b w_b P_b(l)^(1/n(l))]^n(l)
// A single ink sees q = 0 and keeps its measured dot area; an ink at 0 or
// 100 % has a(1 - a) = 0 and is not spread, so paper, solids and overprints
// come back as measured (they are copied, not raised to 1/n and back).
// d a'_i / d a_i = 1 + s_i q_i (1 - 2 a_i) > 0 while |s_i| < 1, so a
// monotone curve stays monotone. A negative s_i lets a second ink shrink
// ink i's area, so a strongly negative factor can lighten a band a little as
// another ink grows; with factors of the size presses show (|s| <= 0.1) and
// primaries that darken with every ink, every band darkens as any ink grows.
//
// The fit reads only the form, in three stages:
//   1. n(l) and the 28 tint areas together, bounded least squares on the
//      tints' spectra: r = [(1 - alpha) W^(1/n) + alpha S^(1/n)]^n - T. It
//      starts from the best single n (and its closed-form areas). A closed-form
//      area step alternating with a per-band n step would not do: the two
//      minimise different objectives and drift apart without converging.
//   2. With n fixed, each tint's area in closed form in 1/n space over all
//      bands, alpha = sum (W' - T')(W' - S') / sum (W' - S')^2 with X' = X^(1/n);
//      the curve runs through (0, 0), the seven tints and (1, 1).
//   3. With n and f fixed, the four spreading factors, least squares on the
//      dL*, da*, db* of the two greys.
#include "YuleNielsen.h"

#include "Colorimetry.h"
#include "LaneLoops.h"
#include "LeastSquares.h"
#include "MonotoneCurve.h"

#include <algorithm>
#include <charconv>
#include <cmath>

namespace veltmarquist {
namespace models {

namespace {

constexpr int kNodes = kTintLevels + 2;
constexpr double kGreyCMYK[2][kInks] = {{40, 40, 40, 0}, {40, 40, 40, 40}};
constexpr const char* kInkNames[kInks] = {"cyan", "magenta", "yellow", "black"};
constexpr double kLargeGreyDeltaE = 2.0; // a grey further off than this after the fit is worth a look

using TintAreas = std::array<std::array<double, kTintLevels>, kInks>;

// Curve nodes: 0, the tint levels and 1, as coverage / 100 (so a coverage
// of exactly a tint level lands exactly on its node).
const std::array<double, kNodes>& curveNodes()
{
    static const std::array<double, kNodes> nodes = [] {
        std::array<double, kNodes> x{};
        for (int t = 0; t < kTintLevels; ++t)
            x[t + 1] = kTintLevelPercent[t] / 100.0;
        x[kNodes - 1] = 1.0;
        return x;
    }();
    return nodes;
}

// Roots of zero or negative reflectances do not exist and tiny ones make n
// meaningless, so every reflectance the model reads is raised to the floor
// first (NaN and infinity too): a degenerate form still gives finite values.
double floored(double r) { return std::isfinite(r) && r > kReflectanceFloor ? r : kReflectanceFloor; }

Bands rootOf(const Bands& r, const Bands& n)
{
    Bands root;
    for (int b = 0; b < kBands; ++b)
        root[b] = std::pow(r[b], 1.0 / n[b]);
    return root;
}

// The tint's area in 1/n space over all bands (arguments already rooted).
// Paper equal to solid in every band leaves no area to measure: the tint
// then keeps its nominal coverage.
double closedFormArea(const Bands& paper, const Bands& solid, const Bands& tint, double nominal)
{
    double num = 0.0, den = 0.0;
    for (int b = 0; b < kBands; ++b) {
        const double span = paper[b] - solid[b];
        num += (paper[b] - tint[b]) * span;
        den += span * span;
    }
    return den > 0.0 ? std::min(std::max(num / den, 0.0), 1.0) : nominal;
}

TintAreas closedFormAreas(const FormPatches& form, const Bands& n)
{
    TintAreas area{};
    const Bands paper = rootOf(form.paper(), n);
    for (int ink = 0; ink < kInks; ++ink) {
        const Bands solid = rootOf(form.solid(ink), n);
        for (int t = 0; t < kTintLevels; ++t)
            area[ink][t] = closedFormArea(paper, solid, rootOf(form.tint[ink][t], n), kTintLevelPercent[t] / 100.0);
    }
    return area;
}

std::string fixed(double value, int decimals)
{
    char text[32];
    const auto end = std::to_chars(text, text + sizeof text, value, std::chars_format::fixed, decimals);
    return std::string(text, end.ptr);
}

std::array<double, 3> lab(const double* spectrum)
{
    double XYZ[3];
    colorimetry::spectrumToXYZ(spectrum, colorimetry::defaultNormFactor(), XYZ);
    std::array<double, 3> Lab;
    colorimetry::XYZToLab(XYZ[0] / 100.0, XYZ[1] / 100.0, XYZ[2] / 100.0, Lab.data());
    return Lab;
}

// Stage 1. Unknowns: n of each band (0..35), then the area of tint t of ink
// i (36 + 7 i + t). Each residual depends on one n and one area, so the
// normal equations are summed directly from the two Jacobian entries:
//   dR/dalpha = n R / M (S' - W')
//   dR/dn     = R [ln M - ((1 - alpha) W' ln W + alpha S' ln S) / (n M)]
// with M = (1 - alpha) W' + alpha S', W' = W^(1/n), S' = S^(1/n).
constexpr int kAreaUnknown = kBands;
constexpr int kStageOneUnknowns = kBands + kInks * kTintLevels;

double tintCost(const FormPatches& form, const std::vector<double>& x, NormalEquations* normal)
{
    double cost = 0.0;
    for (int b = 0; b < kBands; ++b) {
        const double n = x[b], u = 1.0 / n;
        const double W = form.paper()[b], Wu = std::pow(W, u), WlnW = Wu * std::log(W);
        for (int ink = 0; ink < kInks; ++ink) {
            const double S = form.solid(ink)[b], Su = std::pow(S, u), SlnS = Su * std::log(S);
            for (int t = 0; t < kTintLevels; ++t) {
                const int k = kAreaUnknown + ink * kTintLevels + t;
                const double alpha = x[k];
                const double M = (1.0 - alpha) * Wu + alpha * Su;
                const double R = std::pow(M, n);
                const double r = R - form.tint[ink][t][b];
                cost += r * r;
                if (normal == nullptr)
                    continue;
                const double dAlpha = n * R / M * (Su - Wu);
                const double dN = R * (std::log(M) - ((1.0 - alpha) * WlnW + alpha * SlnS) / (n * M));
                normal->at(b, b) += dN * dN;
                normal->at(k, k) += dAlpha * dAlpha;
                normal->at(b, k) += dN * dAlpha;
                normal->at(k, b) += dN * dAlpha;
                normal->Jtr[b] += dN * r;
                normal->Jtr[k] += dAlpha * r;
            }
        }
    }
    return cost / 2.0;
}

struct StageOne {
    double startN = 0.0;
    Bands n{};
    bool converged = false;
};

StageOne fitN(const FormPatches& form)
{
    StageOne fit;
    std::vector<double> x(kStageOneUnknowns);
    double best = HUGE_VAL;
    for (int step = 10; step <= 60; ++step) { // n from 1.0 to 6.0 in steps of 0.1
        Bands n;
        n.fill(step / 10.0);
        const TintAreas area = closedFormAreas(form, n);
        std::vector<double> trial(n.begin(), n.end());
        trial.resize(kStageOneUnknowns);
        for (int ink = 0; ink < kInks; ++ink)
            std::copy(area[ink].begin(), area[ink].end(), trial.begin() + kAreaUnknown + ink * kTintLevels);
        const double cost = tintCost(form, trial, nullptr);
        if (cost < best) {
            best = cost;
            fit.startN = step / 10.0;
            x.swap(trial);
        }
    }
    std::vector<double> lower(kStageOneUnknowns, 0.0), upper(kStageOneUnknowns, 1.0);
    std::fill(lower.begin(), lower.begin() + kBands, kMinN);
    std::fill(upper.begin(), upper.begin() + kBands, kMaxN);
    const LeastSquaresResult result = minimizeBounded(
        [&form](const std::vector<double>& at, NormalEquations& normal) { return tintCost(form, at, &normal); }, x,
        lower, upper);
    std::copy(result.x.begin(), result.x.begin() + kBands, fit.n.begin());
    fit.converged = result.converged;
    return fit;
}

// The form with every reflectance floored, as the model reads it.
FormPatches flooredForm(const FormPatches& measured, int* raised)
{
    FormPatches form = measured;
    auto floorAll = [raised](Bands& bands) {
        for (double& r : bands) {
            const double f = floored(r);
            *raised += f != r;
            r = f;
        }
    };
    for (Bands& primary : form.primary)
        floorAll(primary);
    for (auto& tints : form.tint)
        for (Bands& tint : tints)
            floorAll(tint);
    floorAll(form.grey3);
    floorAll(form.grey4);
    return form;
}

// Stage 3 and the quality report on the fitted model.
void fitSpreading(const FormPatches& form, YuleNielsenFit& fit)
{
    const std::array<double, 3> measured[2] = {lab(form.grey3.data()), lab(form.grey4.data())};
    YuleNielsenFit model = fit;
    auto greyResiduals = [&](const std::vector<double>& s, double* r) {
        std::copy(s.begin(), s.end(), model.spreading.begin());
        for (int grey = 0; grey < 2; ++grey) {
            Bands spectrum;
            predictYuleNielsen(model, kGreyCMYK[grey], spectrum.data());
            const std::array<double, 3> predicted = lab(spectrum.data());
            for (int c = 0; c < 3; ++c)
                r[3 * grey + c] = predicted[c] - measured[grey][c];
        }
    };
    const LeastSquaresResult result =
        minimizeBounded(numericProblem(greyResiduals, 6, 1e-6), std::vector<double>(kInks, 0.0),
                        std::vector<double>(kInks, -kMaxSpreading), std::vector<double>(kInks, kMaxSpreading));
    std::copy(result.x.begin(), result.x.end(), fit.spreading.begin());

    double r[6];
    greyResiduals(result.x, r);
    for (int grey = 0; grey < 2; ++grey) {
        fit.greyDeltaE[grey] = std::sqrt(r[3 * grey] * r[3 * grey] + r[3 * grey + 1] * r[3 * grey + 1] +
                                         r[3 * grey + 2] * r[3 * grey + 2]);
        if (fit.greyDeltaE[grey] > kLargeGreyDeltaE)
            fit.warnings.push_back(std::string(grey == 0 ? "The three-colour grey C40 M40 Y40" : "The four-colour grey C40 M40 Y40 K40") +
                                   " is " + fixed(fit.greyDeltaE[grey], 2) +
                                   " dE*ab from its prediction after the fit: check its measurement.");
    }
    for (int ink = 0; ink < kInks; ++ink)
        if (std::fabs(fit.spreading[ink]) >= kMaxSpreading)
            fit.warnings.push_back(std::string("The spreading factor of ") + kInkNames[ink] + " sits at its bound " +
                                   fixed(fit.spreading[ink], 2) + ": the greys or the " + kInkNames[ink] +
                                   " tints may be mismeasured.");
}

} // namespace

YuleNielsenFit yuleNielsenModel(const std::array<Bands, kPrimaries>& primaries, const Bands& n,
                                const TintAreas& tintArea, const std::array<double, kInks>& spreading)
{
    YuleNielsenFit fit;
    fit.n = n;
    fit.spreading = spreading;
    for (int b = 0; b < kPrimaries; ++b) {
        for (int band = 0; band < kBands; ++band)
            fit.primary[b][band] = floored(primaries[b][band]);
        fit.primaryRoot[b] = rootOf(fit.primary[b], n);
    }
    for (int ink = 0; ink < kInks; ++ink) {
        auto& area = fit.curveArea[ink];
        area[0] = 0.0;
        area[kNodes - 1] = 1.0;
        int levelled = -1;
        for (int t = 0; t < kTintLevels; ++t) {
            const double a = std::isfinite(tintArea[ink][t]) ? std::min(std::max(tintArea[ink][t], 0.0), 1.0) : 0.0;
            if (a < area[t] && levelled < 0)
                levelled = t;
            area[t + 1] = std::max(a, area[t]);
        }
        if (levelled >= 0)
            fit.warnings.push_back(std::string("The ") + kInkNames[ink] + " tint at " +
                                   fixed(kTintLevelPercent[levelled], 0) +
                                   " % has less dot area than the one before it: the dot-area curve was levelled.");
        monotoneSlopes(curveNodes().data(), area.data(), kNodes, fit.curveSlope[ink].data());
    }
    return fit;
}

YuleNielsenFit fitYuleNielsen(const FormPatches& measured)
{
    int raised = 0;
    const FormPatches form = flooredForm(measured, &raised);
    const StageOne stageOne = fitN(form);
    YuleNielsenFit fit = yuleNielsenModel(form.primary, stageOne.n, closedFormAreas(form, stageOne.n), {});
    fit.startN = stageOne.startN;
    if (raised > 0)
        fit.warnings.insert(fit.warnings.begin(), std::to_string(raised) + " reflectances of the form were at or below " +
                                                      fixed(kReflectanceFloor, 4) + " and were raised to it.");
    if (!stageOne.converged)
        fit.warnings.push_back("The fit of n per band stopped at its iteration limit before converging.");
    fitSpreading(form, fit);

    double sum = 0.0;
    for (int ink = 0; ink < kInks; ++ink) {
        for (int t = 0; t < kTintLevels; ++t) {
            double cmyk[kInks] = {};
            cmyk[ink] = kTintLevelPercent[t];
            Bands predicted;
            predictYuleNielsen(fit, cmyk, predicted.data());
            for (int b = 0; b < kBands; ++b)
                sum += (predicted[b] - form.tint[ink][t][b]) * (predicted[b] - form.tint[ink][t][b]);
        }
    }
    fit.tintResidualRms = std::sqrt(sum / (kInks * kTintLevels * kBands));
    return fit;
}

namespace {

// sum[band] = the weights times the primaries' roots, added primary by
// primary from 0; bands are lanes.
VELTMARQUIST_LANE_LOOP
void neugebauerSum(const double (&weight)[kPrimaries], const std::array<Bands, kPrimaries>& root, double (&sum)[kBands])
{
    // A local sum, which nothing else can alias, stays in registers.
    double local[kBands] = {};
    for (int b = 0; b < kPrimaries; ++b) {
        const double w = weight[b];
        const double* r = root[static_cast<size_t>(b)].data();
        for (int band = 0; band < kBands; ++band)
            local[band] += w * r[band];
    }
    for (int band = 0; band < kBands; ++band)
        sum[band] = local[band];
}

} // namespace

void predictYuleNielsen(const YuleNielsenFit& fit, const double cmyk[kInks], double* spectrum)
{
    const std::array<double, kNodes>& nodes = curveNodes();
    double a[kInks];
    for (int ink = 0; ink < kInks; ++ink) {
        const double c = cmyk[ink] > 0.0 ? std::min(cmyk[ink], 100.0) / 100.0 : 0.0;
        a[ink] = monotoneCurveAt(nodes.data(), fit.curveArea[ink].data(), fit.curveSlope[ink].data(), kNodes, c);
    }
    double spread[kInks];
    bool primary = true;
    for (int i = 0; i < kInks; ++i) {
        double others = 1.0;
        for (int j = 0; j < kInks; ++j)
            if (j != i)
                others *= 1.0 - a[j];
        const double q = 1.0 - others;
        spread[i] = std::min(std::max(a[i] + fit.spreading[i] * q * a[i] * (1.0 - a[i]), 0.0), 1.0);
        primary = primary && (spread[i] == 0.0 || spread[i] == 1.0);
    }
    if (primary) {
        const int b = (spread[0] == 1.0) | (spread[1] == 1.0) << 1 | (spread[2] == 1.0) << 2 | (spread[3] == 1.0) << 3;
        std::copy(fit.primary[b].begin(), fit.primary[b].end(), spectrum);
        return;
    }
    double weight[kPrimaries];
    for (int b = 0; b < kPrimaries; ++b) {
        double w = 1.0;
        for (int ink = 0; ink < kInks; ++ink)
            w *= (b >> ink & 1) ? spread[ink] : 1.0 - spread[ink];
        weight[b] = w;
    }
    double sum[kBands];
    neugebauerSum(weight, fit.primaryRoot, sum);
    for (int band = 0; band < kBands; ++band)
        spectrum[band] = std::pow(sum[band], fit.n[band]);
}

} // namespace models
} // namespace veltmarquist
