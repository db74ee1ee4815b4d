// The pieces every HTML report is made of: text and numbers written safely,
// the page with its style sheet, sections, tables and colour swatches.
//
// The page is polyglot XHTML5: it reads as HTML in any browser and parses as
// XML, so that tests and other tools can read its numbers. It needs no
// script, no network and no font of its own, and prints on A4.
#ifndef VELTMARQUIST_TOOL_HTML_H
#define VELTMARQUIST_TOOL_HTML_H

#include "Numbers.h"
#include "Srgb.h"

#include <string>
#include <vector>

namespace veltmarquist::html {

// Text for element content and attribute values: a TAB as a space, other
// control characters and bytes that are not UTF-8 escaped as every message
// shows them, then & < > " ' as character references.
std::string text(const std::string& raw);

// `value` with `decimals` digits after the point (Numbers.h's fixedText).
inline std::string fixed(double value, int decimals)
{
    return fixedText(value, decimals);
}
// A signed value ("+1.5", "-0.3", "0.0").
std::string signedFixed(double value, int decimals);

// The page: everything up to <body>, and its end.
std::string pageStart(const std::string& title);
std::string pageEnd();

// <section id="ID"><h2>HEADING</h2>, a lead paragraph when given; and its end.
std::string sectionStart(const std::string& id, const std::string& heading, const std::string& lead = "");
std::string sectionEnd();

// A table row of data cells, each already HTML; a cell that holds a number is
// right-aligned.
std::string row(const std::vector<std::string>& cells);
// A row of header cells; those from `numbersFrom` on head columns of numbers.
std::string headerRow(const std::vector<std::string>& cells, size_t numbersFrom);

// A small SVG of one colour, or of two side by side (left, right), with
// `title` as its tooltip and text; a clipped colour carries a diamond mark.
std::string swatch(const DisplayColour& colour, const std::string& title, int width = 40, int height = 28);
std::string splitSwatch(const DisplayColour& left, const DisplayColour& right, const std::string& title,
                        int width = 84, int height = 56, bool marked = false);

// The legend of the clip mark, for a section that shows swatches.
std::string clipLegend();

} // namespace veltmarquist::html

#endif // VELTMARQUIST_TOOL_HTML_H
