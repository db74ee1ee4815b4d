// multichannel: the six- or seven-colour spectral chart (process 3 or 5),
// the extended C, M, Y, K combinations for the user's separation software,
// and with its separations the XYZ chart of process 6, all on one profile.
#include "Commands.h"

#include "DecimalValues.h"
#include "Files.h"
#include "LibraryBlock.h"
#include "LibraryHost.h"
#include "MeasurementLoading.h"
#include "OutputFile.h"
#include "PatchMatching.h"
#include "ToolError.h"
#include "report/HtmlReport.h"

#include "Cgats.h"

#include "MathProfile.h"

#include <charconv>
#include <fstream>
#include <iterator>
#include <memory>

namespace veltmarquist {

namespace {

// ---- Separations ----------------------------------------------------------------------------

const char* const kExtendedSetDescriptor = "extended C, M, Y, K combinations of a multi-channel chart";

std::string combinationLabel(size_t record)
{
    const auto& cmyk = MathProfile::ZANExtended[record];
    return "combination " + std::to_string(record + 1) + " (" +
           describeDevice({double(cmyk[0]), double(cmyk[1]), double(cmyk[2]), double(cmyk[3])}) + ")";
}

// The separation software's answer: one set of channel values (percent) per
// combination, found by SAMPLE_ID 1..3499 when every set has a numeric one,
// else in file order.
std::vector<const MeasurementSet*> orderSeparations(const MeasurementFile& file, const std::string& path)
{
    std::vector<const MeasurementSet*> records(VM_EXCHANGE_RECORDS, nullptr);
    bool numbered = true;
    for (const MeasurementSet& set : file.sets)
        numbered = numbered && !set.id.empty() && set.id.find_first_not_of("0123456789") == std::string::npos &&
                   set.id.size() < 6;
    if (numbered) {
        for (const MeasurementSet& set : file.sets) {
            const size_t record = std::stoul(set.id) - 1;
            if (record >= records.size())
                throw ToolError(Failure::InputContent, path + ":" + std::to_string(set.line) + ": sample " + set.id +
                                                           " is not one of the combinations 1-3499");
            if (records[record] != nullptr)
                throw ToolError(Failure::DuplicatePatch, path + ":" + std::to_string(set.line) +
                                                             ": duplicate patch: " + combinationLabel(record) +
                                                             " is also on line " +
                                                             std::to_string(records[record]->line));
            records[record] = &set;
        }
    } else {
        for (size_t i = 0; i < file.sets.size() && i < records.size(); ++i)
            records[i] = &file.sets[i];
        if (file.sets.size() > records.size())
            throw ToolError(Failure::InputContent, path + ": " + std::to_string(file.sets.size()) +
                                                       " separations for 3499 combinations");
    }
    for (size_t record = 0; record < records.size(); ++record)
        if (records[record] == nullptr)
            throw ToolError(Failure::MissingPatch, path + ": the separation of " + combinationLabel(record) +
                                                       " is missing");
    return records;
}

// Channel of the library for each channel of a separation: seven channels
// map one to one; six inks put ink B on channel 6 (channel 5 stays unprinted),
// as the six-colour model does.
std::vector<int> separationChannels(const MeasurementFile& file, int inks, const std::string& path)
{
    const size_t channels = file.deviceFields.size();
    if (channels == 7)
        return {0, 1, 2, 3, 4, 5, 6};
    if (channels == 6 && inks == 6)
        return {0, 1, 2, 3, 4, 6};
    throw ToolError(Failure::InputContent,
                    path + ": separations need the device fields 7CLR_1 ... 7CLR_7" +
                        (inks == 6 ? std::string(" or 6CLR_1 ... 6CLR_6") : std::string()) + "; the file has " +
                        (channels == 0 ? std::string("none") : std::to_string(channels) + " channels"));
}

std::string combinationsText(const MeasurementBlock& block, int inks)
{
    CgatsTable table;
    table.keywords = {{"ORIGINATOR", "veltmarquist"},
                      {"DESCRIPTOR", std::string(kExtendedSetDescriptor) + ", " + std::to_string(inks) + " inks"}};
    table.fields = {"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    for (size_t record = 0; record < VM_EXCHANGE_RECORDS; ++record) {
        std::vector<std::string> row{std::to_string(record + 1)};
        for (size_t channel = 0; channel < 4; ++channel)
            row.push_back(std::to_string(block.ints[7 * record + channel]));
        table.rows.push_back(std::move(row));
    }
    return cgatsText(table);
}

// ---- What the report shows ------------------------------------------------------------------

// The library's channel of each of the file's channels: six inks put ink B
// on channel 6 (channel 5 stays unprinted).
std::vector<size_t> libraryChannels(int inks)
{
    return inks == 6 ? std::vector<size_t>{0, 1, 2, 3, 4, 6} : std::vector<size_t>{0, 1, 2, 3, 4, 5, 6};
}

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
        throw ToolError(Failure::Internal, "the library's spectral chart cannot be read back: " + error->message);
    std::vector<ChannelPatch> patches;
    for (const std::vector<std::string>& row : table.rows) {
        std::vector<double> values;
        for (const std::string& cell : row) {
            double value = 0.0;
            std::from_chars(cell.data(), cell.data() + cell.size(), value);
            values.push_back(value);
        }
        if (values.size() < 7 + kSpectrumBands)
            throw ToolError(Failure::Internal, "the library's spectral chart has a short row");
        ChannelPatch patch;
        for (size_t channel : libraryChannels(inks))
            patch.device.push_back(values[channel]);
        std::copy_n(values.begin() + 7, kSpectrumBands, patch.colour.spectrum.begin());
        patch.colour = coloured(patch.colour.spectrum);
        patches.push_back(std::move(patch));
    }
    return patches;
}

// Paper and solids as measured, the chart, and the tone ramps the library
// built for it (one list of 101 tones per channel of a fresh profile).
void collectForReport(MultiChannelResult& result, const PendingOutput& chart, MathProfile& profile)
{
    const std::vector<std::vector<int>>& picked = result.picked->thousandths;
    result.paperAndSolids.push_back(measuredPatch(*result.form, picked[4], result.inks, -1));
    for (int ink = 0; ink < result.inks; ++ink)
        result.paperAndSolids.push_back(
            measuredPatch(*result.form, picked[static_cast<size_t>(ink < 4 ? ink : ink + 4)], result.inks, ink));
    result.chart = readSpectralChart(chart.temporaryPath(), result.inks);
    for (size_t channel : libraryChannels(result.inks)) {
        std::vector<ColouredSpectrum> ramp;
        for (const MathProfile::ColorPatch& tone : profile.tintLists[channel]) {
            Spectrum spectrum{};
            std::copy_n(tone.spectrum, kSpectrumBands, spectrum.begin());
            ramp.push_back(coloured(spectrum));
        }
        result.ramps.push_back(std::move(ramp));
    }
}

} // namespace

