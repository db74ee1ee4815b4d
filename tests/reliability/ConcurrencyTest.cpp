// Two profiles used from two threads at once write the same bytes as when
// they are used one after the other. Built with ThreadSanitizer by
// scripts/stages/40-tsan.sh.
#include "ReliabilitySupport.h"

#include <gtest/gtest.h>

#include <thread>

using namespace reliability;

namespace {

// Each sequence carries state from call to call: the ramps of process 6 and
// the tint lists of the four-colour calls.
using Sequence = std::vector<std::pair<const char*, int>>;
const Sequence kFirst = {{"multichannel.in", VM_PROCESS_SIX_COLOUR},
                         {"multichannel.in", VM_PROCESS_SEPARATED_SET},
                         {"conversion.in", VM_PROCESS_CHART_CONVERT},
                         {"offset-form.in", VM_PROCESS_GRAVURE}};
const Sequence kSecond = {{"offset-form-k20.in", VM_PROCESS_GRAVURE},
                          {"multichannel.in", VM_PROCESS_SEVEN_COLOUR},
                          {"conversion.in", VM_PROCESS_CHART_BLEND},
                          {"multichannel.in", VM_PROCESS_SEPARATED_SET}};

// The charts of a sequence on a fresh profile ("failed" for a failed call).
std::vector<std::string> run(const Sequence& sequence)
{
    TempDir dir;
    void* profile = CreateMathProfile("thread");
    std::vector<std::string> charts;
    for (const auto& [input, process] : sequence) {
        MeasurementBlock block = process == VM_PROCESS_SEPARATED_SET ? withSeparations(input) : readGoldenInput(input);
        const std::string path = dir.path(std::to_string(charts.size()));
        charts.push_back(calculate(profile, process, path, block) == VM_STATUS_OK ? readFile(path) : "failed");
    }
    DestroyMathProfile(profile);
    return charts;
}

TEST(TwoProfiles, TwoThreadsAtOnceWriteTheSameBytesAsOneAfterTheOther)
{
    const auto first = run(kFirst), second = run(kSecond);
    ASSERT_EQ(std::count(first.begin(), first.end(), "failed") + std::count(second.begin(), second.end(), "failed"), 0);
    std::vector<std::string> concurrent[2];
    std::thread one([&] { concurrent[0] = run(kFirst); }), two([&] { concurrent[1] = run(kSecond); });
    one.join();
    two.join();
    EXPECT_TRUE(concurrent[0] == first);
    EXPECT_TRUE(concurrent[1] == second);
}

} // namespace
