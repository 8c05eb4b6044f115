// Dark and gain references made of recorded frames. They run on the calling thread.
#pragma once

#include "flatfield/kernels/encoding_key.h"

namespace Qor::Luxar::ZELT::FlatField {

/// dst = src - offset, wrapping in the width of the type. Same kind, or unsigned to signed of the same width.
outcome to_dark_ref(const image& dst, const image& src, int32_t offset);

/// dst = norm / src as a gain: Float 32 of any kind of source, Float 64 of a source of eight bytes, read as
/// such, or a fixed-point map, Unsigned of an unsigned source of the same width. A norm that is not >= 0 is
/// replaced by the mean of the source.
outcome to_gain_ref(const image& dst, const image& src, double norm, int32_t scale_factor);

} // namespace Qor::Luxar::ZELT::FlatField
