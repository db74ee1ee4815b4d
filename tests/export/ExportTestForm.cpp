#include "ExportTestForm.h"

#include <cstdlib>
#include <fstream>
#include <stdexcept>

using namespace veltmarquist;

namespace exporttest {

const MeasurementFile& formFile()
{
    static const MeasurementFile file = [] {
        ReadResult read = readMeasurementFile(kFormPath);
        if (!read.ok())
            throw std::runtime_error(read.error.describe());
        return *read.file;
    }();
    return file;
}

const MeasuredForm& measuredForm()
{
    static const MeasuredForm form = [] {
        std::vector<Spectrum> spectra(MeasuredForm::kPatches);
        for (int patch = 0; patch < MeasuredForm::kPatches; ++patch) {
            const Cmyk cmyk = MeasuredForm::coverageOf(patch);
            for (const MeasurementSet& set : formFile().sets)
                if (set.devicePercent() == std::vector<double>(cmyk.begin(), cmyk.end()))
                    for (int band = 0; band < kSpectrumBands; ++band)
                        spectra[patch][band] = set.reflectance[band] / double(kReflectanceUnits);
        }
        return MeasuredForm(spectra);
    }();
    return form;
}

const PrintModel& levelModel()
{
    static const auto model = fitGravureModel(measuredForm(), GravureFactors::defaults);
    return *model;
}

const PrintModel& anyCoverageModel()
{
    static const auto model = fitYuleNielsenModel(measuredForm());
    return *model;
}

std::string temporaryFile(const std::string& name, const std::string& text)
{
    const char* folder = std::getenv("TMPDIR");
    const std::string path = std::string(folder != nullptr ? folder : "/tmp") + "/export-test-" + name;
    std::ofstream(path, std::ios::binary) << text;
    return path;
}

} // namespace exporttest
