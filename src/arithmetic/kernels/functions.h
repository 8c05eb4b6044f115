// Functions of single pixels, for the facets.
#pragma once

#include "pixel/memory_2d.h"

namespace Qor::Luxar::ZELT::Arithmetic {

enum class angle_function { sine, cosine, tangent, arc_sine, arc_cosine, arc_tangent };

/// A function of each pixel, as a Float 32 image. Throws std::invalid_argument with the texts of IMath.
void map(angle_function f, const memory_2d& src, const memory_2d& dst);
/// The angle of the point (x, y) for each pair of pixels.
void arc_tangent_2(const memory_2d& y, const memory_2d& x, const memory_2d& dst);

/// Both views have the same Float type and size.
void exponential(const memory_2d& src, const memory_2d& dst);
void logarithm(const memory_2d& src, const memory_2d& dst);
/// Throws std::invalid_argument with the texts of IBasicOps2::Power.
void power(const memory_2d& src, double exponent, const memory_2d& dst);

} // namespace Qor::Luxar::ZELT::Arithmetic
