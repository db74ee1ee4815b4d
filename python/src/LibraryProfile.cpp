// Profile handle and the library's statuses.
#include "LibraryProfile.h"

#include "ToolError.h"

namespace veltmarquist::python {

LibraryProfile::LibraryProfile(const std::string& name) : handle_(CreateMathProfile(name.c_str()))
{
    if (handle_ == nullptr)
        throw ToolError(Failure::Calculation, "the library could not create a profile");
}

LibraryProfile::~LibraryProfile()
{
    DestroyMathProfile(handle_);
}

void LibraryProfile::calculate(PrintProcess process, const AtomicFile& output, MeasurementBlock& block)
{
    if (handle_ == nullptr)
        throw ToolError(Failure::Calculation, "the profile is gone after an earlier failure; start again");
    const int status = CalculateChart(handle_, process, output.temporaryPath().c_str(), block.ints.data(),
                                      block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
    if (status == VM_STATUS_FILE_NOT_OPENED || status == VM_STATUS_CALCULATION_FAILED)
        handle_ = nullptr;
    if (status == VM_STATUS_OK)
        return output.checkLibraryChart();
    if (status == VM_STATUS_FILE_NOT_OPENED)
        throw ToolError(Failure::OutputUnwritable, "the library could not open the chart file");
    throw ToolError(Failure::Calculation, status == VM_STATUS_OUT_OF_MEMORY ? "the library ran out of memory (status 5)"
                                          : status == VM_STATUS_CALCULATION_FAILED
                                              ? "the calculation failed (status 3)"
                                              : "the library rejected the measurement block (status " +
                                                    std::to_string(status) + ")");
}

} // namespace veltmarquist::python
