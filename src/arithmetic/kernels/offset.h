// An image added to another one at a position.
#pragma once

#include "arithmetic/kernels/binary.h"

namespace Qor::Luxar::ZELT::Arithmetic {

/// Real images, or two of one 24-bit colour encoding.
bool takes_offset(const image_layout& a, const image_layout& b) noexcept;

/// Whether any pixel of b at a position may touch a. False for NaN.
bool reaches(const image_layout& a, const image_layout& b, coordinate<double> position) noexcept;

/// a = fa * a + fb * (b, between pixels) where the grid of b touches a. Outside it a stays as it is. For
/// images and a position that the two functions above say yes to; b may share memory with a. Throws std::bad_alloc.
void add_offset(const image& a, const image& b, coordinate<double> position, double fa, double fb);

/// dst = fa * a, and + fb * (ratio * b) where b lies. All are real; dst has the size and storage of a. The operands may
/// share memory with dst. Throws std::bad_alloc.
outcome add_integer_offset(const image& a, const image& b, coordinate<int32_t> position, double fa, double fb,
                           const image& dst);

} // namespace Qor::Luxar::ZELT::Arithmetic
