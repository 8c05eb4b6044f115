// zelt correct: exposures of a camera, with its dark and flat frames.
#include "argument_text.h"
#include "commands.h"
#include "correct_job.h"
#include "correct_output.h"
#include "failure.h"
#include "number_text.h"
#include "report.h"

#include <cmath>
#include <iostream>

namespace cli {
namespace {

struct command_options {
    correct_options job;
    std::string gain = "float";
    std::string norm = "mean";
    bool no_gain = false;
    std::string area;
    std::string report;
    bool json = false;
};

gain_options parse_gain(const command_options& o)
{
    gain_options gain = o.job.gain;
    gain.kind = o.no_gain ? gain_kind::none : o.gain == "fixed" ? gain_kind::fixed : gain_kind::real;
    if (o.norm == "mean" || o.norm == "lit") {
        gain.norm = o.norm == "mean" ? norm_kind::mean : norm_kind::lit;
        return gain;
    }
    const auto numbers = parse_numbers(o.norm);
    if (!numbers || numbers->size() != 1 || !std::isfinite(numbers->front()) || numbers->front() <= 0)
        throw usage_error("--norm is mean, lit or a number above 0, not '" + o.norm + "'");
    gain.norm = norm_kind::value;
    gain.norm_value = numbers->front();
    return gain;
}

void run(const command_options& given)
{
    command_options o = given;
    o.job.gain = parse_gain(given);
    if (!o.area.empty()) o.job.area = parse_rectangle("--area", o.area);
    std::unique_ptr<correction_report> report;
    std::vector<correction_watcher*> watchers;
    if (!o.report.empty()) {
        report = std::make_unique<correction_report>(o.report, o.job);
        watchers.push_back(report.get());
    }
    const auto teller = o.json ? tell_as_json(report ? report->file() : std::string()) : tell_as_text(o.job);
    watchers.push_back(teller.get());

    const size_t failures = correct(o.job, watchers);
    if (report && !o.json) std::cout << "\nreport: " << report->file() << '\n';
    if (failures)
        throw failure(std::to_string(failures) + " of " + std::to_string(o.job.exposures.size()) +
                      (o.job.exposures.size() == 1 ? " exposure was" : " exposures were") + " not corrected");
}

constexpr char explanation[] =
    R"(Dark and flat frames are averaged. Each exposure has the dark taken away and is multiplied by the gain that makes
the flat frames even. The type of the pixels stays, values are limited to its range.

"uneven" is the standard deviation of the evenly lit pixels in parts of their mean: those where the flat frames
have more than half of their highest light. "fine" looks only at differences from the pixels around (31 x 31).

Examples:
  zelt correct raw.tif --dark dark*.tif --flat flat*.tif -o corrected.tif
  zelt correct raw*.png --bits 12 --dark dark*.png --flat flat*.png -o corrected/ --report report/
  zelt correct long.fits --short short.fits --ratio 16 --dark dark*.fits --flat flat*.fits -o merged.fits)";

const command_registration registered(10, [](CLI::App& app) {
    CLI::App* command = app.add_subcommand("correct", "camera exposures, with dark and flat frames");
    auto o = std::make_shared<command_options>();
    command->add_option("RAW", o->job.exposures, "exposures; each page of a stack is one")->required();
    command->add_option("--dark", o->job.darks, "dark frames, averaged")->type_name("FILE")->required();
    command->add_option("--flat", o->job.flats, "flat frames, averaged")->type_name("FILE");
    command->add_option("-o,--output", o->job.output, "a file, a folder, or a pattern: {} name, {n} number")
        ->type_name("OUT")
        ->required();
    command->add_option("--gain", o->gain, "float, or fixed: 16-bit fixed point, at most 2^scale")
        ->check(CLI::IsMember({"float", "fixed"}))
        ->capture_default_str();
    command->add_option("--scale", o->job.gain.scale, "bits before the point of a fixed gain")
        ->check(CLI::Range(0, 16))
        ->capture_default_str();
    command
        ->add_option(
            "--norm", o->norm,
            "light that has a gain of 1: the flat's mean, the mean of its evenly lit pixels (lit), or "
            "a number")
        ->capture_default_str();
    command->add_flag("--no-gain", o->no_gain, "only take the dark away");
    command->add_option("--short", o->job.shorts, "short exposures that stand in where RAW is saturated")
        ->type_name("FILE");
    command->add_option("--ratio", o->job.ratio, "how many times longer RAW was exposed")
        ->check(CLI::PositiveNumber);
    command->add_option("--bits", o->job.reading.bits, "nominal depth of 16-bit files")
        ->check(CLI::Range(9, 16));
    command->add_option("--area", o->area, "look at evenness there only; right and bottom exclusive")
        ->type_name("L,T,R,B");
    command->add_flag("--float", o->job.as_float, "write float pixels; negative values stay");
    command->add_option("--report", o->report, "write a page with pictures and numbers there")
        ->type_name("DIR");
    command->add_flag("--json", o->json, "the numbers as JSON");
    command->footer(explanation);
    command->callback([o] { run(*o); });
});

} // namespace
} // namespace cli
