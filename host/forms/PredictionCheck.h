// How well a print model predicts what a file measured beyond the test form.
//
// A press sheet or a characterisation measurement holds far more than the 46
// patches a model is fitted to: each further C, M, Y, K combination it
// measured is an independent check of the model on that press. The check
// takes every one the model can predict and says why it left out the others.
#ifndef VELTMARQUIST_FORMS_PREDICTIONCHECK_H
#define VELTMARQUIST_FORMS_PREDICTIONCHECK_H

#include "ColourDifference.h"
#include "MeasurementFile.h"

#include "models/PrintModels.h"

#include <array>
#include <cstddef>
#include <string>
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

// Each of `coverages` that the file measured, once, in the order given,
// leaving out the test form's own patches (the model was fitted to them):
// the averaged measurement against the model's prediction. The model must
// predict every coverage passed.
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

// The measured combinations a check leaves out, by why; each combination counts once.
struct LeftOut {
    std::size_t formPatches = 0; // the test form's own patches: the model was fitted to them
    std::size_t offLevels = 0;   // a coverage that is none of the model's levels
    std::size_t furtherInks = 0; // ink beyond C, M, Y, K, which a four-colour model does not print
    // Those left out for the last two reasons, by black as CheckSummary::byBlack.
    std::array<std::size_t, 4> byBlack{};

    std::size_t total() const { return formPatches + offLevels + furtherInks; }
};

// A model against every combination a file measured that the model can
// predict: the characterisation chart's combinations in chart order, then
// every other in file order.
struct ModelCheck {
    std::vector<CheckedPatch> patches;
    CheckSummary all;   // of every checked patch
    CheckSummary chart; // of those on the chart
    LeftOut leftOut;
    std::vector<double> levels; // the model's levels; empty when it predicts every coverage
    std::string model;          // the model's name
};
ModelCheck checkModel(const MeasurementFile& file, const PrintModel& model);

// The check as the lines people read (each without its newline): the
// tool prints them, Python's CheckResult is them as text. One line when
// nothing could be checked.
std::vector<std::string> checkLines(const ModelCheck& check);

} // namespace veltmarquist

#endif // VELTMARQUIST_FORMS_PREDICTIONCHECK_H
