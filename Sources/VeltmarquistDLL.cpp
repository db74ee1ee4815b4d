// The library's entry points and the life of a profile.
//
// CalculateChart turns the host's integers (reflectance x 1000) into one
// 36-band row per patch, 380 to 730 nm (MeasurementBlock.cpp, which
// FitPrintModel shares), runs the calculation that the process selects, and
// turns every exception into a status: no exception crosses the C boundary.
#include "Colorimetry.h"
#include "MathProfile.h"
#include "MeasurementBlock.h"
#include "VeltmarquistDLL.h"

#include <cstring>
#include <new>

// ---- Profile object --------------------------------------------------------

MathProfile::MathProfile(const char* name)
{
    std::memset(patchSlots, 0, sizeof patchSlots);
    inkOrder = 2;
    rgbFactor[0] = 0.9;
    rgbFactor[1] = 0.85;
    rgbFactor[2] = 0.85;
    normFactor = colorimetry::defaultNormFactor();
    for (double& factor : grayDiffFactor)
        factor = 0.0;
    coverageLimit = 200.0;
    // Longer names are cut to the 1023 characters that fit.
    std::memset(profileName, 0, sizeof profileName);
    if (name != nullptr)
        std::strncpy(profileName, name, sizeof profileName - 1);
}

MathProfile::~MathProfile() = default;

double MathProfile::InterpolateSpectralValue(int band, double* values)
{
    return measurementblock::interpolateSixteen(band, values);
}


namespace {

// Patches the calculation of `process` reads.
int patchesRead(int process)
{
    switch (process) {
    case VM_PROCESS_SIX_COLOUR: return 10;
    case VM_PROCESS_SEVEN_COLOUR: return 11;
    case VM_PROCESS_SEPARATED_SET: return 1;
    case VM_PROCESS_CHART_COPY:
    case VM_PROCESS_CHART_CONVERT:
    case VM_PROCESS_CHART_BLEND: return 2; // the two reference whites
    default: return 46;                    // the four-colour test form
    }
}

bool measurementBlockValid(const MathProfile* profile, PrintProcess process, const char* path,
                           const int* measurements, const measurementblock::Layout& layout)
{
    if (profile == nullptr || path == nullptr)
        return false;
    if (!measurementblock::blockValid(measurements, layout, patchesRead(process)))
        return false;
    if (process == VM_PROCESS_SEPARATED_SET)
        for (const auto& list : profile->tintLists)
            if (list.empty())
                return false; // no tone ramps of a preceding process 3 or 5
    return true;
}

int runCalculation(MathProfile* profile, PrintProcess process, const char* path, int* measurements,
                   const measurementblock::Layout& layout)
{
    measurementblock::Rows buffers;
    if (const int status = measurementblock::marshal(measurements, layout, buffers))
        return status;
    const int count = layout.count;
    if (process == VM_PROCESS_CHART_COPY || process == VM_PROCESS_CHART_CONVERT || process == VM_PROCESS_CHART_BLEND)
        for (int i = 0; i < count; ++i)
            for (int k = 0; k < 7; ++k)
                buffers.channelMatrix[7 * i + k] = measurements[count * layout.valuesPerPatch + 7 * i + k];

    switch (process) {
    case VM_PROCESS_GRAVURE:
        profile->calculateChart(buffers.rows, VM_PROCESS_GRAVURE, path);
        break;
    case VM_PROCESS_SIX_COLOUR:
    case VM_PROCESS_SEVEN_COLOUR:
    case VM_PROCESS_SEPARATED_SET:
        profile->calculateChartMCH(buffers.rows, process, path, measurements);
        break;
    case VM_PROCESS_CHART_COPY:
    case VM_PROCESS_CHART_CONVERT:
    case VM_PROCESS_CHART_BLEND:
        profile->convertChart(buffers.rows, count, path, buffers.channelMatrix, process);
        break;
    default: // 0, 2, 4 and every value outside 0..9
        profile->calculateGrayDiffFactor(buffers.rows);
        profile->calculateChart(buffers.rows, VM_PROCESS_OFFSET, path);
        break;
    }
    return VM_STATUS_OK;
}

} // namespace

// ---- Entry points --------------------------------------------------------------

extern "C" {

void* CreateMathProfile(const char* name)
{
    try {
        return new MathProfile(name);
    } catch (...) {
        return nullptr;
    }
}

int CalculateChart(void* profile, PrintProcess process, const char* path, int* measurements, int inputKind,
                   int firstWavelength, int valuesPerPatch, int count)
{
    if (inputKind != VM_INPUT_10NM && inputKind != VM_INPUT_16BAND)
        return VM_STATUS_UNKNOWN_INPUT_KIND;
    MathProfile* object = static_cast<MathProfile*>(profile);
    const measurementblock::Layout layout{inputKind, firstWavelength, valuesPerPatch, count};
    if (!measurementBlockValid(object, process, path, measurements, layout))
        return VM_STATUS_INVALID_MEASUREMENTS;
    try {
        return runCalculation(object, process, path, measurements, layout);
    } catch (const Exceptions& failure) {
        delete object;
        return failure.code;
    } catch (...) {
        delete object;
        return VM_STATUS_CALCULATION_FAILED;
    }
}

void DestroyMathProfile(void* profile)
{
    delete static_cast<MathProfile*>(profile);
}

} // extern "C"
