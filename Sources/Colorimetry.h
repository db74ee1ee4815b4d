// The library's colorimetry as free functions on plain arrays, for code that
// has no profile at hand (the print models that return values). The profile's
// spec2XYZ, icc_f and XYZ2LAB call these, so both give the same bits.
// Internal to the library.
#ifndef VELTMARQUIST_COLORIMETRY_H
#define VELTMARQUIST_COLORIMETRY_H

namespace colorimetry {

// 100 / sum of the Y weights: the normFactor every profile starts with.
double defaultNormFactor();

// X, Y, Z (D50, 2 degree, 0..100 scale) of 36 bands from 380 nm:
// XYZ[i] = normFactor * sum_b spectrum[b] * weight[b][i], summed from 380 nm up.
void spectrumToXYZ(const double* spectrum, double normFactor, double* XYZ);

// CIELAB companding function with the library's tabulated cube root.
double iccF(double t);

// CIELAB (ICC D50 white) of X, Y, Z given on the 0..1 scale.
void XYZToLab(double X, double Y, double Z, double* Lab);

} // namespace colorimetry

#endif // VELTMARQUIST_COLORIMETRY_H
