// The C entry points: profile life, measurement marshalling and band
// placement, validation of the measurement block, statuses and clean-up.
#if defined(__GNUC__) && !defined(__clang__)
// operator new is replaced below with malloc/free underneath; GCC cannot see
// that both halves are replaced and warns at every inlined delete.
#pragma GCC diagnostic ignored "-Wmismatched-new-delete"
#endif
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <cstring>
#include <new>

using namespace testsupport;

namespace {
// While set, growing a vector of patch records fails as if memory ran out.
std::atomic<bool> failPatchAllocations{false};
} // namespace

void* operator new(std::size_t size)
{
    if (failPatchAllocations && size % sizeof(MathProfile::ColorPatch) == 0)
        throw std::bad_alloc();
    if (void* memory = std::malloc(size == 0 ? 1 : size))
        return memory;
    throw std::bad_alloc();
}
void operator delete(void* memory) noexcept { std::free(memory); }
void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }

namespace {

// Runs process 7 on one patch (plus the two reference whites) and returns the
// 36 values of its row as the chart prints them.
std::vector<double> placedRow(const std::vector<int>& patchValues, int kind, int first, int perPatch)
{
    std::vector<int> block;
    for (int copy = 0; copy < 3; ++copy)
        block.insert(block.end(), patchValues.begin(), patchValues.end());
    block.insert(block.end(), 21, 0); // channel values
    TempDir dir;
    const std::string out = dir.path("rows.txt");
    void* profile = CreateMathProfile("rows");
    const int status = CalculateChart(profile, VM_PROCESS_CHART_COPY, out.c_str(), block.data(), kind, first, perPatch, 3);
    DestroyMathProfile(profile);
    EXPECT_EQ(status, VM_STATUS_OK);
    if (status != VM_STATUS_OK)
        return {};
    const auto chartLines = lines(readFile(out));
    const auto values = fields(chartLines.at(7));
    std::vector<double> row;
    for (size_t i = 5; i < 41; ++i)
        row.push_back(std::stod(values.at(i)));
    return row;
}

std::vector<int> ramp(int n, int start)
{
    std::vector<int> values;
    for (int i = 0; i < n; ++i)
        values.push_back(start + 10 * i);
    return values;
}

int calculate(void* profile, int process, const std::string& path, MeasurementBlock& block)
{
    return CalculateChart(profile, static_cast<PrintProcess>(process), path.c_str(), block.ints.data(),
                          block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
}

} // namespace

TEST(Profile, ConstructionValues)
{
    MathProfile profile(nullptr);
    EXPECT_EQ(profile.profileName[0], '\0');
    EXPECT_EQ(profile.normFactor, 100.0 / 99.94200000000001);
    for (double factor : profile.grayDiffFactor)
        EXPECT_EQ(factor, 0.0);
    EXPECT_EQ(profile.rgbFactor[0], 0.9);
    EXPECT_EQ(profile.rgbFactor[1], 0.85);
    EXPECT_EQ(profile.rgbFactor[2], 0.85);
    EXPECT_EQ(profile.coverageLimit, 200.0);
    EXPECT_EQ(profile.inkOrder, 2);
    for (const auto& list : profile.tintLists)
        EXPECT_TRUE(list.empty());
    const MathProfile::ColorPatch zero = {};
    for (const auto& slot : profile.patchSlots)
        EXPECT_EQ(std::memcmp(&slot, &zero, sizeof zero), 0);
    EXPECT_FALSE(profile.chartFile.is_open());
}

TEST(Profile, VersionSymbols)
{
    EXPECT_STREQ(VeltmarquistDLLVersionString, "@(#)PROGRAM:VeltmarquistDLL  PROJECT:Pellinore_AllModules-1\n");
    EXPECT_EQ(VeltmarquistDLLVersionNumber, 1.0);
    DestroyMathProfile(nullptr); // does nothing
}

TEST(Marshalling, InterpolateSixteenBands)
{
    MathProfile profile("i");
    double v[16];
    for (int i = 0; i < 16; ++i)
        v[i] = 0.1 * (i + 1) + (i % 3) * 0.013;
    for (int b : {0, 1, 2, 3})
        EXPECT_EQ(profile.InterpolateSpectralValue(b, v), v[1]) << b;
    EXPECT_EQ(profile.InterpolateSpectralValue(4, v), v[1]);
    EXPECT_EQ(profile.InterpolateSpectralValue(5, v), (v[1] + v[2]) * 0.5);
    EXPECT_EQ(profile.InterpolateSpectralValue(6, v), v[2]);
    EXPECT_EQ(profile.InterpolateSpectralValue(31, v), (v[14] + v[15]) * 0.5);
    for (int b : {32, 33, 34, 35})
        EXPECT_EQ(profile.InterpolateSpectralValue(b, v), v[15]) << b;
}

TEST(Marshalling, BandPlacementOfBothKinds)
{
    // 16 bands at 400..700 nm, 20 nm steps.
    const std::vector<double> k20 = placedRow(ramp(16, 100), VM_INPUT_16BAND, 0, 16);
    ASSERT_EQ(k20.size(), 36u);
    for (int b = 0; b < 4; ++b)
        EXPECT_EQ(k20[b], 0.11) << "380-410 nm take the 420 nm value";
    for (int b = 4; b <= 32; b += 2)
        EXPECT_DOUBLE_EQ(k20[b], (100 + 10 * (b / 2 - 1)) / 1000.0) << b;
    for (int b = 5; b <= 31; b += 2)
        EXPECT_DOUBLE_EQ(k20[b], (k20[b - 1] + k20[b + 1]) / 2) << b;
    for (int b = 33; b < 36; ++b)
        EXPECT_EQ(k20[b], 0.25);

    // 380 nm, 36 bands: copied as they are.
    const std::vector<double> k10 = placedRow(ramp(36, 5), VM_INPUT_10NM, 380, 36);
    for (int b = 0; b < 36; ++b)
        EXPECT_DOUBLE_EQ(k10[b], (5 + 10 * b) / 1000.0);

    // 360 nm, 40 bands: the two bands below 380 nm are skipped.
    const std::vector<double> wide = placedRow(ramp(40, 5), VM_INPUT_10NM, 360, 40);
    for (int b = 0; b < 36; ++b)
        EXPECT_DOUBLE_EQ(wide[b], (5 + 10 * (b + 2)) / 1000.0);

    // 380 nm, 31 bands (to 680 nm): the last five positions stay 0.
    const std::vector<double> narrow = placedRow(ramp(31, 5), VM_INPUT_10NM, 380, 31);
    for (int b = 0; b < 31; ++b)
        EXPECT_DOUBLE_EQ(narrow[b], (5 + 10 * b) / 1000.0);
    for (int b = 31; b < 36; ++b)
        EXPECT_EQ(narrow[b], 0.0);

    // 400 nm, 10 bands (to 490 nm): positions in front repeat the first
    // value, positions from 10 on the last, then the bands are copied from
    // position 2 on (the last two measured bands fall out).
    const std::vector<int> tenBands = ramp(10, 5);
    const std::vector<double> shifted = placedRow(tenBands, VM_INPUT_10NM, 400, 10);
    EXPECT_EQ(shifted[0], 0.005);
    EXPECT_EQ(shifted[1], 0.005);
    for (int b = 2; b < 10; ++b)
        EXPECT_DOUBLE_EQ(shifted[b], tenBands[b - 2] / 1000.0) << b;
    for (int b = 10; b < 36; ++b)
        EXPECT_EQ(shifted[b], 0.095) << b;
}

TEST(Statuses, ACalculationThatThrowsGivesStatusThree)
{
    // The tone ramps of process 3 cannot grow: the calculation fails with
    // std::bad_alloc after the chart was opened.
    TempDir dir;
    MeasurementBlock block = readGoldenInput("multichannel.in");
    failPatchAllocations = true;
    const int status = calculate(CreateMathProfile("throws"), VM_PROCESS_SIX_COLOUR, dir.path("x.txt"), block);
    failPatchAllocations = false;
    EXPECT_EQ(status, VM_STATUS_CALCULATION_FAILED); // and the profile is gone
}
