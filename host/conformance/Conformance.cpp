// Press conformance against a reference characterisation data set.
#include "Conformance.h"

#include "Cgats.h"
#include "Failure.h"
#include "LibraryBlock.h"
#include "Numbers.h"
#include "PatchMatching.h"
#include "Text.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <fstream>
#include <map>
#include <sstream>

namespace veltmarquist::conformance {

namespace {

Lab labOfD50(double X, double Y, double Z)
{
    return labOfXYZ({X, Y, Z});
}

// Combinations are matched as the form's patches are: whole tenths of a percent.
using Key = CombinationIndex::Key;

std::string fileName(const std::string& path)
{
    const size_t slash = path.find_last_of('/');
    return slash == std::string::npos ? path : path.substr(slash + 1);
}

double number(std::string_view cell, const std::string& where)
{
    std::string text(cell);
    char* end = nullptr;
    const double value = std::strtod(text.c_str(), &end);
    if (text.empty() || end != text.c_str() + text.size() || !std::isfinite(value))
        throw HostError(Failure::InputContent, where + ": '" + escapeControls(text) + "' is not a number");
    return value;
}

// X, Y or Z of a tristimulus channel for an ink's tone value: cyan on X,
// magenta and black on Y, yellow on Z.
double channelOf(const Lab& lab, int ink)
{
    static const size_t channel[4] = {0, 1, 2, 1};
    return XYZOfLab(lab)[channel[ink]];
}

// Murray-Davies tone value increase in percent on the ink's channel.
double toneValueIncrease(const Lab& tint, const Lab& paper, const Lab& solid, int ink, double nominal)
{
    const double p = channelOf(paper, ink), s = channelOf(solid, ink), t = channelOf(tint, ink);
    const double value = p == s ? 0.0 : 100.0 * (p - t) / (p - s);
    return value - nominal;
}

Cmyk single(int ink, double coverage)
{
    Cmyk cmyk{};
    cmyk[static_cast<size_t>(ink)] = coverage;
    return cmyk;
}

double hueDifference(const Lab& a, const Lab& b)
{
    // dH*ab = sqrt(dE*ab^2 - dL^2 - dC^2), signed by nothing: the size of the hue shift.
    const double dE = deltaEab(a, b), dL = a.L - b.L;
    const double dC = std::hypot(a.a, a.b) - std::hypot(b.a, b.b);
    return std::sqrt(std::max(0.0, dE * dE - dL * dL - dC * dC));
}

} // namespace

std::optional<Lab> Reference::find(const Cmyk& wanted) const
{
    const auto key = CombinationIndex::keyOf(wanted);
    for (size_t i = 0; i < cmyk.size(); ++i)
        if (CombinationIndex::keyOf(cmyk[i]) == key)
            return lab[i];
    return std::nullopt;
}

Reference readReference(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    if (!in)
        throw HostError(Failure::InputUnreadable, escapeControls(path) + ": cannot be opened");
    std::ostringstream text;
    text << in.rdbuf();
    const auto [table, error] = cgats::readTable(text.str());
    if (error)
        throw HostError(Failure::InputSyntax, escapeControls(path) + (error->line > 0 ? ":" + std::to_string(error->line) : "") +
                                                  ": " + error->message);
    const auto& fields = table.header.fields;
    const auto column = [&](const char* name) -> long {
        for (size_t i = 0; i < fields.size(); ++i)
            if (fields[i] == name)
                return static_cast<long>(i);
        return -1;
    };
    const long c = column("CMYK_C"), m = column("CMYK_M"), y = column("CMYK_Y"), k = column("CMYK_K");
    if (c < 0 || m < 0 || y < 0 || k < 0)
        throw HostError(Failure::InputContent, escapeControls(path) + ": a reference needs the fields CMYK_C, CMYK_M, "
                                                                      "CMYK_Y and CMYK_K");
    const long L = column("LAB_L"), A = column("LAB_A"), B = column("LAB_B");
    const long X = column("XYZ_X"), Y = column("XYZ_Y"), Z = column("XYZ_Z");
    const bool hasLab = L >= 0 && A >= 0 && B >= 0, hasXYZ = X >= 0 && Y >= 0 && Z >= 0;

    Reference reference;
    reference.path = path;
    for (const cgats::Keyword& keyword : table.header.keywords)
        reference.header.emplace_back(keyword.name, keyword.value);
    const cgats::Keyword* descriptor = table.header.find("DESCRIPTOR");
    reference.description = descriptor && !descriptor->value.empty() ? descriptor->value : fileName(path);

    std::map<Key, std::pair<size_t, std::array<double, 3>>> sums; // count, L a b sums
    std::vector<Cmyk> order;
    // Spectra first, through the same colorimetry as the form's (a file
    // compared with itself then differs by nothing); else the stated colours.
    const ReadResult spectral = readMeasurementFile(path, ReadOptions{});
    const bool hasSpectra = spectral.ok() && spectral.file->layout.present() && spectral.file->deviceFields.size() >= 4;
    if (!hasSpectra && (hasLab || hasXYZ)) {
        for (size_t r = 0; r < table.rows.size(); ++r) {
            const auto& row = table.rows[r];
            const std::string where = escapeControls(path) + ":" + std::to_string(table.rowLines[r]);
            const Cmyk cmyk = {number(row[static_cast<size_t>(c)], where), number(row[static_cast<size_t>(m)], where),
                               number(row[static_cast<size_t>(y)], where), number(row[static_cast<size_t>(k)], where)};
            const Lab lab = hasLab ? Lab{number(row[static_cast<size_t>(L)], where), number(row[static_cast<size_t>(A)], where),
                                         number(row[static_cast<size_t>(B)], where)}
                                   : labOfD50(number(row[static_cast<size_t>(X)], where), number(row[static_cast<size_t>(Y)], where),
                                              number(row[static_cast<size_t>(Z)], where));
            auto& [count, sum] = sums[CombinationIndex::keyOf(cmyk)];
            if (count++ == 0)
                order.push_back(cmyk);
            sum[0] += lab.L, sum[1] += lab.a, sum[2] += lab.b;
        }
    } else {
        if (!hasSpectra)
            throw HostError(Failure::InputContent, escapeControls(path) + ": a reference needs LAB_L..LAB_B, "
                                                                          "XYZ_X..XYZ_Z or spectral fields");
        const MeasurementFile& file = *spectral.file;
        // Repeats averaged as spectra, as the form's patches are.
        std::map<Key, std::vector<size_t>> groups;
        for (size_t i = 0; i < file.sets.size(); ++i) {
            Cmyk cmyk{};
            for (size_t ink = 0; ink < 4; ++ink)
                cmyk[ink] = static_cast<double>(file.sets[i].device[ink]) / kDeviceUnits;
            std::vector<size_t>& group = groups[CombinationIndex::keyOf(cmyk)];
            if (group.empty())
                order.push_back(cmyk);
            group.push_back(i);
        }
        for (const Cmyk& cmyk : order) {
            const std::vector<size_t>& group = groups[CombinationIndex::keyOf(cmyk)];
            const std::vector<int> thousandths = averageThousandths(file, group);
            const Lab lab = labOfXYZ(XYZOfBands(libraryBands({&file.layout, &thousandths})));
            sums[CombinationIndex::keyOf(cmyk)] = {1, {lab.L, lab.a, lab.b}};
        }
    }
    if (order.empty())
        throw HostError(Failure::InputContent, escapeControls(path) + ": the reference holds no patch");
    for (const Cmyk& cmyk : order) {
        const auto& [count, sum] = sums[CombinationIndex::keyOf(cmyk)];
        reference.cmyk.push_back(cmyk);
        reference.lab.push_back({sum[0] / count, sum[1] / count, sum[2] / count});
    }
    return reference;
}

std::vector<std::string> referenceFolders()
{
    std::vector<std::string> folders;
    if (const char* given = std::getenv("VELTMARQUIST_REFERENCES"))
        folders.emplace_back(given);
    folders.emplace_back("/usr/share/color/icc");
    folders.emplace_back("/usr/share/color/argyll/ref");
    return folders;
}

std::string locateReference(const std::string& given)
{
    if (std::ifstream(given))
        return given;
    std::string searched;
    for (const std::string& folder : referenceFolders())
        for (const std::string& name : {given, given + ".ti3", given + ".txt"}) {
            const std::string path = folder + "/" + name;
            if (std::ifstream(path))
                return path;
        }
    for (const std::string& folder : referenceFolders())
        searched += (searched.empty() ? "" : ", ") + folder;
    throw HostError(Failure::InputUnreadable, escapeControls(given) +
                                                  ": no such file, nor a reference data set of that name in " + searched);
}

double* Tolerances::named(const std::string& name)
{
    const std::pair<const char*, double*> names[] = {
        {"paper", &paper}, {"cyan", &cyan}, {"magenta", &magenta}, {"yellow", &yellow}, {"black", &black},
        {"red", &red},     {"green", &green}, {"blue", &blue},     {"cmy", &cmy},       {"cmyk", &cmyk},
        {"grey", &grey},   {"tone-value", &toneValue}};
    for (const auto& [known, value] : names)
        if (name == known)
            return value;
    return nullptr;
}

Tolerances readTolerances(const std::string& path)
{
    std::ifstream in(path);
    if (!in)
        throw HostError(Failure::InputUnreadable, escapeControls(path) + ": cannot be opened");
    Tolerances tolerances;
    std::string line;
    for (int number = 1; std::getline(in, line); ++number) {
        line = line.substr(0, line.find('#'));
        std::istringstream words(line);
        std::string name, value, extra;
        if (!(words >> name))
            continue;
        const std::string where = escapeControls(path) + ":" + std::to_string(number);
        double* tolerance = tolerances.named(name);
        if (!tolerance)
            throw HostError(Failure::InputContent, where + ": unknown tolerance '" + escapeControls(name) +
                                                       "'; names: paper, cyan, magenta, yellow, black, red, green, "
                                                       "blue, cmy, cmyk, grey, tone-value");
        char* end = nullptr;
        words >> value >> extra;
        const double parsed = std::strtod(value.c_str(), &end);
        if (value.empty() || *end != '\0' || !(parsed > 0.0 && parsed < 100.0) || !extra.empty())
            throw HostError(Failure::InputContent, where + ": '" + escapeControls(name) +
                                                       "' needs one number above 0 and below 100");
        *tolerance = parsed;
    }
    return tolerances;
}

std::string toleranceSource(const std::string& name)
{
    if (name == "cyan" || name == "magenta" || name == "yellow" || name == "black")
        return "ISO 12647-2:2013, as cited in TAGA 2015";
    return "this project's default";
}

std::vector<std::string> conditionMismatches(const MeasurementFile& measured, const Reference& reference)
{
    const auto referenceValue = [&](const char* name) -> std::string {
        for (const auto& [keyword, value] : reference.header)
            if (keyword == name)
                return value;
        return "";
    };
    const auto condition = [](std::string text) {
        for (const char* mode : {"M0", "M1", "M2", "M3"})
            if (text.find(mode) != std::string::npos)
                return std::string(mode);
        return std::string();
    };
    std::vector<std::string> mismatches;
    const std::string ours = condition(measured.keyword("FILTER") + " " + measured.keyword("MEASUREMENT_CONDITION") +
                                       " " + measured.keyword("MEASUREMENT_SOURCE"));
    const std::string theirs = condition(referenceValue("FILTER") + " " + referenceValue("MEASUREMENT_CONDITION") +
                                         " " + referenceValue("MEASUREMENT_SOURCE"));
    if (!ours.empty() && !theirs.empty() && ours != theirs)
        mismatches.push_back("measurement condition " + ours + " against the reference's " + theirs);
    // The form's colours are always D50, 2 degree (computed from its spectra).
    const std::string illuminant = referenceValue("ILLUMINATION_NAME"), observer = referenceValue("OBSERVER_ANGLE");
    if (!illuminant.empty() && illuminant != "D50")
        mismatches.push_back("illuminant D50 against the reference's " + escapeControls(illuminant));
    if (!observer.empty() && observer != "2")
        mismatches.push_back("observer 2 degree against the reference's " + escapeControls(observer) + " degree");
    return mismatches;
}

std::vector<std::string> checkConditions(const MeasurementFile& measured, const Reference& reference,
                                         bool anyCondition)
{
    const std::vector<std::string> mismatches = conditionMismatches(measured, reference);
    std::string reasons;
    std::vector<std::string> notes;
    for (const std::string& mismatch : mismatches) {
        reasons += (reasons.empty() ? "" : "; ") + mismatch;
        notes.push_back("compared although they differ: " + mismatch);
    }
    if (!mismatches.empty() && !anyCondition)
        throw HostError(Failure::Usage, "the form and the reference were measured differently (" + reasons +
                                            "): their colours do not compare; --any-condition compares them anyway");
    return notes;
}

int ConformanceResult::failures() const
{
    return static_cast<int>(
        std::count_if(controls.begin(), controls.end(), [](const ControlPatch& p) { return !p.pass; }) +
        std::count_if(toneValues.begin(), toneValues.end(), [](const ToneValuePoint& p) { return !p.pass; }));
}

bool ConformanceResult::pass() const
{
    return failures() == 0;
}

ConformanceResult compare(const FoundForm& form, const Reference& reference, const Tolerances& given,
                          const PrintModel* model)
{
    Tolerances tolerances = given;
    ConformanceResult result;
    const MeasuredForm measuredForm = form.measuredForm();
    std::map<Key, Lab> measured;
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch) {
        const Spectrum& spectrum = measuredForm.spectrum(patch);
        measured[CombinationIndex::keyOf(MeasuredForm::coverageOf(patch))] =
            labOfXYZ(XYZOfBands(std::vector<double>(spectrum.begin(), spectrum.end())));
    }
    const struct {
        const char* name;
        const char* tolerance;
        Cmyk cmyk;
        bool hue;
    } controls[] = {
        {"paper", "paper", {0, 0, 0, 0}, false},          {"cyan", "cyan", {100, 0, 0, 0}, true},
        {"magenta", "magenta", {0, 100, 0, 0}, true},     {"yellow", "yellow", {0, 0, 100, 0}, true},
        {"black", "black", {0, 0, 0, 100}, true},         {"red (M+Y)", "red", {0, 100, 100, 0}, true},
        {"green (C+Y)", "green", {100, 0, 100, 0}, true}, {"blue (C+M)", "blue", {100, 100, 0, 0}, true},
        {"C+M+Y", "cmy", {100, 100, 100, 0}, true},       {"C+M+Y+K", "cmyk", {100, 100, 100, 100}, true},
        {"grey C40 M40 Y40", "grey", {40, 40, 40, 0}, false},
        {"grey C40 M40 Y40 K40", "grey", {40, 40, 40, 40}, false},
    };
    for (const auto& control : controls) {
        const auto ours = measured.find(CombinationIndex::keyOf(control.cmyk));
        const std::optional<Lab> theirs = reference.find(control.cmyk);
        if (ours == measured.end() || !theirs) {
            result.absent.push_back(control.name);
            continue;
        }
        ControlPatch patch;
        patch.name = control.name;
        patch.tolerance = control.tolerance;
        patch.cmyk = control.cmyk;
        patch.measured = ours->second;
        patch.reference = *theirs;
        patch.deltaE00 = deltaE2000(patch.measured, patch.reference);
        patch.deltaEab = deltaEab(patch.measured, patch.reference);
        if (control.hue)
            patch.deltaH = hueDifference(patch.measured, patch.reference);
        patch.limit = *tolerances.named(control.tolerance);
        patch.pass = patch.deltaE00 <= patch.limit;
        result.controls.push_back(patch);
    }

