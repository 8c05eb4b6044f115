#include "correct_pixels.h"

#include <algorithm>
#include <cmath>

namespace cli {

real_rows::real_rows(IPixmat2* image) : rows_(image)
{
    with_pixel_type(rows_.layout(), [](auto) {});
    row_.resize(static_cast<size_t>(std::max(width(), 0)));
}

const double* real_rows::row(int y)
{
    with_pixel_type(rows_.layout(), [&]<class T>(T) {
        for_pixels<T>(rows_.row(y), width(),
                      [&](int x, T value) { row_[static_cast<size_t>(x)] = static_cast<double>(value); });
    });
    return row_.data();
}

std::vector<double> quantiles(IPixmat2* image, const std::vector<double>& shares, const uint8_t* chosen)
{
    // Every n-th pixel, n odd so that no pattern of even period is met in step.
    constexpr size_t enough = 1 << 20;
    real_rows rows(image);
    const size_t step = (rows.pixels() / enough) | 1;
    std::vector<double> values;
    values.reserve(rows.pixels() / step + 1);
    size_t next = 0;
    for (int y = 0; y < rows.height(); ++y) {
        const double* row = rows.row(y);
        for (; next < static_cast<size_t>(rows.width()); next += step)
            if (std::isfinite(row[next]) && (!chosen || chosen[next])) values.push_back(row[next]);
        next -= static_cast<size_t>(rows.width());
        if (chosen) chosen += rows.width();
    }
    std::vector<double> found;
    for (double share : shares) {
        if (values.empty()) {
            found.push_back(std::nan(""));
            continue;
        }
        const auto place = static_cast<size_t>(share * static_cast<double>(values.size() - 1) + 0.5);
        std::nth_element(values.begin(), values.begin() + static_cast<ptrdiff_t>(place), values.end());
        found.push_back(values[place]);
    }
    return found;
}

} // namespace cli
