// chart: the characterisation chart of a four-colour process, and its check
// against what the form measured beyond the test form.
//
// The library's 900-patch chart of processes 0 and 1 is written through
// CalculateChart, as every host gets it; every other chart (the Yule-Nielsen
// model's, another layout, a format for profile builders) is the export's
// text of the model's predictions, which the Python package writes too. The
// numbers of the check come from the fitted model, as the library's chart
// holds them (Y limited, cut to two decimals), whatever the export holds.
#include "Commands.h"

#include "FourColourForm.h"
#include "Files.h"
#include "LibraryBlock.h"
#include "LibraryHost.h"
#include "OutputFile.h"
#include "report/HtmlReport.h"
#include "ToolError.h"

#include "ChartExport.h"

#include <optional>

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

Failure failureOf(exporting::ExportError::Kind kind, bool fromFile)
{
    using Kind = exporting::ExportError::Kind;
    switch (kind) {
    case Kind::Unreadable: return Failure::InputUnreadable;
    case Kind::Syntax: return Failure::InputSyntax;
    case Kind::Content: return Failure::InputContent;
    case Kind::NotPredicted: return fromFile ? Failure::InputContent : Failure::Usage;
    case Kind::Calculation: return Failure::Calculation;
    default: return Failure::Usage;
    }
}

// Runs a step of the export; its failures become the tool's.
template <typename Step>
auto exportStep(const std::string& layout, Step step)
{
    try {
        return step();
    } catch (const exporting::ExportError& error) {
        throw ToolError(failureOf(error.kind(), !exporting::isGeneratedLayout(layout)), error.what());
    }
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
    const bool layoutFromFile = !exporting::isGeneratedLayout(options.layout);
    std::vector<std::string> inputs{options.form};
    if (layoutFromFile)
        inputs.push_back(options.layout);
    refuseClashingOutputs(inputs, {options.output, options.report});
    exporting::ExportOptions exportOptions;
    exportOptions.format = exportStep(options.layout, [&] {
        const auto format = exporting::chartFormatNamed(options.format);
        if (!format)
            throw exporting::ExportError(exporting::ExportError::Kind::Usage,
                                         "unknown chart format '" + options.format + "'; formats: library, cti3, cgats");
        return *format;
    });
    exportOptions.spectral = options.spectral;
    exportOptions.inkLimit = options.inkLimit;
    exportStep(options.layout, [&] { exporting::checkOptions(exportOptions); });
    const bool libraryChart = exportOptions.format == exporting::ChartFormat::library && options.layout == "chart";

    result.form = readTestForm(options.form, options.read, result.formWarnings);
    const FoundForm& form = *result.form;
    const exporting::PatchLayout layout = exportStep(options.layout, [&] { return exporting::readLayout(options.layout); });
    if (layoutFromFile)
        result.layoutWarnings = FileWarnings{options.layout, layout.warnings};
    std::optional<PendingOutput> output, report;
    if (!options.output.empty())
        output.emplace(options.output);
    if (!options.report.empty())
        report.emplace(options.report);
    FittedModel fit = fitChosenModel(form, options.process, options.fitGravure, options.yuleNielsen);
    const std::vector<Cmyk> chart = characterisationChart();
    std::vector<Triple> predicted = predictXYZ(*fit.model, chart);
    // Without a chart, whose writing refuses a value that is not finite, the
    // report refuses it the same way.
    if (!output)
        refuseNonFiniteData(xyzChartText(chart, predicted), report->name());
    if (output && libraryChart && !options.yuleNielsen) {
        writeLibraryChart(options, form, *output);
    } else if (output) {
        output->write(exportStep(options.layout, [&] {
            return exporting::exportChart(*fit.model, exporting::provenanceOf(form.file, options.form), layout,
                                          exportOptions);
        }));
    }
    if (!libraryChart) {
        result.layout = layout.description;
        if (exportOptions.format != exporting::ChartFormat::library)
            result.format = exportOptions.format == exporting::ChartFormat::cti3 ? "CTI3" : "CGATS";
    }
    result.patches = layout.size();
    result.modelled = modelForm(form, *fit.model);
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
    // Chart and report are both written before either is delivered.
    if (report)
        report->write(htmlReport(result));
    deliver(output ? &*output : nullptr, result.written);
    deliver(report ? &*report : nullptr, result.reportWritten);
}

} // namespace veltmarquist
