// Patch matching and the test form found by it, from golden test forms written as CGATS.
#include "GoldenForms.h"
#include "MeasurementFile.h"
#include "PatchMatching.h"
#include "TestForm.h"
#include "Failure.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>

using namespace veltmarquist;
namespace ts = testsupport;

namespace {

MeasurementBlock blockOf(const cgats::Document& form)
{
    ReadResult read = readMeasurementText(cgats::write(form));
    EXPECT_TRUE(read.ok()) << read.error.describe();
    return findTestForm(std::move(*read.file), "form.txt").block;
}

} // namespace

TEST(PatchMatching, ShuffledRepeatedAndNearbyPatchesGiveTheGoldenBlock)
{
    for (const char* name : {"offset-form.in", "offset-form-k20.in"}) {
        SCOPED_TRACE(name);
        const ts::MeasurementBlock golden = ts::readGoldenInput(name);
        cgats::Document form = ts::goldenForm(golden);
        // Every patch measured three times, identically: the block is the golden one to the last int.
        cgats::Document thrice = form;
        for (int copy = 0; copy < 2; ++copy)
            thrice.rows.insert(thrice.rows.end(), form.rows.begin(), form.rows.end());
        std::shuffle(thrice.rows.begin(), thrice.rows.end(), std::mt19937(46));
        const MeasurementBlock block = blockOf(thrice);
        EXPECT_EQ(block.inputKind, golden.inputKind);
        EXPECT_EQ(block.ints, std::vector<int>(golden.ints.begin(), golden.ints.begin() + 46 * golden.valuesPerPatch));
        // Magenta 0.04 % off is the patch, 0.06 % off another; the paper again with 0.901: averaged, half away from 0.
        form.rows[17][2] = "89.96";
        form.rows.push_back(form.rows[17]);
        form.rows.back()[0] = "100";
        form.rows.back()[2] = "89.94";
        form.rows.push_back(form.rows[1]);
        form.rows.back()[0] = "101";
        std::fill(form.rows.back().begin() + 5, form.rows.back().end(), "0.901");
        const MeasurementBlock nearby = blockOf(form);
        for (size_t i = 0; i < nearby.ints.size(); ++i) {
            const bool paper = i / static_cast<size_t>(golden.valuesPerPatch) == 1;
            ASSERT_EQ(nearby.ints[i], paper ? (golden.ints[i] + 902) / 2 : golden.ints[i]) << i;
        }
    }
}

TEST(PatchMatching, EveryMissingPatchIsNamedInOneLine)
{
    cgats::Document form = ts::goldenForm(ts::readGoldenInput("offset-form.in"));
    form.rows.erase(form.rows.begin() + 17, form.rows.begin() + 20);
    const ReadResult read = readMeasurementText(cgats::write(form));
    ASSERT_TRUE(read.ok()) << read.error.describe();
    try {
        pickPatches(*read.file, testFormRequests(), "form.txt");
        FAIL() << "three patches are missing";
    } catch (const HostError& error) {
        EXPECT_EQ(error.failure(), Failure::MissingPatch);
        EXPECT_STREQ(error.what(), "form.txt: 3 test-form patches are missing: 18 (C 0 M 90 Y 0 K 0), "
                                   "19 (C 100 M 100 Y 100 K 100), 20 (C 0 M 0 Y 100 K 0)");
    }
}
