// Fuzzer of CalculateChart: up to three calls on one profile with arguments
// and measurement blocks from the input (ChartCallInput.h). Each call's block
// is exactly as long as a host would make it for those arguments, so a read
// or write past it is caught by AddressSanitizer.
//
// Besides not crashing, every call must keep the documented promises:
//   - inputKind other than 10 and 20 gives 2; an invalid block gives 4; both
//     allocate nothing, write no file and leave the block as it was;
//   - a failing scratch allocation gives 5, no file, the block unchanged;
//   - an unopenable path gives 1 (and the profile is gone);
//   - otherwise 0 and a complete chart with the process's number of sets;
//   - status 3 never happens.
// A broken promise aborts with the call that broke it.
//
// The offset fit (process 0 and the values that run as 0) takes seconds per
// call, so valid calls of those processes always get a failing allocation:
// they exercise marshalling and clean-up, not the fit.
#include "ChartCallInput.h"
#include "ScratchAllocation.h"
#include "VeltmarquistDLL.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <sstream>
#include <string>

using chartfuzz::Call;

namespace {

// ---- Output folder ------------------------------------------------------------

struct Folder {
    std::string dir;
    std::string chart() const { return dir + "/chart.txt"; }
    std::string inMissingFolder() const { return dir + "/missing/chart.txt"; }
    std::string existingFolder() const { return dir + "/folder"; }
};

Folder* folder = nullptr;

void removeFolder()
{
    if (folder == nullptr)
        return;
    unlink(folder->chart().c_str());
    rmdir(folder->existingFolder().c_str());
    rmdir(folder->dir.c_str());
}

// Made once per process, in memory-backed /dev/shm when there is one.
const Folder& outputFolder()
{
    if (folder == nullptr) {
        const char* tmp = std::getenv("TMPDIR");
        std::string base = access("/dev/shm", W_OK) == 0 ? "/dev/shm" : tmp != nullptr ? tmp : "/tmp";
        std::string pattern = base + "/veltmarquist-fuzz-XXXXXX";
        if (mkdtemp(pattern.data()) == nullptr) {
            std::perror("mkdtemp");
            std::abort();
        }
        folder = new Folder{pattern};
        mkdir(folder->existingFolder().c_str(), 0755);
        std::atexit(removeFolder);
    }
    return *folder;
}

// ---- Failing allocations --------------------------------------------------------

int allocationsSeen = 0;
int failingAllocation = 0;
bool allocationFailed = false;

void* failingCalloc(std::size_t count, std::size_t size)
{
    if (++allocationsSeen == failingAllocation) {
        allocationFailed = true;
        return nullptr;
    }
    return std::calloc(count, size);
}

// ---- The documented rules ---------------------------------------------------------

bool isConversion(int process)
{
    return process == VM_PROCESS_CHART_COPY || process == VM_PROCESS_CHART_CONVERT ||
           process == VM_PROCESS_CHART_BLEND;
}

bool usesExchangeBuffer(int process)
{
    return process == VM_PROCESS_SIX_COLOUR || process == VM_PROCESS_SEVEN_COLOUR ||
           process == VM_PROCESS_SEPARATED_SET;
}

bool runsOffsetFit(int process)
{
    return process != VM_PROCESS_GRAVURE && !usesExchangeBuffer(process) && !isConversion(process);
}

int patchesRead(int process)
{
    switch (process) {
    case VM_PROCESS_SIX_COLOUR: return 10;
    case VM_PROCESS_SEVEN_COLOUR: return 11;
    case VM_PROCESS_SEPARATED_SET: return 1;
    default: return isConversion(process) ? 2 : 46;
    }
}

// The status the header documents for a call that cannot run, or 0.
int documentedRejection(const Call& call, bool hasRamps)
{
    if (call.inputKind != VM_INPUT_10NM && call.inputKind != VM_INPUT_16BAND)
        return VM_STATUS_UNKNOWN_INPUT_KIND;
    if ((call.flags & (chartfuzz::kNullProfile | chartfuzz::kNullPath | chartfuzz::kNullMeasurements)) != 0)
        return VM_STATUS_INVALID_MEASUREMENTS;
    if (call.count > 1999 || call.count < patchesRead(call.process))
        return VM_STATUS_INVALID_MEASUREMENTS;
    if (call.inputKind == VM_INPUT_16BAND) {
        if (call.valuesPerPatch != 16)
            return VM_STATUS_INVALID_MEASUREMENTS;
    } else {
        const int F = call.firstWavelength, N = call.valuesPerPatch;
        if (N < 1 || N > 100)
            return VM_STATUS_INVALID_MEASUREMENTS;
        if (F > 380 && (F > 740 || N > 36))
            return VM_STATUS_INVALID_MEASUREMENTS;
        // Bands that land at their own row position: N - |F / 10 - 38|.
        const long shift = std::labs(static_cast<long>(F / 10) - 38);
        if (N - shift < 1)
            return VM_STATUS_INVALID_MEASUREMENTS;
    }
    if (call.process == VM_PROCESS_SEPARATED_SET && !hasRamps)
        return VM_STATUS_INVALID_MEASUREMENTS;
    return 0;
}

int setsOf(const Call& call)
{
    switch (call.process) {
    case VM_PROCESS_GRAVURE: return 900;
    case VM_PROCESS_SIX_COLOUR: return 128;
    case VM_PROCESS_SEVEN_COLOUR: return 159;
    case VM_PROCESS_SEPARATED_SET: return VM_EXCHANGE_RECORDS;
    default: return call.count - 2;
    }
}

// Ints a host passes for these arguments: the patches, the channel values of
// a conversion behind them, at least the exchange buffer for 3, 5 and 6.
std::size_t blockInts(const Call& call)
{
    const long count = call.count < 0 ? 0 : call.count > 1999 ? 1999 : call.count;
    const long perPatch = call.inputKind == VM_INPUT_16BAND ? 16
                          : call.valuesPerPatch < 0         ? 0
                          : call.valuesPerPatch > 100       ? 100
                                                            : call.valuesPerPatch;
    long ints = count * perPatch;
    if (isConversion(call.process))
        ints += 7 * count;
    if (usesExchangeBuffer(call.process) && ints < VM_EXCHANGE_BUFFER_INTS)
        ints = VM_EXCHANGE_BUFFER_INTS;
    return static_cast<std::size_t>(ints < 1 ? 1 : ints);
}

// ---- Checks ---------------------------------------------------------------------

[[noreturn]] void broken(const char* promise, const Call& call, int status)
{
    std::fprintf(stderr,
                 "broken promise: %s\n  process %d, kind %d, first %d, values per patch %d, count %d, flags 0x%02x, "
                 "failing allocation %d -> status %d\n",
                 promise, call.process, call.inputKind, call.firstWavelength, call.valuesPerPatch, call.count,
                 call.flags, call.failingAllocation, status);
    std::abort();
}

bool exists(const std::string& path)
{
    struct stat info;
    return stat(path.c_str(), &info) == 0;
}

// Data lines of a complete chart, or -1 when it does not end with END_DATA.
int completeSets(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    const std::string chart = text.str();
    const std::string begin = "BEGIN_DATA\n", end = "END_DATA\n";
    const std::size_t data = chart.find(begin);
    if (data == std::string::npos || chart.size() < end.size() ||
        chart.compare(chart.size() - end.size(), end.size(), end) != 0)
        return -1;
    int lines = 0;
    for (std::size_t i = data + begin.size(); i < chart.size(); ++i)
        lines += chart[i] == '\n';
    return lines - 1;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const chartfuzz::Input input = chartfuzz::decode(data, size);
    const Folder& out = outputFolder();
    void* profile = CreateMathProfile("fuzz");
    if (profile == nullptr)
        return 0;
    bool hasRamps = false;

    for (Call call : input.calls) {
        const int rejection = documentedRejection(call, hasRamps);
        if (rejection == 0 && runsOffsetFit(call.process))
            call.failingAllocation = 1 + (call.failingAllocation > 0 ? call.failingAllocation - 1 : 0) % call.count;

        std::vector<int> block(blockInts(call));
        for (std::size_t i = 0; i < block.size() && !input.pool.empty(); ++i) {
            const long long value = static_cast<long long>(input.pool[i % input.pool.size()]) * call.scale;
            block[i] = static_cast<int>(static_cast<std::uint32_t>(value));
        }
        const std::vector<int> before = block;

        unlink(out.chart().c_str());
        const int pathKind = call.pathKind();
        const std::string path = pathKind == chartfuzz::kMissingFolder ? out.inMissingFolder()
                                 : pathKind == chartfuzz::kFolder      ? out.existingFolder()
                                                                       : out.chart();
        allocationsSeen = 0;
        allocationFailed = false;
        failingAllocation = call.failingAllocation;
        const scratch::Allocator previous = scratch::setAllocator(failingCalloc);
        const int status = CalculateChart((call.flags & chartfuzz::kNullProfile) != 0 ? nullptr : profile,
                                          static_cast<PrintProcess>(call.process),
                                          (call.flags & chartfuzz::kNullPath) != 0 ? nullptr : path.c_str(),
                                          (call.flags & chartfuzz::kNullMeasurements) != 0 ? nullptr : block.data(),
                                          call.inputKind, call.firstWavelength, call.valuesPerPatch, call.count);
        scratch::setAllocator(previous);

        if (status == VM_STATUS_CALCULATION_FAILED)
            broken("no calculation fails", call, status);
        if (rejection != 0) {
            if (status != rejection)
                broken("the documented rejection status", call, status);
            if (allocationsSeen != 0)
                broken("a rejected call allocates nothing", call, status);
        } else if (allocationFailed) {
            if (status != VM_STATUS_OUT_OF_MEMORY)
                broken("a failing allocation gives status 5", call, status);
        } else if (pathKind == chartfuzz::kMissingFolder || pathKind == chartfuzz::kFolder) {
            if (status != VM_STATUS_FILE_NOT_OPENED)
                broken("an unopenable path gives status 1", call, status);
            if (exists(out.inMissingFolder()))
                broken("nothing is created for an unopenable path", call, status);
            if (block != before)
                broken("the block is untouched when the chart cannot be opened", call, status);
            return 0; // the library destroyed the profile
        } else {
            if (status != VM_STATUS_OK)
                broken("a valid call gives status 0", call, status);
            if (completeSets(path) != setsOf(call))
                broken("a successful call writes a complete chart", call, status);
            if (call.process == VM_PROCESS_SIX_COLOUR || call.process == VM_PROCESS_SEVEN_COLOUR)
                hasRamps = true;
            continue;
        }
        if (exists(out.chart()))
            broken("a call that fails before opening writes no file", call, status);
        if (block != before)
            broken("a call that fails before opening leaves the block as it was", call, status);
    }
    DestroyMathProfile(profile);
    return 0;
}
