// What the chart command does around the library on a real press
// measurement: reading the file and finding the test form, then fitting the
// Yule-Nielsen model and checking it on every combination measured beyond
// the form. The APTEC PC10 data set (1617 measurements) beside the project
// when it is there, else the bundled press sheet (302 measurements). Then a
// generated sheet of 1,000,000 measurements (the form's 46 patches, each
// measured many times, among combinations of 21 levels per ink): reading it
// alone, and reading it, matching the form and averaging the repeats.
#include "PredictionCheck.h"
#include "TestForm.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <filesystem>
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

// The generated sheet; made once in the temporary folder.
std::string millionRowSheet()
{
    const std::filesystem::path path = std::filesystem::temp_directory_path() / "veltmarquist-forms-bench.txt";
    if (std::filesystem::exists(path))
        return path.string();
    std::FILE* out = std::fopen(path.c_str(), "w");
    std::string text = "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K";
    for (int nm = 380; nm <= 730; nm += 10)
        text += "\tSPECTRAL_NM" + std::to_string(nm);
    text += "\nEND_DATA_FORMAT\nBEGIN_DATA\n";
    for (long row = 0; row < 1000000; ++row) {
        Cmyk cmyk;
        if (row % 20 == 0) {
            cmyk = MeasuredForm::coverageOf(static_cast<int>(row / 20 % MeasuredForm::kPatches));
        } else {
            for (int c = 0; c < 4; ++c)
                cmyk[static_cast<size_t>(c)] = 5.0 * ((row * (2 * c + 3) + c) % 21);
        }
        text += std::to_string(row + 1);
        for (double value : cmyk)
            text += "\t" + std::to_string(static_cast<int>(value));
        // The paper brightest, then darker the more ink.
        const double ink = (cmyk[0] + cmyk[1] + cmyk[2] + cmyk[3]) / 400.0;
        for (int band = 0; band < 36; ++band) {
            char value[16];
            std::snprintf(value, sizeof value, "\t%.4f", 0.9 - 0.8 * ink * (0.5 + 0.5 * ((band + row) % 7) / 6.0));
            text += value;
        }
        text += '\n';
        if (text.size() > (1 << 20)) {
            std::fwrite(text.data(), 1, text.size(), out);
            text.clear();
        }
    }
    text += "END_DATA\n";
    std::fwrite(text.data(), 1, text.size(), out);
    std::fclose(out);
    return path.string();
}

void ReadMillionRows(benchmark::State& state)
{
    const std::string path = millionRowSheet();
    for (auto _ : state)
        benchmark::DoNotOptimize(readMeasurementFile(path));
}

void FindTestFormInMillionRows(benchmark::State& state)
{
    const std::string path = millionRowSheet();
    size_t averaged = 0;
    for (auto _ : state)
        averaged = findTestForm(path, ReadOptions{}).picked.averaged;
    state.SetLabel(std::to_string(averaged) + " form patches averaged from repeats");
}

} // namespace

BENCHMARK(FindTestForm)->Unit(benchmark::kMillisecond);
BENCHMARK(ReadMillionRows)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(FindTestFormInMillionRows)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(FitAndCheckYuleNielsen)->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
