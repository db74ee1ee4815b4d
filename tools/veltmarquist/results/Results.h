// What each command found and computed, apart from how it is shown.
//
// A command fills its result step by step as it goes: when it fails, the
// steps it finished stay filled (and are shown before the error, as a run
// shows them), the others stay empty. Plain values only: no printing here
// (report/TextReport.h renders them as the terminal text, report/HtmlReport.h
// as the HTML page).
#ifndef VELTMARQUIST_TOOL_RESULTS_H
#define VELTMARQUIST_TOOL_RESULTS_H

#include "ColourDifference.h"
#include "MeasurementFile.h"
#include "PatchMatching.h"
#include "PredictionCheck.h"
#include "TestForm.h"
#include "ToneValues.h"

#include "VeltmarquistDLL.h"
#include "models/PrintModels.h"

#include <array>
#include <memory>
#include <optional>
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
    PrintProcess process = VM_PROCESS_OFFSET; // the library's process (offset or gravure)
    bool yuleNielsen = false;                 // the Yule-Nielsen model instead of the library's
    bool gravureFitted = false;               // gravure order and factors fitted to red, green, blue

    // "offset", "gravure" or "ynsn": in file names and the report.
    const char* name() const { return yuleNielsen ? "ynsn" : process == VM_PROCESS_GRAVURE ? "gravure" : "offset"; }
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

// What chart and compare begin with: the form found, the model fitted.
struct FormAndModel {
    FileWarnings formWarnings;
    std::optional<FoundForm> form;
    std::optional<FittedModel> fit;
    std::optional<ModelledForm> modelled;
};

// chart FORM -o CHART, and report FORM (the same without a chart)
struct ChartResult : FormAndModel {
    FileWarnings layoutWarnings;      // of a layout read from a file
    std::string layout;               // empty for the library's chart, else how the export names its patches
    std::string format;               // empty for the library's format, else "CTI3" or "CGATS"
    size_t patches = 0;               // written to the chart
    std::vector<Cmyk> coverages;      // the library's chart's patches, as the check reads them
    std::vector<Triple> predicted;    // their X, Y, Z as the model gives them (the chart limits and cuts them)
    std::string written;              // how messages name the delivered chart; empty until delivered
    // The combinations FORM measured beyond the test form against the
    // model: the chart's combinations in chart order, then (for a model that
    // predicts every coverage) all others in file order.
    std::vector<CheckedPatch> check;
    CheckSummary checkSummary;        // of every checked patch
    CheckSummary chartCheckSummary;   // of those on the chart
    std::string reportWritten;        // how messages name the delivered HTML report; empty until delivered
};

// compare FORM
struct CompareResult : FormAndModel {
    std::string measuredWritten, modelWritten; // empty until delivered
    Summary deltaEab;                          // of the 46 patches (CIEDE2000: modelled->deltaE2000)
};

// A spectrum and its colour (X, Y, Z as the library sums them, CIELAB).
struct ColouredSpectrum {
    Spectrum spectrum{};
    Triple XYZ{};
    Lab lab{};
};

// A patch of a multi-channel spectral chart: the file's channels in percent.
struct ChannelPatch {
    std::vector<double> device;
    ColouredSpectrum colour;
};

// multichannel FORM --inks 6|7 -o CHART, and report FORM --inks 6|7
struct MultiChannelResult {
    int inks = 7;
    FileWarnings formWarnings;
    std::optional<MeasurementFile> form;
    std::optional<PickedPatches> picked;
    std::vector<ChannelPatch> paperAndSolids; // the paper, then each ink's solid in the file's channel order
    std::vector<ChannelPatch> chart;          // the spectral chart as the library wrote it
    std::vector<std::vector<ColouredSpectrum>> ramps; // each ink's tone ramp, 0..100 % in 1 % steps
    FileWarnings separationsWarnings;
    std::string separationsPath;
    std::string chartWritten, combinationsWritten, separatedWritten, reportWritten; // empty until delivered
};

// convert CHART
struct ConvertResult {
    std::vector<FileWarnings> warnings; // the chart's, then the whites' files
    PrintProcess mode = VM_PROCESS_CHART_CONVERT;
    std::string fromLabel, toLabel;     // "'PAPER' " for a sample name, else the file
    double whitesApart = 0.0;           // CIE 1976 dE*ab of the two whites
    double blendWeight = 0.0;           // weight of the converted spectra (blend)
    size_t patches = 0;
    std::string written;                // empty until delivered
};

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_RESULTS_H
