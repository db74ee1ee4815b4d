// The C entry points of the print models: a fit from the measurement block
// that CalculateChart takes, predictions into the host's arrays, the fitted
// values for display. A model handle is the PrintModel itself, entered in a
// registry of live models that every call looks the handle up in first.
// Every exception becomes a status: none crosses the C boundary.
#include "PrintModels.h"

#include "Colorimetry.h"
#include "FormOrientation.h"
#include "MeasurementBlock.h"

#include <algorithm>
#include <mutex>
#include <new>
#include <optional>
#include <shared_mutex>
#include <stdexcept>
#include <unordered_set>

namespace {

using namespace veltmarquist;

using Fit = std::unique_ptr<PrintModel> (*)(const MeasuredForm&);

// The fit a selector names, or null for a selector this library holds no model for.
Fit fitFor(int model)
{
    switch (model) {
    case VM_MODEL_OFFSET:
        return fitOffsetModel;
    case VM_MODEL_GRAVURE:
        return [](const MeasuredForm& form) { return fitGravureModel(form, GravureFactors::defaults); };
    case VM_MODEL_GRAVURE_FITTED:
        return [](const MeasuredForm& form) { return fitGravureModel(form, GravureFactors::fittedToRedGreenBlue); };
    case VM_MODEL_YULE_NIELSEN:
        return fitYuleNielsenModel;
    default:
        return nullptr;
    }
}

// The models this library handed out and has not destroyed. A handle is
// looked up before it is used, never dereferenced first, so a destroyed model
// or another object's handle gives a status instead of a crash. Predictions
// hold the registry shared for their whole run, so that a model is not
// destroyed under a prediction in another thread.
class Registry {
public:
    void enter(const void* model)
    {
        const std::unique_lock<std::shared_mutex> lock(mutex_);
        live_.insert(model);
    }
    // Removes a live model and returns true; false for any other handle.
    bool leave(const void* model)
    {
        const std::unique_lock<std::shared_mutex> lock(mutex_);
        return live_.erase(model) > 0;
    }
    // Runs `use` on a live model under the shared lock; VM_STATUS_UNKNOWN_HANDLE otherwise.
    template <typename Use>
    int with(const void* model, Use use)
    {
        const std::shared_lock<std::shared_mutex> lock(mutex_);
        if (live_.count(model) == 0)
            return VM_STATUS_UNKNOWN_HANDLE;
        return use(*static_cast<const PrintModel*>(model));
    }

private:
    std::shared_mutex mutex_;
    std::unordered_set<const void*> live_;
};

Registry& registry()
{
    static Registry models;
    return models;
}

void describe(const PrintModel& m, const char** name, int* valueCount, const double** levels, int* levelCount)
{
    if (name != nullptr)
        *name = m.name().c_str();
    if (valueCount != nullptr)
        *valueCount = static_cast<int>(m.fittedValues().size());
    if (levels != nullptr)
        *levels = m.levels().empty() ? nullptr : m.levels().data();
    if (levelCount != nullptr)
        *levelCount = static_cast<int>(m.levels().size());
}

// The test form in a valid block, its rows placed and oriented as process 0 places and orients them.
MeasuredForm formOf(const measurementblock::Rows& buffers)
{
    double* const* rows = buffers.rows;
    // The exchange runs on the whole row table, as readData runs it: rows
    // behind the form take part.
    if (formorientation::readInSwappedHalves(rows, colorimetry::defaultNormFactor()))
        formorientation::exchangeHalves(rows);
    std::vector<Spectrum> spectra(MeasuredForm::kPatches);
    for (int p = 0; p < MeasuredForm::kPatches; ++p)
        std::copy(rows[p], rows[p] + kSpectrumBands, spectra[static_cast<size_t>(p)].begin());
    return MeasuredForm(spectra);
}

} // namespace

