// The check section of the four-colour report: how the differences between
// measured and predicted colours are distributed, where in colour space and
// over the inks they lie, and the worst combinations.
#include "HtmlSections.h"

#include "Svg.h"

#include <algorithm>
#include <cmath>
#include <numeric>

namespace veltmarquist::html {

namespace {

// A step of 1, 2 or 5 times a power of ten that splits `span` into at most `parts`.
double niceStep(double span, int parts)
{
    const double raw = span / parts;
    const double power = std::pow(10.0, std::floor(std::log10(raw)));
    for (double factor : {1.0, 2.0, 5.0, 10.0})
        if (factor * power >= raw)
            return factor * power;
    return 10.0 * power;
}

std::vector<size_t> worstFirst(const std::vector<CheckedPatch>& check)
{
    std::vector<size_t> order(check.size());
    std::iota(order.begin(), order.end(), 0);
    std::stable_sort(order.begin(), order.end(),
                     [&](size_t a, size_t b) { return check[a].deltaE2000 > check[b].deltaE2000; });
    return order;
}

std::string cmykText(const Cmyk& cmyk)
{
    return coverageText(std::vector<double>(cmyk.begin(), cmyk.end()), {"C", "M", "Y", "K"});
}

// ---- Histogram and cumulative curve -------------------------------------------------------------

std::string histogram(const std::vector<CheckedPatch>& check, const Summary& summary)
{
    // About twenty bins of 0.01, 0.02, 0.05, 0.1, ... up to the largest difference.
    const double largest = std::isfinite(summary.max) ? summary.max : 0.0;
    const double width = largest > 0.0 ? niceStep(largest, 20) : 0.1;
    const size_t bins = std::max<size_t>(1, static_cast<size_t>(std::ceil(largest / width)));
    std::vector<size_t> counts(bins, 0);
    for (const CheckedPatch& patch : check)
        if (std::isfinite(patch.deltaE2000))
            ++counts[std::min(bins - 1, static_cast<size_t>(std::max(0.0, patch.deltaE2000) / width))];
    const size_t most = std::max<size_t>(1, *std::max_element(counts.begin(), counts.end()));
    const double step = niceStep(static_cast<double>(most), 5);
    const double top = std::ceil(static_cast<double>(most) / step) * step;
    const double right = width * static_cast<double>(bins);
    const svg::Plot plot(620, 300, {0, right}, {0, top}, 52, 56, 14, 40);
    const svg::Plot cumulative(620, 300, {0, right}, {0, 100}, 52, 56, 14, 40);

    std::string bars, description = "Combinations per bin of " + fixed(width, 2) + ":";
    svg::Points curve{{0, 0}};
    size_t sum = 0;
    for (size_t bin = 0; bin < bins; ++bin) {
        const double low = width * static_cast<double>(bin);
        sum += counts[bin];
        curve.emplace_back(low + width, 100.0 * static_cast<double>(sum) / static_cast<double>(check.size()));
        if (counts[bin] > 0)
            bars += plot.box(low, 0, low + width, static_cast<double>(counts[bin]), "bar");
        description += " " + fixed(low, 2) + "-" + fixed(low + width, 2) + ": " + std::to_string(counts[bin]) + ";";
    }
    description += " mean " + fixed(summary.mean, 2) + ", 95th percentile " + fixed(summary.p95, 2) + ", max " +
                   fixed(summary.max, 2) + ".";
    const double xStep = niceStep(right, 7);
    return "<figure class=\"plot\"><figcaption>How large the differences are</figcaption>" +
           plot.start("Histogram and cumulative share of CIEDE2000 differences", description) +
           plot.axes(svg::ticks({0, std::floor(right / xStep) * xStep}, xStep), xStep < 0.1 ? 2 : xStep < 1 ? 1 : 0,
                     std::string(kDeltaE00Text) + " (CIEDE2000)", svg::ticks({0, top}, step), 0, "combinations") +
           plot.rightAxis({0, 100}, svg::ticks({0, 100}, 20), 0, "cumulative share (%)") + bars +
           cumulative.polyline(curve, "cumulative") + plot.line(summary.mean, 0, summary.mean, top, "mean") +
           plot.line(summary.p95, 0, summary.p95, top, "p95") +
           plot.label(summary.mean, top, "mean " + fixed(summary.mean, 2), "", "start", 4, 10) +
           plot.label(summary.p95, top, "p95 " + fixed(summary.p95, 2), "", "start", 4, 24) + svg::Plot::end() +
           "<p class=\"legend\"><span class=\"key bar\"></span>combinations per bin of " + fixed(width, 2) +
           "<span class=\"key cumulative\"></span>share at or below (right axis)<span class=\"key mean\"></span>mean"
           "<span class=\"key p95\"></span>95th percentile</p></figure>\n";
}

// ---- a*b* plane ---------------------------------------------------------------------------------

// Combinations drawn one by one in the plane; beyond, cells of the plane
// (kCells per axis) and the kWorstDrawn worst combinations.
constexpr size_t kEveryMark = 2000, kCells = 60, kWorstDrawn = 200;

// The convex hull (Andrew's monotone chain), counter-clockwise.
svg::Points hull(svg::Points points)
{
    std::sort(points.begin(), points.end());
    points.erase(std::unique(points.begin(), points.end()), points.end());
    if (points.size() < 3)
        return points;
    const auto cross = [](const std::pair<double, double>& o, const std::pair<double, double>& a,
                          const std::pair<double, double>& b) {
        return (a.first - o.first) * (b.second - o.second) - (a.second - o.second) * (b.first - o.first);
    };
    svg::Points out(2 * points.size());
    size_t k = 0;
    for (size_t i = 0; i < points.size(); ++i) {
        while (k >= 2 && cross(out[k - 2], out[k - 1], points[i]) <= 0)
            --k;
        out[k++] = points[i];
    }
    for (size_t i = points.size() - 1, lower = k + 1; i > 0; --i) {
        while (k >= lower && cross(out[k - 2], out[k - 1], points[i - 1]) <= 0)
            --k;
        out[k++] = points[i - 1];
    }
    out.resize(k - 1);
    return out;
}

std::string abPlane(const std::vector<CheckedPatch>& check, const std::vector<size_t>& worst)
{
    double reach = 20.0;
    svg::Points measured, predicted;
    for (const CheckedPatch& patch : check) {
        measured.emplace_back(patch.measuredLab.a, patch.measuredLab.b);
        predicted.emplace_back(patch.predictedLab.a, patch.predictedLab.b);
        for (double value : {patch.measuredLab.a, patch.measuredLab.b, patch.predictedLab.a, patch.predictedLab.b})
            if (std::isfinite(value))
                reach = std::max(reach, std::ceil(std::fabs(value) / 20.0) * 20.0);
    }
    const svg::Plot plot(600, 600, {-reach, reach}, {-reach, reach}, 52, 14, 10, 42);
    const double step = reach > 100 ? 40 : 20;
    // Up to kEveryMark combinations each get a dot and a line; beyond that
    // one mark per combination could not be seen anyway and would make the
    // page slow: the plane is split into cells coloured by the mean
    // difference of the measured colours in them, and only the worst
    // combinations are drawn one by one.
    const bool aggregated = check.size() > kEveryMark;
    std::vector<size_t> drawn;
    if (aggregated) {
        const std::vector<size_t> order = worstFirst(check);
        drawn.assign(order.begin(), order.begin() + static_cast<std::ptrdiff_t>(kWorstDrawn));
    } else {
        drawn.resize(check.size());
        std::iota(drawn.begin(), drawn.end(), 0);
    }
    std::string cells, lines, dots, ranks;
    if (aggregated) {
        std::vector<double> sum(kCells * kCells, 0.0);
        std::vector<size_t> count(kCells * kCells, 0);
        const double width = 2.0 * reach / kCells;
        for (size_t i = 0; i < check.size(); ++i) {
            const double a = measured[i].first, b = measured[i].second, d = check[i].deltaE2000;
            if (!std::isfinite(a) || !std::isfinite(b) || !std::isfinite(d))
                continue;
            const auto cellOf = [&](double value) {
                return std::min(kCells - 1, static_cast<size_t>(std::max(0.0, (value + reach) / width)));
            };
            const size_t cell = cellOf(b) * kCells + cellOf(a);
            sum[cell] += d;
            ++count[cell];
        }
        for (size_t row = 0; row < kCells; ++row)
            for (size_t column = 0; column < kCells; ++column) {
                const size_t cell = row * kCells + column;
                if (count[cell] == 0)
                    continue;
                bool dark = false;
                const double a = -reach + width * static_cast<double>(column), b = -reach + width * static_cast<double>(row);
                cells += plot.box(a, b, a + width, b + width, "cell",
                                  heatColour(sum[cell] / static_cast<double>(count[cell]), dark));
            }
    }
    for (size_t i : drawn) {
        lines += plot.line(measured[i].first, measured[i].second, predicted[i].first, predicted[i].second, "error");
        dots += plot.marker(measured[i].first, measured[i].second, "circle", 2.4, "dot",
                            srgbOfXYZ(check[i].measuredXYZ).hex());
    }
    for (size_t rank = 0; rank < worst.size(); ++rank)
        ranks += plot.label(measured[worst[rank]].first, measured[worst[rank]].second, std::to_string(rank + 1),
                            "rank", "start", 4, -4);
    const svg::Points measuredHull = hull(measured), predictedHull = hull(predicted);
    std::string description = std::to_string(check.size()) + " combinations. Gamut outline (a*, b*) measured:";
    for (const auto& [a, b] : measuredHull)
        description += " " + fixed(a, 1) + " " + fixed(b, 1) + ";";
    description += " predicted:";
    for (const auto& [a, b] : predictedHull)
        description += " " + fixed(a, 1) + " " + fixed(b, 1) + ";";
    description += aggregated ? " Cells of " + fixed(2.0 * reach / kCells, 1) +
                                    " a*b* units coloured by the mean CIEDE2000 of the measured colours in them; the " +
                                    std::to_string(kWorstDrawn) + " worst combinations, a* b* measured > predicted:"
                              : std::string(" Each combination, a* b* measured > predicted:");
    for (size_t i : drawn)
        description += " " + cmykText(check[i].device) + " " + fixed(measured[i].first, 1) + " " +
                       fixed(measured[i].second, 1) + " > " + fixed(predicted[i].first, 1) + " " +
                       fixed(predicted[i].second, 1) + ";";
    return "<figure class=\"plot\"><figcaption>Where in colour space: a*b* plane</figcaption>" +
           plot.start("Measured and predicted colours in the a*b* plane", description) +
           plot.axes(svg::ticks({-reach, reach}, step), 0, "a*", svg::ticks({-reach, reach}, step), 0, "b*") +
           plot.line(-reach, 0, reach, 0, "unity") + plot.line(0, -reach, 0, reach, "unity") +
           cells + plot.polygon(measuredHull, "hull-measured") + plot.polygon(predictedHull, "hull-predicted") + lines +
           dots + ranks + svg::Plot::end() + "<p class=\"legend\">" +
           (aggregated ? "Squares: the mean " + std::string(kDeltaE00) + " of the " + std::to_string(check.size()) +
                             " measured colours in each, on the scale of the map below. Dots: the " +
                             std::to_string(kWorstDrawn) + " worst combinations (in their own colour); "
                       : std::string("Dots: measured colours (in their own colour); ")) +
           "<span class=\"key error\"></span>line "
           "to the predicted colour; <span class=\"key measured\"></span>outline of the measured colours; "
           "<span class=\"key hull-predicted\"></span>outline of the predicted ones. Numbers: the worst "
           "combinations as ranked in the table below.</p></figure>\n";
}

// ---- Error map --------------------------------------------------------------------------------------

constexpr size_t kBins = 3;
const char* const kBinNames[kBins] = {"0\xE2\x80\x93" "20", "21\xE2\x80\x93" "70", "71\xE2\x80\x93" "100"};

size_t binOf(double coverage)
{
    return coverage <= 20.0 ? 0 : coverage <= 70.0 ? 1 : 2;
}

std::string errorMap(const ModelCheck& model)
{
    const std::vector<CheckedPatch>& check = model.patches;
    struct Cell {
        std::vector<double> values;
    };
    // [black range][C bin][M bin][Y bin]
    std::vector<Cell> cells(4 * kBins * kBins * kBins);
    const auto at = [&](size_t k, size_t c, size_t m, size_t y) -> Cell& {
        return cells[((k * kBins + c) * kBins + m) * kBins + y];
    };
    for (const CheckedPatch& patch : check)
        at(blackRangeOf(patch.device[3]), binOf(patch.device[0]), binOf(patch.device[1]), binOf(patch.device[2]))
            .values.push_back(patch.deltaE2000);
    static const char* const blacks[4] = {"Black 0 %", "Black 1\xE2\x80\x93" "40 %", "Black 41\xE2\x80\x93" "85 %",
                                          "Black 86\xE2\x80\x93" "100 %"};
    std::string out = "<div class=\"heatmaps\">\n";
    for (size_t k = 0; k < 4; ++k) {
        const std::string id = "error-map-k" + std::to_string(k);
        if (std::all_of(check.begin(), check.end(),
                        [&](const CheckedPatch& patch) { return blackRangeOf(patch.device[3]) != k; })) {
            const std::size_t leftOut = model.leftOut.byBlack[k];
            out += "<p class=\"note\" id=\"" + id + "\">" + blacks[k] + ": " +
                   (leftOut == 0 ? std::string("no combination measured beyond the test form")
                                 : "no combination checked; " + std::to_string(leftOut) +
                                       " measured ones are left out (see the summary)") +
                   ".</p>\n";
            continue;
        }
        out += "<table class=\"heat\" id=\"" + id + "\"><caption>" + blacks[k] + "</caption>\n<tr><th></th>";
        for (size_t m = 0; m < kBins; ++m)
            out += std::string("<th colspan=\"3\">M ") + kBinNames[m] + " %</th>";
        out += "</tr>\n<tr><th></th>";
        for (size_t m = 0; m < kBins; ++m)
            for (size_t y = 0; y < kBins; ++y)
                out += std::string("<th>Y ") + kBinNames[y] + "</th>";
        out += "</tr>\n";
        for (size_t c = 0; c < kBins; ++c) {
            out += std::string("<tr><th>C ") + kBinNames[c] + " %</th>";
            for (size_t m = 0; m < kBins; ++m)
                for (size_t y = 0; y < kBins; ++y) {
                    const std::vector<double>& values = at(k, c, m, y).values;
                    if (values.empty()) {
                        out += "<td style=\"background:#f0f0f2;color:#8d8d93\">\xE2\x80\x93</td>";
                        continue;
                    }
                    const Summary cell = summarise(values);
                    bool dark = false;
                    const std::string colour = heatColour(cell.mean, dark);
                    out += "<td style=\"background:" + colour + ";color:" + (dark ? "#ffffff" : "#000000") +
                           "\" title=\"" + std::to_string(cell.count) + " combinations, mean " + fixed(cell.mean, 2) +
                           ", max " + fixed(cell.max, 2) + "\">" + fixed(cell.mean, 1) + "<span class=\"n\">n " +
                           std::to_string(cell.count) + "</span></td>";
                }
            out += "</tr>\n";
        }
        out += "</table>\n";
    }
    std::string scale;
    for (double value : {0.0, 0.5, 1.0, 1.5, 2.0, 3.0, 4.0}) {
        bool dark = false;
        const std::string colour = heatColour(value, dark);
        scale += "<td style=\"background:" + colour + ";color:" + (dark ? "#ffffff" : "#000000") + "\">" +
                 (value == 4.0 ? "\xE2\x89\xA5" "4" : fixed(value, 1)) + "</td>";
    }
    return out + "</div>\n<table class=\"heat\"><tr><th>mean " + kDeltaE00 + "</th>" + scale + "</tr></table>\n";
}

// ---- The worst combinations --------------------------------------------------------------------------

std::string worstTable(const std::vector<CheckedPatch>& check, const std::vector<size_t>& worst)
{
    std::string out = "<table id=\"worst\">\n" +
                      headerRow({"#", "C M Y K", "measured | predicted", "measured L* a* b*", "predicted L* a* b*",
                                 kDeltaE00, "\xCE\x94" "E*ab"},
                                3);
    for (size_t rank = 0; rank < worst.size(); ++rank) {
        const CheckedPatch& patch = check[worst[rank]];
        const auto lab = [](const Lab& value) {
            return fixed(value.L, 1) + " " + fixed(value.a, 1) + " " + fixed(value.b, 1);
        };
        out += row({std::to_string(rank + 1), text(cmykText(patch.device)),
                    splitSwatch(srgbOfXYZ(patch.measuredXYZ), srgbOfXYZ(patch.predictedXYZ),
                                cmykText(patch.device) + ": measured and predicted", 64, 22),
                    lab(patch.measuredLab), lab(patch.predictedLab), fixed(patch.deltaE2000, 2),
                    fixed(patch.deltaEab, 2)});
    }
    return out + "</table>\n";
}

} // namespace

// Viridis, light (small differences) to dark (4 and above): safe for
// colour-blind readers and still ordered in grey.
std::string heatColour(double value, bool& dark)
{
    static const int stops[5][3] = {{253, 231, 37}, {94, 201, 98}, {33, 145, 140}, {59, 82, 139}, {68, 1, 84}};
    const double at = std::min(std::max(value, 0.0), 4.0);
    const size_t low = std::min<size_t>(3, static_cast<size_t>(at));
    const double t = at - static_cast<double>(low);
    std::array<int, 3> rgb{};
    for (size_t c = 0; c < 3; ++c)
        rgb[c] = static_cast<int>(std::lround(stops[low][c] + t * (stops[low + 1][c] - stops[low][c])));
    dark = at >= 1.8;
    DisplayColour colour;
    colour.rgb = rgb;
    return colour.hex();
}

std::string checkSection(const ChartResult& result)
{
    const std::vector<CheckedPatch>& check = result.check.patches;
    const Summary& summary = result.check.all.deltaE2000;
    std::vector<size_t> worst = worstFirst(check);
    worst.resize(std::min<size_t>(15, worst.size()));
    return sectionStart("check", "5 The check: " + std::to_string(summary.count) +
                                     " combinations measured beyond the test form",
                        "Each combination the file measured beyond the 46 patches of the form is an independent "
                        "check of the model on this press: mean " + std::string(kDeltaE00) + " " +
                            fixed(summary.mean, 2) + ", 95th percentile " + fixed(summary.p95, 2) + ", max " +
                            fixed(summary.max, 2) + ".") +
           "<div class=\"plots wide\">\n" + histogram(check, summary) + abPlane(check, worst) + "</div>\n" +
           "<h3>Where over the inks: mean " + kDeltaE00 + " by cyan, magenta and yellow, for each range of black</h3>\n"
           "<p class=\"note\">Each cell holds the mean difference of the combinations in it and their number (n); "
           "the darker the cell, the larger the difference. Hover a cell for its maximum.</p>\n" +
           errorMap(result.check) + "<h3>The " + std::to_string(worst.size()) + " largest differences</h3>\n" +
           worstTable(check, worst) + sectionEnd();
}

} // namespace veltmarquist::html
