// The orientation check of the four-colour test form, shared by the
// profile's readData and the measured form of the print models, so that both
// see the same rows. Internal to the library.
#ifndef VELTMARQUIST_FORMORIENTATION_H
#define VELTMARQUIST_FORMORIENTATION_H

namespace formorientation {

// True when the two halves of a form were read in swapped order. On a
// correctly read form row 0 is the cyan solid and row 24 yellow + black, row 1
// the paper and row 25 a 70 % magenta: both later rows are bluer (lower Z,
// computed with `normFactor`) than the earlier ones. When both are yellower,
// the halves were swapped.
bool readInSwappedHalves(const double* const* rows, double normFactor);

// Exchanges rows i and i + 24 for i = 0..22. A form of 46 rows has no row 46:
// the exchange stops at the first null row, so there row 22 stays.
void exchangeHalves(double* const* rows);

} // namespace formorientation

#endif // VELTMARQUIST_FORMORIENTATION_H
