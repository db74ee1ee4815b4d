// Charts for profile builders: a fitted print model predicts a layout's
// patches, and the chart is written as CGATS text that a profile builder
// takes as it is.
//
//     const FormProvenance form = provenanceOf(measured, "press4.txt");
//     ExportOptions options;                           // CTI3, no spectra, no ink limit
//     options.inkLimit = 300;
//     std::string text = exportChart(*model, form, readLayout("grid"), options);
//
// The tool's chart command and the Python package both call exportChart, so
// the same model, form, layout and options give the same bytes. Writing the
// text to disk (atomically) is the caller's part. The library's own chart
// format comes from the library's own writer (xyzChartText), which gives the
// bytes of CalculateChart for the library's models.
#ifndef VELTMARQUIST_EXPORT_CHARTEXPORT_H
#define VELTMARQUIST_EXPORT_CHARTEXPORT_H

#include "ChartLayouts.h"

#include <optional>
#include <ostream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace veltmarquist::exporting {

enum class ChartFormat {
    library, // the library's XYZ chart layout (of any layout's patches), by the library's writer
    cti3,    // CGATS with sheet type CTI3, DEVICE_CLASS and COLOR_REP, as profile builders read it
    cgats    // plain CGATS.17 with the same fields
};
// The format "library", "cti3" or "cgats" names; Failure::Usage for another name.
ChartFormat chartFormatNamed(std::string_view name);

// What the export says about the form the model was fitted to.
struct FormProvenance {
    std::string name; // the form's file name without its folders
    std::vector<std::pair<std::string, std::string>> keywords; // the form's header keywords, in file order
};
FormProvenance provenanceOf(const MeasurementFile& form, const std::string& path);

struct ExportOptions {
    ChartFormat format = ChartFormat::cti3;
    bool spectral = false;         // also write the 36 predicted bands, 380-730 nm
    std::optional<double> inkLimit; // TOTAL_INK_LIMIT in percent (kMinInkLimit..kMaxInkLimit); never guessed
    std::optional<double> blackLimit; // BLACK_INK_LIMIT in percent (0..100); never guessed
    std::string created;           // the CREATED value; empty: createdNow()
};

// The current time as CGATS writes it, ISO 8601 in UTC ("2025-11-23T06:36:00Z");
// SOURCE_DATE_EPOCH, when set to a number of seconds, replaces the clock so
// that builds can repeat a file byte for byte.
std::string createdNow();

// The total ink limits a press can have: from one solid to four.
constexpr double kMinInkLimit = 100.0, kMaxInkLimit = 400.0;

// The TARGET_INSTRUMENT of a chart whose form names no instrument a profile
// builder knows: a common spectrophotometer of print shops, so that the
// builder's compensation of optical brighteners (colprof -f) can run.
constexpr const char* kDefaultInstrument = "X-Rite i1 Pro 2";

// Refuses options that do not go together (Failure::Usage): spectra or ink
// limits with the library format, an ink limit outside 100..400 %, a black
// limit outside 0..100 %.
void checkOptions(const ExportOptions& options);

// The chart of `layout` predicted by `model`, as CGATS text (LF line ends).
// Fields SAMPLE_ID, CMYK_C..CMYK_K, XYZ_X..XYZ_Z (D50, 2 degree, 0..100, not
// limited to Y = 100), LAB_L..LAB_B (the CIE formula on those X, Y, Z with
// the ICC's D50 white, as a reader computes it), and with `spectral` the 36 bands as
// SPEC_380..SPEC_730 in percent (CTI3, SPECTRAL_NORM 100) or as reflectance
// factors 0..1 in SPECTRAL_NM380..SPECTRAL_NM730 (CGATS).
// Every number is the shortest text that reads back as the same double.
// The library format writes the library's XYZ chart layout instead (Y limited,
// cut to two decimals, patches numbered from 1).
// Throws HostError: Usage for spectra or an ink limit with the library
// format or an ink limit out of range; for a coverage the model does not
// predict, as checkPredictable; Calculation for a value that is not finite.
// The chart is predicted, checked and written in batches of patches, so that
// memory stays constant apart from the layout itself whatever the chart's
// size; every value is checked finite before it is formatted. On a throw,
// `out` holds a part of the chart: write it where a failure discards it.
void exportChart(const PrintModel& model, const FormProvenance& form, const PatchLayout& layout,
                 const ExportOptions& options, std::ostream& out);
std::string exportChart(const PrintModel& model, const FormProvenance& form, const PatchLayout& layout,
                        const ExportOptions& options);

} // namespace veltmarquist::exporting

#endif // VELTMARQUIST_EXPORT_CHARTEXPORT_H
