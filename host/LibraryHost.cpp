// Profile handle and status mapping.
#include "LibraryHost.h"

#include "Failure.h"

#include <exception>

namespace veltmarquist {

Profile::Profile(const std::string& name) : handle_(CreateMathProfile(name.c_str()))
{
    if (handle_ == nullptr)
        throw HostError(Failure::Calculation, "the library could not create a profile");
}

Profile::~Profile()
{
    DestroyMathProfile(handle_);
}

MathProfile& Profile::object()
{
    if (handle_ == nullptr)
        throw HostError(Failure::Internal, "the profile is gone");
    return *static_cast<MathProfile*>(handle_);
}

void Profile::calculate(PrintProcess process, const PendingOutput& output, MeasurementBlock& block)
{
    if (handle_ == nullptr)
        throw HostError(Failure::Internal, "the profile is gone");
    const int status = CalculateChart(handle_, process, output.temporaryPath().c_str(), block.ints.data(),
                                      block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
    if (status == VM_STATUS_FILE_NOT_OPENED || status == VM_STATUS_CALCULATION_FAILED)
        handle_ = nullptr; // the library has destroyed the profile
    switch (status) {
    case VM_STATUS_OK:
        output.checkChart();
        return;
    case VM_STATUS_FILE_NOT_OPENED:
        throw HostError(Failure::OutputUnwritable, output.name() + ": the library could not open the chart file");
    case VM_STATUS_OUT_OF_MEMORY:
        throw HostError(Failure::Calculation, "the library ran out of memory (status 5)");
    case VM_STATUS_CALCULATION_FAILED:
        throw HostError(Failure::Calculation, "the calculation failed (status 3)");
    default:
        throw HostError(Failure::Calculation,
                        "the library rejected the measurement block (status " + std::to_string(status) + ")");
    }
}

void Profile::run(const std::string& what, const std::function<void(MathProfile&)>& method)
{
    try {
        method(object());
    } catch (const HostError&) {
        throw;
    } catch (const Exceptions& failure) {
        if (failure.code == 1)
            throw HostError(Failure::OutputUnwritable, what + ": the library could not open the chart file");
        throw HostError(Failure::Calculation, what + " failed (library code " + std::to_string(failure.code) + ")");
    } catch (const std::exception& failure) {
        throw HostError(Failure::Calculation, what + " failed: " + failure.what());
    }
}

} // namespace veltmarquist
