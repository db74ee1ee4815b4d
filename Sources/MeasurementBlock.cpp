// The host's measurement block: validation, band placement and the rows of
// one call.
#include "MeasurementBlock.h"

#include "MathProfile.h"
#include "ScratchAllocation.h"
#include "VeltmarquistDLL.h"

#include <algorithm>
#include <cstdlib>

namespace measurementblock {

// Value of the 36-band position `band` from 16 values at 400, 420, ..., 700 nm:
// 380-410 nm take the 420 nm value (values[0] is never used), 710-730 nm the
// 700 nm value; odd positions in between the mean of their neighbours.
double interpolateSixteen(int band, const double* values)
{
    if (band < 4)
        return values[1];
    if (band >= 33)
        return values[15];
    const int h = band / 2;
    if (band % 2 == 0)
        return values[h - 1];
    return (values[h - 1] + values[h]) * 0.5;
}

namespace {

const int kMaxPatches = 1999;
const int kPatchStride = 100;

// Band placement of kind-10 input: d = F / 10 - 38 bands lie below 380 nm
// (or, for F > 380, missing in front of the first measured band).
struct Placement {
    int offset; // min(|d|, 99)
    int copied; // min(N - |d|, 36): bands that land at their own wavelength
};

Placement placementOf(int firstWavelength, int valuesPerPatch)
{
    const int s = std::abs(firstWavelength / 10 - 38);
    return Placement{std::min(s, 99), std::min(valuesPerPatch - s, 36)};
}

// Places the bands of one converted patch (100 doubles) into its 36-band row.
void placeBands(const double* p, double* row, int firstWavelength, int valuesPerPatch, Placement placement)
{
    if (firstWavelength <= 380) {
        // Bands below 380 nm are skipped; positions past the last band keep 0.
        for (int j = 0; j < placement.copied; ++j)
            row[j] = p[placement.offset + j];
        return;
    }
    // The first band starts above 380 nm: positions in front of it repeat the
    // first value, positions past the last band repeat the last value, then
    // the measured bands are copied.
    const int n = std::min(valuesPerPatch, 100);
    for (int j = 0; j < placement.offset; ++j)
        row[j] = p[0];
    if (n <= 35 && valuesPerPatch - placement.offset <= 35)
        for (int j = n; j < 36; ++j)
            row[j] = p[n - 1];
    for (int j = 0; j < placement.copied; ++j)
        row[placement.offset + j] = p[j];
}

} // namespace

bool blockValid(const int* measurements, const Layout& layout, int patchesRead)
{
    if (measurements == nullptr)
        return false;
    if (layout.count > kMaxPatches || layout.count < patchesRead)
        return false;
    const int F = layout.firstWavelength, N = layout.valuesPerPatch;
    if (layout.inputKind == VM_INPUT_16BAND)
        return N == 16;
    if (N < 1 || N > kPatchStride)
        return false;
    if (F > 380 && (F > 740 || N > 36))
        return false;
    return placementOf(F, N).copied >= 1;
}

Rows::~Rows()
{
    scratch::release(channelMatrix);
    for (double* row : rows)
        scratch::release(row);
    scratch::release(patchMatrix);
}

int marshal(const int* measurements, const Layout& layout, Rows& buffers)
{
    const int count = layout.count, valuesPerPatch = layout.valuesPerPatch;
    buffers.channelMatrix = static_cast<double*>(scratch::allocate(static_cast<size_t>(count) * 7, sizeof(double)));
    if (buffers.channelMatrix == nullptr)
        return VM_STATUS_OUT_OF_MEMORY;
    for (int i = 0; i < count; ++i) {
        buffers.rows[i] = static_cast<double*>(scratch::allocate(MathProfile::kBands, sizeof(double)));
        if (buffers.rows[i] == nullptr)
            return VM_STATUS_OUT_OF_MEMORY;
    }
    buffers.patchMatrix =
        static_cast<double*>(scratch::allocate(static_cast<size_t>(count) * kPatchStride, sizeof(double)));
    if (buffers.patchMatrix == nullptr)
        return VM_STATUS_OUT_OF_MEMORY;

    // Convert to reflectance factors (0..1).
    if (layout.inputKind == VM_INPUT_10NM) {
        for (int i = 0; i < count; ++i)
            for (int j = 0; j < valuesPerPatch; ++j)
                buffers.patchMatrix[i * kPatchStride + j] = measurements[i * valuesPerPatch + j] / 1000.0;
    } else {
        double sixteen[16] = {};
        for (int i = 0; i < count; ++i) {
            for (int j = 0; j < valuesPerPatch; ++j)
                sixteen[j] = measurements[i * valuesPerPatch + j] / 1000.0;
            for (int b = 0; b < MathProfile::kBands; ++b)
                buffers.patchMatrix[i * kPatchStride + b] = interpolateSixteen(b, sixteen);
        }
    }
    // Widened 16-band patches are placed as 36 bands from 380 nm; the host's
    // channel values still stand behind its own 16-value patches.
    const int placedFirst = layout.inputKind == VM_INPUT_16BAND ? 380 : layout.firstWavelength;
    const int placedBands = layout.inputKind == VM_INPUT_16BAND ? 36 : valuesPerPatch;
    const Placement placement = placementOf(placedFirst, placedBands);
    for (int i = 0; i < count; ++i)
        placeBands(buffers.patchMatrix + i * kPatchStride, buffers.rows[i], placedFirst, placedBands, placement);
    return VM_STATUS_OK;
}

} // namespace measurementblock
