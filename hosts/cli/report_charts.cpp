#include "report_charts.h"

#include "correct_pixels.h"
#include "report_text.h"

#include <algorithm>
#include <cmath>

using namespace Qor::Luxar;

namespace cli {
namespace {

constexpr double width = 640, height = 260;
constexpr double left = 58, right = 22, top = 12, bottom = 42;

std::string coordinate(double value)
{
    char text[32];
    std::snprintf(text, sizeof text, "%.1f", value);
    return text;
}

/// From values to places in the drawing.
struct scale {
    double low, high;   // values
    double first, last; // places
    double place(double value) const
    {
        return first + (std::clamp(value, low, high) - low) / (high - low) * (last - first);
    }
};

scale horizontal(double low, double high) { return {low, high > low ? high : low + 1, left, width - right}; }
scale vertical(double low, double high) { return {low, high > low ? high : low + 1, height - bottom, top}; }

/// Round numbers that divide a range into about six parts.
std::vector<double> ticks(double low, double high)
{
    const double raw = (high - low) / 8;
    const double power = std::pow(10.0, std::floor(std::log10(raw)));
    double step = 10 * power;
    for (double factor : {5.0, 2.0, 1.0})
        if (factor * power >= raw) step = factor * power;
    std::vector<double> places;
    for (double k = std::ceil(low / step); k * step <= high && places.size() < 20; ++k)
        places.push_back(k * step);
    return places;
}

std::string text(double x, double y, const char* anchor, const std::string& what)
{
    return joined("<text x=\"", coordinate(x), "\" y=\"", coordinate(y), "\" text-anchor=\"", anchor, "\">",
                  escaped(what), "</text>");
}

std::string grid_line(double x1, double y1, double x2, double y2)
{
    return joined("<path class=\"grid\" d=\"M", coordinate(x1), " ", coordinate(y1), "L", coordinate(x2), " ",
                  coordinate(y2), "\"/>");
}

struct frame_of_chart {
    std::string label;
    scale x, y;
    std::vector<std::pair<double, std::string>> y_ticks;
    std::string x_title;
};

/// Everything but the lines.
std::string begin(const frame_of_chart& f, const std::vector<chart_line>& lines)
{
    std::string svg = joined("<svg viewBox=\"0 0 ", coordinate(width), " ", coordinate(height),
                             "\" role=\"img\" aria-label=\"", escaped(f.label), "\">");
    for (const auto& [value, name] : f.y_ticks) {
        const double y = f.y.place(value);
        svg += grid_line(left, y, width - right, y) + text(left - 6, y + 4, "end", name);
    }
    for (double value : ticks(f.x.low, f.x.high)) {
        const double x = f.x.place(value);
        svg += grid_line(x, height - bottom, x, height - bottom + 4) +
               text(x, height - bottom + 17, "middle", figure(value));
    }
    svg += text(width - right, height - 6, "end", f.x_title);
    double x = left;
    for (const chart_line& l : lines) {
        svg += joined("<path class=\"line ", l.style, "\" d=\"M", coordinate(x), " ", coordinate(height - 10),
                      "h18\"/>", text(x + 24, height - 6, "start", l.name));
        x += 44 + 7 * static_cast<double>(l.name.size());
    }
    return svg;
}

bool is_whole(IPixmat2* image) { return layout_of(image).encoding != PixmatEncoding_Float; }

std::vector<size_t> count_bins(IPixmat2* image, double low, double step, size_t bins)
{
    std::vector<size_t> counts(bins);
    real_rows rows(image);
    for (int y = 0; y < rows.height(); ++y) {
        const double* row = rows.row(y);
        for (int x = 0; x < rows.width(); ++x) {
            const double bin = std::floor((row[x] - low) / step);
            if (bin >= 0 && bin < static_cast<double>(bins)) ++counts[static_cast<size_t>(bin)];
        }
    }
    return counts;
}

/// Mean of rows and of neighbouring columns, few enough to draw.
std::vector<double> row_means(IPixmat2* image, int middle, int columns)
{
    constexpr int radius = 2;
    real_rows rows(image);
    const int block = (rows.width() + columns - 1) / columns;
    std::vector<double> sums(static_cast<size_t>((rows.width() + block - 1) / block));
    std::vector<int> counts(sums.size());
    for (int y = std::max(0, middle - radius); y <= std::min(rows.height() - 1, middle + radius); ++y) {
        const double* row = rows.row(y);
        for (int x = 0; x < rows.width(); ++x) {
            if (!std::isfinite(row[x])) continue;
            sums[static_cast<size_t>(x / block)] += row[x];
            ++counts[static_cast<size_t>(x / block)];
        }
    }
    for (size_t i = 0; i < sums.size(); ++i) sums[i] = counts[i] ? sums[i] / counts[i] : std::nan("");
    return sums;
}

} // namespace

std::string histogram_chart(const std::vector<chart_line>& lines)
{
    double low = INFINITY, high = -INFINITY;
    bool whole = true;
    for (const chart_line& l : lines) {
        const auto range = quantiles(l.image.get(), {0.0005, 0.9995});
        if (range[0] < low) low = range[0];
        if (range[1] > high) high = range[1];
        whole = whole && is_whole(l.image.get());
    }
    if (!(high >= low) || !std::isfinite(high - low)) return {};
    constexpr size_t most_bins = 128;
    double step = (high - low) / most_bins;
    if (whole) step = std::ceil(std::max(step, 1.0)); // else some bins would hold more values than others
    if (!(step > 0)) step = 1;
    const auto bins = static_cast<size_t>((high - low) / step) + 1;
    const double end = low + step * static_cast<double>(bins);

    std::vector<std::vector<size_t>> counts;
    size_t most = 1;
    for (const chart_line& l : lines) {
        counts.push_back(count_bins(l.image.get(), low, step, bins));
        most = std::max(most, std::ranges::max(counts.back()));
    }
    const auto level = [](size_t count) { return std::log10(static_cast<double>(count) + 1); };
    frame_of_chart f{
        "Histogram of pixel values", horizontal(low, end), vertical(0, level(most)), {}, "pixel value"};
    f.y_ticks.emplace_back(0, "0");
    for (size_t n = 1, k = 0; n <= most; n *= 10, ++k)
        if (k % 2 == 1 || most < 1000) f.y_ticks.emplace_back(level(n), std::to_string(n));

    std::string svg = begin(f, lines);
    for (size_t i = 0; i < lines.size(); ++i) {
        std::string path = joined("M", coordinate(left), " ", coordinate(f.y.first));
        for (size_t b = 0; b < bins; ++b)
            path += joined("V", coordinate(f.y.place(level(counts[i][b]))), "H",
                           coordinate(f.x.place(low + step * static_cast<double>(b + 1))));
        path += joined("V", coordinate(f.y.first));
        svg += joined("<path class=\"area ", lines[i].style, "\" d=\"", path, "Z\"/>");
    }
    return svg + "</svg>";
}

std::string profile_chart(const std::vector<chart_line>& lines, int middle)
{
    constexpr int most_points = 570;
    std::vector<std::vector<double>> values;
    std::vector<double> all;
    for (const chart_line& l : lines) {
        values.push_back(row_means(l.image.get(), middle, most_points));
        for (double v : values.back())
            if (std::isfinite(v)) all.push_back(v);
    }
    if (all.empty()) return {};
    std::ranges::sort(all);
    const size_t outliers = all.size() / 500; // hot pixels leave the chart rather than flatten it
    const double low = all[outliers], high = all[all.size() - 1 - outliers];
    if (!std::isfinite(high - low)) return {};
    const double margin = high > low ? (high - low) * 0.06 : 1;
    const int pixels = layout_of(lines[0].image.get()).width;
    frame_of_chart f{"Pixel values along a row",
                     horizontal(0, pixels),
                     vertical(low - margin, high + margin),
                     {},
                     "column"};
    for (double v : ticks(f.y.low, f.y.high)) f.y_ticks.emplace_back(v, figure(v));

    std::string svg = begin(f, lines);
    for (size_t i = 0; i < lines.size(); ++i) {
        std::string path;
        bool pen_down = false;
        const double block = std::ceil(static_cast<double>(pixels) / most_points);
        for (size_t k = 0; k < values[i].size(); ++k) {
            const double v = values[i][k];
            if (std::isfinite(v))
                path += joined(pen_down ? "L" : "M",
                               coordinate(f.x.place((static_cast<double>(k) + 0.5) * block)), " ",
                               coordinate(f.y.place(v)));
            pen_down = std::isfinite(v);
        }
        svg += joined("<path class=\"line ", lines[i].style, "\" d=\"", path, "\"/>");
    }
    return svg + "</svg>";
}

} // namespace cli
