// chart: the 900-patch characterisation chart of a four-colour process, and
// its check against what the form measured beyond the test form.
//
// The library's processes 0 and 1 write their chart through CalculateChart,
// as every host gets it; the Yule-Nielsen model's predictions go through the
// library's own XYZ chart writer. The numbers of the check come from the
// fitted model, as the chart holds them (Y limited, cut to two decimals).
#include "Commands.h"

#include "FourColourForm.h"
#include "Files.h"
#include "LibraryBlock.h"
#include "LibraryHost.h"
#include "OutputFile.h"

namespace veltmarquist {

namespace {

void writeLibraryChart(const ChartOptions& options, const FoundForm& form, const PendingOutput& output)
{
    Profile profile(fileStem(options.form));
    if (options.fitGravure) {
        RowTable rows(form.block);
        profile.run("the gravure fit", [&](MathProfile& object) { object.calculateRGBFactors(rows.rows()); });
    }
    MeasurementBlock block = form.block;
    profile.calculate(options.process, output, block);
}

std::vector<CheckedPatch> onChart(const std::vector<CheckedPatch>& patches)
{
    std::vector<CheckedPatch> chart;
    for (const CheckedPatch& patch : patches)
        if (patch.onChart)
            chart.push_back(patch);
    return chart;
}

} // namespace

void runChart(const ChartOptions& options, ChartResult& result)
{
    refuseClashingOutputs({options.form}, {options.output});
    result.form = readTestForm(options.form, options.read, result.formWarnings);
    const FoundForm& form = *result.form;
    PendingOutput output(options.output);
    FittedModel fit = fitChosenModel(form, options.process, options.fitGravure, options.yuleNielsen);
    const std::vector<Cmyk> chart = characterisationChart();
    std::vector<Triple> predicted = predictXYZ(*fit.model, chart);
    if (options.yuleNielsen)
        output.write(xyzChartText(chart, predicted));
    else
        writeLibraryChart(options, form, output);
    result.fit = std::move(fit);
    result.coverages = chart;
    result.predicted = std::move(predicted);

    // A model that predicts every coverage is checked on every combination
    // the file measured; the library's models on the chart's combinations.
    std::vector<Cmyk> checked = chart;
    if (options.yuleNielsen) {
        const std::vector<Cmyk> measured = measuredCombinations(form.file);
        checked.insert(checked.end(), measured.begin(), measured.end());
    }
    result.check = checkPredictions(form.file, checked, *result.fit->model);
    result.checkSummary = summariseChecks(result.check);
    result.chartCheckSummary = summariseChecks(onChart(result.check));
    output.commit();
    result.written = output.name();
}

} // namespace veltmarquist
