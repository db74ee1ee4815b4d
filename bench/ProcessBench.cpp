// Whole CalculateChart jobs on the golden inputs: the default job (process 0)
// with the fast grey fit and with the straightforward one, the multi-channel
// sequence 3 -> 6, and the chart conversions 7 to 9; processes 0 and 1 as
// whole processes against the library's literal build. After the run the
// ratios of the fast and the plain variants are printed, both measured in
// the same run.
#include "TestSupport.h"

#include "RatioReporter.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <map>
#include <sstream>
#include <string>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace testsupport;

namespace {

const MeasurementBlock& offsetForm()
{
    static const MeasurementBlock block = readGoldenInput("offset-form.in");
    return block;
}

// Stops the benchmark with an error unless the call succeeded.
bool succeeded(benchmark::State& state, int status, const char* what)
{
    if (status == VM_STATUS_OK)
        return true;
    state.SkipWithError((std::string(what) + " failed with status " + std::to_string(status)).c_str());
    return false;
}

int calculate(void* profile, int process, const std::string& path, MeasurementBlock& block)
{
    return CalculateChart(profile, static_cast<PrintProcess>(process), path.c_str(), block.ints.data(),
                          block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
}

// One CalculateChart call per iteration, each on a fresh profile.
void timeFreshProfileCalls(benchmark::State& state, int process, MeasurementBlock block, const char* what)
{
    TempDir dir;
    const std::string out = dir.path("chart.txt");
    for (auto _ : state) {
        void* profile = CreateMathProfile("bench");
        const bool ok = succeeded(state, calculate(profile, process, out, block), what);
        DestroyMathProfile(profile);
        if (!ok)
            break;
    }
}

// The process-0 job through the C entry point: marshalling, grey fit, chart.
void Process0_CalculateChart(benchmark::State& state)
{
    timeFreshProfileCalls(state, VM_PROCESS_OFFSET, offsetForm(), "process 0");
}
BENCHMARK(Process0_CalculateChart)->Unit(benchmark::kMillisecond);

// The same job as the members that CalculateChart runs, with the grey fit
// chosen: the straightforward evaluation is reachable only this way.
template <bool Straightforward>
void Process0_Members(benchmark::State& state)
{
    TempDir dir;
    const std::string out = dir.path("p0.chart");
    for (auto _ : state) {
        MathProfile profile("bench");
        RowTable rows = RowTable::fromBlock(offsetForm());
        if (Straightforward)
            profile.calculateGrayDiffFactorStraightforward(rows.rows());
        else
            profile.calculateGrayDiffFactor(rows.rows());
        profile.calculateChart(rows.rows(), VM_PROCESS_OFFSET, out.c_str());
    }
}
BENCHMARK_TEMPLATE(Process0_Members, false)->Name("Process0_Members/fast")->Unit(benchmark::kMillisecond);
BENCHMARK_TEMPLATE(Process0_Members, true)
    ->Name("Process0_Members/straightforward")
    ->Unit(benchmark::kMillisecond)
    ->MinTime(3.0);

// Process 3, then the host's separations, then process 6, on one profile.
// With `separatedOnly` only the process-6 call is timed.
template <bool SeparatedOnly>
void Process3Then6(benchmark::State& state)
{
    TempDir dir;
    const std::string out3 = dir.path("p3.chart"), out6 = dir.path("p6.chart");
    const MeasurementBlock input = readGoldenInput("multichannel.in");
    std::istringstream separations(readFile(goldenPath("multichannel.separations")));
    std::vector<int> records(static_cast<size_t>(7 * VM_EXCHANGE_RECORDS));
    for (int& value : records)
        separations >> value;
    for (auto _ : state) {
        if (SeparatedOnly)
            state.PauseTiming();
        MeasurementBlock block = input; // process 3 writes into the buffer
        void* profile = CreateMathProfile("bench");
        bool ok = succeeded(state, calculate(profile, VM_PROCESS_SIX_COLOUR, out3, block), "process 3");
        std::copy(records.begin(), records.end(), block.ints.begin());
        if (SeparatedOnly)
            state.ResumeTiming();
        ok = ok && succeeded(state, calculate(profile, VM_PROCESS_SEPARATED_SET, out6, block), "process 6");
        DestroyMathProfile(profile);
        if (!ok)
            break;
    }
}
BENCHMARK_TEMPLATE(Process3Then6, false)->Name("Process3Then6")->Unit(benchmark::kMillisecond);
BENCHMARK_TEMPLATE(Process3Then6, true)->Name("Process3Then6/process6only")->Unit(benchmark::kMillisecond);

void ChartConversion(benchmark::State& state)
{
    timeFreshProfileCalls(state, static_cast<int>(state.range(0)), readGoldenInput("conversion.in"), "conversion");
}
BENCHMARK(ChartConversion)->DenseRange(7, 9)->Unit(benchmark::kMicrosecond);

// A whole process per iteration, start-up and library load included: the
// driver reads the golden block and runs one job, linked against the library
// or against its literal build (every job on its plain reference path). Both
// drivers are one source built with the same compiler and flags; the charts
// they write are compared after the run.
void wholeProcess(benchmark::State& state, const char* driver, int process, const char* input, const char* golden)
{
    TempDir dir;
    const std::string block = goldenPath(input), chart = dir.path("chart.txt"), number = std::to_string(process);
    bool ran = true;
    for (auto _ : state) {
        const char* argv[] = {driver, block.c_str(), number.c_str(), chart.c_str(), nullptr};
        pid_t child = 0;
        int status = 0;
        if (posix_spawn(&child, driver, nullptr, nullptr, const_cast<char* const*>(argv), environ) != 0 ||
            waitpid(child, &status, 0) != child || !WIFEXITED(status) || WEXITSTATUS(status) != 0) {
            state.SkipWithError((std::string(driver) + " failed").c_str());
            ran = false;
            break;
        }
    }
    if (ran && readFile(chart) != readFile(goldenPath(golden)))
        state.SkipWithError("the chart differs from the golden chart");
}

void Process0_WholeProcess(benchmark::State& state)
{
    wholeProcess(state, VELTMARQUIST_PROCESS_DRIVER, VM_PROCESS_OFFSET, "offset-form.in", "offset-form.p0.chart");
}
BENCHMARK(Process0_WholeProcess)->Unit(benchmark::kMillisecond)->UseRealTime();

void Process0_WholeProcessLiteral(benchmark::State& state)
{
    wholeProcess(state, VELTMARQUIST_LITERAL_DRIVER, VM_PROCESS_OFFSET, "offset-form.in", "offset-form.p0.chart");
}
BENCHMARK(Process0_WholeProcessLiteral)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(6.0);

void Process1_WholeProcess(benchmark::State& state)
{
    wholeProcess(state, VELTMARQUIST_PROCESS_DRIVER, VM_PROCESS_GRAVURE, "offset-form.in", "offset-form.p1.chart");
}
BENCHMARK(Process1_WholeProcess)->Unit(benchmark::kMillisecond)->UseRealTime();

void Process1_WholeProcessLiteral(benchmark::State& state)
{
    wholeProcess(state, VELTMARQUIST_LITERAL_DRIVER, VM_PROCESS_GRAVURE, "offset-form.in", "offset-form.p1.chart");
}
BENCHMARK(Process1_WholeProcessLiteral)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(6.0);

} // namespace

int main(int argc, char** argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 1;
    RatioReporter reporter(isatty(STDOUT_FILENO) ? RatioReporter::OO_Defaults : RatioReporter::OO_Tabular);
    benchmark::RunSpecifiedBenchmarks(&reporter);
    reporter.printRatio("Process0_Members/straightforward", "Process0_Members/fast");
    reporter.printRatio("Process0_Members/straightforward", "Process0_CalculateChart");
    reporter.printRatio("Process0_WholeProcessLiteral", "Process0_WholeProcess", false);
    reporter.printRatio("Process1_WholeProcessLiteral", "Process1_WholeProcess", false);
    benchmark::Shutdown();
    return 0;
}
