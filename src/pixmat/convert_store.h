// How the working type of a block becomes pixels.
#pragma once

#include "pixmat/convert_blocks.h"

namespace Qor::Luxar::Convert {

/// To integers: rounded half away from zero, limited to the range, NaN is 0. To floats: the value. To full complex:
/// an imaginary part of zero. To colour: a grey limited to 8 bits, alpha 255. Null for other types.
store_pixels store_value(pixel_type type, working kind) noexcept;
/// To integers: truncated, low 64 bits, then low bits; NaN and what no 64-bit integer holds are 0. No colour.
store_pixels store_cast(pixel_type type, working kind) noexcept;
store_pixels store_pair(pixel_type type) noexcept;
store_pixels store_colour(pixel_type type) noexcept;

/// For adjacent pixels: loops without a block in between for the pairs that big images use, else null.
convert_row direct_value(pixel_type from, pixel_type to) noexcept;

/// The integer range of a nominal depth.
nominal_range range_of(pixel_type type, int32_t bits) noexcept;

} // namespace Qor::Luxar::Convert
