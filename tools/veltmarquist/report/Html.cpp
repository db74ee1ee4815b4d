// The page, its style sheet and the small pieces of every report.
#include "Html.h"

#include "Text.h"

#include <algorithm>
#include <charconv>
#include <cmath>

namespace veltmarquist::html {

namespace {

// Light throughout, so that screen and paper look alike; plots take the
// Okabe-Ito colours (safe for colour-blind readers) and differ by dash and
// marker as well. System fonts only.
const char* const kStyle = R"(
:root { --ink: #1d1d1f; --muted: #5b5b60; --rule: #d6d6da; --panel: #f6f6f8; }
* { box-sizing: border-box; }
body { margin: 0; color: var(--ink); background: #ffffff;
  font: 15px/1.45 system-ui, -apple-system, "Segoe UI", Roboto, "Noto Sans", "Liberation Sans", Arial, sans-serif; }
main { max-width: 1200px; margin: 0 auto; padding: 24px 28px 48px; }
header.page { border-bottom: 3px solid var(--ink); margin-bottom: 8px; padding-bottom: 10px; }
h1 { font-size: 26px; margin: 0 0 4px; }
h2 { font-size: 20px; margin: 36px 0 6px; padding-top: 8px; border-top: 1px solid var(--rule); }
h3 { font-size: 15px; margin: 18px 0 6px; }
section#summary h2 { border-top: none; margin-top: 14px; }
.columns { display: flex; flex-wrap: wrap; gap: 0 28px; align-items: flex-start; }
p { margin: 4px 0 10px; max-width: 62em; }
.sub, .note, figcaption, .legend { color: var(--muted); font-size: 13px; }
nav.contents { font-size: 14px; margin: 6px 0 0; }
nav.contents a { color: var(--ink); margin-right: 14px; }
.figures { display: flex; flex-wrap: wrap; gap: 10px; margin: 14px 0; }
.figure { border: 1px solid var(--rule); background: var(--panel); padding: 8px 14px; min-width: 150px; }
.figure .value { font-size: 24px; font-weight: 600; font-variant-numeric: tabular-nums; }
.figure .label { font-size: 12px; color: var(--muted); }
table { border-collapse: collapse; font-variant-numeric: tabular-nums; margin: 6px 0 14px; }
th, td { padding: 3px 8px; border-bottom: 1px solid var(--rule); text-align: left; vertical-align: top; }
th { font-weight: 600; font-size: 13px; }
td.num, th.num { text-align: right; white-space: nowrap; }
table.facts th, table.facts td:first-child { width: 15em; font-weight: 500; color: var(--muted); }
table.facts td.num { text-align: left; }
#tone-values-table td:first-child, #worst td:nth-child(2) { white-space: nowrap; }
ul.words li { margin: 3px 0; }
.warning { color: #8a3b00; }
.swatches { display: flex; flex-wrap: wrap; gap: 8px 10px; align-items: flex-start; margin: 4px 0 10px; }
.swatches .group { flex: 0 0 9.5em; font-weight: 600; font-size: 13px; padding-top: 18px; }
figure.patch { margin: 0; width: 88px; text-align: center; font-size: 12px; line-height: 1.25; }
figure.patch svg { display: block; }
figure.patch strong { color: var(--ink); }
figure.small { width: 44px; font-size: 10px; }
.plots { display: grid; grid-template-columns: repeat(auto-fill, minmax(270px, 1fr)); gap: 10px 14px; }
.plots.wide { grid-template-columns: repeat(auto-fill, minmax(520px, 1fr)); }
figure.plot { margin: 0; }
figure.plot figcaption { font-size: 13px; color: var(--ink); font-weight: 600; margin-bottom: 2px; }
svg { max-width: 100%; height: auto; overflow: visible; }
svg text { font-family: inherit; font-size: 11px; fill: var(--ink); }
svg .axis { stroke: var(--ink); stroke-width: 1; fill: none; }
svg .grid { stroke: #e4e4e8; stroke-width: 1; fill: none; }
svg .unity { stroke: #8d8d93; stroke-width: 1; stroke-dasharray: 4 3; fill: none; }
svg .measured { stroke: #000000; stroke-width: 1.6; fill: none; }
svg .modelled { stroke: #D55E00; stroke-width: 1.6; stroke-dasharray: 5 3; fill: none; }
svg .reference { stroke: #8d8d93; stroke-width: 1.2; stroke-dasharray: 2 2; fill: none; }
svg .point { fill: #ffffff; stroke: #000000; stroke-width: 1.4; }
svg .bar { fill: #56B4E9; stroke: #0072B2; stroke-width: 0.6; }
svg .cumulative { stroke: #E69F00; stroke-width: 2; fill: none; }
svg .mean { stroke: #000000; stroke-width: 1.2; stroke-dasharray: 6 3; }
svg .p95 { stroke: #CC79A7; stroke-width: 1.6; stroke-dasharray: 2 2; }
svg .error { stroke: #D55E00; stroke-width: 0.9; fill: none; }
svg .dot { stroke: #6b6b70; stroke-width: 0.5; }
svg .hull-measured { stroke: #000000; stroke-width: 1.4; fill: none; }
svg .hull-predicted { stroke: #0072B2; stroke-width: 1.4; stroke-dasharray: 6 3; fill: none; }
svg .tolerance { fill: #e4ecf5; stroke: none; }
svg .point.fail { fill: #D55E00; stroke: #D55E00; }
svg .cell { stroke: none; }
svg .rank { font-size: 10px; font-weight: 700; }
svg text.small { font-size: 10px; fill: var(--muted); }
.key { display: inline-block; width: 26px; height: 0; vertical-align: middle; margin: 0 4px 0 12px; }
.key.measured { border-top: 2px solid #000000; }
.key.modelled { border-top: 2px dashed #D55E00; }
.key.reference { border-top: 2px dotted #8d8d93; }
.key.cumulative { border-top: 2px solid #E69F00; }
.key.mean { border-top: 2px dashed #000000; }
.key.p95 { border-top: 2px dotted #CC79A7; }
.key.hull-predicted { border-top: 2px dashed #0072B2; }
.key.error { border-top: 2px solid #D55E00; }
.key.bar { height: 10px; background: #56B4E9; border: 1px solid #0072B2; }
table.heat td { text-align: center; min-width: 3.6em; border: 1px solid #ffffff; padding: 4px 2px; }
table.heat td .n { display: block; font-size: 10px; opacity: 0.8; }
table.heat th { text-align: center; font-size: 12px; white-space: nowrap; padding: 3px 4px; }
.heatmaps { display: flex; flex-wrap: wrap; gap: 6px 18px; align-items: flex-start; }
* { -webkit-print-color-adjust: exact; print-color-adjust: exact; }
@page { size: A4; margin: 12mm; }
@media print {
  body { font-size: 10pt; background: #ffffff; }
  main { max-width: none; padding: 0; }
  nav.contents { display: none; }
  section { break-before: page; }
  section#summary { break-before: auto; }
  h2 { border-top: none; margin-top: 0; }
  figure, table.heat, tr, .figure { break-inside: avoid; }
  .plots { grid-template-columns: repeat(4, 1fr); gap: 4px 8px; }
  table { font-size: 8.5pt; }
  .figures { gap: 6px; margin: 8px 0; }
  .figure { padding: 3px 8px; min-width: 0; }
  .figure .value { font-size: 15pt; }
  figure.patch { width: 64px; font-size: 8pt; }
  figure.patch svg { width: 64px; height: 43px; }
  figure.small, figure.small svg { width: 34px; }
  figure.small svg { height: 23px; }
  .swatches { gap: 6px; }
  .swatches .group { flex-basis: 6.5em; }
  .plots.wide { grid-template-columns: 1fr; }
  .heatmaps { display: block; }
}
)";

std::string svgStart(int width, int height, const std::string& title)
{
    return "<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"" + std::to_string(width) + "\" height=\"" +
           std::to_string(height) + "\" viewBox=\"0 0 " + std::to_string(width) + " " + std::to_string(height) +
           "\" role=\"img\"><title>" + text(title) + "</title>";
}

// The diamond that marks a colour outside sRGB, in black or white, whichever shows.
std::string clipMark(const DisplayColour& colour, int x, int y)
{
    const std::string fill = colour.luminance() > 0.35 ? "#000000" : "#ffffff";
    return "<path d=\"M" + std::to_string(x) + " " + std::to_string(y - 5) + "l5 5l-5 5l-5 -5z\" fill=\"" + fill +
           "\"/>";
}

} // namespace

std::string text(const std::string& raw)
{
    // A TAB inside a quoted header value (spreadsheet exports leave them in
    // "ILLUMINANT,<TAB>D50") is a space on a page; other controls stay visible.
    std::string spaced = raw;
    std::replace(spaced.begin(), spaced.end(), '\t', ' ');
    const std::string shown = escapeControls(spaced);
    std::string out;
    out.reserve(shown.size());
    for (const char character : shown) {
        switch (character) {
        case '&': out += "&amp;"; break;
        case '<': out += "&lt;"; break;
        case '>': out += "&gt;"; break;
        case '"': out += "&quot;"; break;
        case '\'': out += "&#39;"; break;
        default: out += character;
        }
    }
    return out;
}

std::string signedFixed(double value, int decimals)
{
    return signedFixedText(value, decimals);
}

std::string pageStart(const std::string& title)
{
    return "<!DOCTYPE html>\n<html xmlns=\"http://www.w3.org/1999/xhtml\" lang=\"en\" xml:lang=\"en\">\n<head>\n"
           "<meta charset=\"utf-8\"/>\n<meta name=\"viewport\" content=\"width=device-width, initial-scale=1\"/>\n"
           "<meta name=\"generator\" content=\"veltmarquist\"/>\n<title>" +
           text(title) + "</title>\n<style>" + kStyle + "</style>\n</head>\n<body>\n<main>\n";
}

std::string pageEnd()
{
    return "</main>\n</body>\n</html>\n";
}

std::string sectionStart(const std::string& id, const std::string& heading, const std::string& lead)
{
    return "<section id=\"" + id + "\">\n<h2>" + text(heading) + "</h2>\n" +
           (lead.empty() ? "" : "<p>" + lead + "</p>\n");
}

std::string sectionEnd()
{
    return "</section>\n";
}

std::string row(const std::vector<std::string>& cells)
{
    std::string out = "<tr>";
    for (const std::string& cell : cells) {
        // A cell whose text (tags aside) is a number, alone or with a signed
        // difference in brackets, is right-aligned.
        std::string shown;
        for (size_t at = 0; at < cell.size(); ++at) {
            if (cell[at] == '<')
                at = std::min(cell.find('>', at), cell.size());
            else
                shown += cell[at];
        }
        const bool number = shown.find_first_of("0123456789") != std::string::npos &&
                            shown.find_first_not_of("0123456789+-. ()%") == std::string::npos;
        out += std::string(number ? "<td class=\"num\">" : "<td>") + cell + "</td>";
    }
    return out + "</tr>\n";
}

std::string headerRow(const std::vector<std::string>& cells, size_t numbersFrom)
{
    std::string out = "<tr>";
    for (size_t i = 0; i < cells.size(); ++i)
        out += std::string(i >= numbersFrom ? "<th class=\"num\">" : "<th>") + cells[i] + "</th>";
    return out + "</tr>\n";
}

std::string swatch(const DisplayColour& colour, const std::string& title, int width, int height)
{
    return svgStart(width, height, title) + "<rect width=\"" + std::to_string(width) + "\" height=\"" +
           std::to_string(height) + "\" fill=\"" + colour.hex() + "\"/>" +
           (colour.clipped ? clipMark(colour, width - 8, 8) : "") + "</svg>";
}

std::string splitSwatch(const DisplayColour& left, const DisplayColour& right, const std::string& title, int width,
                        int height, bool marked)
{
    const std::string half = std::to_string(width / 2), tall = std::to_string(height);
    std::string out = svgStart(width, height, title) + "<rect width=\"" + half + "\" height=\"" + tall +
                      "\" fill=\"" + left.hex() + "\"/><rect x=\"" + half + "\" width=\"" +
                      std::to_string(width - width / 2) + "\" height=\"" + tall + "\" fill=\"" + right.hex() + "\"/>";
    if (left.clipped)
        out += clipMark(left, 8, 8);
    if (right.clipped)
        out += clipMark(right, width - 8, 8);
    // A heavy black frame with a white line inside it shows on light and dark colours alike.
    if (marked)
        out += "<rect x=\"1.5\" y=\"1.5\" width=\"" + std::to_string(width - 3) + "\" height=\"" +
               std::to_string(height - 3) + "\" fill=\"none\" stroke=\"#000000\" stroke-width=\"3\"/><rect x=\"3.5\" "
               "y=\"3.5\" width=\"" + std::to_string(width - 7) + "\" height=\"" + std::to_string(height - 7) +
               "\" fill=\"none\" stroke=\"#ffffff\" stroke-width=\"1\"/>";
    return out + "</svg>";
}

std::string clipLegend()
{
    return "<span class=\"legend\">" + svgStart(12, 12, "clip mark") +
           "<path d=\"M6 1l5 5l-5 5l-5 -5z\" fill=\"#000000\"/></svg> outside the sRGB gamut: shown clipped, so the "
           "swatch is less saturated than the colour</span>";
}

} // namespace veltmarquist::html
