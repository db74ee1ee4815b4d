// The print models that return values: the golden charts of processes 0 and
// 1 predicted patch by patch in a batch and one by one and written by the
// library's chart writer from values, the refusals, and the statuses of the
// C entry points.
#include "TestSupport.h"
#include "models/PrintModels.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <functional>
#include <limits>

using namespace testsupport;
using namespace veltmarquist;

namespace {

using Model = std::shared_ptr<const PrintModel>;

MeasuredForm formOf(const std::string& golden, bool swapHalves = false)
{
    const MeasurementBlock block = readGoldenInput(golden);
    std::vector<Spectrum> spectra(MeasuredForm::kPatches);
    for (size_t p = 0; p < spectra.size(); ++p)
        for (size_t b = 0; b < kSpectrumBands; ++b)
            spectra[p][b] = block.ints[p * kSpectrumBands + b] / 1000.0;
    for (size_t i = 0; swapHalves && i + 24 < spectra.size(); ++i)
        std::swap(spectra[i], spectra[i + 24]);
    return MeasuredForm(spectra);
}

// A model fitted through the C entry point (its handle is the model).
Model fittedFromC(int selector, const std::string& golden)
{
    MeasurementBlock block = readGoldenInput(golden);
    void* handle = nullptr;
    EXPECT_EQ(FitPrintModel(selector, block.ints.data(), block.inputKind, block.firstWavelength,
                            block.valuesPerPatch, block.count, &handle),
              VM_STATUS_OK);
    return Model(static_cast<PrintModel*>(handle), DestroyPrintModel);
}

} // namespace

TEST(PrintModels, PredictTheProfilesGoldenChartsInABatchAndOneByOne)
{
    const struct {
        const char* what;
        std::function<Model()> fit;
        const char* chart;
    } cases[] = {
        {"offset", [] { return fitOffsetModel(formOf("offset-form.in")); }, "offset-form.p0.chart"},
        {"offset, halves swapped", [] { return fitOffsetModel(formOf("offset-form.in", true)); },
         "offset-form.p0.chart"},
        {"offset, 16 bands through C", [] { return fittedFromC(VM_MODEL_OFFSET, "offset-form-k20.in"); },
         "offset-form-k20.p0.chart"},
        {"gravure", [] { return fitGravureModel(formOf("offset-form.in"), GravureFactors::defaults); },
         "offset-form.p1.chart"},
        {"gravure, fitted factors through C", [] { return fittedFromC(VM_MODEL_GRAVURE_FITTED, "offset-form.in"); },
         "offset-form.rgb-p1.chart"},
    };
    const std::vector<Cmyk> chart = characterisationChart();
    std::vector<double> cmyk;
    for (const Cmyk& coverage : chart)
        cmyk.insert(cmyk.end(), coverage.begin(), coverage.end());
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        const Model model = c.fit();
        ASSERT_NE(model, nullptr);
        std::vector<double> XYZ(3 * 900), Lab(3 * 900);
        model->predict(900, cmyk.data(), nullptr, XYZ.data(), Lab.data());
        std::vector<Triple> one;
        for (size_t i = 0; i < 900; ++i) {
            const Triple xyz = spectrumToXYZ(model->predict(chart[i])), lab = XYZToLab(xyz);
            one.push_back(xyz);
            EXPECT_EQ(std::memcmp(xyz.data(), &XYZ[3 * i], sizeof xyz), 0) << "batch, patch " << i + 1;
            EXPECT_EQ(std::memcmp(lab.data(), &Lab[3 * i], sizeof lab), 0) << "batch, patch " << i + 1;
        }
        EXPECT_EQ(xyzChartText(chart, one), readFile(goldenPath(c.chart)));
    }
    // The fitted values that the golden charts were made with.
    const auto offset = fitOffsetModel(formOf("offset-form.in"));
    EXPECT_EQ(offset->fittedValues().at(0).numbers, (std::vector<double>{-0.04, -0.03, -0.02, 0.03}));
    EXPECT_EQ(offset->fittedValues().at(1).numbers, std::vector<double>{96});
    const auto gravure = fitGravureModel(formOf("offset-form.in"), GravureFactors::fittedToRedGreenBlue);
    EXPECT_EQ(gravure->fittedValues().at(0).text, "YMKC");
    EXPECT_EQ(gravure->fittedValues().at(1).numbers, (std::vector<double>{0.95, 0.95, 1}));
}

