// veltmarquist: the command-line host of the library.
//
// Parses the command line, runs one command, renders its result as the
// report, and maps every failure to one line on stderr and a documented exit
// code.
#include "Messages.h"
#include "OutputFile.h"
#include "ToolError.h"
#include "commands/Commands.h"
#include "report/TextReport.h"

#include "VeltmarquistDLL.h"

#include <CLI/CLI.hpp>

#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <iostream>
#include <new>

#ifndef VELTMARQUIST_VERSION
#define VELTMARQUIST_VERSION "unknown"
#endif

namespace {

using namespace veltmarquist;

const char* const kExitCodes =
    "An output given as - goes to standard output; the report then goes to stderr.\n\n"
    "Exit codes:\n"
    "  0  success\n"
    "  1  internal error\n"
    "  2  bad command line; outputs that clash with an input or with each other\n"
    "  3  an input file cannot be opened or read\n"
    "  4  an input file is not readable CGATS / IT8 text\n"
    "  5  unsupported content: unknown spectral layout, missing fields, bad values\n"
    "  6  a patch the calculation needs is missing\n"
    "  7  duplicate patch: one sample identifier names two different patches\n"
    "  8  an output cannot be written (including standard output)\n"
    "  9  the library rejected or failed the calculation, or its result is not finite\n";

std::string versionText()
{
    char number[32];
    std::snprintf(number, sizeof number, "%.1f", VeltmarquistDLLVersionNumber);
    return std::string("veltmarquist ") + VELTMARQUIST_VERSION + " (library VeltmarquistDLL " + number + ")";
}

void addScale(CLI::App& command, std::string& scale)
{
    command
        .add_option("--scale", scale,
                    "reflectance scale of the input spectra: auto (decided from the paper and the bulk of the values), 1 or 100")
        ->check(CLI::IsMember({"auto", "1", "100"}))
        ->capture_default_str();
}

ReadOptions readOptions(const std::string& scale)
{
    ReadOptions options;
    options.scale = scale == "auto" ? 0.0 : std::stod(scale);
    return options;
}

PrintProcess fourColourProcess(const std::string& name)
{
    return name == "gravure" ? VM_PROCESS_GRAVURE : VM_PROCESS_OFFSET;
}

void addModel(CLI::App& command, std::string& model)
{
    command
        .add_option("--model", model,
                    "library: the library's offset or gravure model (see --process); ynsn: the Yule-Nielsen "
                    "spectral Neugebauer model, for any coverage")
        ->check(CLI::IsMember({"library", "ynsn"}))
        ->capture_default_str();
}

// The process of chart and compare: --fit-gravure implies gravure and
// contradicts an explicit --process offset; both choose among the library's
// models and contradict --model ynsn.
PrintProcess chosenProcess(const CLI::App& command, const std::string& name, bool fitGravure, bool yuleNielsen)
{
    const bool given = command.get_option("--process")->count() > 0;
    if (yuleNielsen && (given || fitGravure))
        throw ToolError(Failure::Usage, std::string(given ? "--process" : "--fit-gravure") +
                                            " chooses among the library's models; it cannot go with --model ynsn");
    if (fitGravure && given && name == "offset")
        throw ToolError(Failure::Usage, "--fit-gravure fits the gravure model; it cannot go with --process offset");
    return fitGravure ? VM_PROCESS_GRAVURE : fourColourProcess(name);
}

// Runs a command and renders its result, also the part a failure left.
template <typename Result, typename Options>
void runAndRender(void (*run)(const Options&, Result&), void (*render)(const Result&, std::ostream&),
                  const Options& options, std::ostream& report)
{
    Result result;
    try {
        run(options, result);
    } catch (...) {
        render(result, report);
        throw;
    }
    render(result, report);
}

int fail(const ToolError& error, std::ostream& report)
{
    report.flush();
    printMessage("error", error.what());
    return exitCodeOf(error.failure());
}

const char* const kCommandNames = "chart, compare, multichannel, convert, report";

// What is wrong with the command itself (the first word that is not an
// option must name a command), or else CLI11's message as one line.
std::string usageMessage(const CLI::ParseError& error, int argc, char** argv)
{
    if (argc < 2)
        return std::string("no command given; commands: ") + kCommandNames;
    for (int at = 1; at < argc; ++at) {
        const std::string word = argv[at];
        if (word.empty() || word[0] == '-')
            continue;
        if ((std::string(", ") + kCommandNames + ",").find(", " + word + ",") == std::string::npos)
            return "unknown command '" + word + "'; commands: " + kCommandNames;
        break;
    }
    std::string message;
    for (const char character : std::string(error.what())) {
        if (character != '\n')
            message += character;
        else if (!message.empty() && message.back() != ' ')
            message += "; ";
    }
    while (!message.empty() && (message.back() == ' ' || message.back() == ';'))
        message.pop_back();
    return message + " (see veltmarquist --help)";
}

} // namespace

