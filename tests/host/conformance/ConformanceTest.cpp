// Press conformance: a file against itself, stated colours against spectra,
// tone values the reference lacks, measurement conditions, tolerance files.
#include "Conformance.h"
#include "Failure.h"
#include "FourColourForm.h"
#include "Numbers.h"
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <fstream>

using namespace veltmarquist;
using namespace veltmarquist::conformance;
namespace ts = testsupport;

namespace {

const std::string kSheet = VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt";

const FoundForm& sheetForm()
{
    static const FoundForm form = [] {
        FileWarnings warnings;
        return readTestForm(kSheet, ReadOptions{}, warnings);
    }();
    return form;
}

// The sheet's combinations with the CIELAB its spectra give, as a CTI3 file
// of stated colours; `keep` picks the rows, `header` goes after the sheet type.
std::string statedReference(const ts::TempDir& dir, const std::function<bool(const Cmyk&)>& keep,
                            const std::string& header = "")
{
    const Reference fromSpectra = readReference(kSheet);
    std::string text = "CTI3\n" + header + "BEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\n"
                       "END_DATA_FORMAT\nBEGIN_DATA\n";
    for (size_t i = 0; i < fromSpectra.cmyk.size(); ++i) {
        const Cmyk& c = fromSpectra.cmyk[i];
        if (!keep(c))
            continue;
        const Lab& lab = fromSpectra.lab[i];
        text += std::to_string(i + 1) + " " + std::to_string(c[0]) + " " + std::to_string(c[1]) + " " +
                std::to_string(c[2]) + " " + std::to_string(c[3]) + " " + roundTripText(lab.L) + " " +
                roundTripText(lab.a) + " " + roundTripText(lab.b) + "\n";
    }
    const std::string path = dir.path("reference.ti3");
    std::ofstream(path) << text << "END_DATA\n";
    return path;
}

} // namespace

TEST(Conformance, AFileAgainstItselfDiffersByNothingAndPasses)
{
    const Reference reference = readReference(kSheet);
    const FittedModel fit = fitModel(sheetForm(), ModelChoice::yuleNielsen);
    const ConformanceResult result = compare(sheetForm(), reference, Tolerances{}, fit.model.get());
    EXPECT_TRUE(result.pass());
    EXPECT_EQ(result.controls.size(), 12u);
    EXPECT_TRUE(result.absent.empty());
    for (const ControlPatch& patch : result.controls)
        EXPECT_EQ(patch.deltaE00, 0.0) << patch.name;
    EXPECT_EQ(result.toneValues.size(), 4u * 7u) << "seven tints of each ink";
    for (const ToneValuePoint& point : result.toneValues) {
        EXPECT_EQ(point.measured, point.reference) << point.ink << " " << point.nominal;
        EXPECT_FALSE(point.interpolated);
    }
    ASSERT_TRUE(result.gamut);
    EXPECT_EQ(result.gamut->regions.front().deltaE00.count, reference.cmyk.size());
    EXPECT_LT(result.gamut->regions.front().deltaE00.mean, 1.0) << "the model predicts its own sheet closely";
}

TEST(Conformance, StatedColoursServeAndMissingTintsAreInterpolated)
{
    ts::TempDir dir;
    // Without the 20 % and 60 % tints of any ink, the greys and C+M+Y+K.
    const std::string path = statedReference(dir, [](const Cmyk& c) {
        int inks = 0;
        for (double v : c)
            inks += v > 0.0 ? 1 : 0;
        const bool tint = inks == 1 && (c[0] + c[1] + c[2] + c[3] == 20.0 || c[0] + c[1] + c[2] + c[3] == 60.0);
        return !tint && !(c[0] == 40 && c[1] == 40 && c[2] == 40) && !(inks == 4 && c[0] == 100);
    });
    const ConformanceResult result = compare(sheetForm(), readReference(path), Tolerances{}, nullptr);
    EXPECT_FALSE(result.gamut);
    EXPECT_EQ(result.absent, (std::vector<std::string>{"C+M+Y+K", "grey C40 M40 Y40", "grey C40 M40 Y40 K40"}));
    for (const ControlPatch& patch : result.controls)
        EXPECT_LT(patch.deltaE00, 1e-9) << patch.name << ": the stated CIELAB is the spectra's";
    int interpolated = 0;
    for (const ToneValuePoint& point : result.toneValues) {
        const bool missing = point.nominal == 20.0 || point.nominal == 60.0;
        EXPECT_EQ(point.interpolated, missing) << point.ink << " " << point.nominal;
        interpolated += point.interpolated ? 1 : 0;
        if (missing) {
            EXPECT_NE(point.measured, point.reference); // between 10 and 40 %, 40 and 70 %: not exact
        }
    }
    EXPECT_EQ(interpolated, 8);
}

TEST(Conformance, ConditionsToleranceFilesAndReferencesByName)
{
    ts::TempDir dir;
    const std::string m0 = statedReference(dir, [](const Cmyk&) { return true; }, "FILTER \"M0\"\n");
    std::string sheet = ts::readFile(kSheet);
    sheet.insert(sheet.find('\n') + 1, "FILTER\t\"M1\"\n");
    std::ofstream(dir.path("m1.txt")) << sheet;
    FileWarnings warnings;
    const FoundForm m1 = readTestForm(dir.path("m1.txt"), ReadOptions{}, warnings);
    EXPECT_EQ(conditionMismatches(m1.file, readReference(m0)),
              std::vector<std::string>{"measurement condition M1 against the reference's M0"});
    EXPECT_TRUE(conditionMismatches(sheetForm().file, readReference(m0)).empty()) << "the form does not say";
    const std::string d65 = statedReference(dir, [](const Cmyk&) { return true; }, "ILLUMINATION_NAME \"D65\"\n");
    EXPECT_EQ(conditionMismatches(sheetForm().file, readReference(d65)).size(), 1u);

    const struct {
        std::string text;
        bool accepted;
    } files[] = {{"# ours\ncyan 2.5\ntone-value 3 # points\n\n", true}, {"cyan\n", false}, {"cyan 0\n", false},
                 {"cyan 2 3\n", false},                                  {"teal 2\n", false}};
    for (const auto& file : files) {
        SCOPED_TRACE(file.text);
        std::ofstream(dir.path("t.txt")) << file.text;
        try {
            const Tolerances read = readTolerances(dir.path("t.txt"));
            EXPECT_TRUE(file.accepted);
            EXPECT_EQ(read.cyan, 2.5);
            EXPECT_EQ(read.toneValue, 3.0);
            EXPECT_EQ(read.black, 5.0);
        } catch (const HostError& error) {
            EXPECT_FALSE(file.accepted);
            EXPECT_EQ(error.failure(), Failure::InputContent);
            EXPECT_NE(std::string(error.what()).find("t.txt:"), std::string::npos) << error.what();
        }
    }
    EXPECT_EQ(toleranceSource("black"), "ISO 12647-2:2013, as cited in TAGA 2015");
    EXPECT_EQ(toleranceSource("grey"), "this project's default");

    EXPECT_EQ(locateReference(m0), m0);
    try {
        locateReference("NO_SUCH_REFERENCE");
        FAIL();
    } catch (const HostError& error) {
        EXPECT_EQ(error.failure(), Failure::InputUnreadable);
        EXPECT_NE(std::string(error.what()).find("/usr/share/color/icc"), std::string::npos);
    }
}
