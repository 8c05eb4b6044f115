// Shading of colour images.
#pragma once

#include "arithmetic/kernels/binary.h"

namespace Qor::Luxar::ZELT::Arithmetic {

/// Colour pixels of three or four bytes, red or blue first.
bool has_colour_bytes(const image_layout& layout) noexcept;

/// Each of the first three bytes c of a pixel becomes pow(c / 255, 1 - weight) * 255 * pow(m, weight), with m from the
/// mask; a fourth byte stays as it is in dst. Images of one size; image and dst of one format, the mask real.
/// The operands may share memory with dst. Throws std::bad_alloc.
outcome modulate(const image& colours, const image& mask, double weight, const image& dst);

} // namespace Qor::Luxar::ZELT::Arithmetic
