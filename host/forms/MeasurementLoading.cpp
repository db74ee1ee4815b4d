// Measurement files read with the tool's errors and paper warnings.
#include "MeasurementLoading.h"

#include "ColourDifference.h"
#include "Cxf3.h"
#include "LibraryBlock.h"
#include "PatchMatching.h"
#include "Failure.h"
#include "Numbers.h"

#include <filesystem>
#include <fstream>
#include <iostream>
#include <optional>
#include <sstream>

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

namespace {

// A CxF3 file as the CGATS text of its data; nullopt for any other file
// (the reader then reads or refuses it as it is).
std::optional<std::string> cxf3Text(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    char start[256] = {};
    in.read(start, sizeof start);
    if (!in.gcount() || !cxf::looksLikeXml(std::string_view(start, static_cast<size_t>(in.gcount()))))
        return std::nullopt;
    std::error_code error;
    const auto bytes = std::filesystem::file_size(path, error);
    if (error || bytes > static_cast<std::uintmax_t>(kMaxFileBytes))
        return std::nullopt; // the reader names what is wrong with it
    in.clear();
    in.seekg(0);
    std::ostringstream text;
    text << in.rdbuf();
    return cxf::cgatsOfCxf3(text.str(), path);
}

} // namespace

// Standard input ("-") read whole, CGATS or CxF3.
ReadResult readStandardInput(const ReadOptions& options, bool& fromCxf)
{
    std::ostringstream text;
    text << std::cin.rdbuf();
    const std::string input = text.str();
    fromCxf = cxf::looksLikeXml(std::string_view(input).substr(0, 256));
    return readMeasurementText(fromCxf ? cxf::cgatsOfCxf3(input, "standard input") : input, options);
}

MeasurementFile loadMeasurementFile(const std::string& path, const ReadOptions& options)
{
    bool fromCxf = false;
    ReadResult result;
    if (path == kStandardInput) {
        result = readStandardInput(options, fromCxf);
    } else {
        const std::optional<std::string> cxf = cxf3Text(path);
        fromCxf = cxf.has_value();
        result = cxf ? readMeasurementText(*cxf, options) : readMeasurementFile(path, options);
    }
    if (fromCxf && !result.ok())
        result.error.line = 0; // a line of the CGATS form, which the user never sees
    if (!result.ok()) {
        const ReadError& error = result.error;
        const std::string name = path == kStandardInput ? "standard input" : path;
        const std::string where = error.line > 0 ? name + ":" + std::to_string(error.line) : name;
        throw HostError(failureOf(error.kind), where + ": " + error.message);
    }
    warnAboutPaper(*result.file);
    return std::move(*result.file);
}

} // namespace veltmarquist