    // Tone value increase at the form's tints of each ink.
    const std::optional<Lab> referencePaper = reference.find({0, 0, 0, 0});
    for (int ink = 0; ink < 4; ++ink) {
        const auto paper = measured.find(CombinationIndex::keyOf(Cmyk{0, 0, 0, 0}));
        const auto solid = measured.find(CombinationIndex::keyOf(single(ink, 100)));
        const std::optional<Lab> referenceSolid = reference.find(single(ink, 100));
        if (!referencePaper || !referenceSolid || paper == measured.end() || solid == measured.end())
            continue;
        // The reference's tints of this ink, rising.
        std::vector<std::pair<double, double>> curve; // nominal, increase
        for (size_t i = 0; i < reference.cmyk.size(); ++i) {
            const Cmyk& cmyk = reference.cmyk[i];
            bool alone = true;
            for (int other = 0; other < 4; ++other)
                alone = alone && (other == ink || cmyk[static_cast<size_t>(other)] == 0.0);
            const double nominal = cmyk[static_cast<size_t>(ink)];
            if (alone && nominal > 0.0 && nominal < 100.0)
                curve.emplace_back(nominal, toneValueIncrease(reference.lab[i], *referencePaper, *referenceSolid, ink, nominal));
        }
        std::sort(curve.begin(), curve.end());
        if (curve.empty())
            continue;
        for (const auto& [key, lab] : measured) {
            Cmyk cmyk = {key[0] / 10.0, key[1] / 10.0, key[2] / 10.0, key[3] / 10.0};
            const double nominal = cmyk[static_cast<size_t>(ink)];
            if (!(cmyk == single(ink, nominal)) || nominal <= 0.0 || nominal >= 100.0)
                continue;
            ToneValuePoint point;
            point.ink = ink;
            point.nominal = nominal;
            point.measured = toneValueIncrease(lab, paper->second, solid->second, ink, nominal);
            // The reference at the same coverage, else between its neighbours (0 at 0 % and 100 %).
            std::vector<std::pair<double, double>> nodes = {{0.0, 0.0}};
            nodes.insert(nodes.end(), curve.begin(), curve.end());
            nodes.emplace_back(100.0, 0.0);
            point.interpolated = true;
            for (size_t n = 0; n + 1 < nodes.size(); ++n) {
                if (nodes[n].first == nominal) {
                    point.reference = nodes[n].second;
                    point.interpolated = false;
                    break;
                }
                if (nodes[n].first < nominal && nominal < nodes[n + 1].first) {
                    const double t = (nominal - nodes[n].first) / (nodes[n + 1].first - nodes[n].first);
                    point.reference = nodes[n].second + t * (nodes[n + 1].second - nodes[n].second);
                    break;
                }
            }
            point.limit = tolerances.toneValue;
            point.pass = std::fabs(point.measured - point.reference) <= point.limit;
            result.toneValues.push_back(point);
        }
    }

