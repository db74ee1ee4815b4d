// Options that several commands take, declared and read in one place: the
// reflectance scale, the print model, output paths and the ink limit.
#ifndef VELTMARQUIST_TOOL_COMMANDOPTIONS_H
#define VELTMARQUIST_TOOL_COMMANDOPTIONS_H

#include "MeasurementFile.h"
#include "ModelChoice.h"

#include <CLI/CLI.hpp>

#include <optional>
#include <string>

namespace veltmarquist {

// --scale auto|1|100
struct ScaleOption {
    std::string scale = "auto";
    void add(CLI::App& command);
    ReadOptions readOptions() const;
};

// --model offset|gravure|gravure-fitted|ynsn, with the older spellings kept:
// --model library (the library's model that --process names), --process
// offset|gravure and --fit-gravure (gravure-fitted).
class ModelOption {
public:
    explicit ModelOption(ModelChoice fallback = ModelChoice::offset) : model_(nameOf(fallback)) {}
    void add(CLI::App& command);
    // The one choice the options make; Failure::Usage when they contradict
    // each other (--process gravure --model ynsn).
    ModelChoice choice() const;

private:
    std::string model_, process_ = "offset";
    bool fitGravure_ = false;
    CLI::Option *modelOption_ = nullptr, *processOption_ = nullptr;
};

// A path option must name a file: an empty one is refused as a usage error
// before anything is read or written.
extern const CLI::Validator kPath;

// --ink-limit PERCENT: a decimal percentage ("300", "287.5") within the
// export's range, anything else a usage error naming the option.
void addInkLimit(CLI::App& command, std::optional<double>& inkLimit, const std::string& help);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_COMMANDOPTIONS_H
