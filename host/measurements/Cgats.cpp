// The CGATS reader (lines, cells, sections) and writer.
#include "Cgats.h"

#include <algorithm>
#include <cctype>
#include <cstring>
#include <stdexcept>

namespace veltmarquist::cgats {

namespace {

bool isBlank(char c)
{
    return c == ' ' || c == '\t';
}

bool equalsIgnoringCase(std::string_view a, std::string_view b)
{
    return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) {
               return (x >= 'a' && x <= 'z' ? x - 32 : x) == (y >= 'a' && y <= 'z' ? y - 32 : y);
           });
}

std::string_view trim(std::string_view text)
{
    while (!text.empty() && isBlank(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && isBlank(text.back()))
        text.remove_suffix(1);
    return text;
}

// ---- Lines ------------------------------------------------------------------------------

// Cuts the source into lines at LF, CR LF or a lone CR, reading in blocks.
class LineReader {
public:
    explicit LineReader(const Source& source) : source_(source) {}

    // The next line (without its end) and its number; false at the end or on
    // an error (then error() is set).
    bool next(std::string_view& line)
    {
        for (;;) {
            const char* data = buffer_.data();
            size_t i = scanned_;
            while (i < buffer_.size() && data[i] != '\n' && data[i] != '\r')
                ++i;
            scanned_ = i;
            // A CR at the end of a block may be the first half of a CR LF.
            const bool complete = i < buffer_.size() && (data[i] == '\n' || i + 1 < buffer_.size() || ended_);
            if (complete) {
                line = std::string_view(data + start_, i - start_);
                const bool crlf = data[i] == '\r' && i + 1 < buffer_.size() && data[i + 1] == '\n';
                start_ = scanned_ = i + (crlf ? 2 : 1);
                return accept(line);
            }
            if (ended_) {
                if (start_ == buffer_.size())
                    return false;
                line = std::string_view(data + start_, buffer_.size() - start_);
                start_ = scanned_ = buffer_.size();
                return accept(line);
            }
            if (buffer_.size() - start_ > kMaxLineBytes)
                return fail(number_ + 1, "line " + std::to_string(number_ + 1) + " is longer than 1 MiB: not a CGATS text");
            refill();
        }
    }

    int number() const { return number_; }
    const std::optional<Error>& error() const { return error_; }

private:
    bool accept(std::string_view& line)
    {
        ++number_;
        if (number_ == 1 && line.substr(0, 3) == "\xEF\xBB\xBF")
            line.remove_prefix(3);
        if (number_ == 1 && line.size() >= 40 && line.substr(36, 4) == "acsp")
            return fail(number_, "an ICC profile, not a measurement file: give the measured CGATS file");
        if (std::memchr(line.data(), '\0', line.size()) != nullptr)
            return fail(number_, "the file holds NUL bytes: not a text file");
        return true;
    }

    bool fail(int line, std::string message)
    {
        error_ = Error{line, std::move(message)};
        return false;
    }

    void refill()
    {
        buffer_.erase(0, start_);
        scanned_ -= start_;
        start_ = 0;
        const size_t kept = buffer_.size();
        buffer_.resize(kept + kBlock);
        const size_t got = source_(&buffer_[kept], kBlock);
        buffer_.resize(kept + got);
        ended_ = got == 0;
    }

    static constexpr size_t kBlock = size_t(1) << 20;
    const Source& source_;
    std::string buffer_;
    size_t start_ = 0, scanned_ = 0;
    bool ended_ = false;
    int number_ = 0;
    std::optional<Error> error_;
};

// ---- Cells ------------------------------------------------------------------------------

// Splits a line into cells; quoted cells come without their quotes. A `"`
// opens a quoted value only at the start of a cell; an apostrophe does so
// only when another one closes the cell, so that Don't stays a word.
std::optional<std::string> splitCells(std::string_view line, std::vector<std::string_view>& cells,
                                      std::vector<bool>* quoted = nullptr)
{
    cells.clear();
    if (quoted != nullptr)
        quoted->clear();
    size_t i = 0;
    while (i < line.size()) {
        if (isBlank(line[i])) {
            ++i;
            continue;
        }
        if (line[i] == '#')
            break;
        const char mark = line[i];
        if (mark == '"' || mark == '\'') {
            const size_t close = line.find(mark, i + 1);
            const bool closesCell = close != std::string_view::npos &&
                                    (close + 1 == line.size() || isBlank(line[close + 1]) || line[close + 1] == '#');
            if (closesCell) {
                cells.push_back(line.substr(i + 1, close - i - 1));
                if (quoted != nullptr)
                    quoted->push_back(true);
                i = close + 1;
                continue;
            }
            if (mark == '"' && close == std::string_view::npos)
                return "a quoted value is not closed: " + excerpt(line.substr(i));
            if (mark == '"' && line[close + 1] == '"')
                return "doubled quotes (\"\") in " + excerpt(line.substr(i)) +
                       ": CGATS values cannot hold a double quote (a spreadsheet's escape)";
            if (mark == '"')
                return "text right after a closing quote: " + excerpt(line.substr(i));
        }
        const size_t end = std::find_if(line.begin() + static_cast<std::ptrdiff_t>(i), line.end(), isBlank) - line.begin();
        cells.push_back(line.substr(i, end - i));
        if (quoted != nullptr)
            quoted->push_back(false);
        i = end;
    }
    return std::nullopt;
}

// A keyword: letters, digits and _ . - / (not starting with a digit or a full stop).
bool isKeyword(std::string_view word)
{
    if (word.empty() || !(std::isalpha(static_cast<unsigned char>(word[0])) || word[0] == '_'))
        return false;
    return std::all_of(word.begin(), word.end(), [](char c) {
        return std::isalnum(static_cast<unsigned char>(c)) || c == '_' || c == '.' || c == '-' || c == '/';
    });
}

// A spreadsheet export: the first line holds three or more names joined by ; or ,.
bool looksLikeSpreadsheet(std::string_view line)
{
    if (line.find('\t') != std::string_view::npos)
        return false;
    return std::count(line.begin(), line.end(), ';') >= 2 ||
           (std::count(line.begin(), line.end(), ',') >= 2 && line.find(' ') > line.find(','));
}

std::optional<long long> count(std::string_view text)
{
    if (text.empty() || text.size() > 12 || !std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; }))
        return std::nullopt;
    return std::stoll(std::string(text));
}

