// Profile handle, status mapping and colour differences.
#include "LibraryHost.h"

#include "ToolError.h"

#include <lcms2.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <exception>

namespace veltmarquist {

Profile::Profile(const std::string& name) : handle_(CreateMathProfile(name.c_str()))
{
    if (handle_ == nullptr)
        throw ToolError(Failure::Calculation, "the library could not create a profile");
}

Profile::~Profile()
{
    DestroyMathProfile(handle_);
}

MathProfile& Profile::object()
{
    if (handle_ == nullptr)
        throw ToolError(Failure::Internal, "the profile is gone");
    return *static_cast<MathProfile*>(handle_);
}

void Profile::calculate(PrintProcess process, const PendingOutput& output, MeasurementBlock& block)
{
    if (handle_ == nullptr)
        throw ToolError(Failure::Internal, "the profile is gone");
    const int status = CalculateChart(handle_, process, output.temporaryPath().c_str(), block.ints.data(),
                                      block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
    if (status == VM_STATUS_FILE_NOT_OPENED || status == VM_STATUS_CALCULATION_FAILED)
        handle_ = nullptr; // the library has destroyed the profile
    switch (status) {
    case VM_STATUS_OK:
        output.checkChart();
        return;
    case VM_STATUS_FILE_NOT_OPENED:
        throw ToolError(Failure::OutputUnwritable, output.name() + ": the library could not open the chart file");
    case VM_STATUS_OUT_OF_MEMORY:
        throw ToolError(Failure::Calculation, "the library ran out of memory (status 5)");
    case VM_STATUS_CALCULATION_FAILED:
        throw ToolError(Failure::Calculation, "the calculation failed (status 3)");
    default:
        throw ToolError(Failure::Calculation,
                        "the library rejected the measurement block (status " + std::to_string(status) + ")");
    }
}

void Profile::run(const std::string& what, const std::function<void(MathProfile&)>& method)
{
    try {
        method(object());
    } catch (const ToolError&) {
        throw;
    } catch (const Exceptions& failure) {
        if (failure.code == 1)
            throw ToolError(Failure::OutputUnwritable, what + ": the library could not open the chart file");
        throw ToolError(Failure::Calculation, what + " failed (library code " + std::to_string(failure.code) + ")");
    } catch (const std::exception& failure) {
        throw ToolError(Failure::Calculation, what + " failed: " + failure.what());
    }
}

// ---- Colour ---------------------------------------------------------------------------------

Lab labOfXYZ(const std::array<double, 3>& XYZ)
{
    const cmsCIEXYZ xyz{XYZ[0] / 100.0, XYZ[1] / 100.0, XYZ[2] / 100.0};
    cmsCIELab lab;
    cmsXYZ2Lab(cmsD50_XYZ(), &lab, &xyz);
    return Lab{lab.L, lab.a, lab.b};
}

double deltaEab(const Lab& first, const Lab& second)
{
    const cmsCIELab a{first.L, first.a, first.b}, b{second.L, second.a, second.b};
    return cmsDeltaE(&a, &b);
}

double deltaE2000(const Lab& first, const Lab& second)
{
    const cmsCIELab a{first.L, first.a, first.b}, b{second.L, second.a, second.b};
    return cmsCIE2000DeltaE(&a, &b, 1.0, 1.0, 1.0);
}

std::array<double, 3> XYZOfBands(const std::vector<double>& bands)
{
    MathProfile colorimetry("colorimetry");
    MathProfile::ColorPatch patch;
    std::memset(&patch, 0, sizeof patch);
    std::copy(bands.begin(), bands.begin() + MathProfile::kBands, patch.spectrum);
    colorimetry.spec2XYZ(&patch);
    std::array<double, 3> XYZ{patch.XYZ[0], patch.XYZ[1], patch.XYZ[2]};
    if (XYZ[1] > 100.0) {
        XYZ[0] = XYZ[0] * 100.0 / XYZ[1];
        XYZ[2] = XYZ[2] * 100.0 / XYZ[1];
        XYZ[1] = 100.0;
    }
    return XYZ;
}

Summary summarise(std::vector<double> values)
{
    Summary summary;
    summary.count = values.size();
    if (values.empty())
        return summary;
    std::sort(values.begin(), values.end());
    double sum = 0.0;
    for (double value : values)
        sum += value;
    summary.mean = sum / static_cast<double>(values.size());
    summary.max = values.back();
    const double rank = 0.95 * static_cast<double>(values.size() - 1);
    const size_t below = static_cast<size_t>(rank);
    const size_t above = std::min(below + 1, values.size() - 1);
    summary.p95 = values[below] + (rank - static_cast<double>(below)) * (values[above] - values[below]);
    return summary;
}

std::string fixed(double value, int decimals)
{
    char text[64];
    std::snprintf(text, sizeof text, "%.*f", decimals, value);
    return text;
}

} // namespace veltmarquist
