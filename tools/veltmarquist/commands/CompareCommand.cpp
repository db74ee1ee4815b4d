// compare: the measured and the modelled 46-step charts of the test form and
// their colour differences, patch by patch. Both charts are written from
// values by the library's XYZ chart writer; the differences are taken
// between the X, Y, Z the two charts hold.
#include "Commands.h"

#include "FourColourForm.h"
#include "Files.h"
#include "OutputFile.h"

namespace veltmarquist {

void runCompare(const CompareOptions& options, CompareResult& result)
{
    std::string folder = options.outputFolder.empty() ? "." : options.outputFolder;
    if (folder.back() != '/')
        folder += '/';
    FittedModel choice;
    choice.process = options.process;
    choice.yuleNielsen = options.yuleNielsen;
    const std::string stem = folder + fileStem(options.form);
    const std::string measuredPath = stem + ".measured46.txt", modelPath = stem + "." + choice.name() + "46.txt";
    refuseClashingOutputs({options.form}, {measuredPath, modelPath});
    result.form = readTestForm(options.form, options.read, result.formWarnings);
    PendingOutput measuredChart(measuredPath);
    PendingOutput modelChart(modelPath);

    FittedModel fit = fitChosenModel(*result.form, options.process, options.fitGravure, options.yuleNielsen);
    const MeasuredForm form = result.form->measuredForm();
    std::vector<Cmyk> coverages;
    std::vector<Triple> measured;
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch) {
        coverages.push_back(MeasuredForm::coverageOf(patch));
        measured.push_back(spectrumToXYZ(form.spectrum(patch)));
    }
    const std::vector<Triple> modelled = predictXYZ(*fit.model, coverages);
    // Both charts are checked before either is delivered: both or neither.
    measuredChart.write(xyzChartText(coverages, measured));
    modelChart.write(xyzChartText(coverages, modelled));
    result.fit = std::move(fit);

    std::vector<double> ab, de2000;
    for (size_t i = 0; i < coverages.size(); ++i) {
        result.patches.push_back(checkedPatch(coverages[i], chartXYZ(measured[i]), chartXYZ(modelled[i])));
        ab.push_back(result.patches.back().deltaEab);
        de2000.push_back(result.patches.back().deltaE2000);
    }
    result.deltaEab = summarise(ab);
    result.deltaE2000 = summarise(de2000);
    measuredChart.commit();
    modelChart.commit();
    result.measuredWritten = measuredChart.name();
    result.modelWritten = modelChart.name();
}

} // namespace veltmarquist
