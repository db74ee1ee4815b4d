// Fuzzer of the print-model entry points: FitPrintModel on a block exactly as
// long as a host makes it, then PredictPrintModel, DescribePrintModel and
// GetPrintModelValue on the model. Aborts on a broken promise: the documented
// rejection (2, 6, 7 or 4) allocating nothing; 5 for a failing allocation;
// else 0 and a model; a prediction gives 8 and writes nothing exactly when a
// coverage is not finite, outside 0..100 or none of the model's levels, else
// 0 and every requested array filled. A fitted model is kept while the next
// input fits the same block. Valid offset fits (slow) always get a failing
// allocation; the offset model's predictions share the gravure model's checks.
// Input: 11 bytes (model, kind, first wavelength int16, values per patch int8,
// count int16, flags, failing allocation, value scale, coverages n), then 4n
// coverage bytes, then an int32 pool filling the block.
#include "ScratchAllocation.h"
#include "VeltmarquistDLL.h"

#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <vector>

namespace {

enum Flags { kNullFitted = 1, kNullMeasurements = 2, kNullSpectra = 4, kNullXYZ = 8, kNullLab = 16, kFail = 32 };
const int kModels[8] = {0, 1, 2, 3, -1, 4, INT_MIN, 1};
const int kKinds[8] = {10, 20, 10, 20, 10, 15, 0, INT_MAX};
const int kScales[8] = {1, 1, 1, 100, 7, 1000, 65537, -1};
const double kInf = std::numeric_limits<double>::infinity();
const double kCoverages[20] = {0, 10, 20, 40, 60, 70, 80, 90, 100, 35, -0.0, -1, 100.5, 1e300, -kInf, kInf,
                               std::numeric_limits<double>::quiet_NaN(), 50, 99.99, 0.001};

int allocated = 0, failingNth = 0;
void* failingCalloc(std::size_t n, std::size_t s) { return ++allocated == failingNth ? nullptr : std::calloc(n, s); }

void check(bool kept, const char* promise, int status)
{
    if (!kept && std::fprintf(stderr, "broken promise: %s (status %d)\n", promise, status))
        std::abort();
}

// The last fitted model and what it was fitted to.
void* keptModel = nullptr;
std::vector<int> keptFit;

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    std::size_t at = 0;
    auto byte = [&]() -> int { return at < size ? data[at++] : 0; };
    auto int16 = [&] { const int low = byte(); return static_cast<int>(static_cast<std::int16_t>(low | byte() << 8)); };
    const int model = kModels[byte() % 8], kind = kKinds[byte() % 8], first = int16();
    const int values = static_cast<std::int8_t>(byte()), count = int16() % 2100, flags = byte(), nth = byte();
    const int scale = kScales[byte() % 8];
    std::vector<double> cmyk(4 * static_cast<std::size_t>(byte()));
    for (double& c : cmyk) {
        const int b = byte();
        c = b % 32 < 20 ? kCoverages[b % 32] : b * 100.0 / 255.0;
    }
    std::vector<int> pool;
    for (; at + 4 <= size; at += 4)
        pool.push_back(static_cast<int>(data[at] | data[at + 1] << 8 | data[at + 2] << 16 |
                                        static_cast<std::uint32_t>(data[at + 3]) << 24));
    const long width = kind == VM_INPUT_16BAND ? 16 : std::clamp(values, 0, 100);
    std::vector<int> block(static_cast<std::size_t>(std::max(std::clamp(count, 0, 1999) * width, 1L)));
    for (std::size_t i = 0; i < block.size() && !pool.empty(); ++i)
        block[i] = static_cast<int>(static_cast<std::uint32_t>(1LL * scale * pool[i % pool.size()]));

