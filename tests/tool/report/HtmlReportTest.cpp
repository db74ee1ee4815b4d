// The HTML report as a browser and other tools read it: well-formed XHTML
// with every section, nothing fetched from elsewhere, file text escaped, and
// the check's figures exactly as the text report prints them.
#include "TestSupport.h"
#include "commands/Commands.h"
#include "report/TextReport.h"

#include <gtest/gtest.h>
#include <libxml/parser.h>
#include <libxml/xpath.h>
#include <libxml/xpathInternals.h>

#include <sys/wait.h>

#include <fstream>
#include <regex>
#include <sstream>

using namespace veltmarquist;
namespace ts = testsupport;

namespace {

// A report parsed as XML, asked by XPath (h: XHTML, s: SVG).
class Page {
public:
    explicit Page(const std::string& html)
        : doc_(xmlReadMemory(html.data(), static_cast<int>(html.size()), "report.html", nullptr,
                             XML_PARSE_NONET | XML_PARSE_NOERROR | XML_PARSE_NOWARNING))
    {
    }
    ~Page() { xmlFreeDoc(doc_); }
    bool wellFormed() const { return doc_ != nullptr; }

    std::string string(const std::string& expression) const
    {
        xmlXPathObjectPtr result = evaluate("string(" + expression + ")");
        std::string value = result != nullptr && result->stringval != nullptr
                                ? reinterpret_cast<const char*>(result->stringval) : "(no result)";
        xmlXPathFreeObject(result);
        return value;
    }
    double count(const std::string& expression) const
    {
        xmlXPathObjectPtr result = evaluate("count(" + expression + ")");
        const double value = result != nullptr ? result->floatval : -1.0;
        xmlXPathFreeObject(result);
        return value;
    }

private:
    xmlXPathObjectPtr evaluate(const std::string& expression) const
    {
        if (doc_ == nullptr)
            return nullptr;
        xmlXPathContextPtr context = xmlXPathNewContext(doc_);
        xmlXPathRegisterNs(context, BAD_CAST "h", BAD_CAST "http://www.w3.org/1999/xhtml");
        xmlXPathRegisterNs(context, BAD_CAST "s", BAD_CAST "http://www.w3.org/2000/svg");
        xmlXPathObjectPtr result = xmlXPathEvalExpression(BAD_CAST expression.c_str(), context);
        xmlXPathFreeContext(context);
        return result;
    }

