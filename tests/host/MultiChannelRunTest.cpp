// The six- and seven-ink run in-process: the golden charts from a measured
// form and the host's separations, the channel map, and the refusals.
#include "GoldenForms.h"
#include "Failure.h"
#include "MultiChannelRun.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace veltmarquist;
namespace ts = testsupport;
using ::testing::HasSubstr;

namespace {

MeasurementFile fileOf(const std::string& text)
{
    ReadResult read = readMeasurementText(text);
    EXPECT_TRUE(read.ok()) << read.error.describe();
    return std::move(*read.file);
}

std::string failureOf(const std::function<void()>& action)
{
    try {
        action();
    } catch (const HostError& error) {
        return std::to_string(exitCodeOf(error.failure())) + ": " + error.what();
    }
    return "";
}

} // namespace

TEST(MultiChannelRun, GoldenChartsFromTheFormAndTheSeparations)
{
    // Seven inks map one to one; six put ink B on the library's channel 6.
    const std::tuple<int, std::vector<int>, const char*, const char*> cases[] = {
        {7, {0, 1, 2, 3, 4, 5, 6}, "multichannel.p5.chart", "multichannel.p5-p6.chart"},
        {6, {0, 1, 2, 3, 4, 6}, "multichannel.p3.chart", "multichannel.p3-p6.chart"}};
    for (const auto& [inks, channels, chart, separated] : cases) {
        SCOPED_TRACE(separated);
        ts::TempDir dir;
        const MeasurementFile form = fileOf(ts::multiChannelForm(inks));
        std::vector<bool> exact;
        const MeasurementFile answer = fileOf(ts::separations(channels, exact));
        MultiChannelRun run(form, "form.txt", inks);
        EXPECT_EQ(run.picked().thousandths.size(), static_cast<size_t>(inks + 4));
        PendingOutput chartOutput(dir.path("chart.txt")), separatedOutput(dir.path("xyz.txt"));
        run.writeChart(chartOutput);
        chartOutput.commit();
        EXPECT_EQ(ts::readFile(dir.path("chart.txt")), ts::readFile(ts::goldenPath(chart)));
        EXPECT_EQ(run.combinations()[1], (Cmyk{0, 0, 0, 2}));
        const std::vector<std::vector<Spectrum>> ramps = run.ramps();
        ASSERT_EQ(ramps.size(), static_cast<size_t>(inks));
        EXPECT_EQ(ramps[0].size(), 101u);
        run.writeSeparated(separationsOf(answer, "answer.txt", inks), separatedOutput);
        separatedOutput.commit();
        ts::expectSeparatedChart(ts::readFile(dir.path("xyz.txt")), separated, exact);
    }
}

TEST(MultiChannelRun, RefusesWhatItCannotSeparateNamingWhere)
{
    const MeasurementFile seven = fileOf(ts::multiChannelForm(7)), six = fileOf(ts::multiChannelForm(6));
    std::vector<bool> exact;
    const MeasurementFile sixColumns = fileOf(ts::separations({0, 1, 2, 3, 4, 6}, exact));
    MultiChannelRun run(seven, "seven.txt", 7);
    ts::TempDir dir;
    PendingOutput output(dir.path("out.txt"));
    Separations tooHigh{7, std::vector<std::int32_t>(7 * 3499, 0)};
    tooHigh.values[7 * 16 + 2] = 101 * 1000000;
    const std::pair<std::function<void()>, std::string> cases[] = {
        {[&] { MultiChannelRun(six, "six.txt", 7); }, "5: six.txt: 7 inks need the device fields 7CLR_1 ... 7CLR_7; "
                                                       "the file has 6 device channels"},
        {[&] { MultiChannelRun(seven, "seven.txt", 5); }, "2: a multi-channel form has 6 or 7 inks, not 5"},
        {[&] { run.writeSeparated(tooHigh, output); }, "1: the separated set needs the multi-channel chart first"},
        {[&] { separationsOf(sixColumns, "answer.txt", 7); },
         "5: answer.txt: separations need the device fields 7CLR_1 ... 7CLR_7; the file has 6 channels"},
        {[&] { run.writeChart(output), run.writeSeparated(tooHigh, output); },
         "5: the separation of combination 17 (C 0 M 0 Y 0 K 85) has channel 3 outside 0..100 %"},
        {[&] { run.writeSeparated(Separations{7, std::vector<std::int32_t>(7 * 10)}, output); },
         "5: 10 separations for 3499 combinations"},
    };
    for (const auto& [action, failure] : cases) {
        SCOPED_TRACE(failure);
        EXPECT_EQ(failureOf(action), failure);
    }
}
