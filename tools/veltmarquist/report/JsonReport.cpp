// The results of every command as one JSON object.
#include "JsonReport.h"

#include "Json.h"

namespace veltmarquist {

namespace {

using json::Writer;

void start(Writer& out, const char* command, bool ok)
{
    out.beginObject().field("schema_version", kJsonSchemaVersion).field("command", command).field("ok", ok);
}

void finish(Writer& out, std::ostream& stream)
{
    out.endObject();
    stream << out.text() << "\n";
}

void warnings(Writer& out, const std::vector<const FileWarnings*>& files)
{
    out.key("warnings").beginArray();
    for (const FileWarnings* file : files)
        for (const std::string& warning : file->warnings)
            out.beginObject().field("file", file->path).field("message", warning).endObject();
    out.endArray();
}

void file(Writer& out, const MeasurementFile& file)
{
    out.field("measurements", file.sets.size())
        .field("scale", file.scale)
        .field("scale_detected", file.scaleDetected)
        .field("spectra", file.describeSpectra());
}

void formAndModel(Writer& out, const FormAndModel& result)
{
    if (result.form) {
        out.key("form").beginObject().field("file", result.form->path);
        file(out, result.form->file);
        out.field("form_patches_found", result.form->picked.setsUsed)
            .field("averaged", result.form->picked.averaged)
            .field("other_measurements", result.form->picked.setsIgnored)
            .endObject();
    }
    if (result.fit) {
        out.key("model").beginObject().field("name", result.fit->model->name()).key("fitted_values").beginObject();
        for (const FittedValue& value : result.fit->model->fittedValues()) {
            if (value.name == "warning")
                continue;
            out.key(value.name);
            if (value.text.empty())
                out.numbers(value.numbers);
            else
                out.value(value.text);
        }
        out.endObject();
        if (result.modelled)
            out.key("form_patches_dE00").beginObject()
                .field("mean", result.modelled->deltaE2000.mean)
                .field("p95", result.modelled->deltaE2000.p95)
                .field("max", result.modelled->deltaE2000.max)
                .endObject();
        out.endObject();
    }
}

void summary(Writer& out, const char* name, const Summary& s)
{
    out.key(name).beginObject().field("count", s.count).field("mean", s.mean).field("p95", s.p95).field("max", s.max).endObject();
}

void check(Writer& out, const ModelCheck& check)
{
    out.key("check").beginObject();
    summary(out, "dE00", check.all.deltaE2000);
    summary(out, "chart_dE00", check.chart.deltaE2000);
    out.key("left_out").beginObject()
        .field("form_patches", check.leftOut.formPatches)
        .field("off_levels", check.leftOut.offLevels)
        .field("further_inks", check.leftOut.furtherInks)
        .endObject()
        .endObject();
}

void written(Writer& out, const std::vector<std::pair<const char*, std::string>>& outputs)
{
    out.key("written").beginObject();
    for (const auto& [what, name] : outputs)
        if (!name.empty())
            out.field(what, name);
    out.endObject();
}

void chartLike(const ChartResult& result, std::ostream& stream, const char* command)
{
    Writer out;
    start(out, command, !result.written.empty() || !result.reportWritten.empty());
    warnings(out, {&result.formWarnings, &result.layoutWarnings});
    formAndModel(out, result);
    if (result.fit)
        check(out, result.check);
    out.field("patches", result.patches);
    written(out, {{"chart", result.written}, {"report", result.reportWritten}});
    finish(out, stream);
}

} // namespace

void jsonChart(const ChartResult& result, std::ostream& out)
{
    chartLike(result, out, "chart");
}

void jsonReport(const ChartResult& result, std::ostream& out)
{
    chartLike(result, out, "report");
}

void jsonCompare(const CompareResult& result, std::ostream& stream)
{
    Writer out;
    start(out, "compare", !result.modelWritten.empty());
    warnings(out, {&result.formWarnings});
    formAndModel(out, result);
    summary(out, "form_patches_dEab", result.deltaEab);
    written(out, {{"measured", result.measuredWritten}, {"modelled", result.modelWritten}});
    finish(out, stream);
}

void jsonMultiChannel(const MultiChannelResult& result, std::ostream& stream)
{
    Writer out;
    start(out, "multichannel", !result.chartWritten.empty() || !result.reportWritten.empty());
    warnings(out, {&result.formWarnings, &result.separationsWarnings});
    out.field("inks", result.inks);
    if (result.form) {
        out.key("form").beginObject().field("file", result.formWarnings.path);
        file(out, *result.form);
        out.endObject();
    }
    out.field("chart_patches", result.chart.size());
    written(out, {{"chart", result.chartWritten},
                  {"combinations", result.combinationsWritten},
                  {"separated", result.separatedWritten},
                  {"report", result.reportWritten}});
    finish(out, stream);
}

void jsonConvert(const ConvertResult& result, std::ostream& stream)
{
    Writer out;
    start(out, "convert", !result.written.empty());
    std::vector<const FileWarnings*> files;
    for (const FileWarnings& file : result.warnings)
        files.push_back(&file);
    warnings(out, files);
    out.field("mode", result.mode == VM_PROCESS_CHART_COPY    ? "copy"
                      : result.mode == VM_PROCESS_CHART_BLEND ? "blend"
                                                              : "convert");
    if (result.mode != VM_PROCESS_CHART_COPY)
        out.field("from", result.fromLabel).field("to", result.toLabel).field("whites_dEab", result.whitesApart);
    if (result.mode == VM_PROCESS_CHART_BLEND)
        out.field("blend_weight", result.blendWeight);
    out.field("patches", result.patches);
    written(out, {{"chart", result.written}});
    finish(out, stream);
}

void jsonProfile(const ProfileResult& result, std::ostream& stream)
{
    Writer out;
    start(out, "profile", !result.written.empty());
    warnings(out, {&result.formWarnings});
    formAndModel(out, result);
    if (!result.written.empty()) {
        const profile::ProfileSummary& summary = result.summary;
        out.key("profile").beginObject()
            .field("icc_version", result.version)
            .field("description", summary.description)
            .field("bytes", summary.bytes)
            .key("a2b_levels").numbers(summary.a2bLevels)
            .field("b2a_nodes", summary.b2aNodes)
            .field("b2a_out_of_gamut", summary.outOfGamut)
            .field("darkest_neutral_L", summary.darkestL)
            .field("settings", result.settings)
            .endObject();
        check(out, result.check);
    }
    written(out, {{"profile", result.written}});
    finish(out, stream);
}

void jsonConformance(const ConformanceRun& run, std::ostream& stream)
{
    Writer out;
    start(out, "conformance", run.result.has_value());
    warnings(out, {&run.formWarnings});
    formAndModel(out, run);
    if (run.reference)
        out.key("reference").beginObject()
            .field("file", run.reference->path)
            .field("description", run.reference->description)
            .field("combinations", run.reference->cmyk.size())
            .endObject();
    out.key("conditions").beginArray();
    for (const std::string& note : run.conditions)
        out.value(note);
    out.endArray();
    if (run.result) {
        const conformance::ConformanceResult& result = *run.result;
        out.field("verdict", result.pass() ? "PASS" : "FAIL").key("controls").beginArray();
        for (const conformance::ControlPatch& patch : result.controls) {
            out.beginObject().field("name", patch.name).key("cmyk").numbers({patch.cmyk.begin(), patch.cmyk.end()})
                .key("measured_Lab").numbers({patch.measured.L, patch.measured.a, patch.measured.b})
                .key("reference_Lab").numbers({patch.reference.L, patch.reference.a, patch.reference.b})
                .field("dE00", patch.deltaE00).field("dEab", patch.deltaEab);
            if (patch.deltaH)
                out.field("dHab", *patch.deltaH);
            out.field("tolerance", patch.limit).field("tolerance_source", conformance::toleranceSource(patch.tolerance))
                .field("pass", patch.pass).endObject();
        }
        out.endArray().key("tone_value_increase").beginArray();
        static const char* const inks[4] = {"C", "M", "Y", "K"};
        for (const conformance::ToneValuePoint& point : result.toneValues)
            out.beginObject().field("ink", inks[point.ink]).field("tint", point.nominal)
                .field("measured", point.measured).field("reference", point.reference)
                .field("interpolated", point.interpolated).field("tolerance", point.limit).field("pass", point.pass)
                .endObject();
        out.endArray();
        if (result.gamut) {
            out.key("gamut").beginObject().field("model", result.gamut->model).key("regions").beginObject();
            for (const conformance::GamutRegion& region : result.gamut->regions)
                summary(out, region.name.c_str(), region.deltaE00);
            out.endObject().endObject();
        }
    }
    written(out, {{"report", run.report}});
    finish(out, stream);
}

} // namespace veltmarquist
