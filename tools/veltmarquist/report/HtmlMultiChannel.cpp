// The multi-channel HTML report: the measured paper and solids, the
// spectral chart the library predicted from them, and the tone ramps it
// built for each ink.
#include "HtmlReport.h"

#include "HtmlSections.h"

namespace veltmarquist {

namespace {

using namespace html;

std::vector<std::string> channelNames(int inks)
{
    std::vector<std::string> names = {"C", "M", "Y", "K"};
    for (int ink = 5; ink <= inks; ++ink)
        names.push_back("ink" + std::to_string(ink));
    return names;
}

std::string inkName(int inks, size_t channel)
{
    static const char* const names[4] = {"Cyan", "Magenta", "Yellow", "Black"};
    return channel < 4 ? names[channel]
                       : "Ink " + std::to_string(channel + 1) + " (" + std::to_string(inks) + "CLR_" +
                             std::to_string(channel + 1) + ")";
}

std::string summarySection(const MultiChannelResult& result)
{
    const MeasurementFile& file = *result.form;
    const char* const model = result.inks == 6 ? "six-colour" : "seven-colour";
    std::string out = sectionStart("summary", "1 Summary") + "<div class=\"figures\">\n" +
                      keyFigure(std::to_string(result.inks), "inks: C, M, Y, K and " +
                                                                 std::to_string(result.inks - 4) + " more") +
                      keyFigure(std::to_string(result.chart.size()), std::string("patches of the ") + model +
                                                                         " spectral chart") +
                      "</div>\n<h3>The file</h3>\n<table class=\"facts\">\n" +
                      fileFacts(result.formWarnings.path, file, provenanceOf(file)) +
                      row({"Found", "the paper and " + std::to_string(result.inks) + " solids; " +
                                        std::to_string(result.picked->setsIgnored) + " other measurements ignored"}) +
                      "</table>\n" + warningList(result.formWarnings.warnings);
    out += std::string("<h3>The model</h3>\n<p>The ") + model +
           " model builds a tone ramp of 101 steps for each ink between the paper and the ink's solid, in the "
           "cube-root domain of reflectance, and prints the inks over each other in channel order with a "
           "trapping factor of 0.85 per ink. It needs only the paper and the solids; the chart below is its "
           "prediction.</p>\n";
    return out + sectionEnd();
}

std::string solidsSection(const MultiChannelResult& result)
{
    const std::vector<std::string> names = channelNames(result.inks);
    std::string swatches = "<div class=\"swatches\">\n", table = "<table id=\"solids\">\n" +
                                                                  headerRow({"", "L*", "a*", "b*"}, 1);
    std::vector<SpectrumPanel> panels;
    const ChannelPatch& paper = result.paperAndSolids.front();
    for (size_t i = 0; i < result.paperAndSolids.size(); ++i) {
        const ChannelPatch& patch = result.paperAndSolids[i];
        const std::string name = i == 0 ? "Paper" : inkName(result.inks, i - 1);
        swatches += "<figure class=\"patch\">" +
                    swatch(srgbOfXYZ(patch.colour.XYZ), name + ": " + labText(patch.colour.lab), 84, 56) +
                    "<figcaption>" + text(name) + "</figcaption></figure>\n";
        table += row({text(name), fixed(patch.colour.lab.L, 1), fixed(patch.colour.lab.a, 1),
                      fixed(patch.colour.lab.b, 1)});
        panels.push_back({name, "", &patch.colour.spectrum, i == 0 ? nullptr : &paper.colour.spectrum,
                          "reference"});
    }
    return sectionStart("solids", "2 Paper and solids",
                        "As measured (repeats averaged); the spectra show each solid "
                        "(<span class=\"key measured\"></span>) over the paper (<span class=\"key reference\"></span>).") +
           "<p>" + clipLegend() + "</p>\n" + swatches + "</div>\n" + table + "</table>\n" + spectrumPanels(panels) +
           sectionEnd();
}

std::string chartSection(const MultiChannelResult& result)
{
    const std::vector<std::string> names = channelNames(result.inks);
    // The table runs in three columns of tables, as a printed list would.
    const size_t perColumn = (result.chart.size() + 2) / 3;
    std::string swatches = "<div class=\"swatches\">\n", table = "<div class=\"columns\" id=\"chart-patches\">\n";
    for (size_t i = 0; i < result.chart.size(); ++i) {
        const ChannelPatch& patch = result.chart[i];
        const std::string channels = coverageText(patch.device, names);
        swatches += "<figure class=\"patch small\">" +
                    swatch(srgbOfXYZ(patch.colour.XYZ),
                           "patch " + std::to_string(i + 1) + ": " + channels + ", " + labText(patch.colour.lab), 44,
                           30) +
                    "<figcaption>" + std::to_string(i + 1) + "</figcaption></figure>\n";
        if (i % perColumn == 0)
            table += (i == 0 ? "" : "</table>\n") + std::string("<table>\n") +
                     headerRow({"#", "channels (%)", "L*", "a*", "b*"}, 2);
        table += row({std::to_string(i + 1), text(channels), fixed(patch.colour.lab.L, 1),
                      fixed(patch.colour.lab.a, 1), fixed(patch.colour.lab.b, 1)});
    }
    table += "</table>\n</div>\n";
    return sectionStart("chart", "3 The predicted spectral chart",
                        "The " + std::to_string(result.chart.size()) +
                            " patches of the chart as the library wrote them, numbered in chart order; the table "
                            "gives each patch's channels and colour.") +
           "<p>" + clipLegend() + "</p>\n" + swatches + "</div>\n" + table + sectionEnd();
}

// One strip per ink, 0 to 100 % in steps of 5 %, the tone and L* under each step.
std::string rampsSection(const MultiChannelResult& result)
{
    constexpr int kCell = 46, kHeight = 64;
    std::string out = sectionStart("ramps", "4 Tone ramps",
                                   "Each ink's ramp from paper (0 %) to solid (100 %) in steps of 5 %, as the model "
                                   "interpolates it, with the tone and L* under each step.");
    for (size_t channel = 0; channel < result.ramps.size(); ++channel) {
        const std::vector<ColouredSpectrum>& ramp = result.ramps[channel];
        const std::string name = inkName(result.inks, channel);
        std::string cells, description = "Tone (%): L* a* b*.";
        for (size_t tone = 0; tone < ramp.size(); tone += 5) {
            const DisplayColour colour = srgbOfXYZ(ramp[tone].XYZ);
            const std::string x = std::to_string(static_cast<int>(tone / 5) * kCell);
            const std::string middle = std::to_string(static_cast<int>(tone / 5) * kCell + kCell / 2);
            cells += "<rect x=\"" + x + "\" width=\"" + std::to_string(kCell) + "\" height=\"30\" fill=\"" +
                     colour.hex() + "\"/>" +
                     (colour.clipped ? "<path d=\"M" + std::to_string(std::stoi(x) + kCell - 8) +
                                           " 3l5 5l-5 5l-5 -5z\" fill=\"" +
                                           (colour.luminance() > 0.35 ? "#000000" : "#ffffff") + "\"/>"
                                     : "") +
                     "<text x=\"" + middle + "\" y=\"44\" text-anchor=\"middle\" class=\"small\">" +
                     std::to_string(tone) + "</text><text x=\"" + middle + "\" y=\"58\" text-anchor=\"middle\">" +
                     fixed(ramp[tone].lab.L, 1) + "</text>";
            description += " " + std::to_string(tone) + ": " + fixed(ramp[tone].lab.L, 1) + " " +
                           fixed(ramp[tone].lab.a, 1) + " " + fixed(ramp[tone].lab.b, 1) + ";";
        }
        const std::string width = std::to_string(21 * kCell);
        out += "<div class=\"swatches\" id=\"ramp-" + std::to_string(channel + 1) + "\"><div class=\"group\">" +
               text(name) + "</div><svg xmlns=\"http://www.w3.org/2000/svg\" width=\"" + width + "\" height=\"" +
               std::to_string(kHeight) + "\" viewBox=\"0 0 " + width + " " + std::to_string(kHeight) +
               "\" role=\"img\"><title>" + text(name) + " ramp</title><desc>" + description + "</desc>" + cells +
               "</svg></div>\n";
    }
    return out + "<p class=\"note\">Under each step: tone (%) and L*.</p>\n" + sectionEnd();
}

} // namespace

std::string htmlReport(const MultiChannelResult& result)
{
    const std::string model = result.inks == 6 ? "six-colour model" : "seven-colour model";
    return pageStart("Print model report: " + result.formWarnings.path) +
           pageHeader("Print model report", text(result.formWarnings.path) + " \xC2\xB7 " + model,
                      {{"summary", "Summary"}, {"solids", "Paper and solids"}, {"chart", "Chart"},
                       {"ramps", "Ramps"}}) +
           summarySection(result) + solidsSection(result) + chartSection(result) + rampsSection(result) + pageEnd();
}

} // namespace veltmarquist
