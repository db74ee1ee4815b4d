// The extension module veltmarquist._veltmarquist: the bindings, the host's
// failures as the package's exceptions, and the library's colorimetry on
// arrays.
#include "Arrays.h"
#include "Bindings.h"

#include "ColourDifference.h"
#include "Failure.h"

#include "models/PrintModels.h"

#include <exception>
#include <stdexcept>

namespace veltmarquist::python {

namespace {

void raise(Failure failure, const std::string& message)
{
    const py::str text = python::text(message);
    const py::object type =
        py::module_::import("veltmarquist._errors").attr("error_class")(exitCodeOf(failure), text);
    PyErr_SetObject(type.ptr(), text.ptr());
}

void translate(std::exception_ptr failure)
{
    try {
        std::rethrow_exception(failure);
    } catch (const HostError& error) {
        raise(error.failure(), error.what());
    } catch (const std::domain_error& error) {
        // A model's result that is no colour: the library refuses to hand it over.
        raise(Failure::Calculation, error.what());
    }
}

// A row-wise function of the library's colorimetry on an array.
template <std::size_t in, std::size_t out, typename Function>
py::array_t<double> rowWise(const py::object& values, const char* what, Function function)
{
    const Rows rows(values, in, what);
    std::vector<double> results(rows.count() * out);
    {
        py::gil_scoped_release released;
        for (std::size_t row = 0; row < rows.count(); ++row)
            function(rows.row(row), &results[row * out]);
    }
    return rows.shaped(std::move(results), out);
}

py::array_t<double> spectraToXYZ(const py::object& spectra)
{
    return rowWise<kSpectrumBands, 3>(spectra, "spectra", [](const double* bands, double* XYZ) {
        Spectrum spectrum;
        std::copy_n(bands, kSpectrumBands, spectrum.begin());
        const Triple result = spectrumToXYZ(spectrum);
        std::copy(result.begin(), result.end(), XYZ);
    });
}

template <Triple (*convert)(const Triple&)>
py::array_t<double> tripleWise(const py::object& values, const char* what)
{
    return rowWise<3, 3>(values, what, [](const double* given, double* result) {
        const Triple triple = convert({given[0], given[1], given[2]});
        std::copy(triple.begin(), triple.end(), result);
    });
}

// A colour difference between CIELAB rows of two arrays that broadcast
// against each other; one pair gives a float.
template <double (*difference)(const Lab&, const Lab&)>
py::object pairWise(const py::object& first, const py::object& second)
{
    const py::object numpy = py::module_::import("numpy");
    const py::tuple both = numpy.attr("broadcast_arrays")(numpy.attr("asarray")(first, "float64"),
                                                          numpy.attr("asarray")(second, "float64"));
    const Rows a(both[0], 3, "lab1"), b(both[1], 3, "lab2");
    std::vector<double> values(a.count());
    {
        py::gil_scoped_release released;
        for (std::size_t row = 0; row < a.count(); ++row) {
            const double *x = a.row(row), *y = b.row(row);
            values[row] = difference({x[0], x[1], x[2]}, {y[0], y[1], y[2]});
        }
    }
    const py::array result = a.shaped(std::move(values), 1).attr("squeeze")(-1);
    return result.ndim() == 0 ? py::object(result.attr("item")()) : py::object(result);
}

} // namespace

} // namespace veltmarquist::python

PYBIND11_MODULE(_veltmarquist, module)
{
    using namespace veltmarquist;
    using namespace veltmarquist::python;
    module.doc() = "The compiled part of the veltmarquist package; use the package itself.";
    py::register_exception_translator(&translate);
    bindMeasurements(module);
    bindCheck(module);
    bindModel(module);
    bindMultiChannel(module);
    bindConvert(module);
    bindConformance(module);

    module.def("spectra_to_xyz", &spectraToXYZ, py::arg("spectra"), R"(
X, Y, Z (D50, 2 degree, 0-100) of spectra (..., 36: reflectance 0-1 at
380-730 nm) as the library sums them; Y is not limited to 100.)");
    module.def(
        "xyz_to_lab", [](const py::object& XYZ) { return tripleWise<&XYZToLab>(XYZ, "xyz"); }, py::arg("xyz"), R"(
CIELAB of X, Y, Z (..., 3; 0-100) with the ICC D50 white and the library's
tabulated cube root: the CIELAB of Model.predict.)");
    module.def(
        "chart_xyz", [](const py::object& XYZ) { return tripleWise<&chartXYZ>(XYZ, "xyz"); }, py::arg("xyz"), R"(
X, Y, Z as the library's XYZ charts hold them: limited to Y = 100 (X and Z
scaled with Y), then cut toward minus infinity at two decimals.)");
    module.def("delta_e_2000", &pairWise<&deltaE2000>, py::arg("lab1"), py::arg("lab2"), R"(
CIEDE2000 (kL = kC = kH = 1) between CIELAB rows (..., 3), as the tool
computes it (LittleCMS). The two arrays broadcast; one pair gives a float.)");
    module.def("delta_e_ab", &pairWise<&deltaEab>, py::arg("lab1"), py::arg("lab2"),
               "CIE 1976 dE*ab between CIELAB rows (..., 3); the arrays broadcast, one pair gives a float.");
}
