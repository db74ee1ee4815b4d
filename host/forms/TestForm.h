// Finding the four-colour test form in a measurement file.
//
// The 46 patches are found by their C, M, Y, K values wherever they stand in
// the file, so a measured test form, an IT8.7/4 or an ECI 2002 measurement
// all serve; repeats of one combination are averaged; everything else in the
// file stays available for checks (PredictionCheck.h).
#ifndef VELTMARQUIST_FORMS_TESTFORM_H
#define VELTMARQUIST_FORMS_TESTFORM_H

#include "LibraryBlock.h"
#include "MeasurementFile.h"
#include "PatchMatching.h"

#include "models/PrintModels.h"

#include <string>
#include <utility>
#include <vector>

namespace veltmarquist {

struct FoundForm {
    std::string path;       // as given
    MeasurementFile file;   // every set, the layouts, the scale, the reader's and the paper warnings
    PickedPatches picked;   // the 46 averaged patches, and how many sets were used, averaged, ignored
    MeasurementBlock block; // the 46 patches as CalculateChart and FitPrintModel take them
    std::vector<Spectrum> spectra; // the same as the library's 36 bands, in measuring order
    // Where the measurements came from, as the header states it (see provenanceOf).
    std::vector<std::pair<std::string, std::string>> provenance;

    // The form the print models are fitted to.
    MeasuredForm measuredForm() const { return MeasuredForm(spectra); }
};

// The keywords of a file's header that say where its measurements came from:
// what was printed and by whom (DESCRIPTOR, ORIGINATOR, CREATED,
// PRINT_CONDITIONS, TARGET_TYPE) and how it was measured (INSTRUMENTATION,
// MEASUREMENT_CONDITION, ILLUMINATION_NAME, OBSERVER_ANGLE, FILTER, ...), in
// file order.
std::vector<std::pair<std::string, std::string>> provenanceOf(const MeasurementFile& file);

// Reads `path` and finds the form. HostErrors name the file (and line): an
// unreadable file, a file without spectral or device fields, every missing
// patch at once, and a form no model may be fitted to (MeasuredForm's rules:
// reflectance outside -0.01..1.5, a paper not brighter than every solid).
FoundForm findTestForm(const std::string& path, const ReadOptions& options);
// The same for a file already read; `path` names it in messages.
FoundForm findTestForm(MeasurementFile file, const std::string& path);

} // namespace veltmarquist

#endif // VELTMARQUIST_FORMS_TESTFORM_H
