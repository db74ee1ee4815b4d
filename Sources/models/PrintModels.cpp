// What every print model shares: the measured form, the check of the
// requested coverages, the batch prediction and the colorimetry of its results.
#include "PrintModels.h"

#include "Colorimetry.h"
#include "FormOrientation.h"
#include "FormPatches.h"
#include "MathProfile.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <stdexcept>

namespace veltmarquist {

namespace {

const char kInkLetters[4] = {'C', 'M', 'Y', 'K'};

// The shortest text that reads back as the same double; independent of the C locale.
std::string number(double value)
{
    char text[32];
    const auto written = std::to_chars(text, text + sizeof text, value);
    return std::string(text, written.ptr);
}

double normFactor()
{
    static const double factor = colorimetry::defaultNormFactor();
    return factor;
}

// One decimal, for the numbers of a message a person reads.
std::string oneDecimal(double value)
{
    char text[400];
    const auto written = std::to_chars(text, text + sizeof text, value, std::chars_format::fixed, 1);
    return std::string(text, written.ptr);
}

// "C 0 M 90 Y 0 K 0": a patch of the form as people find it on the sheet.
std::string coverageText(const Cmyk& cmyk)
{
    std::string text;
    for (int ink = 0; ink < 4; ++ink)
        text += (ink == 0 ? "" : " ") + std::string(1, kInkLetters[ink]) + " " + number(cmyk[static_cast<std::size_t>(ink)]);
    return text;
}

bool isReflectance(double value)
{
    return value >= kLowestReflectance && value <= kHighestReflectance; // false for NaN
}

std::string reflectanceRange()
{
    return number(kLowestReflectance) + " to " + number(kHighestReflectance);
}

// Why a predicted spectrum is no colour, or an empty text.
std::string noColour(const double* spectrum)
{
    for (int b = 0; b < kSpectrumBands; ++b)
        if (!isReflectance(spectrum[b]))
            return "the model predicts reflectance " + number(spectrum[b]) + " at " + std::to_string(380 + 10 * b) +
                   " nm, which is no colour (reflectance lies from " + reflectanceRange() + ")";
    return std::string();
}

// The paper and the four solids among the form's patches.
int formPatchOf(const Cmyk& wanted)
{
    for (int p = 0; p < MeasuredForm::kPatches; ++p)
        if (MeasuredForm::coverageOf(p) == wanted)
            return p;
    return -1;
}

} // namespace

Triple spectrumToXYZ(const Spectrum& spectrum)
{
    Triple XYZ;
    colorimetry::spectrumToXYZ(spectrum.data(), normFactor(), XYZ.data());
    return XYZ;
}

Triple XYZToLab(const Triple& XYZ)
{
    Triple Lab;
    colorimetry::XYZToLab(XYZ[0] / 100.0, XYZ[1] / 100.0, XYZ[2] / 100.0, Lab.data());
    return Lab;
}

// ---- Measured form --------------------------------------------------------------

MeasuredForm::MeasuredForm(const std::vector<Spectrum>& spectra)
{
    if (spectra.size() != kPatches)
        throw std::invalid_argument("a measured form holds the 46 spectra of the test form; " +
                                    std::to_string(spectra.size()) + " were given");
    double* rows[kPatches + 1] = {}; // the null row ends the form for the exchange
    for (int p = 0; p < kPatches; ++p) {
        const Spectrum& spectrum = spectra[static_cast<std::size_t>(p)];
        for (int b = 0; b < kSpectrumBands; ++b)
            if (!std::isfinite(spectrum[static_cast<std::size_t>(b)]))
                throw std::invalid_argument("form patch " + std::to_string(p) + " at " + std::to_string(380 + 10 * b) +
                                            " nm: reflectance " + number(spectrum[static_cast<std::size_t>(b)]) +
                                            " is not a finite number");
        spectra_[static_cast<std::size_t>(p)] = spectrum;
        rows[p] = spectra_[static_cast<std::size_t>(p)].data();
    }
    for (int p = 0; p < kPatches; ++p)
        for (int b = 0; b < kSpectrumBands; ++b)
            if (!isReflectance(spectra_[static_cast<std::size_t>(p)][static_cast<std::size_t>(b)]))
                throw std::invalid_argument(
                    "the patch " + coverageText(coverageOf(p)) + " (form patch " + std::to_string(p) + ") reads " +
                    number(spectra_[static_cast<std::size_t>(p)][static_cast<std::size_t>(b)]) + " at " +
                    std::to_string(380 + 10 * b) + " nm, which is no reflectance: reflectance factors lie from " +
                    reflectanceRange() + " (not percent)");
    halvesExchanged_ = formorientation::readInSwappedHalves(rows, normFactor());
    if (halvesExchanged_)
        formorientation::exchangeHalves(rows);
    // The paper is the brightest patch of a print: a form whose paper is not
    // brighter than a solid holds swapped patches, a blank or no measurement.
    const int paper = formPatchOf({0, 0, 0, 0});
    const double paperY = spectrumToXYZ(spectra_[static_cast<std::size_t>(paper)])[1];
    static const char* const inks[] = {"cyan", "magenta", "yellow", "black"};
    for (int ink = 0; ink < 4; ++ink) {
        Cmyk solid{0, 0, 0, 0};
        solid[static_cast<std::size_t>(ink)] = 100;
        const int patch = formPatchOf(solid);
        const double solidY = spectrumToXYZ(spectra_[static_cast<std::size_t>(patch)])[1];
        if (!(paperY > solidY))
            throw std::invalid_argument("the paper (form patch " + std::to_string(paper) + ", Y " +
                                        oneDecimal(paperY) + ") is not brighter than the " + inks[ink] +
                                        " solid (form patch " + std::to_string(patch) + ", Y " + oneDecimal(solidY) +
                                        "): a paper reflects more light than any ink on it; are they swapped?");
    }
}

Cmyk MeasuredForm::coverageOf(int patch)
{
    if (patch < 0 || patch >= kPatches)
        throw std::out_of_range("the test form has patches 0 to 45, not " + std::to_string(patch));
    const unsigned char* cmyk = MathProfile::dithering[patch];
    return Cmyk{double(cmyk[0]), double(cmyk[1]), double(cmyk[2]), double(cmyk[3])};
}

// ---- Print model ------------------------------------------------------------------

PrintModel::PrintModel(std::string name, std::vector<FittedValue> values, std::vector<double> levels)
    : name_(std::move(name)), values_(std::move(values)), levels_(std::move(levels))
{
}

PrintModel::~PrintModel() = default;

std::string PrintModel::refusal(const double* cmyk) const
{
    for (int ink = 0; ink < 4; ++ink) {
        const double c = cmyk[ink];
        // The negated test also refuses NaN. The text is made only for a refusal.
        const bool coverage = c >= 0.0 && c <= 100.0;
        const bool level = levels_.empty() || std::find(levels_.begin(), levels_.end(), c) != levels_.end();
        if (coverage && level)
            continue;
        const std::string named = std::string(1, kInkLetters[ink]) + " " + number(c);
        if (!coverage)
            return named + " is not a coverage from 0 to 100 %";
        std::string listed;
        for (double value : levels_)
            listed += (listed.empty() ? "" : ", ") + number(value);
        return "the " + name_ + " model predicts only the form's levels " + listed + " %; " + named + " is not one";
    }
    return std::string();
}

Spectrum PrintModel::predict(const Cmyk& cmyk) const
{
    const std::string refused = refusal(cmyk.data());
    if (!refused.empty())
        throw std::invalid_argument(refused);
    Spectrum spectrum;
    predictAccepted(cmyk.data(), spectrum.data());
    const std::string wrong = noColour(spectrum.data());
    if (!wrong.empty())
        throw std::domain_error(wrong);
    return spectrum;
}

void PrintModel::checkCoverages(std::size_t count, const double* cmyk) const
{
    for (std::size_t i = 0; i < count; ++i) {
        const std::string refused = refusal(cmyk + 4 * i);
        if (!refused.empty())
            throw std::invalid_argument("patch " + std::to_string(i) + ": " + refused);
    }
}

void PrintModel::predict(std::size_t count, const double* cmyk, double* spectra, double* XYZ, double* Lab) const
{
    checkCoverages(count, cmyk);
    for (std::size_t i = 0; i < count; ++i) {
        Spectrum spectrum;
        predictAccepted(cmyk + 4 * i, spectrum.data());
        const std::string wrong = noColour(spectrum.data());
        if (!wrong.empty())
            throw std::domain_error("patch " + std::to_string(i) + ": " + wrong);
        if (spectra != nullptr)
            std::copy(spectrum.begin(), spectrum.end(), spectra + kSpectrumBands * i);
        if (XYZ == nullptr && Lab == nullptr)
            continue;
        const Triple xyz = spectrumToXYZ(spectrum);
        if (XYZ != nullptr)
            std::copy(xyz.begin(), xyz.end(), XYZ + 3 * i);
        if (Lab != nullptr) {
            const Triple lab = XYZToLab(xyz);
            std::copy(lab.begin(), lab.end(), Lab + 3 * i);
        }
    }
}

std::unique_ptr<PrintModel> checkedOnForm(std::unique_ptr<PrintModel> model)
{
    for (int p = 0; p < MeasuredForm::kPatches; ++p) {
        try {
            model->predict(MeasuredForm::coverageOf(p));
        } catch (const std::domain_error& failure) {
            throw std::domain_error("the fitted " + model->name() + " model fails on form patch " + std::to_string(p) +
                                    ": " + failure.what());
        }
    }
    return model;
}

} // namespace veltmarquist
