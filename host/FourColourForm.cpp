// The form and model of the four-colour front ends.
#include "FourColourForm.h"

#include "Failure.h"
#include "MeasurementLoading.h"

#include <exception>
#include <new>

namespace veltmarquist {

FoundForm readTestForm(const std::string& path, const ReadOptions& options, FileWarnings& warnings)
{
    MeasurementFile file = loadMeasurementFile(path, options);
    warnings = {path, file.warnings};
    return findTestForm(std::move(file), path);
}

FittedModel fitModel(const FoundForm& form, ModelChoice choice)
{
    FittedModel fit;
    fit.choice = choice;
    const MeasuredForm measured = form.measuredForm();
    try {
        switch (choice) {
        case ModelChoice::offset:
            fit.model = fitOffsetModel(measured);
            break;
        case ModelChoice::gravure:
            fit.model = fitGravureModel(measured, GravureFactors::defaults);
            break;
        case ModelChoice::gravureFitted:
            fit.model = fitGravureModel(measured, GravureFactors::fittedToRedGreenBlue);
            break;
        case ModelChoice::yuleNielsen:
            fit.model = fitYuleNielsenModel(measured);
            break;
        }
    } catch (const std::bad_alloc&) {
        throw;
    } catch (const std::exception& failure) {
        throw HostError(Failure::Calculation, "fitting " + describe(choice) + " failed: " + failure.what());
    }
    return fit;
}

ModelledForm modelForm(const FoundForm& form, const PrintModel& model)
{
    const MeasuredForm measured = form.measuredForm();
    std::vector<Cmyk> coverages;
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch)
        coverages.push_back(MeasuredForm::coverageOf(patch));
    const std::vector<Spectrum> modelled = predictSpectra(model, coverages);
    ModelledForm result;
    std::vector<double> differences;
    for (size_t i = 0; i < coverages.size(); ++i) {
        const Spectrum& spectrum = measured.spectrum(static_cast<int>(i));
        result.patches.push_back({checkedPatch(coverages[i], chartXYZ(spectrumToXYZ(spectrum)),
                                               chartXYZ(spectrumToXYZ(modelled[i]))),
                                  spectrum, modelled[i]});
        differences.push_back(result.patches.back().check.deltaE2000);
    }
    result.deltaE2000 = summarise(differences);
    result.toneValues = toneValueCurves(measured, model);
    return result;
}

} // namespace veltmarquist
