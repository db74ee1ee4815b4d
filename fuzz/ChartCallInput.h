// The byte layout of one input of the CalculateChart fuzzer: up to three
// calls on one profile, each with its own arguments, then a pool of 32-bit
// values that fills every call's measurement block (repeated as needed).
//
//   byte 0            number of calls - 1 (modulo 3)
//   11 bytes per call process, kind, first wavelength (int16), values per
//                     patch (int8), count (int16), flags, failing allocation,
//                     value scale, extremes
//   rest              the value pool, int32 little-endian
//
// Random bytes decode to mostly small, plausible arguments; the extremes byte
// swaps any of wavelength, values per patch and count for INT_MIN or INT_MAX.
#ifndef VELTMARQUIST_FUZZ_CHARTCALLINPUT_H
#define VELTMARQUIST_FUZZ_CHARTCALLINPUT_H

#include <climits>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace chartfuzz {

enum Flags : std::uint8_t {
    kNullProfile = 1,
    kNullPath = 2,
    kNullMeasurements = 4,
    kPathMask = 0x18,        // 0, 1: a new file; 2: in a missing folder; 3: an existing folder
    kFailAllocation = 0x20,  // the failing-allocation byte picks which one
};
enum PathKind { kNewFile = 0, kMissingFolder = 2, kFolder = 3 };

const int kProcesses[16] = {1, 3, 5, 6, 7, 8, 9, 0, 2, 4, -1, 10, INT_MIN, INT_MAX, 8, 7};
const int kKinds[8] = {10, 20, 10, 20, 15, 0, INT_MIN, INT_MAX};
const int kScales[8] = {1, 1, 1, 100, 7, 1000, 65537, -1};

struct Call {
    int process = 0;
    int inputKind = 10;
    int firstWavelength = 380;
    int valuesPerPatch = 36;
    int count = 0;
    std::uint8_t flags = 0;
    int failingAllocation = 0; // 0: none fails; else the n-th (1-based)
    int scale = 1;

    int pathKind() const { return (flags & kPathMask) >> 3; }
};

struct Input {
    std::vector<Call> calls;
    std::vector<std::int32_t> pool;
};

inline Input decode(const std::uint8_t* data, std::size_t size)
{
    Input input;
    std::size_t at = 0;
    auto byte = [&]() -> std::uint8_t { return at < size ? data[at++] : 0; };
    auto int16 = [&]() -> int {
        const unsigned low = byte(), high = byte();
        return static_cast<std::int16_t>(static_cast<std::uint16_t>(low | high << 8));
    };
    const int calls = 1 + byte() % 3;
    for (int c = 0; c < calls; ++c) {
        Call call;
        call.process = kProcesses[byte() % 16];
        call.inputKind = kKinds[byte() % 8];
        call.firstWavelength = int16();
        call.valuesPerPatch = static_cast<std::int8_t>(byte());
        call.count = int16() % 2100;
        call.flags = byte();
        // 1 to 128 one by one, then in steps of 15 up to the largest row table.
        const int failing = byte();
        const int nth = failing < 128 ? 1 + failing : 129 + (failing - 128) * 15;
        call.failingAllocation = (call.flags & kFailAllocation) != 0 ? nth : 0;
        call.scale = kScales[byte() % 8];
        const std::uint8_t extremes = byte();
        if (extremes & 1)
            call.firstWavelength = extremes & 8 ? INT_MAX : INT_MIN;
        if (extremes & 2)
            call.valuesPerPatch = extremes & 16 ? INT_MAX : INT_MIN;
        if (extremes & 4)
            call.count = extremes & 32 ? INT_MAX : INT_MIN;
        input.calls.push_back(call);
    }
    while (at + 4 <= size) {
        const std::uint32_t value = static_cast<std::uint32_t>(data[at]) | static_cast<std::uint32_t>(data[at + 1]) << 8 |
                                    static_cast<std::uint32_t>(data[at + 2]) << 16 |
                                    static_cast<std::uint32_t>(data[at + 3]) << 24;
        input.pool.push_back(static_cast<std::int32_t>(value));
        at += 4;
    }
    return input;
}

// The inverse for plain calls (no extremes, failing allocation 1 to 128),
// used to write seeds.
inline std::vector<std::uint8_t> encode(const std::vector<Call>& calls, const std::vector<std::int32_t>& pool)
{
    std::vector<std::uint8_t> bytes;
    auto indexOf = [](const int* table, int n, int value) {
        for (int i = 0; i < n; ++i)
            if (table[i] == value)
                return static_cast<std::uint8_t>(i);
        return static_cast<std::uint8_t>(0);
    };
    auto int16 = [&](int value) {
        bytes.push_back(static_cast<std::uint8_t>(value & 0xff));
        bytes.push_back(static_cast<std::uint8_t>((value >> 8) & 0xff));
    };
    bytes.push_back(static_cast<std::uint8_t>(calls.size() - 1));
    for (const Call& call : calls) {
        bytes.push_back(indexOf(kProcesses, 16, call.process));
        bytes.push_back(indexOf(kKinds, 8, call.inputKind));
        int16(call.firstWavelength);
        bytes.push_back(static_cast<std::uint8_t>(call.valuesPerPatch));
        int16(call.count);
        bytes.push_back(call.flags);
        bytes.push_back(static_cast<std::uint8_t>(call.failingAllocation > 0 ? (call.failingAllocation - 1) & 0x7f : 0));
        bytes.push_back(indexOf(kScales, 8, call.scale));
        bytes.push_back(0);
    }
    for (std::int32_t value : pool)
        for (int shift = 0; shift < 32; shift += 8)
            bytes.push_back(static_cast<std::uint8_t>(static_cast<std::uint32_t>(value) >> shift));
    return bytes;
}

} // namespace chartfuzz

#endif // VELTMARQUIST_FUZZ_CHARTCALLINPUT_H
