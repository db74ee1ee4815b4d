// The parts of the extension module: each binds one component of the host
// tier to Python, and the objects they hand each other.
#ifndef VELTMARQUIST_PYTHON_BINDINGS_H
#define VELTMARQUIST_PYTHON_BINDINGS_H

#include "FourColourForm.h"
#include "MeasurementFile.h"
#include "TestForm.h"

#include <pybind11/pybind11.h>

#include <memory>
#include <optional>
#include <string>

namespace veltmarquist::python {

namespace py = pybind11;

// ---- read_measurements: a measurement file with its sets as numpy arrays ------------------

// One file as read: the reader's sets and the arrays made of them once.
struct Measurements {
    std::string path;
    MeasurementFile file;
    py::object device, spectra, XYZ; // read-only arrays; spectra and XYZ None when the file has none
};

// The reader's options from the scale argument: None detects, 1 or 100 fix it.
ReadOptions readOptions(std::optional<double> scale);
// The scale argument as given: None or a number (TypeError otherwise).
std::optional<double> scaleOf(const py::handle& given);
// A Measurements object as given, or the file at a path read with `scale`;
// TypeError naming `what` for anything else.
std::shared_ptr<Measurements> measurementsOf(const py::handle& given, std::optional<double> scale, const char* what);

void bindMeasurements(py::module_& module);

// ---- fit and Model: a print model fitted to a form, its predictions and charts -----------

struct Model {
    py::object form;                        // the Measurements the model was fitted to
    std::shared_ptr<const FoundForm> found; // its test form, repeats averaged
    FittedModel fit;
    py::dict values;                        // fitted value name -> number, array or text
    py::dict attributes;                    // the same under attribute names
};

void bindModel(py::module_& module);

// ---- Model.check: predictions against a file's measured combinations ----------------------

// The check of `model` on `measurements` (Measurements, a path, or None for
// the form's own file), as a CheckResult.
py::object checkModel(const Model& model, const py::object& measurements);

void bindCheck(py::module_& module);

// ---- multichannel_chart: the six- and seven-colour charts and the separated set ----------

void bindMultiChannel(py::module_& module);

// ---- convert_chart: a measured chart moved between paper whites (processes 7, 8, 9) -------

void bindConvert(py::module_& module);

// ---- conformance: the press against a reference printing condition -------------------------

void bindConformance(py::module_& module);

} // namespace veltmarquist::python

#endif // VELTMARQUIST_PYTHON_BINDINGS_H