    // The documented rejection, or 0 (kind 10: bands at their own row position, N - |F / 10 - 38| of them).
    const bool layoutBad = (flags & kNullMeasurements) != 0 || count > 1999 || count < 46 ||
                           (kind == 20 ? values != 16 : values < 1 || values > 100 ||
                                                        (first > 380 && (first > 740 || values > 36)) ||
                                                        values - std::labs(first / 10L - 38) < 1);
    const int rejection = kind != 10 && kind != 20 ? VM_STATUS_UNKNOWN_INPUT_KIND
                          : model < 0 || model > 3 ? VM_STATUS_UNKNOWN_MODEL
                          : (flags & kNullFitted) != 0 ? VM_STATUS_INVALID_ARGUMENT
                          : layoutBad ? VM_STATUS_INVALID_MEASUREMENTS : 0;
    std::vector<int> fit = {model, kind, first, values, count};
    fit.insert(fit.end(), block.begin(), block.end());
    if (rejection != 0 || (flags & kFail) != 0 || fit != keptFit) {
        DestroyPrintModel(keptModel);
        keptModel = nullptr, keptFit.clear();
        // A valid offset fit (slow: the grey fit of process 0) always gets a failing allocation.
        const bool slowFit = rejection == 0 && model == VM_MODEL_OFFSET;
        allocated = 0, failingNth = slowFit ? 1 + nth % count : (flags & kFail) != 0 ? 1 + nth % 50 : 0;
        const scratch::Allocator previous = scratch::setAllocator(failingCalloc);
        void* fitted = reinterpret_cast<void*>(1);
        const int status = FitPrintModel(model, (flags & kNullMeasurements) != 0 ? nullptr : block.data(), kind, first,
                                         values, count, (flags & kNullFitted) != 0 ? nullptr : &fitted);
        scratch::setAllocator(previous);
        // Until the library holds the Yule-Nielsen fit, its selector names no model.
        if (model == VM_MODEL_YULE_NIELSEN && status == VM_STATUS_UNKNOWN_MODEL &&
            rejection != VM_STATUS_UNKNOWN_INPUT_KIND)
            return 0;
        if (rejection != 0 || (failingNth > 0 && allocated >= failingNth)) {
            check(rejection != 0 ? status == rejection && allocated == 0 : status == VM_STATUS_OUT_OF_MEMORY,
                  "the documented rejection allocating nothing, or 5 for a failing allocation", status);
            check((flags & kNullFitted) != 0 || rejection == VM_STATUS_UNKNOWN_INPUT_KIND ||
                      rejection == VM_STATUS_UNKNOWN_MODEL || fitted == nullptr,
                  "no model after a failed fit", status);
            return 0;
        }
        check(status == VM_STATUS_OK && fitted != nullptr, "a valid block fits a model", status);
        keptModel = fitted, keptFit = fit;
        static const bool registered = std::atexit([] { DestroyPrintModel(keptModel); }) == 0;
        check(registered, "clean-up registered", status);
    }

    const char* name = nullptr;
    const double* levels = nullptr;
    int valueCount = -1, levelCount = -1;
    check(DescribePrintModel(keptModel, &name, &valueCount, &levels, &levelCount) == 0 && name && valueCount > 0,
          "a model describes itself", -1);
    for (int i = -1; i <= valueCount; ++i) {
        const char *valueName = nullptr, *text = nullptr;
        const int status = GetPrintModelValue(keptModel, i, &valueName, nullptr, nullptr, &text);
        check(i >= 0 && i < valueCount ? status == 0 && valueName && text : status == VM_STATUS_INVALID_ARGUMENT,
              "fitted values by index", status);
    }
    bool predicted = true;
    for (double c : cmyk)
        predicted = predicted && c >= 0.0 && c <= 100.0 &&
                    (levelCount == 0 || std::find(levels, levels + levelCount, c) != levels + levelCount);
    // Every output starts as a signalling NaN, which no arithmetic produces.
    const std::uint64_t sentinel = 0x7ff4000000dead00;
    const std::size_t n = cmyk.size() / 4;
    std::vector<std::uint64_t> out(n * 42, sentinel);
    double* const arrays[3] = {reinterpret_cast<double*>(out.data()), reinterpret_cast<double*>(out.data() + n * 36),
                               reinterpret_cast<double*>(out.data() + n * 39)};
    const int status = PredictPrintModel(keptModel, static_cast<int>(n), cmyk.data(),
                                         (flags & kNullSpectra) ? nullptr : arrays[0],
                                         (flags & kNullXYZ) ? nullptr : arrays[1], (flags & kNullLab) ? nullptr : arrays[2]);
    check(status == (predicted ? VM_STATUS_OK : VM_STATUS_COVERAGE_NOT_PREDICTED), "a prediction's status", status);
    const std::size_t filled = predicted ? n * (((flags & kNullSpectra) ? 0 : 36) + ((flags & kNullXYZ) ? 0 : 3) +
                                                ((flags & kNullLab) ? 0 : 3))
                                         : 0;
    check(static_cast<std::size_t>(out.size() - std::count(out.begin(), out.end(), sentinel)) == filled,
          "the requested arrays filled, or nothing written on a refusal", status);
    return 0;
}
