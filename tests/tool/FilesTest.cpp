// The charts the tool writes, read back by our reader and by LittleCMS (what profile builders use).
#include "../TestSupport.h"
#include "Files.h"

#include <gtest/gtest.h>
#include <lcms2.h>

#include <memory>

using namespace veltmarquist;
namespace ts = testsupport;

namespace {

// Sets and fields of a text as LittleCMS reads it; {-1, -1} when it refuses it.
std::pair<int, int> littleCmsCounts(const std::string& text)
{
    std::unique_ptr<void, void (*)(cmsHANDLE)> handle(
        cmsIT8LoadFromMem(nullptr, text.data(), static_cast<cmsUInt32Number>(text.size())), cmsIT8Free);
    if (!handle)
        return {-1, -1};
    char** names = nullptr;
    return {static_cast<int>(cmsIT8GetPropertyDbl(handle.get(), "NUMBER_OF_SETS")),
            cmsIT8EnumDataFormat(handle.get(), &names)};
}

} // namespace

TEST(Files, EveryChartTheToolWritesReadsBackInOurReaderAndLittleCms)
{
    // The tool's own CGATS, with the cells that need quotes.
    CgatsTable table{"CGATS.17", {{"ORIGINATOR", "veltmarquist"}, {"DESCRIPTOR", "C, M, Y, K\tcombinations"}},
                     {"SAMPLE_ID", "SAMPLE_NAME", "CMYK_C"}, {{"1", "paper white", "0"}, {"2", "#2 don't", "2.5"}, {"3", "", "1e-05"}}};
    const std::string text = cgatsText(table);
    const auto [read, error] = cgats::readTable(text);
    ASSERT_FALSE(error) << error->message;
    EXPECT_EQ(read.header.keywords.at(1).value, "C, M, Y, K\tcombinations");
    EXPECT_EQ(read.header.fields, table.fields);
    EXPECT_EQ(read.rows, table.rows);
    EXPECT_EQ(littleCmsCounts(text), std::make_pair(3, 3));
    // The library's layouts: XYZ, multi-channel spectral and converted charts.
    const std::tuple<const char*, int, int> charts[] = {{"offset-form.p0.chart", 900, 8},
                                                        {"multichannel.p5.chart", 159, 43},
                                                        {"conversion.p8.chart", 30, 41}};
    for (const auto& [name, sets, fields] : charts) {
        SCOPED_TRACE(name);
        const std::string chart = ts::readFile(ts::goldenPath(name));
        const auto [ours, oursError] = cgats::readTable(chart);
        EXPECT_FALSE(oursError) << oursError->message;
        EXPECT_EQ(ours.rows.size(), static_cast<size_t>(sets));
        EXPECT_EQ(littleCmsCounts(chart), std::make_pair(sets, fields));
    }
}
