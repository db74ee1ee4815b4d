// chart FORM -o CHART: the characterisation chart of a four-colour process,
// and its check against what the form measured beyond the test form.
//
// One fit serves everything: the chart (the library's 900 patches in the
// library's own format, which gives the bytes of CalculateChart for the
// library's models, or an export for profile builders), the check and the
// report.
#include "Commands.h"

#include "CommandOptions.h"
#include "OutputFile.h"
#include "report/HtmlReport.h"
#include "report/JsonReport.h"
#include "report/TextReport.h"

#include "ChartExport.h"

#include <memory>

namespace veltmarquist {

void runChart(const ChartJob& job, ChartResult& result)
{
    const bool layoutFromFile = !exporting::isGeneratedLayout(job.layout);
    std::vector<std::string> inputs{job.form};
    if (layoutFromFile)
        inputs.push_back(job.layout);
    refuseClashingOutputs(inputs, {job.output, job.report});
    exporting::ExportOptions options;
    options.format = exporting::chartFormatNamed(job.format);
    options.spectral = job.spectral;
    options.inkLimit = job.inkLimit;
    options.blackLimit = job.blackLimit;
    exporting::checkOptions(options);

    result.form = readTestForm(job.form, job.read, result.formWarnings);
    const FoundForm& form = *result.form;
    const exporting::PatchLayout layout = exporting::readLayout(job.layout);
    if (layoutFromFile)
        result.layoutWarnings = FileWarnings{job.layout, layout.warnings};
    std::optional<PendingOutput> output, report;
    if (!job.output.empty())
        output.emplace(job.output);
    if (!job.report.empty())
        report.emplace(job.report);
    FittedModel fit = fitModel(form, job.model);
    if (output)
        output->writeStreamed([&](std::ostream& out) {
            exporting::exportChart(*fit.model, exporting::provenanceOf(form.file, job.form), layout, options, out);
        });
    if (options.format != exporting::ChartFormat::library || job.layout != "chart") {
        result.layout = layout.description;
        if (options.format != exporting::ChartFormat::library)
            result.format = options.format == exporting::ChartFormat::cti3 ? "CTI3" : "CGATS";
    }
    result.patches = layout.size();
    result.modelled = modelForm(form, *fit.model);
    result.fit = std::move(fit);
    result.check = checkModel(form.file, *result.fit->model);
    // Chart and report are both written before either is delivered.
    if (report)
        report->write(htmlReport(result));
    deliver(output ? &*output : nullptr, result.written);
    deliver(report ? &*report : nullptr, result.reportWritten);
}

Command setupChartCommand(CLI::App& app)
{
    struct Options {
        ChartJob job;
        ScaleOption scale;
        ModelOption model;
        ReportStyle style;
    };
    const auto options = std::make_shared<Options>();
    ChartJob& job = options->job;
    CLI::App* command = app.add_subcommand(
        "chart", "characterisation chart (XYZ) from a measured four-colour test form: the library's 900 patches, "
                 "or a grid or target for profile builders");
    command->add_option("FORM", job.form, "measurement file with the 46 test-form patches (any order)")
        ->required()
        ->check(kPath);
    command->add_option("-o,--output", job.output, "chart file to write (- for standard output)")
        ->required()
        ->check(kPath);
    command
        ->add_option("--format", job.format,
                     "library: the library's own XYZ chart; cti3: for profile builders (CTI3, XYZ and Lab in full "
                     "precision); cgats: the same fields as plain CGATS.17")
        ->check(CLI::IsMember({"library", "cti3", "cgats"}))
        ->capture_default_str();
    command
        ->add_option("--layout", job.layout,
                     "chart: the library's 900 combinations; grid: every combination of the form's 9 levels (6561); "
                     "grid:N: N even levels per ink (--model ynsn); FILE: the device values of a CGATS target")
        ->capture_default_str()
        ->check(kPath);
    command->add_flag("--spectral", job.spectral, "also write the predicted spectra, 380-730 nm (cti3, cgats)");
    addInkLimit(*command, job.inkLimit,
                "write TOTAL_INK_LIMIT PERCENT (100 to 400) for the profile builder's separations (cti3, cgats); "
                "removes no patch");
    command->add_option("--black-limit", job.blackLimit,
                        "write BLACK_INK_LIMIT PERCENT (0 to 100) for the profile builder (cti3, cgats)")
        ->check(CLI::Range(0.0, 100.0));
    command->add_option("--report", job.report,
                        "also write the HTML report of the form, the fit and the check (as the report command)")
        ->check(kPath);
    options->model.add(*command);
    options->scale.add(*command);
    options->style.add(*command);
    return {command, [options] { return std::vector<std::string>{options->job.output, options->job.report}; },
            [options](std::ostream& report) {
                options->job.model = options->model.choice();
                options->job.read = options->scale.readOptions();
                runAndRender<ChartResult>([&](ChartResult& result) { runChart(options->job, result); },
                                          options->style.pick<ChartResult>(renderChart, jsonChart),
                                          report);
            },
            {}};
}

} // namespace veltmarquist
