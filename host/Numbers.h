// Numbers as text: the one formatter of the host tier and the front ends.
//
// Every function gives the same text in every locale (a host such as Python
// may set a decimal-comma locale) and never "-0".
#ifndef VELTMARQUIST_HOST_NUMBERS_H
#define VELTMARQUIST_HOST_NUMBERS_H

#include <string>

namespace veltmarquist {

// The shortest text that reads back as the same double ("0.1",
// "33.333333333333336", "1e-07"): for files that other programs read.
std::string roundTripText(double value);
// `decimals` digits after the point ("12.30"): for people.
std::string fixedText(double value, int decimals);
// The same with a sign: "+1.5", "-0.3", and "0.0" for a value that rounds to zero.
std::string signedFixedText(double value, int decimals);
// Six significant digits without trailing zeros, as printf's %g ("0.95", "272", "1e+06").
std::string shortText(double value);

} // namespace veltmarquist

#endif // VELTMARQUIST_HOST_NUMBERS_H
