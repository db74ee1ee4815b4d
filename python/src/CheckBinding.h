// Model.check and its CheckResult: the model's predictions against the
// combinations a file measured, with the summary the tool prints.
#ifndef VELTMARQUIST_PYTHON_CHECKBINDING_H
#define VELTMARQUIST_PYTHON_CHECKBINDING_H

#include <pybind11/pybind11.h>

namespace veltmarquist::python {

namespace py = pybind11;

struct Model;

// The check of `model` on `measurements` (Measurements, a path, or None for
// the form's own file).
py::object checkModel(const Model& model, const py::handle& measurements);

void bindCheck(py::module_& module);

} // namespace veltmarquist::python

#endif // VELTMARQUIST_PYTHON_CHECKBINDING_H
