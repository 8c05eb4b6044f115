#include "arithmetic/kernels/pixel_bins.h"
#include "arithmetic/kernels/thresholds.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

enum class kind { narrow, wide, real };

kind kind_of(pixel_type t)
{
    if (t == pixel_type::float_32 || t == pixel_type::float_64) return kind::real;
    return GetPixmatBits(t) < 32 ? kind::narrow : kind::wide;
}

/// One bin for each value where there are no more than 65536 of them; floats have 1024 bins at least. Infinities
/// make a scale of 0 or NaN, which puts all pixels into the first bin.
binning choose_bins(kind k, extremes e)
{
    const double range = e.greatest - e.least;
    if (k == kind::narrow) return {e.least, 1, static_cast<int32_t>(range)};
    if (range + 1 >= 65537) return {e.least, 65536.0 / (range + 1), 65535};
    if (k == kind::real && !(range + 1 >= 1024)) return {e.least, 1023 / range, 1023};
    return {e.least, 1, static_cast<int32_t>(range)};
}

int32_t bin_of(double value, pixel_type type, binning b)
{
    uint16_t bin = 0;
    switch_scalar(type, [&]<class T>(pixel<T>) {
        const T p = static_cast<T>(value);
        threshold_level().bins[index(difference::real)][index(type)](reinterpret_cast<const uint8_t*>(&p),
                                                                     sizeof p, 1, b, &bin);
    });
    return bin;
}

struct bounds {
    binning bins;
    int32_t low = 0;
    int32_t high = 0; ///< not above low: nothing to stretch
};

/// The bin in which the pixels become more than low * pixels, and from there on the one in which they become at
/// least high * pixels.
bounds find_bounds(const memory_2d& src, double pixels, double low, double high)
{
    const double below = std::floor(pixels * low);
    const double within = std::ceil(pixels * high);
    if (!(below < pixels && within >= 1)) return {}; // NaN, too
    const bool is_whole = below == 0 && within >= pixels;
    bounds found;
    extremes e{};
    if (!is_whole && is_cheap_by_value(src)) {
        found.bins = bins_by_value(src.type);
    } else {
        e = find_extremes(src);
        found.bins = choose_bins(kind_of(src.type), e);
    }
    if (is_whole) { // the ends are known without a histogram
        found.high = bin_of(e.greatest, src.type, found.bins);
        return found;
    }
    const pixel_bins bins(src, difference::real, found.bins);
    found.low = bins.at_rank(static_cast<int64_t>(below));
    found.high = std::max(found.low, bins.at_rank(static_cast<int64_t>(std::min(within, pixels)) - 1));
    return found;
}

stretch stretch_between(const bounds& found, pixel_type type)
{
    const binning& b = found.bins;
    double span = 0, top = 0;
    switch_scalar(type, [&]<class T>(pixel<T>) {
        top = static_cast<double>(std::numeric_limits<T>::max());
        span = top - static_cast<double>(std::numeric_limits<T>::lowest());
    });
    if (found.high <= found.low) return {0, 1, top};
    switch (kind_of(type)) {
    case kind::narrow:
        return {b.minimum + found.low, span / (found.high - found.low),
                std::min(b.minimum + found.high + 1, top)};
    case kind::wide: { // a whole factor, deliberately
        const double first = b.minimum + std::trunc(found.low / b.scale);
        const double end = b.minimum + std::trunc(found.high / b.scale);
        return {first, static_cast<double>(4294967295u / static_cast<uint32_t>(end - first)), top};
    }
    default: {
        const double first = b.minimum + found.low / b.scale;
        const double end = b.minimum + found.high / b.scale;
        return {first, 1 / (end - first), top};
    }
    }
}

} // namespace

void normalize(const memory_2d& src, double low, double high, const memory_2d& dst)
{
    const long_size all = joined_extent(src);
    const double pixels = static_cast<double>(all.width) * static_cast<double>(all.height);
    if (pixels == 0) return;
    const bounds found = find_bounds(src, pixels, low, high);
    threshold_level().stretched[index(src.type)](grid_of(src), grid_of(dst), joined_extent(src, dst),
                                                 stretch_between(found, src.type));
}

} // namespace Qor::Luxar::ZELT::Arithmetic
