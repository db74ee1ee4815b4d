// The terminal text of each command.
#include "TextReport.h"

#include "Messages.h"
#include "ModelInWords.h"
#include "Numbers.h"
#include "Text.h"

#include <algorithm>
#include <cctype>
#include <string>

namespace veltmarquist {

namespace {

std::string number(double value)
{
    return shortText(value);
}

std::string fixed(double value, int decimals = 2)
{
    return fixedText(value, decimals);
}

void printWarnings(const FileWarnings& file)
{
    for (const std::string& warning : file.warnings)
        printMessage("warning", file.path + ": " + warning);
}

void printForm(const FoundForm& form, std::ostream& out)
{
    const MeasurementFile& file = form.file;
    out << "form: " << form.path << ": " << file.sets.size() << " measurements, " << file.describeSpectra()
        << ", reflectance 0-" << number(file.scale) << (file.scaleDetected ? " (detected)" : " (given)")
        << "\n  46 test-form patches found in " << form.picked.setsUsed << " measurements";
    if (form.picked.averaged > 0)
        out << " (repeated measurements averaged for " << form.picked.averaged << " of them)";
    out << "; " << form.picked.setsIgnored << " other measurements, not on the form\n";
}

std::string inks(const std::vector<double>& numbers, int decimals)
{
    static const char* const letters[] = {"C", "M", "Y", "K"};
    std::string text;
    for (size_t ink = 0; ink < numbers.size() && ink < 4; ++ink)
        text += std::string(ink == 0 ? "" : "  ") + letters[ink] + " " + fixed(numbers[ink], decimals);
    return text;
}

void printYuleNielsen(const PrintModel& model, const std::string& formPath, std::ostream& out)
{
    const std::vector<double>& n = valueNamed(model, "Yule-Nielsen n").numbers;
    const std::vector<double>& tint = valueNamed(model, "tint residual").numbers;
    const std::vector<double>& grey = valueNamed(model, "grey dE*ab").numbers;
    out << "Yule-Nielsen model fitted to the 46 test-form patches:\n";
    if (!n.empty())
        out << "  Yule-Nielsen n          " << fixed(*std::min_element(n.begin(), n.end())) << " to "
            << fixed(*std::max_element(n.begin(), n.end())) << " over 380-730 nm\n";
    out << "  ink spreading           " << inks(valueNamed(model, "ink spreading").numbers, 3) << "\n";
    if (!tint.empty())
        out << "  tint residual           " << fixed(tint[0], 4) << " RMS reflectance\n";
    if (grey.size() == 2)
        out << "  grey residuals          " << fixed(grey[0]) << " dE*ab (C40 M40 Y40), " << fixed(grey[1])
            << " dE*ab (C40 M40 Y40 K40)\n";
    // The fit's warnings are sentences; as messages they lose the capital and the full stop.
    for (const FittedValue& value : model.fittedValues()) {
        if (value.name != "warning" || value.text.empty())
            continue;
        std::string warning = value.text;
        warning[0] = static_cast<char>(std::tolower(static_cast<unsigned char>(warning[0])));
        if (warning.back() == '.')
            warning.pop_back();
        printMessage("warning", formPath + ": Yule-Nielsen model: " + warning);
    }
}

void printModel(const FittedModel& fit, const std::string& formPath, std::ostream& out)
{
    const PrintModel& model = *fit.model;
    if (fit.choice == ModelChoice::yuleNielsen) {
        printYuleNielsen(model, formPath, out);
    } else if (fit.choice != ModelChoice::offset) {
        static const char* const orders[] = {"CMYK", "KCMY", "YCMK", "YMKC", "YKMC"};
        const std::string order = valueNamed(model, "ink order").text;
        const long index = std::find(std::begin(orders), std::end(orders), order) - std::begin(orders);
        const std::vector<double>& factor = valueNamed(model, "trapping factors").numbers;
        out << "gravure model"
            << (fit.choice == ModelChoice::gravureFitted ? " fitted to the red, green and blue overprints:\n"
                                  : " (defaults; --fit-gravure fits them):\n")
            << "  ink order               " << order << " (" << index << ")\n"
            << "  trapping factors        red " << number(factor.at(0)) << "  green " << number(factor.at(1))
            << "  blue " << number(factor.at(2)) << "\n";
    } else {
        const std::vector<double>& factor = valueNamed(model, "gray difference factor").numbers;
        out << "offset model fitted to the two greys:\n"
            << "  gray difference factor  C " << number(factor.at(0)) << "  M " << number(factor.at(1)) << "  Y "
            << number(factor.at(2)) << "  K " << number(factor.at(3)) << "\n"
            << "  full correction at      " << number(valueNamed(model, "full correction").numbers.at(0))
            << " % coverage of the other inks (a model value, not an ink limit)\n";
    }
}

void printSummary(const std::string& what, const Summary& summary, std::ostream& out)
{
    out << what << " mean " << fixed(summary.mean) << ", 95th percentile " << fixed(summary.p95) << ", max "
        << fixed(summary.max) << "\n";
}

void printCheck(const ModelCheck& check, std::ostream& out)
{
    if (check.patches.empty() && check.leftOut.offLevels + check.leftOut.furtherInks == 0)
        return;
    for (const std::string& line : checkLines(check))
        out << line << "\n";
}

void printReportWritten(const std::string& written, std::ostream& out)
{
    if (!written.empty())
        out << "report: HTML report written to " << written << "\n";
}

// The form and the model, as far as they came; true when the model came.
bool printFormAndModel(const FormAndModel& result, std::ostream& out)
{
    printWarnings(result.formWarnings);
    if (result.form)
        printForm(*result.form, out);
    if (result.fit)
        printModel(*result.fit, result.form->path, out);
    return result.fit.has_value();
}

} // namespace

void renderChart(const ChartResult& result, std::ostream& out)
{
    printWarnings(result.layoutWarnings);
    if (!printFormAndModel(result, out) || (result.written.empty() && result.reportWritten.empty()))
        return;
    if (!result.written.empty()) {
        out << "chart: " << result.patches << " patches (";
        if (!result.layout.empty())
            out << result.layout << ", ";
        if (!result.format.empty())
            out << result.format << ", ";
        out << result.fit->model->name() << " model) written to "
            << result.written << "\n";
    }
    printCheck(result.check, out);
    printReportWritten(result.reportWritten, out);
}

void renderCompare(const CompareResult& result, std::ostream& out)
{
    if (!printFormAndModel(result, out) || result.modelWritten.empty())
        return;
    out << "measured 46-step chart written to " << result.measuredWritten << "\n"
        << "modelled 46-step chart (" << kindOf(result.fit->choice) << ") written to " << result.modelWritten << "\n"
        << "patch  C    M    Y    K     dE*ab   dE00\n";
    // Columns: the text padded to its width, numbers right-aligned, coverages left-aligned.
    const auto column = [](const std::string& text, size_t width, bool right) {
        const std::string blanks(text.size() < width ? width - text.size() : 0, ' ');
        return right ? blanks + text : text + blanks;
    };
    for (size_t i = 0; i < result.modelled->patches.size(); ++i) {
        const CheckedPatch& patch = result.modelled->patches[i].check;
        out << column(std::to_string(i + 1), 5, true) << " ";
        for (double coverage : patch.device)
            out << " " << column(number(coverage), 4, false);
        out << " " << column(fixed(patch.deltaEab), 6, true) << " " << column(fixed(patch.deltaE2000), 6, true) << "\n";
    }
    printSummary("dE*ab    over " + std::to_string(result.deltaEab.count) + " patches:", result.deltaEab, out);
    printSummary("CIEDE2000 over " + std::to_string(result.modelled->deltaE2000.count) + " patches:",
                 result.modelled->deltaE2000, out);
}

void renderMultiChannel(const MultiChannelResult& result, std::ostream& out)
{
    printWarnings(result.formWarnings);
    if (result.form && result.picked) {
        const MeasurementFile& form = *result.form;
        out << "form: " << result.formWarnings.path << ": " << form.sets.size() << " measurements, "
            << form.describeSpectra() << ", reflectance 0-" << (form.scale == 100.0 ? "100" : "1")
            << (form.scaleDetected ? " (detected)" : " (given)") << "\n  paper and " << result.inks
            << " solids found; " << result.picked->setsIgnored << " other measurements ignored\n";
    }
    printWarnings(result.separationsWarnings);
    if (!result.chartWritten.empty())
        out << (result.inks == 6 ? "six-colour chart: 128" : "seven-colour chart: 159")
            << " spectral patches written to " << result.chartWritten << "\n";
    if (!result.combinationsWritten.empty())
        out << "combinations: 3499 C, M, Y, K combinations for the separation software written to "
            << result.combinationsWritten << "\n";
    if (!result.separatedWritten.empty())
        out << "separated set: 3499 patches (XYZ) predicted from " << result.separationsPath << " written to "
            << result.separatedWritten << "\n";
    printReportWritten(result.reportWritten, out);
}

void renderProfile(const ProfileResult& result, std::ostream& out)
{
    if (!printFormAndModel(result, out) || result.written.empty())
        return;
    const profile::ProfileSummary& summary = result.summary;
    std::string levels;
    for (double level : summary.a2bLevels)
        levels += (levels.empty() ? "" : ", ") + number(level);
    out << "profile: ICC " << result.version << " output profile '" << summary.description << "' written to "
        << result.written << " (" << summary.bytes / 1024 << " KB)\n"
        << "  A2B0-2: " << summary.a2bLevels.size() << " nodes per ink (" << levels << " %)\n"
        << "  B2A0-2: " << summary.b2aNodes << " nodes per L*, a*, b*; perceptual is colorimetric (minimum dE*ab)\n"
        << "  " << result.settings << "\n"
        << "  darkest neutral L* " << fixed(summary.darkestL, 1) << "; " << summary.outOfGamut << " of "
        << summary.b2aCount << " B2A nodes out of gamut (more than 1 dE*ab from the press's nearest colour)\n";
    printCheck(result.check, out);
}

void renderConformance(const ConformanceRun& run, std::ostream& out)
{
    printFormAndModel(run, out);
    if (!run.reference)
        return;
    const conformance::Reference& reference = *run.reference;
    out << "reference: " << escapeControls(reference.description) << " (" << escapeControls(reference.path) << "), "
        << reference.cmyk.size() << " combinations\n";
    for (const std::string& note : run.conditions)
        out << "  " << note << "\n";
    if (!run.result)
        return;
    const conformance::ConformanceResult& result = *run.result;
    const auto lab = [](const Lab& value) {
        return fixed(value.L, 1) + " " + fixed(value.a, 1) + " " + fixed(value.b, 1);
    };
    out << "control patches: measured L* a* b* | reference | dE00 | dE*ab | dH*ab | tolerance (dE00, source)\n";
    for (const conformance::ControlPatch& patch : result.controls) {
        std::string name = patch.name;
        name.resize(std::max<size_t>(name.size(), 21), ' ');
        out << "  " << name << " " << lab(patch.measured) << " | " << lab(patch.reference) << " | "
            << fixed(patch.deltaE00, 2) << " | " << fixed(patch.deltaEab, 2) << " | "
            << (patch.deltaH ? fixed(*patch.deltaH, 2) : std::string("-")) << " | " << fixed(patch.limit, 1) << " ("
            << conformance::toleranceSource(patch.tolerance) << ") " << (patch.pass ? "pass" : "FAIL") << "\n";
    }
    for (const std::string& absent : result.absent)
        out << "  " << absent << ": not in the reference\n";
    if (!result.toneValues.empty()) {
        out << "tone value increase, percentage points, measured against reference (tolerance "
            << fixed(result.toneValues.front().limit, 1) << ", " << conformance::toleranceSource("tone-value")
            << "; * interpolated between the reference's tints):\n";
        static const char* const inks[4] = {"C", "M", "Y", "K"};
        for (int ink = 0; ink < 4; ++ink) {
            std::string line;
            for (const conformance::ToneValuePoint& point : result.toneValues) {
                if (point.ink != ink)
                    continue;
                line += "  " + shortText(point.nominal) + " % " + signedFixedText(point.measured, 1) + "/" +
                        signedFixedText(point.reference, 1) + (point.interpolated ? "*" : "") + (point.pass ? "" : " FAIL");
            }
            if (!line.empty())
                out << "  " << inks[ink] << ":" << line << "\n";
        }
    }
    out << "verdict: " << (result.pass() ? "PASS" : "FAIL") << " (" << result.checks() - result.failures() << " of "
        << result.checks()
        << " checks within tolerance)\n";
    if (!result.gamut)
        return;
    const conformance::GamutComparison& gamut = *result.gamut;
    out << "whole gamut: the reference's " << reference.cmyk.size() << " combinations as the " << gamut.model
        << " model of this press predicts them, CIEDE2000 against the reference:\n";
    for (const conformance::GamutRegion& region : gamut.regions)
        if (region.deltaE00.count > 0)
            out << "  " << region.name << ": " << region.deltaE00.count << ", mean " << fixed(region.deltaE00.mean)
                << ", 95th percentile " << fixed(region.deltaE00.p95) << ", max " << fixed(region.deltaE00.max) << "\n";
    out << "  worst:";
    for (const conformance::GamutPatch& patch : gamut.worst)
        out << " C" << shortText(patch.cmyk[0]) << " M" << shortText(patch.cmyk[1]) << " Y" << shortText(patch.cmyk[2])
            << " K" << shortText(patch.cmyk[3]) << " " << fixed(patch.deltaE00) << ";";
    out << "\n  (a prediction from the 46 form patches: on real press sheets such predictions were about 0.8 "
           "CIEDE2000 from the measured colours on average)\n";
    printReportWritten(run.report, out);
}

void renderConvert(const ConvertResult& result, std::ostream& out)
{
    for (const FileWarnings& file : result.warnings)
        printWarnings(file);
    if (result.written.empty())
        return;
    if (result.mode == VM_PROCESS_CHART_COPY) {
        out << "chart: " << result.patches << " patches copied to " << result.written << "\n";
        return;
    }
    const bool blend = result.mode == VM_PROCESS_CHART_BLEND;
    out << "whites: " << result.fromLabel << " -> " << result.toLabel << ", " << fixed(result.whitesApart)
        << " dE*ab apart\n";
    if (blend)
        out << "blend: converted spectra weighted " << fixed(result.blendWeight, 3) << ", measured spectra "
            << fixed(1.0 - result.blendWeight, 3) << "\n";
    out << "chart: " << result.patches << " patches " << (blend ? "blended" : "converted") << ", written to "
        << result.written << "\n";
}

} // namespace veltmarquist
