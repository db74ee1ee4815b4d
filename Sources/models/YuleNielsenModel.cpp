// The Yule-Nielsen spectral Neugebauer model as a print model: fitted to all
// 46 patches of the form, it predicts every coverage from 0 to 100 %.
#include "PrintModels.h"

#include "FormPatches.h"
#include "YuleNielsen.h"

namespace veltmarquist {

namespace {

using namespace models;

template <typename Values>
std::vector<double> numbers(const Values& values)
{
    return std::vector<double>(values.begin(), values.end());
}

std::vector<FittedValue> fittedValuesOf(const YuleNielsenFit& fit)
{
    std::vector<FittedValue> values = {
        {"Yule-Nielsen n (380-730 nm)", numbers(fit.n), ""},
        {"ink spreading (C, M, Y, K)", numbers(fit.spreading), ""},
    };
    const char* const curves[kInks] = {"dot area C (0, 10, 20, 40, 60, 70, 80, 90, 100 %)",
                                       "dot area M (0, 10, 20, 40, 60, 70, 80, 90, 100 %)",
                                       "dot area Y (0, 10, 20, 40, 60, 70, 80, 90, 100 %)",
                                       "dot area K (0, 10, 20, 40, 60, 70, 80, 90, 100 %)"};
    for (int ink = 0; ink < kInks; ++ink)
        values.push_back({curves[ink], numbers(fit.curveArea[static_cast<size_t>(ink)]), ""});
    values.push_back({"tint residual RMS", {fit.tintResidualRms}, ""});
    values.push_back({"grey dE*ab (C40 M40 Y40, C40 M40 Y40 K40)", numbers(fit.greyDeltaE), ""});
    for (const std::string& warning : fit.warnings)
        values.push_back({"warning", {}, warning});
    return values;
}

class YuleNielsenModel final : public PrintModel {
public:
    explicit YuleNielsenModel(YuleNielsenFit fit)
        : PrintModel("Yule-Nielsen", fittedValuesOf(fit), {}), fit_(std::move(fit))
    {
    }

private:
    void predictAccepted(const double* cmyk, double* spectrum) const override
    {
        predictYuleNielsen(fit_, cmyk, spectrum);
    }

    YuleNielsenFit fit_;
};

} // namespace

std::unique_ptr<PrintModel> fitYuleNielsenModel(const MeasuredForm& form)
{
    const double* rows[MeasuredForm::kPatches];
    for (int p = 0; p < MeasuredForm::kPatches; ++p)
        rows[p] = form.spectrum(p).data();
    return checkedOnForm(std::make_unique<YuleNielsenModel>(fitYuleNielsen(formPatchesFromRows(rows))));
}

} // namespace veltmarquist
