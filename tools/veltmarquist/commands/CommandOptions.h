// Options that several commands take, declared and read in one place: the
// reflectance scale, the print model, output paths and the ink limit.
#ifndef VELTMARQUIST_TOOL_COMMANDOPTIONS_H
#define VELTMARQUIST_TOOL_COMMANDOPTIONS_H

#include "MeasurementFile.h"
#include "ModelChoice.h"
#include "results/Results.h"

#include <CLI/CLI.hpp>

#include <functional>
#include <optional>
#include <ostream>
#include <string>
#include <type_traits>

namespace veltmarquist {

// --scale auto|1|100
struct ScaleOption {
    std::string scale = "auto";
    void add(CLI::App& command);
    ReadOptions readOptions() const;
};

// How a command reports: the text report (default), --json one JSON object
// for scripts (JsonReport.h), -q nothing but errors, -v the text report and
// every fitted value of the model in full.
struct ReportStyle {
    bool json = false, quiet = false, verbose = false;
    void add(CLI::App& command);

    template <typename Result>
    using Render = void (*)(const Result&, std::ostream&);
    // The renderer the options choose among a command's text and JSON ones.
    template <typename Result>
    std::function<void(const Result&, std::ostream&)> pick(Render<Result> text, Render<Result> asJson) const
    {
        if (json)
            return asJson;
        if (quiet)
            return [](const Result&, std::ostream&) {};
        if constexpr (std::is_base_of_v<FormAndModel, Result>)
            if (verbose)
                return [text](const Result& result, std::ostream& out) {
                    text(result, out);
                    printFittedValues(result, out);
                };
        return text;
    }
};
// Every fitted value of the model, one per line (for -v).
void printFittedValues(const FormAndModel& result, std::ostream& out);

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
