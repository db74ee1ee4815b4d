// The options several commands share.
#include "CommandOptions.h"

#include "ChartExport.h"
#include "Failure.h"
#include "Numbers.h"

#include <charconv>

namespace veltmarquist {

void ScaleOption::add(CLI::App& command)
{
    command
        .add_option("--scale", scale,
                    "reflectance scale of the input spectra: auto (decided from the paper and the bulk of the values), 1 or 100")
        ->check(CLI::IsMember({"auto", "1", "100"}))
        ->capture_default_str();
}

ReadOptions ScaleOption::readOptions() const
{
    ReadOptions options;
    options.scale = scale == "auto" ? 0.0 : scale == "1" ? 1.0 : 100.0;
    return options;
}

void ModelOption::add(CLI::App& command)
{
    modelOption_ = command
                       .add_option("--model", model_,
                                   "offset: the library's offset model, fitted to the greys; gravure: its gravure "
                                   "model; gravure-fitted: the gravure model with ink order and trapping fitted to "
                                   "red, green and blue; ynsn: the Yule-Nielsen spectral Neugebauer model, for any "
                                   "coverage (library: the library's model that --process names)")
                       ->check(CLI::IsMember({"offset", "gravure", "gravure-fitted", "ynsn", "library"}))
                       ->capture_default_str();
    processOption_ = command.add_option("--process", process_, "offset or gravure: as --model offset or gravure")
                         ->check(CLI::IsMember({"offset", "gravure"}));
    command.add_flag("--fit-gravure", fitGravure_, "as --model gravure-fitted");
}

ModelChoice ModelOption::choice() const
{
    const bool processGiven = processOption_->count() > 0;
    // Without --model, --process or --fit-gravure choose among the library's models; with none of
    // them the command's own default holds.
    const bool modelGiven = model_ != "library" && (modelOption_->count() > 0 || (!processGiven && !fitGravure_));
    if (!modelGiven) {
        if (fitGravure_ && processGiven && process_ == "offset")
            throw HostError(Failure::Usage, "--fit-gravure fits the gravure model; it cannot go with --process offset");
        return fitGravure_ ? ModelChoice::gravureFitted
                           : process_ == "gravure" ? ModelChoice::gravure : ModelChoice::offset;
    }
    ModelChoice choice = *modelChoiceNamed(model_);
    const bool library = choice != ModelChoice::yuleNielsen;
    const bool gravure = choice == ModelChoice::gravure || choice == ModelChoice::gravureFitted;
    if (processGiven && (!library || (process_ == "gravure") != gravure))
        throw HostError(Failure::Usage, "--process " + process_ + " contradicts --model " + model_ +
                                            "; give --model alone");
    if (fitGravure_ && !gravure)
        throw HostError(Failure::Usage, "--fit-gravure fits the gravure model; it cannot go with --model " + model_);
    return fitGravure_ ? ModelChoice::gravureFitted : choice;
}

const CLI::Validator kPath(
    [](std::string& path) { return path.empty() ? std::string("an empty path names no file") : std::string(); },
    "PATH", "path");

namespace {

// A percentage as a press operator writes it: digits with at most one
// decimal point, no sign, exponent, hexadecimal or blank; nothing otherwise.
std::optional<double> decimalPercentage(const std::string& text)
{
    const bool decimal = !text.empty() && text.find_first_not_of("0123456789.") == std::string::npos &&
                         text.find('.') == text.rfind('.') && text.front() != '.' && text.back() != '.';
    double value = 0.0;
    if (!decimal || std::from_chars(text.data(), text.data() + text.size(), value).ec != std::errc())
        return std::nullopt;
    return value;
}

} // namespace

void addInkLimit(CLI::App& command, std::optional<double>& inkLimit, const std::string& help)
{
    const CLI::Validator percentage(
        [](std::string& text) {
            const std::optional<double> value = decimalPercentage(text);
            if (value && *value >= exporting::kMinInkLimit && *value <= exporting::kMaxInkLimit)
                return std::string();
            return "'" + text + "' is not a total ink limit: give a percentage from 100 to 400, such as 300";
        },
        "PERCENT");
    command
        .add_option_function<std::string>(
            "--ink-limit", [&inkLimit](const std::string& text) { inkLimit = decimalPercentage(text); }, help)
        ->check(percentage);
}

void ReportStyle::add(CLI::App& command)
{
    CLI::Option* asJson = command.add_flag("--json", json, "print one JSON object for scripts instead of the report");
    CLI::Option* silent = command.add_flag("-q,--quiet", quiet, "no report, only errors");
    command.add_flag("-v,--verbose", verbose, "also every fitted value of the model")->excludes(asJson)->excludes(silent);
    silent->excludes(asJson);
}

void printFittedValues(const FormAndModel& result, std::ostream& out)
{
    if (!result.fit)
        return;
    out << "fitted values:\n";
    for (const FittedValue& value : result.fit->model->fittedValues()) {
        out << "  " << value.name << ":";
        for (double number : value.numbers)
            out << " " << roundTripText(number);
        out << (value.text.empty() ? "" : " " + value.text) << "\n";
    }
}

} // namespace veltmarquist
