// Inline SVG plots.
#include "Svg.h"

#include "Html.h"

#include <cmath>

namespace veltmarquist::svg {

namespace {

std::string attribute(const char* name, const std::string& value)
{
    return std::string(" ") + name + "=\"" + value + "\"";
}

std::string classOf(const std::string& cssClass)
{
    return cssClass.empty() ? "" : attribute("class", cssClass);
}

} // namespace

std::string coordinate(double pixel)
{
    return html::fixed(pixel, 1);
}

std::vector<double> ticks(Range range, double step)
{
    std::vector<double> values;
    const long count = std::lround((range.high - range.low) / step);
    for (long i = 0; i <= count; ++i)
        values.push_back(range.low + step * static_cast<double>(i));
    return values;
}

Plot::Plot(int width, int height, Range x, Range y, int left, int right, int top, int bottom)
    : width_(width), height_(height), x_(x), y_(y), left_(left), right_(right), top_(top), bottom_(bottom)
{
}

double Plot::px(double x) const
{
    return left_ + (x - x_.low) / (x_.high - x_.low) * (width_ - left_ - right_);
}

double Plot::py(double y) const
{
    return height_ - bottom_ - (y - y_.low) / (y_.high - y_.low) * (height_ - top_ - bottom_);
}

std::string Plot::start(const std::string& title, const std::string& description) const
{
    const std::string w = std::to_string(width_), h = std::to_string(height_);
    return "<svg xmlns=\"http://www.w3.org/2000/svg\"" + attribute("width", w) + attribute("height", h) +
           attribute("viewBox", "0 0 " + w + " " + h) + " role=\"img\"><title>" + html::text(title) +
           "</title><desc>" + html::text(description) + "</desc>";
}

std::string Plot::axes(const std::vector<double>& xTicks, int xDecimals, const std::string& xTitle,
                       const std::vector<double>& yTicks, int yDecimals, const std::string& yTitle) const
{
    std::string out;
    for (double tick : xTicks)
        out += line(tick, y_.low, tick, y_.high, "grid") +
               label(tick, y_.low, html::fixed(tick, xDecimals), "", "middle", 0, 15);
    for (double tick : yTicks)
        out += line(x_.low, tick, x_.high, tick, "grid") +
               label(x_.low, tick, html::fixed(tick, yDecimals), "", "end", -5, 4);
    out += polyline({{x_.low, y_.high}, {x_.low, y_.low}, {x_.high, y_.low}}, "axis");
    out += "<text" + attribute("x", coordinate((px(x_.low) + px(x_.high)) / 2)) +
           attribute("y", coordinate(height_ - 6.0)) + " text-anchor=\"middle\">" + html::text(xTitle) + "</text>";
    const std::string middle = coordinate((py(y_.low) + py(y_.high)) / 2);
    out += "<text" + attribute("transform", "translate(12 " + middle + ") rotate(-90)") + " text-anchor=\"middle\">" +
           html::text(yTitle) + "</text>";
    return out;
}

std::string Plot::rightAxis(Range range, const std::vector<double>& yTicks, int decimals, const std::string& title) const
{
    const Plot right(width_, height_, x_, range, left_, right_, top_, bottom_);
    std::string out = right.line(x_.high, range.low, x_.high, range.high, "axis");
    for (double tick : yTicks)
        out += right.label(x_.high, tick, html::fixed(tick, decimals), "", "start", 5, 4);
    const std::string middle = coordinate((py(y_.low) + py(y_.high)) / 2);
    out += "<text" + attribute("transform", "translate(" + std::to_string(width_ - 6) + " " + middle + ") rotate(90)") +
           " text-anchor=\"middle\">" + html::text(title) + "</text>";
    return out;
}

std::string Plot::polyline(const Points& points, const std::string& cssClass) const
{
    std::string coordinates;
    for (const auto& [x, y] : points)
        coordinates += (coordinates.empty() ? "" : " ") + coordinate(px(x)) + "," + coordinate(py(y));
    return "<polyline" + attribute("points", coordinates) + classOf(cssClass) + "/>";
}

std::string Plot::polygon(const Points& points, const std::string& cssClass) const
{
    std::string out = polyline(points, cssClass);
    return "<polygon" + out.substr(9);
}

std::string Plot::line(double x1, double y1, double x2, double y2, const std::string& cssClass) const
{
    return "<line" + attribute("x1", coordinate(px(x1))) + attribute("y1", coordinate(py(y1))) +
           attribute("x2", coordinate(px(x2))) + attribute("y2", coordinate(py(y2))) + classOf(cssClass) + "/>";
}

std::string Plot::box(double x1, double y1, double x2, double y2, const std::string& cssClass,
                      const std::string& fill) const
{
    const double left = std::fmin(px(x1), px(x2)), top = std::fmin(py(y1), py(y2));
    return "<rect" + attribute("x", coordinate(left)) + attribute("y", coordinate(top)) +
           attribute("width", coordinate(std::fabs(px(x2) - px(x1)))) +
           attribute("height", coordinate(std::fabs(py(y2) - py(y1)))) + classOf(cssClass) +
           (fill.empty() ? "" : attribute("fill", fill)) + "/>";
}

std::string Plot::marker(double x, double y, const std::string& shape, double radius, const std::string& cssClass,
                         const std::string& fill) const
{
    const double cx = px(x), cy = py(y), r = radius;
    const std::string paint = classOf(cssClass) + (fill.empty() ? "" : attribute("fill", fill));
    if (shape == "circle")
        return "<circle" + attribute("cx", coordinate(cx)) + attribute("cy", coordinate(cy)) +
               attribute("r", coordinate(r)) + paint + "/>";
    std::string path;
    if (shape == "square")
        path = "M" + coordinate(cx - r) + " " + coordinate(cy - r) + "h" + coordinate(2 * r) + "v" +
               coordinate(2 * r) + "h" + coordinate(-2 * r) + "z";
    else if (shape == "diamond")
        path = "M" + coordinate(cx) + " " + coordinate(cy - r * 1.3) + "l" + coordinate(r * 1.3) + " " +
               coordinate(r * 1.3) + "l" + coordinate(-r * 1.3) + " " + coordinate(r * 1.3) + "l" +
               coordinate(-r * 1.3) + " " + coordinate(-r * 1.3) + "z";
    else
        path = "M" + coordinate(cx) + " " + coordinate(cy - r * 1.3) + "L" + coordinate(cx + r * 1.2) + " " +
               coordinate(cy + r * 0.9) + "L" + coordinate(cx - r * 1.2) + " " + coordinate(cy + r * 0.9) + "z";
    return "<path" + attribute("d", path) + paint + "/>";
}

std::string Plot::label(double x, double y, const std::string& text, const std::string& cssClass,
                        const std::string& anchor, double dx, double dy) const
{
    return "<text" + attribute("x", coordinate(px(x) + dx)) + attribute("y", coordinate(py(y) + dy)) +
           (anchor == "start" ? "" : attribute("text-anchor", anchor)) + classOf(cssClass) + ">" + text + "</text>";
}

} // namespace veltmarquist::svg
