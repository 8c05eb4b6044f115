// Frames around images.
#pragma once

#include "arithmetic/kernels/binary.h"

namespace Qor::Luxar::ZELT::Arithmetic {

/// Copies src, but blanks a frame: `margin` pixels on the right and at the bottom, one more on the left and at the top,
/// get the lowest value of the type (Float: the least positive normal number). src and dst are real images of one size
/// and storage, and may share memory. Throws std::bad_alloc.
outcome set_margins(const image& src, int32_t margin, const image& dst);

/// dst(x, y) = src(x + left, y + top) where src has that pixel, else the pad value, truncated to the type. Both are real
/// images of one storage, and may share memory. Throws std::bad_alloc.
outcome extend(const image& src, coordinate<int32_t> left_top, double pad, const image& dst);

} // namespace Qor::Luxar::ZELT::Arithmetic
