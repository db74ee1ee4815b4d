// A fitted print model told in words a press operator reads: what each
// fitted value does to a dot, rather than the value alone.
#ifndef VELTMARQUIST_TOOL_MODELINWORDS_H
#define VELTMARQUIST_TOOL_MODELINWORDS_H

#include "results/Results.h"

#include <string>
#include <vector>

namespace veltmarquist {

// The fitted value whose name starts with `name`; an empty value when there is none.
const FittedValue& valueNamed(const PrintModel& model, const std::string& name);

// What the model assumes, in one sentence, then one sentence per fitted
// value (numbers included), then the fit's warnings.
struct ModelWords {
    std::string how;
    std::vector<std::string> values;
    std::vector<std::string> warnings;
};
ModelWords modelInWords(const FittedModel& fit);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_MODELINWORDS_H
