// The loops of thresholds, normalisation and absolute values, as plain data shared by all instruction-set levels.
#pragma once

#include <cstdint>

namespace Qor::Luxar::ZELT::Arithmetic {

/// Where pixels lie: the first one and the distances in bytes to its neighbours.
struct pixel_grid {
    uint8_t* first;
    int64_t x_stride;
    int64_t y_stride;
};

/// An extent to walk; long, since rows that follow each other without a gap count as one.
struct long_size {
    int64_t width;
    int64_t height;
};

/// Below low_limit becomes low_value, else above high_limit becomes high_value. Every value of the eight real types
/// is exact as a double.
struct threshold_limits {
    double low_limit;
    double low_value;
    double high_limit;
    double high_value;
};

/// value = (p - offset) * factor, from the bottom of the type on.
struct stretch {
    double offset;
    double factor;
    double end; ///< integers of 8 and 16 bits: from here on the value is the top of the type; offset < end
};

/// Empty: least above greatest. NaN is neither.
struct extremes {
    double least;
    double greatest;
};

/// The bin of p is (p - minimum) * scale, truncated and limited to 0 to last; NaN is 0.
struct binning {
    double minimum;
    double scale;
    int32_t last; ///< at most 65535
};

/// src and dst may be the same pixels.
using threshold_function = void (*)(pixel_grid src, pixel_grid dst, long_size extent,
                                    threshold_limits limits);
using stretch_function = void (*)(pixel_grid src, pixel_grid dst, long_size extent, stretch s);
using absolute_function = void (*)(pixel_grid src, pixel_grid dst, long_size extent);
using extremes_function = extremes (*)(pixel_grid src, long_size extent);
/// The bins of pixels in a row.
using bins_function = void (*)(const uint8_t* from, int64_t stride, int64_t count, binning b, uint16_t* bins);

/// How p - minimum is taken: as real numbers, or as the pixel's type does it (float rounds, 32-bit integers wrap).
enum class difference { real, of_type };

/// Numbers of pixel_type are the index; there is nothing for 64-bit integers.
struct threshold_table {
    static constexpr int types = 10;
    threshold_function threshold[types];
    stretch_function stretched[types];
    absolute_function absolute[types];
    extremes_function find_extremes[types];
    bins_function bins[2][types];
};

} // namespace Qor::Luxar::ZELT::Arithmetic
