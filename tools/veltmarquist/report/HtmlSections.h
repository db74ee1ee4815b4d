// Parts that the four-colour and the multi-channel HTML reports share, and
// the check section of the four-colour report (HtmlCheck.cpp).
#ifndef VELTMARQUIST_TOOL_HTMLSECTIONS_H
#define VELTMARQUIST_TOOL_HTMLSECTIONS_H

#include "Html.h"
#include "results/Results.h"

#include <string>
#include <utility>
#include <vector>

namespace veltmarquist::html {

// The CIEDE2000 symbol as HTML, and as plain text for SVG titles.
extern const char* const kDeltaE00;
extern const char* const kDeltaE00Text;

// The page's head: title, the file, and links to the sections.
std::string pageHeader(const std::string& title, const std::string& subtitle,
                       const std::vector<std::pair<std::string, std::string>>& sections);

// A key figure: a large value over a small label (both HTML); `id` names the value.
std::string keyFigure(const std::string& value, const std::string& label, const std::string& id = "");

// Table rows about a measurement file: its name, sets, spectra, scale and
// where its measurements came from (provenanceOf).
std::string fileFacts(const std::string& path, const MeasurementFile& file,
                      const std::vector<std::pair<std::string, std::string>>& provenance);

// Warnings as a list, each escaped; empty when there are none.
std::string warningList(const std::vector<std::string>& warnings);

// Small multiples of spectra, 380-730 nm, on one reflectance scale: a solid
// line and, when given, a dashed second spectrum (modelled, or a reference).
struct SpectrumPanel {
    std::string title;       // plain text
    std::string caption;     // HTML, under the title
    const Spectrum* solid;   // measured
    const Spectrum* dashed;  // modelled or reference; may be null
    std::string dashedClass; // "modelled" or "reference"
};
std::string spectrumPanels(const std::vector<SpectrumPanel>& panels);

// "C 40 M 40 Y 40 K 0" without the zero inks ("C 40 M 40 Y 40"); "paper" for none.
std::string coverageText(const std::vector<double>& device, const std::vector<std::string>& names);

// L* a* b* as text with one decimal.
std::string labText(const Lab& lab);

std::string checkSection(const ChartResult& result);

// The colour of a CIEDE2000 value on the error maps' scale (viridis, light
// for small differences, dark for 4 and above); `dark` says that text on it
// should be white.
std::string heatColour(double value, bool& dark);

} // namespace veltmarquist::html

#endif // VELTMARQUIST_TOOL_HTMLSECTIONS_H
