// Fuzzer of CalculateChart and the print-model entry points: up to three calls
// on one profile, blocks exactly as long as a host makes them. Aborts on a
// broken promise: 2 or 4, allocating and writing nothing; 5 and no file for a
// failing allocation; 1 and nothing made for an unopenable path; else 0 and a
// complete chart. Valid offset fits (slow) always get a failing allocation.
// A call with flag 0x40 fits a print model instead (the process is the model
// selector, the null-path flag nulls the model pointer) and predicts the
// coverages that the pool holds behind the block: see modelCall.
// Input: byte 0 is calls - 1 (mod 3); 11 bytes per call: process, kind, first
// wavelength (int16), values per patch (int8), count (int16), flags, failing
// allocation, value scale, extremes; the rest is an int32 pool filling blocks.
#include "ScratchAllocation.h"
#include "VeltmarquistDLL.h"

#include <unistd.h>

#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace {

enum Flags { kNullProfile = 1, kNullPath = 2, kNullMeasurements = 4, kFailAllocation = 0x20, kModelCall = 0x40 };
enum PathKind { kMissingFolder = 2, kFolder = 3 }; // flag bits 3 and 4; else a new file
const int kProcesses[16] = {1, 3, 5, 6, 7, 8, 9, 0, 2, 4, -1, 10, INT_MIN, INT_MAX, 8, 7};
const int kKinds[8] = {10, 20, 10, 20, 15, 0, INT_MIN, INT_MAX};
const int kScales[8] = {1, 1, 1, 100, 7, 1000, 65537, -1};

struct Call { int process, inputKind, firstWavelength, valuesPerPatch, count, flags, failingAllocation, scale; };

