// The results of chart (and report) and of multichannel as one
// self-contained HTML page: what the form holds, how the model reproduces
// it, and how well it predicts what the file measured beyond the form.
//
// It renders the results the commands filled (results/Results.h) and the
// text report prints; it computes no prediction and no check of its own.
#ifndef VELTMARQUIST_TOOL_HTMLREPORT_H
#define VELTMARQUIST_TOOL_HTMLREPORT_H

#include "results/Results.h"

#include <string>

namespace veltmarquist {

// Summary, test form, spectra, tone values and, when the file measured
// combinations beyond the form, the check. Needs the form and the model.
std::string htmlReport(const ChartResult& result);

// Summary, paper and solids, the spectral chart's colours and the ramps.
// Needs the form and the chart.
std::string htmlReport(const MultiChannelResult& result);

// The conformance check: verdict, control patches, tone value increase and
// the whole gamut. Needs the form, the reference and the comparison.
std::string conformanceReport(const ConformanceRun& run);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_HTMLREPORT_H
