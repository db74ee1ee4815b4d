// The four-colour HTML report: summary, test form, spectra and tone values
// (the check is in HtmlCheck.cpp), and the parts both reports share.
#include "HtmlReport.h"

#include "HtmlSections.h"
#include "ModelInWords.h"
#include "Svg.h"

#include <algorithm>
#include <cmath>
#include <iterator>
#include <numeric>

namespace veltmarquist {

namespace html {

const char* const kDeltaE00 = "\xCE\x94" "E<sub>00</sub>";
const char* const kDeltaE00Text = "\xCE\x94" "E00";

std::string pageHeader(const std::string& title, const std::string& subtitle,
                       const std::vector<std::pair<std::string, std::string>>& sections)
{
    std::string out = "<header class=\"page\">\n<h1>" + text(title) + "</h1>\n<p class=\"sub\">" + subtitle +
                      "</p>\n<nav class=\"contents\">";
    for (const auto& [id, name] : sections)
        out += "<a href=\"#" + id + "\">" + text(name) + "</a>";
    return out + "</nav>\n</header>\n";
}

std::string keyFigure(const std::string& value, const std::string& label, const std::string& id)
{
    return "<div class=\"figure\"><div class=\"value\"" + (id.empty() ? "" : " id=\"" + id + "\"") + ">" + value +
           "</div><div class=\"label\">" + label + "</div></div>\n";
}

std::string fileFacts(const std::string& path, const MeasurementFile& file,
                      const std::vector<std::pair<std::string, std::string>>& provenance)
{
    std::string out = row({"File", text(path)}) + row({"Measurements", std::to_string(file.sets.size())}) +
                      row({"Spectra", text(file.describeSpectra())}) +
                      row({"Reflectance scale", "0\xE2\x80\x93" + text(fixed(file.scale, 0)) +
                                                    (file.scaleDetected ? " (detected)" : " (given)")});
    for (const auto& [keyword, value] : provenance)
        out += row({text(keyword), text(value)});
    return out;
}

std::string warningList(const std::vector<std::string>& warnings)
{
    if (warnings.empty())
        return "";
    std::string out = "<ul class=\"words warning\">\n";
    for (const std::string& warning : warnings)
        out += "<li>Warning: " + text(warning) + "</li>\n";
    return out + "</ul>\n";
}

std::string spectrumPanels(const std::vector<SpectrumPanel>& panels)
{
    // Each panel gets the smallest of these scales (top, tick step) that holds
    // it, so that a dark overprint shows its shape too.
    static const double scales[][2] = {{0.02, 0.005}, {0.05, 0.01}, {0.1, 0.02}, {0.2, 0.05}, {0.5, 0.1},
                                       {1.0, 0.2},    {1.2, 0.2},   {1.6, 0.4},  {2.0, 0.5},  {4.0, 1.0}};
    const auto points = [](const Spectrum& spectrum) {
        svg::Points out;
        for (size_t band = 0; band < spectrum.size(); ++band)
            out.emplace_back(380.0 + 10.0 * static_cast<double>(band), spectrum[band]);
        return out;
    };
    const auto numbers = [](const Spectrum& spectrum) {
        std::string out;
        for (double value : spectrum)
            out += (out.empty() ? "" : " ") + fixed(value, 4);
        return out;
    };
    std::string out = "<div class=\"plots\">\n";
    for (const SpectrumPanel& panel : panels) {
        double highest = 0.0;
        for (const Spectrum* spectrum : {panel.solid, panel.dashed})
            if (spectrum != nullptr)
                highest = std::max(highest, *std::max_element(spectrum->begin(), spectrum->end()));
        size_t scale = 0;
        while (scale + 1 < std::size(scales) && scales[scale][0] < highest * 1.04)
            ++scale;
        const double top = scales[scale][0], step = scales[scale][1];
        const svg::Plot plot(290, 190, {380, 730}, {0, top}, 54);
        std::string description = "Reflectance factor at 380, 390, ..., 730 nm. Solid line: " + numbers(*panel.solid);
        if (panel.dashed != nullptr)
            description += ". Dashed line (" + panel.dashedClass + "): " + numbers(*panel.dashed);
        out += "<figure class=\"plot\"><figcaption>" + text(panel.title) + " " + panel.caption + "</figcaption>" +
               plot.start(panel.title, description) +
               plot.axes(svg::ticks({400, 700}, 100), 0, "wavelength (nm)", svg::ticks({0, top}, step),
                         step < 0.01 ? 3 : step < 0.1 ? 2 : 1, "reflectance factor");
        // A reference lies under the measured line; a modelled line over it,
        // so that where the two agree both still show.
        if (panel.dashed != nullptr && panel.dashedClass == "reference")
            out += plot.polyline(points(*panel.dashed), panel.dashedClass);
        out += plot.polyline(points(*panel.solid), "measured");
        if (panel.dashed != nullptr && panel.dashedClass != "reference")
            out += plot.polyline(points(*panel.dashed), panel.dashedClass);
        out += svg::Plot::end() + "</figure>\n";
    }
    return out + "</div>\n";
}

std::string coverageText(const std::vector<double>& device, const std::vector<std::string>& names)
{
    std::string out;
    for (size_t channel = 0; channel < device.size() && channel < names.size(); ++channel) {
        const double value = device[channel];
        if (value != 0.0)
            out += (out.empty() ? "" : " ") + names[channel] + (names[channel].size() > 1 ? " " : "") +
                   fixed(value, value == std::floor(value) ? 0 : 1);
    }
    return out.empty() ? "paper" : out;
}

std::string labText(const Lab& lab)
{
    return "L* " + fixed(lab.L, 1) + " a* " + fixed(lab.a, 1) + " b* " + fixed(lab.b, 1);
}

} // namespace html

namespace {

using namespace html;

const std::vector<std::string> kCmyk = {"C", "M", "Y", "K"};
const char* const kInkNames[4] = {"Cyan", "Magenta", "Yellow", "Black"};

std::string deviceText(const Cmyk& cmyk)
{
    return coverageText(std::vector<double>(cmyk.begin(), cmyk.end()), kCmyk);
}

// "C+M (blue)" for an overprint of solids, "paper", else the coverages.
std::string patchName(const Cmyk& cmyk)
{
    std::string solids;
    for (size_t ink = 0; ink < 4; ++ink) {
        if (cmyk[ink] != 0.0 && cmyk[ink] != 100.0)
            return deviceText(cmyk);
        if (cmyk[ink] == 100.0)
            solids += (solids.empty() ? "" : "+") + kCmyk[ink];
    }
    if (solids == "C+M" || solids == "C+Y" || solids == "M+Y")
        return solids + (solids == "C+M" ? " (blue)" : solids == "C+Y" ? " (green)" : " (red)");
    return solids.empty() ? "paper" : solids;
}

// The order in which paper, solids and overprints are shown: those without
// black first, fewer inks first, then C before M before Y; the greys last.
int displayOrder(const Cmyk& cmyk)
{
    const auto inked = [&](size_t ink) { return cmyk[ink] > 0.0; };
    const int inks = inked(0) + inked(1) + inked(2) + inked(3);
    const bool grey = cmyk[0] == 40.0 && cmyk[1] == 40.0;
    return (grey ? 1000 : 0) + (inked(3) ? 100 : 0) + 10 * inks + (inked(0) ? 0 : 4) + (inked(1) ? 0 : 2) +
           (inked(2) ? 0 : 1);
}

// ---- Summary ----------------------------------------------------------------------------------

std::string checkRow(const std::string& what, const Summary& summary, const std::string& id)
{
    const auto cell = [&](const std::string& name, const std::string& value) {
        return id.empty() ? value : "<span id=\"" + id + "-" + name + "\">" + value + "</span>";
    };
    return row({what, cell("count", std::to_string(summary.count)), cell("mean", fixed(summary.mean, 2)),
                cell("p95", fixed(summary.p95, 2)), cell("max", fixed(summary.max, 2))});
}

// Which measured combinations the check left out and why, as a sentence;
// empty when it left none out beyond the form's own patches.
std::string leftOutText(const ModelCheck& check)
{
    const LeftOut& out = check.leftOut;
    std::string text;
    if (out.offLevels > 0) {
        std::string levels;
        for (double level : check.levels)
            levels += (levels.empty() ? "" : ", ") + fixed(level, 0);
        text += std::to_string(out.offLevels) + " with a coverage that is none of the levels the " + check.model +
                " model predicts (" + levels + " %)";
    }
    if (out.furtherInks > 0)
        text += (text.empty() ? "" : "; ") + std::to_string(out.furtherInks) +
                " with ink beyond C, M, Y and K, which a four-colour model does not print";
    return text.empty() ? text : "Left out: " + text + ".";
}

std::string checkFigures(const ModelCheck& check)
{
    std::string out = "<h3>The check</h3>\n<p>The model's predictions, as an XYZ chart holds them, against every "
                      "combination the file measured beyond the test form that the model predicts (repeats "
                      "averaged). " + std::string(kDeltaE00) + " by LittleCMS.</p>\n";
    const std::string leftOut = leftOutText(check);
    if (!leftOut.empty())
        out += "<p class=\"note\" id=\"check-left-out\">" + text(leftOut) + "</p>\n";
    if (check.patches.empty())
        return out;
    out += "<table id=\"check-figures\">\n" +
           headerRow({"Combinations", "count", std::string("mean ") + kDeltaE00, "95th percentile", "max"}, 1) +
           checkRow("all beyond the form", check.all.deltaE2000, "check");
    if (check.chart.deltaE2000.count > 0)
        out += checkRow("of them on the chart", check.chart.deltaE2000, "check-chart");
    static const char* const blacks[] = {"black 0 %", "black 1\xE2\x80\x93" "40 %", "black 41\xE2\x80\x93" "85 %",
                                         "black 86\xE2\x80\x93" "100 %"};
    for (size_t range = 0; range < 4; ++range)
        if (check.all.byBlack[range].count > 0)
            out += checkRow(blacks[range], check.all.byBlack[range], "");
    return out + "</table>\n<p>Largest difference at " + text(deviceText(check.patches[check.all.largest].device)) +
           ".</p>\n";
}

std::string summarySection(const ChartResult& result, const Summary& form)
{
    const FoundForm& found = *result.form;
    const FittedModel& fit = *result.fit;
    std::string out = sectionStart("summary", "1 Summary") + "<div class=\"figures\">\n" +
                      keyFigure("46", "test-form patches found in " + std::to_string(found.picked.setsUsed) +
                                          " of " + std::to_string(found.file.sets.size()) + " measurements") +
                      keyFigure(text(describe(fit.choice).substr(4)), "print model") +
                      keyFigure(fixed(form.mean, 2), std::string("mean ") + kDeltaE00 + " of the form's 46 patches (max " +
                                                         fixed(form.max, 2) + ")");
    if (!result.check.patches.empty()) {
        const Summary& check = result.check.all.deltaE2000;
        out += keyFigure(fixed(check.mean, 2), std::string("mean ") + kDeltaE00 + " over " +
                                                   std::to_string(check.count) + " combinations beyond the form") +
               keyFigure(fixed(check.p95, 2), std::string("95th percentile ") + kDeltaE00) +
               keyFigure(fixed(check.max, 2), std::string("max ") + kDeltaE00);
    }
    out += "</div>\n<h3>The file</h3>\n<table class=\"facts\">\n" + fileFacts(found.path, found.file, found.provenance) +
           row({"Test form", "46 patches found in " + std::to_string(found.picked.setsUsed) + " measurements" +
                                 (found.picked.averaged > 0 ? "; repeats averaged for " +
                                                                  std::to_string(found.picked.averaged) + " of them"
                                                            : "")}) +
           row({"Other measurements", std::to_string(found.picked.setsIgnored) +
                                          (result.check.patches.empty()
                                               ? " (none of them a combination the check can use)"
                                               : " (the check below compares " +
                                                     std::to_string(result.check.patches.size()) +
                                                     " combinations among them with the model)")}) +
           "</table>\n" + warningList(result.formWarnings.warnings);
    const ModelWords words = modelInWords(fit);
    out += "<h3>The model: " + text(describe(fit.choice)) + "</h3>\n<p>" + text(words.how) + "</p>\n<ul class=\"words\">\n";
    for (const std::string& sentence : words.values)
        out += "<li>" + text(sentence) + "</li>\n";
    out += "</ul>\n" + warningList(words.warnings);
    if (!result.check.patches.empty() || result.check.leftOut.offLevels + result.check.leftOut.furtherInks > 0)
        out += checkFigures(result.check);
    else
        out += "<p class=\"note\">The file measures nothing beyond the test form that the model could be checked "
               "on; a full characterisation sheet (IT8.7/4, ECI 2002) would add the check.</p>\n";
    return out + sectionEnd();
}

// ---- The test form --------------------------------------------------------------------------------

std::string formSection(const ModelledForm& form)
{
    const std::vector<FormPatch>& patches = form.patches;
    // The five largest differences (those above 0.05) are marked, ranked.
    std::vector<size_t> order(patches.size());
    std::iota(order.begin(), order.end(), 0);
    std::stable_sort(order.begin(), order.end(), [&](size_t a, size_t b) {
        return patches[a].check.deltaE2000 > patches[b].check.deltaE2000;
    });
    std::vector<int> rank(patches.size(), 0);
    for (size_t i = 0; i < 5 && i < order.size() && patches[order[i]].check.deltaE2000 > 0.05; ++i)
        rank[order[i]] = static_cast<int>(i) + 1;

    const auto figure = [&](size_t patch, const std::string& label) {
        const CheckedPatch& check = patches[patch].check;
        const std::string title = patchName(check.device) + ": measured " + labText(check.measuredLab) +
                                  ", modelled " + labText(check.predictedLab) + ", " + kDeltaE00Text + " " +
                                  fixed(check.deltaE2000, 2);
        return std::string("<figure class=\"patch\">") +
               splitSwatch(srgbOfXYZ(check.measuredXYZ), srgbOfXYZ(check.predictedXYZ), title, 84, 56,
                           rank[patch] > 0) +
               "<figcaption>" + text(label) + "<br/>" +
               (rank[patch] > 0 ? "<strong>\xE2\x96\xB2" + std::to_string(rank[patch]) + "</strong> " : "") +
               kDeltaE00 + " " +
               fixed(check.deltaE2000, 2) + "</figcaption></figure>\n";
    };
    const auto group = [&](const std::string& name, const std::vector<std::pair<size_t, std::string>>& members) {
        std::string out = "<div class=\"swatches\"><div class=\"group\">" + text(name) + "</div>\n";
        for (const auto& [patch, label] : members)
            out += figure(patch, label);
        return out + "</div>\n";
    };

    std::vector<std::pair<size_t, std::string>> inks[4], overprints, paperAndGreys;
    for (size_t patch = 0; patch < patches.size(); ++patch) {
        const Cmyk& cmyk = patches[patch].check.device;
        const int inked = static_cast<int>(std::count_if(cmyk.begin(), cmyk.end(), [](double c) { return c > 0; }));
        const size_t first = static_cast<size_t>(std::find_if(cmyk.begin(), cmyk.end(), [](double c) { return c > 0; }) -
                                                 cmyk.begin());
        if (inked == 1)
            inks[first].emplace_back(patch, fixed(cmyk[first], 0) + " %");
        else if (inked == 0 || cmyk[0] == 40.0)
            paperAndGreys.emplace_back(patch, patchName(cmyk));
        else
            overprints.emplace_back(patch, patchName(cmyk));
    }
    const auto byCoverage = [&](const std::pair<size_t, std::string>& a, const std::pair<size_t, std::string>& b) {
        const Cmyk &x = patches[a.first].check.device, &y = patches[b.first].check.device;
        return std::accumulate(x.begin(), x.end(), 0.0) < std::accumulate(y.begin(), y.end(), 0.0);
    };
    const auto bySolids = [&](const std::pair<size_t, std::string>& a, const std::pair<size_t, std::string>& b) {
        return displayOrder(patches[a.first].check.device) < displayOrder(patches[b.first].check.device);
    };
    std::string out = sectionStart("form", "2 The test form",
                                   "Each swatch shows the measured colour on the left and the model's on the right "
                                   "(D50 colours shown in sRGB through a Bradford adaptation to D65), with their " +
                                       std::string(kDeltaE00) + " below. \xE2\x96\xB2" "1 to \xE2\x96\xB2" "5 and a "
                                       "heavy frame mark the five largest differences above 0.05. ") +
                      "<p>" + clipLegend() + "</p>\n";
    std::stable_sort(paperAndGreys.begin(), paperAndGreys.end(), byCoverage);
    out += group("Paper and greys", paperAndGreys);
    for (size_t ink = 0; ink < 4; ++ink) {
        std::stable_sort(inks[ink].begin(), inks[ink].end(), byCoverage);
        out += group(kInkNames[ink], inks[ink]);
    }
    std::stable_sort(overprints.begin(), overprints.end(), bySolids);
    return out + group("Overprints", overprints) + sectionEnd();
}

// ---- Spectra ----------------------------------------------------------------------------------------

std::string spectraSection(const ModelledForm& form)
{
    // Paper, solids, overprints (solids only) and the two greys, fewest inks first.
    std::vector<size_t> chosen;
    for (size_t patch = 0; patch < form.patches.size(); ++patch) {
        const Cmyk& cmyk = form.patches[patch].check.device;
        if (std::all_of(cmyk.begin(), cmyk.end(), [](double c) { return c == 0.0 || c == 100.0; }) ||
            (cmyk[0] == 40.0 && cmyk[1] == 40.0))
            chosen.push_back(patch);
    }
    std::stable_sort(chosen.begin(), chosen.end(), [&](size_t a, size_t b) {
        return displayOrder(form.patches[a].check.device) < displayOrder(form.patches[b].check.device);
    });
    std::vector<SpectrumPanel> panels;
    for (size_t patch : chosen) {
        const FormPatch& p = form.patches[patch];
        panels.push_back({patchName(p.check.device),
                          "<span class=\"note\">" + std::string(kDeltaE00) + " " + fixed(p.check.deltaE2000, 2) +
                              "</span>",
                          &p.measured, &p.modelled, "modelled"});
    }
    return sectionStart("spectra", "3 Spectra",
                        "Reflectance of the paper, the four solids, the eleven overprints and the two greys, "
                        "380\xE2\x80\x93" "730 nm: <span class=\"key measured\"></span>measured "
                        "<span class=\"key modelled\"></span>modelled.") +
           spectrumPanels(panels) + sectionEnd();
}

// ---- Tone values ----------------------------------------------------------------------------------

std::string toneValueSection(const ModelledForm& form)
{
    const svg::Plot plot(290, 270, {0, 100}, {0, 100});
    const char* const shapes[4] = {"circle", "square", "diamond", "triangle"};
    std::string plots = "<div class=\"plots\">\n", table;
    std::vector<std::string> header{"Ink (channel)"};
    for (double level : form.toneValues[0].nominal)
        if (level > 0.0 && level < 100.0)
            header.push_back(fixed(level, 0) + " %");
    table = "<table id=\"tone-values-table\">\n" + headerRow(header, 1);
    for (size_t ink = 0; ink < 4; ++ink) {
        const ToneValueCurve& curve = form.toneValues[ink];
        std::string description = "Measured tone value (%) at nominal coverage:";
        std::vector<std::string> cells{std::string(kInkNames[ink]) + "<br/><span class=\"note\">" +
                                       text(densitometerChannel(static_cast<int>(ink))) + "</span>"};
        svg::Points model;
        for (size_t i = 0; i < curve.modelNominal.size(); ++i)
            model.emplace_back(curve.modelNominal[i], curve.modelled[i]);
        std::string marks;
        for (size_t i = 0; i < curve.nominal.size(); ++i) {
            description += " " + fixed(curve.nominal[i], 0) + ": " + fixed(curve.measured[i], 1) + ";";
            marks += plot.marker(curve.nominal[i], curve.measured[i], shapes[ink], 3.5, "point");
            if (curve.nominal[i] > 0.0 && curve.nominal[i] < 100.0)
                cells.push_back(fixed(curve.measured[i], 1) + " (" +
                                signedFixed(curve.measured[i] - curve.nominal[i], 1) + ")");
        }
        plots += "<figure class=\"plot\"><figcaption>" + std::string(kInkNames[ink]) +
                 " <span class=\"note\">(" + text(densitometerChannel(static_cast<int>(ink))) + ")</span></figcaption>" +
                 plot.start(std::string(kInkNames[ink]) + ": tone value against nominal coverage", description) +
                 plot.axes(svg::ticks({0, 100}, 20), 0, "nominal coverage (%)", svg::ticks({0, 100}, 20), 0,
                           "tone value (%)") +
                 plot.line(0, 0, 100, 100, "unity") + plot.polyline(model, "modelled") + marks + svg::Plot::end() +
                 "</figure>\n";
        table += row(cells);
    }
    return sectionStart("tone-values", "4 Tone value increase",
                        "Tone value of each ink's measured tints (markers) and of the model's tints "
                        "(<span class=\"key modelled\"></span>) against nominal coverage, with the 1:1 line "
                        "(<span class=\"key reference\"></span>). Murray-Davies, TV = (R<sub>paper</sub> \xE2\x88\x92 "
                        "R<sub>tint</sub>) / (R<sub>paper</sub> \xE2\x88\x92 R<sub>solid</sub>), on the channel a "
                        "densitometer reads for the ink: the mean reflectance over the band of its complementary "
                        "filter for cyan, magenta and yellow, CIE Y for black.") +
           plots + "</div>\n<h3>Measured tone value (tone value increase), %</h3>\n" + table + "</table>\n" +
           sectionEnd();
}

} // namespace

std::string htmlReport(const ChartResult& result)
{
    const ModelledForm& form = *result.modelled;
    std::vector<std::pair<std::string, std::string>> sections = {
        {"summary", "Summary"}, {"form", "Test form"}, {"spectra", "Spectra"}, {"tone-values", "Tone values"}};
    if (!result.check.patches.empty())
        sections.emplace_back("check", "Check");
    return pageStart("Print model report: " + result.form->path) +
           pageHeader("Print model report", text(result.form->path) + " \xC2\xB7 " + text(describe(result.fit->choice)),
                      sections) +
           summarySection(result, form.deltaE2000) + formSection(form) + spectraSection(form) +
           toneValueSection(form) + (result.check.patches.empty() ? "" : checkSection(result)) + pageEnd();
}

} // namespace veltmarquist
