// The tool's side of the library's profiles: one profile handle with its
// life cycle, and library statuses and exceptions turned into tool errors.
#ifndef VELTMARQUIST_TOOL_LIBRARYHOST_H
#define VELTMARQUIST_TOOL_LIBRARYHOST_H

#include "LibraryBlock.h"
#include "OutputFile.h"

#include "MathProfile.h"
#include "VeltmarquistDLL.h"

#include <functional>
#include <string>

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
    // 0 becomes a HostError, and the chart is checked (complete, finite).
    void calculate(PrintProcess process, const PendingOutput& output, MeasurementBlock& block);

    // Runs a class method; the library's exceptions become HostErrors.
    void run(const std::string& what, const std::function<void(MathProfile&)>& method);

private:
    void* handle_;
};

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_LIBRARYHOST_H
