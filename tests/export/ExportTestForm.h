// The bundled offset form and models fitted to it, shared by the export tests.
#ifndef VELTMARQUIST_EXPORTTESTFORM_H
#define VELTMARQUIST_EXPORTTESTFORM_H

#include "MeasurementFile.h"
#include "models/PrintModels.h"

#include <string>

namespace exporttest {

const std::string kFormPath = VELTMARQUIST_SAMPLES_DIR "/offset_form.txt";

// samples/offset_form.txt as read by our reader.
const veltmarquist::MeasurementFile& formFile();
// Its 46 test-form patches, found by their coverages.
const veltmarquist::MeasuredForm& measuredForm();
// A model bound to the form's levels (gravure with its defaults) and one that
// predicts every coverage (Yule-Nielsen), fitted once.
const veltmarquist::PrintModel& levelModel();
const veltmarquist::PrintModel& anyCoverageModel();
// A file in the temporary folder holding `text`; returns its path.
std::string temporaryFile(const std::string& name, const std::string& text);

} // namespace exporttest

#endif // VELTMARQUIST_EXPORTTESTFORM_H
