// Print models that return values, for C++ hosts.
//
// Fit a four-colour model to a measured test form once, then predict as many
// patches as needed, from as many threads as needed:
//
//     veltmarquist::MeasuredForm form(spectra);        // the 46 patches in measuring order
//     std::unique_ptr<veltmarquist::PrintModel> model = veltmarquist::fitOffsetModel(form);
//     veltmarquist::Spectrum grey = model->predict({40, 40, 40, 0});
//     veltmarquist::Triple Lab = veltmarquist::XYZToLab(veltmarquist::spectrumToXYZ(grey));
//
// The offset and gravure models give exactly the numbers of the profile's
// methods (and so of the charts of processes 0 and 1), and like them predict
// only the coverage levels printed on the form; the Yule-Nielsen model
// predicts every coverage from 0 to 100 %. C hosts reach the same models
// through FitPrintModel and PredictPrintModel in VeltmarquistDLL.h.
#ifndef VELTMARQUIST_PRINTMODELS_H
#define VELTMARQUIST_PRINTMODELS_H

#include "VeltmarquistDLL.h"

#include <array>
#include <cstddef>
#include <memory>
#include <string>
#include <vector>

namespace veltmarquist {

constexpr int kSpectrumBands = 36;
using Spectrum = std::array<double, kSpectrumBands>; // band b at 380 + 10 b nm, reflectance factor 0..1
using Cmyk = std::array<double, 4>;                  // C, M, Y, K coverage in percent
using Triple = std::array<double, 3>;                // X, Y, Z or L*, a*, b*

// X, Y, Z (D50, 2 degree, 0..100) of a spectrum, as the library sums them. Y
// is not limited to 100 (the chart files limit it when they write it).
VELTMARQUIST_API Triple spectrumToXYZ(const Spectrum& spectrum);
// CIELAB of X, Y, Z on the 0..100 scale, with the ICC D50 white and the
// library's tabulated cube root, as the grey and gravure fits compute it.
VELTMARQUIST_API Triple XYZToLab(const Triple& XYZ);

// The reflectance factors a measurement can hold: a few thousandths below
// zero are instrument noise on a dark patch, fluorescent papers stay well
// below 1.5. A value outside is no measurement (a percent scale, a
// thousandths scale, garbage), and a prediction outside is no colour.
constexpr double kLowestReflectance = -0.01;
constexpr double kHighestReflectance = 1.5;

// The measured four-colour test form as a value.
//
// It applies the library's orientation check: when the two halves of the
// form were read in swapped order (rows 24 and 25 yellower than rows 0 and 1),
// rows i and i + 24 are exchanged for i = 0..21, exactly as process 0 does
// with a form of 46 patches. Every model is fitted to the rows after that check.
class VELTMARQUIST_API MeasuredForm {
public:
    static constexpr int kPatches = 46;

    // The 46 spectra of the test form in measuring order (the order of
    // coverageOf), repeats averaged by the caller. Throws
    // std::invalid_argument, naming the patch, for what cannot be a measured
    // form: another number of spectra, a value that is not finite or lies
    // outside kLowestReflectance..kHighestReflectance, or a paper (after the
    // orientation check) whose Y is not above that of every solid.
    explicit MeasuredForm(const std::vector<Spectrum>& spectra);

    // C, M, Y, K of a patch of the form in measuring order (0..45).
    static Cmyk coverageOf(int patch);
    // A patch's spectrum after the orientation check.
    const Spectrum& spectrum(int patch) const { return spectra_.at(static_cast<std::size_t>(patch)); }
    // True when the orientation check exchanged the halves.
    bool halvesExchanged() const { return halvesExchanged_; }

private:
    std::array<Spectrum, kPatches> spectra_;
    bool halvesExchanged_ = false;
};

// One fitted value of a model, for display.
struct FittedValue {
    std::string name;            // for example "gray difference factor (C, M, Y, K)"
    std::vector<double> numbers; // empty when the value is text alone
    std::string text;            // for example the ink order "YMKC"; empty when there is none
};

// A fitted four-colour print model. Immutable once made: every member is
// const and safe to call from several threads at once.
class VELTMARQUIST_API PrintModel {
public:
    virtual ~PrintModel();
    PrintModel(const PrintModel&) = delete;
    PrintModel& operator=(const PrintModel&) = delete;

    // "offset", "gravure" or "Yule-Nielsen".
    const std::string& name() const { return name_; }
    const std::vector<FittedValue>& fittedValues() const { return values_; }
    // The coverages, the same for each ink, that the model predicts; empty
    // when it predicts every coverage from 0 to 100 %.
    const std::vector<double>& levels() const { return levels_; }

