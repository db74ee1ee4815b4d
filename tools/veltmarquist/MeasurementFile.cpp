// Reading CGATS / IT8 measurement files: normalise the text, let LittleCMS's
// IT8 parser read it, then find the device, spectral and XYZ fields.
#include "MeasurementFile.h"

#include <lcms2.h>

#include <algorithm>
#include <cctype>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <memory>

namespace veltmarquist {

namespace {

// ---- Text helpers -------------------------------------------------------------

std::string upper(std::string text)
{
    for (char& c : text)
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return text;
}

bool isBlank(char c)
{
    return c == ' ' || c == '\t';
}

std::string trim(const std::string& text)
{
    size_t begin = 0, end = text.size();
    while (begin < end && isBlank(text[begin]))
        ++begin;
    while (end > begin && isBlank(text[end - 1]))
        --end;
    return text.substr(begin, end - begin);
}

// Splits the text into lines at LF, CR LF or a lone CR; drops a UTF-8 BOM.
std::vector<std::string> splitLines(const std::string& text)
{
    std::vector<std::string> lines;
    size_t start = text.compare(0, 3, "\xEF\xBB\xBF") == 0 ? 3 : 0;
    std::string current;
    for (size_t i = start; i < text.size(); ++i) {
        const char c = text[i];
        if (c == '\r' || c == '\n') {
            lines.push_back(current);
            current.clear();
            if (c == '\r' && i + 1 < text.size() && text[i + 1] == '\n')
                ++i;
        } else {
            current += c;
        }
    }
    if (!current.empty())
        lines.push_back(current);
    return lines;
}

bool quoted(const std::string& value)
{
    return value.size() >= 2 && (value.front() == '"' || value.front() == '\'') && value.back() == value.front();
}

// Cells of a line: TAB-separated when the line has a TAB, else separated by
// runs of blanks. Quoted strings may hold separators.
std::vector<std::string> splitCells(const std::string& line)
{
    const bool tabs = line.find('\t') != std::string::npos;
    std::vector<std::string> cells;
    std::string cell;
    char quote = 0;
    bool any = false;
    for (char c : line) {
        if (quote != 0) {
            cell += c;
            if (c == quote)
                quote = 0;
        } else if (c == '"' || c == '\'') {
            quote = c;
            cell += c;
            any = true;
        } else if (tabs ? c == '\t' : isBlank(c)) {
            if (tabs || any)
                cells.push_back(trim(cell));
            cell.clear();
            any = false;
        } else {
            cell += c;
            any = any || !isBlank(c);
        }
    }
    if (tabs || any)
        cells.push_back(trim(cell));
    return cells;
}

// A number the CGATS parser takes as it is: -?digits(.digits)?, not too long.
bool plainDecimal(const std::string& text)
{
    size_t i = text[0] == '-' ? 1 : 0;
    const size_t digitsStart = i;
    while (i < text.size() && std::isdigit(static_cast<unsigned char>(text[i])))
        ++i;
    if (i == digitsStart)
        return false;
    if (i < text.size() && text[i] == '.') {
        const size_t fraction = ++i;
        while (i < text.size() && std::isdigit(static_cast<unsigned char>(text[i])))
            ++i;
        if (i == fraction)
            return false;
    }
    return i == text.size() && text.size() <= 32;
}

// A quoted string for the CGATS parser; CGATS strings have no escapes, so an
// inner double quote becomes a single one.
std::string quote(std::string value)
{
    std::replace(value.begin(), value.end(), '"', '\'');
    return '"' + value + '"';
}

// Names the CGATS parser reads as identifiers (it misreads names that start
// with a digit, such as 6CLR_1, and rejects quoted ones).
bool identifier(const std::string& name)
{
    if (name.empty() || !(std::isalpha(static_cast<unsigned char>(name[0])) || name[0] == '_'))
        return false;
    return std::all_of(name.begin(), name.end(), [](char c) {
        return std::isalnum(static_cast<unsigned char>(c)) || c == '_' || c == '.' || c == '-' || c == '/';
    });
}

bool parseNumber(const std::string& text, double& value)
{
    std::string_view view(text);
    if (quoted(text))
        view = view.substr(1, view.size() - 2);
    if (!view.empty() && view.front() == '+')
        view.remove_prefix(1);
    const auto result = std::from_chars(view.data(), view.data() + view.size(), value);
    return result.ec == std::errc() && result.ptr == view.data() + view.size() && std::isfinite(value);
}

std::string shortNumber(double value)
{
    char text[32];
    std::snprintf(text, sizeof text, "%g", value);
    return text;
}

ReadError syntaxError(int line, std::string message)
{
    return ReadError{Failure::InputSyntax, line, std::move(message)};
}

ReadError contentError(int line, std::string message)
{
    return ReadError{Failure::InputContent, line, std::move(message)};
}

// ---- Normalisation ----------------------------------------------------------------

class Normaliser {
public:
    NormalisedText run(const std::string& text);

private:
    enum class Section { Header, Format, Data, Done };

