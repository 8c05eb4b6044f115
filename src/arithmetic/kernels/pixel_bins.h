// A histogram of an image, and what the routines behind thresholds and normalisation share.
#pragma once

#include "arithmetic/kernels/thresholds_levels.h"
#include "pixel/memory_2d.h"

#include <vector>

namespace Qor::Luxar::ZELT::Arithmetic {

constexpr int index(pixel_type t) { return static_cast<int>(t); }
constexpr int index(difference d) { return static_cast<int>(d); }

inline pixel_grid grid_of(const memory_2d& m) { return {m.data + m.offset, m.x_stride, m.y_stride}; }

/// Rows that follow each other without a gap, in all views, are one row. Without pixels, both are 0.
template <class... Views>
long_size joined_extent(const memory_2d& first, const Views&... others)
{
    const int64_t width = first.width, height = first.height;
    if (width <= 0 || height <= 0) return {0, 0};
    const auto is_packed = [=](const memory_2d& m) { return m.y_stride == m.x_stride * width; };
    if ((is_packed(first) && ... && is_packed(others))) return {width * height, 1};
    return {width, height};
}

inline extremes find_extremes(const memory_2d& image)
{
    return threshold_level().find_extremes[index(image.type)](grid_of(image), joined_extent(image));
}

/// True where a bin for each value of an integer type costs less than to look for the extremes first.
bool is_cheap_by_value(const memory_2d& image);

/// A bin for each value of an 8- or 16-bit type, from the lowest on.
binning bins_by_value(pixel_type type);

/// The pixels of an image by their bins: how often each one occurs, or, for few pixels, the bins themselves, since
/// looking through them is then cheaper than looking through bins.
class pixel_bins {
public:
    /// The least pixel is in bin 0 if it is the minimum.
    pixel_bins(const memory_2d& image, difference d, binning b);

    /// The first and the last bin that has a pixel.
    int32_t first() const noexcept { return at_rank(0); }
    int32_t last() const noexcept;

    /// Moves the pixels of each bin: to what is scale times its distance from the first one, truncated and limited.
    void rescale(double scale, int32_t last_bin);

    /// The first bin up to which there are more than `rank` pixels; fewer than all.
    int32_t at_rank(int64_t rank) const noexcept;

    struct part {
        int64_t pixels = 0;
        int64_t sum = 0; ///< of their bins
    };
    part all() const noexcept { return below(last_bin_ + 1); }
    part below(int32_t bin) const noexcept;

private:
    static constexpr int64_t few = 4096;

    void count(const memory_2d& image, long_size extent, bins_function to_bins, binning b);

    int32_t last_bin_;
    int64_t listed_ = 0;
    uint16_t list_[few];
    std::vector<int64_t> counts_; ///< empty when pixels are listed
};

} // namespace Qor::Luxar::ZELT::Arithmetic
