// Patch layouts: counts and order of the generated ones, a file's order and
// identifiers, and the refusal of coverages a model cannot predict.
#include "ChartLayouts.h"
#include "ExportTestForm.h"

#include "MathProfile.h"

#include <gtest/gtest.h>

#include <functional>

using namespace veltmarquist;
using namespace veltmarquist::exporting;

namespace {

std::vector<double> coverageOf(const PatchLayout& layout, size_t patch)
{
    return {layout.cmyk.begin() + 4 * patch, layout.cmyk.begin() + 4 * patch + 4};
}

ExportError::Kind failureOf(const std::function<void()>& action, std::string& message)
{
    try {
        action();
    } catch (const ExportError& error) {
        message = error.what();
        return error.kind();
    }
    ADD_FAILURE() << "no ExportError";
    return ExportError::Kind::Usage;
}

} // namespace

TEST(ChartLayouts, GeneratedLayoutsHaveTheirCountAndDocumentedOrder)
{
    const auto chart = [](size_t patch) {
        const auto& entry = MathProfile::toBeCalculated[patch];
        return std::vector<double>(entry.begin(), entry.end());
    };
    const struct {
        const char* argument;
        size_t count;
        size_t patch;
        std::vector<double> cmyk;
    } cases[] = {
        {"chart", 900, 899, chart(899)},
        {"chart", 900, 153, chart(153)},
        {"grid", 6561, 1, {0, 0, 0, 10}},
        {"grid", 6561, ((3 * 9 + 0) * 9 + 5) * 9 + 8, {40, 0, 70, 100}},
        {"grid", 6561, 6560, {100, 100, 100, 100}},
        {"grid:11", 14641, 3, {0, 0, 0, 30}},
        {"grid:11", 14641, 11, {0, 0, 10, 0}},
        {"grid:2", 16, 8, {100, 0, 0, 0}},
        {"grid:21", 194481, 194480, {100, 100, 100, 100}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(std::string(c.argument) + " patch " + std::to_string(c.patch));
        const PatchLayout layout = readLayout(c.argument);
        EXPECT_EQ(layout.size(), c.count);
        EXPECT_EQ(layout.cmyk.size(), 4 * c.count);
        EXPECT_EQ(coverageOf(layout, c.patch), c.cmyk);
        EXPECT_EQ(layout.ids[c.patch], std::to_string(c.patch + 1));
    }
    EXPECT_EQ(evenLevels(3), (std::vector<double>{0, 50, 100}));
}

TEST(ChartLayouts, RefusesGridsOutOfBoundsAndFilesWithoutFourInks)
{
    const std::string noDevice = exporttest::temporaryFile("no-device.txt", "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID XYZ_X XYZ_Y XYZ_Z\n"
                                                                            "END_DATA_FORMAT\nBEGIN_DATA\n1 1 2 3\nEND_DATA\n");
    const struct {
        std::string argument;
        ExportError::Kind kind;
        const char* message;
    } cases[] = {
        {"grid:1", ExportError::Kind::Usage, "grid:N takes a whole number of levels per ink from 2 to 21"},
        {"grid:22", ExportError::Kind::Usage, "layout grid:22: grid:N"},
        {"grid:1x", ExportError::Kind::Usage, "layout grid:1x: grid:N"},
        {"grid:", ExportError::Kind::Usage, "layout grid:: grid:N"},
        {"/no/such/layout.ti1", ExportError::Kind::Unreadable, "/no/such/layout.ti1: "},
        {noDevice, ExportError::Kind::Content, "needs the four device fields CMYK_C"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.argument);
        std::string message;
        EXPECT_EQ(failureOf([&] { readLayout(c.argument); }, message), c.kind);
        EXPECT_NE(message.find(c.message), std::string::npos) << message;
    }
}

TEST(ChartLayouts, FileLayoutKeepsOrderIdentifiersAndExactValues)
{
    const std::string path = exporttest::temporaryFile(
        "target.ti1", "CTI1\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K\nEND_DATA_FORMAT\nBEGIN_DATA\n"
                      "B7 33.3333 0 0 0\nA1 0 0 0 100\nB7 33.3333 0 0 0\nC2 0 12.5 0 0.1\nEND_DATA\n");
    const PatchLayout layout = readLayout(path);
    EXPECT_EQ(layout.ids, (std::vector<std::string>{"B7", "A1", "B7", "C2"}));
    EXPECT_EQ(layout.lines, (std::vector<int>{6, 7, 8, 9}));
    EXPECT_EQ(coverageOf(layout, 0), (std::vector<double>{33.3333, 0, 0, 0}));
    EXPECT_EQ(coverageOf(layout, 3), (std::vector<double>{0, 12.5, 0, 0.1}));
    EXPECT_EQ(roundTripText(layout.cmyk[0]), "33.3333");
}

TEST(ChartLayouts, ALevelBoundModelRefusesOffLevelCoveragesNamingLevelsAndPatch)
{
    const std::string off = exporttest::temporaryFile(
        "off-level.txt", "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K\nEND_DATA_FORMAT\nBEGIN_DATA\n"
                         "P1 0 0 0 0\nP2 35 0 0 0\nP3 0 50 0 0\nEND_DATA\n");
    const std::string levels = "it predicts only the form's levels 0, 10, 20, 40, 60, 70, 80, 90, 100 %";
    const struct {
        std::string argument;
        std::string message; // empty: predictable
    } cases[] = {
        {"chart", ""},
        {"grid", ""},
        {"grid:6", ""}, // 0, 20, 40, 60, 80, 100 % are all on the form
        {"grid:11", "sample 4 (C 0 M 0 Y 0 K 30) has K 30, which the gravure model cannot predict: " + levels},
        {off, off + ": sample P2 (line 7) has C 35, which the gravure model cannot predict: " + levels},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.argument);
        const PatchLayout layout = readLayout(c.argument);
        EXPECT_NO_THROW(checkPredictable(layout, exporttest::anyCoverageModel()));
        std::string message;
        if (c.message.empty())
            EXPECT_NO_THROW(checkPredictable(layout, exporttest::levelModel()));
        else
            EXPECT_EQ(failureOf([&] { checkPredictable(layout, exporttest::levelModel()); }, message),
                      ExportError::Kind::NotPredicted);
        EXPECT_EQ(message.substr(0, c.message.size()), c.message);
    }
}