    void emit(const std::string& line, int original)
    {
        out_.push_back(line);
        result_.originalLine.push_back(original);
    }
    void headerLine(const std::string& line, int number);
    void dataLine(const std::string& line, int number);
    void finish();
    void fail(ReadError error)
    {
        if (!result_.error)
            result_.error = std::move(error);
    }

    NormalisedText result_;
    std::vector<std::string> out_;
    Section section_ = Section::Header;
    // Declared counts and their lines; line 0: not declared.
    std::pair<long, int> fieldCount_{0, 0}, setCount_{0, 0};
    int formatAt_ = -1, dataAt_ = -1; // indices in out_ of BEGIN_DATA_FORMAT / BEGIN_DATA
};

void Normaliser::headerLine(const std::string& line, int number)
{
    const std::vector<std::string> cells = splitCells(line);
    const std::string keyword = cells.empty() ? std::string() : cells[0];
    const std::string value = trim(line.substr(line.find(keyword) + keyword.size()));
    if (!identifier(keyword))
        return fail(syntaxError(number, "'" + keyword + "' is not a CGATS keyword"));
    const std::string name = upper(keyword);
    if (name == "BEGIN_DATA_FORMAT") {
        formatAt_ = static_cast<int>(out_.size());
        section_ = Section::Format;
        return emit(keyword, number);
    }
    if (name == "BEGIN_DATA") {
        if (result_.fields.empty())
            return fail(syntaxError(number, "BEGIN_DATA comes before any BEGIN_DATA_FORMAT"));
        dataAt_ = static_cast<int>(out_.size());
        section_ = Section::Data;
        return emit(keyword, number);
    }
    if (name == "NUMBER_OF_FIELDS")
        fieldCount_ = {std::atol(value.c_str()), number};
    if (name == "NUMBER_OF_SETS")
        setCount_ = {std::atol(value.c_str()), number};
    if (value.empty()) // also the first line that names the file type (CGATS.17, ISO28178, ...)
        return emit(keyword, number);
    if (quoted(value) || plainDecimal(value))
        return emit(keyword + "\t" + value, number);
    emit(keyword + "\t" + quote(value), number); // CREATED  July 2023 and the like
}

void Normaliser::dataLine(const std::string& line, int number)
{
    if (upper(trim(line)) == "END_DATA") {
        section_ = Section::Done;
        return emit("END_DATA", number);
    }
    const std::vector<std::string> cells = splitCells(line);
    if (cells.size() != result_.fields.size())
        return fail(syntaxError(number, std::to_string(cells.size()) + " values, but " +
                                            std::to_string(result_.fields.size()) + " fields are declared"));
    std::string joined;
    for (size_t i = 0; i < cells.size(); ++i) {
        const std::string& cell = cells[i];
        if (cell.empty())
            return fail(syntaxError(number, "no value for field " + result_.fields[i]));
        if (!joined.empty())
            joined += '\t';
        // Anything but a plain decimal (exponent forms included, which the
        // parser misreads) is handed over as a string and converted here.
        joined += quoted(cell) || plainDecimal(cell) ? cell : quote(cell);
    }
    result_.dataLines.push_back(number);
    emit(joined, number);
}

void Normaliser::finish()
{
    if (formatAt_ < 0)
        return fail(syntaxError(0, "no BEGIN_DATA_FORMAT line: not a CGATS measurement file"));
    if (dataAt_ < 0)
        return fail(syntaxError(0, "no BEGIN_DATA line: the file holds no data"));
    if (result_.dataLines.empty())
        return fail(contentError(0, "the file holds no data sets"));
    const long rows = static_cast<long>(result_.dataLines.size()), fields = static_cast<long>(result_.fields.size());
    if (setCount_.second > 0 && setCount_.first != rows)
        return fail(syntaxError(setCount_.second, "NUMBER_OF_SETS says " + std::to_string(setCount_.first) +
                                                      ", but the data holds " + std::to_string(rows) + " sets"));
    if (fieldCount_.second > 0 && fieldCount_.first != fields)
        return fail(syntaxError(fieldCount_.second, "NUMBER_OF_FIELDS says " + std::to_string(fieldCount_.first) +
                                                        ", but the format names " + std::to_string(fields) + " fields"));
    // The parser needs both counts; add the ones the file leaves out.
    if (setCount_.second == 0) {
        out_.insert(out_.begin() + dataAt_, "NUMBER_OF_SETS\t" + std::to_string(result_.dataLines.size()));
        result_.originalLine.insert(result_.originalLine.begin() + dataAt_, result_.originalLine[dataAt_]);
    }
    if (fieldCount_.second == 0) {
        out_.insert(out_.begin() + formatAt_, "NUMBER_OF_FIELDS\t" + std::to_string(result_.fields.size()));
        result_.originalLine.insert(result_.originalLine.begin() + formatAt_, result_.originalLine[formatAt_]);
    }
}

NormalisedText Normaliser::run(const std::string& text)
{
    if (text.find('\0') != std::string::npos)
        fail(syntaxError(0, "the file holds NUL bytes: not a text file"));
    const std::vector<std::string> lines = splitLines(text);
    for (size_t i = 0; i < lines.size() && !result_.error && section_ != Section::Done; ++i) {
        const int number = static_cast<int>(i) + 1;
        const std::string line = trim(lines[i]);
        if (line.empty() || line[0] == '#') {
            emit(line, number);
            continue;
        }
        switch (section_) {
        case Section::Header:
            headerLine(line, number);
            break;
        case Section::Format: {
            for (const std::string& name : splitCells(line)) {
                if (upper(name) == "END_DATA_FORMAT") {
                    section_ = Section::Header;
                    break;
                }
                result_.fields.push_back(name);
            }
            if (section_ == Section::Header) {
                std::string names;
                for (size_t f = 0; f < result_.fields.size(); ++f) {
                    // Names the parser cannot read as identifiers get an alias;
                    // the original names are kept by column.
                    const std::string& name = result_.fields[f];
                    names += (f ? "\t" : "") + (identifier(name) ? name : "FIELD_" + std::to_string(f + 1));
                }
                emit(names, number);
                emit("END_DATA_FORMAT", number);
            }
            break;
        }
        case Section::Data:
            dataLine(line, number);
            break;
        case Section::Done:
            break;
        }
    }
    if (!result_.error && section_ == Section::Format)
        fail(syntaxError(0, "no END_DATA_FORMAT line"));
    if (!result_.error)
        finish();
    for (const std::string& line : out_)
        result_.text += line + '\n';
    return std::move(result_);
}

// ---- Parsing with LittleCMS --------------------------------------------------------------

// Collects the parser's last message (the context carries it, so separate
// readers in separate threads do not mix their messages).
struct ParserMessages {
    std::string first;
};

void collectMessage(cmsContext context, cmsUInt32Number, const char* text)
{
    // The first message names the defect; later ones follow from it.
    auto* messages = static_cast<ParserMessages*>(cmsGetContextUserData(context));
    if (messages != nullptr && text != nullptr && messages->first.empty())
        messages->first = text;
}

// "Line 12, Count mismatch..." from the parser, with the line number
// translated to the line of the original file.
ReadError parserError(const std::string& message, const std::vector<int>& originalLine)
{
    std::string text = message;
    while (!text.empty() && (text[0] == ':' || text[0] == ' '))
        text.erase(0, 1);
    while (!text.empty() && std::isspace(static_cast<unsigned char>(text.back())))
        text.pop_back();
    int line = 0;
    if (text.compare(0, 5, "Line ") == 0) {
        const size_t comma = text.find(',');
        const int parsed = std::atoi(text.c_str() + 5);
        if (parsed >= 1 && static_cast<size_t>(parsed) <= originalLine.size())
            line = originalLine[static_cast<size_t>(parsed) - 1];
        if (comma != std::string::npos)
            text = trim(text.substr(comma + 1));
    }
    if (text.empty())
        text = "the CGATS parser rejected the file";
    return syntaxError(line, text);
}

struct ContextDeleter {
    void operator()(void* context) const { cmsDeleteContext(static_cast<cmsContext>(context)); }
};
struct HandleDeleter {
    void operator()(void* handle) const { cmsIT8Free(handle); }
};

// Fields that carry the device values: a complete nCLR_1..nCLR_n family, or
// CMYK_C, CMYK_M, CMYK_Y, CMYK_K.
std::optional<ReadError> findDeviceFields(const std::vector<std::string>& fields, std::vector<int>& columns)
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
                return contentError(0, "field " + std::to_string(n) + "CLR_" + std::to_string(k) +
                                           " is missing from the " + std::to_string(n) + "CLR channels");
            columns.push_back(members.at(k));
        }
        return std::nullopt;
    }
    if (cmyk.empty())
        return std::nullopt;
    for (const char* name : {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"}) {
        if (!cmyk.count(name))
            return contentError(0, std::string("field ") + name + " is missing beside the other CMYK fields");
        columns.push_back(cmyk.at(name));
    }
    return std::nullopt;
}

