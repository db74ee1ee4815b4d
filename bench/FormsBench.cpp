// What the chart command does around the library on a real press
// measurement: reading the file and finding the test form, then fitting the
// Yule-Nielsen model and checking it on every combination measured beyond
// the form. The APTEC PC10 data set (1617 measurements) beside the project
// when it is there, else the bundled press sheet (302 measurements).
#include "PredictionCheck.h"
#include "TestForm.h"

#include <benchmark/benchmark.h>

#include <fstream>
#include <string>

using namespace veltmarquist;

namespace {

const std::string& measurementPath()
{
    static const std::string path = [] {
        const std::string shared = VELTMARQUIST_SHARED_DATA_DIR "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt";
        return std::ifstream(shared) ? shared : std::string(VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt");
    }();
    return path;
}

void FindTestForm(benchmark::State& state)
{
    for (auto _ : state)
        benchmark::DoNotOptimize(findTestForm(measurementPath(), ReadOptions{}));
    state.SetLabel(measurementPath().substr(measurementPath().rfind('/') + 1));
}

void FitAndCheckYuleNielsen(benchmark::State& state)
{
    const FoundForm form = findTestForm(measurementPath(), ReadOptions{});
    size_t checked = 0;
    for (auto _ : state) {
        const auto model = fitYuleNielsenModel(form.measuredForm());
        checked = checkModel(form.file, *model).patches.size();
    }
    state.SetLabel(std::to_string(checked) + " combinations checked");
}

} // namespace

BENCHMARK(FindTestForm)->Unit(benchmark::kMillisecond);
BENCHMARK(FitAndCheckYuleNielsen)->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
