// The conformance page: the verdict, the control patches as swatches beside
// the reference with their differences and tolerances, the tone value
// increase of each ink against the reference's, and the whole gamut of the
// reference as this press's model predicts it.
#include "HtmlReport.h"
#include "HtmlSections.h"

#include "Svg.h"

#include <algorithm>
#include <cmath>

namespace veltmarquist {

namespace {

using namespace html;

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

// Each ink's tone value increase against nominal coverage: the press (solid
// line, markers) and the reference (dashed), with the tolerance band around
// the reference.
std::string toneValueCurves(const conformance::ConformanceResult& result)
{
    static const char* const inks[4] = {"Cyan", "Magenta", "Yellow", "Black"};
    double top = 10.0;
    for (const conformance::ToneValuePoint& point : result.toneValues)
        top = std::max({top, point.measured + 2.0, point.reference + point.limit + 2.0});
    top = std::ceil(top / 5.0) * 5.0;
    const svg::Plot plot(290, 240, {0, 100}, {-5, top});
    std::string plots = "<div class=\"plots\">\n";
    for (int ink = 0; ink < 4; ++ink) {
        svg::Points press{{0, 0}}, reference{{0, 0}}, upper{{0, 0}}, lower{{0, 0}};
        std::string marks, description = "Tone value increase at nominal coverage, press / reference:";
        for (const conformance::ToneValuePoint& point : result.toneValues) {
            if (point.ink != ink)
                continue;
            press.emplace_back(point.nominal, point.measured);
            reference.emplace_back(point.nominal, point.reference);
            upper.emplace_back(point.nominal, point.reference + point.limit);
            lower.emplace_back(point.nominal, point.reference - point.limit);
            marks += plot.marker(point.nominal, point.measured, "circle", 3.0, point.pass ? "point" : "point fail");
            description += " " + shortText(point.nominal) + ": " + fixed(point.measured, 1) + " / " +
                           fixed(point.reference, 1) + ";";
        }
        if (press.size() < 2)
            continue;
        for (svg::Points* curve : {&press, &reference, &upper, &lower})
            curve->emplace_back(100, 0);
        svg::Points band = upper;
        band.insert(band.end(), lower.rbegin(), lower.rend());
        plots += "<figure class=\"plot\"><figcaption>" + std::string(inks[ink]) + "</figcaption>" +
                 plot.start(std::string(inks[ink]) + ": tone value increase, press and reference", description) +
                 plot.axes(svg::ticks({0, 100}, 20), 0, "nominal coverage (%)", svg::ticks({0, top}, 5), 0,
                           "tone value increase (%)") +
                 plot.polygon(band, "tolerance") + plot.polyline(reference, "reference") +
                 plot.polyline(press, "measured") + marks + svg::Plot::end() + "</figure>\n";
    }
    return plots + "</div>\n<p class=\"legend\"><span class=\"key measured\"></span>this press "
                   "<span class=\"key reference\"></span>the reference, with its tolerance band</p>\n";
}

std::string toneValueTable(const conformance::ConformanceResult& result)
{
    static const char* const inks[4] = {"Cyan", "Magenta", "Yellow", "Black"};
    std::string out = toneValueCurves(result) + "<table id=\"tone-value-increase\">\n" +
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

// Where in colour space the press departs from the reference: the a*b*
// plane in cells coloured by the largest difference of the reference's
// colours in them (the error map's colours: light small, dark 4 and above).
std::string gamutMap(const conformance::GamutComparison& gamut)
{
    if (gamut.all.empty())
        return "";
    constexpr int kCells = 32;
    const double reach = 100.0, width = 2.0 * reach / kCells;
    std::vector<double> worst(kCells * kCells, -1.0);
    for (const conformance::GamutPatch& patch : gamut.all) {
        const auto cellOf = [&](double value) {
            return std::min(kCells - 1, std::max(0, static_cast<int>((value + reach) / width)));
        };
        double& cell = worst[static_cast<size_t>(cellOf(patch.reference.b) * kCells + cellOf(patch.reference.a))];
        cell = std::max(cell, patch.deltaE00);
    }
    const svg::Plot plot(420, 420, {-reach, reach}, {-reach, reach}, 46, 14, 10, 38);
    std::string cells;
    for (int row = 0; row < kCells; ++row)
        for (int column = 0; column < kCells; ++column) {
            const double value = worst[static_cast<size_t>(row * kCells + column)];
            if (value < 0.0)
                continue;
            const double a = -reach + width * column, b = -reach + width * row;
            bool dark = false;
            cells += plot.box(a, b, a + width, b + width, "cell", heatColour(value, dark));
        }
    return "<figure class=\"plot\"><figcaption>Where the press departs from the reference</figcaption>" +
           plot.start("Largest CIEDE2000 of the reference's colours in each cell of the a*b* plane",
                      std::to_string(gamut.all.size()) + " reference colours, cells of " + fixed(width, 1) +
                          " a*b* units") +
           plot.axes(svg::ticks({-reach, reach}, 40), 0, "a*", svg::ticks({-reach, reach}, 40), 0, "b*") + cells +
           svg::Plot::end() + "</figure>\n";
}

std::string gamutSection(const conformance::GamutComparison& gamut, std::size_t patches)
{
    std::string out = "<table id=\"gamut\">\n" + headerRow({"Region", "combinations", "mean", "95th percentile", "max"}, 1);
    for (const conformance::GamutRegion& region : gamut.regions)
        if (region.deltaE00.count > 0)
            out += row({text(region.name), std::to_string(region.deltaE00.count), fixed(region.deltaE00.mean, 2),
                        fixed(region.deltaE00.p95, 2), fixed(region.deltaE00.max, 2)});
    out += "</table>\n" + gamutMap(gamut) + "<h3>The largest differences</h3>\n<table id=\"gamut-worst\">\n" +
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
    const int checks = result.checks(), failed = result.failures();
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