const char* const kLayoutHelp = "; supported: 10 nm steps covering at least 400-700 nm, or 16 bands 400-700 nm "
                                "in 20 nm steps";

// Layout of the spectral fields, with their columns in wavelength order.
std::optional<ReadError> findSpectralLayout(const std::vector<std::string>& fields, SpectralLayout& layout,
                                            std::vector<int>& columns)
{
    std::map<int, int> byWavelength;
    for (size_t i = 0; i < fields.size(); ++i) {
        const int nm = wavelengthOfField(fields[i]);
        if (nm == 0)
            continue;
        if (!byWavelength.emplace(nm, static_cast<int>(i)).second)
            return contentError(0, "unknown spectral layout: fields " + fields[byWavelength[nm]] + " and " +
                                       fields[i] + " both name " + std::to_string(nm) + " nm");
    }
    if (byWavelength.empty())
        return std::nullopt;
    std::vector<int> nm;
    for (const auto& [wavelength, column] : byWavelength) {
        nm.push_back(wavelength);
        columns.push_back(column);
    }
    const std::string range = std::to_string(nm.front()) + "-" + std::to_string(nm.back()) + " nm";
    if (nm.size() < 2)
        return contentError(0, "unknown spectral layout: a single band at " + range + kLayoutHelp);
    const int step = nm[1] - nm[0];
    for (size_t i = 1; i < nm.size(); ++i)
        if (nm[i] - nm[i - 1] != step)
            return contentError(0, "unknown spectral layout: bands " + std::to_string(nm[i - 1]) + " and " +
                                       std::to_string(nm[i]) + " nm break the " + std::to_string(step) +
                                       " nm steps" + kLayoutHelp);
    layout = SpectralLayout{nm.front(), step, static_cast<int>(nm.size())};
    if (step == 20 && nm.front() == 400 && nm.size() == 16)
        return std::nullopt;
    if (step != 10 || nm.front() % 10 != 0 || nm.front() > 400 || nm.back() < 700)
        return contentError(0, "unknown spectral layout: " + std::to_string(nm.size()) + " bands " + range +
                                   " in " + std::to_string(step) + " nm steps" + kLayoutHelp);
    return std::nullopt;
}