    xmlDocPtr doc_;
};

struct Case {
    const char* name;
    std::string form;
    int inks;          // 0: four colours
    bool yuleNielsen, fitGravure;
    std::vector<std::pair<const char*, double>> counts; // XPath, expected count
};

void PrintTo(const Case& run, std::ostream* out)
{
    *out << run.name;
}

const std::string kSamples = VELTMARQUIST_SAMPLES_DIR;
const std::string kRealData = VELTMARQUIST_SHARED_DATA_DIR "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt";

const std::vector<std::pair<const char*, double>> kFourColour = {
    {"//h:section[@id='summary' or @id='form' or @id='spectra' or @id='tone-values']", 4},
    {"//h:section[@id='form']//h:figure", 46},
    {"//h:section[@id='spectra']//s:svg", 18},
    {"//h:section[@id='tone-values']//s:svg", 4},
};
const std::vector<std::pair<const char*, double>> kChecked = {
    {"//h:section[@id='check']", 1}, {"//h:table[@id='worst']/h:tr", 16}, {"//*[starts-with(@id, 'error-map')]", 4}};

std::vector<std::pair<const char*, double>> operator+(std::vector<std::pair<const char*, double>> a,
                                                      const std::vector<std::pair<const char*, double>>& b)
{
    a.insert(a.end(), b.begin(), b.end());
    return a;
}

const Case kCases[] = {
    {"OffsetOnPressSheet", kSamples + "/offset_press_sheet.txt", 0, false, false, kFourColour + kChecked},
    {"YuleNielsenOnPressSheet", kSamples + "/offset_press_sheet.txt", 0, true, false, kFourColour + kChecked},
    {"FittedGravureOn16Bands", kSamples + "/offset_form_16band.txt", 0, false, true,
     kFourColour + std::vector<std::pair<const char*, double>>{{"//h:section[@id='check']", 0}}},
    {"YuleNielsenOnRealData", kRealData, 0, true, false, kFourColour + kChecked},
    {"SevenInks", kSamples + "/seven_ink_form.txt", 7, false, false,
     {{"//h:section", 4}, {"//h:section[@id='chart']//h:figure", 159}, {"//h:div[starts-with(@id, 'ramp-')]", 7}}},
    {"SixInks", kSamples + "/six_ink_form.txt", 6, false, false,
     {{"//h:section[@id='chart']//h:figure", 128}, {"//h:div[starts-with(@id, 'ramp-')]", 6},
      {"//h:table[@id='solids']/h:tr", 8}}},
};

// Runs report FORM in-process; the page and the text report of the run.
std::pair<std::string, std::string> report(const Case& run, const ts::TempDir& dir)
{
    std::ostringstream text;
    if (run.inks > 0) {
        MultiChannelJob job;
        job.form = run.form;
        job.inks = run.inks;
        job.report = dir.path("report.html");
        MultiChannelResult result;
        runMultiChannel(job, result);
        renderMultiChannel(result, text);
    } else {
        ChartJob job;
        job.form = run.form;
        job.report = dir.path("report.html");
        job.model = run.yuleNielsen ? ModelChoice::yuleNielsen
                                    : run.fitGravure ? ModelChoice::gravureFitted : ModelChoice::offset;
        ChartResult result;
        runChart(job, result);
        renderChart(result, text);
    }
    return {ts::readFile(dir.path("report.html")), text.str()};
}

class HtmlReport : public testing::TestWithParam<Case> {};

TEST_P(HtmlReport, IsSelfContainedXhtmlWithItsSectionsAndTheTextReportsCheck)
{
    const Case& run = GetParam();
    if (!ts::fileExists(run.form))
        GTEST_SKIP() << "no evaluation data set at " << run.form << " (the real press data set is not beside the project)";
    ts::TempDir dir;
    const auto [html, text] = report(run, dir);
    EXPECT_LT(html.size(), 2u << 20);
    const Page page(html);
    ASSERT_TRUE(page.wellFormed());
    for (const auto& [expression, expected] : run.counts) {
        SCOPED_TRACE(expression);
        EXPECT_EQ(page.count(expression), expected);
    }
    // Readable offline: no script, nothing loaded or linked from elsewhere; every figure named.
    EXPECT_EQ(page.count("//h:script | //h:link | //h:img | //h:iframe | //@src"), 0);
    EXPECT_EQ(page.count("//@href[not(starts-with(., '#'))]"), 0);
    EXPECT_EQ(page.count("//s:svg[not(s:title)]"), 0);

    // The figures the text report prints, as it prints them.
    for (const auto& [pattern, id] : {std::pair<const char*, const char*>{
                                          "check: (\\d+) .*CIEDE2000 mean (\\S+), 95th percentile (\\S+), max (\\S+)\n",
                                          "check"},
                                      {"  (\\d+) of them on the chart: mean (\\S+), 95th percentile (\\S+), max (\\S+)\n",
                                       "check-chart"}}) {
        std::smatch printed;
        const bool inText = std::regex_search(text, printed, std::regex(pattern));
        EXPECT_EQ(inText, page.count(std::string("//*[@id='") + id + "-count']") == 1) << id;
        if (!inText)
            continue;
        int field = 1;
        for (const char* figure : {"count", "mean", "p95", "max"}) {
            SCOPED_TRACE(std::string(id) + "-" + figure);
            EXPECT_EQ(page.string(std::string("//*[@id='") + id + "-" + figure + "']"), printed[field++].str());
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Reports, HtmlReport, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<Case>& info) { return std::string(info.param.name); });

TEST(HtmlReport, ShowsWhatTheFileSaysEscaped)
{
    ts::TempDir dir;
    std::string form = ts::readFile(kSamples + "/offset_form.txt");
    const std::string instrument = "<i>Spectro</i> &\t'Co' \x1b[31m";
    // Where the measurements came from, with characters that would reorder or hide text.
    form.insert(form.find('\n') + 1, "INSTRUMENTATION\t\"" + instrument + "\"\nDESCRIPTOR\t\"Press 4 \xE2\x80\xAE"
                                     "kcab\"\nORIGINATOR\t\"Print\xE2\x80\x8Bshop\"\nCREATED\t\"2026-11-02\"\n"
                                     "PRINT_CONDITIONS\t\"coated, 60 l/cm\"\n");
    std::ofstream(dir.path("form <&>.txt")) << form;
    const auto [html, text] = report({"", dir.path("form <&>.txt"), 0, false, false, {}}, dir);
    const Page page(html);
    ASSERT_TRUE(page.wellFormed());
    EXPECT_EQ(page.string("//h:table[@class='facts']/h:tr[h:td='INSTRUMENTATION']/h:td[2]"),
              "<i>Spectro</i> & 'Co' \\x1b[31m");
    EXPECT_EQ(page.string("//h:table[@class='facts']/h:tr[h:td='File']/h:td[2]"), dir.path("form <&>.txt"));
    const std::pair<const char*, const char*> provenance[] = {{"DESCRIPTOR", "Press 4 \\u202Ekcab"},
                                                              {"ORIGINATOR", "Print\\u200Bshop"},
                                                              {"CREATED", "2026-11-02"},
                                                              {"PRINT_CONDITIONS", "coated, 60 l/cm"}};
    for (const auto& [keyword, shown] : provenance)
        EXPECT_EQ(page.string(std::string("//h:table[@class='facts']/h:tr[h:td='") + keyword + "']/h:td[2]"), shown);
}

TEST(HtmlReport, StaysSmallWhenThousandsOfCombinationsAreChecked)
{
    // A sheet of the form and 4,096 further combinations, as the Yule-Nielsen
    // model of the sample predicts their spectra.
    ts::TempDir dir;
    std::string layout = "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\nEND_DATA_FORMAT\nBEGIN_DATA\n";
    int id = 0;
    const auto add = [&](const Cmyk& cmyk) {
        layout += std::to_string(++id);
        for (double value : cmyk)
            layout += "\t" + std::to_string(value);
        layout += "\n";
    };
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch)
        add(MeasuredForm::coverageOf(patch));
    for (int c = 0; c < 8; ++c)
        for (int m = 0; m < 8; ++m)
            for (int y = 0; y < 8; ++y)
                for (int k = 0; k < 8; ++k)
                    add({5.0 + 13.0 * c, 5.0 + 13.0 * m, 5.0 + 13.0 * y, 5.0 + 13.0 * k});
    std::ofstream(dir.path("layout.txt")) << layout << "END_DATA\n";
    ChartJob sheet;
    sheet.form = kSamples + "/offset_form.txt";
    sheet.model = ModelChoice::yuleNielsen;
    sheet.layout = dir.path("layout.txt");
    sheet.format = "cgats";
    sheet.spectral = true;
    sheet.output = dir.path("sheet.txt");
    ChartResult made;
    runChart(sheet, made);

    const auto [html, text] = report({"", dir.path("sheet.txt"), 0, true, false, {}}, dir);
    const Page page(html);
    ASSERT_TRUE(page.wellFormed());
    EXPECT_NE(text.find("check: 4096 "), std::string::npos) << text;
    // Cells of the a*b* plane and the 200 worst drawn one by one, not a mark per combination.
    EXPECT_EQ(page.count("//h:section[@id='check']//s:circle"), 200);
    EXPECT_GT(page.count("//h:section[@id='check']//s:rect[@class='cell']"), 20);
    EXPECT_LT(html.size(), 600u << 10);
}

// ---- The command line ---------------------------------------------------------------------------

struct ToolRun {
    int exitCode;
    std::string out, err;
};

ToolRun tool(const std::string& arguments, const ts::TempDir& dir)
{
    const int status = std::system(("cd '" + dir.dir() + "' && '" VELTMARQUIST_TOOL "' " + arguments +
                                    " >stdout.txt 2>stderr.txt").c_str());
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, ts::readFile(dir.path("stdout.txt")),
            ts::readFile(dir.path("stderr.txt"))};
}

