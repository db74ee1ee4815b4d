// Patch layouts: counts and order of the generated ones, a file's order and
// identifiers, and the refusals, with the levels and patch they name.
#include "ChartLayouts.h"
#include "ExportTestForm.h"

#include "MathProfile.h"

#include <gtest/gtest.h>

using namespace exporttest;
using namespace veltmarquist::exporting;

namespace {

std::vector<double> coverageOf(const PatchLayout& layout, size_t patch)
{
    return {layout.cmyk.begin() + 4 * patch, layout.cmyk.begin() + 4 * patch + 4};
}

} // namespace

TEST(ChartLayouts, GeneratedAndFileLayoutsHaveTheirCountOrderAndIdentifiers)
{
    const auto& last = MathProfile::toBeCalculated[899];
    const std::string file = temporaryFile("target.ti1", "CTI1\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K\n"
                                                         "END_DATA_FORMAT\nBEGIN_DATA\nB7 33.3333 0 0 0\nA1 0 0 0 100\n"
                                                         "B7 33.3333 0 0 0\nC2 0 12.5 0 0.1\nEND_DATA\n");
    const struct {
        std::string argument;
        size_t count, patch;
        std::vector<double> cmyk;
        std::string id;
    } cases[] = {
        {"chart", 900, 899, {double(last[0]), double(last[1]), double(last[2]), double(last[3])}, "900"},
        {"grid", 6561, 1, {0, 0, 0, 10}, "2"},
        {"grid", 6561, ((3 * 9 + 0) * 9 + 5) * 9 + 8, {40, 0, 70, 100}, "2241"},
        {"grid:11", 14641, 11, {0, 0, 10, 0}, "12"},
        {"grid:21", 194481, 194480, {100, 100, 100, 100}, "194481"},
        {file, 4, 0, {33.3333, 0, 0, 0}, "B7"},
        {file, 4, 2, {33.3333, 0, 0, 0}, "B7"},
        {file, 4, 3, {0, 12.5, 0, 0.1}, "C2"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.argument + " patch " + std::to_string(c.patch));
        const PatchLayout layout = readLayout(c.argument);
        EXPECT_EQ(layout.size(), c.count);
        EXPECT_EQ(coverageOf(layout, c.patch), c.cmyk);
        EXPECT_EQ(layout.ids[c.patch], c.id);
    }
}

// Every identifier goes into a chart a profile builder reads back: one no
// reader may take becomes the patch's number, with a warning naming its line.
TEST(ChartLayouts, IdentifiersNoReaderMayTakeAreReplacedByThePatchNumber)
{
    const struct {
        const char* what;
        std::vector<std::string> ids; // as written in the file (quoted)
        std::vector<std::string> written;
        size_t warnings;
    } cases[] = {
        {"plain and UTF-8 kept", {"A1", "Gr\xC3\xBCn", std::string(64, 'x')}, {"A1", "Gr\xC3\xBCn", std::string(64, 'x')}, 0},
        {"too long", {"A1", std::string(65, 'x'), "C3"}, {"A1", "2", "C3"}, 1},
        {"right-to-left override", {"A1", "a\xE2\x80\xAE" "b", "C3"}, {"A1", "2", "C3"}, 1},
        {"zero width space", {"\xE2\x80\x8B" "A1", "B2", "C3"}, {"1", "B2", "C3"}, 1},
        {"blank and control", {"A 1", "B\x1b" "2", "C3"}, {"1", "2", "C3"}, 2},
        {"not UTF-8", {"A1", "B\xE9", "C3"}, {"A1", "2", "C3"}, 1},
        {"a number taken twice", {"2", "long " + std::string(70, 'y'), "C3"}, {"1", "2", "3"}, 2},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        std::string rows;
        for (size_t patch = 0; patch < c.ids.size(); ++patch)
            rows += "\"" + c.ids[patch] + "\" " + std::to_string(10 * patch) + " 0 0 0\n";
        const PatchLayout layout = readLayout(temporaryFile("ids.txt", "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C "
                                                                       "CMYK_M CMYK_Y CMYK_K\nEND_DATA_FORMAT\n"
                                                                       "BEGIN_DATA\n" + rows + "END_DATA\n"));
        EXPECT_EQ(layout.ids, c.written);
        EXPECT_EQ(layout.warnings.size(), c.warnings);
        for (const std::string& warning : layout.warnings)
            EXPECT_TRUE(warning.rfind("line ", 0) == 0 || warning.find("every patch is numbered") != std::string::npos)
                << warning;
    }
}

TEST(ChartLayouts, RefusalsNameWhatIsWrongAndWhere)
{
    const std::string noInks = temporaryFile("rgb.txt", "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID RGB_R RGB_G RGB_B\n"
                                                        "END_DATA_FORMAT\nBEGIN_DATA\n1 1 2 3\nEND_DATA\n");
    const std::string off = temporaryFile("off-level.txt", "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K\n"
                                                           "END_DATA_FORMAT\nBEGIN_DATA\nP1 0 0 0 0\nP2 35 0 0 0\nEND_DATA\n");
    const std::string levels = "which the gravure model cannot predict: it predicts only the form's levels "
                               "0, 10, 20, 40, 60, 70, 80, 90, 100 % (the Yule-Nielsen model predicts every coverage)";
    const struct {
        std::string argument;
        std::string failure; // of reading the layout, then of predicting it with the level-bound model
    } cases[] = {
        {"grid:1", "2: layout grid:1: grid:N takes a whole number of levels per ink from 2 to 21 (grid:11 is 0, 10, ..., 100 %)"},
        {"grid:1x", "2: layout grid:1x: grid:N takes"},
        {"/no/such/target.ti1", "3: /no/such/target.ti1: "},
        {noInks, "5: " + noInks + ": a layout needs the four device fields CMYK_C, CMYK_M, CMYK_Y, CMYK_K"},
        {"chart", ""},
        {"grid", ""},
        {"grid:6", ""}, // 0, 20, 40, 60, 80, 100 % all lie on the form
        {"grid:11", "2: sample 4 (C 0 M 0 Y 0 K 30) has K 30, " + levels},
        {off, "5: " + off + ": sample P2 (line 7) has C 35, " + levels},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.argument);
        std::string failure = failureOf([&] { readLayout(c.argument); });
        if (failure.empty()) {
            const PatchLayout layout = readLayout(c.argument);
            EXPECT_EQ(failureOf([&] { checkPredictable(layout, anyCoverageModel()); }), "");
            failure = failureOf([&] { checkPredictable(layout, levelModel()); });
        }
        EXPECT_EQ(failure.substr(0, c.failure.size()), c.failure);
        EXPECT_EQ(failure.empty(), c.failure.empty()) << failure;
    }
}
