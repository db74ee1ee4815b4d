// The conformance page: the verdict, the control patches as swatches beside
// the reference with their differences and tolerances, the tone value
// increase of each ink against the reference's, and the whole gamut of the
// reference as this press's model predicts it.
#include "HtmlReport.h"
#include "HtmlSections.h"

#include <cmath>

namespace veltmarquist {

namespace {

using namespace html;

// X, Y, Z (D50, 0..100) of a CIELAB colour, for its swatch.
Triple XYZOfLab(const Lab& lab)
{
    const double fy = (lab.L + 16.0) / 116.0, fx = fy + lab.a / 500.0, fz = fy - lab.b / 200.0;
    const auto inverse = [](double f) {
        return f > 6.0 / 29.0 ? f * f * f : 3.0 * (6.0 / 29.0) * (6.0 / 29.0) * (f - 4.0 / 29.0);
    };
    return {96.422 * inverse(fx), 100.0 * inverse(fy), 82.521 * inverse(fz)};
}

std::string verdictCell(bool pass)
{
    return pass ? "<span class=\"pass\">pass</span>" : "<strong class=\"fail\">FAIL</strong>";
}

std::string controlSection(const conformance::ConformanceResult& result)
{
    std::string out = "<table id=\"controls\">\n" +
                      headerRow({"Patch", "measured | reference", "measured L* a* b*", "reference L* a* b*", kDeltaE00,
                                 "\xCE\x94" "E*ab", "\xCE\x94" "H*ab", "tolerance", "source", "verdict"},
                                4);
    for (const conformance::ControlPatch& patch : result.controls)
        out += row({text(patch.name),
                    splitSwatch(srgbOfXYZ(XYZOfLab(patch.measured)), srgbOfXYZ(XYZOfLab(patch.reference)),
                                patch.name + ": measured and reference", 64, 22),
                    labText(patch.measured), labText(patch.reference), fixed(patch.deltaE00, 2),
                    fixed(patch.deltaEab, 2), patch.deltaH ? fixed(*patch.deltaH, 2) : "\xE2\x80\x93",
                    fixed(patch.limit, 1), text(conformance::toleranceSource(patch.tolerance)),
                    verdictCell(patch.pass)});
    out += "</table>\n";
    for (const std::string& absent : result.absent)
        out += "<p class=\"note\">" + text(absent) + ": not in the reference.</p>\n";
    return sectionStart("controls", "Control patches",
                        "CIELAB D50, 2\xC2\xB0: the form's from its spectra, the reference's as it states them.") +
           out + sectionEnd();
}

std::string toneValueTable(const conformance::ConformanceResult& result)
{
    static const char* const inks[4] = {"Cyan", "Magenta", "Yellow", "Black"};
    std::string out = "<table id=\"tone-value-increase\">\n" +
                      headerRow({"Ink", "tint %", "measured", "reference", "difference", "tolerance", "verdict"}, 1);
    for (const conformance::ToneValuePoint& point : result.toneValues)
        out += row({inks[point.ink], shortText(point.nominal), signedFixed(point.measured, 1),
                    signedFixed(point.reference, 1) + (point.interpolated ? "*" : ""),
                    signedFixed(point.measured - point.reference, 1), fixed(point.limit, 1), verdictCell(point.pass)});
    return sectionStart("tone-values", "Tone value increase",
                        "Percentage points, Murray-Davies on CIE X (cyan), Y (magenta, black) and Z (yellow) for "
                        "both files; * the reference lacks this tint and is interpolated between its neighbours. "
                        "Tolerance: " + conformance::toleranceSource("tone-value") + ".") +
           out + "</table>\n" + sectionEnd();
}

std::string gamutSection(const conformance::GamutComparison& gamut, std::size_t patches)
{
    std::string out = "<table id=\"gamut\">\n" + headerRow({"Region", "combinations", "mean", "95th percentile", "max"}, 1);
    for (const conformance::GamutRegion& region : gamut.regions)
        if (region.deltaE00.count > 0)
            out += row({text(region.name), std::to_string(region.deltaE00.count), fixed(region.deltaE00.mean, 2),
                        fixed(region.deltaE00.p95, 2), fixed(region.deltaE00.max, 2)});
    out += "</table>\n<h3>The largest differences</h3>\n<table id=\"gamut-worst\">\n" +
           headerRow({"C M Y K", "predicted | reference", kDeltaE00}, 2);
    for (const conformance::GamutPatch& patch : gamut.worst) {
        const std::string cmyk = coverageText({patch.cmyk[0], patch.cmyk[1], patch.cmyk[2], patch.cmyk[3]},
                                              {"C", "M", "Y", "K"});
        out += row({text(cmyk),
                    splitSwatch(srgbOfXYZ(XYZOfLab(patch.predicted)), srgbOfXYZ(XYZOfLab(patch.reference)),
                                cmyk + ": predicted and reference", 64, 22),
                    fixed(patch.deltaE00, 2)});
    }
    return sectionStart("gamut", "The whole gamut",
                        "The reference's " + std::to_string(patches) + " combinations as the " + text(gamut.model) +
                            " model fitted to this form predicts them, " + kDeltaE00 +
                            " against the reference. A prediction from 46 patches: on real press sheets such "
                            "predictions were about 0.8 " + kDeltaE00 + " from the measured colours on average.") +
           out + "</table>\n" + sectionEnd();
}

} // namespace

std::string conformanceReport(const ConformanceRun& run)
{
    const conformance::ConformanceResult& result = *run.result;
    int checks = 0, failed = 0;
    for (const auto& patch : result.controls)
        ++checks, failed += patch.pass ? 0 : 1;
    for (const auto& point : result.toneValues)
        ++checks, failed += point.pass ? 0 : 1;
    std::vector<std::pair<std::string, std::string>> sections = {
        {"summary", "Summary"}, {"controls", "Control patches"}, {"tone-values", "Tone values"}};
    if (result.gamut)
        sections.emplace_back("gamut", "Whole gamut");
    std::string notes;
    for (const std::string& note : run.conditions)
        notes += "<p class=\"note\">" + text(note) + "</p>\n";
    return pageStart("Conformance: " + run.form->path) +
           pageHeader("Conformance", text(run.form->path) + " against " + text(run.reference->description), sections) +
           sectionStart("summary", "Summary") + "<div class=\"figures\">\n" +
           keyFigure(result.pass() ? "PASS" : "FAIL", "verdict", "verdict") +
           keyFigure(std::to_string(checks - failed) + " of " + std::to_string(checks), "checks within tolerance") +
           "</div>\n<table class=\"facts\">\n" + fileFacts(run.form->path, run.form->file, run.form->provenance) +
           row({"Reference", text(run.reference->path)}) + "</table>\n" + notes + sectionEnd() +
           controlSection(result) + toneValueTable(result) +
           (result.gamut ? gamutSection(*result.gamut, run.reference->cmyk.size()) : "") + pageEnd();
}

} // namespace veltmarquist
