// zelt demo: a correction whose truth is known, since the camera is simulated.
#include "camera_model.h"
#include "camera_scene.h"
#include "commands.h"
#include "correct_job.h"
#include "correct_output.h"
#include "correct_outputs.h"
#include "correct_pixels.h"
#include "failure.h"
#include "report.h"
#include "report_text.h"

#include <cmath>
#include <iostream>

using namespace Qor::Luxar;

namespace cli {
namespace {

constexpr double brightest = 24000;  ///< electrons of the scene's white
constexpr double flat_light = 22000; ///< of the flat frames
constexpr int frames_of_each = 8;

struct demo_options {
    std::string output = "zelt-demo";
    uint64_t seed = 1;
    bool stars = false;
};

/// Differences from the truth, root mean square, in counts.
struct errors {
    double all = 0;     ///< of all pixels
    double working = 0; ///< of those that are neither dead nor saturated
};

class demonstration final : public correction_watcher {
public:
    demonstration(const demo_options& options);

    void make_frames();
    void run();

    void frame(const corrected_frame&, IPixmat2* raw, IPixmat2* corrected) override;
    void failed(const std::string&, const std::string& message) override { throw failure(message); }

private:
    std::string path(const std::string& name) const { return options_.output + "/" + name; }
    com_ptr<IPixmat2> truth() const;
    errors compare(IPixmat2* image, double offset) const;
    double noise_limit() const;
    std::string of_mean(double error) const { return percent(error / mean_truth_); }

