// The charts the tool writes, read back by our reader and by LittleCMS (what profile builders use).
#include "TestSupport.h"
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
    // The tool's own CGATS, with cells that need quotes, then the library's XYZ, multi-channel and converted charts.
    const CgatsTable table{"CGATS.17", {{"DESCRIPTOR", "C, M, Y, K\tcombinations"}}, {"SAMPLE_ID", "SAMPLE_NAME", "CMYK_C"},
                           {{"1", "paper white", "0"}, {"2", "#2 don't", "2.5"}, {"3", "", "1e-05"}}};
    const std::tuple<std::string, int, int> charts[] = {
        {cgatsText(table), 3, 3}, {ts::readFile(ts::goldenPath("offset-form.p0.chart")), 900, 8},
        {ts::readFile(ts::goldenPath("multichannel.p5.chart")), 159, 43},
        {ts::readFile(ts::goldenPath("conversion.p8.chart")), 30, 41}};
    for (const auto& [text, sets, fields] : charts) {
        SCOPED_TRACE(text.substr(0, 20));
        const auto [ours, error] = cgats::readTable(text);
        EXPECT_FALSE(error);
        EXPECT_EQ(ours.rows.size(), static_cast<size_t>(sets));
        EXPECT_EQ(littleCmsCounts(text), std::make_pair(sets, fields));
    }
    EXPECT_EQ(cgats::readTable(cgatsText(table)).first.rows, table.rows);
}
