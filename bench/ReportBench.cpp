// The report command on a 1617-patch measurement, as a user runs it: read
// the file, find the form, fit the model, check it on every combination
// beyond the form and write the HTML page. The file is generated once: the
// 46 patches of the bundled offset form as measured, then 1571 further
// combinations (the chart's, then others at the levels of an IT8.7/4 sheet)
// as the Yule-Nielsen model fitted to that form predicts them. With the real
// data set beside the project, the same on it.
#include "PredictionCheck.h"
#include "TestForm.h"
#include "commands/Commands.h"

#include "Cgats.h"

#include <benchmark/benchmark.h>

#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <set>

using namespace veltmarquist;

namespace {

constexpr size_t kSets = 1617;

std::string generatedSheet()
{
    const FoundForm form = findTestForm(VELTMARQUIST_SAMPLES_DIR "/offset_form.txt", ReadOptions{});
    const MeasuredForm measured = form.measuredForm();
    const auto model = fitYuleNielsenModel(measured);
    std::vector<Cmyk> coverages;
    std::set<Cmyk> seen;
    const auto add = [&](const Cmyk& cmyk) {
        if (coverages.size() < kSets && seen.insert(cmyk).second)
            coverages.push_back(cmyk);
    };
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch)
        add(MeasuredForm::coverageOf(patch));
    for (const Cmyk& cmyk : characterisationChart())
        add(cmyk);
    const double levels[] = {0, 2, 3, 5, 7, 10, 15, 20, 25, 30, 40, 50, 55, 60, 70, 75, 80, 85, 90, 95, 98, 100};
    for (unsigned step = 1; coverages.size() < kSets; ++step) {
        const unsigned mix = step * 2654435761u;
        add({levels[mix % 22], levels[(mix >> 8) % 22], levels[(mix >> 16) % 22], levels[(mix >> 24) % 22]});
    }
    const std::vector<Spectrum> predicted = predictSpectra(*model, coverages);
    cgats::Document sheet;
    sheet.keywords = {{"DESCRIPTOR", "generated 1617-patch sheet for the report benchmark"}};
    sheet.fields = {"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    for (int nm = 380; nm <= 730; nm += 10)
        sheet.fields.push_back("SPECTRAL_NM" + std::to_string(nm));
    for (size_t i = 0; i < coverages.size(); ++i) {
        std::vector<std::string> row{std::to_string(i + 1)};
        for (double coverage : coverages[i])
            row.push_back(std::to_string(static_cast<int>(coverage)));
        const Spectrum& spectrum = i < MeasuredForm::kPatches ? measured.spectrum(static_cast<int>(i)) : predicted[i];
        for (double value : spectrum) {
            char text[16];
            std::snprintf(text, sizeof text, "%.4f", value);
            row.push_back(text);
        }
        sheet.rows.push_back(std::move(row));
    }
    const std::string path = "/tmp/veltmarquist-report-bench-" + std::to_string(::getpid()) + ".txt";
    std::ofstream(path) << cgats::write(sheet);
    return path;
}

const std::string& sheetPath()
{
    static const std::string path = generatedSheet();
    return path;
}

// chart (with `chart`) or report (without) on a form, as the commands run them.
void Run(benchmark::State& state, const std::string& form, ModelChoice model, bool chart)
{
    if (!std::ifstream(form)) {
        state.SkipWithError("no evaluation data set beside the project");
        return;
    }
    const std::string output = "/tmp/veltmarquist-report-bench-" + std::to_string(::getpid());
    ChartJob job;
    job.form = form;
    job.model = model;
    (chart ? job.output : job.report) = output;
    size_t checked = 0;
    for (auto _ : state) {
        ChartResult result;
        runChart(job, result);
        checked = result.check.patches.size();
    }
    state.counters["checked"] = static_cast<double>(checked);
    state.counters["bytes"] = static_cast<double>(std::ifstream(output, std::ios::ate).tellg());
    std::remove(output.c_str());
}

void GeneratedSheetYuleNielsen(benchmark::State& state) { Run(state, sheetPath(), ModelChoice::yuleNielsen, false); }
void GeneratedSheetOffset(benchmark::State& state) { Run(state, sheetPath(), ModelChoice::offset, false); }
void RealDataYuleNielsen(benchmark::State& state)
{
    Run(state, VELTMARQUIST_SHARED_DATA_DIR "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt", ModelChoice::yuleNielsen,
        false);
}
// The chart command writes from the one fit that its check and report use:
// on the bundled form it takes about as long as the report.
void BundledFormReport(benchmark::State& state)
{
    Run(state, VELTMARQUIST_SAMPLES_DIR "/offset_form.txt", ModelChoice::offset, false);
}
void BundledFormChart(benchmark::State& state)
{
    Run(state, VELTMARQUIST_SAMPLES_DIR "/offset_form.txt", ModelChoice::offset, true);
}

} // namespace

BENCHMARK(GeneratedSheetYuleNielsen)->Unit(benchmark::kMillisecond);
BENCHMARK(GeneratedSheetOffset)->Unit(benchmark::kMillisecond);
BENCHMARK(RealDataYuleNielsen)->Unit(benchmark::kMillisecond);
BENCHMARK(BundledFormReport)->Unit(benchmark::kMillisecond);
BENCHMARK(BundledFormChart)->Unit(benchmark::kMillisecond);

int main(int argc, char** argv)
{
    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    std::remove(sheetPath().c_str());
    return 0;
}
