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
    ModelledForm modelled = modelForm(*result.form, *fit.model);
    std::vector<Cmyk> coverages;
    std::vector<Triple> measured, modelledXYZ;
    std::vector<double> ab;
    for (const FormPatch& patch : modelled.patches) {
        coverages.push_back(patch.check.device);
        measured.push_back(spectrumToXYZ(patch.measured));
        modelledXYZ.push_back(spectrumToXYZ(patch.modelled));
        ab.push_back(patch.check.deltaEab);
    }
    // Both charts are checked before either is delivered: both or neither.
    measuredChart.write(xyzChartText(coverages, measured));
    modelChart.write(xyzChartText(coverages, modelledXYZ));
    result.fit = std::move(fit);
    result.modelled = std::move(modelled);
    result.deltaEab = summarise(ab);
    measuredChart.commit();
    modelChart.commit();
    result.measuredWritten = measuredChart.name();
    result.modelWritten = modelChart.name();
}

} // namespace veltmarquist
