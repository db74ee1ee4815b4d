// The tool's commands. Each command's file declares its subcommand with the
// options it owns and what runs it; main keeps the application, the version
// flag and the failure mapping.
//
// A command reads its inputs, runs the library through the host tier, writes
// its outputs and fills its result (results/Results.h) as it goes; on any
// failure it throws a HostError, with no output left behind under its final
// name and the result holding the steps it finished.
#ifndef VELTMARQUIST_TOOL_COMMANDS_H
#define VELTMARQUIST_TOOL_COMMANDS_H

#include "FourColourForm.h"
#include "MeasurementFile.h"
#include "ModelChoice.h"
#include "results/Results.h"

#include <CLI/CLI.hpp>

#include <functional>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

namespace veltmarquist {

struct Command {
    CLI::App* app = nullptr;
    // The outputs the options name: when one is standard output ("-"), the
    // report goes to stderr.
    std::function<std::vector<std::string>()> outputs;
    // Runs the command and renders its result on `report`, also the part a
    // failure left.
    std::function<void(std::ostream& report)> run;
    // The exit code of a run that ended without a failure (empty: 0).
    std::function<int()> status;
};

// The exit code of a conformance check whose verdict is FAIL: distinct from
// every failure's code (Failure.h).
constexpr int kExitOutOfTolerance = 10;

Command setupChartCommand(CLI::App& app);
Command setupReportCommand(CLI::App& app);
Command setupCompareCommand(CLI::App& app);
Command setupMultiChannelCommand(CLI::App& app);
Command setupConvertCommand(CLI::App& app);
Command setupProfileCommand(CLI::App& app);
Command setupConformanceCommand(CLI::App& app);

// ---- What chart and report run, and multichannel and report --inks -----------------------

// The characterisation chart of a four-colour form and its check: the
// library's 900-patch chart, or an export for profile builders, and with
// `report` the HTML report of the form, the fit and the check. Without
// `output` (the report command) only the report.
struct ChartJob {
    std::string form;
    std::string output; // empty: no chart
    std::string report; // empty: no HTML report
    ModelChoice model = ModelChoice::offset;
    std::string format = "library"; // library, cti3 or cgats
    std::string layout = "chart";   // chart, grid, grid:N or a CGATS file
    bool spectral = false;          // also the predicted spectra (cti3, cgats)
    std::optional<double> inkLimit; // TOTAL_INK_LIMIT in percent (cti3, cgats)
    std::optional<double> blackLimit; // BLACK_INK_LIMIT in percent (cti3, cgats)
    ReadOptions read;
};
void runChart(const ChartJob& job, ChartResult& result);

// The six- or seven-colour spectral chart, the extended combinations and
// with separations the XYZ chart of the separated set, on one profile; with
// `report` the HTML report of paper, solids, chart and ramps. Without
// `output` (report --inks) the chart is made for the report only.
struct MultiChannelJob {
    std::string form;
    int inks = 7;
    std::string output;
    std::string report;
    std::string combinations;
    std::string separations; // needs separatedOutput
    std::string separatedOutput;
    ReadOptions read;
};
void runMultiChannel(const MultiChannelJob& job, MultiChannelResult& result);

// Runs a command's step and renders its result, also the part a failure left.
template <typename Result, typename Run, typename Render>
void runAndRender(Run run, Render render, std::ostream& report)
{
    Result result;
    try {
        run(result);
    } catch (...) {
        render(result, report);
        throw;
    }
    render(result, report);
}

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_COMMANDS_H
