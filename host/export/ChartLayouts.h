// Which patches an exported chart holds: the library's 900-patch chart, a
// grid of coverage levels, or the device values of a target or measurement
// file, each with its sample identifiers, in a fixed order.
//
//     PatchLayout layout = readLayout("grid:11");        // or "chart", "grid", "ECI2002.ti2"
//     checkPredictable(layout, *model);                  // throws HostError when it cannot
//
// Failures are HostErrors of the kind every front end reports: a layout,
// format or option that does not exist is Failure::Usage; a layout file that
// cannot be read, is not CGATS or holds no C, M, Y, K values is
// InputUnreadable, InputSyntax or InputContent; a coverage the model cannot
// predict is Usage for a generated layout and InputContent for a file's
// patch; a value that is not finite is Calculation.
//
// The tool's --layout option and the Python package both name a layout with
// the same text, so they export the same patches.
#ifndef VELTMARQUIST_EXPORT_CHARTLAYOUTS_H
#define VELTMARQUIST_EXPORT_CHARTLAYOUTS_H

#include "MeasurementFile.h"

#include <cstddef>
#include <string>
#include <vector>

namespace veltmarquist {
class PrintModel; // models/PrintModels.h
}

namespace veltmarquist::exporting {

struct PatchLayout {
    std::string description;           // "grid of 11 levels per ink (0, 10, ..., 100 %)", for headers and reports
    std::string file;                  // the layout file as messages name it; empty for generated layouts
    std::vector<std::string> ids;      // the SAMPLE_ID of each patch
    std::vector<double> cmyk;          // C, M, Y, K in percent, four per patch
    std::vector<int> lines;            // each patch's line in its file; empty for generated layouts
    std::vector<std::string> warnings; // the layout file's reader warnings and the sample
                                       // identifiers replaced, one line each, without its name

    std::size_t size() const { return ids.size(); }
    // "sample 17 (C 0 M 30 Y 0 K 0)", or "ECI2002.ti2: sample A12 (line 40)" for a file's patch.
    std::string describePatch(std::size_t patch) const;
};

// The coverages printed on the four-colour test form, the same for each ink:
// 0, 10, 20, 40, 60, 70, 80, 90, 100 %.
std::vector<double> formLevels();

// `count` evenly spaced coverages from 0 to 100 %: level i is 100 i / (count - 1).
constexpr int kMinEvenLevels = 2;
constexpr int kMaxEvenLevels = 21; // 21^4 = 194,481 patches
std::vector<double> evenLevels(int count);

// The library's 900 combinations (MathProfile::toBeCalculated) in its order,
// SAMPLE_ID 1 to 900 as in the library's own chart.
PatchLayout characterisationChartLayout();

// Every combination of `levels` for the four inks. C changes slowest and K
// fastest: patch ((c n + m) n + y) n + k has SAMPLE_ID one more than that,
// where c, m, y, k index the levels and n is their count.
PatchLayout gridLayout(const std::vector<double>& levels, const std::string& description);

// The device values of a target or measurement file (CMYK_C..CMYK_K or
// 4CLR_1..4CLR_4), in the file's order with its SAMPLE_IDs (else its
// SAMPLE_NAMEs, else the set's number counted from 1). `name` is how
// messages name the file.
//
// Every identifier goes into the chart a profile builder reads back, so one
// that no reader may take is replaced by the patch's number, with a warning:
// an identifier longer than kMaxSampleIdBytes, or one that holds a blank, a
// quote, a control character, a byte that is not UTF-8, or a character that
// reorders or hides text. When a number would then name two patches, every
// patch is numbered.
constexpr std::size_t kMaxSampleIdBytes = 64;
PatchLayout fileLayout(const MeasurementFile& file, const std::string& name);

// True for the words that name generated layouts: "chart", "grid", "grid:..."
// (a malformed grid:N is still no file name).
bool isGeneratedLayout(const std::string& argument);

// "chart", "grid", "grid:N" (N from 2 to 21) or the path of a CGATS file.
// The three words win over files of that name: write ./grid for a file
// called grid.
PatchLayout readLayout(const std::string& argument);

// Refuses a layout with a coverage that the model does not predict: the
// message names the model's levels and the first patch that is not on them.
void checkPredictable(const PatchLayout& layout, const PrintModel& model);

} // namespace veltmarquist::exporting

#endif // VELTMARQUIST_EXPORT_CHARTLAYOUTS_H