TEST(ReportCommand, WritesWhereItIsToldAndRefusesWhatCannotGoTogether)
{
    const std::string form = "'" + kSamples + "/offset_form.txt' ";
    const struct {
        std::string arguments;
        int exitCode;
        std::string out, err; // the beginning of standard output, a part of stderr
    } cases[] = {
        {"report " + form + "-o -", 0, "<!DOCTYPE html>", "report: HTML report written to standard output"},
        {"chart " + form + "-o chart.txt --report report.html", 0, "form: ", ""},
        {"report " + form + "-o r.html --inks 7 --model ynsn", 2, "", "--inks reports a multi-channel form"},
        {"chart " + form + "-o same.html --report same.html", 2, "", "are the same file"},
        {"report " + form + "-o - --fit-gravure --process offset", 2, "", "cannot go with --process offset"},
    };
    for (const auto& run : cases) {
        SCOPED_TRACE(run.arguments);
        ts::TempDir dir;
        const ToolRun result = tool(run.arguments, dir);
        EXPECT_EQ(result.exitCode, run.exitCode) << result.err;
        EXPECT_EQ(result.out.substr(0, run.out.size()), run.out);
        EXPECT_NE(result.err.find(run.err), std::string::npos) << result.err;
    }
    // The chart beside a report is the chart without one, byte for byte.
    ts::TempDir dir;
    ASSERT_EQ(tool("chart " + form + "-o chart.txt --report report.html", dir).exitCode, 0);
    ASSERT_EQ(tool("chart " + form + "-o plain.txt", dir).exitCode, 0);
    EXPECT_EQ(ts::readFile(dir.path("chart.txt")), ts::readFile(dir.path("plain.txt")));
    EXPECT_TRUE(Page(ts::readFile(dir.path("report.html"))).wellFormed());
}

