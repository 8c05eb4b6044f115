// What the loops of the convolution are told, and the table of them that each instruction-set level exports. Plain data
// only: shared by code built for different processors.
#pragma once

#include "filters/kernels/padded_row.h"

namespace Qor::Luxar::ZELT::Filters {

/// Neighbouring output rows, computed together: each source row is then read once for all of them.
template <class E>
struct convolve_rows {
    /// The padded source rows that they need, the lowest first: output_rows + kernel_height - 1 of them.
    const E* const* rows;
    int32_t output_rows; ///< 1 or 4
    const double* kernel;
    int64_t kernel_width;
    int64_t kernel_height;
    int64_t step;            ///< numbers from pixel to pixel
    int64_t elements;        ///< numbers of an output row
    const uint8_t* next_row; ///< the source's, that will be asked for next; null when that is not known
    int64_t next_stride;
};

/// How far the loops read beyond the numbers that they are asked for.
inline constexpr int64_t convolve_slack = 64;

/// The loops for one type of pixels, read as numbers of E.
template <class E>
struct convolve_loops {
    void (*load)(const padded_source&, int64_t y, E* to);
    /// Fill the output rows, the lowest first.
    struct sums {
        void (*any_size)(const convolve_rows<E>&, uint8_t* const* to);
        void (*size_3x3)(const convolve_rows<E>&, uint8_t* const* to);
    };
    sums sum;
    sums sum_exact; ///< for kernels whose products with pixels are exact
};

struct convolve_table {
    convolve_loops<double> u8, u16, u32, i8, i16, i32, f32, f64;
    /// For 3 x 3: floats hold these types as well, and reading half as much memory counts more than
    /// conversions.
    convolve_loops<float> small_u8, small_u16, small_i8, small_i16, small_f32;
};

} // namespace Qor::Luxar::ZELT::Filters
