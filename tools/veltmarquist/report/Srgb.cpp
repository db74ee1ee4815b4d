// D50 X, Y, Z to sRGB through Bradford.
#include "Srgb.h"

#include <cmath>

namespace veltmarquist {

namespace {

using Matrix = std::array<std::array<double, 3>, 3>;

Matrix multiply(const Matrix& a, const Matrix& b)
{
    Matrix product{};
    for (size_t i = 0; i < 3; ++i)
        for (size_t j = 0; j < 3; ++j)
            for (size_t k = 0; k < 3; ++k)
                product[i][j] += a[i][k] * b[k][j];
    return product;
}

Triple apply(const Matrix& m, const Triple& v)
{
    Triple out{};
    for (size_t i = 0; i < 3; ++i)
        out[i] = m[i][0] * v[0] + m[i][1] * v[1] + m[i][2] * v[2];
    return out;
}

Matrix inverse(const Matrix& m)
{
    const double det = m[0][0] * (m[1][1] * m[2][2] - m[1][2] * m[2][1]) -
                       m[0][1] * (m[1][0] * m[2][2] - m[1][2] * m[2][0]) +
                       m[0][2] * (m[1][0] * m[2][1] - m[1][1] * m[2][0]);
    Matrix out{};
    for (size_t i = 0; i < 3; ++i)
        for (size_t j = 0; j < 3; ++j) {
            // Cofactor of m[j][i] over the determinant.
            const size_t r1 = (j + 1) % 3, r2 = (j + 2) % 3, c1 = (i + 1) % 3, c2 = (i + 2) % 3;
            out[i][j] = (m[r1][c1] * m[r2][c2] - m[r1][c2] * m[r2][c1]) / det;
        }
    return out;
}

// X, Y, Z (D50, 0..1) to linear sRGB: M_sRGB * Bradford^-1 * diag(D65 / D50 cone) * Bradford.
Matrix displayMatrix()
{
    const Matrix bradford = {{{0.8951, 0.2664, -0.1614}, {-0.7502, 1.7135, 0.0367}, {0.0389, -0.0685, 1.0296}}};
    const Matrix toSrgb = {{{3.2406, -1.5372, -0.4986}, {-0.9689, 1.8758, 0.0415}, {0.0557, -0.2040, 1.0570}}};
    const Triple d50 = apply(bradford, {0.9642, 1.0, 0.8249});
    const Triple d65 = apply(bradford, {0.95047, 1.0, 1.08883});
    Matrix scale{};
    for (size_t i = 0; i < 3; ++i)
        scale[i][i] = d65[i] / d50[i];
    return multiply(toSrgb, multiply(inverse(bradford), multiply(scale, bradford)));
}

double encode(double linear)
{
    return linear <= 0.0031308 ? 12.92 * linear : 1.055 * std::pow(linear, 1.0 / 2.4) - 0.055;
}

double decode(double encoded)
{
    return encoded <= 0.04045 ? encoded / 12.92 : std::pow((encoded + 0.055) / 1.055, 2.4);
}

} // namespace

std::string DisplayColour::hex() const
{
    static const char digits[] = "0123456789abcdef";
    std::string text = "#";
    for (int channel : rgb) {
        text += digits[channel / 16];
        text += digits[channel % 16];
    }
    return text;
}

double DisplayColour::luminance() const
{
    return 0.2126 * decode(rgb[0] / 255.0) + 0.7152 * decode(rgb[1] / 255.0) + 0.0722 * decode(rgb[2] / 255.0);
}

DisplayColour srgbOfXYZ(const Triple& XYZ)
{
    static const Matrix matrix = displayMatrix();
    const Triple linear = apply(matrix, {XYZ[0] / 100.0, XYZ[1] / 100.0, XYZ[2] / 100.0});
    DisplayColour colour;
    for (size_t i = 0; i < 3; ++i) {
        // A colour that is not finite shows as black, marked as clipped.
        const double value = std::round(255.0 * encode(linear[i]));
        const bool inside = value >= 0.0 && value <= 255.0;
        colour.clipped = colour.clipped || !inside;
        colour.rgb[i] = inside ? static_cast<int>(value) : value > 255.0 ? 255 : 0;
    }
    return colour;
}

} // namespace veltmarquist