int main(int argc, char** argv)
{
    CLI::App app{"Spectral print models and characterisation charts from measured test forms.", "veltmarquist"};
    app.set_version_flag("--version", versionText());
    app.require_subcommand(1);
    app.footer(kExitCodes);

    std::string scale = "auto", processName = "offset", model = "library";

    ChartOptions chart;
    CLI::App* chartCommand = app.add_subcommand(
        "chart", "characterisation chart (XYZ) from a measured four-colour test form: the library's 900 patches, "
                 "or a grid or target for profile builders");
    chartCommand->add_option("FORM", chart.form, "measurement file with the 46 test-form patches (any order)")
        ->required();
    chartCommand->add_option("-o,--output", chart.output, "chart file to write")->required();
    chartCommand
        ->add_option("--format", chart.format,
                     "library: the library's own XYZ chart; cti3: for profile builders (CTI3, XYZ and Lab in full "
                     "precision); cgats: the same fields as plain CGATS.17")
        ->check(CLI::IsMember({"library", "cti3", "cgats"}))
        ->capture_default_str();
    chartCommand
        ->add_option("--layout", chart.layout,
                     "chart: the library's 900 combinations; grid: every combination of the form's 9 levels (6561); "
                     "grid:N: N even levels per ink (--model ynsn); FILE: the device values of a CGATS target")
        ->capture_default_str();
    chartCommand->add_flag("--spectral", chart.spectral, "also write the predicted spectra, 380-730 nm (cti3, cgats)");
    chartCommand->add_option("--ink-limit", chart.inkLimit,
                             "write TOTAL_INK_LIMIT PERCENT for the profile builder's separations (cti3, cgats); "
                             "removes no patch");
    chartCommand->add_option("--process", processName, "print model")
        ->check(CLI::IsMember({"offset", "gravure"}))
        ->capture_default_str();
    chartCommand->add_flag("--fit-gravure", chart.fitGravure,
                           "fit the gravure ink order and trapping factors first (implies --process gravure)");
    chartCommand->add_option("--report", chart.report,
                             "also write the HTML report of the form, the fit and the check (as the report command)");
    addModel(*chartCommand, model);
    addScale(*chartCommand, scale);

    CompareOptions compare;
    CLI::App* compareCommand = app.add_subcommand(
        "compare", "measured and modelled 46-step charts of a test form and their colour differences");
    compareCommand->add_option("FORM", compare.form, "measurement file with the 46 test-form patches")->required();
    compareCommand->add_option("-o,--output-folder", compare.outputFolder,
                               "folder for FORM.measured46.txt and FORM.offset46.txt / .gravure46.txt / .ynsn46.txt")
        ->capture_default_str();
    compareCommand->add_option("--process", processName, "print model")
        ->check(CLI::IsMember({"offset", "gravure"}))
        ->capture_default_str();
    compareCommand->add_flag("--fit-gravure", compare.fitGravure, "fit the gravure model first");
    addModel(*compareCommand, model);
    addScale(*compareCommand, scale);

    MultiChannelOptions multi;
    CLI::App* multiCommand = app.add_subcommand(
        "multichannel", "six- or seven-colour spectral chart, extended combinations and their separated XYZ chart");
    multiCommand->add_option("FORM", multi.form, "measurement file with paper and solids (nCLR_1 ... nCLR_n fields)")
        ->required();
    multiCommand->add_option("--inks", multi.inks, "number of inks")->required()->check(CLI::IsMember({6, 7}));
    multiCommand->add_option("-o,--output", multi.output, "spectral chart to write")->required();
    multiCommand->add_option("--combinations", multi.combinations,
                             "write the 3499 extended C, M, Y, K combinations (CGATS) here");
    CLI::Option* separations = multiCommand->add_option(
        "--separations", multi.separations, "the separation software's channel values for the combinations (CGATS, %)");
    CLI::Option* separatedOut = multiCommand->add_option("--separated-out", multi.separatedOutput,
                                                         "XYZ chart of the separated combinations to write");
    separations->needs(separatedOut);
    separatedOut->needs(separations);
    multiCommand->add_option("--report", multi.report, "also write the HTML report of paper, solids, chart and ramps");
    addScale(*multiCommand, scale);

    // report: the chart command's form, fit and check (or the multichannel
    // command's chart and ramps) as an HTML page, without a chart.
    std::string reportForm, reportOutput;
    int reportInks = 0;
    bool reportFitGravure = false;
    CLI::App* reportCommand = app.add_subcommand(
        "report", "HTML report of a measured form: the test form, the model's fit and its check against everything "
                  "else the file measured (or, with --inks, a multi-channel form's chart and ramps)");
    reportCommand->add_option("FORM", reportForm, "measurement file with the 46 test-form patches (any order)")
        ->required();
    reportCommand->add_option("-o,--output", reportOutput, "HTML file to write")->required();
    reportCommand->add_option("--process", processName, "print model")
        ->check(CLI::IsMember({"offset", "gravure"}))
        ->capture_default_str();
    reportCommand->add_flag("--fit-gravure", reportFitGravure,
                            "fit the gravure ink order and trapping factors first (implies --process gravure)");
    addModel(*reportCommand, model);
    reportCommand->add_option("--inks", reportInks, "a six- or seven-colour form (nCLR_1 ... nCLR_n fields)")
        ->check(CLI::IsMember({6, 7}));
    addScale(*reportCommand, scale);

    ConvertOptions convert;
    std::string mode = "convert";
    CLI::App* convertCommand =
        app.add_subcommand("convert", "measured spectral chart copied, converted or blended to another paper white");
    convertCommand->add_option("CHART", convert.chart, "measured chart (device and spectral fields)")->required();
    convertCommand->add_option("--from", convert.from,
                               "white the chart was printed on: a file with one spectrum, or a sample name in CHART");
    convertCommand->add_option("--to", convert.to, "white to convert to: a file or a sample name in CHART");
    convertCommand->add_option("--mode", mode, "copy, convert, or blend converted and measured spectra")
        ->check(CLI::IsMember({"copy", "convert", "blend"}))
        ->capture_default_str();
    convertCommand->add_option("-o,--output", convert.output, "spectral chart to write")->required();
    convertCommand->add_flag("--cmyk-only", convert.cmykOnly,
                             "drop channels 5-7 (the converted chart holds C, M, Y, K only) instead of refusing");
    addScale(*convertCommand, scale);

    // A closed pipe shows as EPIPE where the tool writes: the report stops
    // quietly, a chart on standard output ends the run quietly.
    std::signal(SIGPIPE, SIG_IGN);
    cleanUpTemporariesOnSignals();
    try {
        app.parse(argc, argv);
    } catch (const CLI::Success& done) {
        errno = 0;
        const int code = app.exit(done); // --help, --version
        std::cout.flush();
        if (!std::cout && errno != EPIPE)
            return fail(ToolError(Failure::OutputUnwritable, std::string("standard output: write failed: ") +
                                                                 std::strerror(errno != 0 ? errno : EIO)),
                        std::cerr);
        return code;
    } catch (const CLI::ParseError& error) {
        return fail(ToolError(Failure::Usage, usageMessage(error, argc, argv)), std::cerr);
    }

    // With an output on standard output the report goes to stderr.
    bool chartOnStandardOutput = false;
    for (const std::string* output : {&chart.output, &chart.report, &multi.output, &multi.combinations,
                                      &multi.separatedOutput, &multi.report, &convert.output, &reportOutput})
        chartOnStandardOutput = chartOnStandardOutput || isStandardOutput(*output);
    const int reportDescriptor = chartOnStandardOutput ? STDERR_FILENO : STDOUT_FILENO;
    ReportBuffer reportBuffer(reportDescriptor);
    std::ostream report(&reportBuffer);

    try {
        const ReadOptions read = readOptions(scale);
        if (*chartCommand) {
            chart.yuleNielsen = model == "ynsn";
            chart.process = chosenProcess(*chartCommand, processName, chart.fitGravure, chart.yuleNielsen);
            chart.read = read;
            runAndRender(runChart, renderChart, chart, report);
        } else if (*compareCommand) {
            compare.yuleNielsen = model == "ynsn";
            compare.process = chosenProcess(*compareCommand, processName, compare.fitGravure, compare.yuleNielsen);
            compare.read = read;
            runAndRender(runCompare, renderCompare, compare, report);
        } else if (*multiCommand) {
            multi.read = read;
            runAndRender(runMultiChannel, renderMultiChannel, multi, report);
        } else if (*convertCommand) {
            convert.mode = mode == "copy" ? VM_PROCESS_CHART_COPY
                                          : mode == "blend" ? VM_PROCESS_CHART_BLEND : VM_PROCESS_CHART_CONVERT;
            if (convert.mode != VM_PROCESS_CHART_COPY && (convert.from.empty() || convert.to.empty()))
                throw ToolError(Failure::Usage, "--mode " + mode + " needs --from and --to");
            convert.read = read;
            runAndRender(runConvert, renderConvert, convert, report);
        } else if (*reportCommand && reportCommand->get_option("--inks")->count() > 0) {
            const bool yuleNielsen = model == "ynsn";
            if (yuleNielsen || reportFitGravure || reportCommand->get_option("--process")->count() > 0)
                throw ToolError(Failure::Usage, "--inks reports a multi-channel form; it cannot go with --process, "
                                                "--fit-gravure or --model");
            MultiChannelOptions options;
            options.form = reportForm;
            options.inks = reportInks;
            options.report = reportOutput;
            options.read = read;
            runAndRender(runMultiChannel, renderMultiChannel, options, report);
        } else if (*reportCommand) {
            ChartOptions options;
            options.form = reportForm;
            options.report = reportOutput;
            options.fitGravure = reportFitGravure;
            options.yuleNielsen = model == "ynsn";
            options.process = chosenProcess(*reportCommand, processName, options.fitGravure, options.yuleNielsen);
            options.read = read;
            runAndRender(runChart, renderChart, options, report);
        }
    } catch (const ToolError& error) {
        return fail(error, report);
    } catch (const std::bad_alloc&) {
        return fail(ToolError(Failure::Internal, "out of memory"), report);
    } catch (const std::exception& error) {
        return fail(ToolError(Failure::Internal, error.what()), report);
    }
    report.flush();
    if (reportBuffer.error() != 0 && reportDescriptor == STDOUT_FILENO)
        return fail(ToolError(Failure::OutputUnwritable,
                              std::string("standard output: cannot write the report: ") +
                                  std::strerror(reportBuffer.error())),
                    report);
    return 0;
}