void runMultiChannel(const MultiChannelOptions& options, MultiChannelResult& result)
{
    refuseClashingOutputs({options.form, options.separations},
                          {options.output, options.combinations, options.separatedOutput, options.report});
    result.inks = options.inks;
    result.form = loadMeasurementFile(options.form, options.read);
    const MeasurementFile& form = *result.form;
    result.formWarnings = {options.form, form.warnings};
    const std::string family = std::to_string(options.inks) + "CLR_";
    if (form.deviceFields.size() != static_cast<size_t>(options.inks))
        throw ToolError(Failure::InputContent, options.form + ": " + std::to_string(options.inks) +
                                                   " inks need the device fields " + family + "1 ... " + family +
                                                   std::to_string(options.inks) + "; the file has " +
                                                   std::to_string(form.deviceFields.size()) + " device channels");
    result.picked = pickPatches(form, multiChannelRequests(options.inks), options.form);
    const PickedPatches& picked = *result.picked;

    // Read the separations before anything is calculated, so that a broken
    // file costs no time and leaves nothing behind.
    MeasurementFile separations;
    std::vector<const MeasurementSet*> records;
    std::vector<int> channels;
    if (!options.separations.empty()) {
        separations = loadMeasurementFile(options.separations, options.read);
        result.separationsWarnings = {options.separations, separations.warnings};
        channels = separationChannels(separations, options.inks, options.separations);
        records = orderSeparations(separations, options.separations);
    }

    // The report alone still needs the library's chart for its colours: it
    // is then written to a temporary file that is never delivered.
    PendingOutput chart(options.output.empty() ? "/dev/null" : options.output);
    std::unique_ptr<PendingOutput> combinations, separated, report;
    if (!options.combinations.empty())
        combinations = std::make_unique<PendingOutput>(options.combinations);
    if (!options.separations.empty())
        separated = std::make_unique<PendingOutput>(options.separatedOutput);
    if (!options.report.empty())
        report = std::make_unique<PendingOutput>(options.report);

    std::vector<MeasuredSpectrum> spectra;
    for (const std::vector<int>& thousandths : picked.thousandths)
        spectra.push_back({&form.layout, &thousandths});
    MeasurementBlock block = buildBlock(spectra, VM_EXCHANGE_BUFFER_INTS);
    Profile profile(fileStem(options.form));
    profile.calculate(options.inks == 6 ? VM_PROCESS_SIX_COLOUR : VM_PROCESS_SEVEN_COLOUR, chart, block);
    collectForReport(result, chart, profile.object());
    if (combinations)
        combinations->write(combinationsText(block, options.inks));
    if (separated) {
        // The exchange buffer takes thousandths of a percent.
        for (size_t record = 0; record < records.size(); ++record) {
            for (size_t channel = 0; channel < 7; ++channel)
                block.ints[7 * record + channel] = 0;
            for (size_t channel = 0; channel < channels.size(); ++channel)
                block.ints[7 * record + static_cast<size_t>(channels[channel])] =
                    static_cast<int>(divideRounded(records[record]->device[channel], kDeviceUnits / 1000));
        }
        profile.calculate(VM_PROCESS_SEPARATED_SET, *separated, block);
    }

    result.separationsPath = options.separations;
    if (report)
        report->write(htmlReport(result));
    deliver(options.output.empty() ? nullptr : &chart, result.chartWritten);
    deliver(combinations.get(), result.combinationsWritten);
    deliver(separated.get(), result.separatedWritten);
    deliver(report.get(), result.reportWritten);
}

} // namespace veltmarquist
