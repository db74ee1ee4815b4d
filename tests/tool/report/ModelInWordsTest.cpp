// Fitted values in a press operator's words: the numbers the sentences give
// follow from the models' formulas (worked out by hand below), signs included.
#include "report/ModelInWords.h"

#include <gtest/gtest.h>

using namespace veltmarquist;

namespace {

// A model that holds given fitted values and predicts nothing.
class Fitted final : public PrintModel {
public:
    Fitted(const char* name, std::vector<FittedValue> values) : PrintModel(name, std::move(values), {0, 100}) {}

private:
    void predictAccepted(const double*, double*) const override {}
};

std::string allWords(const FittedModel& fit)
{
    std::string text;
    for (const std::string& sentence : modelInWords(fit).values)
        text += sentence + "\n";
    return text;
}

} // namespace

TEST(ModelInWords, SaysWhatEachFittedValueDoesToADot)
{
    FittedModel offset, gravure, yuleNielsen;
    offset.model = std::make_shared<Fitted>("offset", std::vector<FittedValue>{
        {"gray difference factor (C, M, Y, K)", {0.07, -0.05, 0.0, -0.15}, ""},
        {"full correction at other inks' coverage (%)", {272}, ""}});
    gravure.choice = ModelChoice::gravure;
    gravure.model = std::make_shared<Fitted>("gravure", std::vector<FittedValue>{
        {"ink order", {}, "YCMK"}, {"trapping factors (red, green, blue)", {0.9, 0.85, 0.85}, ""}});
    yuleNielsen.choice = ModelChoice::yuleNielsen;
    std::vector<double> n(36, 1.8);
    n.front() = 1.6;
    n.back() = 2.2;
    yuleNielsen.model = std::make_shared<Fitted>("Yule-Nielsen", std::vector<FittedValue>{
        {"Yule-Nielsen n (380-730 nm)", n, ""}, {"ink spreading (C, M, Y, K)", {0.1, -0.053, 0.0, 0.02}, ""}});
    const struct {
        const FittedModel* fit;
        const char* sentence;
    } cases[] = {
        // 0.5 ^ (1 - g sqrt(0.5)): g 0.07 -> 0.5126, g -0.15 -> 0.4646
        {&offset, "Cyan dots print larger over other inks: a 50 % dot area becomes 51.7 % where the other inks "
                  "cover 272 % or more"},
        {&offset, "Black dots print smaller over other inks: a 50 % dot area becomes 46.5 %"},
        {&offset, "Yellow prints over other inks as on paper"},
        // The inks' strengths multiply: 0.9, 0.9 * 0.85, 0.9 * 0.85 * 0.85.
        {&gravure, "Ink order Y, C, M, K: Y prints first."},
        {&gravure, "Second ink C prints on solid Y with 90.0 % of its strength"},
        {&gravure, "Fourth ink K prints on solid Y, C and M with 65.0 % of its strength (trapping factor 0.85)"},
        // 0.5 + s / 4
        {&yuleNielsen, "n = 1.60 at 380 nm, rising to 2.20 at 730 nm"},
        {&yuleNielsen, "Cyan spreads more over other inks: a 50 % dot on a full cover of other inks grows to 52.5 %"},
        {&yuleNielsen, "Magenta spreads less over other inks: a 50 % dot on a full cover of other inks shrinks to 48.7 %"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.sentence);
        EXPECT_NE(allWords(*c.fit).find(c.sentence), std::string::npos) << allWords(*c.fit);
    }
}
