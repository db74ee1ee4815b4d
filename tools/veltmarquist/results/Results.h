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
#include "Conformance.h"
#include "FourColourForm.h"
#include "MeasurementFile.h"
#include "PatchMatching.h"
#include "PredictionCheck.h"
#include "PrintProfile.h"

#include "VeltmarquistDLL.h"
#include "models/PrintModels.h"

#include <array>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace veltmarquist {

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
    // The combinations FORM measured beyond the test form that the model
    // predicts, against the model, and those it left out.
    ModelCheck check;
    std::string reportWritten;        // how messages name the delivered HTML report; empty until delivered
};

// profile FORM -o PROFILE
struct ProfileResult : FormAndModel {
    profile::ProfileSummary summary;
    std::string settings;  // limits and black generation, as the report says them
    std::string version;   // "2.4" or "4.3"
    std::string written;   // empty until delivered
    ModelCheck check;
};

// conformance FORM --reference REF
struct ConformanceRun : FormAndModel {
    std::optional<conformance::Reference> reference;
    std::vector<std::string> conditions;  // the measurement conditions compared, as the report says them
    std::optional<conformance::ConformanceResult> result;
    std::string report; // the HTML page's name once delivered
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
