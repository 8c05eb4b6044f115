#include "correct_job.h"

#include "correct_frames.h"
#include "correct_outputs.h"
#include "correct_pixels.h"
#include "correct_progress.h"
#include "failure.h"

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <optional>

using namespace Qor::Luxar;

namespace cli {
namespace {

constexpr double not_a_number = std::numeric_limits<double>::quiet_NaN();

class batch {
public:
    batch(const correct_options& options, const std::vector<correction_watcher*>& watchers);

    size_t run();

private:
    void require_sense() const;
    frame_sum average(const std::vector<std::string>& names, const char* kind, com_ptr<IPixmat2>* first);
    void make_basis();
    void check_flat(const frame_sum& flats, IPixmat2* dark, IPixmat2* first);
    void correct_file(size_t index);
    com_ptr<IPixmat2> correct_page(corrected_frame& result, IPixmat2* raw, IPixmat2* short_exposure) const;

    const correct_options& options_;
    const std::vector<correction_watcher*>& watchers_;
    std::vector<std::string> outputs_;
    progress_line progress_;
    frame_format format_;
    std::optional<references> refs_;
    std::optional<lit_area> lit_;
    correction_basis basis_{};
};

batch::batch(const correct_options& options, const std::vector<correction_watcher*>& watchers)
    : options_(options), watchers_(watchers),
      progress_(options.darks.size() + options.flats.size() + options.exposures.size())
{
    require_sense();
    std::vector<std::string> inputs;
    for (const auto* names : {&options.exposures, &options.shorts, &options.darks, &options.flats})
        inputs.insert(inputs.end(), names->begin(), names->end());
    outputs_ =
        output_names(options.exposures, options.output, options.as_float || !options.shorts.empty(), inputs);
}

void batch::require_sense() const
{
    if (options_.flats.empty() && options_.gain.kind != gain_kind::none)
        throw usage_error("--flat is needed for a gain; --no-gain only subtracts the dark");
    if (options_.shorts.empty()) return;
    if (options_.shorts.size() != options_.exposures.size())
        throw usage_error("--short needs one exposure for each long one: there are " +
                          std::to_string(options_.shorts.size()) + " for " +
                          std::to_string(options_.exposures.size()));
    if (!(options_.ratio > 0)) throw usage_error("--short needs --ratio: long time / short time");
    if (options_.gain.kind == gain_kind::fixed)
        throw usage_error("--short needs a float gain: the products of two exposures do not fit 32 bits");
}

/// Adds up all pages of all files. `first` gets the first frame.
frame_sum batch::average(const std::vector<std::string>& names, const char* kind, com_ptr<IPixmat2>* first)
{
    frame_sum sum;
    for (const std::string& name : names) {
        progress_.step(std::string(kind) + " " + name);
        const auto reader = open_image(name, options_.reading);
        for (int i = 0; i < reader->count(); ++i) {
            const com_ptr<IPixmat2> frame = reader->read(i);
            format_.require(frame.get(), name);
            sum.add(frame.get());
            if (first && !*first) *first = frame;
        }
    }
    return sum;
}

void batch::make_basis()
{
    const frame_sum darks = average(options_.darks, "dark", nullptr);
    const com_ptr<IPixmat2> dark = darks.mean();
    com_ptr<IPixmat2> first_flat, flat;
    frame_sum flats;
    if (!options_.flats.empty()) {
        flats = average(options_.flats, "flat", &first_flat);
        flat = flats.mean();
    }
    refs_.emplace(dark.get(), flat.get(), options_.gain);
    basis_.refs = &*refs_;
    basis_.format = format_.layout();
    basis_.darks = darks.count();
    basis_.flats = flats.count();
    basis_.dark = measure(refs_->dark());
    basis_.flat_before = basis_.flat_after = {not_a_number, not_a_number};
    if (!flat) return;
    lit_.emplace(refs_->light(), options_.area);
    basis_.lit = &*lit_;
    basis_.light_mean = finite_mean(refs_->light());
    if (flats.count() > 1 && refs_->gain()) check_flat(flats, dark.get(), first_flat.get());
}

void batch::check_flat(const frame_sum& flats, IPixmat2* dark, IPixmat2* first)
{
    const references others(dark, flats.mean_without(first).get(), options_.gain);
    const lit_area lit(others.light(), options_.area);
    basis_.flat_before = lit.measure(others.subtracted(first).get());
    basis_.flat_after = lit.measure(others.corrected(first, true).get());
}

/// Pixels with the largest value of their depth; real numbers have none.
size_t count_highest(IPixmat2* frame)
{
    const image_layout l = layout_of(frame);
    if (l.encoding == PixmatEncoding_Float) return 0;
    const double top = std::ldexp(1.0, l.encoding == PixmatEncoding_Signed ? l.bits - 1 : l.bits) - 1;
    size_t count = 0;
    real_rows rows(frame);
    for (int y = 0; y < rows.height(); ++y) {
        const double* row = rows.row(y);
        for (int x = 0; x < rows.width(); ++x) count += row[x] >= top;
    }
    return count;
}

com_ptr<IPixmat2> batch::correct_page(corrected_frame& result, IPixmat2* raw, IPixmat2* short_exposure) const
{
    com_ptr<IPixmat2> corrected;
    if (short_exposure) {
        const image_layout l = layout_of(raw);
        if (l.encoding != PixmatEncoding_Unsigned || pixel_bytes(l) != 2)
            throw failure(result.name + ": two exposures are merged from Unsigned frames of 9 to 16 bits");
        corrected = refs_->merged(raw, short_exposure, options_.ratio, options_.as_float);
        result.saturated = count_highest(raw);
    } else {
        corrected = refs_->corrected(raw, options_.as_float);
    }
    result.format = layout_of(corrected.get());
    const size_t highest = count_highest(corrected.get());
    if (!short_exposure) result.limited = highest - std::min(highest, count_highest(raw));
    result.raw = measure(raw);
    result.corrected = measure(corrected.get());
    result.before = result.after = {not_a_number, not_a_number};
    if (lit_) {
        result.before = lit_->measure(refs_->subtracted(raw).get());
        result.after = lit_->measure(corrected.get());
    }
    return corrected;
}

void batch::correct_file(size_t index)
{
    const std::string& name = options_.exposures[index];
    const auto reader = open_image(name, options_.reading);
    const int pages = reader->count();
    std::unique_ptr<frame_reader> shorts;
    if (!options_.shorts.empty()) {
        shorts = open_image(options_.shorts[index], options_.reading);
        if (shorts->count() != pages)
            throw failure(options_.shorts[index] + ": has " + std::to_string(shorts->count()) + " pages, " +
                          name + " has " + std::to_string(pages));
    }
    const auto writer = create_image(outputs_[index], pages);
    for (int page = 0; page < pages; ++page) {
        const com_ptr<IPixmat2> raw = reader->read(page);
        frame_format format = format_;
        format.require(raw.get(), name);
        com_ptr<IPixmat2> short_exposure;
        if (shorts) {
            short_exposure = shorts->read(page);
            format.require(short_exposure.get(), options_.shorts[index]);
        }
        corrected_frame result;
        result.name = pages > 1 ? name + ":" + std::to_string(page + 1) : name;
        result.output = outputs_[index];
        const com_ptr<IPixmat2> corrected = correct_page(result, raw.get(), short_exposure.get());
        writer->add(corrected.get());
        if (page + 1 == pages) writer->finish();
        progress_.clear();
        for (correction_watcher* w : watchers_) w->frame(result, raw.get(), corrected.get());
    }
}

size_t batch::run()
{
    make_basis();
    for (const std::string& output : outputs_)
        make_folder(std::filesystem::path(output).parent_path().string());
    progress_.clear();
    for (correction_watcher* w : watchers_) w->start(basis_);
    size_t failures = 0;
    const auto leave_out = [&](const std::string& file, const std::string& message) {
        progress_.clear();
        ++failures;
        for (correction_watcher* w : watchers_) w->failed(file, message);
    };
    for (size_t i = 0; i < options_.exposures.size(); ++i) {
        const std::string& name = options_.exposures[i];
        progress_.step(name);
        try {
            correct_file(i);
        } catch (const failure& f) {
            leave_out(name, f.what());
        } catch (const zelt::error& e) {
            leave_out(name, name + ": " + message_of(e));
        } catch (const std::bad_alloc&) {
            leave_out(name, name + ": there is not enough memory");
        }
    }
    progress_.clear();
    for (correction_watcher* w : watchers_) w->finish();
    return failures;
}

} // namespace

size_t correct(const correct_options& options, const std::vector<correction_watcher*>& watchers)
{
    return batch(options, watchers).run();
}

} // namespace cli
