// Golden measurement blocks written as the CGATS files that users measure:
// SAMPLE_ID, device fields, then the bands as reflectance 0-1 ("0.512").
// Shared by the host's and the command-line tests.
#ifndef VELTMARQUIST_GOLDENFORMS_H
#define VELTMARQUIST_GOLDENFORMS_H

#include "TestSupport.h"
#include "Cgats.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <sstream>

namespace testsupport {

using Row = std::vector<std::string>;

// `row` followed by prefix + first, prefix + (first + step), ...
inline Row numbered(const std::string& prefix, int first, int step, int count, Row row = {})
{
    for (int j = 0; j < count; ++j)
        row.push_back(prefix + std::to_string(first + step * j));
    return row;
}

// Patches [first, last) of a golden block; `values` fills the `device` fields of each.
inline veltmarquist::cgats::Document goldenDocument(const MeasurementBlock& block, int first, int last, Row device,
                                                    const std::function<void(int, Row&)>& values)
{
    const int n = block.valuesPerPatch;
    device.insert(device.begin(), "SAMPLE_ID");
    veltmarquist::cgats::Document form;
    form.fields = block.inputKind == 20 ? numbered("nm", 400, 20, n, device)
                                        : numbered("SPECTRAL_NM", block.firstWavelength, 10, n, device);
    for (int patch = first; patch < last; ++patch) {
        form.rows.push_back({std::to_string(patch + 1)});
        values(patch, form.rows.back());
        for (int j = 0; j < n; ++j)
            form.rows.back().push_back(std::to_string(block.ints[static_cast<size_t>(patch * n + j)] / 1e3));
    }
    return form;
}

// The 46 patches of a golden four-colour block in measuring order, with CMYK fields.
inline veltmarquist::cgats::Document goldenForm(const MeasurementBlock& block)
{
    return goldenDocument(block, 0, 46, {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"}, [](int patch, Row& row) {
        for (unsigned char coverage : MathProfile::dithering[patch])
            row.push_back(std::to_string(coverage));
    });
}

inline Row clrFields(int inks, Row before = {}) { return numbered(std::to_string(inks) + "CLR_", 1, 1, inks, before); }

// The golden multi-channel patches: C, M, Y, K solids, paper, three tints the processes ignore, further ink solids.
inline std::string multiChannelForm(int inks)
{
    return veltmarquist::cgats::write(goldenDocument(readGoldenInput("multichannel.in"), 0, inks + 4, clrFields(inks),
                                                     [inks](int patch, Row& row) {
        const int solidOf[11] = {0, 1, 2, 3, -1, -2, -3, -4, 4, 5, 6};
        for (int channel = 0; channel < inks; ++channel)
            row.push_back(channel == solidOf[patch] ? "100" : solidOf[patch] == -channel - 2 ? "50" : "0");
    }));
}

// The golden separations as the host's answer: `channels` as nCLR_1, ... in percent, clamped to 0-100.
// `exact` marks the records that say what the golden ones say (nothing clamped, no ink dropped).
inline std::string separations(const std::vector<int>& channels, std::vector<bool>& exact)
{
    std::istringstream in(readFile(goldenPath("multichannel.separations")));
    veltmarquist::cgats::Document answer{"CGATS.17", {}, clrFields(static_cast<int>(channels.size()), {"SAMPLE_ID"}), {}};
    for (int record = 1; record <= 3499; ++record) {
        int values[7];
        for (int& value : values)
            in >> value;
        bool unchanged = true;
        for (int channel = 0; channel < 7; ++channel)
            unchanged &= values[channel] == (std::count(channels.begin(), channels.end(), channel)
                                                 ? std::clamp(values[channel], 0, 100000) : 0);
        answer.rows.push_back({std::to_string(record)});
        for (int channel : channels)
            answer.rows.back().push_back(std::to_string(std::clamp(values[channel], 0, 100000) / 1000.0));
        exact.push_back(unchanged);
    }
    return veltmarquist::cgats::write(answer);
}

// The lines of a separated chart against the golden one: header, every record that went in unchanged, end.
inline void expectSeparatedChart(const std::string& chart, const std::string& golden, const std::vector<bool>& exact)
{
    const std::vector<std::string> ours = lines(chart), theirs = lines(readFile(goldenPath(golden)));
    ASSERT_EQ(ours.size(), theirs.size());
    ASSERT_GT(std::count(exact.begin(), exact.end(), true), 1000);
    for (size_t line = 0; line < ours.size(); ++line)
        if (line < 7 || line >= 7 + exact.size() || exact[line - 7]) {
            EXPECT_EQ(ours[line], theirs[line]) << "line " << line + 1;
        }
}

// Patches [first, last) of the golden conversion input: 30 in 7 channels, PAPER_PRINTED, PAPER_TARGET.
inline std::string conversionChart(int first, int last)
{
    const MeasurementBlock block = readGoldenInput("conversion.in");
    return veltmarquist::cgats::write(goldenDocument(block, first, last, clrFields(7, {"SAMPLE_NAME"}),
                                                     [&block](int patch, Row& row) {
        row.push_back(patch == 30 ? "PAPER_PRINTED" : patch == 31 ? "PAPER_TARGET" : "P" + std::to_string(patch + 1));
        for (size_t channel = 0; channel < 7; ++channel)
            row.push_back(std::to_string(block.ints[static_cast<size_t>(block.count * 36 + 7 * patch) + channel]));
    }));
}

} // namespace testsupport

#endif // VELTMARQUIST_GOLDENFORMS_H
