// The form and model of the four-colour commands.
#include "FourColourForm.h"

#include "MeasurementLoading.h"
#include "PredictionCheck.h"
#include "ToolError.h"

#include <exception>
#include <new>

namespace veltmarquist {

FoundForm readTestForm(const std::string& path, const ReadOptions& options, FileWarnings& warnings)
{
    MeasurementFile file = loadMeasurementFile(path, options);
    warnings = {path, file.warnings};
    return findTestForm(std::move(file), path);
}

FittedModel fitChosenModel(const FoundForm& form, PrintProcess process, bool fitGravure, bool yuleNielsen)
{
    FittedModel fit;
    fit.process = process;
    fit.yuleNielsen = yuleNielsen;
    fit.gravureFitted = fitGravure;
    const char* what = yuleNielsen ? "the Yule-Nielsen fit" : process == VM_PROCESS_GRAVURE ? "the gravure fit"
                                                                                           : "the offset fit";
    try {
        const MeasuredForm measured = form.measuredForm();
        if (yuleNielsen)
            fit.model = fitYuleNielsenModel(measured);
        else if (process == VM_PROCESS_GRAVURE)
            fit.model = fitGravureModel(measured, fitGravure ? GravureFactors::fittedToRedGreenBlue
                                                             : GravureFactors::defaults);
        else
            fit.model = fitOffsetModel(measured);
    } catch (const std::bad_alloc&) {
        throw;
    } catch (const std::exception& failure) {
        throw ToolError(Failure::Calculation, std::string(what) + " failed: " + failure.what());
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
