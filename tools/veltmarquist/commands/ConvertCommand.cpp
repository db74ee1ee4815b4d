// convert CHART: a measured chart copied, converted from one paper white to
// another, or blended (processes 7-9). The whites come from files of their
// own or from sample names inside the chart; the conversion's rules are the
// host's (ChartConversion.h).
#include "Commands.h"

#include "ChartConversion.h"
#include "CommandOptions.h"
#include "Failure.h"
#include "Files.h"
#include "LibraryBlock.h"
#include "MeasurementLoading.h"
#include "OutputFile.h"
#include "report/JsonReport.h"
#include "report/TextReport.h"

#include <sys/stat.h>

#include <cstdint>
#include <memory>

namespace veltmarquist {

namespace {

struct ConvertJob {
    std::string chart;
    std::string from, to; // a file with one spectrum, or a sample name in the chart
    std::string output;
    PrintProcess mode = VM_PROCESS_CHART_CONVERT;
    bool cmykOnly = false;
    ReadOptions read;
};

bool isRegularFile(const std::string& path)
{
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

struct White {
    std::string label;
    MeasurementFile file; // when read from a file of its own
    const MeasurementSet* set = nullptr;
    const SpectralLayout* layout = nullptr;
    std::vector<int> thousandths;
};

// A white given as a file with one measurement, or as a sample name inside
// the chart (SAMPLE_ID or SAMPLE_NAME).
void resolveWhite(const std::string& given, const char* option, const MeasurementFile& chart,
                  const std::string& chartPath, const ReadOptions& read, White& white,
                  std::vector<FileWarnings>& warnings)
{
    if (isRegularFile(given)) {
        white.file = loadMeasurementFile(given, read);
        warnings.push_back({given, white.file.warnings});
        if (white.file.sets.size() != 1)
            throw HostError(Failure::InputContent, given + ": a white file holds one measurement, this one " +
                                                       std::to_string(white.file.sets.size()));
        if (!white.file.layout.present())
            throw HostError(Failure::InputContent, given + ": the white has no spectral fields; " +
                                                       white.file.describeFields());
        white.set = &white.file.sets[0];
        white.layout = &white.file.layout;
        white.thousandths = thousandthsOf(*white.set);
        white.label = given;
        return;
    }
    for (const MeasurementSet& set : chart.sets) {
        if (set.id != given && set.name != given)
            continue;
        if (white.set != nullptr)
            throw HostError(Failure::DuplicatePatch, chartPath + ":" + std::to_string(set.line) +
                                                         ": duplicate patch: the " + option + " white '" + given +
                                                         "' is also on line " + std::to_string(white.set->line));
        white.set = &set;
    }
    if (white.set == nullptr)
        throw HostError(Failure::MissingPatch, chartPath + ": the " + std::string(option) + " white '" + given +
                                                   "' is neither a file nor a sample name in the chart");
    white.layout = &chart.layout;
    white.thousandths = thousandthsOf(*white.set);
    white.label = "'" + given + "'";
}

void runConvert(const ConvertJob& job, ConvertResult& result)
{
    refuseClashingOutputs({job.chart, job.from, job.to}, {job.output});
    const MeasurementFile chart = loadMeasurementFile(job.chart, job.read);
    result.mode = job.mode;
    result.warnings.push_back({job.chart, chart.warnings});
    if (!chart.layout.present() || chart.deviceFields.empty())
        throw HostError(Failure::InputContent, job.chart + ": a chart needs device fields (CMYK_C ... or "
                                                           "nCLR_1 ...) and spectral fields; " +
                                                   chart.describeFields());
    White from, to;
    if (!job.from.empty())
        resolveWhite(job.from, "--from", chart, job.chart, job.read, from, result.warnings);
    if (!job.to.empty())
        resolveWhite(job.to, "--to", chart, job.chart, job.read, to, result.warnings);

    ChartConversion conversion;
    conversion.mode = job.mode;
    conversion.source = job.chart;
    conversion.dropFurtherChannels = job.cmykOnly;
    conversion.dropOption = "--cmyk-only";
    // Whites named inside the chart are references, not chart patches.
    std::vector<std::vector<int>> thousandths;
    thousandths.reserve(chart.sets.size());
    for (const MeasurementSet& set : chart.sets)
        if (&set != from.set && &set != to.set)
            thousandths.push_back(thousandthsOf(set));
    size_t at = 0;
    for (const MeasurementSet& set : chart.sets)
        if (&set != from.set && &set != to.set)
            conversion.patches.push_back({{&chart.layout, &thousandths[at++]}, set.device, set.where()});
    if (from.set != nullptr) {
        conversion.from = MeasuredSpectrum{from.layout, &from.thousandths};
        conversion.fromLabel = from.label;
    }
    if (to.set != nullptr) {
        conversion.to = MeasuredSpectrum{to.layout, &to.thousandths};
        conversion.toLabel = to.label;
    }

    PendingOutput output(job.output);
    const ConversionOutcome outcome = convertChart(conversion, output, fileStem(job.chart));
    output.commit();
    result.fromLabel = from.label;
    result.toLabel = to.label;
    result.whitesApart = outcome.whitesApart;
    result.blendWeight = outcome.blendWeight;
    result.patches = outcome.patches;
    result.written = output.name();
}

} // namespace

Command setupConvertCommand(CLI::App& app)
{
    struct Options {
        ConvertJob job;
        std::string mode = "convert";
        ScaleOption scale;
        ReportStyle style;
    };
    const auto options = std::make_shared<Options>();
    ConvertJob& job = options->job;
    CLI::App* command =
        app.add_subcommand("convert", "measured spectral chart copied, converted or blended to another paper white");
    command->add_option("CHART", job.chart, "measured chart (device and spectral fields)")->required()->check(kPath);
    command->add_option("--from", job.from,
                        "white the chart was printed on: a file with one spectrum, or a sample name in CHART")
        ->check(kPath);
    command->add_option("--to", job.to, "white to convert to: a file or a sample name in CHART")->check(kPath);
    command->add_option("--mode", options->mode, "copy, convert, or blend converted and measured spectra")
        ->check(CLI::IsMember({"copy", "convert", "blend"}))
        ->capture_default_str();
    command->add_option("-o,--output", job.output, "spectral chart to write (- for standard output)")
        ->required()
        ->check(kPath);
    command->add_flag("--cmyk-only", job.cmykOnly,
                      "drop channels 5-7 (the converted chart holds C, M, Y, K only) instead of refusing");
    options->scale.add(*command);
    options->style.add(*command);
    return {command, [options] { return std::vector<std::string>{options->job.output}; },
            [options](std::ostream& report) {
                ConvertJob& job = options->job;
                const std::string& mode = options->mode;
                job.mode = mode == "copy" ? VM_PROCESS_CHART_COPY
                                          : mode == "blend" ? VM_PROCESS_CHART_BLEND : VM_PROCESS_CHART_CONVERT;
                if (job.mode != VM_PROCESS_CHART_COPY && (job.from.empty() || job.to.empty()))
                    throw HostError(Failure::Usage, "--mode " + mode + " needs --from and --to");
                job.read = options->scale.readOptions();
                runAndRender<ConvertResult>([&](ConvertResult& result) { runConvert(job, result); },
                                            options->style.pick<ConvertResult>(renderConvert, jsonConvert),
                                            report);
            },
            {}};
}

} // namespace veltmarquist
