// The print models that return values on the golden offset form: the fit,
// one prediction, 10,000 predictions in one batch (spectra, XYZ and CIELAB),
// and a full grid: 11 levels per ink (14,641 points) for a model that predicts
// every coverage, the form's 9 levels per ink (6,561 points) for one that
// predicts only those.
#include "TestSupport.h"
#include "models/PrintModels.h"

#include <benchmark/benchmark.h>

#include <functional>

using namespace testsupport;
using namespace veltmarquist;

namespace {

using Fit = std::function<std::unique_ptr<PrintModel>(const MeasuredForm&)>;

const MeasuredForm& goldenForm()
{
    static const MeasuredForm form = [] {
        const MeasurementBlock block = readGoldenInput("offset-form.in");
        std::vector<Spectrum> spectra(MeasuredForm::kPatches);
        for (size_t p = 0; p < spectra.size(); ++p)
            for (size_t b = 0; b < kSpectrumBands; ++b)
                spectra[p][b] = block.ints[p * kSpectrumBands + b] / 1000.0;
        return MeasuredForm(spectra);
    }();
    return form;
}

// Every combination of the levels, four values each, black outermost.
std::vector<double> grid(const std::vector<double>& levels)
{
    std::vector<double> cmyk;
    for (double k : levels)
        for (double y : levels)
            for (double m : levels)
                for (double c : levels)
                    cmyk.insert(cmyk.end(), {c, m, y, k});
    return cmyk;
}

// The grid a model predicts: its own levels, or 11 levels per ink.
std::vector<double> gridOf(const PrintModel& model)
{
    if (!model.levels().empty())
        return grid(model.levels());
    std::vector<double> levels;
    for (int level = 0; level <= 100; level += 10)
        levels.push_back(level);
    return grid(levels);
}

void FitModel(benchmark::State& state, const Fit& fit)
{
    for (auto _ : state)
        benchmark::DoNotOptimize(fit(goldenForm()));
}

void PredictOne(benchmark::State& state, const Fit& fit)
{
    const auto model = fit(goldenForm());
    const Cmyk cmyk = {40, 70, 20, 10};
    for (auto _ : state)
        benchmark::DoNotOptimize(model->predict(cmyk));
}

// `count` coverages taken from the model's grid in order (repeated when the
// grid is shorter); 0: the whole grid once.
void PredictBatch(benchmark::State& state, const Fit& fit, size_t count)
{
    const auto model = fit(goldenForm());
    const std::vector<double> points = gridOf(*model);
    std::vector<double> cmyk = points;
    if (count > 0) {
        cmyk.resize(4 * count);
        for (size_t i = points.size(); i < cmyk.size(); ++i)
            cmyk[i] = points[i % points.size()];
    }
    const size_t n = cmyk.size() / 4;
    std::vector<double> spectra(n * kSpectrumBands), XYZ(n * 3), Lab(n * 3);
    for (auto _ : state) {
        model->predict(n, cmyk.data(), spectra.data(), XYZ.data(), Lab.data());
        benchmark::ClobberMemory();
    }
    state.counters["patches"] = static_cast<double>(n);
    state.SetItemsProcessed(static_cast<int64_t>(state.iterations() * n));
}

const Fit kOffset = fitOffsetModel;
const Fit kYuleNielsen = fitYuleNielsenModel;
const Fit kGravure = [](const MeasuredForm& form) { return fitGravureModel(form, GravureFactors::defaults); };
const Fit kGravureFitted = [](const MeasuredForm& form) {
    return fitGravureModel(form, GravureFactors::fittedToRedGreenBlue);
};

} // namespace

BENCHMARK_CAPTURE(FitModel, offset, kOffset)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(FitModel, gravure, kGravure)->Unit(benchmark::kMicrosecond);
BENCHMARK_CAPTURE(FitModel, gravureFitted, kGravureFitted)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(FitModel, yuleNielsen, kYuleNielsen)->Unit(benchmark::kMillisecond);

BENCHMARK_CAPTURE(PredictOne, offset, kOffset)->Unit(benchmark::kMicrosecond);
BENCHMARK_CAPTURE(PredictOne, gravure, kGravure)->Unit(benchmark::kMicrosecond);
BENCHMARK_CAPTURE(PredictOne, yuleNielsen, kYuleNielsen)->Unit(benchmark::kMicrosecond);

BENCHMARK_CAPTURE(PredictBatch, offset10000, kOffset, 10000)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(PredictBatch, gravure10000, kGravure, 10000)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(PredictBatch, yuleNielsen10000, kYuleNielsen, 10000)->Unit(benchmark::kMillisecond);

BENCHMARK_CAPTURE(PredictBatch, offsetGrid, kOffset, 0)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(PredictBatch, gravureGrid, kGravure, 0)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(PredictBatch, yuleNielsenGrid, kYuleNielsen, 0)->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
