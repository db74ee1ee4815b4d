// CGATS / IT8 text: the grammar of measurement files, read and written.
//
// A CGATS text is a sheet-type line (CGATS.17, ISO28178, IT8.7/4, CTI3, ...),
// header keywords with their values, the field names between
// BEGIN_DATA_FORMAT and END_DATA_FORMAT, and one data row per line between
// BEGIN_DATA and END_DATA. Blanks and TABs both separate cells outside
// quotes, a quoted value may hold either, and `#` starts a comment wherever a
// cell could start. Lines end in LF, CR LF or a lone CR; a UTF-8 BOM is
// skipped. NUMBER_OF_FIELDS and NUMBER_OF_SETS are checked when present and
// may be left out (a NUMBER_OF_FIELDS that only the rows' length contradicts
// becomes a warning: the names and every row agree, nothing is lost). Only the first data table is read; whatever follows its
// END_DATA is ignored. Keywords are only ever text: no line makes the reader
// open another file.
//
// The reader streams: data rows are handed to a handler one at a time, so
// memory stays with what the handler keeps. No limit on the number of sets.
#ifndef VELTMARQUIST_MEASUREMENTS_CGATS_H
#define VELTMARQUIST_MEASUREMENTS_CGATS_H

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace veltmarquist::cgats {

struct Keyword {
    std::string name;
    std::string value; // without its quotes; an unquoted multi-word value as written
    int line = 0;
};

struct Error {
    int line = 0; // 0 when the error concerns no single line
    std::string message;
};

struct Header {
    std::string sheetType;         // the first line, trimmed ("" when the file starts with a keyword)
    std::vector<Keyword> keywords; // in file order, before BEGIN_DATA
    std::vector<std::string> fields;
    int formatLine = 0; // line of BEGIN_DATA_FORMAT
    // Defects that lose nothing: a NUMBER_OF_FIELDS that disagrees with the
    // field names when the rows agree with the names.
    std::vector<Error> warnings;

    const Keyword* find(std::string_view name) const; // case-insensitive; null when absent
};

// Receives the table while it is read. A handler's error stops the reading.
class Handler {
public:
    virtual ~Handler() = default;
    // At BEGIN_DATA, with the header complete.
    virtual std::optional<Error> begin(const Header& header) = 0;
    // One data row: as many cells as fields, valid only during the call.
    virtual std::optional<Error> row(int line, const std::vector<std::string_view>& cells) = 0;
};

// Fills `buffer` with up to `capacity` bytes; 0 at the end of the input.
using Source = std::function<size_t(char* buffer, size_t capacity)>;

// The longest line the reader takes (a 1000-field row is about 10 KB).
constexpr size_t kMaxLineBytes = size_t(1) << 20;

std::optional<Error> read(const Source& source, Handler& handler);
std::optional<Error> readText(std::string_view text, Handler& handler);

// The whole first table in memory, for small files and tests.
struct Table {
    Header header;
    std::vector<int> rowLines;
    std::vector<std::vector<std::string>> rows;
};
std::pair<Table, std::optional<Error>> readTable(std::string_view text);

// A CGATS.17 text: the sheet type, keywords (values always quoted), the
// counts, the fields and the rows, TAB-separated with LF line ends. Cells
// with blanks, TABs or a leading `#` or quote are quoted. Throws
// std::invalid_argument for what CGATS cannot hold: a value with a double
// quote or a line end, a row of the wrong length, or a field name that is
// not one plain word.
struct Document {
    std::string sheetType = "CGATS.17";
    std::vector<std::pair<std::string, std::string>> keywords;
    std::vector<std::string> fields;
    std::vector<std::vector<std::string>> rows;
};
std::string write(const Document& document);

// The same text in pieces, for a writer that streams its rows: everything
// up to and including BEGIN_DATA, one cell of a row (TAB before all but the
// first, quoted as write quotes it), and the text after the last row.
std::string headerText(const std::string& sheetType, const std::vector<std::pair<std::string, std::string>>& keywords,
                       const std::vector<std::string>& fields, size_t sets);
void appendCell(std::string& line, const std::string& value, bool first);
constexpr const char* kEndText = "END_DATA\n";

// `text` cut to `limit` characters with "..." when longer: file content in
// messages stays short whatever the file holds.
std::string excerpt(std::string_view text, size_t limit = 40);

} // namespace veltmarquist::cgats

#endif // VELTMARQUIST_MEASUREMENTS_CGATS_H
