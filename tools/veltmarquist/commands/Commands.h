// The tool's commands. Each reads its inputs, runs the library, writes its
// outputs and fills its result (results/Results.h) as it goes; on any
// failure it throws a ToolError, with no output left behind under its final
// name and the result holding the steps it finished.
#ifndef VELTMARQUIST_TOOL_COMMANDS_H
#define VELTMARQUIST_TOOL_COMMANDS_H

#include "MeasurementFile.h"
#include "results/Results.h"

#include "VeltmarquistDLL.h"

#include <optional>
#include <string>

namespace veltmarquist {

// chart FORM -o CHART: the characterisation chart of a four-colour process
// from the 46 test-form patches. By default the library's 900-patch chart:
// process 0 or 1 of the library, or the Yule-Nielsen model written in the
// library's layout; --format and --layout export other patches for profile
// builders. With `report` it also writes the HTML report of the form, the
// fit and the check; the report command is this without a chart (`output`
// empty).
struct ChartOptions {
    std::string form;
    std::string output; // empty: no chart
    std::string report; // empty: no HTML report
    PrintProcess process = VM_PROCESS_OFFSET;
    bool fitGravure = false;  // fit ink order and trapping factors first (gravure only)
    bool yuleNielsen = false; // the Yule-Nielsen model instead of the library's
    std::string format = "library"; // library, cti3 or cgats
    std::string layout = "chart";   // chart, grid, grid:N or a CGATS file
    bool spectral = false;          // also the predicted spectra (cti3, cgats)
    std::optional<double> inkLimit; // TOTAL_INK_LIMIT in percent (cti3, cgats)
    ReadOptions read;
};
void runChart(const ChartOptions& options, ChartResult& result);

// compare FORM: the measured and the modelled 46-step charts and their
// colour differences, patch by patch.
struct CompareOptions {
    std::string form;
    std::string outputFolder = ".";
    PrintProcess process = VM_PROCESS_OFFSET;
    bool fitGravure = false;
    bool yuleNielsen = false;
    ReadOptions read;
};
void runCompare(const CompareOptions& options, CompareResult& result);

// multichannel FORM --inks 6|7 -o CHART: the six- or seven-colour spectral
// chart (process 3 or 5), the extended C, M, Y, K combinations for the
// user's separation software, and with its separations the XYZ chart of
// process 6, all on one profile. With `report` it also writes the HTML report
// of paper, solids, chart and ramps; the report command is this without a
// chart to deliver (`output` empty).
struct MultiChannelOptions {
    std::string form;
    int inks = 7;
    std::string output; // empty: the chart is made for the report only
    std::string report; // empty: no HTML report
    std::string combinations;  // optional
    std::string separations;   // optional, needs separatedOutput
    std::string separatedOutput;
    ReadOptions read;
};
void runMultiChannel(const MultiChannelOptions& options, MultiChannelResult& result);

// convert CHART --from WHITE --to WHITE -o OUT: a measured chart copied,
// converted from one paper white to another, or blended (processes 7-9).
struct ConvertOptions {
    std::string chart;
    std::string from; // a file with one spectrum, or a sample name in the chart
    std::string to;
    std::string output;
    PrintProcess mode = VM_PROCESS_CHART_CONVERT;
    bool cmykOnly = false; // drop ink in channels 5-7 instead of refusing the chart
    ReadOptions read;
};
void runConvert(const ConvertOptions& options, ConvertResult& result);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_COMMANDS_H
