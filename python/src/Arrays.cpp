// numpy arrays in and out, and file text as str.
#include "Arrays.h"

#include <cmath>
#include <utility>

namespace veltmarquist::python {

Rows::Rows(const py::handle& array, std::size_t columns, const char* what) : columns_(columns)
{
    const Doubles values = Doubles::ensure(array);
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
