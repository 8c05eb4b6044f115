// How pixels become the working type of a block.
#pragma once

#include "pixmat/convert_blocks.h"

namespace Qor::Luxar::Convert {

struct loader {
    load_pixels load = nullptr; ///< null: pixels of this type cannot be loaded so
    working kind = working::narrow;
};

/// Numbers as they are; of full complex pixels the real part, of colours the luminance
/// 0.299 R + 0.587 G + 0.114 B.
loader load_value(pixel_type type) noexcept;
/// Real and imaginary part of a complex or half-complex pixel.
loader load_pair(pixel_type type) noexcept;
/// The channels of a colour; three bytes get alpha 255.
loader load_colour(pixel_type type) noexcept;

/// Turns values of any kind but pairs and colours into doubles; in place is fine for real ones.
void to_real(working kind, const void* values, int count, double* out) noexcept;

} // namespace Qor::Luxar::Convert
