// A benchmark program's console output, and the ratio of two benchmarks'
// times measured in the same run.
#ifndef VELTMARQUIST_BENCH_RATIOREPORTER_H
#define VELTMARQUIST_BENCH_RATIOREPORTER_H

#include <benchmark/benchmark.h>

#include <cstdio>
#include <map>
#include <string>
#include <utility>
#include <vector>

// Console output as usual, plus the times of every benchmark by name: of its
// run, or the median of its repetitions when there are several.
class RatioReporter : public benchmark::ConsoleReporter {
public:
    explicit RatioReporter(OutputOptions options) : ConsoleReporter(options) {}

    void ReportRuns(const std::vector<Run>& runs) override
    {
        for (const Run& run : runs) {
            const bool single = run.run_type == Run::RT_Iteration && run.repetitions <= 1;
            const bool median = run.run_type == Run::RT_Aggregate && run.aggregate_name == "median";
            if ((single || median) && !run.error_occurred)
                times_[run.run_name.function_name] = {run.GetAdjustedRealTime(), run.GetAdjustedCPUTime()};
        }
        ConsoleReporter::ReportRuns(runs);
    }
    // The ratio of real times, and of CPU times unless the slow one runs in
    // another process (`cpu` false), where this one's CPU time says nothing.
    void printRatio(const std::string& slow, const std::string& fast, bool cpu = true) const
    {
        const auto s = times_.find(slow), f = times_.find(fast);
        if (s == times_.end() || f == times_.end() || !(f->second.first > 0.0 && f->second.second > 0.0))
            return;
        std::printf("%s / %s: %.1f x real time", slow.c_str(), fast.c_str(), s->second.first / f->second.first);
        if (cpu)
            std::printf(", %.1f x CPU time", s->second.second / f->second.second);
        std::printf("\n");
    }

private:
    std::map<std::string, std::pair<double, double>> times_; // real, CPU
};

#endif // VELTMARQUIST_BENCH_RATIOREPORTER_H
