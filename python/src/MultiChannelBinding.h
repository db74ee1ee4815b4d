// The six- and seven-colour workflow on arrays: multichannel_chart writes
// the spectral chart (process 3 or 5) and gives the 3499 extended C, M, Y, K
// combinations; MultiChannelChart.separated_chart takes the separation
// software's answer as an array and writes the XYZ chart (process 6) on the
// same profile.
#ifndef VELTMARQUIST_PYTHON_MULTICHANNELBINDING_H
#define VELTMARQUIST_PYTHON_MULTICHANNELBINDING_H

#include <pybind11/pybind11.h>

namespace veltmarquist::python {

namespace py = pybind11;

void bindMultiChannel(py::module_& module);

} // namespace veltmarquist::python

#endif // VELTMARQUIST_PYTHON_MULTICHANNELBINDING_H
