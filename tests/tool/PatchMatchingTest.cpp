// Patch matching by device values and the measurement block handed to the
// library.
#include "PatchMatching.h"
#include "ToolTestSupport.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>

using namespace veltmarquist;
using tooltest::Row;

namespace {

MeasurementFile parseText(const std::string& text)
{
    ReadResult result = readMeasurementText(text);
    EXPECT_TRUE(result.ok()) << result.error.describe();
    return result.ok() ? *result.file : MeasurementFile{};
}

std::vector<Spectrum> spectraOf(const MeasurementFile& file, const PickedPatches& picked)
{
    std::vector<Spectrum> spectra;
    for (const std::vector<double>& reflectance : picked.reflectance)
        spectra.push_back({&file.layout, &reflectance});
    return spectra;
}

ToolError pickError(const MeasurementFile& file, const std::vector<PatchRequest>& requests)
{
    try {
        pickPatches(file, requests, "form.txt");
    } catch (const ToolError& error) {
        return error;
    }
    ADD_FAILURE() << "no error";
    return ToolError(Failure::Internal, "");
}

} // namespace

TEST(PatchMatching, TestFormInAnyOrderGivesTheLibraryItsBlock)
{
    const tooltest::GoldenBlock golden = tooltest::readGolden("offset-form.in");
    std::vector<Row> rows = tooltest::testFormRows(golden);
    // Other patches, a repeat of the paper with a different spectrum, and a shuffle.
    Row other = rows[0];
    other[0] = "100";
    other[1] = "55";
    rows.push_back(other);
    Row paperAgain = rows[1];
    paperAgain[0] = "101";
    for (size_t j = 5; j < paperAgain.size(); ++j)
        paperAgain[j] = "0.5";
    rows.push_back(paperAgain);
    std::shuffle(rows.begin(), rows.end(), std::mt19937(46));

    const MeasurementFile file = parseText(tooltest::cgats(tooltest::testFormFields(golden), rows));
    const PickedPatches picked = pickPatches(file, testFormRequests(), "form.txt");
    EXPECT_EQ(picked.averaged, 1u);
    EXPECT_EQ(picked.setsUsed, 47u);
    EXPECT_EQ(picked.setsIgnored, 1u);
    const MeasurementBlock block = buildBlock(spectraOf(file, picked));
    EXPECT_EQ(block.inputKind, VM_INPUT_10NM);
    EXPECT_EQ(block.count, 46);
    ASSERT_EQ(block.ints.size(), 46u * 36u);
    for (size_t i = 0; i < block.ints.size(); ++i) {
        const bool paper = i / 36 == 1; // averaged with 0.5 (500)
        const int expected = paper ? (golden.ints[i] + 500 + 1) / 2 : golden.ints[i];
        ASSERT_NEAR(block.ints[i], expected, paper ? 1 : 0) << "value " << i % 36 << " of patch " << i / 36;
    }
}

TEST(PatchMatching, MissingPatchesAreNamed)
{
    const tooltest::GoldenBlock golden = tooltest::readGolden("offset-form.in");
    std::vector<Row> rows = tooltest::testFormRows(golden);
    rows.erase(rows.begin() + 17); // 0/90/0/0
    const MeasurementFile file = parseText(tooltest::cgats(tooltest::testFormFields(golden), rows));
    const ToolError error = pickError(file, testFormRequests());
    EXPECT_EQ(error.failure(), Failure::MissingPatch);
    EXPECT_STREQ(error.what(), "form.txt: test-form patch 18 (C 0 M 90 Y 0 K 0) is missing");

    // A value 0.04 off still matches; 0.06 off does not.
    rows = tooltest::testFormRows(golden);
    rows[17][2] = "89.96";
    EXPECT_NO_THROW(pickPatches(parseText(tooltest::cgats(tooltest::testFormFields(golden), rows)), testFormRequests(), "f"));
    rows[17][2] = "89.94";
    EXPECT_EQ(pickError(parseText(tooltest::cgats(tooltest::testFormFields(golden), rows)), testFormRequests()).failure(),
              Failure::MissingPatch);
}