TEST(PrintModels, RefuseCoveragesTheyDoNotPredictAndWriteNothing)
{
    const MeasuredForm form = formOf("offset-form.in");
    const Model offset = fitOffsetModel(form), gravure = fitGravureModel(form, GravureFactors::defaults);
    const double nan = std::numeric_limits<double>::quiet_NaN(), inf = std::numeric_limits<double>::infinity();
    const std::string levels = " model predicts only the form's levels 0, 10, 20, 40, 60, 70, 80, 90, 100 %; ";
    const struct {
        const PrintModel* model;
        Cmyk cmyk;
        std::string message;
    } cases[] = {
        {offset.get(), {35, 0, 0, 0}, "the offset" + levels + "C 35 is not one"},
        {gravure.get(), {100, 40, 0, 50}, "the gravure" + levels + "K 50 is not one"},
        {offset.get(), {-1, 0, 0, 0}, "C -1 is not a coverage from 0 to 100 %"},
        {gravure.get(), {0, 100.5, 0, 0}, "M 100.5 is not a coverage from 0 to 100 %"},
        {offset.get(), {0, 0, nan, 0}, "Y nan is not a coverage from 0 to 100 %"},
        {gravure.get(), {0, 0, 0, -inf}, "K -inf is not a coverage from 0 to 100 %"},
    };
    auto refusal = [](const std::function<void()>& call) -> std::string {
        try {
            call();
        } catch (const std::invalid_argument& refused) {
            return refused.what();
        }
        return "predicted";
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.message);
        EXPECT_EQ(refusal([&] { c.model->predict(c.cmyk); }), c.message);
        // In a batch the refused patch is named, and nothing is written.
        const double batch[8] = {0, 0, 0, 0, c.cmyk[0], c.cmyk[1], c.cmyk[2], c.cmyk[3]};
        std::vector<double> spectra(72, -7.0);
        EXPECT_EQ(refusal([&] { c.model->predict(2, batch, spectra.data(), nullptr, nullptr); }),
                  "patch 1: " + c.message);
        EXPECT_EQ(spectra, std::vector<double>(72, -7.0)) << "written before the refusal";
    }
    EXPECT_EQ(refusal([] { MeasuredForm(std::vector<Spectrum>(45)); }),
              "a measured form holds the 46 spectra of the test form; 45 were given");
}

// What cannot be a measured form is refused by every model, at the C door
// with status 4 and *fitted null; a fitted model's handle stays checked.
TEST(PrintModelEntryPoints, FormsThatAreNoMeasurementAndHandlesThatAreNoModel)
{
    const MeasurementBlock golden = readGoldenInput("offset-form.in");
    auto altered = [&](const std::function<void(std::vector<int>&)>& change) {
        std::vector<int> ints = golden.ints;
        change(ints);
        return ints;
    };
    auto patch = [](std::vector<int>& ints, int p, int value) {
        std::fill_n(ints.begin() + 36 * p, 36, value);
    };
    const struct {
        const char* what;
        std::vector<int> block;
        int firstWavelength;
    } forms[] = {
        {"all zero", std::vector<int>(golden.ints.size(), 0), 380},
        {"all INT_MAX", std::vector<int>(golden.ints.size(), std::numeric_limits<int>::max()), 380},
        {"all -1000", std::vector<int>(golden.ints.size(), -1000), 380},
        {"one value everywhere", std::vector<int>(golden.ints.size(), 500), 380},
        {"percent scale", altered([](std::vector<int>& ints) { for (int& v : ints) v *= 100; }), 380},
        {"a band at -0.011", altered([](std::vector<int>& ints) { ints[36 * 5 + 3] = -11; }), 380},
        {"a band at 1.501", altered([](std::vector<int>& ints) { ints[36 * 7 + 30] = 1501; }), 380},
        {"paper darker than the cyan solid", altered([&](std::vector<int>& ints) { patch(ints, 1, 40); }), 380},
        {"first band at 379 nm", golden.ints, 379},
    };
    for (const int selector : {VM_MODEL_OFFSET, VM_MODEL_GRAVURE, VM_MODEL_GRAVURE_FITTED, VM_MODEL_YULE_NIELSEN})
        for (const auto& form : forms) {
            void* handle = &handle;
            EXPECT_EQ(FitPrintModel(selector, form.block.data(), 10, form.firstWavelength, 36, 46, &handle),
                      VM_STATUS_INVALID_MEASUREMENTS)
                << form.what << ", model " << selector;
            EXPECT_EQ(handle, nullptr) << form.what;
        }
    // Noise a few thousandths below zero on a dark patch is a measurement.
    void* handle = &handle;
    const std::vector<int> noisy = altered([](std::vector<int>& ints) { ints[36 * 5 + 3] = -10; });
    EXPECT_EQ(FitPrintModel(VM_MODEL_YULE_NIELSEN, noisy.data(), 10, 380, 36, 46, &handle), VM_STATUS_OK);
    for (int kind : {15, 10}) { // status 2, then 6: *fitted is null after any status
        void* other = &other;
        EXPECT_NE(FitPrintModel(kind == 10 ? 7 : 0, golden.ints.data(), kind, 380, 36, 46, &other), VM_STATUS_OK);
        EXPECT_EQ(other, nullptr) << "kind " << kind;
    }
    // A destroyed model, a profile and any other pointer are unknown handles; destroying them does nothing.
    void* profile = CreateMathProfile("not a model");
    int unrelated = 0;
    const double cmyk[4] = {0, 0, 0, 0};
    double Lab[3] = {-1, -1, -1};
    ASSERT_EQ(PredictPrintModel(handle, 1, cmyk, nullptr, nullptr, Lab), VM_STATUS_OK);
    EXPECT_GT(Lab[0], 90.0);
    DestroyPrintModel(handle);
    for (const void* stranger : {handle, profile, static_cast<void*>(&unrelated)}) {
        const char* name = nullptr;
        EXPECT_EQ(PredictPrintModel(stranger, 1, cmyk, nullptr, nullptr, Lab), VM_STATUS_UNKNOWN_HANDLE);
        EXPECT_EQ(DescribePrintModel(stranger, &name, nullptr, nullptr, nullptr), VM_STATUS_UNKNOWN_HANDLE);
        EXPECT_EQ(GetPrintModelValue(stranger, 0, &name, nullptr, nullptr, nullptr), VM_STATUS_UNKNOWN_HANDLE);
        EXPECT_EQ(name, nullptr);
        DestroyPrintModel(const_cast<void*>(stranger));
    }
    DestroyMathProfile(profile);
}

