// convert_chart: a measured chart held as arrays, copied, converted from one
// paper white to another or blended (processes 7, 8, 9).
#ifndef VELTMARQUIST_PYTHON_CONVERTBINDING_H
#define VELTMARQUIST_PYTHON_CONVERTBINDING_H

#include <pybind11/pybind11.h>

namespace veltmarquist::python {

namespace py = pybind11;

void bindConvert(py::module_& module);

} // namespace veltmarquist::python

#endif // VELTMARQUIST_PYTHON_CONVERTBINDING_H
