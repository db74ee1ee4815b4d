// Measurement files as arrays.
#include "Bindings.h"

#include "Arrays.h"

#include "LibraryBlock.h"
#include "MeasurementLoading.h"

#include "models/PrintModels.h"

#include <pybind11/stl.h>

namespace veltmarquist::python {

namespace {

// The arrays of a file already read.
std::shared_ptr<Measurements> arraysOf(std::string path, MeasurementFile file)
{
    auto measurements = std::make_shared<Measurements>();
    measurements->path = std::move(path);
    measurements->file = std::move(file);
    const MeasurementFile& read = measurements->file;
    const std::size_t sets = read.sets.size(), channels = read.deviceFields.size();
    std::vector<double> device, XYZ;
    for (const MeasurementSet& set : read.sets) {
        const std::vector<double> percent = set.devicePercent();
        device.insert(device.end(), percent.begin(), percent.end());
        XYZ.insert(XYZ.end(), set.XYZ.begin(), set.XYZ.end());
    }
    measurements->device = matrix(std::move(device), sets, channels);
    measurements->XYZ = read.hasXYZ ? py::object(matrix(std::move(XYZ), sets, 3)) : py::none();
    measurements->spectra = py::none();
    if (read.layout.present()) {
        // The 36 bands the library makes of each set: what it computes with.
        std::vector<double> spectra;
        for (const MeasurementSet& set : read.sets) {
            const std::vector<int> thousandths = thousandthsOf(set);
            const std::vector<double> bands = libraryBands({&read.layout, &thousandths});
            spectra.insert(spectra.end(), bands.begin(), bands.end());
        }
        measurements->spectra = matrix(std::move(spectra), sets, kSpectrumBands);
    }
    return measurements;
}

std::shared_ptr<Measurements> readMeasurements(const std::string& path, std::optional<double> scale)
{
    const ReadOptions options = readOptions(scale);
    MeasurementFile file;
    {
        py::gil_scoped_release released;
        file = loadMeasurementFile(path, options);
    }
    return arraysOf(path, std::move(file));
}

// ---- Pickling: the file as read, every value exact ------------------------------------------

py::tuple layoutState(const SpectralLayout& layout)
{
    return py::make_tuple(layout.firstNm, layout.stepNm, layout.bands);
}

SpectralLayout layoutOf(const py::handle& state)
{
    const py::tuple values = state.cast<py::tuple>();
    return SpectralLayout{values[0].cast<int>(), values[1].cast<int>(), values[2].cast<int>()};
}

py::tuple stateOf(const Measurements& m)
{
    const MeasurementFile& file = m.file;
    py::list sets;
    for (const MeasurementSet& set : file.sets)
        sets.append(py::make_tuple(set.line, py::bytes(set.id), py::bytes(set.name), set.device, set.reflectance,
                                   set.XYZ));
    std::vector<std::pair<py::bytes, py::bytes>> keywords;
    for (const auto& [name, value] : file.keywords)
        keywords.emplace_back(py::bytes(name), py::bytes(value));
    const auto bytesOf = [](const std::vector<std::string>& texts) {
        py::list list;
        for (const std::string& text : texts)
            list.append(py::bytes(text));
        return list;
    };
    return py::make_tuple(py::bytes(m.path), py::bytes(file.fileType), keywords, bytesOf(file.fields),
                          bytesOf(file.deviceFields), layoutState(file.fileLayout), layoutState(file.layout),
                          file.scale, file.scaleDetected, file.hasXYZ, sets, bytesOf(file.warnings));
}

std::shared_ptr<Measurements> fromState(const py::tuple& state)
{
    if (state.size() != 12)
        throw py::value_error("not a pickled Measurements");
    const auto texts = [](const py::handle& list) {
        std::vector<std::string> out;
        for (const py::handle item : list)
            out.push_back(item.cast<std::string>());
        return out;
    };
    MeasurementFile file;
    file.fileType = state[1].cast<std::string>();
    for (const py::handle pair : state[2])
        file.keywords.emplace_back(pair.cast<py::tuple>()[0].cast<std::string>(),
                                   pair.cast<py::tuple>()[1].cast<std::string>());
    file.fields = texts(state[3]);
    file.deviceFields = texts(state[4]);
    file.fileLayout = layoutOf(state[5]);
    file.layout = layoutOf(state[6]);
    file.scale = state[7].cast<double>();
    file.scaleDetected = state[8].cast<bool>();
    file.hasXYZ = state[9].cast<bool>();
    for (const py::handle item : state[10]) {
        const py::tuple values = item.cast<py::tuple>();
        MeasurementSet set;
        set.line = values[0].cast<int>();
        set.id = values[1].cast<std::string>();
        set.name = values[2].cast<std::string>();
        set.device = values[3].cast<std::vector<std::int32_t>>();
        set.reflectance = values[4].cast<std::vector<std::int32_t>>();
        set.XYZ = values[5].cast<std::array<double, 3>>();
        file.sets.push_back(std::move(set));
    }
    file.warnings = texts(state[11]);
    return arraysOf(state[0].cast<std::string>(), std::move(file));
}

py::list texts(const MeasurementFile& file, std::string MeasurementSet::*member)
{
    py::list list;
    for (const MeasurementSet& set : file.sets)
        list.append(text(set.*member));
    return list;
}

py::list texts(const std::vector<std::string>& lines, const std::string& prefix = "")
{
    py::list list;
    for (const std::string& line : lines)
        list.append(text(prefix + line));
    return list;
}

} // namespace

ReadOptions readOptions(std::optional<double> scale)
{
    ReadOptions options;
    if (scale && *scale != 1.0 && *scale != 100.0)
        throw py::value_error("scale must be None (detect it), 1 or 100");
    options.scale = scale.value_or(0.0);
    return options;
}

std::optional<double> scaleOf(const py::handle& given)
{
    return numberOf(given, "scale");
}

std::shared_ptr<Measurements> measurementsOf(const py::handle& given, std::optional<double> scale, const char* what)
{
    if (py::isinstance<Measurements>(given)) {
        if (scale)
            throw py::value_error("scale applies to a file read from a path, not to Measurements already read");
        return given.cast<std::shared_ptr<Measurements>>();
    }
    if (!py::isinstance<py::str>(given) && !py::isinstance<py::bytes>(given) &&
        !py::isinstance(given, py::module_::import("os").attr("PathLike")))
        throw py::type_error(std::string(what) + " must be Measurements or a path (str or os.PathLike), not " +
                             std::string(py::str(py::type::handle_of(given).attr("__name__"))));
    return readMeasurements(pathOf(given, what), scale);
}

void bindMeasurements(py::module_& module)
{
    py::class_<Measurements, std::shared_ptr<Measurements>>(module, "Measurements", R"(
A measurement file as the veltmarquist tool reads it: any CGATS / IT8 dialect,
any patch order, spectra resampled to the library's 36 bands.

Every set of the file is one row, in file order (repeats are not averaged
here; fit() and check() average them where they build a form). Read one with
read_measurements().)")
        .def_readonly("path", &Measurements::path, "The path the file was read from.")
        .def_readonly("device", &Measurements::device,
                      "Device values in percent, float64, one row per set and one column per device field.")
        .def_readonly("spectra", &Measurements::spectra,
                      "Reflectance factors (0-1) at 380, 390, ..., 730 nm, float64 N x 36: the bands the "
                      "library computes with (thousandths). None for a file without spectral fields.")
        .def_readonly("xyz", &Measurements::XYZ, "XYZ_X, XYZ_Y, XYZ_Z as the file holds them, or None.")
        .def_property_readonly(
            "wavelengths", [](const Measurements&) {
                std::vector<double> nm;
                for (int band = 0; band < kSpectrumBands; ++band)
                    nm.push_back(380.0 + 10.0 * band);
                return vector(std::move(nm));
            },
            "The wavelengths of the spectra's columns in nm: 380, 390, ..., 730.")
        .def_property_readonly(
            "sample_ids", [](const Measurements& m) { return texts(m.file, &MeasurementSet::id); },
            "SAMPLE_ID of each set (else its SAMPLE_NAME, else '').")
        .def_property_readonly(
            "sample_names", [](const Measurements& m) { return texts(m.file, &MeasurementSet::name); },
            "SAMPLE_NAME of each set ('' when the file has none).")
        .def_property_readonly(
            "keywords",
            [](const Measurements& m) {
                py::dict keywords;
                for (const auto& [name, value] : m.file.keywords)
                    if (!keywords.contains(text(name)))
                        keywords[text(name)] = text(value);
                return keywords;
            },
            "The header keywords and their values, in file order (the first of repeated keywords).")
        .def_property_readonly(
            "device_fields", [](const Measurements& m) { return texts(m.file.deviceFields); },
            "The device fields, CMYK_C ... CMYK_K or nCLR_1 ... nCLR_n.")
        .def_property_readonly(
            "warnings", [](const Measurements& m) { return texts(m.file.warnings, m.path + ": "); },
            "The reader's and the paper's warnings, one line each, as the tool prints them.")
        .def_property_readonly(
            "scale", [](const Measurements& m) { return m.file.scale; },
            "What the file's reflectance was divided by: 1 (0-1 scale) or 100 (percent).")
        .def_property_readonly(
            "spectral_layout", [](const Measurements& m) { return text(m.file.describeSpectra()); },
            "The file's spectral fields as the tool describes them.")
        .def("__len__", [](const Measurements& m) { return m.file.sets.size(); })
        .def(py::pickle([](const Measurements& m) { return stateOf(m); },
                        [](const py::tuple& state) { return fromState(state); }))
        .def("__repr__", [](const Measurements& m) {
            return text("<veltmarquist.Measurements " + m.path + ": " + std::to_string(m.file.sets.size()) +
                        " sets, " + m.file.describeSpectra() + ">");
        });

    module.def(
        "read_measurements",
        [](const py::object& path, const py::object& scale) {
            return readMeasurements(pathOf(path, "path"), scaleOf(scale));
        },
        py::arg("path"), py::arg("scale") = py::none(), R"(
Reads a measurement file as the veltmarquist tool reads it.

scale: None decides the reflectance scale from the paper and the bulk of the
values; 1 or 100 fixes it (refused when the file contradicts it).

Raises MissingFileError / UnreadableFileError (OSError), FileFormatError,
ContentError or DuplicatePatchError (ValueError) with the tool's one-line
message naming the file and line; TypeError for a path that is no str or
os.PathLike, or a scale that is no number.

Measurements pickle (the file as read travels, not its path) and deep-copy.)");
}

} // namespace veltmarquist::python
