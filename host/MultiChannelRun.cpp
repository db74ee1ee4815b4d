// The six- and seven-ink processes on one profile.
#include "MultiChannelRun.h"

#include "Cgats.h"
#include "DecimalValues.h"
#include "Failure.h"
#include "Files.h"

#include "MathProfile.h"

#include <algorithm>

namespace veltmarquist {

namespace {

constexpr std::size_t kLibraryChannels = 7;

std::string familyOf(int inks)
{
    return std::to_string(inks) + "CLR_";
}

} // namespace

MultiChannelRun::MultiChannelRun(const MeasurementFile& form, const std::string& path, int inks)
    : inks_(inks), name_(fileStem(path))
{
    if (inks != 6 && inks != 7)
        throw HostError(Failure::Usage, "a multi-channel form has 6 or 7 inks, not " + std::to_string(inks));
    if (form.deviceFields.size() != static_cast<std::size_t>(inks))
        throw HostError(Failure::InputContent, path + ": " + std::to_string(inks) + " inks need the device fields " +
                                                   familyOf(inks) + "1 ... " + familyOf(inks) + std::to_string(inks) +
                                                   "; the file has " + std::to_string(form.deviceFields.size()) +
                                                   " device channels");
    picked_ = pickPatches(form, multiChannelRequests(inks), path);
    std::vector<MeasuredSpectrum> spectra;
    for (const std::vector<int>& thousandths : picked_.thousandths)
        spectra.push_back({&form.layout, &thousandths});
    block_ = buildBlock(spectra, VM_EXCHANGE_BUFFER_INTS);
}

void MultiChannelRun::writeChart(const PendingOutput& chart)
{
    if (profile_)
        throw HostError(Failure::Internal, "the multi-channel chart is written once");
    profile_ = std::make_unique<Profile>(name_);
    profile_->calculate(inks_ == 6 ? VM_PROCESS_SIX_COLOUR : VM_PROCESS_SEVEN_COLOUR, chart, block_);
}

std::vector<Cmyk> MultiChannelRun::combinations() const
{
    std::vector<Cmyk> combinations(VM_EXCHANGE_RECORDS);
    for (std::size_t record = 0; record < VM_EXCHANGE_RECORDS; ++record)
        for (std::size_t channel = 0; channel < 4; ++channel)
            combinations[record][channel] = block_.ints[kLibraryChannels * record + channel];
    return combinations;
}

std::string MultiChannelRun::combinationsText() const
{
    cgats::Document table;
    table.keywords = {{"ORIGINATOR", "veltmarquist"},
                      {"DESCRIPTOR", "extended C, M, Y, K combinations of a multi-channel chart, " +
                                         std::to_string(inks_) + " inks"}};
    table.fields = {"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    for (std::size_t record = 0; record < VM_EXCHANGE_RECORDS; ++record) {
        std::vector<std::string> row{std::to_string(record + 1)};
        for (std::size_t channel = 0; channel < 4; ++channel)
            row.push_back(std::to_string(block_.ints[kLibraryChannels * record + channel]));
        table.rows.push_back(std::move(row));
    }
    return cgatsText(table);
}

void MultiChannelRun::writeSeparated(const Separations& separations, const PendingOutput& output)
{
    if (!profile_)
        throw HostError(Failure::Internal, "the separated set needs the multi-channel chart first");
    const std::size_t channels = separations.channels;
    if (channels != kLibraryChannels && !(channels == 6 && inks_ == 6))
        throw HostError(Failure::InputContent, "separations of " + std::to_string(inks_) + " inks have " +
                                                   (inks_ == 6 ? std::string("6 or ") : std::string()) +
                                                   "7 channels, not " + std::to_string(channels));
    if (separations.values.size() != channels * VM_EXCHANGE_RECORDS)
        throw HostError(Failure::InputContent, std::to_string(separations.values.size() / channels) +
                                                   " separations for " + std::to_string(VM_EXCHANGE_RECORDS) +
                                                   " combinations");
    const std::vector<std::size_t> map =
        channels == kLibraryChannels ? libraryChannels(7) : libraryChannels(6);
    for (std::size_t record = 0; record < VM_EXCHANGE_RECORDS; ++record) {
        int* exchange = &block_.ints[kLibraryChannels * record];
        std::fill(exchange, exchange + kLibraryChannels, 0);
        for (std::size_t channel = 0; channel < channels; ++channel) {
            const std::int32_t value = separations.values[channels * record + channel];
            if (!deviceValueInRange(value))
                throw HostError(Failure::InputContent, "the separation of " + combinationLabel(record) +
                                                           " has channel " + std::to_string(channel + 1) +
                                                           " outside 0..100 %");
            // The exchange buffer takes thousandths of a percent.
            exchange[map[channel]] = static_cast<int>(divideRounded(value, kDeviceUnits / 1000));
        }
    }
    profile_->calculate(VM_PROCESS_SEPARATED_SET, output, block_);
}

std::vector<std::vector<Spectrum>> MultiChannelRun::ramps()
{
    std::vector<std::vector<Spectrum>> ramps;
    if (!profile_)
        return ramps;
    MathProfile& profile = profile_->object();
    for (std::size_t channel : libraryChannels(inks_)) {
        std::vector<Spectrum> ramp;
        for (const MathProfile::ColorPatch& tone : profile.tintLists[channel]) {
            Spectrum spectrum{};
            std::copy_n(tone.spectrum, kSpectrumBands, spectrum.begin());
            ramp.push_back(spectrum);
        }
        ramps.push_back(std::move(ramp));
    }
    return ramps;
}

std::vector<std::size_t> MultiChannelRun::libraryChannels(int inks)
{
    return inks == 6 ? std::vector<std::size_t>{0, 1, 2, 3, 4, 6} : std::vector<std::size_t>{0, 1, 2, 3, 4, 5, 6};
}

std::string MultiChannelRun::combinationLabel(std::size_t record)
{
    const auto& cmyk = MathProfile::ZANExtended[record];
    return "combination " + std::to_string(record + 1) + " (" +
           describeDevice({double(cmyk[0]), double(cmyk[1]), double(cmyk[2]), double(cmyk[3])}) + ")";
}

Separations separationsOf(const MeasurementFile& file, const std::string& path, int inks)
{
    const std::size_t channels = file.deviceFields.size();
    if (channels != kLibraryChannels && !(channels == 6 && inks == 6))
        throw HostError(Failure::InputContent,
                        path + ": separations need the device fields 7CLR_1 ... 7CLR_7" +
                            (inks == 6 ? std::string(" or 6CLR_1 ... 6CLR_6") : std::string()) + "; the file has " +
                            (channels == 0 ? std::string("none") : std::to_string(channels) + " channels"));
    std::vector<const MeasurementSet*> records(VM_EXCHANGE_RECORDS, nullptr);
    const bool numbered = std::all_of(file.sets.begin(), file.sets.end(), [](const MeasurementSet& set) {
        return !set.id.empty() && set.id.find_first_not_of("0123456789") == std::string::npos && set.id.size() < 6;
    });
    if (numbered) {
        for (const MeasurementSet& set : file.sets) {
            const std::size_t record = std::stoul(set.id) - 1;
            if (record >= records.size())
                throw HostError(Failure::InputContent, path + ":" + std::to_string(set.line) + ": sample " + set.id +
                                                           " is not one of the combinations 1-3499");
            if (records[record] != nullptr)
                throw HostError(Failure::DuplicatePatch, path + ":" + std::to_string(set.line) +
                                                             ": duplicate patch: " +
                                                             MultiChannelRun::combinationLabel(record) +
                                                             " is also on line " +
                                                             std::to_string(records[record]->line));
            records[record] = &set;
        }
    } else {
        if (file.sets.size() > records.size())
            throw HostError(Failure::InputContent, path + ": " + std::to_string(file.sets.size()) +
                                                       " separations for 3499 combinations");
        for (std::size_t i = 0; i < file.sets.size(); ++i)
            records[i] = &file.sets[i];
    }
    Separations separations;
    separations.channels = channels;
    for (std::size_t record = 0; record < records.size(); ++record) {
        if (records[record] == nullptr)
            throw HostError(Failure::MissingPatch, path + ": the separation of " +
                                                       MultiChannelRun::combinationLabel(record) + " is missing");
        separations.values.insert(separations.values.end(), records[record]->device.begin(),
                                  records[record]->device.end());
    }
    return separations;
}

} // namespace veltmarquist
