// Patch matching by device values and the measurement block handed to the library.
#include "PatchMatching.h"
#include "ToolTestSupport.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>

using namespace veltmarquist;

TEST(PatchMatching, ShuffledFormGivesTheLibraryTheGoldenBlock)
{
    for (const char* name : {"offset-form.in", "offset-form-k20.in"}) {
        const testsupport::MeasurementBlock golden = testsupport::readGoldenInput(name);
        tooltest::Form form = tooltest::goldenForm(name);
        // Magenta 0.04 % off is the patch, 0.06 % off another; the paper again with another spectrum; a shuffle.
        form.rows[17][2] = "89.96";
        form.rows.push_back(form.rows[17]);
        form.rows.push_back(form.rows[1]);
        form.rows[46][0] = "100";
        form.rows[46][2] = "89.94";
        form.rows[47][0] = "101";
        std::fill(form.rows[47].begin() + 5, form.rows[47].end(), "0.5");
        std::shuffle(form.rows.begin(), form.rows.end(), std::mt19937(46));

        const ReadResult read = readMeasurementText(form.text());
        ASSERT_TRUE(read.ok()) << read.error.describe();
        const PickedPatches picked = pickPatches(*read.file, testFormRequests(), "form.txt");
        EXPECT_TRUE(picked.averaged == 1 && picked.setsUsed == 47 && picked.setsIgnored == 1) << name;
        std::vector<Spectrum> spectra;
        for (const std::vector<double>& reflectance : picked.reflectance)
            spectra.push_back({&read.file->layout, &reflectance});
        const MeasurementBlock block = buildBlock(spectra);
        ASSERT_TRUE(block.inputKind == golden.inputKind && block.ints.size() == 46u * golden.valuesPerPatch) << name;
        for (size_t i = 0; i < block.ints.size(); ++i) {
            const bool isPaper = i / golden.valuesPerPatch == 1; // averaged with 0.5 (500)
            const int expected = isPaper ? (golden.ints[i] + 500 + 1) / 2 : golden.ints[i];
            ASSERT_NEAR(block.ints[i], expected, isPaper ? 1 : 0) << name << ": value " << i;
        }
    }
}

TEST(PatchMatching, BlocksOfOtherRangesAndMixedLayouts)
{
    const SpectralLayout narrow{400, 10, 31}, sixteen{400, 20, 16};
    std::vector<double> fine, coarse;
    for (int j = 0; j < 31; ++j)
        fine.push_back(0.1 + 0.01 * j);
    for (int j = 0; j < 16; ++j)
        coarse.push_back(0.2 + 0.02 * j);
    // 400-700 nm in 10 nm steps: the bands outside repeat the first and last one.
    const std::vector<int> ints = buildBlock({{&narrow, &fine}}, 100).ints;
    EXPECT_EQ(std::vector<int>({ints[0], ints[2], ints[3], ints[32], ints[35], ints[36], ints[99]}),
              (std::vector<int>{100, 100, 110, 400, 400, 0, 0})); // 380, 400, 410, 700, 730 nm, padding
    // 16 bands, mixed with a 10 nm spectrum in a block or alone in the rows of
    // the class methods (gravure fit, 46-step chart), are widened the same way.
    const MeasurementBlock mixed = buildBlock({{&narrow, &fine}, {&sixteen, &coarse}});
    RowTable rows(buildBlock({{&sixteen, &coarse}}));
    EXPECT_TRUE(mixed.inputKind == VM_INPUT_10NM && rows.rows()[1] == nullptr);
    const int widened[][2] = {{0, 220}, {5, 230}, {35, 500}}; // 380 nm takes 420, 430 is between 420 and 440
    for (const auto& [band, value] : widened) {
        EXPECT_EQ(mixed.ints[static_cast<size_t>(36 + band)], value) << band;
        EXPECT_DOUBLE_EQ(rows.rows()[0][band], value / 1000.0) << band;
    }
}
