// numpy arrays in and out, and file text as str.
#include "Arrays.h"

#include <cmath>
#include <utility>

namespace veltmarquist::python {

namespace {

std::string typeName(const py::handle& value)
{
    return py::str(py::type::handle_of(value).attr("__name__"));
}

} // namespace

Rows::Rows(const py::handle& array, std::size_t columns, const char* what) : columns_(columns)
{
    // Checked before NumPy converts anything: "40", True and 1j all become numbers there.
    const py::array given = py::module_::import("numpy").attr("asarray")(array);
    const char kind = given.dtype().kind();
    if (kind != 'i' && kind != 'u' && kind != 'f')
        throw py::type_error(std::string(what) + " must hold numbers (int or float), not " +
                             (given.ndim() == 0 ? typeName(array) : "values of dtype " + std::string(py::str(given.dtype()))));
    const Doubles values = Doubles::ensure(given);
    if (!values)
        throw py::value_error(std::string(what) + " must be an array of numbers");
    if (values.ndim() == 0 || static_cast<std::size_t>(values.shape(values.ndim() - 1)) != columns) {
        std::string shape;
        for (py::ssize_t axis = 0; axis < values.ndim(); ++axis)
            shape += (axis == 0 ? "" : ", ") + std::to_string(values.shape(axis));
        throw py::value_error(std::string(what) + " must hold " + std::to_string(columns) +
                              " values per row (shape (" + std::to_string(columns) + ",) or (N, " +
                              std::to_string(columns) + ")); it has shape (" + shape + ")");
    }
    leading_.assign(values.shape(), values.shape() + values.ndim() - 1);
    count_ = columns == 0 ? 0 : static_cast<std::size_t>(values.size()) / columns;
    values_.assign(values.data(), values.data() + values.size());
}

py::array_t<double> Rows::shaped(std::vector<double> values, std::size_t columns) const
{
    std::vector<py::ssize_t> shape = leading_;
    shape.push_back(static_cast<py::ssize_t>(columns));
    auto* owned = new std::vector<double>(std::move(values));
    py::capsule owner(owned, [](void* pointer) { delete static_cast<std::vector<double>*>(pointer); });
    return py::array_t<double>(shape, owned->data(), owner);
}

py::array_t<double> Rows::allocate(std::size_t columns) const
{
    std::vector<py::ssize_t> shape = leading_;
    shape.push_back(static_cast<py::ssize_t>(columns));
    return py::array_t<double>(shape);
}

std::string pathOf(const py::handle& given, const char* what)
{
    const py::module_ os = py::module_::import("os");
    if (!py::isinstance<py::str>(given) && !py::isinstance(given, os.attr("PathLike")) &&
        !py::isinstance<py::bytes>(given))
        throw py::type_error(std::string(what) + " must be a path (str or os.PathLike), not " + typeName(given));
    // The bytes the file system takes, whatever their encoding.
    return std::string(py::bytes(os.attr("fsencode")(given)));
}

std::string textOf(const py::handle& given, const char* what)
{
    if (!py::isinstance<py::str>(given))
        throw py::type_error(std::string(what) + " must be a str, not " + typeName(given));
    return given.cast<std::string>();
}

std::optional<double> numberOf(const py::handle& given, const char* what, bool optional)
{
    if (optional && given.is_none())
        return std::nullopt;
    const py::module_ numbers = py::module_::import("numbers");
    if (py::isinstance<py::bool_>(given) || py::isinstance(given, py::module_::import("numpy").attr("bool_")) ||
        !py::isinstance(given, numbers.attr("Real")))
        throw py::type_error(std::string(what) + " must be a number" + (optional ? " or None" : "") + ", not " +
                             typeName(given));
    return given.cast<double>();
}

bool flagOf(const py::handle& given, const char* what)
{
    if (!py::isinstance<py::bool_>(given) && !py::isinstance(given, py::module_::import("numpy").attr("bool_")))
        throw py::type_error(std::string(what) + " must be True or False, not " + typeName(given));
    return PyObject_IsTrue(given.ptr()) == 1;
}

py::array_t<double> matrix(std::vector<double> values, std::size_t rows, std::size_t columns)
{
    auto* owned = new std::vector<double>(std::move(values));
    py::capsule owner(owned, [](void* pointer) { delete static_cast<std::vector<double>*>(pointer); });
    py::array_t<double> array({static_cast<py::ssize_t>(rows), static_cast<py::ssize_t>(columns)}, owned->data(),
                              owner);
    py::detail::array_proxy(array.ptr())->flags &= ~py::detail::npy_api::NPY_ARRAY_WRITEABLE_;
    return array;
}

py::array_t<double> vector(std::vector<double> values)
{
    const std::size_t size = values.size();
    return matrix(std::move(values), 1, size).attr("reshape")(size).cast<py::array_t<double>>();
}

py::str text(const std::string& bytes)
{
    PyObject* decoded = PyUnicode_DecodeUTF8(bytes.data(), static_cast<py::ssize_t>(bytes.size()), "backslashreplace");
    if (decoded == nullptr)
        throw py::error_already_set();
    return py::reinterpret_steal<py::str>(decoded);
}

} // namespace veltmarquist::python
