// Allocation failure: through the scratch allocation seam, the n-th buffer
// of a call fails, for every n the call allocates. Each failing call returns
// status 5, writes no file, leaves block, profile and heap as they were, and
// the profile then writes the reference chart.
#include "ReliabilitySupport.h"
#include "ScratchAllocation.h"

#include <cstdlib>
#if defined(__GLIBC__)
#include <malloc.h>
#endif

using namespace testsupport;
using namespace reliability;

namespace {

int allocationsSeen = 0;
int failingAllocation = 0; // 0: none fails

void* failNth(std::size_t count, std::size_t size)
{
    return ++allocationsSeen == failingAllocation ? nullptr : std::calloc(count, size);
}

// Installs failNth for one scope; the library's default comes back afterwards.
class FailingAllocator {
public:
    explicit FailingAllocator(int failing)
    {
        allocationsSeen = 0;
        failingAllocation = failing;
        previous_ = scratch::setAllocator(failNth);
    }
    ~FailingAllocator() { scratch::setAllocator(previous_); }
    FailingAllocator(const FailingAllocator&) = delete;
    FailingAllocator& operator=(const FailingAllocator&) = delete;

private:
    scratch::Allocator previous_;
};

// Bytes in use on the heap, when the C library counts them exactly: freed
// chunks that wait in glibc's per-thread cache still count as used, so the
// count is exact only with that cache off (CTest runs these tests with
// GLIBC_TUNABLES=glibc.malloc.tcache_count=0). Under a sanitizer's allocator
// the leak check at exit covers the same ground.
bool heapCountIsExact()
{
#if defined(__GLIBC__) && (__GLIBC__ > 2 || (__GLIBC__ == 2 && __GLIBC_MINOR__ >= 33))
    static const bool exact = [] {
        // Through a volatile pointer, so that the pair is not optimised away.
        static void* volatile probe = nullptr;
        probe = std::malloc(200);
        const std::size_t held = mallinfo2().uordblks;
        std::free(probe);
        return mallinfo2().uordblks < held;
    }();
    return exact;
#else
    return false;
#endif
}

std::size_t heapInUse()
{
#if defined(__GLIBC__) && (__GLIBC__ > 2 || (__GLIBC__ == 2 && __GLIBC_MINOR__ >= 33))
    return heapCountIsExact() ? mallinfo2().uordblks : 0;
#else
    return 0;
#endif
}

// Buffers one successful call of `process` allocates.
int allocationsOf(int process, MeasurementBlock block, bool primed, const TempDir& dir)
{
    void* profile = primed ? primedProfile(dir.path("primed.txt")) : CreateMathProfile("count");
    FailingAllocator counting(0);
    EXPECT_EQ(calculate(profile, process, dir.path("counted.txt"), block), VM_STATUS_OK);
    const int seen = allocationsSeen;
    DestroyMathProfile(profile);
    return seen;
}

// Fails each allocation of the call in turn on one profile, checking every
// failing call, then hands the profile back for the follow-up.
void failEachAllocation(void* profile, int process, MeasurementBlock& block, int allocations, const TempDir& dir)
{
    const std::string path = dir.path("chart.txt");
    const std::vector<int> blockBefore = block.ints;
    const ProfileState before = stateOf(profile);
    for (int n = 1; n <= allocations; ++n) {
        SCOPED_TRACE("failing allocation " + std::to_string(n) + " of " + std::to_string(allocations));
        int status = -1;
        const std::size_t heapBefore = heapInUse();
        {
            FailingAllocator failing(n);
            status = calculate(profile, process, path, block);
        }
        EXPECT_EQ(heapInUse(), heapBefore) << "buffers of the failed call leaked";
        ASSERT_EQ(status, VM_STATUS_OUT_OF_MEMORY);
        EXPECT_FALSE(fileExists(path));
        EXPECT_TRUE(block.ints == blockBefore);
        EXPECT_TRUE(stateOf(profile) == before);
    }
}

struct Case {
    const char* name;
    const char* input;
    int process;
    FollowUp followUp;
};

const Case kCases[] = {
    {"gravure", "offset-form.in", VM_PROCESS_GRAVURE, FollowUp::Gravure},
    {"offset", "offset-form.in", VM_PROCESS_OFFSET, FollowUp::Gravure},
    {"offset16Bands", "offset-form-k20.in", VM_PROCESS_OFFSET, FollowUp::Gravure},
    {"sixColour", "multichannel.in", VM_PROCESS_SIX_COLOUR, FollowUp::ChartCopy},
    {"sevenColour", "multichannel.in", VM_PROCESS_SEVEN_COLOUR, FollowUp::ChartCopy},
    {"separatedSet", "multichannel.in", VM_PROCESS_SEPARATED_SET, FollowUp::SeparatedSet},
    {"chartBlend", "conversion.in", VM_PROCESS_CHART_BLEND, FollowUp::ChartCopy},
};

void PrintTo(const Case& test, std::ostream* out)
{
    *out << test.name;
}

class AllocationFailureTest : public ::testing::TestWithParam<Case> {};

TEST_P(AllocationFailureTest, EveryFailingBufferGivesStatusFiveAndKeepsTheProfile)
{
    const Case& test = GetParam();
    const bool primed = test.process == VM_PROCESS_SEPARATED_SET;
    MeasurementBlock block = readGoldenInput(test.input);
    if (primed)
        putSeparations(block);
    // The offset fit is not run: allocations are counted on the gravure call,
    // which marshals the same block the same way.
    TempDir dir;
    const int allocations =
        allocationsOf(test.process == VM_PROCESS_OFFSET ? VM_PROCESS_GRAVURE : test.process, block, primed, dir);
    ASSERT_GE(allocations, block.count);

    void* profile = primed ? primedProfile(dir.path("primed.txt")) : CreateMathProfile("allocation");
    failEachAllocation(profile, test.process, block, allocations, dir);
    EXPECT_TRUE(servesFollowUp(profile, test.followUp, dir.path("follow-up.txt")));
    DestroyMathProfile(profile);
}

INSTANTIATE_TEST_SUITE_P(Processes, AllocationFailureTest, ::testing::ValuesIn(kCases),
                         [](const ::testing::TestParamInfo<Case>& info) { return info.param.name; });

// The largest row table a call can have.
TEST(AllocationFailure, FullRowTableIsReleasedAtEveryFailure)
{
    MeasurementBlock block = readGoldenInput("conversion.in");
    block.count = 1999;
    block.ints.assign(static_cast<size_t>(block.count) * (36 + 7), 500);
    TempDir dir;
    const int allocations = allocationsOf(VM_PROCESS_CHART_COPY, block, false, dir);
    ASSERT_GE(allocations, block.count);

    void* profile = CreateMathProfile("allocation");
    failEachAllocation(profile, VM_PROCESS_CHART_COPY, block, allocations, dir);
    EXPECT_TRUE(servesFollowUp(profile, FollowUp::ChartCopy, dir.path("follow-up.txt")));
    DestroyMathProfile(profile);
}

// Rejected calls allocate nothing at all.
TEST(AllocationFailure, RejectedCallsAllocateNothing)
{
    MeasurementBlock block = readGoldenInput("conversion.in");
    TempDir dir;
    void* profile = CreateMathProfile("allocation");
    FailingAllocator counting(0);
    block.inputKind = 15;
    EXPECT_EQ(calculate(profile, VM_PROCESS_CHART_COPY, dir.path("chart.txt"), block), VM_STATUS_UNKNOWN_INPUT_KIND);
    block.inputKind = VM_INPUT_10NM;
    block.count = 1;
    EXPECT_EQ(calculate(profile, VM_PROCESS_CHART_COPY, dir.path("chart.txt"), block),
              VM_STATUS_INVALID_MEASUREMENTS);
    EXPECT_EQ(allocationsSeen, 0);
    DestroyMathProfile(profile);
}

} // namespace
