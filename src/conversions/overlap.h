// Conversions between images that share memory.
#pragma once

#include "conversions/regions.h"

namespace Qor::Luxar::ZELT {

/// Where an image's pixels are: its layout and the data of a lock.
struct image_pixels {
    image_layout layout;
    uint8_t* data;
};

/// Whether writing a pixel may change one that is still to be read. Pixels that land on themselves do no harm, and
/// regions that are empty or leave their image are not converted at all.
bool writes_over_source(const image_pixels& source, const image_pixels& target,
                        const conversion_regions& regions) noexcept;

} // namespace Qor::Luxar::ZELT
