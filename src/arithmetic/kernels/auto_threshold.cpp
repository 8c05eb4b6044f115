#include "arithmetic/kernels/pixel_bins.h"
#include "arithmetic/kernels/thresholds.h"

#include <cmath>
#include <limits>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

template <class T>
constexpr bool is_narrow = std::is_integral_v<T> && sizeof(T) < 4;

/// The span from least to greatest as the pixel's type has it: float rounds, 32-bit integers wrap.
template <class T>
double range_of(extremes e)
{
    const T least = static_cast<T>(e.least), greatest = static_cast<T>(e.greatest);
    if constexpr (std::is_floating_point_v<T> || is_narrow<T>)
        return static_cast<double>(greatest - least);
    else
        return static_cast<T>(static_cast<uint32_t>(greatest) - static_cast<uint32_t>(least));
}

/// Deliberately not asked of unsigned bytes.
template <class T>
bool fills_type(double range)
{
    using limits = std::numeric_limits<T>;
    if constexpr (is_narrow<T> && !std::is_same_v<T, uint8_t>)
        return range >= limits::max() - limits::min();
    else
        return false;
}

/// Narrow ranges are spread over 128 bins, others have a bin for each value. From 65537 values on the scale, a whole
/// quotient, is 0 and everything falls into one bin; so does what spans the whole of 16 or signed 8 bits nearly.
template <class T>
binning choose_bins(extremes e)
{
    const double range = range_of<T>(e);
    if (range >= 65536) return {e.least, 0, 65535};
    // Wrapped ranges may be negative. Without numbers, or with infinities alone, there is no range.
    const auto values = std::isfinite(range) ? static_cast<int64_t>(range) + 1 : 0;
    if (range >= 127 && !fills_type<T>(range)) return {e.least, 1, static_cast<int32_t>(values - 1)};
    if constexpr (sizeof(T) == 1) return {e.least, static_cast<double>(128 / values), 127};
    return {e.least, 128.0 / static_cast<double>(values), 127};
}

/// Moves the limit to the middle between the means of both sides until it rests.
double iterate(const pixel_bins& bins)
{
    const auto mean = [](pixel_bins::part p, double former) {
        return p.pixels > 0 ? static_cast<double>(p.sum) / static_cast<double>(p.pixels) : former;
    };
    const pixel_bins::part all = bins.all();
    double lower_mean = 0; // the first bin, which always has pixels
    double upper_mean = bins.last();
    double limit = (lower_mean + upper_mean) * 0.5;
    for (;;) {
        const auto lower = bins.below(static_cast<int32_t>(limit));
        lower_mean = mean(lower, lower_mean);
        upper_mean = mean({all.pixels - lower.pixels, all.sum - lower.sum}, upper_mean);
        const double next = (lower_mean + upper_mean) * 0.5;
        const bool moved = std::fabs(limit - next) > 0.1;
        limit = next;
        if (!moved) return limit;
    }
}

} // namespace

double find_threshold(const memory_2d& src)
{
    double limit = 0;
    if (src.width <= 0 || src.height <= 0) return limit; // no bin has a pixel
    switch_scalar(src.type, [&]<class T>(pixel<T>) {
        if (is_cheap_by_value(src)) {
            const binning b = bins_by_value(src.type);
            pixel_bins bins(src, difference::real, b);
            const binning chosen = choose_bins<T>({b.minimum + bins.first(), b.minimum + bins.last()});
            bins.rescale(chosen.scale, chosen.last);
            limit = iterate(bins);
        } else {
            const extremes e = find_extremes(src);
            limit = iterate(pixel_bins(src, difference::of_type, choose_bins<T>(e)));
        }
        if constexpr (std::is_integral_v<T>)
            limit = static_cast<T>(static_cast<int64_t>(limit));
        else
            limit = static_cast<T>(limit);
    });
    return limit;
}

} // namespace Qor::Luxar::ZELT::Arithmetic
