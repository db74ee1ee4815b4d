// Golden measurement blocks of the library's tests written as CGATS text.
#ifndef VELTMARQUIST_TOOLTESTSUPPORT_H
#define VELTMARQUIST_TOOLTESTSUPPORT_H

#include "../TestSupport.h"
#include "MeasurementFile.h"

#include <functional>

namespace tooltest {

using Row = std::vector<std::string>;

inline std::string cgats(const Row& fields, const std::vector<Row>& rows)
{
    const auto line = [](const Row& items) {
        std::string text;
        for (size_t i = 0; i < items.size(); ++i)
            text += (i ? "\t" : "") + items[i];
        return text + "\n";
    };
    std::string text = "CGATS.17\nNUMBER_OF_FIELDS\t" + std::to_string(fields.size()) + "\nBEGIN_DATA_FORMAT\n" +
                       line(fields) + "END_DATA_FORMAT\nNUMBER_OF_SETS\t" + std::to_string(rows.size()) +
                       "\nBEGIN_DATA\n";
    for (const Row& row : rows)
        text += line(row);
    return text + "END_DATA\n";
}

struct Form {
    Row fields;
    std::vector<Row> rows;
    std::string text() const { return cgats(fields, rows); }
};

// Patches [first, last) of a golden block: fields SAMPLE_ID, `device`, then
// SPECTRAL_NM380 ... (nm400 ... for 16 bands); rows id, `values(patch)`, spectrum.
inline Form goldenForm(const testsupport::MeasurementBlock& block, int first, int last, const Row& device,
                       const std::function<Row(int)>& values)
{
    Form form{{"SAMPLE_ID"}, {}};
    form.fields.insert(form.fields.end(), device.begin(), device.end());
    for (int j = 0; j < block.valuesPerPatch; ++j)
        form.fields.push_back(block.inputKind == 20 ? "nm" + std::to_string(400 + 20 * j)
                                                    : "SPECTRAL_NM" + std::to_string(block.firstWavelength + 10 * j));
    for (int patch = first; patch < last; ++patch) {
        form.rows.push_back(values(patch));
        form.rows.back().insert(form.rows.back().begin(), std::to_string(patch + 1));
        for (size_t j = 0; j < static_cast<size_t>(block.valuesPerPatch); ++j)
            form.rows.back().push_back(std::to_string(block.ints[patch * block.valuesPerPatch + j] / 1e3));
    }
    return form;
}

// A golden four-colour form: its 46 patches in measuring order with CMYK fields.
inline Form goldenForm(const char* name)
{
    const Row cmyk{"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    return goldenForm(testsupport::readGoldenInput(name), 0, 46, cmyk, [](int patch) {
        Row row;
        for (int channel = 0; channel < 4; ++channel)
            row.push_back(std::to_string(MathProfile::dithering[patch][channel]));
        return row;
    });
}

} // namespace tooltest

#endif // VELTMARQUIST_TOOLTESTSUPPORT_H
