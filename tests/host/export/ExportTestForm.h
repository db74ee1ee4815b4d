// The bundled offset form, models fitted to it and a catcher of export
// errors, shared by the export tests and benchmark.
#ifndef VELTMARQUIST_EXPORTTESTFORM_H
#define VELTMARQUIST_EXPORTTESTFORM_H

#include "ChartLayouts.h"
#include "Failure.h"
#include "models/PrintModels.h"

#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <functional>

namespace exporttest {

using namespace veltmarquist;

const std::string kFormPath = VELTMARQUIST_SAMPLES_DIR "/offset_form.txt";

inline const MeasurementFile& formFile()
{
    static const MeasurementFile file = *readMeasurementFile(kFormPath).file;
    return file;
}

// The sample holds the 46 patches of the test form in measuring order.
inline const MeasuredForm& measuredForm()
{
    static const MeasuredForm form = [] {
        std::vector<Spectrum> spectra(MeasuredForm::kPatches);
        for (size_t patch = 0; patch < spectra.size(); ++patch)
            for (size_t band = 0; band < kSpectrumBands; ++band)
                spectra[patch][band] = formFile().sets[patch].reflectance[band] / double(kReflectanceUnits);
        return MeasuredForm(spectra);
    }();
    return form;
}

// A model bound to the form's levels (gravure, defaults) and one that predicts every coverage.
inline const PrintModel& levelModel()
{
    static const auto model = fitGravureModel(measuredForm(), GravureFactors::defaults);
    return *model;
}
inline const PrintModel& anyCoverageModel()
{
    static const auto model = fitYuleNielsenModel(measuredForm());
    return *model;
}

inline std::string temporaryFile(const std::string& name, const std::string& text)
{
    // One folder per process, so that runs at once do not share files; removed at the end.
    static const struct Folder {
        std::filesystem::path path = std::filesystem::temp_directory_path() /
                                     ("veltmarquist-export-test-" + std::to_string(::getpid()));
        Folder() { std::filesystem::create_directories(path); }
        ~Folder() { std::filesystem::remove_all(path); }
    } folder;
    const std::string path = (folder.path / name).string();
    std::ofstream(path, std::ios::binary) << text;
    return path;
}

// "exit code: message" of the HostError that `action` throws; "" when it throws none.
inline std::string failureOf(const std::function<void()>& action)
{
    try {
        action();
    } catch (const HostError& error) {
        return std::to_string(exitCodeOf(error.failure())) + ": " + error.what();
    }
    return "";
}

} // namespace exporttest

#endif // VELTMARQUIST_EXPORTTESTFORM_H
