// The profile of a press, from form and model to the file's bytes.
#include "PrintProfile.h"

#include "Cgats.h"
#include "ChartExport.h"
#include "ColourDifference.h"
#include "Failure.h"
#include "ForwardTable.h"
#include "IccProfile.h"
#include "Numbers.h"
#include "Separation.h"

#include <cstdlib>

namespace veltmarquist::profile {

namespace {

constexpr int kDefaultA2bNodes = 17;

// The measured form as the profile's characterisation data: the 46 patches
// as measured (repeats averaged), C, M, Y, K, X, Y, Z and CIELAB (D50).
std::string characterisation(const FoundForm& form)
{
    cgats::Document document;
    document.sheetType = "CTI3";
    document.keywords = {{"DESCRIPTOR", "the measured test form " + exporting::provenanceOf(form.file, form.path).name},
                         {"ORIGINATOR", "veltmarquist"}};
    document.fields = {"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "XYZ_X", "XYZ_Y", "XYZ_Z",
                       "LAB_L", "LAB_A", "LAB_B"};
    const MeasuredForm measured = form.measuredForm();
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch) {
        const Triple XYZ = spectrumToXYZ(measured.spectrum(patch));
        const Lab lab = labOfXYZ(XYZ);
        std::vector<std::string> row{std::to_string(patch + 1)};
        for (double value : MeasuredForm::coverageOf(patch))
            row.push_back(roundTripText(value));
        for (double value : {XYZ[0], XYZ[1], XYZ[2], lab.L, lab.a, lab.b})
            row.push_back(fixedText(value, 4));
        document.rows.push_back(std::move(row));
    }
    return cgats::write(document);
}

std::vector<double> a2bLevels(const ProfileOptions& options, const PrintModel& model)
{
    if (!model.levels().empty())
        return model.levels();
    const int nodes = options.a2bNodes.value_or(kDefaultA2bNodes);
    std::vector<double> levels;
    for (int i = 0; i < nodes; ++i)
        levels.push_back(100.0 * i / (nodes - 1));
    return levels;
}

std::optional<std::time_t> sourceDateEpoch()
{
    const char* epoch = std::getenv("SOURCE_DATE_EPOCH");
    if (epoch == nullptr)
        return std::nullopt;
    char* end = nullptr;
    const long long seconds = std::strtoll(epoch, &end, 10);
    if (end == epoch || *end != '\0' || seconds < 0)
        return std::nullopt;
    return static_cast<std::time_t>(seconds);
}

} // namespace

void checkProfileOptions(const ProfileOptions& options, const PrintModel* model)
{
    if (!(options.inkLimit >= 100.0 && options.inkLimit <= 400.0))
        throw HostError(Failure::Usage, "ink limit " + roundTripText(options.inkLimit) +
                                            ": the total ink limit is a percentage from 100 to 400");
    if (!(options.blackLimit >= 0.0 && options.blackLimit <= 100.0 && options.blackLimit <= options.inkLimit))
        throw HostError(Failure::Usage, "black limit " + roundTripText(options.blackLimit) +
                                            ": the black limit is a percentage from 0 to 100, at most the ink limit");
    const BlackGeneration& black = options.black;
    if (!(black.start >= 0.0 && black.start <= 1.0 && black.amount >= 0.0 && black.amount <= 1.0 &&
          black.shape > 0.0 && black.shape <= 10.0 && black.width > 0.0))
        throw HostError(Failure::Usage, "black generation: start and amount lie from 0 to 1, the shape above 0 and "
                                        "at most 10");
    if (options.a2bNodes) {
        if (model != nullptr && !model->levels().empty() &&
            *options.a2bNodes != static_cast<int>(model->levels().size()))
            throw HostError(Failure::Usage, "A2B grid " + std::to_string(*options.a2bNodes) + ": the " + model->name() +
                                                " model predicts only the form's " +
                                                std::to_string(model->levels().size()) +
                                                " levels, which are its A2B grid (the Yule-Nielsen model takes any)");
        if (*options.a2bNodes < 5 || *options.a2bNodes > 33)
            throw HostError(Failure::Usage, "A2B grid " + std::to_string(*options.a2bNodes) +
                                                ": an A2B table has 5 to 33 nodes per ink");
    }
    if (options.b2aNodes < 9 || options.b2aNodes > 65 || options.b2aNodes % 2 == 0)
        throw HostError(Failure::Usage, "B2A grid " + std::to_string(options.b2aNodes) +
                                            ": a B2A table has an odd number of nodes per axis from 9 to 65, so "
                                            "that one lies on the neutral axis");
}

std::string printProfile(const FittedModel& fit, const FoundForm& form, const ProfileOptions& options,
                         ProfileSummary& summary, const std::function<void(const char*, double)>& progress)
{
    const PrintModel& model = *fit.model;
    checkProfileOptions(options, &model);
    const auto report = [&](const char* step, double done) {
        if (progress)
            progress(step, done);
    };
    report("A2B table", 0.0);
    const ForwardTable a2b(model, a2bLevels(options, model), LabEncoding{options.version});
    summary.a2bLevels = a2bLevels(options, model);
    report("B2A table", 0.05);
    const InkLimits limits{options.inkLimit / 100.0, options.blackLimit / 100.0};
    const SeparationTable b2a = separate(a2b, limits, options.black, options.b2aNodes,
                                         [&](double done) { report("B2A table", 0.05 + 0.9 * done); });
    summary.b2aNodes = b2a.nodes;
    summary.b2aCount = b2a.gamut.size();
    summary.outOfGamut = b2a.outOfGamut;
    summary.darkestL = b2a.darkestL;

    ProfileTexts texts;
    texts.description = options.description;
    if (texts.description.empty()) {
        const std::string descriptor = form.file.keyword("DESCRIPTOR");
        texts.description = (descriptor.empty() ? exporting::provenanceOf(form.file, form.path).name : descriptor) +
                            ", " + model.name() + " model";
    }
    texts.copyright = options.copyright.empty() ? "No copyright; made by veltmarquist from the measurements named "
                                                  "in its characterisation data"
                                                : options.copyright;
    texts.characterisation = characterisation(form);
    summary.description = texts.description;
    report("file", 0.95);
    std::string bytes = iccProfileBytes(a2b, b2a, texts, options.created ? options.created : sourceDateEpoch());
    summary.bytes = bytes.size();
    report("file", 1.0);
    return bytes;
}

} // namespace veltmarquist::profile
