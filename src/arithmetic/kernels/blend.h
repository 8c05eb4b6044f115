// Blending by a mask.
#pragma once

#include "arithmetic/kernels/binary.h"
#include "arithmetic/kernels/compositing_table.h"

namespace Qor::Luxar::ZELT::Arithmetic {

/// How pixels of a real storage map to [0, 1]; Float stays as it is.
mask_range mask_range_of(storage mask) noexcept;

/// dst = base * (1 - w) + other * w, with w from the mask. All of one size and real storage. The operands may share
/// memory with dst. Throws std::bad_alloc.
outcome blend(const image& base, const image& other, const image& mask, const image& dst);

} // namespace Qor::Luxar::ZELT::Arithmetic
