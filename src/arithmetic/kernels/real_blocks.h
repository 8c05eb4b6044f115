// Blocks of real pixels as doubles: how kernels that compute in double reach any type and stride.
#pragma once

#include "arithmetic/kernels/arithmetic_levels.h"
#include "arithmetic/kernels/plane.h"

namespace Qor::Luxar::ZELT::Arithmetic {

struct alignas(64) real_block {
    double values[block_pixels];
};

/// Pixels as doubles. The count may pass that of a block.
inline void load_reals(const arithmetic_table& table, const plane& p, int64_t x, int64_t y, int32_t count,
                       double* to)
{
    table.load[static_cast<int>(computing::f64)][static_cast<int>(p.type)](p.at(x, y), p.x_stride, count, to);
}

/// Doubles as pixels: integers are truncated and keep their low bits, 0 for NaN and beyond 64 bits.
inline void store_reals(const arithmetic_table& table, const double* from, int32_t count, const plane& p,
                        int64_t x, int64_t y)
{
    table.store[static_cast<int>(computing::f64)][static_cast<int>(p.type)][static_cast<int>(rounding::wrap)](
        from, count, {}, p.at(x, y), p.x_stride);
}

/// body(x, y, count) for each block of an area.
template <class Body>
void for_each_block(size extent, Body&& body)
{
    for (int64_t y = 0; y < extent.height; ++y)
        for (int64_t x = 0; x < extent.width; x += block_pixels)
            body(x, y,
                 static_cast<int32_t>(extent.width - x < block_pixels ? extent.width - x : block_pixels));
}

} // namespace Qor::Luxar::ZELT::Arithmetic
