// Two profiles used from two threads at once write the same bytes as when
// they are used one after the other: separate profiles share nothing but
// constant tables. Built with ThreadSanitizer by scripts/stages/40-tsan.sh.
#include "ReliabilitySupport.h"

#include <atomic>
#include <thread>

using namespace testsupport;
using namespace reliability;

namespace {

struct Step {
    const char* input;
    int process;
    bool separations; // the host's separations go into the buffer first
};

// Each sequence keeps state between its calls (ramps for process 6, tint
// lists that every four-colour call appends to).
const std::vector<Step> kSequenceA = {
    {"multichannel.in", VM_PROCESS_SIX_COLOUR, false},
    {"multichannel.in", VM_PROCESS_SEPARATED_SET, true},
    {"conversion.in", VM_PROCESS_CHART_CONVERT, false},
    {"offset-form.in", VM_PROCESS_GRAVURE, false},
};
const std::vector<Step> kSequenceB = {
    {"offset-form-k20.in", VM_PROCESS_GRAVURE, false},
    {"multichannel.in", VM_PROCESS_SEVEN_COLOUR, false},
    {"conversion.in", VM_PROCESS_CHART_BLEND, false},
    {"multichannel.in", VM_PROCESS_SEPARATED_SET, true},
};

// Runs a sequence on a fresh profile; returns its charts and statuses.
std::vector<std::string> run(const std::vector<Step>& sequence, const std::atomic<bool>* go = nullptr)
{
    std::vector<MeasurementBlock> blocks;
    for (const Step& step : sequence) {
        blocks.push_back(readGoldenInput(step.input));
        if (step.separations)
            putSeparations(blocks.back());
    }
    TempDir dir;
    if (go != nullptr)
        while (!go->load())
            std::this_thread::yield();

    std::vector<std::string> results;
    void* profile = CreateMathProfile("thread");
    for (size_t i = 0; i < sequence.size(); ++i) {
        const std::string path = dir.path("chart" + std::to_string(i) + ".txt");
        const int status = calculate(profile, sequence[i].process, path, blocks[i]);
        results.push_back(std::to_string(status) + (status == VM_STATUS_OK ? "\n" + readFile(path) : ""));
    }
    DestroyMathProfile(profile);
    return results;
}

TEST(TwoProfiles, TwoThreadsAtOnceWriteTheSameBytesAsOneAfterTheOther)
{
    const auto sequentialA = run(kSequenceA);
    const auto sequentialB = run(kSequenceB);
    for (const auto& result : sequentialA)
        ASSERT_EQ(result.substr(0, 2), "0\n");
    for (const auto& result : sequentialB)
        ASSERT_EQ(result.substr(0, 2), "0\n");

    for (int round = 0; round < 2; ++round) {
        SCOPED_TRACE("round " + std::to_string(round));
        std::atomic<bool> go{false};
        std::vector<std::string> concurrentA, concurrentB;
        std::thread first([&] { concurrentA = run(kSequenceA, &go); });
        std::thread second([&] { concurrentB = run(kSequenceB, &go); });
        go = true;
        first.join();
        second.join();
        EXPECT_TRUE(concurrentA == sequentialA);
        EXPECT_TRUE(concurrentB == sequentialB);
    }
}

// Both threads run the same sequence on their own profiles and buffers.
TEST(TwoProfiles, TheSameSequenceInTwoThreadsAtOnce)
{
    const auto sequential = run(kSequenceA);
    std::atomic<bool> go{false};
    std::vector<std::string> first, second;
    std::thread one([&] { first = run(kSequenceA, &go); });
    std::thread two([&] { second = run(kSequenceA, &go); });
    go = true;
    one.join();
    two.join();
    EXPECT_TRUE(first == sequential);
    EXPECT_TRUE(second == sequential);
}

} // namespace
