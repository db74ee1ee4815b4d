// The meaning of a measurement file's sets: fields, exact values, scale,
// unmeasured bands, repeats and warnings.
#include "MeasurementFile.h"

#include "Cgats.h"
#include "DecimalValues.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstring>
#include <functional>
#include <map>
#include <unordered_map>

namespace veltmarquist {

namespace {

std::string upper(std::string text)
{
    for (char& c : text)
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return text;
}

// An exact count of millionths as the decimal it stands for: 87500000 -> "87.5".
std::string decimalOf(std::int64_t units)
{
    std::string text = std::to_string(units < 0 ? -units : units);
    if (text.size() < 7)
        text.insert(0, 7 - text.size(), '0');
    text.insert(text.size() - 6, ".");
    while (text.back() == '0')
        text.pop_back();
    if (text.back() == '.')
        text.pop_back();
    return units < 0 ? "-" + text : text;
}

ReadError syntaxError(int line, std::string message)
{
    return ReadError{ReadFailure::Syntax, line, std::move(message)};
}

ReadError contentError(int line, std::string message)
{
    return ReadError{ReadFailure::Content, line, std::move(message)};
}

// Fields that carry the device values: a complete nCLR_1..nCLR_n family, or
// CMYK_C, CMYK_M, CMYK_Y, CMYK_K.
std::optional<std::string> findDeviceFields(const std::vector<std::string>& fields, std::vector<int>& columns)
{
    std::map<int, std::map<int, int>> families; // n -> k -> column
    std::map<std::string, int> cmyk;
    for (size_t i = 0; i < fields.size(); ++i) {
        const auto [n, k] = colorFieldOf(fields[i]);
        if (n > 0)
            families[n].emplace(k, static_cast<int>(i));
        const std::string name = upper(fields[i]);
        if (name == "CMYK_C" || name == "CMYK_M" || name == "CMYK_Y" || name == "CMYK_K")
            cmyk.emplace(name, static_cast<int>(i));
    }
    if (!families.empty()) {
        const auto& [n, members] = *families.rbegin();
        for (int k = 1; k <= n; ++k) {
            if (!members.count(k))
                return "field " + std::to_string(n) + "CLR_" + std::to_string(k) + " is missing from the " +
                       std::to_string(n) + "CLR channels";
            columns.push_back(members.at(k));
        }
        return std::nullopt;
    }
    if (cmyk.empty())
        return std::nullopt;
    for (const char* name : {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"}) {
        if (!cmyk.count(name))
            return std::string("field ") + name + " is missing beside the other CMYK fields";
        columns.push_back(cmyk.at(name));
    }
    return std::nullopt;
}

int findField(const std::vector<std::string>& fields, const char* wanted)
{
    for (size_t i = 0; i < fields.size(); ++i)
        if (upper(fields[i]) == wanted)
            return static_cast<int>(i);
    return -1;
}

// Sets reserved ahead at most (a few hundred MB); beyond, the vector grows.
constexpr std::int64_t kMaxReserved = 4000000;

// Builds the sets row by row as the CGATS reader hands them over; values are
// kept in the file's own unit until the scale is known.
class SetReader : public cgats::Handler {
public:
    // `bytes`: the size of the input, which bounds the sets worth reserving.
    SetReader(const ReadOptions& options, std::int64_t bytes) : options_(options), bytes_(bytes) {}

    std::optional<cgats::Error> begin(const cgats::Header& header) override;
    std::optional<cgats::Error> row(int line, const std::vector<std::string_view>& cells) override;
    // After the last row: scale, bands, repeats, warnings.
    std::optional<ReadError> finish();

    MeasurementFile file;
    std::optional<ReadError> contentFailure; // a content error met while reading

private:
    std::optional<cgats::Error> fail(ReadError error)
    {
        contentFailure = error;
        return cgats::Error{error.line, error.message};
    }
    std::optional<ReadError> decideScale();
    std::optional<ReadError> widenUnmeasuredBands();
    std::optional<ReadError> checkDeviceScale() const;
    std::optional<ReadError> checkRepeats() const;
    void warnAboutSpectra();

    ReadOptions options_;
    std::int64_t bytes_;
    std::vector<int> deviceColumns_;
    SpectralFields spectral_;
    int idColumn_ = -1, nameColumn_ = -1;
    std::array<int, 3> xyzColumns_{-1, -1, -1};
    long long valuesAbove2_ = 0, values_ = 0; // evidence for the scale, in the file's unit
};

std::optional<cgats::Error> SetReader::begin(const cgats::Header& header)
{
    file.fileType = header.sheetType;
    for (const cgats::Keyword& keyword : header.keywords)
        file.keywords.emplace_back(keyword.name, keyword.value);
    file.fields = header.fields;
    for (const cgats::Error& warning : header.warnings)
        file.warnings.push_back("line " + std::to_string(warning.line) + ": " + warning.message);
    if (auto message = findDeviceFields(file.fields, deviceColumns_))
        return fail(contentError(header.formatLine, *message));
    if (auto message = findSpectralFields(file.fields, spectral_))
        return fail(contentError(header.formatLine, *message));
    file.fileLayout = spectral_.file;
    file.layout = spectral_.delivered;
    for (int column : deviceColumns_)
        file.deviceFields.push_back(file.fields[static_cast<size_t>(column)]);
    idColumn_ = findField(file.fields, "SAMPLE_ID");
    nameColumn_ = findField(file.fields, "SAMPLE_NAME");
    xyzColumns_ = {findField(file.fields, "XYZ_X"), findField(file.fields, "XYZ_Y"), findField(file.fields, "XYZ_Z")};
    file.hasXYZ = xyzColumns_[0] >= 0 && xyzColumns_[1] >= 0 && xyzColumns_[2] >= 0;
    // Every cell of a row takes two bytes at least.
    if (const cgats::Keyword* sets = header.find("NUMBER_OF_SETS"))
        file.sets.reserve(static_cast<size_t>(std::min<std::int64_t>(
            {std::stoll(sets->value), bytes_ / static_cast<std::int64_t>(2 * file.fields.size()), kMaxReserved})));
    return std::nullopt;
}

std::optional<cgats::Error> SetReader::row(int line, const std::vector<std::string_view>& cells)
{
    if (file.sets.empty() && file.sets.capacity() == 0) {
        // Without NUMBER_OF_SETS the first row's length estimates the count:
        // growing a vector of sets by copies would cost more than the reading.
        const std::int64_t rowBytes = cells.back().data() + cells.back().size() - cells.front().data() + 2;
        file.sets.reserve(static_cast<size_t>(std::min<std::int64_t>(bytes_ / rowBytes + bytes_ / rowBytes / 8 + 1, kMaxReserved)));
    }
    MeasurementSet set;
    set.line = line;
    const auto notANumber = [&](int column) {
        return fail(contentError(line, "field " + cgats::excerpt(file.fields[static_cast<size_t>(column)]) + ": '" +
                                           cgats::excerpt(cells[static_cast<size_t>(column)]) + "' is not a number"));
    };
    set.name = nameColumn_ >= 0 ? std::string(cells[static_cast<size_t>(nameColumn_)]) : "";
    set.id = idColumn_ >= 0 ? std::string(cells[static_cast<size_t>(idColumn_)]) : set.name;
    set.device.reserve(deviceColumns_.size());
    for (int column : deviceColumns_) {
        const std::optional<std::int64_t> value = parseDecimal(cells[static_cast<size_t>(column)], 6);
        if (!value)
            return notANumber(column);
        if (!deviceValueInRange(*value))
            return fail(contentError(line, "field " + file.fields[static_cast<size_t>(column)] + ": " +
                                               decimalOf(*value) + " is outside 0-100 %"));
        set.device.push_back(static_cast<std::int32_t>(*value));
    }
    set.reflectance.reserve(spectral_.columns.size());
    for (int column : spectral_.columns) {
        const std::optional<std::int64_t> value = parseDecimal(cells[static_cast<size_t>(column)], 6);
        if (!value)
            return notANumber(column);
        if (*value <= -1000 * kReflectanceUnits || *value >= 1000 * kReflectanceUnits)
            return fail(contentError(line, "field " + file.fields[static_cast<size_t>(column)] + ": reflectance " +
                                               decimalOf(*value) + " is out of range on either scale"));
        set.reflectance.push_back(static_cast<std::int32_t>(*value));
        valuesAbove2_ += *value > 2 * kReflectanceUnits;
    }
    values_ += static_cast<long long>(spectral_.columns.size());
    for (size_t axis = 0; file.hasXYZ && axis < 3; ++axis) {
        const std::string_view cell = cells[static_cast<size_t>(xyzColumns_[axis])];
        const auto parsed = std::from_chars(cell.data() + (cell.substr(0, 1) == "+"), cell.data() + cell.size(), set.XYZ[axis]);
        if (parsed.ec != std::errc() || parsed.ptr != cell.data() + cell.size() || !std::isfinite(set.XYZ[axis]))
            return notANumber(xyzColumns_[axis]);
    }
    file.sets.push_back(std::move(set));
    return std::nullopt;
}

// The scale: the paper's brightest band says it (about 0.9 on a 0-1 scale,
// about 90 in percent); without a paper, the bulk of the values does (more
// than half above 2: percent; at most 1 % above 2: 0-1). A stray value never
// flips a file, and evidence that contradicts itself or --scale is refused.
std::optional<ReadError> SetReader::decideScale()
{
    const std::vector<size_t> paper = file.paperSets();
    double paperPeak = 0.0;
    for (size_t band = 0; band < static_cast<size_t>(file.fileLayout.bands); ++band) {
        double sum = 0.0;
        for (size_t set : paper)
            sum += file.sets[set].reflectance[band];
        paperPeak = std::max(paperPeak, sum / static_cast<double>(paper.size()) / kReflectanceUnits);
    }
    const std::string evidence =
        paper.empty() ? std::to_string(valuesAbove2_) + " of " + std::to_string(values_) + " values are above 2"
                      : "the paper peaks at " + decimalOf(std::llround(paperPeak * kReflectanceUnits));
    const bool looksPercent = paper.empty() ? valuesAbove2_ * 2 > values_ : paperPeak > 2.0;
    const bool looksUnit = paper.empty() ? valuesAbove2_ * 100 <= values_ : paperPeak <= 2.0;
    file.scaleDetected = options_.scale == 0.0;
    if (file.scaleDetected) {
        if (!paper.empty() && looksUnit && valuesAbove2_ * 2 > values_)
            return contentError(0, evidence + " (a 0-1 scale), but " + std::to_string(valuesAbove2_) + " of " +
                                       std::to_string(values_) + " values are above 2 (percent); give --scale 1 or 100");
        if (!looksPercent && !looksUnit)
            return contentError(0, "cannot tell the reflectance scale: " + evidence + "; give --scale 1 or 100");
        file.scale = looksPercent ? 100.0 : 1.0;
    } else {
        file.scale = options_.scale;
        if ((file.scale == 1.0 && looksPercent) || (file.scale == 100.0 && valuesAbove2_ == 0))
            return contentError(0, "--scale " + std::string(file.scale == 1.0 ? "1" : "100") +
                                       " contradicts the data: " + evidence);
    }
    const bool resampling = file.fileLayout.firstNm != file.layout.firstNm ||
                            file.fileLayout.stepNm != file.layout.stepNm || file.fileLayout.bands != file.layout.bands;
    for (MeasurementSet& set : file.sets) {
        for (size_t band = 0; band < set.reflectance.size(); ++band) {
            const std::int32_t raw = set.reflectance[band];
            const std::int64_t value = file.scale == 100.0 ? divideToOdd(raw, 100) : raw;
            // Even fluorescent papers stay far below 3; the library takes integers.
            if (value < -kReflectanceUnits / 2 || value > 3 * kReflectanceUnits)
                return contentError(set.line, "field " + file.fields[static_cast<size_t>(spectral_.columns[band])] +
                                                  ": reflectance " + decimalOf(raw) + " is out of range on the 0-" +
                                                  (file.scale == 1.0 ? "1" : "100") + " scale (see --scale)");
            set.reflectance[band] = static_cast<std::int32_t>(value);
        }
        if (resampling)
            set.reflectance = resample(spectral_, set.reflectance);
    }
    return std::nullopt;
}

// A band in which the paper is 0 (or below) was never measured: instrument
// software pads 380 and 390 nm with 0. At either end of the range such bands
// take the nearest measured band's value in every set of the file; in the
// middle there is nothing to widen from.
std::optional<ReadError> SetReader::widenUnmeasuredBands()
{
    const std::vector<size_t> paper = file.paperSets();
    const int bands = file.layout.bands;
    std::vector<bool> unmeasured(static_cast<size_t>(bands), false);
    for (size_t set : paper)
        for (int band = 0; band < bands; ++band)
            if (file.sets[set].reflectance[static_cast<size_t>(band)] <= 0)
                unmeasured[static_cast<size_t>(band)] = true;
    int first = 0, last = bands - 1;
    while (first < bands && unmeasured[static_cast<size_t>(first)])
        ++first;
    while (last > first && unmeasured[static_cast<size_t>(last)])
        --last;
    const auto nm = [&](int band) { return std::to_string(file.layout.firstNm + file.layout.stepNm * band); };
    if (first == bands)
        return contentError(file.sets[paper.front()].line, "the paper's spectrum is 0 in every band");
    for (int band = first; band <= last; ++band)
        if (unmeasured[static_cast<size_t>(band)])
            return contentError(0, "the paper is 0 at " + nm(band) + " nm, inside the measured range; "
                                   "a paper reflects light in every band");
    if (first == 0 && last == bands - 1)
        return std::nullopt;
    for (MeasurementSet& set : file.sets) {
        std::fill(set.reflectance.begin(), set.reflectance.begin() + first, set.reflectance[static_cast<size_t>(first)]);
        std::fill(set.reflectance.begin() + last + 1, set.reflectance.end(), set.reflectance[static_cast<size_t>(last)]);
    }
    const auto range = [&](int from, int to) { return from == to ? nm(from) : nm(from) + "-" + nm(to); };
    std::string bandsText = first > 0 ? range(0, first - 1) : "";
    if (last < bands - 1)
        bandsText += (bandsText.empty() ? "" : " and ") + range(last + 1, bands - 1);
    const std::string from = (first > 0 ? nm(first) + " nm" : "") + (first > 0 && last < bands - 1 ? " and " : "") +
                             (last < bands - 1 ? nm(last) + " nm" : "");
    file.warnings.push_back("the paper is 0 at " + bandsText + " nm: taken as unmeasured and widened from " + from +
                            " in every set");
    return std::nullopt;
}

// Separations and forms are in percent; a file whose device values all lie
// within 0-1, some between the two, was written as fractions.
std::optional<ReadError> SetReader::checkDeviceScale() const
{
    bool fraction = false;
    for (const MeasurementSet& set : file.sets)
        for (std::int32_t value : set.device) {
            if (value > kDeviceUnits)
                return std::nullopt;
            fraction = fraction || (value > 0 && value < kDeviceUnits);
        }
    if (!fraction)
        return std::nullopt;
    return contentError(0, "every device value lies within 0-1: they look like fractions, but " +
                               file.deviceFields.front() + " ... are read in percent (100 is a solid)");
}

// A repeated identifier is a repeated measurement only when it names the
// same device values; otherwise the file contradicts itself. Without device
// fields an identifier names no patch to match, and sets stand on their own.
std::optional<ReadError> SetReader::checkRepeats() const
{
    if (file.deviceFields.empty())
        return std::nullopt;
    std::unordered_map<std::string_view, size_t> seen;
    seen.reserve(file.sets.size());
    for (size_t i = 0; i < file.sets.size(); ++i) {
        const MeasurementSet& set = file.sets[i];
        if (set.id.empty())
            continue;
        const auto [at, fresh] = seen.emplace(set.id, i);
        const MeasurementSet& earlier = file.sets[at->second];
        if (!fresh && earlier.device != set.device)
            return ReadError{ReadFailure::Duplicate, set.line,
                             "duplicate patch: sample " + cgats::excerpt(set.id) + " is also on line " +
                                 std::to_string(earlier.line) + " with other device values"};
    }
    return std::nullopt;
}

// Valid but almost certainly wrong: a spectrum with no light in any band (all
// zero or negative). A few slightly negative bands are instrument noise on
// dark patches and pass unremarked.
void SetReader::warnAboutSpectra()
{
    size_t dark = 0;
    const MeasurementSet* first = nullptr;
    for (const MeasurementSet& set : file.sets)
        if (std::all_of(set.reflectance.begin(), set.reflectance.end(), [](std::int32_t v) { return v <= 0; }))
            first = dark++ == 0 ? &set : first;
    if (dark > 0)
        file.warnings.push_back(std::to_string(dark) + " set(s) read zero or negative in every band, the first " +
                                first->where() + ": no instrument reads that on paper or ink");
}

std::optional<ReadError> SetReader::finish()
{
    if (!file.deviceFields.empty())
        if (auto error = checkDeviceScale())
            return error;
    if (file.layout.present()) {
        if (auto error = decideScale())
            return error;
        if (!file.paperSets().empty())
            if (auto error = widenUnmeasuredBands())
                return error;
        warnAboutSpectra();
    }
    return checkRepeats();
}

ReadResult failure(ReadError error)
{
    ReadResult result;
    result.error = std::move(error);
    return result;
}

ReadResult readWith(const std::function<std::optional<cgats::Error>(cgats::Handler&)>& parse, const ReadOptions& options,
                    std::int64_t bytes)
{
    SetReader reader(options, bytes);
    if (std::optional<cgats::Error> error = parse(reader))
        return failure(reader.contentFailure ? *reader.contentFailure : syntaxError(error->line, error->message));
    if (std::optional<ReadError> error = reader.finish())
        return failure(*error);
    ReadResult result;
    result.file = std::move(reader.file);
    return result;
}

} // namespace

// ---- Public functions ---------------------------------------------------------------------

std::vector<double> MeasurementSet::devicePercent() const
{
    std::vector<double> percent;
    for (std::int32_t value : device)
        percent.push_back(static_cast<double>(value) / kDeviceUnits);
    return percent;
}

std::string MeasurementSet::where() const
{
    const std::string at = "line " + std::to_string(line);
    return id.empty() ? at : "sample " + cgats::excerpt(id) + " (" + at + ")";
}

std::string MeasurementFile::keyword(const std::string& name) const
{
    for (const auto& [key, value] : keywords)
        if (key == name)
            return value;
    return "";
}

std::string MeasurementFile::describeSpectra() const
{
    const bool same = fileLayout.firstNm == layout.firstNm && fileLayout.stepNm == layout.stepNm &&
                      fileLayout.bands == layout.bands;
    return fileLayout.describe() + (same ? "" : ", resampled to " + layout.describe());
}

std::string MeasurementFile::describeFields() const
{
    std::string list;
    for (const std::string& field : fields)
        list += (list.empty() ? "" : ", ") + field;
    return "its fields: " + cgats::excerpt(list, 100);
}

std::vector<size_t> MeasurementFile::paperSets() const
{
    std::vector<size_t> paper;
    if (deviceFields.empty())
        return sets.size() == 1 ? std::vector<size_t>{0} : paper;
    for (size_t i = 0; i < sets.size(); ++i)
        if (std::all_of(sets[i].device.begin(), sets[i].device.end(), [](std::int32_t v) { return v == 0; }))
            paper.push_back(i);
    return paper;
}

std::vector<int> averageThousandths(const MeasurementFile& file, const size_t* sets, size_t count)
{
    std::vector<int> mean(static_cast<size_t>(file.layout.bands));
    for (size_t band = 0; band < mean.size(); ++band) {
        std::int64_t sum = 0;
        for (size_t i = 0; i < count; ++i)
            sum += file.sets[sets[i]].reflectance[band];
        const std::int64_t divisor = static_cast<std::int64_t>(count) * (kReflectanceUnits / 1000);
        mean[band] = static_cast<int>(divideRounded(sum, divisor));
    }
    return mean;
}

std::string ReadError::describe() const
{
    return line > 0 ? "line " + std::to_string(line) + ": " + message : message;
}

std::pair<int, int> colorFieldOf(const std::string& name)
{
    const std::string field = upper(name);
    const size_t mark = field.find("CLR_");
    if (mark == std::string::npos || mark == 0 || mark > 2 || field.size() == mark + 4 || field.size() > mark + 6)
        return {0, 0};
    const std::string n = field.substr(0, mark), k = field.substr(mark + 4);
    auto digits = [](const std::string& s) {
        return std::all_of(s.begin(), s.end(), [](char c) { return std::isdigit(static_cast<unsigned char>(c)); });
    };
    if (!digits(n) || !digits(k))
        return {0, 0};
    const int channels = std::stoi(n), channel = std::stoi(k);
    if (channels < 2 || channels > 15 || channel < 1 || channel > channels)
        return {0, 0};
    return {channels, channel};
}

ReadResult readMeasurementText(std::string_view text, const ReadOptions& options)
{
    return readWith([&](cgats::Handler& handler) { return cgats::readText(text, handler); }, options,
                    static_cast<std::int64_t>(text.size()));
}

ReadResult readMeasurementFile(const std::string& path, const ReadOptions& options)
{
    const auto unreadable = [](std::string message) { return failure(ReadError{ReadFailure::Unreadable, 0, std::move(message)}); };
    // Looked at before it is opened: opening a FIFO without a writer would wait for ever.
    struct stat status {};
    if (::stat(path.c_str(), &status) != 0)
        return unreadable(std::string("cannot open: ") + std::strerror(errno));
    if (S_ISDIR(status.st_mode))
        return unreadable("is a folder, not a file");
    if (!S_ISREG(status.st_mode))
        return unreadable("not a regular file (a pipe, device or socket): give a file");
    if (status.st_size > kMaxFileBytes)
        return unreadable("is " + std::to_string(status.st_size >> 20) + " MiB; measurement files of more than " +
                          std::to_string(kMaxFileBytes >> 20) + " MiB are refused");
    const int descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (descriptor < 0)
        return unreadable(std::string("cannot open: ") + std::strerror(errno));
    int readError = 0;
    std::int64_t total = 0;
    const cgats::Source source = [&](char* buffer, size_t capacity) -> size_t {
        for (;;) {
            const ssize_t got = ::read(descriptor, buffer, capacity);
            if (got < 0 && errno == EINTR)
                continue;
            if (got < 0)
                readError = errno;
            total += got > 0 ? got : 0;
            // A file that grows while it is read stops at the limit.
            return got > 0 && total <= kMaxFileBytes ? static_cast<size_t>(got) : 0;
        }
    };
    ReadResult result = readWith([&](cgats::Handler& handler) { return cgats::read(source, handler); }, options,
                                 status.st_size);
    ::close(descriptor);
    if (readError != 0)
        return unreadable(std::string("read error: ") + std::strerror(readError));
    return result;
}

} // namespace veltmarquist