TEST(PrintModelEntryPoints, StatusesAsDocumented)
{
    MeasurementBlock block = readGoldenInput("offset-form.in");
    const int* ints = block.ints.data();
    void* handle = nullptr;
    auto fit = [&](int model, int kind, int values, int count, const int* measurements, void** out) {
        return FitPrintModel(model, measurements, kind, 380, values, count, out);
    };
    ASSERT_EQ(fit(VM_MODEL_GRAVURE, 10, 36, 46, ints, &handle), VM_STATUS_OK);
    const double levels[4] = {100, 40, 0, 0}, between[4] = {35, 0, 0, 0};
    double Lab[3] = {-1, -1, -1};
    const char* name = nullptr;
    const struct {
        const char* what;
        std::function<int()> call;
        int expected;
    } cases[] = {
        {"fit: kind 15 before the unknown model", [&] { return fit(9, 15, 36, 46, ints, &handle); }, 2},
        {"fit: selector 4", [&] { return fit(4, 10, 36, 46, ints, &handle); }, 6},
        {"fit: selector -1", [&] { return fit(-1, 20, 16, 46, ints, &handle); }, 6},
        {"fit: null model pointer", [&] { return fit(0, 10, 36, 46, ints, nullptr); }, 7},
        {"fit: null measurements", [&] { return fit(0, 10, 36, 46, nullptr, &handle); }, 4},
        {"fit: 45 patches", [&] { return fit(1, 10, 36, 45, ints, &handle); }, 4},
        {"fit: no scratch memory", [&] { FailingAllocation none(1); return fit(0, 10, 36, 46, ints, &handle); }, 5},
        {"predict: null model", [&] { return PredictPrintModel(nullptr, 1, levels, nullptr, nullptr, Lab); }, 7},
        {"predict: count -1", [&] { return PredictPrintModel(handle, -1, levels, nullptr, nullptr, Lab); }, 7},
        {"predict: null coverages", [&] { return PredictPrintModel(handle, 1, nullptr, nullptr, nullptr, Lab); }, 7},
        {"predict: nothing", [&] { return PredictPrintModel(handle, 0, nullptr, nullptr, nullptr, Lab); }, 0},
        {"predict: C 35", [&] { return PredictPrintModel(handle, 1, between, nullptr, nullptr, Lab); }, 8},
        {"describe: null model", [&] { return DescribePrintModel(nullptr, &name, nullptr, nullptr, nullptr); }, 7},
        {"value: index -1", [&] { return GetPrintModelValue(handle, -1, &name, nullptr, nullptr, nullptr); }, 7},
        {"value: index 2 of 2", [&] { return GetPrintModelValue(handle, 2, &name, nullptr, nullptr, nullptr); }, 7},
    };
    void* const fitted = handle;
    for (const auto& c : cases) {
        handle = fitted;
        EXPECT_EQ(c.call(), c.expected) << c.what;
    }
    handle = fitted;
    EXPECT_EQ(Lab[0], -1.0) << "nothing written on a refusal";
    const char* text = nullptr;
    ASSERT_EQ(DescribePrintModel(handle, &name, nullptr, nullptr, nullptr), VM_STATUS_OK);
    EXPECT_STREQ(name, "gravure");
    ASSERT_EQ(GetPrintModelValue(handle, 0, &name, nullptr, nullptr, &text), VM_STATUS_OK);
    EXPECT_EQ(std::string(name) + ": " + text, "ink order: YCMK");
    DestroyPrintModel(handle);
    DestroyPrintModel(nullptr);
}
