// numpy arrays in and out of the module, and text from files as Python str.
#ifndef VELTMARQUIST_PYTHON_ARRAYS_H
#define VELTMARQUIST_PYTHON_ARRAYS_H

#include <pybind11/numpy.h>
#include <pybind11/pybind11.h>

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace veltmarquist::python {

namespace py = pybind11;

// Any array-like of numbers as C-ordered doubles.
using Doubles = py::array_t<double, py::array::c_style | py::array::forcecast>;

// Rows of `columns` values from an array whose last axis has that length:
// one row (shape (columns,)), N rows (N, columns) or more leading axes. The
// results of a row-wise function take the same leading axes.
//
// Only numbers are taken: integers and floats, as Python numbers, lists or
// numpy arrays. Strings, bools, complex numbers, None and objects raise
// TypeError naming `what`, as NumPy would otherwise turn them into numbers
// without a word.
class Rows {
public:
    // Throws TypeError naming `what` for values that are not numbers,
    // ValueError for another last axis.
    Rows(const py::handle& array, std::size_t columns, const char* what);
    std::size_t count() const { return count_; }
    bool single() const { return leading_.empty(); } // one row without a first axis
    const double* data() const { return values_.data(); }
    const double* row(std::size_t index) const { return values_.data() + index * columns_; }
    // An array of `columns` doubles per row in the shape of these rows.
    py::array_t<double> shaped(std::vector<double> values, std::size_t columns) const;
    // A new, unfilled array of `columns` doubles per row in the shape of these rows.
    py::array_t<double> allocate(std::size_t columns) const;

private:
    std::vector<double> values_;
    std::vector<py::ssize_t> leading_;
    std::size_t columns_ = 0, count_ = 0;
};

// Arguments checked by their type, with TypeError naming `what`: a bool is
// no number and a number no flag, a str no path list and None no text.
// - a file path: str, bytes or os.PathLike, as the file system's bytes;
std::string pathOf(const py::handle& given, const char* what);
// - a str;
std::string textOf(const py::handle& given, const char* what);
// - an int or float (no bool), or None when `optional`;
std::optional<double> numberOf(const py::handle& given, const char* what, bool optional = true);
// - a bool (numpy's bool too).
bool flagOf(const py::handle& given, const char* what);

// A rows x columns array that owns `values` (no copy), read-only.
py::array_t<double> matrix(std::vector<double> values, std::size_t rows, std::size_t columns);
py::array_t<double> vector(std::vector<double> values);

// Text from a file or the library as str: bytes that are not UTF-8 are kept
// as \xHH escapes instead of failing.
py::str text(const std::string& bytes);

} // namespace veltmarquist::python

#endif // VELTMARQUIST_PYTHON_ARRAYS_H
