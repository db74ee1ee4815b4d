// The print model a front end fits: one name for one choice, mirroring the
// C header's VM_MODEL_* one to one. The tool's --model, Python's model= and
// the C selector all end here; renderers ask the fitted model what it
// predicts, not the flags that chose it.
#ifndef VELTMARQUIST_HOST_MODELCHOICE_H
#define VELTMARQUIST_HOST_MODELCHOICE_H

#include "VeltmarquistDLL.h"

#include <optional>
#include <string>
#include <string_view>

namespace veltmarquist {

enum class ModelChoice : int {
    offset = VM_MODEL_OFFSET,                // the library's offset model, fitted to the greys
    gravure = VM_MODEL_GRAVURE,              // the library's gravure model, default order and factors
    gravureFitted = VM_MODEL_GRAVURE_FITTED, // the gravure model, order and factors fitted to red, green, blue
    yuleNielsen = VM_MODEL_YULE_NIELSEN      // the Yule-Nielsen spectral Neugebauer model, any coverage
};

// The name front ends take and show: "offset", "gravure", "gravure-fitted", "ynsn".
const char* nameOf(ModelChoice choice);
// The choice a name gives, or nothing for a name that is none of them.
std::optional<ModelChoice> modelChoiceNamed(std::string_view name);
// "offset, gravure, gravure-fitted, ynsn": for messages and help texts.
std::string modelChoiceNames();

// "the offset model", "the gravure model (defaults)", "the gravure model
// (fitted)", "the Yule-Nielsen model": the model in a sentence.
std::string describe(ModelChoice choice);

// How output file names and reports call the model's kind: "offset",
// "gravure" (fitted or not) or "ynsn".
const char* kindOf(ModelChoice choice);

} // namespace veltmarquist

#endif // VELTMARQUIST_HOST_MODELCHOICE_H
