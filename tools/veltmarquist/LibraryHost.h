// The tool's side of the library: one profile handle with its life cycle,
// library statuses turned into tool errors, and the colour arithmetic the
// reports need (CIELAB, CIE 1976 and CIEDE2000 differences, summaries).
#ifndef VELTMARQUIST_TOOL_LIBRARYHOST_H
#define VELTMARQUIST_TOOL_LIBRARYHOST_H

#include "Files.h"
#include "OutputFile.h"
#include "PatchMatching.h"

#include "MathProfile.h"
#include "VeltmarquistDLL.h"

#include <array>
#include <functional>
#include <string>
#include <vector>

namespace veltmarquist {

// A profile made by CreateMathProfile. The library destroys the profile
// itself after statuses 1 and 3; the handle knows and never destroys it twice.
class Profile {
public:
    explicit Profile(const std::string& name);
    ~Profile();
    Profile(const Profile&) = delete;
    Profile& operator=(const Profile&) = delete;

    // The object behind the handle, for the class methods that no entry
    // point reaches and for the fitted values.
    MathProfile& object();

    // CalculateChart into the output's temporary file; a status other than
    // 0 becomes a ToolError, and the chart is checked (complete, finite).
    void calculate(PrintProcess process, const PendingOutput& output, MeasurementBlock& block);

    // Runs a class method; the library's exceptions become ToolErrors.
    void run(const std::string& what, const std::function<void(MathProfile&)>& method);

private:
    void* handle_;
};

struct Lab {
    double L, a, b;
};

// CIELAB (D50) of X, Y, Z on the 0..100 scale.
Lab labOfXYZ(const std::array<double, 3>& XYZ);
double deltaEab(const Lab& first, const Lab& second);
double deltaE2000(const Lab& first, const Lab& second);

// X, Y, Z (D50, 2 degree, 0..100) of a 36-band spectrum, with Y limited to
// 100 the way the charts limit it.
std::array<double, 3> XYZOfBands(const std::vector<double>& bands);

struct Summary {
    size_t count = 0;
    double mean = 0.0;
    double p95 = 0.0; // 95th percentile, linear between ranks
    double max = 0.0;
};
Summary summarise(std::vector<double> values);

// "%.2f" without locale surprises.
std::string fixed(double value, int decimals = 2);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_LIBRARYHOST_H
