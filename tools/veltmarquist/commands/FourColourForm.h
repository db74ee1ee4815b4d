// What chart and compare share: the test form read with its warnings kept,
// the four-colour model that the options choose, fitted to it, and the form
// as the model reproduces it.
#ifndef VELTMARQUIST_TOOL_FOURCOLOURFORM_H
#define VELTMARQUIST_TOOL_FOURCOLOURFORM_H

#include "TestForm.h"
#include "results/Results.h"

#include "VeltmarquistDLL.h"
#include "models/PrintModels.h"

#include <string>

namespace veltmarquist {

// Reads the form; the file's warnings land in `warnings` before the form is
// looked for, so that a missing patch still leaves them to be shown.
FoundForm readTestForm(const std::string& path, const ReadOptions& options, FileWarnings& warnings);

// The library's offset or gravure model (with --fit-gravure its factors
// fitted), or the Yule-Nielsen model. Failures of a fit are ToolErrors.
FittedModel fitChosenModel(const FoundForm& form, PrintProcess process, bool fitGravure, bool yuleNielsen);

// The 46 patches measured and as the model gives them (X, Y, Z as the 46-step
// charts hold them), and the inks' tone values.
ModelledForm modelForm(const FoundForm& form, const PrintModel& model);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_FOURCOLOURFORM_H
