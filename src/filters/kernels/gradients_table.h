// What the loops of the gradients are told, and the table of them that each instruction-set level exports. Plain data
// only: shared by code built for different processors.
#pragma once

#include "filters/kernels/padded_row.h"

namespace Qor::Luxar::ZELT::Filters {

/// Three padded source rows, from above to below, one pixel longer at either end than the output row.
template <class E>
struct gradient_rows {
    const E* row[3];
    int64_t step;            ///< numbers from pixel to pixel
    int64_t elements;        ///< numbers of an output row
    const uint8_t* next_row; ///< the source's, that will be asked for next; null when that is not known
};

template <class E>
struct gradient_loops {
    void (*load)(const padded_source&, int64_t y, E* to);
    void (*sobel)(const gradient_rows<E>&, uint8_t* to);
    void (*prewitt)(const gradient_rows<E>&, uint8_t* to);
    void (*derivative)(const gradient_rows<E>&, uint8_t* to);
};

/// Pixels are read as numbers in which their differences are exact, or which are their own type.
struct gradients_table {
    gradient_loops<int16_t> u8, i8;
    gradient_loops<int32_t> u16, i16;
    gradient_loops<double> u32, i32, f64;
    gradient_loops<float> f32;
};

} // namespace Qor::Luxar::ZELT::Filters
