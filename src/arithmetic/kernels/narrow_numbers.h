// How narrow integers and a number are computed in the width of a pixel.
#pragma once

#include "arithmetic/kernels/binary.h"

namespace Qor::Luxar::ZELT::Arithmetic {

/// Finds how every pixel of a narrow integer type plus a number, or minus it, is computed; false if it can not be so.
/// `reversed`: the number minus a pixel.
bool plan_sum(operation op, bool reversed, const number& b, storage type, rounding mode, range limits,
              narrow_sum* plan) noexcept;

/// The same for pixels times a number, or divided by it. Takes about a hundred nanoseconds.
bool plan_product(operation op, const number& b, storage type, rounding mode, range limits,
                  narrow_product* plan) noexcept;

} // namespace Qor::Luxar::ZELT::Arithmetic
