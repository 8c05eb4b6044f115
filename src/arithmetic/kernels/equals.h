// Whether two images have the same pixels.
#pragma once

#include "arithmetic/kernels/binary.h"

namespace Qor::Luxar::ZELT::Arithmetic {

/// Images of one size, encoding and depth: integers and colours by their stored bytes, Float and complex by value, so
/// that NaN differs from itself and 0 equals -0.
outcome equals(const image& a, const image& b, bool* same) noexcept;

} // namespace Qor::Luxar::ZELT::Arithmetic
