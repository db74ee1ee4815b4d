// The results of the commands as the terminal text of a run: the report
// (one stream, normally standard output) and the warnings (one escaped line
// each on stderr, through printMessage). A result that a failure cut short
// renders the steps it finished, as the run showed them before the error.
#ifndef VELTMARQUIST_TOOL_TEXTREPORT_H
#define VELTMARQUIST_TOOL_TEXTREPORT_H

#include "results/Results.h"

#include <ostream>

namespace veltmarquist {

void renderChart(const ChartResult& result, std::ostream& out);
void renderCompare(const CompareResult& result, std::ostream& out);
void renderMultiChannel(const MultiChannelResult& result, std::ostream& out);
void renderConvert(const ConvertResult& result, std::ostream& out);
void renderProfile(const ProfileResult& result, std::ostream& out);
void renderConformance(const ConformanceRun& run, std::ostream& out);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_TEXTREPORT_H