extern "C" {

int FitPrintModel(int model, const int* measurements, int inputKind, int firstWavelength, int valuesPerPatch,
                  int count, void** fitted)
{
    if (fitted != nullptr)
        *fitted = nullptr;
    if (inputKind != VM_INPUT_10NM && inputKind != VM_INPUT_16BAND)
        return VM_STATUS_UNKNOWN_INPUT_KIND;
    const Fit fit = fitFor(model);
    if (fit == nullptr)
        return VM_STATUS_UNKNOWN_MODEL;
    if (fitted == nullptr)
        return VM_STATUS_INVALID_ARGUMENT;
    const measurementblock::Layout layout{inputKind, firstWavelength, valuesPerPatch, count};
    // Bands lie on the 10 nm grid: a first band at 379 nm is no place the
    // block can say, where CalculateChart would take it as 370 nm.
    if (!measurementblock::blockValid(measurements, layout, MeasuredForm::kPatches) ||
        (inputKind == VM_INPUT_10NM && firstWavelength % 10 != 0))
        return VM_STATUS_INVALID_MEASUREMENTS;
    try {
        measurementblock::Rows buffers;
        if (const int status = measurementblock::marshal(measurements, layout, buffers))
            return status;
        std::optional<MeasuredForm> form;
        try {
            form.emplace(formOf(buffers));
        } catch (const std::invalid_argument&) {
            return VM_STATUS_INVALID_MEASUREMENTS; // no measured form
        }
        std::unique_ptr<PrintModel> made = fit(*form);
        registry().enter(made.get());
        *fitted = made.release();
        return VM_STATUS_OK;
    } catch (const std::bad_alloc&) {
        return VM_STATUS_OUT_OF_MEMORY;
    } catch (...) {
        return VM_STATUS_CALCULATION_FAILED;
    }
}

int PredictPrintModel(const void* model, int count, const double* cmyk, double* spectra, double* XYZ, double* Lab)
{
    if (model == nullptr || count < 0 || (count > 0 && cmyk == nullptr))
        return VM_STATUS_INVALID_ARGUMENT;
    return registry().with(model, [&](const PrintModel& m) {
        try {
            m.predict(static_cast<std::size_t>(count), cmyk, spectra, XYZ, Lab);
            return static_cast<int>(VM_STATUS_OK);
        } catch (const std::invalid_argument&) {
            return static_cast<int>(VM_STATUS_COVERAGE_NOT_PREDICTED);
        } catch (...) {
            return static_cast<int>(VM_STATUS_CALCULATION_FAILED);
        }
    });
}

int DescribePrintModel(const void* model, const char** name, int* valueCount, const double** levels, int* levelCount)
{
    if (model == nullptr)
        return VM_STATUS_INVALID_ARGUMENT;
    return registry().with(model, [&](const PrintModel& m) {
        describe(m, name, valueCount, levels, levelCount);
        return static_cast<int>(VM_STATUS_OK);
    });
}

int GetPrintModelValue(const void* model, int index, const char** name, const double** numbers, int* count,
                       const char** text)
{
    if (model == nullptr)
        return VM_STATUS_INVALID_ARGUMENT;
    return registry().with(model, [&](const PrintModel& m) {
        const std::vector<FittedValue>& values = m.fittedValues();
        if (index < 0 || static_cast<std::size_t>(index) >= values.size())
            return static_cast<int>(VM_STATUS_INVALID_ARGUMENT);
        const FittedValue& value = values[static_cast<std::size_t>(index)];
        if (name != nullptr)
            *name = value.name.c_str();
        if (numbers != nullptr)
            *numbers = value.numbers.empty() ? nullptr : value.numbers.data();
        if (count != nullptr)
            *count = static_cast<int>(value.numbers.size());
        if (text != nullptr)
            *text = value.text.c_str();
        return static_cast<int>(VM_STATUS_OK);
    });
}

void DestroyPrintModel(void* model)
{
    // Only a live model is deleted: null, a model destroyed before and any
    // other handle are left alone.
    if (model != nullptr && registry().leave(model))
        delete static_cast<PrintModel*>(model);
}

} // extern "C"
