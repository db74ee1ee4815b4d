// Plots as inline SVG: a frame with axes, ticks and labels, and the lines,
// bars and markers drawn in data coordinates inside it. Styles are classes
// of the page's style sheet.
#ifndef VELTMARQUIST_TOOL_SVG_H
#define VELTMARQUIST_TOOL_SVG_H

#include <string>
#include <utility>
#include <vector>

namespace veltmarquist::svg {

struct Range {
    double low, high;
};

using Points = std::vector<std::pair<double, double>>;

// Evenly spaced ticks from `range.low` to `range.high` in steps of `step`.
std::vector<double> ticks(Range range, double step);

class Plot {
public:
    // A plot `width` x `height` pixels; the data ranges fill the area inside
    // the margins (left, right, top, bottom).
    Plot(int width, int height, Range x, Range y, int left = 46, int right = 14, int top = 10, int bottom = 38);

    double px(double x) const; // pixel of a data value
    double py(double y) const;

    // <svg> with its title (tooltip and accessible name) and a description
    // that holds the figure's numbers as text.
    std::string start(const std::string& title, const std::string& description) const;
    static std::string end() { return "</svg>"; }

    // Grid lines, the axes at the ranges' lows, ticks with labels, axis titles.
    std::string axes(const std::vector<double>& xTicks, int xDecimals, const std::string& xTitle,
                     const std::vector<double>& yTicks, int yDecimals, const std::string& yTitle) const;
    // A second y axis on the right for `range`, drawn in this plot's frame.
    std::string rightAxis(Range range, const std::vector<double>& yTicks, int decimals, const std::string& title) const;

    std::string polyline(const Points& points, const std::string& cssClass) const;
    std::string polygon(const Points& points, const std::string& cssClass) const;
    std::string line(double x1, double y1, double x2, double y2, const std::string& cssClass) const;
    // A rectangle between two data corners.
    std::string box(double x1, double y1, double x2, double y2, const std::string& cssClass,
                    const std::string& fill = "") const;
    // A marker: "circle", "square", "diamond" or "triangle", radius in pixels.
    std::string marker(double x, double y, const std::string& shape, double radius, const std::string& cssClass,
                       const std::string& fill = "") const;
    std::string label(double x, double y, const std::string& text, const std::string& cssClass = "",
                      const std::string& anchor = "start", double dx = 0, double dy = 0) const;

private:
    int width_, height_;
    Range x_, y_;
    int left_, right_, top_, bottom_;
};

// A pixel coordinate as SVG text: one decimal, locale-proof.
std::string coordinate(double pixel);

} // namespace veltmarquist::svg

#endif // VELTMARQUIST_TOOL_SVG_H
