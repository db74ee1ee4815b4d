// The commands beyond four colours: multichannel (six- and seven-colour
// charts with the separation exchange) and convert (a measured chart moved
// from one paper white to another).
#include "Commands.h"

#include "DecimalValues.h"
#include "Files.h"
#include "OutputFile.h"
#include "LibraryHost.h"
#include "PatchMatching.h"
#include "ToolError.h"

#include <sys/stat.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <iostream>
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

// ---- Reference whites ------------------------------------------------------------------------

bool isRegularFile(const std::string& path)
{
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

struct White {
    std::string label;
    MeasurementFile file;              // when read from a file of its own
    const MeasurementSet* set = nullptr;
    const SpectralLayout* layout = nullptr;
    std::vector<int> thousandths;
    size_t chartIndex = SIZE_MAX;      // position in the chart when named there
};

// A white given as a file with one measurement, or as a sample name inside
// the chart (SAMPLE_ID or SAMPLE_NAME).
void resolveWhite(const std::string& given, const char* option, const MeasurementFile& chart,
                  const std::string& chartPath, const ReadOptions& read, White& white)
{
    if (isRegularFile(given)) {
        white.file = loadMeasurementFile(given, read);
        printWarnings(white.file, given);
        if (white.file.sets.size() != 1)
            throw ToolError(Failure::InputContent, given + ": a white file holds one measurement, this one " +
                                                       std::to_string(white.file.sets.size()));
        if (!white.file.layout.present())
            throw ToolError(Failure::InputContent, given + ": the white has no spectral fields; " +
                                                       white.file.describeFields());
        white.set = &white.file.sets[0];
        white.layout = &white.file.layout;
        white.thousandths = thousandthsOf(*white.set);
        white.label = given;
        return;
    }
    for (size_t i = 0; i < chart.sets.size(); ++i) {
        const MeasurementSet& set = chart.sets[i];
        if (set.id != given && set.name != given)
            continue;
        if (white.set != nullptr)
            throw ToolError(Failure::DuplicatePatch, chartPath + ":" + std::to_string(set.line) +
                                                         ": duplicate patch: the " + option + " white '" + given +
                                                         "' is also on line " + std::to_string(white.set->line));
        white.set = &set;
        white.chartIndex = i;
    }
    if (white.set == nullptr)
        throw ToolError(Failure::MissingPatch, chartPath + ": the " + std::string(option) + " white '" + given +
                                                   "' is neither a file nor a sample name in the chart");
    white.layout = &chart.layout;
    white.thousandths = thousandthsOf(*white.set);
    white.label = "'" + given + "'";
}

// The converted chart holds C, M, Y, K only: a chart with ink in further
// channels is refused unless the user says they may go.
void refuseDroppedChannels(const MeasurementFile& chart, const std::string& path)
{
    size_t inked = 0;
    for (const MeasurementSet& set : chart.sets)
        inked += std::any_of(set.device.begin() + std::min<std::ptrdiff_t>(4, static_cast<std::ptrdiff_t>(set.device.size())),
                             set.device.end(), [](std::int32_t value) { return value != 0; });
    if (inked > 0)
        throw ToolError(Failure::InputContent,
                        path + ": " + std::to_string(inked) + " patches have ink in channels 5-" +
                            std::to_string(chart.deviceFields.size()) + " (" + chart.deviceFields[4] + " ...), but the "
                            "converted chart holds C, M, Y, K only; give --cmyk-only to drop those channels");
}

} // namespace

void runMultiChannel(const MultiChannelOptions& options, std::ostream& out)
{
    refuseClashingOutputs({options.form, options.separations},
                          {options.output, options.combinations, options.separatedOutput});
    const MeasurementFile form = loadMeasurementFile(options.form, options.read);
    printWarnings(form, options.form);
    const std::string family = std::to_string(options.inks) + "CLR_";
    if (form.deviceFields.size() != static_cast<size_t>(options.inks))
        throw ToolError(Failure::InputContent, options.form + ": " + std::to_string(options.inks) +
                                                   " inks need the device fields " + family + "1 ... " + family +
                                                   std::to_string(options.inks) + "; the file has " +
                                                   std::to_string(form.deviceFields.size()) + " device channels");
    const PickedPatches picked = pickPatches(form, multiChannelRequests(options.inks), options.form);
    out << "form: " << options.form << ": " << form.sets.size() << " measurements, " << form.describeSpectra()
        << ", reflectance 0-" << (form.scale == 100.0 ? "100" : "1") << (form.scaleDetected ? " (detected)" : " (given)")
        << "\n  paper and " << options.inks << " solids found; " << picked.setsIgnored
        << " other measurements ignored\n";

    // Read the separations before anything is calculated, so that a broken
    // file costs no time and leaves nothing behind.
    MeasurementFile separations;
    std::vector<const MeasurementSet*> records;
    std::vector<int> channels;
    if (!options.separations.empty()) {
        separations = loadMeasurementFile(options.separations, options.read);
        printWarnings(separations, options.separations);
        channels = separationChannels(separations, options.inks, options.separations);
        records = orderSeparations(separations, options.separations);
    }

    PendingOutput chart(options.output);
    std::unique_ptr<PendingOutput> combinations, separated;
    if (!options.combinations.empty())
        combinations = std::make_unique<PendingOutput>(options.combinations);
    if (!options.separations.empty())
        separated = std::make_unique<PendingOutput>(options.separatedOutput);

    std::vector<Spectrum> spectra;
    for (const std::vector<int>& thousandths : picked.thousandths)
        spectra.push_back({&form.layout, &thousandths});
    MeasurementBlock block = buildBlock(spectra, VM_EXCHANGE_BUFFER_INTS);
    Profile profile(fileStem(options.form));
    profile.calculate(options.inks == 6 ? VM_PROCESS_SIX_COLOUR : VM_PROCESS_SEVEN_COLOUR, chart, block);
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

    chart.commit();
    out << (options.inks == 6 ? "six-colour chart: 128" : "seven-colour chart: 159")
        << " spectral patches written to " << chart.name() << "\n";
    if (combinations) {
        combinations->commit();
        out << "combinations: 3499 C, M, Y, K combinations for the separation software written to "
            << combinations->name() << "\n";
    }
    if (separated) {
        separated->commit();
        out << "separated set: 3499 patches (XYZ) predicted from " << options.separations << " written to "
            << separated->name() << "\n";
    }
}

