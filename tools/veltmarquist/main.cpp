// veltmarquist: the command-line host of the library.
//
// Declares the application and its commands (each command's file owns its
// options), runs the one the command line names, and maps every failure to
// one line on stderr and a documented exit code.
#include "Failure.h"
#include "Messages.h"
#include "Numbers.h"
#include "OutputFile.h"
#include "commands/Commands.h"

#include "VeltmarquistDLL.h"

#include <CLI/CLI.hpp>

#include <unistd.h>

#include <cerrno>
#include <csignal>
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
    "  9  the library rejected or failed the calculation, or its result is not finite\n"
    " 10  conformance: the press is out of tolerance (the verdict FAIL)\n";

std::string versionText()
{
    return std::string("veltmarquist ") + VELTMARQUIST_VERSION + " (library VeltmarquistDLL " +
           fixedText(VeltmarquistDLLVersionNumber, 1) + ")";
}

int fail(const HostError& error, std::ostream& report)
{
    report.flush();
    printMessage("error", error.what());
    return exitCodeOf(error.failure());
}

// CLI11's message as one line; for a first word that names no command, or
// an option before the command, what the command line must look like.
std::string usageMessage(const CLI::App& app, const CLI::ParseError& error, int argc, char** argv)
{
    std::string commands;
    bool named = false;
    for (const CLI::App* command : app.get_subcommands(std::function<bool(const CLI::App*)>())) {
        commands += (commands.empty() ? "" : ", ") + command->get_name();
        named = named || (argc > 1 && command->get_name() == argv[1]);
    }
    if (argc < 2)
        return "no command given; commands: " + commands;
    const std::string first = argv[1];
    if (first.empty() || first[0] == '-')
        return "'" + first + "' is not a command or --help or --version; give the command first (" + commands + ")";
    if (!named)
        return "unknown command '" + first + "'; commands: " + commands;
    std::string message;
    for (const char character : std::string(error.what())) {
        if (character != '\n')
            message += character;
        else if (!message.empty() && message.back() != ' ')
            message += "; ";
    }
    while (!message.empty() && (message.back() == ' ' || message.back() == ';'))
        message.pop_back();
    return message + " (see veltmarquist " + first + " --help)";
}

} // namespace

int main(int argc, char** argv)
{
    CLI::App app{"Spectral print models and characterisation charts from measured test forms.", "veltmarquist"};
    app.set_version_flag("--version", versionText());
    app.require_subcommand(1);
    app.footer(kExitCodes);
    const Command commands[] = {setupProfileCommand(app),     setupChartCommand(app),        setupReportCommand(app),
                                setupConformanceCommand(app), setupCompareCommand(app),      setupMultiChannelCommand(app),
                                setupConvertCommand(app)};

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
            return fail(HostError(Failure::OutputUnwritable, std::string("standard output: write failed: ") +
                                                                 std::strerror(errno != 0 ? errno : EIO)),
                        std::cerr);
        return code;
    } catch (const CLI::ParseError& error) {
        return fail(HostError(Failure::Usage, usageMessage(app, error, argc, argv)), std::cerr);
    }

    const Command* chosen = nullptr;
    for (const Command& command : commands)
        if (command.app->parsed())
            chosen = &command;
    // With an output on standard output the report goes to stderr.
    bool outputOnStandardOutput = false;
    for (const std::string& output : chosen->outputs())
        outputOnStandardOutput = outputOnStandardOutput || isStandardOutput(output);
    const int reportDescriptor = outputOnStandardOutput ? STDERR_FILENO : STDOUT_FILENO;
    ReportBuffer reportBuffer(reportDescriptor);
    std::ostream report(&reportBuffer);

    try {
        chosen->run(report);
    } catch (const HostError& error) {
        return fail(error, report);
    } catch (const std::bad_alloc&) {
        return fail(HostError(Failure::Internal, "out of memory"), report);
    } catch (const std::domain_error& error) {
        // A model's result that is not a colour (the library refuses to hand it over).
        return fail(HostError(Failure::Calculation, error.what()), report);
    } catch (const std::exception& error) {
        return fail(HostError(Failure::Internal, error.what()), report);
    }
    report.flush();
    if (reportBuffer.error() != 0 && reportDescriptor == STDOUT_FILENO)
        return fail(HostError(Failure::OutputUnwritable,
                              std::string("standard output: cannot write the report: ") +
                                  std::strerror(reportBuffer.error())),
                    report);
    return chosen->status ? chosen->status() : 0;
}