    const demo_options& options_;
    camera_scene scene_;
    simulated_camera camera_;
    std::vector<double> light_; ///< electrons
    double to_counts_;          ///< from electrons of the scene to counts of the corrected picture
    double mean_truth_ = 0;
    size_t working_ = 0;
    correct_options job_;
    correction_report* report_ = nullptr;
    errors before_, after_;
};

camera_design design_for(const camera_scene& scene)
{
    camera_design design;
    design.width = scene.width;
    design.height = scene.height;
    return design;
}

demonstration::demonstration(const demo_options& options)
    : options_(options), scene_(find_scene(options.stars, options.seed)),
      camera_(design_for(scene_), options.seed)
{
    to_counts_ = camera_.mean_response() / camera_.design().electrons_per_count;
    for (double part : scene_.light) {
        light_.push_back(part * brightest);
        mean_truth_ += light_.back() * to_counts_ / static_cast<double>(scene_.light.size());
    }
    for (size_t i = 0; i < light_.size(); ++i)
        working_ += camera_.works(i, light_[i]) && camera_.works(i, flat_light);
}

com_ptr<IPixmat2> demonstration::truth() const
{
    const new_image image(scene_.width, scene_.height, camera_.design().bits, PixmatEncoding_Unsigned);
    for (size_t i = 0; i < light_.size(); ++i) {
        const auto value = static_cast<uint16_t>(light_[i] * to_counts_ + 0.5);
        std::memcpy(image.data + i * sizeof value, &value, sizeof value);
    }
    return image.image;
}

void demonstration::make_frames()
{
    make_folder(options_.output);
    for (int i = 1; i <= frames_of_each; ++i) {
        job_.darks.push_back(path("dark_" + std::to_string(i) + ".tif"));
        write_image(job_.darks.back(), camera_.expose_evenly(0).get());
        job_.flats.push_back(path("flat_" + std::to_string(i) + ".tif"));
        write_image(job_.flats.back(), camera_.expose_evenly(flat_light).get());
    }
    job_.exposures = {path("raw.tif")};
    write_image(job_.exposures[0], camera_.expose(light_).get());
    write_image(path("truth.tif"), truth().get());
    job_.output = path("corrected.tif");
}

errors demonstration::compare(IPixmat2* image, double offset) const
{
    double all = 0, working = 0;
    real_rows rows(image);
    size_t i = 0;
    for (int y = 0; y < rows.height(); ++y) {
        const double* row = rows.row(y);
        for (int x = 0; x < rows.width(); ++x, ++i) {
            const double difference = row[x] - offset - light_[i] * to_counts_;
            all += difference * difference;
            if (camera_.works(i, light_[i]) && camera_.works(i, flat_light))
                working += difference * difference;
        }
    }
    return {std::sqrt(all / static_cast<double>(light_.size())),
            std::sqrt(working / static_cast<double>(working_))};
}

/// What shot and read noise of exposure, dark and flat frames leave after a perfect correction: no method does better.
double demonstration::noise_limit() const
{
    constexpr double rounding = 1.0 / 12;
    const double mean_response = camera_.mean_response();
    double sum = 0;
    for (size_t i = 0; i < light_.size(); ++i) {
        if (!camera_.works(i, light_[i]) || !camera_.works(i, flat_light)) continue;
        const double gain = mean_response / camera_.response(i);
        const double dark = camera_.variance(i, 0) / frames_of_each + rounding;
        const double flat = camera_.variance(i, flat_light) / frames_of_each + rounding + dark;
        const double flat_counts = flat_light * camera_.response(i) / camera_.design().electrons_per_count;
        const double truth = light_[i] * to_counts_;
        sum += gain * gain * (camera_.variance(i, light_[i]) + dark) +
               truth * truth * flat / (flat_counts * flat_counts) + rounding;
    }
    return std::sqrt(sum / static_cast<double>(working_));
}

void demonstration::frame(const corrected_frame&, IPixmat2* raw, IPixmat2* corrected)
{
    before_ = compare(raw, camera_.mean_dark());
    after_ = compare(corrected, 0);
    report_->add_tile("Error against the truth", of_mean(before_.working), of_mean(after_.working),
                      "root mean square of the working pixels; noise alone makes " + of_mean(noise_limit()));
    report_->add_tile("The same with dead pixels", of_mean(before_.all), of_mean(after_.all),
                      figure(static_cast<double>(light_.size() - working_)) +
                          " pixels are dead or saturated");
}

void demonstration::run()
{
    correction_report report(options_.output, job_);
    report_ = &report;
    report.set_truth(truth());
    report.set_introduction("A simulated 14-bit camera took " + scene_.description +
                            ": dark corners, dust, uneven pixels and columns, hot and dead pixels, shot and "
                            "read noise. The correction "
                            "knows " +
                            std::to_string(frames_of_each) + " dark and " + std::to_string(frames_of_each) +
                            " flat frames of the camera; the truth is there to judge the result by.");
    std::cout << "A simulated camera took " << scene_.description << ".\nIts frames are in "
              << options_.output << "/.\n\n";
    const auto teller = tell_as_text(job_);
    correct(job_, {this, &report, teller.get()});

    std::cout << "\nerror against the truth, root mean square of the working pixels\n"
              << "  raw        " << figure(before_.working) << " counts, " << of_mean(before_.working)
              << " of the mean\n"
              << "  corrected  " << figure(after_.working) << " counts, " << of_mean(after_.working)
              << " (noise alone makes " << of_mean(noise_limit()) << ")\n"
              << "  " << light_.size() - working_
              << " dead or saturated pixels included: " << of_mean(before_.all) << " and "
              << of_mean(after_.all) << "\n\nreport: " << report.file() << '\n';
}

const command_registration registered(12, [](CLI::App& app) {
    CLI::App* command = app.add_subcommand("demo", "simulates a camera and corrects what it took");
    auto o = std::make_shared<demo_options>();
    command->add_option("-o,--output", o->output, "folder for frames, result and report")
        ->type_name("DIR")
        ->capture_default_str();
    command->add_option("--seed", o->seed, "the same number makes the same camera and noise")
        ->capture_default_str();
    command->add_flag("--stars", o->stars, "looks at a star field instead of a photograph");
    command->callback([o] {
        demonstration demo(*o);
        demo.make_frames();
        demo.run();
    });
});

} // namespace
} // namespace cli
