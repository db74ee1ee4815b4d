#include "ReliabilitySupport.h"

#include <cstring>
#include <fstream>
#include <sstream>

namespace reliability {

using namespace testsupport;

int calculate(void* profile, int process, const std::string& path, MeasurementBlock& block)
{
    return CalculateChart(profile, static_cast<PrintProcess>(process), path.c_str(), block.ints.data(),
                          block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
}

namespace {

template <typename T>
void append(std::vector<unsigned char>& bytes, const T& value)
{
    const auto* raw = reinterpret_cast<const unsigned char*>(&value);
    bytes.insert(bytes.end(), raw, raw + sizeof value);
}

} // namespace

ProfileState stateOf(const void* handle)
{
    const auto* profile = static_cast<const MathProfile*>(handle);
    ProfileState state;
    append(state.bytes, profile->normFactor);
    append(state.bytes, profile->patchSlots);
    for (const auto& list : profile->tintLists) {
        append(state.bytes, list.size());
        for (const auto& patch : list)
            append(state.bytes, patch);
    }
    append(state.bytes, profile->grayDiffFactor);
    append(state.bytes, profile->rgbFactor);
    append(state.bytes, profile->coverageLimit);
    append(state.bytes, profile->profileName);
    append(state.bytes, profile->inkOrder);
    return state;
}

void putSeparations(MeasurementBlock& block)
{
    std::istringstream in(readFile(goldenPath("multichannel.separations")));
    for (int i = 0; i < VM_EXCHANGE_BUFFER_INTS; ++i)
        in >> block.ints.at(static_cast<size_t>(i));
    if (!in)
        throw std::runtime_error("malformed golden separations");
}

void* primedProfile(const std::string& path)
{
    MeasurementBlock block = readGoldenInput("multichannel.in");
    void* profile = CreateMathProfile("primed");
    const int status = calculate(profile, VM_PROCESS_SIX_COLOUR, path, block);
    if (status != VM_STATUS_OK)
        throw std::runtime_error("process 3 on the golden multi-channel form failed");
    return profile;
}

int dataLines(const std::string& chart)
{
    const std::string end = "END_DATA\n";
    if (chart.size() < end.size() || chart.compare(chart.size() - end.size(), end.size(), end) != 0)
        return -1;
    const auto all = lines(chart);
    int n = 0;
    bool inData = false;
    for (const auto& line : all) {
        if (line == "END_DATA")
            return inData ? n : -1;
        if (inData)
            ++n;
        if (line == "BEGIN_DATA")
            inData = true;
    }
    return -1;
}

::testing::AssertionResult servesFollowUp(void* profile, FollowUp followUp, const std::string& out)
{
    MeasurementBlock block;
    int process = 0;
    std::string golden;
    switch (followUp) {
    case FollowUp::ChartCopy:
        block = readGoldenInput("conversion.in");
        process = VM_PROCESS_CHART_COPY;
        golden = "conversion.p7.chart";
        break;
    case FollowUp::Gravure:
        block = readGoldenInput("offset-form.in");
        process = VM_PROCESS_GRAVURE;
        golden = "offset-form.p1.chart";
        break;
    case FollowUp::SeparatedSet:
        block = readGoldenInput("multichannel.in");
        putSeparations(block);
        process = VM_PROCESS_SEPARATED_SET;
        golden = "multichannel.p3-p6.chart";
        break;
    }
    const int status = calculate(profile, process, out, block);
    if (status != VM_STATUS_OK)
        return ::testing::AssertionFailure() << "follow-up process " << process << " returned " << status;
    if (readFile(out) != readFile(goldenPath(golden)))
        return ::testing::AssertionFailure() << "follow-up process " << process << " differs from " << golden;
    return ::testing::AssertionSuccess();
}

} // namespace reliability
