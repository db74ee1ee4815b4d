// The Yule-Nielsen spectral Neugebauer model on the golden offset form: the
// fit from the 46 patches, one prediction, and 10,000 predictions spread over
// the CMYK cube (as a chart or a profile builder would ask for them).
#include "TestSupport.h"
#include "models/YuleNielsen.h"

#include <benchmark/benchmark.h>

using namespace veltmarquist::models;

namespace {

const FormPatches& goldenForm()
{
    static const FormPatches form = [] {
        testsupport::RowTable rows = testsupport::RowTable::fromBlock(testsupport::readGoldenInput("offset-form.in"));
        return formPatchesFromRows(rows.rows());
    }();
    return form;
}

void YuleNielsen_Fit(benchmark::State& state)
{
    for (auto _ : state)
        benchmark::DoNotOptimize(fitYuleNielsen(goldenForm()));
}
BENCHMARK(YuleNielsen_Fit)->Unit(benchmark::kMillisecond);

// `state.range(0)` predictions per iteration, coverages stepping through the
// cube so that no two neighbours repeat.
void YuleNielsen_Predict(benchmark::State& state)
{
    const YuleNielsenFit fit = fitYuleNielsen(goldenForm());
    const int count = static_cast<int>(state.range(0));
    Bands spectrum;
    int i = 0;
    for (auto _ : state) {
        for (int p = 0; p < count; ++p, ++i) {
            const double cmyk[kInks] = {i % 11 * 10.0, i / 11 % 11 * 10.0, i / 121 % 11 * 10.0 + 3.3, i * 7 % 100 + 0.5};
            predictYuleNielsen(fit, cmyk, spectrum.data());
            benchmark::DoNotOptimize(spectrum);
        }
    }
    state.SetItemsProcessed(state.iterations() * count);
}
BENCHMARK(YuleNielsen_Predict)->Arg(1)->Unit(benchmark::kNanosecond);
BENCHMARK(YuleNielsen_Predict)->Arg(10000)->Unit(benchmark::kMillisecond);

} // namespace

BENCHMARK_MAIN();
