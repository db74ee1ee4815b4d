// Measurement files read with the tool's errors and paper warnings.
#include "MeasurementLoading.h"

#include "ColourDifference.h"
#include "LibraryBlock.h"
#include "PatchMatching.h"
#include "Failure.h"
#include "Numbers.h"


namespace veltmarquist {

namespace {

Failure failureOf(ReadFailure kind)
{
    switch (kind) {
    case ReadFailure::Unreadable:
        return Failure::InputUnreadable;
    case ReadFailure::Content:
        return Failure::InputContent;
    case ReadFailure::Duplicate:
        return Failure::DuplicatePatch;
    case ReadFailure::Syntax:
        break;
    }
    return Failure::InputSyntax;
}

double paperY(const MeasurementFile& file, const SetList& sets)
{
    const std::vector<int> thousandths = averageThousandths(file, sets.begin(), sets.size());
    return XYZOfBands(libraryBands({&file.layout, &thousandths}))[1];
}

// A paper is the brightest thing on the sheet, and brighter than Y 20.
void warnAboutPaper(MeasurementFile& file)
{
    const std::vector<size_t> paper = file.paperSets();
    if (paper.empty() || !file.layout.present())
        return;
    const double Y = paperY(file, SetList(paper.data(), paper.size()));
    if (Y < 20.0)
        file.warnings.push_back("the paper (" + file.sets[paper[0]].where() + ") has Y " + fixedText(Y, 1) +
                                ": a paper is far brighter; is it measured on black, or is it not the paper?");
    const CombinationIndex index(file);
    for (size_t channel = 0; channel < file.deviceFields.size() && channel < 4; ++channel) {
        std::vector<double> solid(file.deviceFields.size(), 0.0);
        solid[channel] = 100.0;
        const SetList sets = index.find(solid);
        if (sets.empty() || paperY(file, sets) <= Y)
            continue;
        file.warnings.push_back("the paper (Y " + fixedText(Y, 1) + ") is darker than the solid " +
                                file.deviceFields[channel] + " 100 (" + file.sets[sets[0]].where() + ", Y " +
                                fixedText(paperY(file, sets), 1) + "): are paper and solid swapped?");
    }
}

} // namespace

MeasurementFile loadMeasurementFile(const std::string& path, const ReadOptions& options)
{
    ReadResult result = readMeasurementFile(path, options);
    if (!result.ok()) {
        const ReadError& error = result.error;
        const std::string where = error.line > 0 ? path + ":" + std::to_string(error.line) : path;
        throw HostError(failureOf(error.kind), where + ": " + error.message);
    }
    warnAboutPaper(*result.file);
    return std::move(*result.file);
}

} // namespace veltmarquist
