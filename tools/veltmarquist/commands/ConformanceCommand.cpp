// conformance FORM --reference REF: is the press printing to a reference
// condition? The form's control patches and tone values against the
// reference's, each with its tolerance and a verdict, and the reference's
// whole patch list as the press's Yule-Nielsen model predicts it
// (Conformance.h). Out of tolerance ends with its own exit code.
#include "Commands.h"

#include "CommandOptions.h"
#include "Failure.h"
#include "OutputFile.h"
#include "Text.h"
#include "report/HtmlReport.h"
#include "report/JsonReport.h"
#include "report/TextReport.h"

#include <memory>

namespace veltmarquist {

namespace {

struct ConformanceJob {
    std::string form, reference, tolerances, report;
    bool anyCondition = false, gamut = true;
    ReadOptions read;
};

void runConformance(const ConformanceJob& job, ConformanceRun& run)
{
    const std::string referencePath = conformance::locateReference(job.reference);
    refuseClashingOutputs({job.form, referencePath, job.tolerances}, {job.report});
    const conformance::Tolerances tolerances =
        job.tolerances.empty() ? conformance::Tolerances{} : conformance::readTolerances(job.tolerances);
    run.form = readTestForm(job.form, job.read, run.formWarnings);
    run.reference = conformance::readReference(referencePath);
    run.conditions = conformance::checkConditions(run.form->file, *run.reference, job.anyCondition);
    std::optional<PendingOutput> report;
    if (!job.report.empty())
        report.emplace(job.report);
    if (job.gamut)
        run.fit = fitModel(*run.form, ModelChoice::yuleNielsen);
    run.result = conformance::compare(*run.form, *run.reference, tolerances, run.fit ? run.fit->model.get() : nullptr);
    if (report) {
        report->write(conformanceReport(run));
        report->commit();
        run.report = report->name();
    }
}

} // namespace

Command setupConformanceCommand(CLI::App& app)
{
    struct Options {
        ConformanceJob job;
        ScaleOption scale;
        ReportStyle style;
        ConformanceRun run;
    };
    const auto options = std::make_shared<Options>();
    CLI::App* command = app.add_subcommand(
        "conformance", "the form's control patches and tone values against a reference printing condition, "
                       "with tolerances and a verdict, and the reference's whole gamut as this press prints it");
    command->add_option("FORM", options->job.form, "measurement file with the 46 test-form patches")
        ->required()
        ->check(kPath);
    command
        ->add_option("--reference", options->job.reference,
                     "reference data set: a CGATS/CTI3 file with CMYK and LAB, XYZ or spectra, or the name of an "
                     "installed one (FOGRA39L: looked for in $VELTMARQUIST_REFERENCES, /usr/share/color/icc, "
                     "/usr/share/color/argyll/ref)")
        ->required();
    command->add_option("--tolerances", options->job.tolerances,
                        "tolerance file: 'name value' per line (paper, cyan, magenta, yellow, black, red, green, "
                        "blue, cmy, cmyk, grey, tone-value)")
        ->check(kPath);
    command->add_flag("--any-condition", options->job.anyCondition,
                      "compare even when the measurement conditions (M0/M1/M2, illuminant, observer) differ");
    command->add_flag("!--no-gamut", options->job.gamut, "leave out the whole-gamut prediction");
    command->add_option("--report", options->job.report, "also write an HTML page of the comparison")->check(kPath);
    options->scale.add(*command);
    options->style.add(*command);
    return {command, [options] { return std::vector<std::string>{options->job.report}; },
            [options](std::ostream& report) {
                options->job.read = options->scale.readOptions();
                const auto render = options->style.pick<ConformanceRun>(renderConformance, jsonConformance);
                try {
                    runConformance(options->job, options->run);
                } catch (...) {
                    render(options->run, report);
                    throw;
                }
                render(options->run, report);
            },
            [options] { return options->run.result && !options->run.result->pass() ? kExitOutOfTolerance : 0; }};
}

} // namespace veltmarquist