void runConvert(const ConvertOptions& options, std::ostream& out)
{
    refuseClashingOutputs({options.chart, options.from, options.to}, {options.output});
    const MeasurementFile chart = loadMeasurementFile(options.chart, options.read);
    printWarnings(chart, options.chart);
    if (!chart.layout.present() || chart.deviceFields.empty())
        throw ToolError(Failure::InputContent, options.chart + ": a chart needs device fields (CMYK_C ... or "
                                                               "nCLR_1 ...) and spectral fields; " +
                                                   chart.describeFields());
    if (!options.cmykOnly)
        refuseDroppedChannels(chart, options.chart);
    const bool copy = options.mode == VM_PROCESS_CHART_COPY;
    White from, to;
    if (!options.from.empty())
        resolveWhite(options.from, "--from", chart, options.chart, options.read, from);
    if (!options.to.empty())
        resolveWhite(options.to, "--to", chart, options.chart, options.read, to);

    // Whites named inside the chart are references, not chart patches.
    std::vector<const MeasurementSet*> patches;
    for (size_t i = 0; i < chart.sets.size(); ++i)
        if (i != from.chartIndex && i != to.chartIndex)
            patches.push_back(&chart.sets[i]);
    if (patches.size() > 1997)
        throw ToolError(Failure::InputContent, options.chart + ": " + std::to_string(patches.size()) +
                                                   " patches; at most 1997 can be converted in one chart");

    std::vector<std::vector<int>> thousandths;
    for (const MeasurementSet* patch : patches)
        thousandths.push_back(thousandthsOf(*patch));
    if (thousandths.empty())
        thousandths.push_back(thousandthsOf(chart.sets[0]));
    std::vector<Spectrum> spectra;
    for (size_t i = 0; i < patches.size(); ++i)
        spectra.push_back({&chart.layout, &thousandths[i]});
    // A copy reads no white; two copies of the first patch stand in for them.
    const Spectrum first{&chart.layout, &thousandths[0]};
    spectra.push_back(from.set != nullptr ? Spectrum{from.layout, &from.thousandths} : first);
    spectra.push_back(to.set != nullptr ? Spectrum{to.layout, &to.thousandths} : first);
    MeasurementBlock block = buildBlock(spectra);

    double whitesApart = 0.0;
    if (from.set != nullptr && to.set != nullptr) {
        const std::vector<double> fromBands = libraryBands(spectra[spectra.size() - 2]);
        if (!copy)
            for (int band = 0; band < MathProfile::kBands; ++band)
                if (std::lround(fromBands[static_cast<size_t>(band)] * 1000.0) <= 0)
                    throw ToolError(Failure::InputContent, "the --from white " + from.label + " has no reflectance at " +
                                                               std::to_string(380 + 10 * band) +
                                                               " nm; the conversion divides by it");
        whitesApart = deltaEab(labOfXYZ(XYZOfBands(fromBands)),
                               labOfXYZ(XYZOfBands(libraryBands(spectra.back()))));
    }
    // Channel values follow the spectra, seven whole percentages per patch.
    for (const MeasurementSet* patch : patches)
        for (size_t channel = 0; channel < 7; ++channel)
            block.ints.push_back(channel < patch->device.size()
                                     ? static_cast<int>(divideRounded(patch->device[channel], kDeviceUnits))
                                     : 0);
    block.ints.insert(block.ints.end(), 14, 0);

    PendingOutput output(options.output);
    Profile profile(fileStem(options.chart));
    profile.calculate(options.mode, output, block);
    output.commit();

    if (copy) {
        out << "chart: " << patches.size() << " patches copied to " << output.name() << "\n";
        return;
    }
    out << "whites: " << from.label << " -> " << to.label << ", " << fixed(whitesApart) << " dE*ab apart\n";
    if (options.mode == VM_PROCESS_CHART_BLEND) {
        const double weight = whitesApart <= 11.0 ? 0.33 : 0.33 / ((whitesApart - 10.0) / 25.0);
        out << "blend: converted spectra weighted " << fixed(weight, 3) << ", measured spectra " << fixed(1.0 - weight, 3)
            << "\n";
    }
    out << "chart: " << patches.size() << " patches " << (options.mode == VM_PROCESS_CHART_BLEND ? "blended" : "converted")
        << ", written to " << output.name() << "\n";
}

} // namespace veltmarquist
