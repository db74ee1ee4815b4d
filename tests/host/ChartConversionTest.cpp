// Chart conversion from values, in-process: the golden charts of the three
// modes from the golden spectra and channel values, and the refusals, each
// before the library writes anything.
#include "ChartConversion.h"
#include "Failure.h"
#include "TestSupport.h"
#include "models/PrintModels.h"

#include <gtest/gtest.h>

using namespace veltmarquist;
namespace ts = testsupport;

namespace {

// The golden conversion input: 30 patches in seven channels, then the two whites.
struct GoldenConversion {
    GoldenConversion()
    {
        const ts::MeasurementBlock block = ts::readGoldenInput("conversion.in");
        for (int patch = 0; patch < block.count; ++patch)
            spectra.emplace_back(block.ints.begin() + 36 * patch, block.ints.begin() + 36 * (patch + 1));
        for (int patch = 0; patch < block.count - 2; ++patch) {
            std::vector<std::int32_t> channels;
            for (int channel = 0; channel < 7; ++channel)
                channels.push_back(block.ints[static_cast<size_t>(36 * block.count + 7 * patch + channel)] * 1000000);
            conversion.patches.push_back({{&layout, &spectra[static_cast<size_t>(patch)]}, channels,
                                          "patch " + std::to_string(patch + 1)});
        }
        conversion.from = MeasuredSpectrum{&layout, &spectra[30]};
        conversion.to = MeasuredSpectrum{&layout, &spectra[31]};
        conversion.fromLabel = "PAPER_PRINTED";
        conversion.dropFurtherChannels = true;
        conversion.dropOption = "--cmyk-only";
    }
    SpectralLayout layout = libraryLayout();
    std::vector<std::vector<int>> spectra;
    ChartConversion conversion;
};

// The chart a conversion writes, or "exit code: message" of its refusal; nothing stays behind a refusal.
std::string converted(const ChartConversion& conversion, ConversionOutcome* outcome = nullptr)
{
    ts::TempDir dir;
    try {
        PendingOutput output(dir.path("out.txt"));
        const ConversionOutcome done = convertChart(conversion, output, "conversion");
        output.commit();
        if (outcome != nullptr)
            *outcome = done;
    } catch (const HostError& error) {
        EXPECT_FALSE(ts::fileExists(dir.path("out.txt")));
        return std::to_string(exitCodeOf(error.failure())) + ": " + error.what();
    }
    return ts::readFile(dir.path("out.txt"));
}

} // namespace

TEST(ChartConversion, GoldenChartsOfTheThreeModesFromValues)
{
    GoldenConversion golden;
    const std::pair<PrintProcess, const char*> modes[] = {{VM_PROCESS_CHART_COPY, "conversion.p7.chart"},
                                                          {VM_PROCESS_CHART_CONVERT, "conversion.p8.chart"},
                                                          {VM_PROCESS_CHART_BLEND, "conversion.p9.chart"}};
    for (const auto& [mode, chart] : modes) {
        SCOPED_TRACE(chart);
        golden.conversion.mode = mode;
        ConversionOutcome outcome;
        EXPECT_EQ(converted(golden.conversion, &outcome), ts::readFile(ts::goldenPath(chart)));
        EXPECT_EQ(outcome.patches, 30u);
        EXPECT_GT(outcome.whitesApart, 15.0); // the golden whites lie about 20 dE*ab apart
        EXPECT_EQ(outcome.blendWeight, chartConversionBlendWeight(outcome.whitesApart));
    }
}

TEST(ChartConversion, RefusesWhatTheLibraryCannotConvertOrWouldLose)
{
    const auto refusal = [](const std::function<void(ChartConversion&)>& change) {
        GoldenConversion golden;
        change(golden.conversion);
        return converted(golden.conversion);
    };
    const std::vector<int> dark(36, 0);
    const SpectralLayout layout = libraryLayout();
    const std::pair<std::function<void(ChartConversion&)>, std::string> cases[] = {
        {[](ChartConversion& c) { c.dropFurtherChannels = false; c.source = "chart.txt"; },
         "5: chart.txt: 30 patches have ink in channels 5-7 (the first: patch 1), but the converted chart holds C, M, "
         "Y, K only; give --cmyk-only to drop those channels"},
        {[](ChartConversion& c) { c.mode = VM_PROCESS_CHART_BLEND, c.to.reset(); },
         "2: a blend needs both whites: the paper the chart was printed on and the paper to convert to"},
        {[](ChartConversion& c) { c.mode = static_cast<PrintProcess>(6); }, "2: a chart is copied, converted or blended"},
        {[](ChartConversion& c) { c.patches.clear(); }, "5: 0 patches; a chart to convert holds 1 to 1997"},
        {[](ChartConversion& c) { c.patches.resize(1998, c.patches[0]); }, "5: 1998 patches; a chart to convert holds"},
        {[](ChartConversion& c) { c.patches[3].channels[1] = 100060000; },
         "5: patch 4: a channel value lies outside 0..100 %"},
        {[&](ChartConversion& c) { c.from = MeasuredSpectrum{&layout, &dark}; },
         "5: the white PAPER_PRINTED has no reflectance at 380 nm; the conversion divides by it"},
    };
    for (const auto& [change, failure] : cases) {
        SCOPED_TRACE(failure);
        EXPECT_EQ(refusal(change).substr(0, failure.size()), failure);
    }
    // A copy needs no whites, and the reader's noise around 0 and 100 % passes.
    EXPECT_EQ(refusal([](ChartConversion& c) { c.mode = VM_PROCESS_CHART_COPY, c.from.reset(), c.to.reset(),
                                               c.patches[0].channels[0] = -50000; })
                  .substr(0, 4),
              "LGOR"); // the converted spectral layout
}
