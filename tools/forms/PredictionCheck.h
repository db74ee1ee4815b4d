// How well a print model predicts what a file measured beyond the test form.
//
// A press sheet or a characterisation measurement holds far more than the 46
// patches a model is fitted to: each further C, M, Y, K combination it
// measured is an independent check of the model on that press.
#ifndef VELTMARQUIST_FORMS_PREDICTIONCHECK_H
#define VELTMARQUIST_FORMS_PREDICTIONCHECK_H

#include "ColourDifference.h"
#include "MeasurementFile.h"

#include "models/PrintModels.h"

#include <array>
#include <cstddef>
#include <vector>

namespace veltmarquist {

// One measured combination against the model's prediction.
struct CheckedPatch {
    Cmyk device{};
    Triple measuredXYZ{};  // the averaged measurement, Y limited to 100
    Triple predictedXYZ{}; // as an XYZ chart holds the prediction (chartXYZ)
    Lab measuredLab{}, predictedLab{};
    double deltaEab = 0.0, deltaE2000 = 0.0;
    bool onChart = false; // one of the 900 combinations of the characterisation chart
};

// One patch: CIELAB of both and their differences.
CheckedPatch checkedPatch(const Cmyk& device, const Triple& measuredXYZ, const Triple& predictedXYZ);

// X, Y, Z (as the model gives them, Y not limited) of each coverage, in one
// batch: the model refuses the whole batch when it does not predict one.
std::vector<Triple> predictXYZ(const PrintModel& model, const std::vector<Cmyk>& coverages);
// The spectra of the coverages, in one batch likewise.
std::vector<Spectrum> predictSpectra(const PrintModel& model, const std::vector<Cmyk>& coverages);

// The C, M, Y, K combinations of the file (further channels 0), each once, in
// file order.
std::vector<Cmyk> measuredCombinations(const MeasurementFile& file);

// Each of `coverages` that the file measured, once, in the order given,
// leaving out the test form's own patches (the model was fitted to them):
// the averaged measurement against the model's prediction. The model must
// predict every coverage passed (the library's models: only the form's
// levels, as on the characterisation chart).
std::vector<CheckedPatch> checkPredictions(const MeasurementFile& file, const std::vector<Cmyk>& coverages,
                                           const PrintModel& model);

// The ranges of black the summary splits the check by: 0 for K 0, 1 for
// K 1-40, 2 for K 41-85, 3 for K 86-100 %.
size_t blackRangeOf(double black);

struct CheckSummary {
    Summary deltaE2000;
    size_t largest = 0; // the first patch with the largest CIEDE2000
    // CIEDE2000 by black: K 0, 1-40, 41-85, 86-100 %.
    std::array<Summary, 4> byBlack{};
};
CheckSummary summariseChecks(const std::vector<CheckedPatch>& patches);

} // namespace veltmarquist

#endif // VELTMARQUIST_FORMS_PREDICTIONCHECK_H
