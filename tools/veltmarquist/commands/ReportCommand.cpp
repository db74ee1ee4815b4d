// report FORM -o PAGE: the HTML report of a measured form without a chart:
// the test form, the model's fit and its check against everything else the
// file measured, or with --inks a multi-channel form's chart and ramps.
#include "Commands.h"

#include "CommandOptions.h"
#include "Failure.h"
#include "report/JsonReport.h"
#include "report/TextReport.h"

#include <memory>

namespace veltmarquist {

Command setupReportCommand(CLI::App& app)
{
    struct Options {
        std::string form, output;
        int inks = 0;
        ScaleOption scale;
        ModelOption model;
        ReportStyle style;
        CLI::App* command = nullptr;
        CLI::Option* inksOption = nullptr;
    };
    const auto options = std::make_shared<Options>();
    CLI::App* command = app.add_subcommand(
        "report", "HTML report of a measured form: the test form, the model's fit and its check against everything "
                  "else the file measured (or, with --inks, a multi-channel form's chart and ramps)");
    command->add_option("FORM", options->form, "measurement file with the 46 test-form patches (any order)")
        ->required()
        ->check(kPath);
    command->add_option("-o,--output", options->output, "HTML file to write (- for standard output)")
        ->required()
        ->check(kPath);
    options->command = command;
    options->model.add(*command);
    options->inksOption = command->add_option("--inks", options->inks,
                                              "a six- or seven-colour form (nCLR_1 ... nCLR_n fields)")
                              ->check(CLI::IsMember({6, 7}));
    options->scale.add(*command);
    options->style.add(*command);
    return {command, [options] { return std::vector<std::string>{options->output}; },
            [options](std::ostream& report) {
                if (options->inksOption->count() > 0) {
                    for (const char* model : {"--model", "--process", "--fit-gravure"})
                        if (options->command->count(model) > 0)
                            throw HostError(Failure::Usage, std::string("--inks reports a multi-channel form; it "
                                                                        "cannot go with ") + model);
                    MultiChannelJob job;
                    job.form = options->form;
                    job.inks = options->inks;
                    job.report = options->output;
                    job.read = options->scale.readOptions();
                    runAndRender<MultiChannelResult>([&](MultiChannelResult& result) { runMultiChannel(job, result); },
                                                     options->style.pick<MultiChannelResult>(renderMultiChannel, jsonMultiChannel),
                                                     report);
                    return;
                }
                ChartJob job;
                job.form = options->form;
                job.report = options->output;
                job.model = options->model.choice();
                job.read = options->scale.readOptions();
                runAndRender<ChartResult>([&](ChartResult& result) { runChart(job, result); },
                                          options->style.pick<ChartResult>(renderChart, jsonReport), report);
            },
            {}};
}

} // namespace veltmarquist
