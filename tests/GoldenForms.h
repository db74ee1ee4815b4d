// Golden measurement blocks written as the CGATS files that users measure:
// SAMPLE_ID, device fields, then the bands as reflectance 0-1 ("0.512").
// Shared by the form-finding and the command-line tests.
#ifndef VELTMARQUIST_GOLDENFORMS_H
#define VELTMARQUIST_GOLDENFORMS_H

#include "TestSupport.h"
#include "Cgats.h"

#include <functional>

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

} // namespace testsupport

#endif // VELTMARQUIST_GOLDENFORMS_H
