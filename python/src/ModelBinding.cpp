// Fitting, predicting and charting.
#include "Bindings.h"

#include "Arrays.h"

#include "ChartExport.h"
#include "Failure.h"
#include "FourColourForm.h"
#include "OutputFile.h"
#include "ParallelPrediction.h"
#include "PrintProfile.h"

#include <pybind11/stl.h>

#include <algorithm>
#include <cctype>
#include <optional>
#include <stdexcept>
#include <string>

namespace veltmarquist::python {

namespace {

// "gray difference factor (C, M, Y, K)" -> "gray_difference_factor": the
// words before the parenthesis, lower case, joined by underscores.
std::string attributeName(const std::string& name)
{
    std::string attribute;
    for (char c : name.substr(0, name.find(" ("))) {
        if (std::isalnum(static_cast<unsigned char>(c)))
            attribute += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        else if (!attribute.empty() && attribute.back() != '_')
            attribute += '_';
    }
    while (!attribute.empty() && attribute.back() == '_')
        attribute.pop_back();
    if (attribute == "full_correction_at_other_inks_coverage")
        return "full_correction";
    if (attribute == "grey_de_ab")
        return "grey_delta_e_ab";
    return attribute;
}

py::object valueOf(const FittedValue& value)
{
    if (value.numbers.empty())
        return text(value.text);
    if (value.numbers.size() == 1)
        return py::float_(value.numbers[0]);
    return vector(value.numbers);
}

// The one choice model= and the older fit_gravure= make.
ModelChoice chosenModel(const std::optional<std::string>& name, bool fitGravure)
{
    const std::optional<ModelChoice> choice = name ? modelChoiceNamed(*name) : ModelChoice::offset;
    if (!choice)
        throw HostError(Failure::Usage, "unknown model '" + *name + "'; models: " + modelChoiceNames());
    if (!fitGravure)
        return *choice;
    if (name && *choice != ModelChoice::gravure && *choice != ModelChoice::gravureFitted)
        throw HostError(Failure::Usage, "fit_gravure fits the gravure model; it cannot go with model='" + *name + "'");
    return ModelChoice::gravureFitted;
}

Model fitModel(const py::object& given, const py::object& modelGiven, const py::object& fitGravure,
               const py::object& scale)
{
    const std::optional<std::string> name =
        modelGiven.is_none() ? std::nullopt : std::optional<std::string>(textOf(modelGiven, "model"));
    const ModelChoice choice = chosenModel(name, flagOf(fitGravure, "fit_gravure"));
    Model model;
    const std::shared_ptr<Measurements> measurements = measurementsOf(given, scaleOf(scale), "form");
    model.form = py::cast(measurements);
    {
        py::gil_scoped_release released;
        auto found = std::make_shared<FoundForm>(findTestForm(measurements->file, measurements->path));
        model.fit = veltmarquist::fitModel(*found, choice);
        model.found = std::move(found);
    }
    py::list warnings;
    for (const FittedValue& value : model.fit.model->fittedValues()) {
        if (value.name == "warning") {
            warnings.append(text(value.text));
            continue;
        }
        model.values[text(value.name)] = valueOf(value);
        model.attributes[text(attributeName(value.name))] = valueOf(value);
    }
    model.attributes["warnings"] = warnings;
    return model;
}

// Coverages are percent; coverages that all lie within 0..1 (and are not all
// zero) were most likely given as fractions: a warning says so, as 0.4 % is
// a coverage too.
void warnAboutFractions(const Rows& rows)
{
    const double* first = rows.data();
    const double* last = first + 4 * rows.count();
    if (rows.count() == 0 || !std::all_of(first, last, [](double c) { return c >= 0.0 && c <= 1.0; }) ||
        std::all_of(first, last, [](double c) { return c == 0.0; }))
        return;
    const py::object warning = py::module_::import("veltmarquist._errors").attr("CoverageScaleWarning");
    if (PyErr_WarnEx(warning.ptr(),
                     "every coverage lies within 0-1, but coverages are percent (100 is a solid): multiply "
                     "fractions by 100",
                     2) != 0)
        throw py::error_already_set();
}

py::tuple predict(const Model& model, const py::object& cmyk)
{
    const py::object prediction = py::module_::import("veltmarquist._results").attr("Prediction");
    const Rows rows(cmyk, 4, "cmyk");
    warnAboutFractions(rows);
    // Predicted straight into the arrays handed back, without the GIL, on every core.
    py::array_t<double> spectra = rows.allocate(kSpectrumBands), XYZ = rows.allocate(3), Lab = rows.allocate(3);
    double *spectraData = spectra.mutable_data(), *XYZData = XYZ.mutable_data(), *LabData = Lab.mutable_data();
    try {
        py::gil_scoped_release released;
        predictInParallel(*model.fit.model, rows.count(), rows.data(), spectraData, XYZData, LabData);
    } catch (const std::invalid_argument& refusal) {
        // One coverage was given: its refusal needs no patch number.
        const std::string message = refusal.what(), patch = "patch 0: ";
        throw py::value_error(rows.single() && message.rfind(patch, 0) == 0
                                  ? message.substr(patch.size())
                                  : message);
    }
    return prediction(spectra, XYZ, Lab);
}

std::size_t writeChart(const Model& model, const py::object& pathGiven, const py::object& layoutGiven,
                       const py::object& format, const py::object& spectral, const py::object& inkLimit,
                       const py::object& blackLimit, const py::object& created)
{
    const std::string path = pathOf(pathGiven, "path"), layoutName = pathOf(layoutGiven, "layout");
    exporting::ExportOptions options;
    options.format = exporting::chartFormatNamed(textOf(format, "format"));
    options.spectral = flagOf(spectral, "spectral");
    options.inkLimit = numberOf(inkLimit, "ink_limit");
    options.blackLimit = numberOf(blackLimit, "black_limit");
    options.created = created.is_none() ? "" : textOf(created, "created");
    py::gil_scoped_release released;
    exporting::checkOptions(options);
    // The form's own file and the layout file are never overwritten.
    refuseClashingOutputs({model.found->path, exporting::isGeneratedLayout(layoutName) ? "" : layoutName}, {path});
    const exporting::PatchLayout layout = exporting::readLayout(layoutName);
    PendingOutput output(path);
    output.writeStreamed([&](std::ostream& out) {
        exporting::exportChart(*model.fit.model, exporting::provenanceOf(model.found->file, model.found->path), layout,
                               options, out);
    });
    output.commit();
    return layout.size();
}

py::object writeProfile(const Model& model, const py::object& pathGiven, const py::object& inkLimit,
                        const py::object& blackLimit, const py::object& black, const py::object& blackStart,
                        const py::object& blackAmount, const py::object& blackShape, const py::object& blackFixed,
                        const py::object& grid, const py::object& b2aGrid, const py::object& iccVersion,
                        const py::object& description, const py::object& copyright)
{
    const py::object result = py::module_::import("veltmarquist._results").attr("Profile");
    const std::string path = pathOf(pathGiven, "path");
    profile::ProfileOptions options;
    options.inkLimit = *numberOf(inkLimit, "ink_limit", false);
    options.blackLimit = *numberOf(blackLimit, "black_limit", false);
    const std::string preset = textOf(black, "black");
    const std::optional<profile::BlackGeneration> named = profile::blackGenerationNamed(preset);
    if (!named)
        throw HostError(Failure::Usage, "unknown black generation '" + preset + "'; presets: " +
                                            profile::blackGenerationNames());
    options.black = *named;
    const std::optional<double> start = numberOf(blackStart, "black_start"), amount = numberOf(blackAmount, "black_amount"),
                                shape = numberOf(blackShape, "black_shape");
    if (start || amount || shape)
        options.black.name = "custom, from " + preset;
    options.black.start = start.value_or(options.black.start);
    options.black.amount = amount.value_or(options.black.amount);
    options.black.shape = shape.value_or(options.black.shape);
    options.black.fixed = options.black.fixed || flagOf(blackFixed, "black_fixed");
    const auto whole = [](const py::object& given, const char* what) -> std::optional<int> {
        if (given.is_none())
            return std::nullopt;
        if (!py::isinstance<py::int_>(given) || py::isinstance<py::bool_>(given))
            throw py::type_error(std::string(what) + " must be an int");
        return given.cast<int>();
    };
    options.a2bNodes = whole(grid, "grid");
    options.b2aNodes = *whole(b2aGrid, "b2a_grid");
    const std::optional<int> version = whole(iccVersion, "icc_version");
    if (*version != 2 && *version != 4)
        throw HostError(Failure::Usage, "icc_version " + std::to_string(*version) + ": 2 (2.4) or 4 (4.3)");
    options.version = *version == 4 ? profile::IccVersion::v4 : profile::IccVersion::v2;
    options.description = description.is_none() ? "" : textOf(description, "description");
    options.copyright = copyright.is_none() ? "" : textOf(copyright, "copyright");
    profile::ProfileSummary summary;
    {
        py::gil_scoped_release released;
        refuseClashingOutputs({model.found->path}, {path});
        PendingOutput output(path);
        output.writeBytes(profile::printProfile(model.fit, *model.found, options, summary));
        output.commit();
    }
    return result(text(summary.description), vector(summary.a2bLevels), summary.b2aNodes, summary.b2aCount,
                  summary.outOfGamut, summary.darkestL, summary.bytes);
}

} // namespace

void bindModel(py::module_& module)
{
    py::class_<Model, std::shared_ptr<Model>>(module, "Model", R"(
A four-colour print model fitted to the 46-patch test form of a measurement
file, as the tool's chart command fits it. Immutable: predict() may run in
several threads at once (it releases the GIL).

Each fitted value is an attribute (gray_difference_factor, full_correction;
ink_order, trapping_factors; yule_nielsen_n, ink_spreading, dot_area_c ...,
tint_residual_rms, grey_delta_e_ab, warnings) and an entry of fitted_values
under the library's name. Make one with fit().)")
        .def_property_readonly(
            "name", [](const Model& m) { return std::string(nameOf(m.fit.choice)); },
            "The model chosen: 'offset', 'gravure', 'gravure-fitted' or 'ynsn'.")
        .def_readonly("form", &Model::form, "The Measurements the model was fitted to.")
        .def_readonly("fitted_values", &Model::values, "The fitted values under the library's names.")
        .def_property_readonly(
            "levels",
            [](const Model& m) -> py::object {
                if (m.fit.model->levels().empty())
                    return py::none();
                return vector(m.fit.model->levels());
            },
            "The coverages (the same for each ink) the model predicts, or None for every coverage 0-100 %.")
        .def("predict", &predict, py::arg("cmyk"), R"(
Predicts coverages: cmyk is one row (C, M, Y, K in percent) or an N x 4 array.

Returns Prediction(spectra, xyz, lab): reflectance at 380-730 nm (N x 36),
XYZ (D50, 2 degree, 0-100, Y not limited) and the library's CIELAB (N x 3);
one row gives arrays without the first axis. A coverage that is not finite,
lies outside 0-100 % or (offset and gravure) is none of the form's levels
raises ValueError, and nothing is predicted. Coverages must be numbers:
strings, bools, complex numbers and None raise TypeError.

Coverages are percent. When every coverage lies within 0-1 (and not all are
0) they were most likely fractions: predict() then warns with
CoverageScaleWarning and predicts them as the percentages given (0.4 is a
0.4 % tint). Turn the warning into an error with
warnings.simplefilter("error", veltmarquist.CoverageScaleWarning).)")
        .def("chart", &writeChart, py::arg("path"), py::arg("layout") = "chart", py::arg("format") = "library",
             py::arg("spectral") = false, py::arg("ink_limit") = py::none(), py::arg("black_limit") = py::none(),
             py::arg("created") = py::none(),
             R"(
Writes a chart as the tool's chart command writes it, byte for byte, and
atomically (a temporary file beside it, renamed when complete).

layout: 'chart' (the library's 900 patches), 'grid', 'grid:N' or the path of
a CGATS file whose C, M, Y, K to predict. format: 'library', 'cti3' or
'cgats'. spectral adds the 36 bands and ink_limit writes TOTAL_INK_LIMIT
(cti3 and cgats; 100 to 400 %), black_limit BLACK_INK_LIMIT (0 to 100 %);
the file names TARGET_INSTRUMENT for the builder. created replaces the CREATED time (else the
clock, or SOURCE_DATE_EPOCH). Returns the number of patches written. The
form's own file and the layout file are never written over (UsageError).)")
        .def("profile", &writeProfile, py::arg("path"), py::kw_only(), py::arg("ink_limit") = 300.0,
             py::arg("black_limit") = 95.0, py::arg("black") = "heavy", py::arg("black_start") = py::none(),
             py::arg("black_amount") = py::none(), py::arg("black_shape") = py::none(), py::arg("black_fixed") = false,
             py::arg("grid") = py::none(), py::arg("b2a_grid") = 33, py::arg("icc_version") = 2,
             py::arg("description") = py::none(), py::arg("copyright") = py::none(), R"(
Writes an ICC output profile of the press, as the tool's profile command
writes it, byte for byte, and atomically.

A2B0-2 from this model on a grid of `grid` nodes per ink (17; the offset and
gravure models: the form's 9 levels), B2A0-2 inverted from that table within
ink_limit (total, percent) and black_limit (K, percent), with the black
generation `black` ('none', 'light', 'medium', 'heavy', 'maximum', 'ucr'),
adjusted by black_start, black_amount (0-1) and black_shape, and held fixed
on its curve with black_fixed=True; b2a_grid nodes per Lab axis (odd).
icc_version 2 writes version 2.4, 4 version 4.3. Returns Profile(description,
a2b_levels, b2a_nodes, b2a_count, out_of_gamut, darkest_lightness, bytes).)")
        .def("check", &checkModel, py::arg("measurements") = py::none(), R"(
Checks the model against every combination a file measured beyond the test
form that the model predicts (by default the form's own file), as the tool's
chart command checks it: the offset and gravure models on the combinations
whose coverages are all on the form's levels, the Yule-Nielsen model on every
combination. Returns a CheckResult; str() of it is the tool's summary, with
what was left out and why.)")
        .def("__getattr__",
             [](const Model& m, const std::string& name) -> py::object {
                 if (!m.attributes.contains(name))
                     throw py::attribute_error("'Model' object has no attribute '" + name + "'");
                 return m.attributes[py::str(name)];
             })
        .def("__dir__",
             [](py::object self) {
                 py::list names = py::module_::import("builtins").attr("object").attr("__dir__")(self);
                 for (const auto& item : self.cast<const Model&>().attributes)
                     names.append(item.first);
                 return names;
             })
        .def("__repr__",
             [](const Model& m) {
                 return text("<veltmarquist.Model " + std::string(nameOf(m.fit.choice)) + " fitted to " +
                             m.found->path + ">");
             })
        // A pickled model is its form and its choice: the fit is exact and
        // repeatable, so the model is fitted again where it is unpickled.
        .def(py::pickle(
            [](const Model& m) { return py::make_tuple(m.form, std::string(nameOf(m.fit.choice))); },
            [](const py::tuple& state) {
                if (state.size() != 2)
                    throw py::value_error("not a pickled Model");
                return fitModel(state[0], state[1], py::bool_(false), py::none());
            }));

    module.def("fit", &fitModel, py::arg("form"), py::arg("model") = py::none(), py::arg("fit_gravure") = false,
               py::arg("scale") = py::none(), R"(
Fits a print model to the test form in a measurement file.

form: Measurements or the path of a file; the 46 test-form patches are found
by their C, M, Y, K values in any order, repeats averaged. model: 'offset'
(the default: the library's offset model, fitted to the two greys),
'gravure' (default ink order and trapping factors), 'gravure-fitted' (both
fitted to red, green and blue) or 'ynsn' (Yule-Nielsen, predicts every
coverage), as the tool's --model. fit_gravure=True is the older spelling of
model='gravure-fitted'. scale: the reflectance scale when form is a path.

Raises the tool's errors: MissingPatchError naming every missing patch,
FileFormatError, ContentError, CalculationError, UsageError; TypeError for
arguments of the wrong type. Models pickle and deep-copy (the form travels
with them and the model is fitted again, to the same numbers).)");
}

} // namespace veltmarquist::python
