#include "correct_output.h"

#include "report_text.h"
#include "value_text.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <iostream>

namespace cli {
namespace {

std::string described(const image_layout& l)
{
    return std::to_string(l.width) + " x " + std::to_string(l.height) + " " + format_name(l);
}

void warn(const std::string& message) { std::fprintf(stderr, "zelt: %s\n", message.c_str()); }

class text_watcher final : public correction_watcher {
public:
    explicit text_watcher(const correct_options& options) : options_(options)
    {
        for (const std::string& name : options.exposures)
            name_width_ = std::max(name_width_, std::min<size_t>(name.size() + 3, 60));
    }

    void start(const correction_basis& b) override
    {
        const auto frames = [](int count) { return counted(static_cast<size_t>(count), "frame"); };
        std::cout << "dark  " << frames(b.darks) << ", " << described(b.format) << ", mean "
                  << figure(b.dark.mean) << '\n';
        if (b.lit)
            std::cout << "flat  " << frames(b.flats) << ", mean less dark " << figure(b.light_mean) << ", "
                      << percent(b.lit->share()) << " of the pixels evenly lit\n";
        if (b.refs->gain()) tell_gain(b);
        std::cout << '\n'
                  << cell("", name_width_, true) << cell("mean") << cell("minimum") << cell("maximum")
                  << cell("std. dev.") << cell("uneven") << cell("fine") << std::endl;
    }

    void frame(const corrected_frame& f, IPixmat2*, IPixmat2*) override
    {
        row(f.name, f.raw, f.before);
        row("  " + base_name(f.output), f.corrected, f.after);
        if (f.limited)
            std::cout << "  " << counted(f.limited, "pixel") << " too bright for " << format_name(f.format)
                      << ", limited (--float keeps the values)\n";
        if (!options_.shorts.empty())
            std::cout << "  the short exposure stands in for " << counted(f.saturated, "pixel")
                      << (f.saturated ? "\n" : ": none is saturated (is --bits the camera's?)\n");
        std::cout.flush();
    }

    void failed(const std::string&, const std::string& message) override { warn(message); }

private:
    void tell_gain(const correction_basis& b) const
    {
        std::cout << "gain  " << (options_.gain.kind == gain_kind::fixed ? "fixed-point" : "float")
                  << ", 1 where the light is " << figure(b.refs->norm()) << "; "
                  << counted(b.refs->pixels_at_highest(), "pixel") << " dead or too dark (highest gain, "
                  << figure(b.refs->highest_gain()) << ")\n";
        if (std::isfinite(b.flat_after.all))
            std::cout << "      checked on the first flat frame with the gain of the others: uneven "
                      << percent(b.flat_before.all) << " -> " << percent(b.flat_after.all) << ", fine "
                      << percent(b.flat_before.fine) << " -> " << percent(b.flat_after.fine) << '\n';
    }

    void row(const std::string& name, const frame_numbers& n, const unevenness& u) const
    {
        std::cout << cell(name, name_width_, true) << cell(figure(n.mean)) << cell(figure(n.minimum))
                  << cell(figure(n.maximum)) << cell(figure(n.deviation)) << cell(percent(u.all))
                  << cell(percent(u.fine)) << '\n';
    }

    static std::string cell(const std::string& text, size_t width = 11, bool left = false)
    {
        const std::string blanks(width > text.size() ? width - text.size() : 0, ' ');
        return left ? text + blanks : blanks + text;
    }

    const correct_options& options_;
    size_t name_width_ = 12;
};

std::string number_json(double value) { return std::isfinite(value) ? number_text(value) : "null"; }

std::string json(const frame_numbers& n, const unevenness& u)
{
    return "{\"mean\": " + number_json(n.mean) + ", \"minimum\": " + number_json(n.minimum) +
           ", \"maximum\": " + number_json(n.maximum) +
           ", \"standard_deviation\": " + number_json(n.deviation) + ", \"uneven\": " + number_json(u.all) +
           ", \"fine_uneven\": " + number_json(u.fine) + "}";
}

std::string json(const unevenness& u)
{
    return "{\"uneven\": " + number_json(u.all) + ", \"fine_uneven\": " + number_json(u.fine) + "}";
}

class json_watcher final : public correction_watcher {
public:
    explicit json_watcher(const std::string& report) : report_(report) {}

    void start(const correction_basis& b) override
    {
        text_ = "{\"dark\": {\"frames\": " + std::to_string(b.darks) +
                ", \"type\": " + json_string(format_name(b.format)) +
                ", \"width\": " + std::to_string(b.format.width) +
                ", \"height\": " + std::to_string(b.format.height) +
                ", \"mean\": " + number_json(b.dark.mean) + "}";
        if (b.lit)
            text_ += ",\n \"flat\": {\"frames\": " + std::to_string(b.flats) +
                     ", \"mean_less_dark\": " + number_json(b.light_mean) +
                     ", \"lit\": " + number_json(b.lit->share()) + ", \"before\": " + json(b.flat_before) +
                     ", \"after\": " + json(b.flat_after) + "}";
        if (b.refs->gain())
            text_ += ",\n \"gain\": {\"norm\": " + number_json(b.refs->norm()) +
                     ", \"highest\": " + number_json(b.refs->highest_gain()) +
                     ", \"pixels_at_highest\": " + std::to_string(b.refs->pixels_at_highest()) + "}";
        text_ += ",\n \"exposures\": [";
    }

    void frame(const corrected_frame& f, IPixmat2*, IPixmat2*) override
    {
        add("{\"file\": " + json_string(f.name) + ", \"output\": " + json_string(f.output) +
            ", \"type\": " + json_string(format_name(f.format)) + ",\n   \"raw\": " + json(f.raw, f.before) +
            ",\n   \"corrected\": " + json(f.corrected, f.after) + ", \"saturated\": " +
            std::to_string(f.saturated) + ", \"limited\": " + std::to_string(f.limited) + "}");
    }

    void failed(const std::string& file, const std::string& message) override
    {
        warn(message);
        add("{\"file\": " + json_string(file) + ", \"error\": " + json_string(message) + "}");
    }

    void finish() override
    {
        std::cout << text_ << "]";
        if (!report_.empty()) std::cout << ",\n \"report\": " << json_string(report_);
        std::cout << "}\n";
    }

private:
    void add(const std::string& item)
    {
        text_ += separator_ + item;
        separator_ = ",\n  ";
    }

    std::string report_;
    std::string text_;
    std::string separator_;
};

} // namespace

std::unique_ptr<correction_watcher> tell_as_text(const correct_options& options)
{
    return std::make_unique<text_watcher>(options);
}

std::unique_ptr<correction_watcher> tell_as_json(const std::string& report)
{
    return std::make_unique<json_watcher>(report);
}

} // namespace cli
