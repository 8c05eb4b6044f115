#include "correct_measures.h"

#include "correct_pixels.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>

using namespace Qor::Luxar::ZELT;

namespace cli {
namespace {

/// Mean and standard deviation of values that come one after the other.
class spread {
public:
    void add(double value) noexcept
    {
        ++count_;
        const double from_mean = value - mean_;
        mean_ += from_mean / static_cast<double>(count_);
        squares_ += from_mean * (value - mean_);
    }
    double mean() const noexcept { return count_ ? mean_ : std::nan(""); }
    double relative() const noexcept
    {
        return count_ && mean_ > 0 ? std::sqrt(squares_ / static_cast<double>(count_)) / mean_ : std::nan("");
    }

private:
    size_t count_ = 0;
    double mean_ = 0;
    double squares_ = 0;
};

constexpr int radius = 15; ///< of the neighbourhood of "fine"

/// Sums over the lit pixels of a column, in the rows around the current one.
struct column_sum {
    double value = 0;
    int count = 0;
};

void add_row(std::vector<column_sum>& columns, const double* row, const uint8_t* lit, int sign)
{
    for (size_t x = 0; x < columns.size(); ++x) {
        if (!lit[x] || !std::isfinite(row[x])) continue;
        columns[x].value += sign * row[x];
        columns[x].count += sign;
    }
}

/// Adds pixel / mean of its neighbourhood for the lit pixels of a row.
void add_ratios(spread& ratios, const std::vector<column_sum>& columns, const double* row, const uint8_t* lit)
{
    const int width = static_cast<int>(columns.size());
    double sum = 0;
    int count = 0;
    const auto include = [&](int x, int sign) {
        if (x < 0 || x >= width) return;
        sum += sign * columns[static_cast<size_t>(x)].value;
        count += sign * columns[static_cast<size_t>(x)].count;
    };
    for (int x = 0; x < radius; ++x) include(x, 1);
    for (int x = 0; x < width; ++x) {
        include(x + radius, 1);
        include(x - radius - 1, -1);
        if (lit[x] && std::isfinite(row[x]) && count > 0 && sum > 0) ratios.add(row[x] * count / sum);
    }
}

} // namespace

frame_numbers measure(IPixmat2* image)
{
    static const com_ptr<IStatistics> facet =
        zelt::get(zelt::create<IZELT2>("ZELT.Main2"), &IZELT2::get_Statistics);
    const image_layout layout = layout_of(image);
    frame_numbers n;
    n.mean = zelt::call(facet, &IStatistics::Mean, image);
    n.minimum = zelt::call(facet, &IStatistics::Minimum, image);
    n.maximum = zelt::call(facet, &IStatistics::Maximum, image);
    const double variance = zelt::call(facet, &IStatistics::SumSquares, image) /
                                (static_cast<double>(layout.width) * layout.height) -
                            n.mean * n.mean;
    n.deviation = std::isnan(variance) ? variance : std::sqrt(std::max(variance, 0.0));
    return n;
}

lit_area::lit_area(IPixmat2* light, const std::optional<Qor::Luxar::rectangle>& area)
    : width_(layout_of(light).width)
{
    const double threshold = quantiles(light, {0.999})[0] / 2;
    real_rows rows(light);
    lit_.reserve(rows.pixels());
    for (int y = 0; y < rows.height(); ++y) {
        const double* row = rows.row(y);
        for (int x = 0; x < width_; ++x) {
            const bool inside =
                !area || (x >= area->left && x < area->right && y >= area->top && y < area->bottom);
            const bool lit = inside && row[x] > threshold && row[x] > 0 && std::isfinite(row[x]);
            lit_.push_back(lit);
            count_ += lit;
        }
    }
}

double lit_area::share() const noexcept
{
    return lit_.empty() ? 0 : static_cast<double>(count_) / static_cast<double>(lit_.size());
}

double lit_area::mean(IPixmat2* image) const
{
    spread values;
    real_rows rows(image);
    for (int y = 0; y < rows.height(); ++y) {
        const double* row = rows.row(y);
        for (int x = 0; x < width_; ++x)
            if (this->row(y)[x] && std::isfinite(row[x])) values.add(row[x]);
    }
    return values.mean();
}

unevenness lit_area::measure(IPixmat2* image) const
{
    spread all, ratios;
    real_rows rows(image);
    std::vector<column_sum> columns(static_cast<size_t>(width_));
    for (int y = 0; y < std::min(radius, rows.height()); ++y) add_row(columns, rows.row(y), row(y), 1);
    for (int y = 0; y < rows.height(); ++y) {
        if (y + radius < rows.height()) add_row(columns, rows.row(y + radius), row(y + radius), 1);
        if (y > radius) add_row(columns, rows.row(y - radius - 1), row(y - radius - 1), -1);
        const double* values = rows.row(y);
        for (int x = 0; x < width_; ++x)
            if (row(y)[x] && std::isfinite(values[x])) all.add(values[x]);
        add_ratios(ratios, columns, values, row(y));
    }
    unevenness u{all.relative(), ratios.relative()};
    if (std::isnan(u.all)) u.fine = u.all;
    return u;
}

double finite_mean(IPixmat2* image)
{
    double sum = 0;
    size_t count = 0;
    real_rows rows(image);
    for (int y = 0; y < rows.height(); ++y) {
        const double* row = rows.row(y);
        for (int x = 0; x < rows.width(); ++x) {
            if (!std::isfinite(row[x])) continue;
            sum += row[x];
            ++count;
        }
    }
    return sum / static_cast<double>(count);
}

} // namespace cli