// ---- Sections ------------------------------------------------------------------------------

class Parser {
public:
    Parser(const Source& source, Handler& handler) : lines_(source), handler_(handler) {}
    std::optional<Error> run();

private:
    enum class Section { Start, Header, Format, Data };

    std::optional<Error> headerLine(int number, std::string_view line);
    std::optional<Error> formatCells(int number, size_t from);
    std::optional<Error> dataLine(int number);
    std::optional<Error> beginData(int number);
    std::optional<Error> endData(int number);

    LineReader lines_;
    Handler& handler_;
    Header header_;
    Section section_ = Section::Start;
    std::vector<std::string_view> cells_;
    std::vector<bool> quoted_;
    std::pair<long long, int> fieldCount_{-1, 0}, setCount_{-1, 0}; // declared value and line
    long long rows_ = 0;
    bool ended_ = false;
};

std::optional<Error> Parser::run()
{
    std::string_view line;
    while (!ended_ && lines_.next(line)) {
        const int number = lines_.number();
        if (section_ == Section::Start && looksLikeSpreadsheet(trim(line)))
            return Error{number, "a spreadsheet table (" + excerpt(trim(line)) +
                                     "): save it as CGATS text with BEGIN_DATA_FORMAT and BEGIN_DATA"};
        if (auto message = splitCells(line, cells_, &quoted_))
            return Error{number, *message};
        if (cells_.empty())
            continue;
        std::optional<Error> error;
        if (section_ == Section::Start) {
            section_ = Section::Header;
            const std::string_view first = cells_[0];
            // Files people take for measurements by mistake, named for what they are.
            if (first == "BOXES")
                return Error{number, "a chart recognition template (BOXES ...): it lays out a target for scanning "
                                     "and holds no measurements; give the measured CGATS file"};
            if (first.substr(0, 1) == "<")
                return Error{number, "an XML document (" + excerpt(first) + "), not CGATS text; "
                                     "give the measurements as CGATS"};
            const bool keywordLine = equalsIgnoringCase(first, "BEGIN_DATA_FORMAT") ||
                                     equalsIgnoringCase(first, "NUMBER_OF_FIELDS") ||
                                     equalsIgnoringCase(first, "KEYWORD") || (cells_.size() > 1 && quoted_[1]);
            if (!keywordLine) {
                header_.sheetType = std::string(trim(line.substr(0, line.find('#'))));
                continue;
            }
        }
        if (section_ == Section::Header)
            error = headerLine(number, line);
        else if (section_ == Section::Format)
            error = formatCells(number, 0);
        else
            error = dataLine(number);
        if (error)
            return error;
    }
    if (lines_.error())
        return lines_.error();
    if (ended_)
        return std::nullopt;
    if (section_ == Section::Data)
        return Error{lines_.number(), "the data ends without END_DATA: the file is cut short"};
    if (header_.formatLine == 0)
        return Error{0, "no BEGIN_DATA_FORMAT line: not a CGATS measurement file"};
    return Error{0, "no BEGIN_DATA line: the file holds no data"};
}

