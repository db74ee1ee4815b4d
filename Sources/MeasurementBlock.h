// The host's measurement block: its validation and its conversion into one
// 36-band row per patch (380 to 730 nm, reflectance 0..1), shared by every
// entry point that takes a block. Internal to the library; defined in
// VeltmarquistDLL.cpp.
#ifndef VELTMARQUIST_MEASUREMENTBLOCK_H
#define VELTMARQUIST_MEASUREMENTBLOCK_H

namespace measurementblock {

const int kRowTableSize = 2000;

// Value of the 36-band position `band` from 16 values at 400, 420, ..., 700 nm
// (MathProfile::InterpolateSpectralValue).
double interpolateSixteen(int band, const double* values);

// How the host describes its block (the arguments of CalculateChart).
struct Layout {
    int inputKind, firstWavelength, valuesPerPatch, count;
};

// True when `measurements` is not null and the layout is one the library
// reads with at least `patchesRead` patches (the rules of status 4 in
// VeltmarquistDLL.h). The input kind itself must already be 10 or 20.
bool blockValid(const int* measurements, const Layout& layout, int patchesRead);

// The scratch buffers of one call, released on every path.
struct Rows {
    double* channelMatrix = nullptr;     // 7 values per patch, filled by the conversions
    double* rows[kRowTableSize] = {};    // rows 0..count-1; the rest stay null
    double* patchMatrix = nullptr;       // the converted values, 100 per patch

    Rows() = default;
    Rows(const Rows&) = delete;
    Rows& operator=(const Rows&) = delete;
    ~Rows();
};

// Allocates the buffers through the scratch allocator and fills the rows of a
// valid block. Returns VM_STATUS_OK, or VM_STATUS_OUT_OF_MEMORY when a buffer
// cannot be allocated.
int marshal(const int* measurements, const Layout& layout, Rows& rows);

} // namespace measurementblock

#endif // VELTMARQUIST_MEASUREMENTBLOCK_H
