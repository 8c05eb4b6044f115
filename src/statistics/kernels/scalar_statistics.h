// The scalar statistics of an image, all found in one pass.
#pragma once

#include "pixel/memory_2d.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace Qor::Luxar::ZELT::Statistics {

/// What a caller wants to know. The pass finds everything but the histogram whatever is asked for.
enum statistic_flag : uint32_t {
    flag_minimum = 1,
    flag_maximum = 2,
    flag_mean = 4,
    flag_sum_squares = 8,
    flag_range_min = 16,
    flag_range_max = 32,
    flag_histogram = 64,
    flag_minimum_count = 128,
    flag_maximum_count = 256,
    flag_minimum_x = 512,
    flag_minimum_y = 1024,
    flag_maximum_x = 2048,
    flag_maximum_y = 4096,
    flag_gravity_x = 8192,
    flag_gravity_y = 16384,
};

struct image_statistics {
    double minimum = 0;
    uint64_t minimum_count = 0;
    int32_t minimum_x = 0;
    int32_t minimum_y = 0;
    double maximum = 0;
    uint64_t maximum_count = 0;
    int32_t maximum_x = 0;
    int32_t maximum_y = 0;
    double gravity_x = 0;
    double gravity_y = 0;
    double mean = 0;
    double sum_squares = 0;
    double range_min = 0;
    double range_max = 0;
    std::vector<uint32_t> histogram; ///< bins, for flag_histogram only

    bool minimum_valid = false;
    bool maximum_valid = false;
    bool gravity_valid = false;
    bool mean_valid = false;
    bool sum_squares_valid = false;
    bool range_min_valid = false;
    bool range_max_valid = false;
};

/// How the statistics see the pixels of a format: also depths that have no pixel type.
struct value_format {
    pixel_type element; ///< one of the eight real types
    int32_t pixel_bytes;
    double range_min;
    double range_max;
};

/// Empty for every format that is not one of unsigned and signed integers of 1 to 32 bits, float and double.
std::optional<value_format> find_value_format(PixmatEncoding encoding, int32_t bits);

/// The value range that a declared format has, for any encoding.
double range_minimum(PixmatEncoding encoding, int32_t bits);
double range_maximum(PixmatEncoding encoding, int32_t bits);

/// Fills the record from every step-th pixel of every step-th row of the area, which must lie in the image.
/// Positions count from the image's corner.
///
/// Extremes   start at the pixel in the area's corner with a count of 1, which the scan counts again. An area
///            without pixels takes the nearest pixel of the image, an image without pixels NaN and counts of 0.
/// Sums       of integers are those of adding doubles one by one in scan order; of float and double those of
///            16 lanes in a row (sample i goes to lane i mod 16), folded by halves and added row by row.
///            The same at every instruction-set level and stride.
void measure(const image_layout& image, const void* data, const rectangle& area, int32_t step,
             const value_format& format, image_statistics& record);

} // namespace Qor::Luxar::ZELT::Statistics