TEST(ConformanceCommand, VerdictAsExitCodeAndPageConditionsRefused)
{
    const std::string sheet = "'" + kSamples + "/offset_press_sheet.txt' ";
    ts::TempDir dir;
    // Against itself: PASS, exit 0, and the page says so.
    ToolRun run = tool("conformance " + sheet + "--reference " + sheet + "--report page.html", dir);
    EXPECT_EQ(run.exitCode, 0) << run.err;
    EXPECT_NE(run.out.find("verdict: PASS (40 of 40 checks within tolerance)"), std::string::npos) << run.out;
    const Page page(ts::readFile(dir.path("page.html")));
    ASSERT_TRUE(page.wellFormed());
    EXPECT_EQ(page.string("//*[@id='verdict']"), "PASS");
    EXPECT_EQ(page.count("//h:table[@id='controls']/h:tr"), 13);
    EXPECT_EQ(page.count("//h:section[@id='gamut']"), 1);
    // Tolerances no press meets: FAIL, its own exit code.
    std::ofstream(dir.path("tight.txt")) << "paper 0.001\n";
    std::string other = ts::readFile(kSamples + "/offset_form.txt");
    std::ofstream(dir.path("form.txt")) << other;
    run = tool("conformance form.txt --reference " + sheet + "--tolerances tight.txt --no-gamut", dir);
    EXPECT_EQ(run.exitCode, 10) << run.err;
    EXPECT_NE(run.out.find("verdict: FAIL"), std::string::npos);
    // Another measurement condition: refused unless asked for.
    other.insert(other.find('\n') + 1, "FILTER\t\"M2\"\n");
    std::ofstream(dir.path("m2.txt")) << other;
    std::ofstream(dir.path("m1.txt")) << "CTI3\nFILTER \"M1\"\n" << ts::readFile(kSamples + "/offset_press_sheet.txt").substr(9);
    run = tool("conformance m2.txt --reference m1.txt --no-gamut", dir);
    EXPECT_EQ(run.exitCode, 2);
    EXPECT_NE(run.err.find("measurement condition M2 against the reference's M1"), std::string::npos) << run.err;
    run = tool("conformance m2.txt --reference m1.txt --no-gamut --any-condition", dir);
    EXPECT_NE(run.exitCode, 2) << run.err;
    EXPECT_NE(run.out.find("compared although they differ"), std::string::npos);
}

} // namespace
