// The results of every command as one JSON object for scripts (--json), the
// same facts the text report prints. Stable: a field is only ever added,
// and "schema_version" counts changes that are not additions.
//
// Every object holds "schema_version", "command", "ok" (false when the
// command failed; the error is then on stderr and in the exit code), and
// "warnings". Commands that read a form add "form" (file, measurements,
// form_patches_found, other_measurements, scale, spectra), "model" (name and
// fitted_values: name -> numbers, or text) and, where the file measured
// more, "check" (count, mean, p95, max CIEDE2000, those on the chart, the
// left-out counts). "written" names each output delivered.
#ifndef VELTMARQUIST_TOOL_JSONREPORT_H
#define VELTMARQUIST_TOOL_JSONREPORT_H

#include "results/Results.h"

#include <ostream>

namespace veltmarquist {

constexpr int kJsonSchemaVersion = 1;

void jsonChart(const ChartResult& result, std::ostream& out);
void jsonReport(const ChartResult& result, std::ostream& out);
void jsonCompare(const CompareResult& result, std::ostream& out);
void jsonMultiChannel(const MultiChannelResult& result, std::ostream& out);
void jsonConvert(const ConvertResult& result, std::ostream& out);
void jsonProfile(const ProfileResult& result, std::ostream& out);
void jsonConformance(const ConformanceRun& run, std::ostream& out);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_JSONREPORT_H
