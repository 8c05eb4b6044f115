// From a half-complex spectrum to the full one.
#pragma once

#include "pixel/memory_2d.h"

namespace Qor::Luxar::ZELT {

/// Writes the full spectrum of logical width W: each stored column x to itself and, for 1 <= x < W/2, its conjugate
/// to column W - x of the mirrored row. For an odd W the column (W + 1)/2 has no writer and stays as it is. The two
/// views must not share memory. Throws std::invalid_argument, nothing is written then:
/// "ExpandHalfComplex: src and dst size mismatch" unless the heights agree and dst.width / 2 + 1 is src.width;
/// "ExpandHalfComplex: unsupported pixel type" unless dst is complex of the precision of a half-complex src.
void ExpandHalfComplex(const memory_2d& src, const memory_2d& dst);

} // namespace Qor::Luxar::ZELT
