// A measured chart copied, converted from one paper white to another, or
// blended (the library's processes 7, 8 and 9), from values: the rules that
// the tool (from a chart file) and the Python package (from arrays) keep alike.
//
//     ChartConversion conversion;
//     conversion.mode = VM_PROCESS_CHART_CONVERT;
//     conversion.patches = ...;                     // spectra and channel values
//     conversion.from = printedPaper; conversion.to = targetPaper;
//     PendingOutput output("converted.txt");
//     ConversionOutcome done = convertChart(conversion, output, "press 4");
//     output.commit();
#ifndef VELTMARQUIST_HOST_CHARTCONVERSION_H
#define VELTMARQUIST_HOST_CHARTCONVERSION_H

#include "LibraryBlock.h"
#include "OutputFile.h"

#include "VeltmarquistDLL.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace veltmarquist {

// The most patches one conversion takes: the library's block holds 1999
// spectra, two of them the whites.
constexpr std::size_t kMaxConvertedPatches = 1997;

// One patch of the chart: its spectrum and its channel values.
struct ConversionPatch {
    MeasuredSpectrum spectrum;
    std::vector<std::int32_t> channels; // kDeviceUnits per percent, up to 7 (C, M, Y, K, further inks)
    std::string label;                  // how messages name the patch ("line 12", "patch 3")
};

struct ChartConversion {
    PrintProcess mode = VM_PROCESS_CHART_CONVERT; // copy (7), convert (8) or blend (9)
    std::vector<ConversionPatch> patches;
    // The whites: the paper the chart was printed on and the paper to convert
    // to, with how messages name them. A copy needs neither.
    std::optional<MeasuredSpectrum> from, to;
    std::string fromLabel, toLabel;
    // The converted chart holds C, M, Y, K only: ink in channels 5-7 is
    // refused unless it may be dropped. `dropOption` names how the front end
    // allows it ("--cmyk-only", "cmyk_only=True").
    bool dropFurtherChannels = false;
    std::string dropOption;
    std::string source; // how messages name the chart ("chart.txt"; empty for values)
};

struct ConversionOutcome {
    std::size_t patches = 0;
    double whitesApart = 0.0; // CIE 1976 dE*ab of the two whites; 0 without them
    double blendWeight = 0.0; // the weight of the converted spectra in a blend
};

// Refuses (HostError) a conversion the library cannot make or that would lose
// ink: no patches or more than kMaxConvertedPatches (InputContent), a mode
// that is none of the three or a conversion without both whites (Usage), a
// channel value outside 0..100 % or ink in channels 5-7 (InputContent), a
// --from white with no reflectance in a band (InputContent: the conversion
// divides by it). Then runs the library into the output's temporary file,
// on a profile named `profileName`.
ConversionOutcome convertChart(const ChartConversion& conversion, const PendingOutput& output,
                               const std::string& profileName);

} // namespace veltmarquist

#endif // VELTMARQUIST_HOST_CHARTCONVERSION_H
