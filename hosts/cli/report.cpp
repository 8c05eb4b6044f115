#include "report.h"

#include "correct_outputs.h"
#include "output_file.h"
#include "report_charts.h"
#include "report_style.h"
#include "report_text.h"

#include <algorithm>
#include <cmath>
#include <filesystem>

namespace cli {
namespace {

constexpr size_t most_shown = 4; ///< exposures with pictures; the others have their numbers

constexpr char how_to_read[] = R"(<h2>How to read this</h2>
<p><b>Uneven</b> is the standard deviation of the evenly lit pixels, in parts of their mean. Evenly lit are the pixels
where the flat frames, less the dark, have more than half of their highest light. Vignetting, dust and pixel patterns
raise it; so do noise and the scene itself, which a correction leaves alone. <b>Fine</b> is the same after each pixel was
divided by the mean of its surroundings (31 &#215; 31 pixels), so that only small things count.</p>
<p>Before stands for the exposure less the dark, after for the corrected one. Pictures are stretched for the eye: black and
white are the values below and above which half a percent of the pixels lie (for the gain, and for the white of
corrected exposures, of the evenly lit ones). Histograms count on a logarithmic scale.</p>
)";

/// On one line of the page.
std::string unbroken(std::string text)
{
    if (const size_t blank = text.find(' '); blank != std::string::npos) text.replace(blank, 1, "&#160;");
    return text;
}

std::string tile(const std::string& name, const std::string& before, const std::string& after,
                 const std::string& note)
{
    const std::string number = after.empty()
                                   ? escaped(before)
                                   : joined("<span class=\"was\">", escaped(before),
                                            "</span> &#8594; <span class=\"is\">", escaped(after), "</span>");
    return joined("<div class=\"tile\"><b>", escaped(name), "</b><span>", number, "</span><p class=\"soft\">",
                  escaped(note), "</p></div>\n");
}

} // namespace

correction_report::correction_report(const std::string& folder, const correct_options& options)
    : file_((std::filesystem::path(folder) / "report.html").string()), options_(options)
{
    make_folder(folder);
    const output_file would_be_written(file_); // throws if it cannot be
}

void correction_report::add_tile(const std::string& name, const std::string& before, const std::string& after,
                                 const std::string& note)
{
    tiles_ += tile(name, before, after, note);
}

/// Where only a part of the field is lit, the rest would decide what is white.
shades correction_report::shades_of_lit(IPixmat2* image) const
{
    const bool enough = lit_ && lit_->share() > 0.01;
    return shades_of(image, enough ? lit_->row(0) : nullptr);
}

std::string correction_report::figure_with(const std::string& title, IPixmat2* image, const std::string& note,
                                           shades range) const
{
    const picture p = make_picture(image, range);
    return joined("<figure><img alt=\"", escaped(title), "\" width=\"", std::to_string(p.width),
                  "\" height=\"", std::to_string(p.height), "\" src=\"", p.uri, "\"/><figcaption><b>",
                  escaped(title), "</b> ", escaped(note), "<br/>black is ", figure(range.black), ", white ",
                  figure(range.white), "</figcaption></figure>\n");
}

void correction_report::start(const correction_basis& b)
{
    refs_ = b.refs;
    middle_ = b.format.height / 2;
    lit_ = b.lit;
    if (std::isfinite(b.flat_after.all))
        own_tiles_ +=
            tile("Flat frame, uneven", percent(b.flat_before.all), percent(b.flat_after.all),
                 "the first of " + std::to_string(b.flats) + ", corrected with the gain of the others");
    const auto frames = [](int n) { return "mean of " + counted(static_cast<size_t>(n), "frame"); };
    reference_figures_ =
        figure_with("Dark reference", b.refs->dark(), frames(b.darks), shades_of(b.refs->dark()));
    if (b.lit)
        reference_figures_ += figure_with("Light", b.refs->light(), frames(b.flats) + ", less the dark",
                                          shades_of(b.refs->light()));
    if (!b.refs->gain()) return;
    const std::string unit =
        options_.gain.kind == gain_kind::fixed ? ", stored as " + figure(b.refs->gain_unit()) + " for 1" : "";
    reference_figures_ += figure_with("Gain reference", b.refs->gain(), "a factor for each pixel" + unit,
                                      shades_of_lit(b.refs->gain()));
    own_tiles_ += tile("Dead or too dark", figure(static_cast<double>(b.refs->pixels_at_highest())), "",
                       "pixels with the highest gain, " + figure(b.refs->highest_gain()));
}

void correction_report::add_row(const std::string& name, const std::string& kind, const frame_numbers& n,
                                const unevenness& u)
{
    rows_ += "<tr><td>" + escaped(name) + "</td><td>" + kind + "</td>";
    for (double value : {n.mean, n.minimum, n.maximum, n.deviation})
        rows_ += "<td>" + figure(value) + "</td>";
    rows_ += "<td>" + percent(u.all) + "</td><td>" + percent(u.fine) + "</td></tr>\n";
}

void correction_report::frame(const corrected_frame& f, IPixmat2* raw, IPixmat2* corrected)
{
    ++corrected_;
    add_row(f.name, "raw", f.raw, f.before);
    add_row(f.output, "corrected", f.corrected, f.after);
    if (shown_++ >= most_shown) return;

    exposures_ += "<h2>" + escaped(base_name(f.name)) + "</h2>\n<p class=\"soft\">";
    if (std::isfinite(f.after.all))
        exposures_ +=
            joined("Uneven: ", unbroken(percent(f.before.all)), " before, ", unbroken(percent(f.after.all)),
                   " after; fine: ", unbroken(percent(f.before.fine)), " before, ",
                   unbroken(percent(f.after.fine)), " after. ");
    if (f.limited)
        exposures_ +=
            counted(f.limited, "pixel") + " too bright for " + format_name(f.format) + ", limited. ";
    if (f.saturated)
        exposures_ += "The short exposure stands in for " + counted(f.saturated, "saturated pixel") + ".";
    exposures_ += "</p>\n<div class=\"pictures\">" +
                  figure_with("Raw", raw, base_name(f.name), shades_of(raw)) +
                  figure_with("Corrected", corrected, base_name(f.output),
                              {shades_of(corrected).black, shades_of_lit(corrected).white});
    if (truth_)
        exposures_ +=
            figure_with("Truth", truth_.get(), "what a perfect camera would show", shades_of(truth_.get()));
    exposures_ += "</div>\n" + charts(raw, corrected);
}

std::string correction_report::charts(IPixmat2* raw, IPixmat2* corrected) const
{
    std::vector<chart_line> histogram, profile;
    if (truth_) histogram = profile = {{"truth", "truth", truth_}};
    histogram.push_back({"before", "raw", com_ptr<IPixmat2>(raw)});
    profile.push_back({"before", "raw less dark", refs_->subtracted(raw)});
    histogram.push_back({"after", "corrected", com_ptr<IPixmat2>(corrected)});
    profile.push_back(histogram.back());
    return "<div class=\"charts\"><figure>" + histogram_chart(histogram) +
           "<figcaption><b>Histogram</b> how many pixels have a value</figcaption></figure>\n<figure>" +
           profile_chart(profile, middle_) + "<figcaption><b>Profile</b> along row " +
           std::to_string(middle_) + ", mean of five rows</figcaption></figure></div>\n";
}

void correction_report::failed(const std::string&, const std::string& message)
{
    failures_ += "<li>" + escaped(message) + "</li>\n";
}

std::string correction_report::title() const
{
    const size_t others = options_.exposures.size() - 1;
    return "Correction of " + base_name(options_.exposures[0]) +
           (others ? " and " + std::to_string(others) + " more" : "");
}

void correction_report::finish()
{
    std::string page = "<!DOCTYPE html>\n<html lang=\"en\"><head><meta charset=\"utf-8\"/>\n"
                       "<meta name=\"viewport\" content=\"width=device-width, initial-scale=1\"/>\n<title>" +
                       escaped(title()) + "</title>\n<style>" + report_style +
                       "</style></head>\n<body><main>\n<h1>" + escaped(title()) + "</h1>\n";
    page += introduction_.empty()
                ? "<p class=\"soft\">" + counted(corrected_, "exposure") + " corrected.</p>\n"
                : "<p>" + escaped(introduction_) + "</p>\n";
    if (!failures_.empty())
        page += "<div class=\"failed\"><p><b>Left out</b></p><ul>\n" + failures_ + "</ul></div>\n";
    tiles_ += own_tiles_;
    if (!tiles_.empty()) page += "<div class=\"tiles\">\n" + tiles_ + "</div>\n";
    page += exposures_;
    if (shown_ > most_shown)
        page += "<p class=\"soft\">Pictures of the first " + std::to_string(most_shown) + " of " +
                std::to_string(shown_) + "; the numbers of all are below.</p>\n";
    page += "<h2>References</h2>\n<div class=\"pictures\">" + reference_figures_ + "</div>\n";
    if (!rows_.empty())
        page += "<h2>Numbers</h2>\n<div class=\"table\"><table><thead><tr><th>file</th><th></th><th>mean</th>"
                "<th>minimum</th><th>maximum</th><th>std. dev.</th><th>uneven</th><th>fine</th></tr></thead>"
                "\n<tbody>" +
                rows_ + "</tbody></table></div>\n";
    if (lit_) page += how_to_read;
    page += "<footer>zelt " ZELT_VERSION "</footer>\n</main></body></html>\n";

    output_file file(file_);
    file.write(page.data(), page.size());
    file.commit();
}

} // namespace cli