    // The spectrum of one coverage. Throws std::invalid_argument, naming the
    // ink and the value, for a coverage that is not finite, lies outside
    // 0..100 % or is none of the model's levels; std::domain_error for a
    // spectrum that is no colour (not finite, or outside
    // kLowestReflectance..kHighestReflectance), which a fitted model never
    // hands over.
    Spectrum predict(const Cmyk& cmyk) const;
    // `count` coverages (cmyk: 4 values each) into the caller's arrays:
    // spectra 36 values, XYZ and Lab 3 values per patch; any of the three may
    // be null. Every coverage is checked before anything is written: a
    // refusal (std::invalid_argument, naming the patch, counted from 0)
    // leaves the arrays untouched. A spectrum that is no colour throws
    // std::domain_error naming the patch; the arrays then hold the patches
    // before it. The arrays must not overlap `cmyk`.
    void predict(std::size_t count, const double* cmyk, double* spectra, double* XYZ, double* Lab) const;
    // Checks `count` coverages as the batch predict checks them, without
    // predicting: std::invalid_argument naming the first refused patch
    // (counted from 0). For hosts that split a batch over threads.
    void checkCoverages(std::size_t count, const double* cmyk) const;

protected:
    PrintModel(std::string name, std::vector<FittedValue> values, std::vector<double> levels);

private:
    // Why the model refuses a coverage, or an empty text when it predicts it.
    std::string refusal(const double* cmyk) const;
    // The spectrum of a coverage that refusal accepted.
    virtual void predictAccepted(const double* cmyk, double* spectrum) const = 0;

    std::string name_;
    std::vector<FittedValue> values_;
    std::vector<double> levels_;
};

// Every fit checks its model on the form it was fitted to: a model that
// predicts no colour for one of the 46 patches is refused (std::domain_error).

// The offset model, its gray difference factors and coverage limit fitted to
// the form's two greys exactly as process 0 fits them.
VELTMARQUIST_API std::unique_ptr<PrintModel> fitOffsetModel(const MeasuredForm& form);

// The gravure model with the library's default ink order and trapping factors
// (those of process 1 on a new profile), or with both fitted to the red,
// green and blue solids as MathProfile::calculateRGBFactors fits them.
enum class GravureFactors { defaults, fittedToRedGreenBlue };
VELTMARQUIST_API std::unique_ptr<PrintModel> fitGravureModel(const MeasuredForm& form, GravureFactors factors);

// The Yule-Nielsen spectral Neugebauer model (n per band, dot-area curves,
// ink spreading) fitted to all 46 patches; it predicts every coverage.
VELTMARQUIST_API std::unique_ptr<PrintModel> fitYuleNielsenModel(const MeasuredForm& form);

// ---- The charts' conventions, for hosts that hold values ------------------------------
// The chart writers of processes 0, 1, 6 and 9 call these same functions, so
// a host that applies them to predicted values gets the numbers and bytes of
// the library's charts.

// The 900 C, M, Y, K combinations of the characterisation chart (processes 0
// and 1), in the chart's order. Every coverage is one of the form's levels.
VELTMARQUIST_API std::vector<Cmyk> characterisationChart();

// X, Y, Z limited to Y = 100 as every XYZ chart limits them: when Y > 100, X
// and Z become X * 100 / Y and Z * 100 / Y, and Y becomes 100.
VELTMARQUIST_API Triple limitToChartY(const Triple& XYZ);
// X, Y, Z as an XYZ chart holds them: limited to Y = 100, then each cut toward
// minus infinity at two decimals, floor(v * 100) / 100 (12.3456 -> 12.34).
VELTMARQUIST_API Triple chartXYZ(const Triple& XYZ);

// The text of an XYZ chart (the layout of processes 0, 1 and 6 and of the
// 46-step chart) that holds one patch per coverage, numbered from 1: exactly
// the bytes the library's writers produce, Y limit and two-decimal cut
// included, whatever the host's locale. Throws std::invalid_argument when the
// two lists differ in length. X, Y, Z that are not finite are written as they
// are ("nan", "inf"); checking them is the host's part.
VELTMARQUIST_API std::string xyzChartText(const std::vector<Cmyk>& coverages, const std::vector<Triple>& XYZ);

// The weight of the converted spectra in a blended chart conversion (process
// 9), from the CIE 1976 distance of the two reference whites:
// w = 0.33 up to dE*ab 11, above it 0.33 / ((dE*ab - 10) / 25). Each patch
// becomes w * converted + (1 - w) * measured.
VELTMARQUIST_API double chartConversionBlendWeight(double deltaE);

} // namespace veltmarquist

#endif // VELTMARQUIST_PRINTMODELS_H
