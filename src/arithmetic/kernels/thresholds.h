// Pixels against limits: thresholds, contrast stretch, absolute values.
#pragma once

#include "arithmetic/kernels/thresholds_table.h"
#include "pixel/memory_2d.h"

#include <optional>

namespace Qor::Luxar::ZELT::Arithmetic {

/// An image as the routines below see it: depths of 9 to 15 bits are pixels of 16, 17 to 31 those of 32. Empty for
/// everything but Unsigned, Signed and Float of up to 64 bits, and for pixels that overlap their neighbours.
std::optional<memory_2d> view_by_depth_class(const image_layout& layout, uint8_t* data) noexcept;

// dst has the size and type of src, one of the eight real types, and may be src.

void threshold(const memory_2d& src, threshold_limits limits, const memory_2d& dst) noexcept;

/// Signed and float pixels only.
void absolute(const memory_2d& src, const memory_2d& dst) noexcept;

/// The limit between two classes of pixels, by the method of means on a histogram: a number of bins, deliberately
/// neither scaled nor shifted back to pixel values. Whole, with the low bits of the type, for integers.
double find_threshold(const memory_2d& src);

/// Stretches what lies between two fractions of the histogram over the range of the type, that of floats being 0
/// to 1. Any fractions: no stretch is done where they leave nothing between.
void normalize(const memory_2d& src, double low, double high, const memory_2d& dst);

} // namespace Qor::Luxar::ZELT::Arithmetic
