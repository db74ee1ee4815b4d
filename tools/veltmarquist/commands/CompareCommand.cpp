// compare FORM: the measured and the modelled 46-step charts of the test form
// and their colour differences, patch by patch. Both charts are written from
// values by the library's XYZ chart writer; the differences are taken
// between the X, Y, Z the two charts hold.
#include "Commands.h"

#include "CommandOptions.h"
#include "Failure.h"
#include "Files.h"
#include "OutputFile.h"
#include "report/JsonReport.h"
#include "report/TextReport.h"

#include <memory>
#include <optional>

namespace veltmarquist {

namespace {

struct CompareJob {
    std::string form;
    std::string folder = ".";
    ModelChoice model = ModelChoice::offset;
    ReadOptions read;
};

void runCompare(const CompareJob& job, CompareResult& result)
{
    // Into a folder as two files, or both charts one after the other on standard output.
    const bool standardOutput = isStandardOutput(job.folder);
    const std::string folder = job.folder.back() == '/' ? job.folder : job.folder + "/";
    const std::string stem = folder + fileStem(job.form);
    const std::string measuredPath = standardOutput ? job.folder : stem + ".measured46.txt";
    const std::string modelPath = standardOutput ? "" : stem + "." + kindOf(job.model) + "46.txt";
    refuseClashingOutputs({job.form}, {measuredPath, modelPath});
    result.form = readTestForm(job.form, job.read, result.formWarnings);
    PendingOutput measuredChart(measuredPath);
    std::optional<PendingOutput> modelChart;
    if (!standardOutput)
        modelChart.emplace(modelPath);

    FittedModel fit = fitModel(*result.form, job.model);
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
    if (standardOutput) {
        measuredChart.write(xyzChartText(coverages, measured) + xyzChartText(coverages, modelledXYZ));
    } else {
        measuredChart.write(xyzChartText(coverages, measured));
        modelChart->write(xyzChartText(coverages, modelledXYZ));
    }
    result.fit = std::move(fit);
    result.modelled = std::move(modelled);
    result.deltaEab = summarise(ab);
    measuredChart.commit();
    result.measuredWritten = measuredChart.name();
    if (modelChart) {
        modelChart->commit();
        result.modelWritten = modelChart->name();
    } else {
        result.modelWritten = result.measuredWritten + ", after the measured chart";
    }
}

} // namespace

Command setupCompareCommand(CLI::App& app)
{
    struct Options {
        CompareJob job;
        ScaleOption scale;
        ModelOption model;
        ReportStyle style;
    };
    const auto options = std::make_shared<Options>();
    CLI::App* command = app.add_subcommand(
        "compare", "measured and modelled 46-step charts of a test form and their colour differences");
    command->add_option("FORM", options->job.form, "measurement file with the 46 test-form patches")
        ->required()
        ->check(kPath);
    command
        ->add_option("-o,--output-folder", options->job.folder,
                     "folder for FORM.measured46.txt and FORM.offset46.txt / .gravure46.txt / .ynsn46.txt; - writes "
                     "both charts to standard output, the measured one first")
        ->capture_default_str()
        ->check(kPath);
    options->model.add(*command);
    options->scale.add(*command);
    options->style.add(*command);
    return {command, [options] { return std::vector<std::string>{options->job.folder}; },
            [options](std::ostream& report) {
                options->job.model = options->model.choice();
                options->job.read = options->scale.readOptions();
                runAndRender<CompareResult>([&](CompareResult& result) { runCompare(options->job, result); },
                                            options->style.pick<CompareResult>(renderCompare, jsonCompare), report);
            },
            {}};
}

} // namespace veltmarquist
