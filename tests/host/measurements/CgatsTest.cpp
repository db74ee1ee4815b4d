// The CGATS grammar: texts that real files hold, and hostile ones, to fields and cells or to one error line.
#include "Cgats.h"

#include <gtest/gtest.h>

using namespace veltmarquist;

namespace {

const std::string kFormat = "BEGIN_DATA_FORMAT\nSAMPLE_ID NAME VALUE\nEND_DATA_FORMAT\n";

struct Case {
    const char* name;
    std::string text;
    const char* result; // the cells of the last row joined by '|', or "line N: " and the start of the error
};

std::string outcome(const std::string& text)
{
    const auto [table, error] = cgats::readTable(text);
    if (error)
        return "line " + std::to_string(error->line) + ": " + error->message;
    std::string cells;
    for (const std::string& cell : table.rows.back())
        cells += (cells.empty() ? "" : "|") + cell;
    return cells;
}

} // namespace

TEST(Cgats, ReadsWhatRealFilesHoldAndNamesTheLineOfEachDefect)
{
    const Case cases[] = {
        {"BlanksAndTabsMixed", "CGATS.17\n" + kFormat + "BEGIN_DATA\n1 \t a\t  2.5\nEND_DATA\n", "1|a|2.5"},
        {"QuotedTabAndComment", "CTI3\n" + kFormat + "BEGIN_DATA\n1\t\"a\tb\" 2 # checked\nEND_DATA\n", "1|a\tb|2"},
        {"ApostropheAndCrLineEnds", "\xEF\xBB\xBFIT8.7/4\rDESCRIPTOR don't know\r" + kFormat + "BEGIN_DATA\r1 don't 3\rEND_DATA\r",
         "1|don't|3"},
        {"OnlyTheFirstTableIsRead", "LGOROWLENGTH 54\n" + kFormat + "BEGIN_DATA\n1 a 2\nEND_DATA\nCAL\n.INCLUDE x\n", "1|a|2"},
        {"CountsChecked", "CGATS.17\nNUMBER_OF_FIELDS 3\n" + kFormat + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 a 2\nEND_DATA\n", "1|a|2"},
        {"Include", "CGATS.17\n.INCLUDE \"/etc/passwd\"\n" + kFormat, "line 2: .INCLUDE: the reader opens no other files"},
        {"SetsNotANumber", "CGATS.17\n" + kFormat + "NUMBER_OF_SETS \"many\"\n", "line 5: NUMBER_OF_SETS \"many\" is not a number"},
        {"SetsMiscounted", "CGATS.17\n" + kFormat + "NUMBER_OF_SETS 3\nBEGIN_DATA\n1 a 2\nEND_DATA\n",
         "line 5: NUMBER_OF_SETS says 3, but the data holds 1 sets"},
        {"FieldsMiscountedRowsAgree", "CGATS.17\nNUMBER_OF_FIELDS 4\n" + kFormat + "BEGIN_DATA\n1 a 2\nEND_DATA\n", "1|a|2"},
        {"ShortRow", "CGATS.17\n" + kFormat + "BEGIN_DATA\n1 a\n", "line 6: 2 values, but 3 fields are declared"},
        {"CutShort", "CGATS.17\n" + kFormat + "BEGIN_DATA\n1 a 2\n", "line 6: the data ends without END_DATA"},
        {"ExcelQuotes", "CGATS.17\n" + kFormat + "BEGIN_DATA\n1 \"6\"\" strip\" 2\n", "line 6: doubled quotes"},
        {"Spreadsheet", "SAMPLE_ID;CMYK_C;CMYK_M\n1;0;0\n", "line 1: a spreadsheet table (SAMPLE_ID;CMYK_C;CMYK_M)"},
        {"DataBeforeFormat", "CGATS.17\nBEGIN_DATA\n", "line 2: BEGIN_DATA comes before any BEGIN_DATA_FORMAT"},
        {"NulBytes", std::string("CGATS.17\nA\0B\n", 13), "line 2: the file holds NUL bytes"},
        {"NotCgats", "Report of 12 March\nall good\n", "line 0: no BEGIN_DATA_FORMAT line"},
        // Files taken for measurements by mistake are named for what they are.
        {"ChartTemplate", "\nBOXES 286\n  F _ _ 22 14\n", "line 2: a chart recognition template (BOXES ...)"},
        {"Xml", "<?xml version=\"1.0\"?>\n<cc:CxF>\n", "line 1: an XML document (<?xml), not CGATS text"},
        {"IccProfile", std::string(36, 'x') + "acsp" + std::string("\0\0", 2) + "\n", "line 1: an ICC profile"},
        {"LongToken", "CGATS.17\n" + std::string(5000, '1') + "\n",
         "line 2: '1111111111111111111111111111111111111111...' is not a CGATS keyword"},
    };
    for (const Case& test : cases) {
        SCOPED_TRACE(test.name);
        EXPECT_EQ(outcome(test.text).substr(0, std::string(test.result).size()), test.result);
    }
}
