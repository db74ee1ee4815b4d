// The fitted values of the four-colour models in words.
#include "ModelInWords.h"

#include "Html.h"

#include <algorithm>
#include <cctype>
#include <cmath>

namespace veltmarquist {

namespace {

const char* const kInks[4] = {"cyan", "magenta", "yellow", "black"};

std::string capital(std::string text)
{
    if (!text.empty())
        text[0] = static_cast<char>(std::toupper(static_cast<unsigned char>(text[0])));
    return text;
}

std::string percent(double fraction)
{
    return html::fixed(100.0 * fraction, 1) + " %";
}

// The offset model raises an ink's dot area d to e = 1 - g sqrt(q x / 100),
// q = 1 where the other inks cover the full-correction coverage or more: a
// 50 % dot area of a 50 % tint becomes 0.5^e there.
std::vector<std::string> offsetWords(const PrintModel& model)
{
    const std::vector<double>& factor = valueNamed(model, "gray difference factor").numbers;
    const std::vector<double>& limit = valueNamed(model, "full correction").numbers;
    std::vector<std::string> words;
    if (factor.size() < 4 || limit.empty())
        return words;
    const std::string full = html::fixed(limit[0], 0) + " %";
    for (size_t ink = 0; ink < 4; ++ink) {
        const double area = std::pow(0.5, 1.0 - factor[ink] * std::sqrt(0.5));
        const std::string value = "(gray difference factor " + html::fixed(factor[ink], 2) + ")";
        if (std::fabs(area - 0.5) < 0.0005)
            words.push_back(capital(kInks[ink]) + " prints over other inks as on paper " + value + ".");
        else
            words.push_back(capital(kInks[ink]) + " dots print " + (area > 0.5 ? "larger" : "smaller") +
                            " over other inks: a 50 % dot area becomes " + percent(area) +
                            " where the other inks cover " + full + " or more " + value + ".");
    }
    words.push_back("The correction grows with the other inks' total coverage and is full from " + full +
                    " on (a value of the model, not an ink limit).");
    return words;
}

// The gravure model prints ink i + 1 with the exponent f_1 ... f_i on solids
// of the inks before it: the product of their trapping factors.
std::vector<std::string> gravureWords(const FittedModel& fit)
{
    const std::string order = valueNamed(*fit.model, "ink order").text;
    const std::vector<double>& factor = valueNamed(*fit.model, "trapping factors").numbers;
    std::vector<std::string> words;
    if (order.size() != 4 || factor.size() < 3)
        return words;
    words.push_back("Ink order " + std::string(1, order[0]) + ", " + order[1] + ", " + order[2] + ", " + order[3] +
                    ": " + order[0] + " prints first.");
    const char* const positions[3] = {"second", "third", "fourth"};
    double strength = 1.0;
    std::string below(1, order[0]);
    for (size_t i = 0; i < 3; ++i) {
        strength *= factor[i];
        words.push_back(capital(positions[i]) + " ink " + order[i + 1] + " prints on solid " + below + " with " +
                        percent(strength) + " of its strength (trapping factor " + html::fixed(factor[i], 2) + ").");
        below += std::string(i == 1 ? " and " : ", ") + order[i + 1];
    }
    words.push_back(fit.choice == ModelChoice::gravureFitted ? "Ink order and trapping factors are fitted to the measured red, green and "
                                        "blue overprints."
                                      : "Ink order and trapping factors are the library's defaults (--fit-gravure "
                                        "fits them to the red, green and blue overprints).");
    return words;
}

// The Yule-Nielsen model spreads ink i over others: a' = a + s q a (1 - a),
// so a 50 % dot fully covered by other inks (q = 1) gains s / 4.
std::vector<std::string> yuleNielsenWords(const PrintModel& model)
{
    std::vector<std::string> words;
    const std::vector<double>& n = valueNamed(model, "Yule-Nielsen n").numbers;
    if (!n.empty()) {
        const auto low = std::min_element(n.begin(), n.end()), high = std::max_element(n.begin(), n.end());
        const auto nm = [&](std::vector<double>::const_iterator at) {
            return std::to_string(380 + 10 * (at - n.begin())) + " nm";
        };
        words.push_back("Effective dot-gain exponent n = " + html::fixed(n.front(), 2) + " at 380 nm, " +
                        (n.back() >= n.front() ? "rising" : "falling") + " to " + html::fixed(n.back(), 2) +
                        " at 730 nm (lowest " + html::fixed(*low, 2) + " at " + nm(low) + ", highest " +
                        html::fixed(*high, 2) + " at " + nm(high) + "); n = 1 would mean no optical dot gain.");
    }
    for (const auto& [index, level] : {std::pair<size_t, const char*>{3, "40"}, {6, "80"}}) {
        std::string areas;
        for (size_t ink = 0; ink < 4; ++ink) {
            const std::vector<double>& curve =
                valueNamed(model, std::string("dot area ") + "CMYK"[ink]).numbers;
            if (curve.size() > index)
                areas += std::string(areas.empty() ? "" : ", ") + "CMYK"[ink] + " " + percent(curve[index]);
        }
        if (!areas.empty())
            words.push_back("Effective dot area of a " + std::string(level) + " % tint: " + areas + ".");
    }
    const std::vector<double>& spreading = valueNamed(model, "ink spreading").numbers;
    for (size_t ink = 0; ink < 4 && ink < spreading.size(); ++ink) {
        const double grown = 0.5 + spreading[ink] / 4.0;
        const std::string value = "(spreading factor " + html::signedFixed(spreading[ink], 3) + ")";
        if (std::fabs(grown - 0.5) < 0.0005)
            words.push_back(capital(kInks[ink]) + " spreads over other inks as on paper " + value + ".");
        else
            words.push_back(capital(kInks[ink]) + " spreads " + (grown > 0.5 ? "more" : "less") +
                            " over other inks: a 50 % dot on a full cover of other inks " +
                            (grown > 0.5 ? "grows" : "shrinks") + " to " + percent(grown) + " " + value + ".");
    }
    const std::vector<double>& tint = valueNamed(model, "tint residual").numbers;
    const std::vector<double>& grey = valueNamed(model, "grey dE*ab").numbers;
    if (!tint.empty() && grey.size() == 2)
        words.push_back("Fit residuals: the 28 tints " + html::fixed(tint[0], 4) + " RMS reflectance; the greys " +
                        html::fixed(grey[0], 2) + " \xCE\x94" "E*ab (C40 M40 Y40) and " + html::fixed(grey[1], 2) +
                        " \xCE\x94" "E*ab (C40 M40 Y40 K40).");
    return words;
}

} // namespace

const FittedValue& valueNamed(const PrintModel& model, const std::string& name)
{
    static const FittedValue none;
    const std::vector<FittedValue>& values = model.fittedValues();
    const auto found = std::find_if(values.begin(), values.end(),
                                    [&](const FittedValue& value) { return value.name.rfind(name, 0) == 0; });
    return found == values.end() ? none : *found;
}

ModelWords modelInWords(const FittedModel& fit)
{
    ModelWords words;
    if (fit.choice == ModelChoice::yuleNielsen) {
        words.how = "The Yule-Nielsen model mixes the 16 measured solids and overprints in a compressed reflectance "
                    "scale (each spectrum raised to 1/n, n fitted per wavelength), with a smooth dot-area curve per "
                    "ink through its measured tints and a spreading factor per ink for dots printed over other inks; "
                    "it is fitted to all 46 patches and predicts any coverage.";
        words.values = yuleNielsenWords(*fit.model);
    } else if (fit.choice != ModelChoice::offset) {
        words.how = "The gravure model prints the inks one over the other: each ink's measured tint multiplies onto "
                    "what lies below it, with less strength the more ink lies below (trapping). It predicts the "
                    "form's coverage levels.";
        words.values = gravureWords(fit);
    } else {
        words.how = "The offset model mixes the 16 measured solids and overprints by the inks' area shares "
                    "(spectral Neugebauer); each ink's dot area comes from its measured tints, wavelength by "
                    "wavelength, corrected where the ink prints over other inks by a correction fitted to the two "
                    "measured greys. It predicts the form's coverage levels.";
        words.values = offsetWords(*fit.model);
    }
    for (const FittedValue& value : fit.model->fittedValues())
        if (value.name == "warning" && !value.text.empty())
            words.warnings.push_back(value.text);
    return words;
}

} // namespace veltmarquist
