// fit() and the Model class: a print model fitted to the test form of a
// measurement file, predicting arrays and writing the tool's charts.
#ifndef VELTMARQUIST_PYTHON_MODELBINDING_H
#define VELTMARQUIST_PYTHON_MODELBINDING_H

#include "results/Results.h"

#include "TestForm.h"

#include <pybind11/pybind11.h>

#include <memory>

namespace veltmarquist::python {

namespace py = pybind11;

struct Model {
    py::object form;                        // the Measurements the model was fitted to
    std::shared_ptr<const FoundForm> found; // its test form, repeats averaged
    FittedModel fit;
    py::dict values;                        // fitted value name -> number, array or text
    py::dict attributes;                    // the same under attribute names
};

void bindModel(py::module_& module);

} // namespace veltmarquist::python

#endif // VELTMARQUIST_PYTHON_MODELBINDING_H