std::optional<Error> Parser::headerLine(int number, std::string_view line)
{
    const std::string_view word = cells_[0];
    std::string_view bare = word;
    while (!bare.empty() && (bare[0] == '.' || bare[0] == '$'))
        bare.remove_prefix(1);
    if (equalsIgnoringCase(bare, "INCLUDE"))
        return Error{number, excerpt(word) + ": the reader opens no other files; include its content instead"};
    if (quoted_[0] || !isKeyword(word))
        return Error{number, "'" + excerpt(word) + "' is not a CGATS keyword"};
    if (equalsIgnoringCase(word, "BEGIN_DATA_FORMAT")) {
        if (header_.formatLine != 0)
            return Error{number, "a second BEGIN_DATA_FORMAT (the first is on line " +
                                     std::to_string(header_.formatLine) + ")"};
        header_.formatLine = number;
        section_ = Section::Format;
        return formatCells(number, 1);
    }
    if (equalsIgnoringCase(word, "BEGIN_DATA"))
        return beginData(number);
    if (equalsIgnoringCase(word, "END_DATA_FORMAT") || equalsIgnoringCase(word, "END_DATA"))
        return Error{number, std::string(word) + " without its BEGIN line"};
    // The value: one cell as it stands, else the rest of the line as written.
    std::string_view value = cells_.size() == 2 ? cells_[1] : std::string_view();
    if (cells_.size() > 2) {
        const size_t after = static_cast<size_t>(word.data() + word.size() - line.data());
        value = trim(line.substr(after, static_cast<size_t>(cells_.back().data() + cells_.back().size() - line.data()) +
                                             (quoted_.back() ? 1 : 0) - after));
    }
    for (auto* declared : {&fieldCount_, &setCount_}) {
        if (!equalsIgnoringCase(word, declared == &fieldCount_ ? "NUMBER_OF_FIELDS" : "NUMBER_OF_SETS"))
            continue;
        const std::optional<long long> n = count(value);
        if (!n)
            return Error{number, std::string(word) + " \"" + excerpt(value) + "\" is not a number of " +
                                     (declared == &fieldCount_ ? "fields" : "sets")};
        *declared = {*n, number};
    }
    header_.keywords.push_back({std::string(word), std::string(value), number});
    return std::nullopt;
}

std::optional<Error> Parser::formatCells(int number, size_t from)
{
    for (size_t i = from; i < cells_.size(); ++i) {
        if (!quoted_[i] && equalsIgnoringCase(cells_[i], "END_DATA_FORMAT")) {
            if (i + 1 != cells_.size())
                return Error{number, "text after END_DATA_FORMAT: " + excerpt(cells_[i + 1])};
            section_ = Section::Header;
            if (header_.fields.empty())
                return Error{number, "the data format names no fields"};
            return std::nullopt;
        }
        if (!quoted_[i] && (equalsIgnoringCase(cells_[i], "BEGIN_DATA") || equalsIgnoringCase(cells_[i], "END_DATA")))
            return Error{number, std::string(cells_[i]) + " inside the data format: END_DATA_FORMAT is missing"};
        header_.fields.emplace_back(cells_[i]);
    }
    return std::nullopt;
}

std::optional<Error> Parser::beginData(int number)
{
    if (cells_.size() > 1)
        return Error{number, "text after BEGIN_DATA: " + excerpt(cells_[1])};
    if (header_.formatLine == 0)
        return Error{number, "BEGIN_DATA comes before any BEGIN_DATA_FORMAT"};
    const long long fields = static_cast<long long>(header_.fields.size());
    if (fieldCount_.second > 0 && fieldCount_.first != fields)
        header_.warnings.push_back({fieldCount_.second, "NUMBER_OF_FIELDS says " + std::to_string(fieldCount_.first) +
                                                            ", but the format names " + std::to_string(fields) +
                                                            " fields; read as " + std::to_string(fields)});
    section_ = Section::Data;
    return handler_.begin(header_);
}

std::optional<Error> Parser::dataLine(int number)
{
    if (cells_.size() == 1 && !quoted_[0] && equalsIgnoringCase(cells_[0], "END_DATA"))
        return endData(number);
    if (cells_.size() != header_.fields.size())
        return Error{number, std::to_string(cells_.size()) + " values, but " + std::to_string(header_.fields.size()) +
                                 " fields are declared"};
    ++rows_;
    return handler_.row(number, cells_);
}

