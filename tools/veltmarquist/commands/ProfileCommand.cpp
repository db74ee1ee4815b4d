// profile FORM -o PROFILE: an ICC output profile of the press from its
// measured test form (PrintProfile.h), with exact ink limits and black
// generation, and the model's check against what the form measured beyond it.
#include "Commands.h"

#include "CommandOptions.h"
#include "Failure.h"
#include "Numbers.h"
#include "OutputFile.h"
#include "report/JsonReport.h"
#include "report/TextReport.h"

#include <unistd.h>

#include <chrono>
#include <iostream>
#include <memory>

namespace veltmarquist {

namespace {

struct ProfileJob {
    std::string form, output;
    ModelChoice model = ModelChoice::yuleNielsen;
    profile::ProfileOptions options;
    bool quiet = false;
    ReadOptions read;
};

// Progress on stderr while a step runs longer than a second, when stderr is
// a terminal: one line rewritten in place, cleared at the end.
class Progress {
public:
    explicit Progress(bool shown) : shown_(shown && ::isatty(STDERR_FILENO) == 1), start_(Clock::now()) {}
    ~Progress()
    {
        if (drawn_)
            std::cerr << "\r\x1b[K" << std::flush;
    }
    void operator()(const char* step, double done)
    {
        if (!shown_ || Clock::now() - start_ < std::chrono::seconds(1))
            return;
        drawn_ = true;
        std::cerr << "\rprofile: " << step << " " << fixedText(100.0 * done, 0) << " %\x1b[K" << std::flush;
    }

private:
    using Clock = std::chrono::steady_clock;
    bool shown_, drawn_ = false;
    Clock::time_point start_;
};

std::string settingsOf(const profile::ProfileOptions& options)
{
    const profile::BlackGeneration& black = options.black;
    return "ink limit " + shortText(options.inkLimit) + " %, black limit " + shortText(options.blackLimit) +
           " %, black generation " + black.name + " (start " + shortText(black.start) + ", amount " +
           shortText(black.amount) + ", shape " + shortText(black.shape) + (black.fixed ? ", fixed" : "") + ")";
}

void runProfile(const ProfileJob& job, ProfileResult& result)
{
    refuseClashingOutputs({job.form}, {job.output});
    profile::checkProfileOptions(job.options);
    result.form = readTestForm(job.form, job.read, result.formWarnings);
    PendingOutput output(job.output);
    FittedModel fit = fitModel(*result.form, job.model);
    profile::checkProfileOptions(job.options, fit.model.get());
    result.settings = settingsOf(job.options);
    result.version = job.options.version == profile::IccVersion::v2 ? "2.4" : "4.3";
    Progress progress(!job.quiet);
    output.writeBytes(profile::printProfile(fit, *result.form, job.options, result.summary,
                                            [&](const char* step, double done) { progress(step, done); }));
    result.modelled = modelForm(*result.form, *fit.model);
    result.fit = std::move(fit);
    result.check = checkModel(result.form->file, *result.fit->model);
    output.commit();
    result.written = output.name();
}

} // namespace

Command setupProfileCommand(CLI::App& app)
{
    struct Options {
        ProfileJob job;
        ScaleOption scale;
        ModelOption model{ModelChoice::yuleNielsen};
        ReportStyle style;
        std::string black = "heavy", version = "2";
        std::optional<double> start, amount, shape;
        bool fixed = false;
        std::optional<double> inkLimit;
    };
    const auto options = std::make_shared<Options>();
    ProfileJob& job = options->job;
    CLI::App* command = app.add_subcommand(
        "profile", "ICC output profile of the press from a measured four-colour test form: A2B tables from the "
                   "fitted model, B2A tables within the ink limits and with the chosen black generation");
    command->add_option("FORM", job.form, "measurement file with the 46 test-form patches (any order)")
        ->required()
        ->check(kPath);
    command->add_option("-o,--output", job.output, "ICC profile to write (- for standard output)")
        ->required()
        ->check(kPath);
    options->model.add(*command);
    addInkLimit(*command, options->inkLimit, "total area coverage the separations never pass, percent (default 300)");
    command->add_option("--black-limit", job.options.blackLimit, "the most black the separations use, percent")
        ->check(CLI::Range(0.0, 100.0))
        ->capture_default_str();
    command
        ->add_option("--black", options->black,
                     std::string("black generation: ") + profile::blackGenerationNames() +
                         " (ucr: black only in the darkest neutrals, held fixed)")
        ->check(CLI::IsMember({"none", "light", "medium", "heavy", "maximum", "ucr"}))
        ->capture_default_str();
    command->add_option("--black-start", options->start,
                        "share of the lightness range, from the paper down, before black begins (0-1)")
        ->check(CLI::Range(0.0, 1.0));
    command->add_option("--black-amount", options->amount,
                        "black at the darkest neutral, as a share of the black limit (0-1)")
        ->check(CLI::Range(0.0, 1.0));
    command->add_option("--black-shape", options->shape, "curve of the black ramp: 1 linear, more holds black back")
        ->check(CLI::Range(0.1, 10.0));
    command->add_flag("--black-fixed", options->fixed,
                      "hold black exactly on its curve (C, M, Y alone reproduce the colour)");
    command->add_option("--grid", job.options.a2bNodes,
                        "A2B nodes per ink (default 17; the offset and gravure models: the form's 9 levels)")
        ->check(CLI::Range(5, 33));
    command->add_option("--b2a-grid", job.options.b2aNodes, "B2A nodes per L*, a*, b* axis (odd)")
        ->check(CLI::Range(9, 65))
        ->capture_default_str();
    command->add_option("--icc-version", options->version, "2 (2.4, what most RIPs and applications read) or 4 (4.3)")
        ->check(CLI::IsMember({"2", "4"}))
        ->capture_default_str();
    command->add_option("--description", job.options.description,
                        "the profile's description (default: the form's DESCRIPTOR and the model)");
    command->add_option("--copyright", job.options.copyright, "the profile's copyright text");
    options->scale.add(*command);
    options->style.add(*command);
    return {command, [options] { return std::vector<std::string>{options->job.output}; },
            [options](std::ostream& report) {
                ProfileJob& job = options->job;
                job.model = options->model.choice();
                job.read = options->scale.readOptions();
                job.options.inkLimit = options->inkLimit.value_or(300.0);
                job.options.black = *profile::blackGenerationNamed(options->black);
                if (options->start || options->amount || options->shape)
                    job.options.black.name = "custom, from " + options->black;
                job.options.black.start = options->start.value_or(job.options.black.start);
                job.options.black.amount = options->amount.value_or(job.options.black.amount);
                job.options.black.shape = options->shape.value_or(job.options.black.shape);
                job.options.black.fixed = job.options.black.fixed || options->fixed;
                job.options.version = options->version == "4" ? profile::IccVersion::v4 : profile::IccVersion::v2;
                job.quiet = options->style.quiet || options->style.json;
                runAndRender<ProfileResult>([&](ProfileResult& result) { runProfile(job, result); },
                                            options->style.pick<ProfileResult>(renderProfile, jsonProfile), report);
            },
            {}};
}

} // namespace veltmarquist