    if (model) {
        GamutComparison gamut;
        gamut.model = model->name();
        std::vector<double> cmyk;
        for (const Cmyk& patch : reference.cmyk)
            cmyk.insert(cmyk.end(), patch.begin(), patch.end());
        std::vector<double> XYZ(3 * reference.cmyk.size());
        model->predict(reference.cmyk.size(), cmyk.data(), nullptr, XYZ.data(), nullptr);
        std::vector<double> all, neutrals, skin, dark, saturated;
        std::vector<GamutPatch> patches;
        for (size_t i = 0; i < reference.cmyk.size(); ++i) {
            GamutPatch patch;
            patch.cmyk = reference.cmyk[i];
            patch.reference = reference.lab[i];
            patch.predicted = labOfXYZ({XYZ[3 * i], XYZ[3 * i + 1], XYZ[3 * i + 2]});
            patch.deltaE00 = deltaE2000(patch.predicted, patch.reference);
            const Lab& r = patch.reference;
            const double chroma = std::hypot(r.a, r.b), hue = std::atan2(r.b, r.a) * 180.0 / M_PI;
            all.push_back(patch.deltaE00);
            if (chroma < 5.0)
                neutrals.push_back(patch.deltaE00);
            if (r.L >= 50.0 && r.L <= 85.0 && chroma >= 10.0 && chroma <= 40.0 && hue >= 30.0 && hue <= 75.0)
                skin.push_back(patch.deltaE00);
            if (r.L < 30.0)
                dark.push_back(patch.deltaE00);
            if (chroma > 60.0)
                saturated.push_back(patch.deltaE00);
            patches.push_back(patch);
        }
        gamut.regions = {{"all", summarise(all)},
                         {"neutrals (C*ab below 5)", summarise(neutrals)},
                         {"skin tones (L* 50-85, C*ab 10-40, hue 30-75 degrees)", summarise(skin)},
                         {"dark colours (L* below 30)", summarise(dark)},
                         {"saturated colours (C*ab above 60)", summarise(saturated)}};
        gamut.all = patches;
        std::stable_sort(patches.begin(), patches.end(),
                         [](const GamutPatch& a, const GamutPatch& b) { return a.deltaE00 > b.deltaE00; });
        patches.resize(std::min<size_t>(10, patches.size()));
        gamut.worst = std::move(patches);
        result.gamut = std::move(gamut);
    }
    return result;
}

} // namespace veltmarquist::conformance