int findField(const std::vector<std::string>& fields, const char* wanted)
{
    for (size_t i = 0; i < fields.size(); ++i)
        if (upper(fields[i]) == wanted)
            return static_cast<int>(i);
    return -1;
}

ReadResult failure(ReadError error)
{
    ReadResult result;
    result.error = std::move(error);
    return result;
}

ReadResult extract(cmsHANDLE handle, const NormalisedText& normalised, const ReadOptions& options)
{
    MeasurementFile file;
    const char* type = cmsIT8GetSheetType(handle);
    file.fileType = type != nullptr ? type : "";
    char** names = nullptr;
    const cmsUInt32Number propertyCount = cmsIT8EnumProperties(handle, &names);
    for (cmsUInt32Number i = 0; i < propertyCount; ++i) {
        const char* value = cmsIT8GetProperty(handle, names[i]);
        file.keywords.emplace_back(names[i], value != nullptr ? value : "");
    }
    file.fields = normalised.fields;
    if (cmsIT8EnumDataFormat(handle, &names) != static_cast<int>(file.fields.size()))
        return failure(syntaxError(0, "the CGATS parser read a different number of fields"));

    std::vector<int> deviceColumns, spectralColumns;
    if (auto error = findDeviceFields(file.fields, deviceColumns))
        return failure(*error);
    if (auto error = findSpectralLayout(file.fields, file.layout, spectralColumns))
        return failure(*error);
    for (int column : deviceColumns)
        file.deviceFields.push_back(file.fields[static_cast<size_t>(column)]);
    const int idColumn = findField(file.fields, "SAMPLE_ID");
    const int nameColumn = findField(file.fields, "SAMPLE_NAME");
    const int xyzColumns[3] = {findField(file.fields, "XYZ_X"), findField(file.fields, "XYZ_Y"),
                               findField(file.fields, "XYZ_Z")};
    file.hasXYZ = xyzColumns[0] >= 0 && xyzColumns[1] >= 0 && xyzColumns[2] >= 0;

    const size_t count = normalised.dataLines.size();
    double largest = 0.0;
    for (size_t row = 0; row < count; ++row) {
        MeasurementSet set;
        set.line = normalised.dataLines[row];
        auto text = [&](int column) -> std::string {
            const char* cell = cmsIT8GetDataRowCol(handle, static_cast<int>(row), column);
            std::string value = cell != nullptr ? cell : "";
            return quoted(value) ? value.substr(1, value.size() - 2) : value;
        };
        auto number = [&](int column, double& value) {
            const std::string cell = text(column);
            if (parseNumber(cell, value))
                return true;
            return false;
        };
        auto badNumber = [&](int column) {
            return failure(contentError(set.line, "field " + file.fields[static_cast<size_t>(column)] + ": '" +
                                                      text(column) + "' is not a number"));
        };
        set.name = nameColumn >= 0 ? text(nameColumn) : "";
        set.id = idColumn >= 0 ? text(idColumn) : set.name;
        for (int column : deviceColumns) {
            set.device.push_back(0.0);
            if (!number(column, set.device.back()))
                return badNumber(column);
            if (set.device.back() < -0.05 || set.device.back() > 100.05)
                return failure(contentError(set.line, "field " + file.fields[static_cast<size_t>(column)] + ": " +
                                                          text(column) + " is outside 0-100 %"));
        }
        for (int column : spectralColumns) {
            set.reflectance.push_back(0.0);
            if (!number(column, set.reflectance.back()))
                return badNumber(column);
            largest = std::max(largest, set.reflectance.back());
        }
        for (int axis = 0; file.hasXYZ && axis < 3; ++axis)
            if (!number(xyzColumns[axis], set.XYZ[static_cast<size_t>(axis)]))
                return badNumber(xyzColumns[axis]);
        file.sets.push_back(std::move(set));
    }

    // Reflectance on a 0..1 scale stays below 2 even with strong brighteners;
    // on a 0..100 scale the paper alone is far above it.
    file.scaleDetected = options.scale == 0.0;
    file.scale = file.scaleDetected ? (largest > 2.0 ? 100.0 : 1.0) : options.scale;
    for (MeasurementSet& set : file.sets)
        for (size_t band = 0; band < set.reflectance.size(); ++band) {
            double& value = set.reflectance[band];
            value /= file.scale;
            // Even fluorescent papers stay far below 3; a larger value means
            // a wrong scale or a broken file, and the library takes integers.
            if (value < -0.5 || value > 3.0)
                return failure(contentError(set.line, "field " + file.fields[static_cast<size_t>(spectralColumns[band])] +
                                                          ": reflectance " + shortNumber(value * file.scale) +
                                                          " is out of range on the 0-" +
                                                          (file.scale == 1.0 ? "1" : "100") +
                                                          " scale (see --scale)"));
        }

    // A repeated identifier is a repeated measurement only when it names the
    // same device values; otherwise the file contradicts itself.
    std::map<std::string, size_t> seen;
    for (size_t i = 0; i < file.sets.size(); ++i) {
        const MeasurementSet& set = file.sets[i];
        if (set.id.empty())
            continue;
        const auto [at, fresh] = seen.emplace(set.id, i);
        if (!fresh && (file.deviceFields.empty() || file.sets[at->second].device != set.device))
            return failure(ReadError{Failure::DuplicatePatch, set.line,
                                     "duplicate patch: sample " + set.id + " is also on line " +
                                         std::to_string(file.sets[at->second].line) +
                                         (file.deviceFields.empty() ? "" : " with other device values")});
    }
    ReadResult result;
    result.file = std::move(file);
    return result;
}

} // namespace