std::optional<Error> Parser::endData(int number)
{
    if (rows_ == 0)
        return Error{number, "the file holds no data sets"};
    if (setCount_.second > 0 && setCount_.first != rows_)
        return Error{setCount_.second, "NUMBER_OF_SETS says " + std::to_string(setCount_.first) +
                                           ", but the data holds " + std::to_string(rows_) + " sets"};
    ended_ = true;
    return std::nullopt;
}

// Collects the table for readTable.
class Collector : public Handler {
public:
    explicit Collector(Table& table) : table_(table) {}
    std::optional<Error> begin(const Header& header) override
    {
        table_.header = header;
        return std::nullopt;
    }
    std::optional<Error> row(int line, const std::vector<std::string_view>& cells) override
    {
        table_.rowLines.push_back(line);
        table_.rows.emplace_back(cells.begin(), cells.end());
        return std::nullopt;
    }

private:
    Table& table_;
};

// A cell or keyword value as the writer puts it: bare when it reads back as
// one plain cell, else in double quotes.
std::string writtenValue(const std::string& value, bool alwaysQuote)
{
    if (value.find_first_of("\"\r\n") != std::string::npos)
        throw std::invalid_argument("a CGATS value cannot hold a double quote or a line end: " + excerpt(value));
    const bool structural = equalsIgnoringCase(value, "END_DATA") || equalsIgnoringCase(value, "END_DATA_FORMAT") ||
                            equalsIgnoringCase(value, "BEGIN_DATA");
    const bool plain = !value.empty() && value.find_first_of(" \t") == std::string::npos && value[0] != '#' &&
                       value[0] != '\'' && value[0] != '"' && !structural;
    return plain && !alwaysQuote ? value : '"' + value + '"';
}

} // namespace

const Keyword* Header::find(std::string_view name) const
{
    for (const Keyword& keyword : keywords)
        if (equalsIgnoringCase(keyword.name, name))
            return &keyword;
    return nullptr;
}

std::optional<Error> read(const Source& source, Handler& handler)
{
    return Parser(source, handler).run();
}

std::optional<Error> readText(std::string_view text, Handler& handler)
{
    size_t at = 0;
    const Source source = [&](char* buffer, size_t capacity) {
        const size_t n = std::min(capacity, text.size() - at);
        std::memcpy(buffer, text.data() + at, n);
        at += n;
        return n;
    };
    return read(source, handler);
}

std::pair<Table, std::optional<Error>> readTable(std::string_view text)
{
    Table table;
    Collector collector(table);
    std::optional<Error> error = readText(text, collector);
    return {std::move(table), std::move(error)};
}

std::string headerText(const std::string& sheetType, const std::vector<std::pair<std::string, std::string>>& keywords,
                       const std::vector<std::string>& fields, size_t sets)
{
    std::string text = writtenValue(sheetType, false) + "\n";
    for (const auto& [name, value] : keywords) {
        if (!isKeyword(name))
            throw std::invalid_argument("not a CGATS keyword: " + excerpt(name));
        text += name + "\t" + writtenValue(value, true) + "\n";
    }
    text += "NUMBER_OF_FIELDS\t" + std::to_string(fields.size()) + "\nBEGIN_DATA_FORMAT\n";
    for (size_t i = 0; i < fields.size(); ++i) {
        if (writtenValue(fields[i], false) != fields[i])
            throw std::invalid_argument("a field name is one plain word: " + excerpt(fields[i]));
        text += (i == 0 ? "" : "\t") + fields[i];
    }
    return text + "\nEND_DATA_FORMAT\nNUMBER_OF_SETS\t" + std::to_string(sets) + "\nBEGIN_DATA\n";
}

void appendCell(std::string& line, const std::string& value, bool first)
{
    if (!first)
        line += '\t';
    line += writtenValue(value, false);
}

std::string write(const Document& document)
{
    std::string text = headerText(document.sheetType, document.keywords, document.fields, document.rows.size());
    for (const std::vector<std::string>& row : document.rows) {
        if (row.size() != document.fields.size())
            throw std::invalid_argument("a row of " + std::to_string(row.size()) + " values for " +
                                        std::to_string(document.fields.size()) + " fields");
        for (size_t i = 0; i < row.size(); ++i)
            appendCell(text, row[i], i == 0);
        text += '\n';
    }
    return text + kEndText;
}

std::string excerpt(std::string_view text, size_t limit)
{
    return text.size() <= limit ? std::string(text) : std::string(text.substr(0, limit)) + "...";
}

} // namespace veltmarquist::cgats
