// Allocation failure: the first, second, ... scratch buffer of a call fails
// until the call allocates no more. Each failing call gives status 5, no
// file, the block and heap as they were; the call that finally runs through
// on the same profile writes the reference chart.
#include "ReliabilitySupport.h"

#include <gtest/gtest.h>

#include <malloc.h>

#include <tuple>

using namespace reliability;

namespace {

// Bytes in use on the heap, or 0 where glibc does not count them exactly:
// freed chunks in its per-thread cache still count as used (CTest turns the
// cache off). Under a sanitizer or memcheck the leak check covers the same.
std::size_t heapInUse()
{
#if defined(__GLIBC__) && (__GLIBC__ > 2 || __GLIBC_MINOR__ >= 33)
    static const bool exact = [] {
        static void* volatile probe = nullptr;
        probe = std::malloc(200);
        const std::size_t held = mallinfo2().uordblks;
        std::free(probe);
        return mallinfo2().uordblks < held;
    }();
    return exact ? mallinfo2().uordblks : 0;
#else
    return 0;
#endif
}

TEST(AllocationFailure, EachFailingBufferGivesStatusFiveAndReleasesTheOthers)
{
    const std::tuple<const char*, int, const char*> cases[] = {
        {"offset-form.in", VM_PROCESS_GRAVURE, "offset-form.p1.chart"},
        {"offset-form-k20.in", VM_PROCESS_OFFSET, "offset-form-k20.p0.chart"},
        {"multichannel.in", VM_PROCESS_SIX_COLOUR, "multichannel.p3.chart"},
        {"multichannel.in", VM_PROCESS_SEPARATED_SET, "multichannel.p3-p6.chart"},
        {"conversion.in", VM_PROCESS_CHART_BLEND, "conversion.p9.chart"},
    };
    TempDir dir;
    for (const auto& [input, process, reference] : cases) {
        const std::string path = dir.path(reference);
        const bool separated = process == VM_PROCESS_SEPARATED_SET;
        MeasurementBlock block = separated ? withSeparations(input) : readGoldenInput(input);
        const std::vector<int> before = block.ints;
        void* profile = separated ? primedProfile(dir) : CreateMathProfile("allocation");
        for (int n = 1;; ++n) {
            SCOPED_TRACE(std::string(reference) + ", failing buffer " + std::to_string(n));
            const std::size_t heapBefore = heapInUse();
            const int status = [&] {
                FailingAllocation failing(n);
                return calculate(profile, process, path, block);
            }();
            if (FailingAllocation::seen() < n) { // nothing failed
                ASSERT_EQ(status, VM_STATUS_OK);
                EXPECT_GT(n, block.count) << "fewer buffers than patches: the seam is not used";
                EXPECT_TRUE(readFile(path) == readFile(goldenPath(reference)));
                break;
            }
            ASSERT_EQ(status, VM_STATUS_OUT_OF_MEMORY);
            EXPECT_EQ(heapInUse(), heapBefore) << "buffers of the failed call leaked";
            EXPECT_FALSE(fileExists(path));
            EXPECT_TRUE(block.ints == before);
        }
        DestroyMathProfile(profile);
    }
}

} // namespace
