// Charts for profile builders from the bundled offset form, fit included:
// the Yule-Nielsen model on 11 levels per ink (14,641 patches), with and
// without spectra, and the offset model on the form's 9 levels per ink
// (6,561 patches). Each iteration fits, builds the layout and writes the
// CTI3 text. The largest export (21 levels per ink with spectra, 194,481
// patches) streams into a file, with the heap's peak against its size.
#include "ChartExport.h"
#include "ExportTestForm.h"
#include "HeapPeak.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <functional>

using namespace veltmarquist;
using namespace veltmarquist::exporting;

namespace {

using Fit = std::function<std::unique_ptr<PrintModel>(const MeasuredForm&)>;

void ExportChart(benchmark::State& state, const Fit& fit, const char* layoutName, bool spectral)
{
    const FormProvenance form = provenanceOf(exporttest::formFile(), exporttest::kFormPath);
    ExportOptions options;
    options.spectral = spectral;
    options.created = "2025-01-15T12:00:00Z";
    size_t bytes = 0;
    for (auto _ : state) {
        const std::unique_ptr<PrintModel> model = fit(exporttest::measuredForm());
        const std::string text = exportChart(*model, form, readLayout(layoutName), options);
        bytes = text.size();
        benchmark::DoNotOptimize(text.data());
    }
    state.counters["bytes"] = static_cast<double>(bytes);
}

void StreamLargestChart(benchmark::State& state)
{
    const FormProvenance form = provenanceOf(exporttest::formFile(), exporttest::kFormPath);
    ExportOptions options;
    options.spectral = true;
    options.created = "2025-01-15T12:00:00Z";
    const std::string path = (std::filesystem::temp_directory_path() / "veltmarquist-export-bench.ti3").string();
    const std::unique_ptr<PrintModel> model = fitYuleNielsenModel(exporttest::measuredForm());
    for (auto _ : state) {
        const long long before = heappeak::startPeak();
        {
            std::ofstream out(path, std::ios::binary | std::ios::trunc);
            exportChart(*model, form, readLayout("grid:21"), options, out);
        }
        const double bytes = static_cast<double>(std::filesystem::file_size(path));
        state.counters["file_MB"] = bytes / 1e6;
        state.counters["peak_heap_per_file_byte"] = static_cast<double>(heappeak::heapPeak - before) / bytes;
    }
    std::remove(path.c_str());
}
BENCHMARK(StreamLargestChart)->Unit(benchmark::kMillisecond)->Iterations(2);

const Fit yuleNielsen = [](const MeasuredForm& form) { return fitYuleNielsenModel(form); };
const Fit offset = [](const MeasuredForm& form) { return fitOffsetModel(form); };

} // namespace

BENCHMARK_CAPTURE(ExportChart, YuleNielsenGrid11, yuleNielsen, "grid:11", false)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ExportChart, YuleNielsenGrid11Spectral, yuleNielsen, "grid:11", true)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ExportChart, OffsetGrid, offset, "grid", false)->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
