// The profile command's work on the bundled press sheet: read, fit the
// Yule-Nielsen model, the A2B and B2A tables, the file; and beside it, when
// Debian's argyll is installed, colprof making a profile from the same
// model's grid of the form's 9 levels (6,561 patches, its CTI3 export), as a
// user of another profile builder does. Both in real time, whole jobs; the
// ratio ends the output.
#include "RatioReporter.h"

#include "ChartExport.h"
#include "FourColourForm.h"
#include "PrintProfile.h"

#include <benchmark/benchmark.h>

#include <unistd.h>

#include <cstdlib>
#include <fstream>

using namespace veltmarquist;

namespace {

const char* const kSheet = VELTMARQUIST_SAMPLES_DIR "/offset_press_sheet.txt";

void WholeProfile(benchmark::State& state)
{
    std::size_t bytes = 0;
    for (auto _ : state) {
        FileWarnings warnings;
        const FoundForm form = readTestForm(kSheet, ReadOptions{}, warnings);
        const FittedModel fit = fitModel(form, ModelChoice::yuleNielsen);
        profile::ProfileSummary summary;
        const std::string icc = profile::printProfile(fit, form, profile::ProfileOptions{}, summary);
        std::ofstream("/tmp/veltmarquist-profile-bench.icc", std::ios::binary) << icc;
        bytes = icc.size();
    }
    state.counters["bytes"] = static_cast<double>(bytes);
    std::remove("/tmp/veltmarquist-profile-bench.icc");
}
BENCHMARK(WholeProfile)->Unit(benchmark::kMillisecond)->UseRealTime();

void ColprofOnTheModelGrid(benchmark::State& state)
{
    if (std::system("command -v colprof >/dev/null 2>&1") != 0) {
        state.SkipWithError("no colprof (Debian's argyll) on this machine");
        return;
    }
    FileWarnings warnings;
    const FoundForm form = readTestForm(kSheet, ReadOptions{}, warnings);
    const FittedModel fit = fitModel(form, ModelChoice::yuleNielsen);
    exporting::ExportOptions options;
    options.inkLimit = 300;
    const std::string base = "/tmp/veltmarquist-colprof-bench-" + std::to_string(::getpid());
    std::ofstream(base + ".ti3") << exporting::exportChart(*fit.model, exporting::provenanceOf(form.file, kSheet),
                                                           exporting::readLayout("grid"), options);
    const std::string command = "colprof -v0 -qm -l 300 -L 95 -D bench " + base + " >/dev/null 2>&1";
    for (auto _ : state)
        if (std::system(command.c_str()) != 0)
            state.SkipWithError("colprof failed");
    std::remove((base + ".ti3").c_str());
    std::remove((base + ".icc").c_str());
}
BENCHMARK(ColprofOnTheModelGrid)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(1);

} // namespace

int main(int argc, char** argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 1;
    RatioReporter reporter(isatty(STDOUT_FILENO) ? RatioReporter::OO_Defaults : RatioReporter::OO_Tabular);
    benchmark::RunSpecifiedBenchmarks(&reporter);
    reporter.printRatio("ColprofOnTheModelGrid", "WholeProfile", false);
    benchmark::Shutdown();
    return 0;
}
