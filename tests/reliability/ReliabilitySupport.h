// Helpers of the reliability tests: calls through the C entry point, the
// host's separations, complete charts, and a failing scratch allocator.
#ifndef VELTMARQUIST_RELIABILITYSUPPORT_H
#define VELTMARQUIST_RELIABILITYSUPPORT_H

#include "ScratchAllocation.h"
#include "TestSupport.h"

#include <algorithm>
#include <cstdlib>
#include <sstream>
#include <stdexcept>
#include <string>

namespace reliability {

using namespace testsupport;

inline int calculate(void* profile, int process, const std::string& path, MeasurementBlock& block)
{
    return CalculateChart(profile, static_cast<PrintProcess>(process), path.c_str(), block.ints.data(),
                          block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
}

// A golden input whose exchange records hold the host's golden separations.
inline MeasurementBlock withSeparations(const std::string& input)
{
    MeasurementBlock block = readGoldenInput(input);
    std::istringstream in(readFile(goldenPath("multichannel.separations")));
    for (int i = 0; i < VM_EXCHANGE_BUFFER_INTS; ++i)
        in >> block.ints[static_cast<size_t>(i)];
    if (!in)
        throw std::runtime_error("malformed golden separations");
    return block;
}

// A profile holding the tone ramps of the golden six-colour chart.
inline void* primedProfile(const TempDir& dir)
{
    MeasurementBlock block = readGoldenInput("multichannel.in");
    void* profile = CreateMathProfile("primed");
    if (calculate(profile, VM_PROCESS_SIX_COLOUR, dir.path("primed.txt"), block) != VM_STATUS_OK)
        throw std::runtime_error("process 3 on the golden multi-channel form failed");
    return profile;
}

// Data lines of a chart ending with "END_DATA" and a line feed; -1 otherwise.
inline int dataLines(const std::string& chart)
{
    const size_t data = chart.find("BEGIN_DATA\n");
    if (data == std::string::npos || chart.rfind("END_DATA\n") + 9 != chart.size())
        return -1;
    return static_cast<int>(std::count(chart.begin() + static_cast<long>(data), chart.end(), '\n')) - 2;
}

// While it lives, the scratch allocator counts the buffers and fails the
// nth (none for 0).
class FailingAllocation {
public:
    explicit FailingAllocation(int nth) : previous_(scratch::setAllocator(allocate)) { seen_ = 0, nth_ = nth; }
    ~FailingAllocation() { scratch::setAllocator(previous_); }
    static int seen() { return seen_; }

private:
    static void* allocate(std::size_t count, std::size_t size)
    {
        return ++seen_ == nth_ ? nullptr : std::calloc(count, size);
    }
    static inline int seen_ = 0, nth_ = 0;
    scratch::Allocator previous_;
};

} // namespace reliability

#endif // VELTMARQUIST_RELIABILITYSUPPORT_H
