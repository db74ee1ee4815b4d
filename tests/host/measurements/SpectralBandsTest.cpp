// Spectral field names and layouts, and their resampling to 10 nm.
#include "SpectralBands.h"

#include <gtest/gtest.h>

using namespace veltmarquist;

namespace {

std::vector<std::string> names(const std::string& prefix, int first, int step, int count)
{
    std::vector<std::string> fields{"SAMPLE_ID"};
    for (int j = 0; j < count; ++j)
        fields.push_back(prefix + std::to_string(first + step * j));
    return fields;
}

} // namespace

TEST(SpectralBands, FindsLayoutsAndNamesTheFieldsOfThoseItCannotRead)
{
    const std::pair<std::vector<std::string>, const char*> cases[] = {
        {names("nm", 380, 10, 36), "36 bands 380-730 nm in 10 nm steps"},
        {names("SPECTRAL_NM_", 400, 10, 31), "31 bands 400-700 nm in 10 nm steps"},
        {names("spec_", 340, 10, 50), "50 bands 340-830 nm in 10 nm steps"},
        {names("SPECTRAL_", 400, 20, 16), "16 bands 400-700 nm in 20 nm steps"},
        {names("SPECTRAL_NM", 380, 20, 21), "41 bands 380-780 nm in 10 nm steps"},
        {names("nm", 380, 5, 81), "41 bands 380-780 nm in 10 nm steps"},
        {names("nm", 385, 10, 36), "35 bands 390-730 nm in 10 nm steps"},
        {names("nm", 400, 1, 301), "31 bands 400-700 nm in 10 nm steps"},
        {names("nm", 420, 20, 15), "unknown spectral layout: 15 bands 420-700 nm in 20 nm steps (fields nm420 ... nm700)"},
        {names("SPEC_", 350, 3, 161), "unknown spectral layout: 161 bands 350-830 nm in 3 nm steps (fields SPEC_350 ... SPEC_830)"},
        {{"nm400", "nm410", "nm425"}, "unknown spectral layout: bands 410 and 425 nm break the 10 nm steps (fields nm400"},
        {{"nm400", "SPECTRAL_400"}, "unknown spectral layout: fields nm400 and SPECTRAL_400 both name 400 nm"},
    };
    for (const auto& [fields, expected] : cases) {
        SCOPED_TRACE(fields.back());
        SpectralFields found;
        const std::optional<std::string> error = findSpectralFields(fields, found);
        EXPECT_EQ((error ? *error : found.delivered.describe()).substr(0, std::string(expected).size()), expected);
    }
}

TEST(SpectralBands, DecimatesWhereThe10nmPointsExistAndInterpolatesBetween)
{
    for (int step : {5, 20}) {
        SCOPED_TRACE(step);
        SpectralFields fields;
        ASSERT_FALSE(findSpectralFields(names("nm", 380, step, 400 / step + 1), fields));
        std::vector<std::int32_t> values;
        for (int nm = 380; nm <= 780; nm += step)
            values.push_back(nm == 400 ? 5 : nm * 1000); // 5 at 400 nm
        const std::vector<std::int32_t> resampled = resample(fields, values);
        ASSERT_EQ(resampled.size(), 41u);
        EXPECT_EQ(resampled[2], 5);                                   // 400 nm measured
        EXPECT_EQ(resampled[1], step == 5 ? 390000 : 190003);         // (380000 + 5) / 2, odd for the cut half
        EXPECT_EQ(resampled[35], 730000);                             // 730 nm: measured, or between 720 and 740
    }
}
