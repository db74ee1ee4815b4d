// Reading a large measurement file: time, and the heap's peak against the
// file's size. The file (about 200 MB: SAMPLE_ID, CMYK and 36 bands of 0-1
// reflectance with four decimals) is generated once in a temporary folder.
#include "HeapPeak.h"
#include "MeasurementFile.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string>

namespace {

// About `bytes` of measurement file; returns its path.
std::string largeFile(long long bytes)
{
    const std::filesystem::path path = std::filesystem::temp_directory_path() / "veltmarquist-reader-bench.txt";
    if (std::filesystem::exists(path) && static_cast<long long>(std::filesystem::file_size(path)) >= bytes)
        return path.string();
    std::FILE* out = std::fopen(path.c_str(), "w");
    std::string text = "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K";
    for (int nm = 380; nm <= 730; nm += 10)
        text += "\tSPECTRAL_NM" + std::to_string(nm);
    text += "\nEND_DATA_FORMAT\nBEGIN_DATA\n";
    long long written = 0;
    for (long long row = 1; written < bytes; ++row) {
        text += std::to_string(row);
        for (int channel = 0; channel < 4; ++channel)
            text += "\t" + std::to_string((row / (channel + 1)) % 101);
        for (int band = 0; band < 36; ++band) {
            char value[16];
            std::snprintf(value, sizeof value, "\t0.%04lld", (row * 7 + band * 131) % 9000 + 500);
            text += value;
        }
        text += '\n';
        if (text.size() > (1 << 20)) {
            written += static_cast<long long>(std::fwrite(text.data(), 1, text.size(), out));
            text.clear();
        }
    }
    text += "END_DATA\n";
    std::fwrite(text.data(), 1, text.size(), out);
    std::fclose(out);
    return path.string();
}

void ReadLargeFile(benchmark::State& state)
{
    const std::string path = largeFile(200LL << 20);
    const double fileBytes = static_cast<double>(std::filesystem::file_size(path));
    size_t sets = 0;
    for (auto _ : state) {
        const long long before = heappeak::startPeak();
        const veltmarquist::ReadResult result = veltmarquist::readMeasurementFile(path);
        if (!result.ok())
            state.SkipWithError(result.error.describe().c_str());
        sets = result.ok() ? result.file->sets.size() : 0;
        state.counters["peak_heap_per_file_byte"] = static_cast<double>(heappeak::heapPeak - before) / fileBytes;
    }
    state.counters["file_MB"] = fileBytes / 1e6;
    state.counters["sets"] = static_cast<double>(sets);
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * static_cast<int64_t>(fileBytes));
}
BENCHMARK(ReadLargeFile)->Unit(benchmark::kMillisecond)->Iterations(3);

} // namespace

BENCHMARK_MAIN();
