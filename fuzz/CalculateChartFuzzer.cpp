// Fuzzer of CalculateChart: up to three calls on one profile, each with a
// block exactly as long as a host would make it (AddressSanitizer catches a
// read or write past it). A broken promise aborts: status 2 for an unknown
// kind and 4 for an invalid block, neither allocating nor writing anything;
// status 5, no file and the block untouched for a failing scratch
// allocation; status 1 and nothing created for an unopenable path; else 0
// and a complete chart. Valid calls of the slow offset fit (process 0 and
// every value that runs as 0) always get a failing allocation.
// Input: byte 0 is the number of calls - 1 (modulo 3); 11 bytes per call:
// process, kind, first wavelength (int16), values per patch (int8), count
// (int16), flags, failing allocation, value scale, extremes; the rest is a
// pool of little-endian int32 that fills every block, repeated as needed.
#include "ScratchAllocation.h"
#include "VeltmarquistDLL.h"

#include <unistd.h>

#include <algorithm>
#include <climits>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

namespace {

enum Flags { kNullProfile = 1, kNullPath = 2, kNullMeasurements = 4, kFailAllocation = 0x20 };
enum PathKind { kMissingFolder = 2, kFolder = 3 }; // flag bits 3 and 4; else a new file
const int kProcesses[16] = {1, 3, 5, 6, 7, 8, 9, 0, 2, 4, -1, 10, INT_MIN, INT_MAX, 8, 7};
const int kKinds[8] = {10, 20, 10, 20, 15, 0, INT_MIN, INT_MAX};
const int kScales[8] = {1, 1, 1, 100, 7, 1000, 65537, -1};

struct Call {
    int process, inputKind, firstWavelength, valuesPerPatch, count, flags, failingAllocation, scale;
};

std::vector<Call> decode(const std::uint8_t* data, std::size_t size, std::vector<int>& pool)
{
    std::size_t at = 0;
    auto byte = [&]() -> int { return at < size ? data[at++] : 0; };
    auto int16 = [&] {
        const int low = byte();
        return static_cast<int>(static_cast<std::int16_t>(low | byte() << 8));
    };
    std::vector<Call> calls(static_cast<std::size_t>(1 + byte() % 3));
    for (Call& call : calls) {
        call.process = kProcesses[byte() % 16];
        call.inputKind = kKinds[byte() % 8];
        call.firstWavelength = int16();
        call.valuesPerPatch = static_cast<std::int8_t>(byte());
        call.count = int16() % 2100;
        call.flags = byte();
        const int nth = byte(); // 1 to 128 one by one, then in steps of 15 up to the largest row table
        call.failingAllocation = (call.flags & kFailAllocation) == 0 ? 0 : nth < 128 ? 1 + nth : 129 + (nth - 128) * 15;
        call.scale = kScales[byte() % 8];
        const int x = byte(); // extremes
        call.firstWavelength = x & 1 ? (x & 8 ? INT_MAX : INT_MIN) : call.firstWavelength;
        call.valuesPerPatch = x & 2 ? (x & 16 ? INT_MAX : INT_MIN) : call.valuesPerPatch;
        call.count = x & 4 ? (x & 32 ? INT_MAX : INT_MIN) : call.count;
    }
    for (; at + 4 <= size; at += 4)
        pool.push_back(static_cast<int>(data[at] | data[at + 1] << 8 | data[at + 2] << 16 |
                                        static_cast<std::uint32_t>(data[at + 3]) << 24));
    return calls;
}

// The status the header documents for a call that cannot run, or 0.
int documentedRejection(const Call& call, bool conversion, bool hasRamps)
{
    if (call.inputKind != VM_INPUT_10NM && call.inputKind != VM_INPUT_16BAND)
        return VM_STATUS_UNKNOWN_INPUT_KIND;
    const int p = call.process, F = call.firstWavelength, N = call.valuesPerPatch;
    const int patchesRead = p == 3 ? 10 : p == 5 ? 11 : p == 6 ? 1 : conversion ? 2 : 46;
    bool invalid = (call.flags & (kNullProfile | kNullPath | kNullMeasurements)) != 0 || call.count > 1999 ||
                   call.count < patchesRead || (p == VM_PROCESS_SEPARATED_SET && !hasRamps);
    if (call.inputKind == VM_INPUT_16BAND)
        invalid = invalid || N != 16;
    else // bands at their own row position: N - |F / 10 - 38|
        invalid = invalid || N < 1 || N > 100 || (F > 380 && (F > 740 || N > 36)) ||
                  N - std::labs(static_cast<long>(F / 10) - 38) < 1;
    return invalid ? VM_STATUS_INVALID_MEASUREMENTS : 0;
}

// Data lines of a chart ending with END_DATA, or -1.
int completeSets(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    const std::string chart((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    const std::size_t data = chart.find("BEGIN_DATA\n");
    if (data == std::string::npos || chart.rfind("END_DATA\n") + 9 != chart.size())
        return -1;
    return static_cast<int>(std::count(chart.begin() + static_cast<long>(data), chart.end(), '\n')) - 2;
}

std::string folder; // made once per process, in memory-backed /dev/shm when there is one
int allocationsSeen = 0, failingAllocation = 0;

void* failingCalloc(std::size_t count, std::size_t size)
{
    return ++allocationsSeen == failingAllocation ? nullptr : std::calloc(count, size);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (folder.empty()) {
        folder = std::string(access("/dev/shm", W_OK) == 0 ? "/dev/shm" : "/tmp") + "/veltmarquist-fuzz-XXXXXX";
        if (mkdtemp(folder.data()) == nullptr)
            std::abort(); // no temporary folder
        std::atexit([] {
            unlink((folder + "/chart.txt").c_str());
            rmdir(folder.c_str());
        });
    }
    const std::string chart = folder + "/chart.txt", inMissingFolder = folder + "/missing/chart.txt";
    std::vector<int> pool;
    const std::vector<Call> calls = decode(data, size, pool);
    void* profile = CreateMathProfile("fuzz");
    bool hasRamps = false;

    for (Call call : calls) {
        const int p = call.process;
        const bool conversion = p >= VM_PROCESS_CHART_COPY && p <= VM_PROCESS_CHART_BLEND;
        const bool exchange = p == 3 || p == 5 || p == 6;
        const int rejection = documentedRejection(call, conversion, hasRamps);
        if (rejection == 0 && p != VM_PROCESS_GRAVURE && !exchange && !conversion) // the offset fit
            call.failingAllocation = 1 + std::max(call.failingAllocation - 1, 0) % call.count;

        // The patches, a conversion's channel values behind them, at least the exchange buffer for 3, 5 and 6.
        const long count = std::clamp(call.count, 0, 1999);
        long ints = count * (call.inputKind == VM_INPUT_16BAND ? 16 : std::clamp(call.valuesPerPatch, 0, 100));
        ints += conversion ? 7 * count : 0;
        std::vector<int> block(static_cast<std::size_t>(std::max({ints, 1L, exchange ? VM_EXCHANGE_BUFFER_INTS : 0L})));
        for (std::size_t i = 0; i < block.size() && !pool.empty(); ++i) {
            const long long value = pool[i % pool.size()] * static_cast<long long>(call.scale);
            block[i] = static_cast<int>(static_cast<std::uint32_t>(value));
        }
        const std::vector<int> before = block;
        const int pathKind = (call.flags >> 3) & 3;
        const std::string path = pathKind == kMissingFolder ? inMissingFolder : pathKind == kFolder ? folder : chart;
        unlink(chart.c_str());

        allocationsSeen = 0;
        failingAllocation = call.failingAllocation;
        const scratch::Allocator previous = scratch::setAllocator(failingCalloc);
        const int status = CalculateChart((call.flags & kNullProfile) != 0 ? nullptr : profile,
                                          static_cast<PrintProcess>(p),
                                          (call.flags & kNullPath) != 0 ? nullptr : path.c_str(),
                                          (call.flags & kNullMeasurements) != 0 ? nullptr : block.data(),
                                          call.inputKind, call.firstWavelength, call.valuesPerPatch, call.count);
        scratch::setAllocator(previous);

        auto check = [&](bool kept, const char* promise) {
            if (!kept) {
                std::fprintf(stderr, "broken promise: %s\n  process %d, kind %d, first %d, values per patch %d, "
                             "count %d, flags 0x%02x, failing allocation %d -> status %d\n", promise, p,
                             call.inputKind, call.firstWavelength, call.valuesPerPatch, call.count, call.flags,
                             call.failingAllocation, status);
                std::abort();
            }
        };
        if (rejection != 0) {
            check(status == rejection, "the documented rejection status");
            check(allocationsSeen == 0, "a rejected call allocates nothing");
        } else if (failingAllocation > 0 && allocationsSeen >= failingAllocation) {
            check(status == VM_STATUS_OUT_OF_MEMORY, "a failing allocation gives status 5");
        } else if (pathKind == kMissingFolder || pathKind == kFolder) {
            check(status == VM_STATUS_FILE_NOT_OPENED, "an unopenable path gives status 1");
            check(access(inMissingFolder.c_str(), F_OK) != 0, "nothing is created for an unopenable path");
            check(block == before, "the block is untouched when the chart cannot be opened");
            return 0; // the library destroyed the profile
        } else {
            check(status == VM_STATUS_OK, "a valid call gives status 0");
            const int sets = p == 1 ? 900 : p == 3 ? 128 : p == 5 ? 159 : p == 6 ? VM_EXCHANGE_RECORDS : call.count - 2;
            check(completeSets(path) == sets, "a successful call writes a complete chart");
            hasRamps = hasRamps || p == VM_PROCESS_SIX_COLOUR || p == VM_PROCESS_SEVEN_COLOUR;
            continue;
        }
        check(access(chart.c_str(), F_OK) != 0, "a call that fails before opening writes no file");
        check(block == before, "a call that fails before opening leaves the block as it was");
    }
    DestroyMathProfile(profile);
    return 0;
}
