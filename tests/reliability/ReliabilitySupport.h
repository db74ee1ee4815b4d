// Helpers of the reliability tests: calls through the C entry point with any
// argument, a snapshot of everything a profile keeps between calls, and the
// shape of a written chart.
#ifndef VELTMARQUIST_RELIABILITYSUPPORT_H
#define VELTMARQUIST_RELIABILITYSUPPORT_H

#include "TestSupport.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace reliability {

using testsupport::MeasurementBlock;

// CalculateChart with a plain int as process and the block's own layout.
int calculate(void* profile, int process, const std::string& path, MeasurementBlock& block);

// Everything a profile carries from one call to the next, byte for byte.
struct ProfileState {
    std::vector<unsigned char> bytes;
    bool operator==(const ProfileState& other) const { return bytes == other.bytes; }
};
ProfileState stateOf(const void* profile);

// The host's separations of the extended set (golden file), written into the
// exchange records of `block`.
void putSeparations(MeasurementBlock& block);

// A profile that holds the tone ramps of a six-colour chart, as process 6
// needs; its chart goes to `path`.
void* primedProfile(const std::string& path);

// Data lines between BEGIN_DATA and END_DATA of a chart, or -1 when the chart
// does not end with "END_DATA" and a line feed (an incomplete file).
int dataLines(const std::string& chart);

// The first valid call on a profile in each family, with its reference chart
// (the bytes a fresh profile writes):
//   process 7 on the conversion chart, cheap, reads no profile state;
//   process 1 on the test form, reads the tint lists, slots and gravure factors;
//   process 6 with the golden separations, reads the ramps of a preceding 3.
enum class FollowUp { ChartCopy, Gravure, SeparatedSet };
// The chart goes to `path`.
::testing::AssertionResult servesFollowUp(void* profile, FollowUp followUp, const std::string& path);

} // namespace reliability

#endif // VELTMARQUIST_RELIABILITYSUPPORT_H
