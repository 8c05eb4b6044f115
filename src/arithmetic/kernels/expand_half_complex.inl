// The loops behind ExpandHalfComplex.
#pragma once

#include "pixel/rows.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {

template <class Part, class Src, class Dst>
void expand_half_complex(Src src, Dst dst)
{
    using P = complex_pixel<Part>;
    const int64_t width = dst.width;
    for (int32_t y = 0; y < src.height; ++y) {
        const auto half = src[y];
        const auto full = dst[y];
        const auto mirrored = dst[y == 0 ? 0 : src.height - y];
        for (int64_t x = 0; x <= width / 2; ++x) full[x] = static_cast<P>(half[x]);
        for (int64_t x = 1; x < width / 2; ++x) {
            const P p = half[x];
            mirrored[width - x] = P{p.real, -p.imaginary};
        }
    }
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