// ---- Public functions ---------------------------------------------------------------------

std::string SpectralLayout::describe() const
{
    if (!present())
        return "no spectra";
    return std::to_string(bands) + " bands " + std::to_string(firstNm) + "-" + std::to_string(lastNm()) +
           " nm in " + std::to_string(stepNm) + " nm steps";
}

std::string MeasurementSet::where() const
{
    const std::string at = "line " + std::to_string(line);
    return id.empty() ? at : "sample " + id + " (" + at + ")";
}

std::string MeasurementFile::keyword(const std::string& name) const
{
    for (const auto& [key, value] : keywords)
        if (key == name)
            return value;
    return "";
}

std::string ReadError::describe() const
{
    return line > 0 ? "line " + std::to_string(line) + ": " + message : message;
}

int wavelengthOfField(const std::string& name)
{
    const std::string field = upper(name);
    for (const char* prefix : {"SPECTRAL_NM_", "SPECTRAL_NM", "SPECTRAL_", "NM"}) {
        const std::string p(prefix);
        if (field.compare(0, p.size(), p) != 0)
            continue;
        const std::string digits = field.substr(p.size());
        if (digits.size() < 3 || digits.size() > 4 ||
            !std::all_of(digits.begin(), digits.end(), [](char c) { return std::isdigit(static_cast<unsigned char>(c)); }))
            return 0;
        const int nm = std::stoi(digits);
        return nm >= 300 && nm <= 1100 ? nm : 0;
    }
    return 0;
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

NormalisedText normaliseCgatsText(const std::string& text)
{
    return Normaliser().run(text);
}

ReadResult readMeasurementText(const std::string& text, const ReadOptions& options)
{
    NormalisedText normalised = normaliseCgatsText(text);
    if (normalised.error)
        return failure(*normalised.error);

    ParserMessages messages;
    std::unique_ptr<void, ContextDeleter> context(cmsCreateContext(nullptr, &messages));
    if (!context)
        return failure(ReadError{Failure::Internal, 0, "cannot create a CGATS parser context"});
    cmsSetLogErrorHandlerTHR(static_cast<cmsContext>(context.get()), collectMessage);
    std::unique_ptr<void, HandleDeleter> handle(cmsIT8LoadFromMem(
        static_cast<cmsContext>(context.get()), normalised.text.data(),
        static_cast<cmsUInt32Number>(normalised.text.size())));
    if (!handle)
        return failure(parserError(messages.first, normalised.originalLine));
    if (cmsIT8TableCount(handle.get()) < 1)
        return failure(syntaxError(0, "the file holds no data table"));
    return extract(handle.get(), normalised, options);
}

} // namespace veltmarquist
