// The offset and gravure models as values.
//
// A fit runs on a profile of its own, with the very methods of processes 0
// and 1 (calculateGrayDiffFactor with its fast path, calculateRGBFactors), and
// keeps the fitted factors. A prediction then selects the form's spectra as
// setSample selects them on a profile that has read the form (the paper for
// 0 %, the tint of exactly that coverage, the solid for 100 %) and calls the
// kernels that calcOffsetSample and calcGravureSample call, so the numbers are
// those of the profile's methods, bit for bit. Both models predict only the
// form's levels: between them the profile has no tint to select, and a
// silent 0 % would be wrong.
#include "PrintModels.h"

#include "FormPatches.h"
#include "FourColourKernels.h"
#include "MathProfile.h"

#include <algorithm>

namespace veltmarquist {

namespace {

using namespace models;

constexpr int kLevels = kTintLevels + 2; // 0 %, the tints, 100 %

std::vector<double> formLevels()
{
    std::vector<double> levels = {0.0};
    levels.insert(levels.end(), kTintLevelPercent.begin(), kTintLevelPercent.end());
    levels.push_back(100.0);
    return levels;
}

// Index of an accepted coverage among the levels.
int levelIndex(const std::vector<double>& levels, double coverage)
{
    return static_cast<int>(std::find(levels.begin(), levels.end(), coverage) - levels.begin());
}

// The form's rows as a profile reads them: a table of 46 rows and a null row.
struct FormRows {
    explicit FormRows(const MeasuredForm& form)
    {
        for (int p = 0; p < MeasuredForm::kPatches; ++p) {
            spectra[static_cast<size_t>(p)] = form.spectrum(p);
            table[static_cast<size_t>(p)] = spectra[static_cast<size_t>(p)].data();
        }
    }
    FormRows(const FormRows&) = delete;
    FormRows& operator=(const FormRows&) = delete;

    std::array<Spectrum, MeasuredForm::kPatches> spectra;
    std::array<double*, MeasuredForm::kPatches + 1> table{};
};

// What setSample selects for each ink and level: the paper, the tints, the solid.
using InkTints = std::array<std::array<Bands, kLevels>, kInks>;

InkTints inkTints(const FormPatches& form)
{
    InkTints tints;
    for (int ink = 0; ink < kInks; ++ink) {
        auto& levels = tints[static_cast<size_t>(ink)];
        levels[0] = form.paper();
        std::copy(form.tint[static_cast<size_t>(ink)].begin(), form.tint[static_cast<size_t>(ink)].end(),
                  levels.begin() + 1);
        levels[kLevels - 1] = form.solid(ink);
    }
    return tints;
}

class OffsetModel final : public PrintModel {
public:
    OffsetModel(const FormPatches& form, const double factor[4], double limit)
        : PrintModel("offset",
                     {{"gray difference factor (C, M, Y, K)", {factor[0], factor[1], factor[2], factor[3]}, ""},
                      {"full correction at other inks' coverage (%)", {limit}, ""}},
                     formLevels()),
          limit_(limit)
    {
        std::copy(factor, factor + 4, factor_.begin());
        for (int p = 0; p < kOffsetPrimaries; ++p)
            primary_[static_cast<size_t>(p)] = form.primary[kOffsetPrimaryMask[p]];
        // The dot areas of the form's tints do not depend on the coverage requested.
        const InkTints tints = inkTints(form);
        for (size_t x = 0; x < kInks; ++x)
            for (size_t level = 0; level < kLevels; ++level)
                for (size_t j = 0; j < kBands; ++j)
                    dot_[x][level][j] = dotArea(tints[x][level][j], primary_[x][j], form.paper()[j]);
    }

private:
    void predictAccepted(const double* cmyk, double* spectrum) const override
    {
        double coverage[4], others[4], exponent[4];
        const double* dot[4];
        for (int x = 0; x < 4; ++x) {
            const int level = levelIndex(levels(), cmyk[x]);
            coverage[x] = levels()[static_cast<size_t>(level)]; // +0 for -0
            dot[x] = dot_[static_cast<size_t>(x)][static_cast<size_t>(level)].data();
        }
        otherCoverages(coverage, others);
        for (int x = 0; x < 4; ++x)
            exponent[x] = offsetExponent(factor_[static_cast<size_t>(x)], others[x], coverage[x], limit_);
        const double* primary[kOffsetPrimaries];
        for (int p = 0; p < kOffsetPrimaries; ++p)
            primary[p] = primary_[static_cast<size_t>(p)].data();
        offsetSpectrum(primary, dot, exponent, spectrum, nullptr);
    }

    std::array<double, 4> factor_;
    double limit_;
    std::array<Bands, kOffsetPrimaries> primary_;         // in the order of the Neugebauer sum
    std::array<std::array<Bands, kLevels>, kInks> dot_; // per ink and level
};

class GravureModel final : public PrintModel {
public:
    GravureModel(const FormPatches& form, int inkOrder, const double factor[3], GravureFactors source)
        : PrintModel("gravure",
                     {{"ink order", {}, gravureInkOrder(inkOrder).name},
                      {"trapping factors", {factor[0], factor[1], factor[2]},
                       source == GravureFactors::defaults ? "the library's defaults"
                                                          : "fitted to the red, green and blue solids"}},
                     formLevels()),
          order_(gravureInkOrder(inkOrder)), paper_(form.paper()), tints_(inkTints(form))
    {
        std::copy(factor, factor + 3, factor_.begin());
    }

private:
    void predictAccepted(const double* cmyk, double* spectrum) const override
    {
        const double* tint[4];
        double coverage[4];
        for (int k = 0; k < 4; ++k) {
            const int ink = order_.ink[k];
            const int level = levelIndex(levels(), cmyk[ink]);
            tint[k] = tints_[static_cast<size_t>(ink)][static_cast<size_t>(level)].data();
            coverage[k] = levels()[static_cast<size_t>(level)];
        }
        gravureSpectrum(paper_.data(), tint, coverage, factor_.data(), spectrum);
    }

    InkOrder order_;
    std::array<double, 3> factor_;
    Bands paper_;
    InkTints tints_;
};

FormPatches patchesOf(const FormRows& rows)
{
    return formPatchesFromRows(rows.table.data());
}

} // namespace

std::unique_ptr<PrintModel> fitOffsetModel(const MeasuredForm& form)
{
    FormRows rows(form);
    const auto profile = std::make_unique<MathProfile>("offset model");
    profile->calculateGrayDiffFactor(rows.table.data());
    return checkedOnForm(std::make_unique<OffsetModel>(patchesOf(rows), profile->grayDiffFactor, profile->coverageLimit));
}

std::unique_ptr<PrintModel> fitGravureModel(const MeasuredForm& form, GravureFactors factors)
{
    FormRows rows(form);
    const auto profile = std::make_unique<MathProfile>("gravure model"); // holds the defaults
    if (factors == GravureFactors::fittedToRedGreenBlue)
        profile->calculateRGBFactors(rows.table.data());
    return checkedOnForm(std::make_unique<GravureModel>(patchesOf(rows), profile->inkOrder, profile->rgbFactor, factors));
}

} // namespace veltmarquist
