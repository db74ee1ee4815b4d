// The four-colour commands: chart (the 900-patch characterisation chart) and
// compare (measured against modelled 46-step chart).
#include "Commands.h"

#include "Files.h"
#include "OutputFile.h"
#include "LibraryHost.h"
#include "PatchMatching.h"
#include "ToolError.h"

#include <cstdio>
#include <iostream>
#include <set>
#include <sstream>

namespace veltmarquist {

namespace {

std::string number(double value)
{
    char text[32];
    std::snprintf(text, sizeof text, "%g", value);
    return text;
}

const char* processName(PrintProcess process)
{
    return process == VM_PROCESS_GRAVURE ? "gravure" : "offset";
}

// The 46 test-form patches of a measurement file, as the library takes them.
struct TestForm {
    MeasurementFile file;
    PickedPatches picked;
    MeasurementBlock block;
};

TestForm readTestForm(const std::string& path, const ReadOptions& read, std::ostream& out)
{
    TestForm form{loadMeasurementFile(path, read), {}, {}};
    printWarnings(form.file, path);
    form.picked = pickPatches(form.file, testFormRequests(), path);
    std::vector<Spectrum> spectra;
    for (const std::vector<int>& thousandths : form.picked.thousandths)
        spectra.push_back({&form.file.layout, &thousandths});
    form.block = buildBlock(spectra);

    out << "form: " << path << ": " << form.file.sets.size() << " measurements, " << form.file.describeSpectra()
        << ", reflectance 0-" << number(form.file.scale) << (form.file.scaleDetected ? " (detected)" : " (given)")
        << "\n  46 test-form patches found in " << form.picked.setsUsed << " measurements";
    if (form.picked.averaged > 0)
        out << " (repeated measurements averaged for " << form.picked.averaged << " of them)";
    out << "; " << form.picked.setsIgnored << " other measurements ignored\n";
    return form;
}

void printOffsetModel(const MathProfile& profile, std::ostream& out)
{
    out << "offset model fitted to the two greys:\n"
        << "  gray difference factor  C " << number(profile.grayDiffFactor[0]) << "  M "
        << number(profile.grayDiffFactor[1]) << "  Y " << number(profile.grayDiffFactor[2]) << "  K "
        << number(profile.grayDiffFactor[3]) << "\n"
        << "  coverage limit          " << number(profile.coverageLimit) << " %\n";
}

void printGravureModel(const MathProfile& profile, bool fitted, std::ostream& out)
{
    static const char* const orders[] = {"CMYK", "KCMY", "YCMK", "YMKC", "YKMC"};
    const int order = profile.inkOrder >= 1 && profile.inkOrder <= 4 ? profile.inkOrder : 0;
    out << "gravure model"
        << (fitted ? " fitted to the red, green and blue overprints:\n" : " (defaults; --fit-gravure fits them):\n")
        << "  ink order               " << orders[order] << " (" << profile.inkOrder << ")\n"
        << "  trapping factors        red " << number(profile.rgbFactor[0]) << "  green "
        << number(profile.rgbFactor[1]) << "  blue " << number(profile.rgbFactor[2]) << "\n";
}

void printSummary(const std::string& what, const Summary& summary, std::ostream& out)
{
    out << what << " mean " << fixed(summary.mean) << ", 95th percentile " << fixed(summary.p95) << ", max "
        << fixed(summary.max) << "\n";
}

MeasurementFile readChart(const std::string& path)
{
    return loadMeasurementFile(path, ReadOptions{});
}

// How well the written chart predicts the chart combinations that the form
// measured beyond the 46 test-form patches (each combination once).
void checkAgainstMeasurements(const TestForm& form, const std::string& chartPath, std::ostream& out)
{
    const MeasurementFile chart = readChart(chartPath);
    const CombinationIndex measured(form.file);
    std::set<CombinationIndex::Key> skip;
    for (const PatchRequest& request : testFormRequests())
        skip.insert(CombinationIndex::keyOf(request.device));
    std::vector<double> differences;
    double worst = -1.0;
    std::string worstPatch;
    for (const MeasurementSet& set : chart.sets) {
        if (!skip.insert(CombinationIndex::keyOf(set)).second)
            continue;
        const std::vector<size_t>& sets = measured.find(set.devicePercent());
        if (sets.empty())
            continue;
        const std::vector<int> thousandths = averageThousandths(form.file, sets);
        const Lab truth = labOfXYZ(XYZOfBands(libraryBands({&form.file.layout, &thousandths})));
        differences.push_back(deltaE2000(truth, labOfXYZ(set.XYZ)));
        if (differences.back() > worst) {
            worst = differences.back();
            worstPatch = describeDevice(set.devicePercent());
        }
    }
    if (differences.empty())
        return;
    printSummary("check: " + std::to_string(differences.size()) +
                     " chart combinations measured beyond the test form, CIEDE2000",
                 summarise(differences), out);
    out << "  largest difference at " << worstPatch << "\n";
}

} // namespace

void runChart(const ChartOptions& options, std::ostream& out)
{
    refuseClashingOutputs({options.form}, {options.output});
    TestForm form = readTestForm(options.form, options.read, out);
    PendingOutput output(options.output);
    Profile profile(fileStem(options.form));
    if (options.fitGravure) {
        RowTable rows(form.block);
        profile.run("the gravure fit", [&](MathProfile& object) { object.calculateRGBFactors(rows.rows()); });
    }
    profile.calculate(options.process, output, form.block);
    if (options.process == VM_PROCESS_GRAVURE)
        printGravureModel(profile.object(), options.fitGravure, out);
    else
        printOffsetModel(profile.object(), out);
    // The check reads the chart before it is delivered: standard output
    // cannot be read back.
    std::ostringstream check;
    checkAgainstMeasurements(form, output.temporaryPath(), check);
    output.commit();
    out << "chart: 900 patches (" << processName(options.process) << " model) written to " << output.name() << "\n"
        << check.str();
}

void runCompare(const CompareOptions& options, std::ostream& out)
{
    std::string folder = options.outputFolder.empty() ? "." : options.outputFolder;
    if (folder.back() != '/')
        folder += '/';
    const std::string stem = folder + fileStem(options.form);
    const std::string measuredPath = stem + ".measured46.txt",
                      modelPath = stem + "." + processName(options.process) + "46.txt";
    refuseClashingOutputs({options.form}, {measuredPath, modelPath});
    TestForm form = readTestForm(options.form, options.read, out);
    PendingOutput measuredChart(measuredPath);
    PendingOutput modelChart(modelPath);

    Profile profile(fileStem(options.form));
    RowTable rows(form.block);
    if (options.process == VM_PROCESS_OFFSET)
        profile.run("the offset fit", [&](MathProfile& object) { object.calculateGrayDiffFactor(rows.rows()); });
    else if (options.fitGravure)
        profile.run("the gravure fit", [&](MathProfile& object) { object.calculateRGBFactors(rows.rows()); });
    // Each chart reads the form anew; empty lists leave the profile as a
    // fresh one with the fitted values.
    profile.run("the modelled 46-step chart", [&](MathProfile& object) {
        object.clearTintLists();
        object.calculateChart46(rows.rows(), options.process, modelChart.temporaryPath().c_str(), false);
    });
    profile.run("the measured 46-step chart", [&](MathProfile& object) {
        object.clearTintLists();
        object.calculateChart46(rows.rows(), options.process, measuredChart.temporaryPath().c_str(), true);
    });
    // Both charts are checked before either is delivered: both or neither.
    measuredChart.checkChart();
    modelChart.checkChart();
    if (options.process == VM_PROCESS_GRAVURE)
        printGravureModel(profile.object(), options.fitGravure, out);
    else
        printOffsetModel(profile.object(), out);

    const MeasurementFile measured = readChart(measuredChart.temporaryPath());
    const MeasurementFile modelled = readChart(modelChart.temporaryPath());
    std::ostringstream table;
    std::vector<double> ab, de2000;
    table << "patch  C    M    Y    K     dE*ab   dE00\n";
    for (size_t i = 0; i < measured.sets.size() && i < modelled.sets.size(); ++i) {
        const Lab truth = labOfXYZ(measured.sets[i].XYZ), model = labOfXYZ(modelled.sets[i].XYZ);
        ab.push_back(deltaEab(truth, model));
        de2000.push_back(deltaE2000(truth, model));
        char line[96];
        const std::vector<double> device = measured.sets[i].devicePercent();
        std::snprintf(line, sizeof line, "%5zu  %-4g %-4g %-4g %-4g %6.2f %6.2f\n", i + 1, device[0], device[1],
                      device[2], device[3], ab.back(), de2000.back());
        table << line;
    }
    printSummary("dE*ab    over " + std::to_string(ab.size()) + " patches:", summarise(ab), table);
    printSummary("CIEDE2000 over " + std::to_string(de2000.size()) + " patches:", summarise(de2000), table);

    measuredChart.commit();
    modelChart.commit();
    out << "measured 46-step chart written to " << measuredChart.name() << "\n"
        << "modelled 46-step chart (" << processName(options.process) << ") written to " << modelChart.name() << "\n"
        << table.str();
}

} // namespace veltmarquist
