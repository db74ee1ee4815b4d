// CxF3 files: the same data as a CGATS file give the same chart, byte for
// byte; malformed files are named with the element and line at fault.
#include "Cgats.h"
#include "Failure.h"
#include "FourColourForm.h"
#include "MeasurementLoading.h"
#include "TestSupport.h"

#include "export/ChartExport.h"

#include <gtest/gtest.h>

#include <fstream>

using namespace veltmarquist;
namespace ts = testsupport;

namespace {

// The CxF3 document of a CGATS measurement file with CMYK and spectra, every
// number as the CGATS file writes it, in the layout instrument programs use.
std::string cxf3Of(const std::string& cgatsPath)
{
    const auto [table, error] = cgats::readTable(ts::readFile(cgatsPath));
    EXPECT_FALSE(error);
    const auto& fields = table.header.fields;
    std::vector<size_t> bands;
    size_t c = 0;
    for (size_t i = 0; i < fields.size(); ++i) {
        if (fields[i].rfind("SPECTRAL_NM", 0) == 0)
            bands.push_back(i);
        if (fields[i] == "CMYK_C")
            c = i;
    }
    const std::string start = fields[bands.front()].substr(fields[bands.front()].find_first_of("0123456789"));
    std::string xml = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                      "<cc:CxF xmlns:cc=\"http://colorexchangeformat.com/CxF3-core\">\n"
                      "  <cc:FileInformation><cc:Creator>test</cc:Creator><cc:Description>converted</cc:Description>"
                      "</cc:FileInformation>\n  <cc:Resources>\n    <cc:ObjectCollection>\n";
    for (size_t r = 0; r < table.rows.size(); ++r) {
        const auto& row = table.rows[r];
        xml += "      <cc:Object ObjectType=\"Target\" Name=\"" + std::to_string(r + 1) + "\" Id=\"o" +
               std::to_string(r + 1) + "\">\n        <cc:ColorValues><cc:ReflectanceSpectrum ColorSpecification=\"cs\">";
        for (size_t band : bands)
            xml += (band == bands.front() ? "" : " ") + row[band];
        xml += "</cc:ReflectanceSpectrum></cc:ColorValues>\n        <cc:DeviceColorValues><cc:ColorCMYK "
               "ColorSpecification=\"device\"><cc:Cyan>" + row[c] + "</cc:Cyan><cc:Magenta>" + row[c + 1] +
               "</cc:Magenta><cc:Yellow>" + row[c + 2] + "</cc:Yellow><cc:Black>" + row[c + 3] +
               "</cc:Black></cc:ColorCMYK></cc:DeviceColorValues>\n      </cc:Object>\n";
    }
    return xml + "    </cc:ObjectCollection>\n    <cc:ColorSpecificationCollection>\n      <cc:ColorSpecification "
                 "Id=\"cs\"><cc:TristimulusSpec><cc:Illuminant>D50</cc:Illuminant><cc:Observer>2_Degree</cc:Observer>"
                 "</cc:TristimulusSpec><cc:MeasurementSpec><cc:MeasurementType>Spectrum_Reflectance</cc:MeasurementType>"
                 "<cc:WavelengthRange StartWL=\"" + start + "\" Increment=\"10\"/><cc:Device><cc:Model>i1Pro3</cc:Model>"
                 "</cc:Device></cc:MeasurementSpec></cc:ColorSpecification>\n    </cc:ColorSpecificationCollection>\n"
                 "  </cc:Resources>\n</cc:CxF>\n";
}

std::string chartOf(const std::string& path, ModelChoice model)
{
    FileWarnings warnings;
    const FoundForm form = readTestForm(path, ReadOptions{}, warnings);
    const FittedModel fit = fitModel(form, model);
    exporting::ExportOptions options;
    options.created = "2026-01-01T00:00:00Z";
    return exporting::exportChart(*fit.model, exporting::FormProvenance{"form", {}}, exporting::readLayout("chart"),
                                  options);
}

} // namespace

TEST(Cxf3, GivesTheChartOfTheSameDataInCgats)
{
    const std::string real = VELTMARQUIST_SHARED_DATA_DIR "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt";
    for (const std::string& path : {std::string(VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt"), real}) {
        if (!ts::fileExists(path))
            continue; // the real data set is not beside the project
        SCOPED_TRACE(path);
        ts::TempDir dir;
        std::ofstream(dir.path("sheet.cxf")) << cxf3Of(path);
        const MeasurementFile file = loadMeasurementFile(dir.path("sheet.cxf"), ReadOptions{});
        EXPECT_EQ(file.keyword("INSTRUMENTATION"), "i1Pro3");
        EXPECT_EQ(file.keyword("ILLUMINATION_NAME"), "D50");
        for (ModelChoice model : {ModelChoice::offset, ModelChoice::yuleNielsen})
            EXPECT_EQ(chartOf(dir.path("sheet.cxf"), model), chartOf(path, model));
    }
}

TEST(Cxf3, MalformedFilesNameTheElementAndLine)
{
    const std::string good = cxf3Of(VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt");
    const auto replaced = [&](const std::string& from, const std::string& to) {
        std::string text = good;
        text.replace(text.find(from), from.size(), to);
        return text;
    };
    const struct {
        std::string text, message;
        Failure failure;
    } cases[] = {
        {good.substr(0, good.size() / 2), "sheet.cxf:", Failure::InputSyntax},
        {"<?xml version=\"1.0\"?>\n<svg/>\n", "sheet.cxf:2: an XML file whose root is <svg>", Failure::InputSyntax},
        {good.substr(0, good.find("<cc:ColorValues>")) + good.substr(good.find("</cc:ColorValues>") + 17),
         "sheet.cxf:6: <Object Name=\"1\">: no <cc:ReflectanceSpectrum>", Failure::InputContent},
        {replaced("<cc:Cyan>20</cc:Cyan>", "<cc:Cyan>twenty</cc:Cyan>"),
         "sheet.cxf:8: <ColorCMYK>: <cc:Cyan> is not a number", Failure::InputContent},
        {replaced("<cc:ColorValues><cc:ReflectanceSpectrum ColorSpecification=\"cs\">",
                  "<cc:ColorValues><cc:ReflectanceSpectrum ColorSpecification=\"cs\" StartWL=\"400\">"),
         "sheet.cxf:11: <ReflectanceSpectrum>: a spectrum from 380 nm in 36 bands, where the first object's starts at 400 nm", Failure::InputContent},
    };
    for (const auto& c : cases) {
        ts::TempDir dir;
        std::ofstream(dir.path("sheet.cxf")) << c.text;
        try {
            loadMeasurementFile(dir.path("sheet.cxf"), ReadOptions{});
            ADD_FAILURE() << "accepted: " << c.message;
        } catch (const HostError& error) {
            EXPECT_EQ(error.failure(), c.failure) << error.what();
            EXPECT_NE(std::string(error.what()).find(c.message), std::string::npos) << error.what();
        }
    }
}
