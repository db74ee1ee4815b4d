// read_measurements and the Measurements class: a measurement file as the
// tool reads it, with its sets as numpy arrays.
#ifndef VELTMARQUIST_PYTHON_MEASUREMENTSBINDING_H
#define VELTMARQUIST_PYTHON_MEASUREMENTSBINDING_H

#include "MeasurementFile.h"

#include <pybind11/pybind11.h>

#include <memory>
#include <optional>
#include <string>

namespace veltmarquist::python {

namespace py = pybind11;

// One file as read: the reader's sets and the arrays made of them once.
struct Measurements {
    std::string path;
    MeasurementFile file;
    py::object device, spectra, XYZ; // read-only arrays; spectra and XYZ None when the file has none
};

// The reader's options from the scale argument: None detects, 1 or 100 fix it.
ReadOptions readOptions(std::optional<double> scale);

// A Measurements object as given, or the file at a path read with `scale`.
std::shared_ptr<Measurements> measurementsOf(const py::handle& given, std::optional<double> scale);

void bindMeasurements(py::module_& module);

} // namespace veltmarquist::python

#endif // VELTMARQUIST_PYTHON_MEASUREMENTSBINDING_H
