// What the loops of the convolution are told, and the table of them that each instruction-set level exports. Plain data
// only: shared by code built for different processors.
#pragma once

#include "filters/kernels/padded_row.h"

namespace Qor::Luxar::ZELT::Filters {

/// Neighbouring output rows, computed together: each source row is then read once for all of them.
struct convolve_rows {
    /// The padded source rows that they need, the lowest first: output_rows + kernel_height - 1 of them.
    const double* const* rows;
    int32_t output_rows; ///< 1, 2 or 4
    const double* kernel;
    int64_t kernel_width;
    int64_t kernel_height;
    int64_t step;     ///< numbers from pixel to pixel
    int64_t elements; ///< numbers of an output row
};

/// How far the loops read and write beyond the numbers that they are asked for.
inline constexpr int64_t convolve_slack = 64;

struct convolve_table {
    using load_function = void (*)(const padded_source&, int64_t y, double* to);
    using sum_function = void (*)(const convolve_rows&, double* const* to);
    using store_function = void (*)(const double* sums, int64_t count, uint8_t* to);

    // By type: unsigned 8, 16, 32 bit, signed 8, 16, 32 bit, float, double.
    load_function load[8];
    sum_function sum;
    store_function store[8];
};

} // namespace Qor::Luxar::ZELT::Filters