std::vector<Call> decode(const std::uint8_t* data, std::size_t size, std::vector<int>& pool)
{
    std::size_t at = 0;
    auto byte = [&]() -> int { return at < size ? data[at++] : 0; };
    auto int16 = [&] { const int low = byte(); return static_cast<int>(static_cast<std::int16_t>(low | byte() << 8)); };
    std::vector<Call> calls(static_cast<std::size_t>(1 + byte() % 3));
    for (Call& c : calls) {
        c.process = kProcesses[byte() % 16], c.inputKind = kKinds[byte() % 8], c.firstWavelength = int16();
        c.valuesPerPatch = static_cast<std::int8_t>(byte()), c.count = int16() % 2100, c.flags = byte();
        const int nth = byte(); // 1 to 128 one by one, then in steps of 15 up to the largest row table
        c.failingAllocation = (c.flags & kFailAllocation) == 0 ? 0 : nth < 128 ? 1 + nth : 129 + (nth - 128) * 15;
        c.scale = kScales[byte() % 8];
        const int x = byte(); // extremes
        c.firstWavelength = x & 1 ? (x & 8 ? INT_MAX : INT_MIN) : c.firstWavelength;
        c.valuesPerPatch = x & 2 ? (x & 16 ? INT_MAX : INT_MIN) : c.valuesPerPatch;
        c.count = x & 4 ? (x & 32 ? INT_MAX : INT_MIN) : c.count;
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
    // kind 20: 16 values; kind 10: bands at their own row position, N - |F / 10 - 38| of them
    invalid = invalid || (call.inputKind == 20 ? N != 16 : N < 1 || N > 100 || (F > 380 && (F > 740 || N > 36)) ||
                                                        N - std::labs(static_cast<long>(F / 10) - 38) < 1);
    return invalid ? VM_STATUS_INVALID_MEASUREMENTS : 0;
}

// Data lines of a chart ending with END_DATA, or -1.
int completeSets(const std::string& path)
{
    const std::string chart = (std::ostringstream() << std::ifstream(path, std::ios::binary).rdbuf()).str();
    const std::size_t data = chart.find("BEGIN_DATA\n");
    if (data == std::string::npos || chart.rfind("END_DATA\n") + 9 != chart.size())
        return -1;
    return static_cast<int>(std::count(chart.begin() + static_cast<long>(data), chart.end(), '\n')) - 2;
}

std::string folder; // made once per process, in memory-backed /dev/shm when there is one
int allocated = 0, failingNth = 0;
void* failingCalloc(std::size_t n, std::size_t s) { return ++allocated == failingNth ? nullptr : std::calloc(n, s); }

void promise(bool kept, const char* what, int process, int status)
{
    if (!kept && std::fprintf(stderr, "broken promise: %s (process %d, status %d)\n", what, process, status))
        std::abort();
}

// An odd pool value v picks kCoverages[(v >> 1) & 15], an even one (v >> 1) % 10001 / 100.
const double kCoverages[16] = {0, 10, 20, 40, 60, 70, 80, 90, 100, 35, -0.0, -1, 100.5, HUGE_VAL, -HUGE_VAL, NAN};

// FitPrintModel on the block: the documented rejection (2, 6, 7, then 4 as for
// process 0 or for a first band off the 10 nm grid) allocating nothing, 5 for
// a failing allocation, else a model, or 4 for a form that is no measurement
// or 3 for a fit that fails; on every status but 0 the model is null. Its
// prediction of the coverages (at most 64 patches) refuses with 8 and writes
// nothing exactly when one is not finite, lies outside 0..100 or is none of
// the model's levels; otherwise it fills every array with colours (finite
// reflectance within -0.01..1.5), or stops with 3. A destroyed model and a
// profile are unknown handles (9).
void modelCall(Call call, const std::vector<int>& block, const int* coverages, std::size_t coverageInts, void* profile)
{
    Call asForm = call;
    asForm.process = VM_PROCESS_OFFSET, asForm.flags &= ~(kNullProfile | kNullPath);
    int layout = documentedRejection(asForm, false, true);
    if (layout == 0 && call.inputKind == VM_INPUT_10NM && call.firstWavelength % 10 != 0)
        layout = VM_STATUS_INVALID_MEASUREMENTS;
    const int p = call.process;
    const int rejection = layout == VM_STATUS_UNKNOWN_INPUT_KIND ? layout
                          : p < 0 || p > 3                       ? VM_STATUS_UNKNOWN_MODEL
                          : (call.flags & kNullPath) != 0        ? VM_STATUS_INVALID_ARGUMENT
                                                                 : layout;
    if (rejection == 0 && p == VM_MODEL_OFFSET) // the grey fit of process 0
        call.failingAllocation = 1 + std::max(call.failingAllocation - 1, 0) % call.count;
    allocated = 0, failingNth = call.failingAllocation;
    const scratch::Allocator previous = scratch::setAllocator(failingCalloc);
    void* model = &allocated; // a fit that checks the block must leave null when it fails
    const int status = FitPrintModel(p, (call.flags & kNullMeasurements) != 0 ? nullptr : block.data(), call.inputKind,
                                     call.firstWavelength, call.valuesPerPatch, call.count,
                                     (call.flags & kNullPath) != 0 ? nullptr : &model);
    scratch::setAllocator(previous);
    if (rejection != 0 || (failingNth > 0 && allocated >= failingNth)) {
        promise(rejection != 0 ? status == rejection && allocated == 0 : status == VM_STATUS_OUT_OF_MEMORY,
                "the documented rejection of a fit allocating nothing, or 5 for a failing allocation", p, status);
        promise((call.flags & kNullPath) != 0 || model == nullptr, "no model after a failed fit", p, status);
        return;
    }
    if (status != VM_STATUS_OK) {
        promise((status == VM_STATUS_INVALID_MEASUREMENTS || status == VM_STATUS_CALCULATION_FAILED) &&
                    model == nullptr,
                "a valid layout fits a model, or refuses its values (4) or fails (3) leaving no model", p, status);
        return;
    }
    const double* levels = nullptr;
    int levelCount = -1;
    promise(DescribePrintModel(model, nullptr, nullptr, &levels, &levelCount) == 0, "a fitted model describes itself",
            p, status);
    std::vector<double> cmyk(std::min<std::size_t>(coverageInts / 4, 64) * 4);
    bool predicted = true;
    for (std::size_t i = 0; i < cmyk.size(); ++i) {
        const int v = coverages[i];
        const double c = cmyk[i] = v & 1 ? kCoverages[(v >> 1) & 15] : (v >> 1) % 10001 / 100.0;
        predicted = predicted && c >= 0.0 && c <= 100.0 &&
                    (levelCount == 0 || std::find(levels, levels + levelCount, c) != levels + levelCount);
    }
    // Every output starts as a signalling NaN, which no arithmetic produces.
    const std::size_t n = cmyk.size() / 4;
    std::vector<std::uint64_t> out(n * 42 + 1, 0x7ff4000000dead00);
    double* const first = reinterpret_cast<double*>(out.data());
    const int predictedStatus =
        PredictPrintModel(model, static_cast<int>(n), cmyk.data(), first, first + n * 36, first + n * 39);
    DestroyPrintModel(model);
    promise(PredictPrintModel(model, 0, nullptr, nullptr, nullptr, nullptr) == VM_STATUS_UNKNOWN_HANDLE &&
                PredictPrintModel(profile, 0, nullptr, nullptr, nullptr, nullptr) == VM_STATUS_UNKNOWN_HANDLE,
            "a destroyed model and a profile are unknown handles", p, predictedStatus);
    DestroyPrintModel(model); // a second time: left alone
    if (predicted && predictedStatus == VM_STATUS_CALCULATION_FAILED)
        return; // a prediction that is no colour is never handed over with 0
    promise(predictedStatus == (predicted ? VM_STATUS_OK : VM_STATUS_COVERAGE_NOT_PREDICTED), "a prediction's status",
            p, predictedStatus);
    const auto untouched = static_cast<std::size_t>(std::count(out.begin(), out.end(), out.back()));
    promise(untouched == 1 + (predicted ? 0 : n * 42),
            "the requested arrays filled, or nothing written on a refusal", p, predictedStatus);
    for (std::size_t i = 0; predicted && i < n * 36; ++i)
        promise(first[i] >= -0.01 && first[i] <= 1.5, "every predicted reflectance a colour", p, predictedStatus);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (folder.empty()) {
        folder = std::string(access("/dev/shm", W_OK) == 0 ? "/dev/shm" : "/tmp") + "/veltmarquist-fuzz-XXXXXX";
        if (!mkdtemp(folder.data()) ||
            std::atexit([] { unlink((folder + "/chart.txt").c_str()), rmdir(folder.data()); }))
            std::abort();
    }
    const std::string chart = folder + "/chart.txt", inMissingFolder = folder + "/missing/chart.txt";
    std::vector<int> pool;
    const std::vector<Call> calls = decode(data, size, pool);
    void* profile = CreateMathProfile("fuzz");
    bool hasRamps = false;
    for (Call call : calls) {
        const int p = call.process;
        const bool conversion = p >= 7 && p <= 9, exchange = p == 3 || p == 5 || p == 6;
        const int rejection = documentedRejection(call, conversion, hasRamps);
        // The offset fit of process 0 (slow) always gets a failing allocation.
        if (rejection == 0 && p != VM_PROCESS_GRAVURE && !exchange && !conversion && !(call.flags & kModelCall))
            call.failingAllocation = 1 + std::max(call.failingAllocation - 1, 0) % call.count;
        // The patches, a conversion's channel values behind them, at least the exchange buffer for 3, 5 and 6.
        const long width = call.inputKind == VM_INPUT_16BAND ? 16 : std::clamp(call.valuesPerPatch, 0, 100);
        const long ints = std::clamp(call.count, 0, 1999) * (width + (conversion ? 7 : 0));
        std::vector<int> block(static_cast<std::size_t>(std::max({ints, 1L, exchange ? VM_EXCHANGE_BUFFER_INTS : 0L})));
        for (std::size_t i = 0; i < block.size() && !pool.empty(); ++i)
            block[i] = static_cast<int>(static_cast<std::uint32_t>(1LL * call.scale * pool[i % pool.size()]));
        const std::vector<int> before = block;
        if ((call.flags & kModelCall) != 0) {
            const std::size_t behind = std::min<std::size_t>(static_cast<std::size_t>(ints), pool.size());
            modelCall(call, block, pool.data() + behind, pool.size() - behind, profile);
            promise(block == before, "a fit only reads the block", p, 0);
            continue;
        }
        const int pathKind = (call.flags >> 3) & 3;
        const std::string path = pathKind == kMissingFolder ? inMissingFolder : pathKind == kFolder ? folder : chart;
        unlink(chart.c_str());
        allocated = 0, failingNth = call.failingAllocation;
        const scratch::Allocator previous = scratch::setAllocator(failingCalloc);
        const int status = CalculateChart(call.flags & kNullProfile ? nullptr : profile, static_cast<PrintProcess>(p),
                                          (call.flags & kNullPath) != 0 ? nullptr : path.c_str(),
                                          (call.flags & kNullMeasurements) != 0 ? nullptr : block.data(),
                                          call.inputKind, call.firstWavelength, call.valuesPerPatch, call.count);
        scratch::setAllocator(previous);
        auto check = [&](bool kept, const char* what) { promise(kept, what, p, status); };
        if (rejection != 0 || (failingNth > 0 && allocated >= failingNth)) {
            check(rejection != 0 ? status == rejection && allocated == 0 : status == VM_STATUS_OUT_OF_MEMORY,
                  "the documented rejection allocating nothing, or status 5 for a failing allocation");
            check(access(chart.c_str(), F_OK) != 0 && block == before, "no file, the block untouched");
        } else if (pathKind == kMissingFolder || pathKind == kFolder) {
            check(status == VM_STATUS_FILE_NOT_OPENED && access(inMissingFolder.c_str(), F_OK) != 0 && block == before,
                  "an unopenable path gives status 1, creates nothing and leaves the block");
            return 0; // the library destroyed the profile
        } else {
            const int sets = p == 1 ? 900 : p == 3 ? 128 : p == 5 ? 159 : p == 6 ? VM_EXCHANGE_RECORDS : call.count - 2;
            check(status == VM_STATUS_OK && completeSets(path) == sets, "a valid call writes a complete chart");
            hasRamps = hasRamps || p == 3 || p == 5;
        }
    }
    DestroyMathProfile(profile);
    return 0;
}
