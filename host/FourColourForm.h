// The four-colour road that every front end takes: the test form read with
// its warnings kept, the chosen model fitted to it, and the form as the model
// reproduces it.
#ifndef VELTMARQUIST_HOST_FOURCOLOURFORM_H
#define VELTMARQUIST_HOST_FOURCOLOURFORM_H

#include "ModelChoice.h"
#include "PredictionCheck.h"
#include "TestForm.h"
#include "ToneValues.h"

#include "models/PrintModels.h"

#include <array>
#include <memory>
#include <string>
#include <vector>

namespace veltmarquist {

// The warnings of one input file (the reader's and the paper's).
struct FileWarnings {
    std::string path;
    std::vector<std::string> warnings;
};

// A four-colour model fitted to the form, and how it was chosen.
struct FittedModel {
    std::shared_ptr<const PrintModel> model;
    ModelChoice choice = ModelChoice::offset;

    // True for a model that predicts every coverage from 0 to 100 %; the
    // library's models predict only the form's levels.
    bool predictsEveryCoverage() const { return model->levels().empty(); }
};

// A patch of the test form, measured and as the model gives it.
struct FormPatch {
    CheckedPatch check;              // X, Y, Z as the 46-step charts hold them
    Spectrum measured{}, modelled{}; // the measured one after the form's orientation check
};

// The form as the fitted model reproduces it.
struct ModelledForm {
    std::vector<FormPatch> patches;             // the 46, in measuring order
    Summary deltaE2000;                         // of the 46 patches
    std::array<ToneValueCurve, 4> toneValues{}; // C, M, Y, K: measured tints and the model's
};

// Reads the form; the file's warnings land in `warnings` before the form is
// looked for, so that a missing patch still leaves them to be shown.
FoundForm readTestForm(const std::string& path, const ReadOptions& options, FileWarnings& warnings);

// The chosen model fitted to the form. Failures of a fit are
// HostErrors (Failure::Calculation) that name the fit.
FittedModel fitModel(const FoundForm& form, ModelChoice choice);

// The 46 patches measured and as the model gives them (X, Y, Z as the 46-step
// charts hold them), and the inks' tone values.
ModelledForm modelForm(const FoundForm& form, const PrintModel& model);

} // namespace veltmarquist

#endif // VELTMARQUIST_HOST_FOURCOLOURFORM_H