TEST(PatchMatching, DeviceVectorsOfDifferentLength)
{
    // A seven-channel file answers four-colour requests where its further
    // inks are 0, and the multi-channel requests come in the library's order.
    std::vector<std::string> fields{"SAMPLE_ID"};
    for (int k = 1; k <= 7; ++k)
        fields.push_back("7CLR_" + std::to_string(k));
    for (int nm = 400; nm <= 700; nm += 20)
        fields.push_back("nm" + std::to_string(nm));
    std::vector<Row> rows;
    for (int ink = -1; ink < 7; ++ink) {
        Row row{std::to_string(ink + 2), "0", "0", "0", "0", "0", "0", "0", "0." + std::to_string(ink + 2)};
        if (ink >= 0)
            row[static_cast<size_t>(ink + 1)] = "100";
        row.insert(row.end(), 15, "0.5");
        rows.push_back(row);
    }
    Row mixed{"20", "100", "0", "0", "0", "100", "0", "0"}; // cyan + ink 5
    mixed.insert(mixed.end(), 16, "0.05");
    rows.push_back(mixed);
    const MeasurementFile file = parseText(tooltest::cgats(fields, rows));
    const CombinationIndex index(file);
    EXPECT_EQ(index.find({100, 0, 0, 0}), (std::vector<size_t>{1}));
    EXPECT_EQ(index.find({0, 0, 0, 0}), (std::vector<size_t>{0}));
    EXPECT_TRUE(index.find({100, 0, 0, 0, 0, 0, 0, 1}).empty());

    const std::vector<PatchRequest> requests = multiChannelRequests(7);
    ASSERT_EQ(requests.size(), 11u);
    const PickedPatches picked = pickPatches(file, requests, "seven.txt");
    const double expectedFirstBand[] = {0.2, 0.3, 0.4, 0.5, 0.1, 0.1, 0.1, 0.1, 0.6, 0.7, 0.8};
    for (size_t i = 0; i < requests.size(); ++i)
        EXPECT_DOUBLE_EQ(picked.reflectance[i][0], expectedFirstBand[i]) << requests[i].label;
    EXPECT_EQ(picked.setsIgnored, 1u);
    EXPECT_EQ(requests[10].label, "solid of ink 7 (C 0 M 0 Y 0 K 0 ink7 100)");
    EXPECT_EQ(multiChannelRequests(6).size(), 10u);
}

TEST(PatchMatching, BlockLayoutsAndRows)
{
    // 10 nm from 400 to 700: the ends repeat the first and last band.
    SpectralLayout narrow{400, 10, 31};
    std::vector<double> values;
    for (int j = 0; j < 31; ++j)
        values.push_back(0.1 + 0.01 * j);
    const MeasurementBlock block = buildBlock({{&narrow, &values}}, 100);
    EXPECT_EQ(block.inputKind, VM_INPUT_10NM);
    EXPECT_EQ(block.firstWavelength, 380);
    EXPECT_EQ(block.valuesPerPatch, 36);
    EXPECT_EQ(block.ints.size(), 100u);
    const std::vector<int> expected{100, 100, 100, 110, 120};
    EXPECT_EQ(std::vector<int>(block.ints.begin(), block.ints.begin() + 5), expected);
    EXPECT_EQ(block.ints[32], 400); // 700 nm
    EXPECT_EQ(block.ints[35], 400); // 730 nm repeats 700 nm
    EXPECT_EQ(block.ints[36], 0);   // padding

    // 16 bands stay 16 bands (input kind 20) ...
    SpectralLayout sixteen{400, 20, 16};
    std::vector<double> coarse;
    for (int j = 0; j < 16; ++j)
        coarse.push_back(0.2 + 0.02 * j);
    MeasurementBlock kind20 = buildBlock({{&sixteen, &coarse}});
    EXPECT_EQ(kind20.inputKind, VM_INPUT_16BAND);
    EXPECT_EQ(kind20.valuesPerPatch, 16);
    EXPECT_EQ(kind20.ints[1], 220);
    // ... and the rows for the class methods widen them as the library does.
    RowTable rows(kind20);
    EXPECT_DOUBLE_EQ(rows.rows()[0][0], 0.22);  // 380 nm takes 420 nm
    EXPECT_DOUBLE_EQ(rows.rows()[0][5], 0.23);  // 430 nm: mean of 420 and 440 nm
    EXPECT_DOUBLE_EQ(rows.rows()[0][35], 0.5);  // 730 nm takes 700 nm
    EXPECT_EQ(rows.rows()[1], nullptr);

    // Mixed with a 10 nm spectrum, the 16 bands are widened in the block.
    const MeasurementBlock mixed = buildBlock({{&narrow, &values}, {&sixteen, &coarse}});
    EXPECT_EQ(mixed.inputKind, VM_INPUT_10NM);
    EXPECT_EQ(mixed.ints.size(), 72u);
    EXPECT_EQ(mixed.ints[36 + 5], 230);
}
