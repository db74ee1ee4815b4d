// CIELAB, colour differences and their summaries.
#include "ColourDifference.h"

#include <lcms2.h>

#include <algorithm>

namespace veltmarquist {

Lab labOfXYZ(const Triple& XYZ)
{
    const cmsCIEXYZ xyz{XYZ[0] / 100.0, XYZ[1] / 100.0, XYZ[2] / 100.0};
    cmsCIELab lab;
    cmsXYZ2Lab(cmsD50_XYZ(), &lab, &xyz);
    return Lab{lab.L, lab.a, lab.b};
}

Triple XYZOfLab(const Lab& lab)
{
    const cmsCIELab value{lab.L, lab.a, lab.b};
    cmsCIEXYZ xyz;
    cmsLab2XYZ(cmsD50_XYZ(), &xyz, &value);
    return {xyz.X * 100.0, xyz.Y * 100.0, xyz.Z * 100.0};
}

double deltaEab(const Lab& first, const Lab& second)
{
    const cmsCIELab a{first.L, first.a, first.b}, b{second.L, second.a, second.b};
    return cmsDeltaE(&a, &b);
}

double deltaE2000(const Lab& first, const Lab& second)
{
    const cmsCIELab a{first.L, first.a, first.b}, b{second.L, second.a, second.b};
    return cmsCIE2000DeltaE(&a, &b, 1.0, 1.0, 1.0);
}

Triple XYZOfBands(const std::vector<double>& bands)
{
    Spectrum spectrum{};
    std::copy_n(bands.begin(), std::min<size_t>(bands.size(), kSpectrumBands), spectrum.begin());
    return limitToChartY(spectrumToXYZ(spectrum));
}

Summary summarise(std::vector<double> values)
{
    Summary summary;
    summary.count = values.size();
    if (values.empty())
        return summary;
    std::sort(values.begin(), values.end());
    double sum = 0.0;
    for (double value : values)
        sum += value;
    summary.mean = sum / static_cast<double>(values.size());
    summary.max = values.back();
    const double rank = 0.95 * static_cast<double>(values.size() - 1);
    const size_t below = static_cast<size_t>(rank);
    const size_t above = std::min(below + 1, values.size() - 1);
    summary.p95 = values[below] + (rank - static_cast<double>(below)) * (values[above] - values[below]);
    return summary;
}

} // namespace veltmarquist
