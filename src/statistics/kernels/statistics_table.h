// What the loops of the statistics family see and fill, and the table of them that each instruction-set level
// exports. Plain data only: shared by code built for different processors.
#pragma once

#include "pixel/memory_2d.h"

namespace Qor::Luxar::ZELT {

/// The samples of a scan: every step-th pixel of every step-th row, from the first pixel on.
struct sample_grid {
    const uint8_t* first;
    int32_t width; ///< in pixels, as height
    int32_t height;
    int64_t x_stride; ///< in bytes from pixel to pixel, as y_stride
    int64_t y_stride;
    int32_t step;
    int32_t pixel_bytes; ///< what a pixel has in memory; fewer than its element has for odd depths
};

/// Extremes and sums of a scan, coordinates counted from the first pixel.
struct scan_result {
    double minimum;
    double maximum;
    uint64_t minimum_count;
    uint64_t maximum_count;
    int32_t minimum_x, minimum_y;
    int32_t maximum_x, maximum_y;
    double sum;
    double sum_squares;
    double moment_x; ///< the sum of x * value
    double moment_y; ///< the sum of y * value
};

using scan_function = void (*)(const sample_grid&, scan_result&);

struct statistics_table {
    scan_function scan_u8, scan_u16, scan_u32, scan_i8, scan_i16, scan_i32, scan_f32, scan_f64;
};

} // namespace Qor::Luxar::ZELT
