// Which part of the source goes where in the destination.
#pragma once

#include "zelt/pixmat/layout.h"

namespace Qor::Luxar::ZELT {

struct conversion_regions {
    rectangle source;
    coordinate<int32_t> target_point;
    rectangle target;
};

/// `area` null means the whole source; `point` null means (0, 0) without clipping. A region may come out with a width or
/// height of 0 or less: there is nothing to convert then.
conversion_regions compute_regions(const image_layout& source, const image_layout& target,
                                   const rectangle* area, const coordinate<int32_t>* point) noexcept;

} // namespace Qor::Luxar::ZELT
