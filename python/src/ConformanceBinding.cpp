// conformance: the form's control patches, tone values and whole gamut
// against a reference printing condition, as the tool's conformance command
// computes them (host/conformance), as plain Python values.
#include "Arrays.h"
#include "Bindings.h"
#include "Conformance.h"

#include <pybind11/stl.h>

namespace veltmarquist::python {

namespace {

py::list triple(double a, double b, double c)
{
    py::list values;
    values.append(a), values.append(b), values.append(c);
    return values;
}

py::dict summary(const Summary& s)
{
    py::dict out;
    out["count"] = s.count, out["mean"] = s.mean, out["p95"] = s.p95, out["max"] = s.max;
    return out;
}

py::dict conformanceOf(const py::object& form, const py::object& referenceGiven, const py::object& tolerancesGiven,
                       const py::object& anyCondition, const py::object& gamut, const py::object& scale)
{
    const std::shared_ptr<Measurements> measurements = measurementsOf(form, scaleOf(scale), "form");
    const std::string reference = pathOf(referenceGiven, "reference");
    const std::string tolerancesPath = tolerancesGiven.is_none() ? "" : pathOf(tolerancesGiven, "tolerances");
    const bool any = flagOf(anyCondition, "any_condition"), whole = flagOf(gamut, "gamut");
    std::optional<conformance::Reference> read;
    std::optional<conformance::ConformanceResult> result;
    std::vector<std::string> notes;
    {
        py::gil_scoped_release released;
        const conformance::Tolerances tolerances =
            tolerancesPath.empty() ? conformance::Tolerances{} : conformance::readTolerances(tolerancesPath);
        const FoundForm found = findTestForm(measurements->file, measurements->path);
        read = conformance::readReference(conformance::locateReference(reference));
        notes = conformance::checkConditions(found.file, *read, any);
        std::optional<FittedModel> fit;
        if (whole)
            fit = fitModel(found, ModelChoice::yuleNielsen);
        result = conformance::compare(found, *read, tolerances, fit ? fit->model.get() : nullptr);
    }
    py::dict out;
    out["verdict"] = result->pass() ? "PASS" : "FAIL";
    out["passed"] = result->pass();
    out["reference"] = read->path;
    out["conditions"] = notes;
    py::list controls;
    for (const conformance::ControlPatch& patch : result->controls) {
        py::dict item;
        item["name"] = patch.name;
        item["cmyk"] = std::vector<double>(patch.cmyk.begin(), patch.cmyk.end());
        item["measured_lab"] = triple(patch.measured.L, patch.measured.a, patch.measured.b);
        item["reference_lab"] = triple(patch.reference.L, patch.reference.a, patch.reference.b);
        item["delta_e_2000"] = patch.deltaE00;
        item["delta_e_ab"] = patch.deltaEab;
        item["delta_h_ab"] = patch.deltaH ? py::object(py::float_(*patch.deltaH)) : py::object(py::none());
        item["tolerance"] = patch.limit;
        item["tolerance_source"] = conformance::toleranceSource(patch.tolerance);
        item["passed"] = patch.pass;
        controls.append(item);
    }
    out["controls"] = controls;
    out["absent"] = result->absent;
    py::list tones;
    static const char* const inks[4] = {"C", "M", "Y", "K"};
    for (const conformance::ToneValuePoint& point : result->toneValues) {
        py::dict item;
        item["ink"] = inks[point.ink], item["tint"] = point.nominal, item["measured"] = point.measured;
        item["reference"] = point.reference, item["interpolated"] = point.interpolated;
        item["tolerance"] = point.limit, item["passed"] = point.pass;
        tones.append(item);
    }
    out["tone_value_increase"] = tones;
    if (result->gamut) {
        py::dict regions;
        for (const conformance::GamutRegion& region : result->gamut->regions)
            regions[py::str(region.name)] = summary(region.deltaE00);
        py::dict gamutOut;
        gamutOut["model"] = result->gamut->model;
        gamutOut["regions"] = regions;
        out["gamut"] = gamutOut;
    } else {
        out["gamut"] = py::none();
    }
    return out;
}

} // namespace

void bindConformance(py::module_& module)
{
    module.def("conformance", &conformanceOf, py::arg("form"), py::arg("reference"), py::kw_only(),
               py::arg("tolerances") = py::none(), py::arg("any_condition") = false, py::arg("gamut") = true,
               py::arg("scale") = py::none(), R"(
The form's control patches and tone value increase against a reference
printing condition, as the tool's conformance command computes them.

form: Measurements or a path. reference: a path of a CGATS/CTI3 file with
CMYK and LAB, XYZ or spectra, or the name of an installed one ("FOGRA39L").
tolerances: a tolerance file ('name value' per line). Forms and references
measured under different conditions raise UsageError unless any_condition.
Returns a dict: verdict ("PASS" or "FAIL"), passed, reference, conditions,
controls (name, cmyk, measured_lab, reference_lab, delta_e_2000, delta_e_ab,
delta_h_ab, tolerance, tolerance_source, passed), absent,
tone_value_increase (ink, tint, measured, reference, interpolated,
tolerance, passed) and gamut (model and CIEDE2000 summaries by region, or
None with gamut=False).)");
}

} // namespace veltmarquist::python
