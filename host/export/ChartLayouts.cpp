// The patch layouts of an exported chart: the library's chart, grids and files.
#include "ChartLayouts.h"

#include "Cgats.h"
#include "Failure.h"
#include "Numbers.h"
#include "Text.h"

#include "MathProfile.h"
#include "models/PrintModels.h"

#include <algorithm>
#include <charconv>
#include <optional>
#include <set>

namespace veltmarquist::exporting {

namespace {

const char kInkLetters[4] = {'C', 'M', 'Y', 'K'};

std::string listOf(const std::vector<double>& levels)
{
    std::string text;
    for (double level : levels)
        text += (text.empty() ? "" : ", ") + roundTripText(level);
    return text + " %";
}

std::string coverageText(const double* cmyk)
{
    std::string text;
    for (int ink = 0; ink < 4; ++ink)
        text += (ink == 0 ? "" : " ") + std::string(1, kInkLetters[ink]) + " " + roundTripText(cmyk[ink]);
    return text;
}

// The argument of grid:N as a level count, or nothing when it is not a
// whole number from 2 to 21.
std::optional<int> evenLevelCount(const std::string& text)
{
    int count = 0;
    const auto parsed = std::from_chars(text.data(), text.data() + text.size(), count);
    if (text.empty() || parsed.ec != std::errc() || parsed.ptr != text.data() + text.size() ||
        count < kMinEvenLevels || count > kMaxEvenLevels)
        return std::nullopt;
    return count;
}

Failure failureOf(ReadFailure failure)
{
    switch (failure) {
    case ReadFailure::Unreadable:
        return Failure::InputUnreadable;
    case ReadFailure::Syntax:
        return Failure::InputSyntax;
    default:
        return Failure::InputContent;
    }
}

// Why an identifier cannot go into a chart as it is, or nothing.
const char* unfitIdentifier(const std::string& id)
{
    if (id.size() > kMaxSampleIdBytes)
        return "is longer than 64 bytes";
    if (id.find_first_of(" \"'") != std::string::npos)
        return "holds a blank or a quote";
    if (!isPlainText(id))
        return "holds a control character, a byte that is not UTF-8 or a character that reorders or hides text";
    return nullptr;
}

// Replaces the identifiers no reader may take by the patch's number.
void replaceUnfitIdentifiers(PatchLayout& layout)
{
    std::vector<std::string> replaced;
    for (std::size_t patch = 0; patch < layout.size(); ++patch) {
        std::string& id = layout.ids[patch];
        if (const char* why = unfitIdentifier(id)) {
            layout.warnings.push_back("line " + std::to_string(layout.lines[patch]) + ": sample identifier '" +
                                      escapeControls(cgats::excerpt(id)) + "' " + why + "; written as " +
                                      std::to_string(patch + 1));
            id = std::to_string(patch + 1);
            replaced.push_back(id);
        }
    }
    if (replaced.empty())
        return;
    std::set<std::string> seen;
    for (const std::string& id : layout.ids)
        if (!seen.insert(id).second) {
            for (std::size_t patch = 0; patch < layout.size(); ++patch)
                layout.ids[patch] = std::to_string(patch + 1);
            layout.warnings.push_back("a replaced sample identifier would name two patches: every patch is numbered "
                                      "from 1 in file order");
            return;
        }
}

} // namespace

std::string PatchLayout::describePatch(std::size_t patch) const
{
    if (!file.empty())
        return file + ": sample " + ids[patch] + " (line " + std::to_string(lines[patch]) + ")";
    return "sample " + ids[patch] + " (" + coverageText(&cmyk[4 * patch]) + ")";
}

std::vector<double> formLevels()
{
    std::set<double> levels;
    for (int patch = 0; patch < MeasuredForm::kPatches; ++patch)
        for (double coverage : MeasuredForm::coverageOf(patch))
            levels.insert(coverage);
    return {levels.begin(), levels.end()};
}

std::vector<double> evenLevels(int count)
{
    if (count < kMinEvenLevels || count > kMaxEvenLevels)
        throw HostError(Failure::Usage, "an even grid has 2 to 21 levels per ink, not " + std::to_string(count));
    std::vector<double> levels;
    for (int i = 0; i < count; ++i)
        levels.push_back(100.0 * i / (count - 1));
    return levels;
}

PatchLayout characterisationChartLayout()
{
    PatchLayout layout;
    layout.description = "the library's 900-patch characterisation chart";
    for (const auto& entry : MathProfile::toBeCalculated) {
        layout.ids.push_back(std::to_string(layout.ids.size() + 1));
        layout.cmyk.insert(layout.cmyk.end(), entry.begin(), entry.end());
    }
    return layout;
}

PatchLayout gridLayout(const std::vector<double>& levels, const std::string& description)
{
    PatchLayout layout;
    layout.description = description;
    const std::size_t n = levels.size();
    layout.ids.reserve(n * n * n * n);
    layout.cmyk.reserve(4 * n * n * n * n);
    for (double c : levels)
        for (double m : levels)
            for (double y : levels)
                for (double k : levels) {
                    layout.ids.push_back(std::to_string(layout.ids.size() + 1));
                    layout.cmyk.insert(layout.cmyk.end(), {c, m, y, k});
                }
    return layout;
}

PatchLayout fileLayout(const MeasurementFile& file, const std::string& name)
{
    if (file.deviceFields.size() != 4)
        throw HostError(Failure::InputContent,
                          name + ": a layout needs the four device fields CMYK_C, CMYK_M, CMYK_Y, CMYK_K (or 4CLR_1..4CLR_4); " +
                              (file.deviceFields.empty() ? "the file has none, " + file.describeFields()
                                                         : "it has " + std::to_string(file.deviceFields.size()) + " channels"));
    if (file.sets.empty())
        throw HostError(Failure::InputContent, name + ": the layout holds no patches");
    PatchLayout layout;
    layout.description = "the " + std::to_string(file.sets.size()) + " patches of " + name;
    layout.file = name;
    for (const MeasurementSet& set : file.sets) {
        layout.ids.push_back(set.id.empty() ? std::to_string(layout.ids.size() + 1) : set.id);
        layout.lines.push_back(set.line);
        for (double percent : set.devicePercent())
            layout.cmyk.push_back(std::clamp(percent, 0.0, 100.0)); // the reader lets -0.05..100.05 % pass as noise
    }
    layout.warnings = file.warnings;
    replaceUnfitIdentifiers(layout);
    return layout;
}

bool isGeneratedLayout(const std::string& argument)
{
    return argument == "chart" || argument == "grid" || argument.rfind("grid:", 0) == 0;
}

PatchLayout readLayout(const std::string& argument)
{
    if (argument == "chart")
        return characterisationChartLayout();
    if (argument == "grid") {
        const std::vector<double> levels = formLevels();
        return gridLayout(levels, "grid of the form's " + std::to_string(levels.size()) + " levels per ink (" +
                                      listOf(levels) + ")");
    }
    if (argument.rfind("grid:", 0) == 0) {
        const std::optional<int> count = evenLevelCount(argument.substr(5));
        if (!count)
            throw HostError(Failure::Usage,
                              "layout " + argument + ": grid:N takes a whole number of levels per ink from 2 to 21 "
                                                     "(grid:11 is 0, 10, ..., 100 %)");
        const std::vector<double> levels = evenLevels(*count);
        return gridLayout(levels, "grid of " + std::to_string(*count) + " even levels per ink (" + listOf(levels) + ")");
    }
    const ReadResult read = readMeasurementFile(argument);
    if (!read.ok())
        throw HostError(failureOf(read.error.kind), argument + ": " + read.error.describe());
    return fileLayout(*read.file, argument);
}

void checkPredictable(const PatchLayout& layout, const PrintModel& model)
{
    const std::vector<double>& levels = model.levels();
    if (levels.empty())
        return;
    for (std::size_t patch = 0; patch < layout.size(); ++patch)
        for (int ink = 0; ink < 4; ++ink) {
            const double coverage = layout.cmyk[4 * patch + static_cast<std::size_t>(ink)];
            if (std::find(levels.begin(), levels.end(), coverage) == levels.end())
                throw HostError(layout.file.empty() ? Failure::Usage : Failure::InputContent,
                                  layout.describePatch(patch) + " has " + std::string(1, kInkLetters[ink]) + " " +
                                      roundTripText(coverage) + ", which the " + model.name() +
                                      " model cannot predict: it predicts only the form's levels " + listOf(levels) +
                                      " (the Yule-Nielsen model predicts every coverage)");
        }
}

} // namespace veltmarquist::exporting
