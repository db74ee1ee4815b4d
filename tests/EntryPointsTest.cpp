// The entry points: a new profile, the band placement of 10 nm rows that do
// not start at 380 nm or end at 730 nm, and status 3 for a failing
// calculation. (The 16-band widening is pinned by the golden 16-band charts,
// every rejection and clean-up path by the reliability suite.)
#if defined(__GNUC__) && !defined(__clang__)
// operator new is replaced below with malloc/free underneath; GCC cannot see
// that both halves are replaced and warns at every inlined delete.
#pragma GCC diagnostic ignored "-Wmismatched-new-delete"
#endif
#include "TestSupport.h"

#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
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

// The 36-band row that CalculateChart builds from one patch of `n` values
// start, start + 10, ..., read back from a process-7 chart (the patch three
// times: chart patch and both reference whites).
std::vector<double> placedRow(int n, int first)
{
    std::vector<int> block;
    for (int copy = 0; copy < 3; ++copy)
        for (int i = 0; i < n; ++i)
            block.push_back(5 + 10 * i);
    block.insert(block.end(), 21, 0);
    const auto values = fields(lines(chartOf({VM_INPUT_10NM, first, n, 3, block}, VM_PROCESS_CHART_COPY)).at(7));
    std::vector<double> row;
    for (size_t i = 5; i < 41; ++i)
        row.push_back(std::stod(values.at(i)) * 1000.0);
    return row;
}

} // namespace

TEST(Profile, NameAndVersion)
{
    EXPECT_STREQ(MathProfile(nullptr).profileName, "");
    const std::string longName(1500, 'x');
    EXPECT_EQ(std::string(MathProfile(longName.c_str()).profileName), longName.substr(0, 1023));
    EXPECT_STREQ(VeltmarquistDLLVersionString, "@(#)PROGRAM:VeltmarquistDLL  PROJECT:Pellinore_AllModules-1\n");
    EXPECT_EQ(VeltmarquistDLLVersionNumber, 1.0);
}

TEST(Marshalling, BandPlacementOfTenNanometreRows)
{
    const auto k10 = placedRow(36, 380);
    const auto wide = placedRow(40, 360); // 360..750 nm: the first two are skipped
    const auto narrow = placedRow(31, 380); // 380..680 nm: the rest stays 0
    const auto shifted = placedRow(10, 400); // 400..490 nm
    for (int b = 0; b < 36; ++b) {
        EXPECT_NEAR(k10[b], 5 + 10 * b, 1e-9) << b;
        EXPECT_NEAR(wide[b], 25 + 10 * b, 1e-9) << b;
        EXPECT_NEAR(narrow[b], b < 31 ? 5 + 10 * b : 0, 1e-9) << b;
        // In front the first value, from position 10 on the last, between
        // them the bands copied from position 2 on.
        EXPECT_NEAR(shifted[b], b < 2 ? 5 : b < 10 ? 5 + 10 * (b - 2) : 95, 1e-9) << b;
    }
}

TEST(Statuses, ACalculationThatThrowsGivesStatusThree)
{
    // The tone ramps of process 3 cannot grow: the calculation fails with
    // std::bad_alloc after the chart was opened.
    TempDir dir;
    MeasurementBlock block = readGoldenInput("multichannel.in");
    failPatchAllocations = true;
    const int status = calculateBlock(CreateMathProfile("throws"), VM_PROCESS_SIX_COLOUR, dir.path("x"), block);
    failPatchAllocations = false;
    EXPECT_EQ(status, VM_STATUS_CALCULATION_FAILED); // and the profile is gone
}
