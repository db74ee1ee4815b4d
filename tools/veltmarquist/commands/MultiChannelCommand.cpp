// multichannel FORM --inks 6|7 -o CHART: the six- or seven-colour spectral
// chart (process 3 or 5), the extended C, M, Y, K combinations for the
// user's separation software, and with its separations the XYZ chart of
// process 6, all on one profile (MultiChannelRun.h).
#include "Commands.h"

#include "CommandOptions.h"
#include "Failure.h"
#include "MeasurementLoading.h"
#include "MultiChannelRun.h"
#include "OutputFile.h"
#include "report/HtmlReport.h"
#include "report/JsonReport.h"
#include "report/TextReport.h"

#include "Cgats.h"

#include <charconv>
#include <fstream>
#include <iterator>
#include <memory>

namespace veltmarquist {

namespace {

ColouredSpectrum coloured(const Spectrum& spectrum)
{
    const Triple XYZ = spectrumToXYZ(spectrum);
    return {spectrum, XYZ, labOfXYZ(XYZ)};
}

ChannelPatch measuredPatch(const MeasurementFile& form, const std::vector<int>& thousandths, int inks, int solid)
{
    const std::vector<double> bands = libraryBands({&form.layout, &thousandths});
    Spectrum spectrum{};
    std::copy_n(bands.begin(), kSpectrumBands, spectrum.begin());
    std::vector<double> device(static_cast<size_t>(inks), 0.0);
    if (solid >= 0)
        device[static_cast<size_t>(solid)] = 100.0;
    return {device, coloured(spectrum)};
}

// The chart the library wrote (channels C, M, Y, K, RGB_R, RGB_G, RGB_B, then
// 36 bands), read back from its file: the colours the report shows are the
// chart's own numbers.
std::vector<ChannelPatch> readSpectralChart(const std::string& path, int inks)
{
    std::ifstream in(path, std::ios::binary);
    const std::string text{std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
    const auto [table, error] = cgats::readTable(text);
    if (error)
        throw HostError(Failure::Internal, "the library's spectral chart cannot be read back: " + error->message);
    std::vector<ChannelPatch> patches;
    for (const std::vector<std::string>& row : table.rows) {
        std::vector<double> values;
        for (const std::string& cell : row) {
            double value = 0.0;
            std::from_chars(cell.data(), cell.data() + cell.size(), value);
            values.push_back(value);
        }
        if (values.size() < 7 + kSpectrumBands)
            throw HostError(Failure::Internal, "the library's spectral chart has a short row");
        ChannelPatch patch;
        for (size_t channel : MultiChannelRun::libraryChannels(inks))
            patch.device.push_back(values[channel]);
        std::copy_n(values.begin() + 7, kSpectrumBands, patch.colour.spectrum.begin());
        patch.colour = coloured(patch.colour.spectrum);
        patches.push_back(std::move(patch));
    }
    return patches;
}

// Paper and solids as measured, the chart, and the tone ramps the library
// built for it.
void collectForReport(MultiChannelResult& result, const PendingOutput& chart, MultiChannelRun& run)
{
    const std::vector<std::vector<int>>& picked = result.picked->thousandths;
    result.paperAndSolids.push_back(measuredPatch(*result.form, picked[4], result.inks, -1));
    for (int ink = 0; ink < result.inks; ++ink)
        result.paperAndSolids.push_back(
            measuredPatch(*result.form, picked[static_cast<size_t>(ink < 4 ? ink : ink + 4)], result.inks, ink));
    result.chart = readSpectralChart(chart.temporaryPath(), result.inks);
    for (const std::vector<Spectrum>& ramp : run.ramps()) {
        std::vector<ColouredSpectrum> tones;
        for (const Spectrum& tone : ramp)
            tones.push_back(coloured(tone));
        result.ramps.push_back(std::move(tones));
    }
}

} // namespace

void runMultiChannel(const MultiChannelJob& job, MultiChannelResult& result)
{
    refuseClashingOutputs({job.form, job.separations},
                          {job.output, job.combinations, job.separatedOutput, job.report});
    result.inks = job.inks;
    result.form = loadMeasurementFile(job.form, job.read);
    result.formWarnings = {job.form, result.form->warnings};
    MultiChannelRun run(*result.form, job.form, job.inks);
    result.picked = run.picked();

    // Read the separations before anything is calculated, so that a broken
    // file costs no time and leaves nothing behind.
    Separations separations;
    if (!job.separations.empty()) {
        const MeasurementFile file = loadMeasurementFile(job.separations, job.read);
        result.separationsWarnings = {job.separations, file.warnings};
        separations = separationsOf(file, job.separations, job.inks);
    }

    // The report alone still needs the library's chart for its colours: it
    // is then written to a temporary file that is never delivered.
    PendingOutput chart(job.output.empty() ? "/dev/null" : job.output);
    std::unique_ptr<PendingOutput> combinations, separated, report;
    if (!job.combinations.empty())
        combinations = std::make_unique<PendingOutput>(job.combinations);
    if (!job.separations.empty())
        separated = std::make_unique<PendingOutput>(job.separatedOutput);
    if (!job.report.empty())
        report = std::make_unique<PendingOutput>(job.report);

    run.writeChart(chart);
    collectForReport(result, chart, run);
    if (combinations)
        combinations->write(run.combinationsText());
    if (separated)
        run.writeSeparated(separations, *separated);

    result.separationsPath = job.separations;
    if (report)
        report->write(htmlReport(result));
    deliver(job.output.empty() ? nullptr : &chart, result.chartWritten);
    deliver(combinations.get(), result.combinationsWritten);
    deliver(separated.get(), result.separatedWritten);
    deliver(report.get(), result.reportWritten);
}

Command setupMultiChannelCommand(CLI::App& app)
{
    struct Options {
        MultiChannelJob job;
        ScaleOption scale;
        ReportStyle style;
    };
    const auto options = std::make_shared<Options>();
    MultiChannelJob& job = options->job;
    CLI::App* command = app.add_subcommand(
        "multichannel", "six- or seven-colour spectral chart, extended combinations and their separated XYZ chart");
    command->add_option("FORM", job.form, "measurement file with paper and solids (nCLR_1 ... nCLR_n fields)")
        ->required()
        ->check(kPath);
    command->add_option("--inks", job.inks, "number of inks")->required()->check(CLI::IsMember({6, 7}));
    command->add_option("-o,--output", job.output, "spectral chart to write (- for standard output)")
        ->required()
        ->check(kPath);
    command->add_option("--combinations", job.combinations,
                        "write the 3499 extended C, M, Y, K combinations (CGATS) here")
        ->check(kPath);
    CLI::Option* separations =
        command->add_option("--separations", job.separations,
                            "the separation software's channel values for the combinations (CGATS, %)")
            ->check(kPath);
    CLI::Option* separatedOut =
        command->add_option("--separated-out", job.separatedOutput, "XYZ chart of the separated combinations to write")
            ->check(kPath);
    separations->needs(separatedOut);
    separatedOut->needs(separations);
    command->add_option("--report", job.report, "also write the HTML report of paper, solids, chart and ramps")
        ->check(kPath);
    options->scale.add(*command);
    options->style.add(*command);
    return {command,
            [options] {
                const MultiChannelJob& job = options->job;
                return std::vector<std::string>{job.output, job.combinations, job.separatedOutput, job.report};
            },
            [options](std::ostream& report) {
                options->job.read = options->scale.readOptions();
                runAndRender<MultiChannelResult>(
                    [&](MultiChannelResult& result) { runMultiChannel(options->job, result); },
                    options->style.pick<MultiChannelResult>(renderMultiChannel, jsonMultiChannel),
                    report);
            },
            {}};
}

} // namespace veltmarquist
