// A source row as filters read it: numbers side by side, continued beyond both ends by the pixel there.
#pragma once

#include <cstdint>

namespace Qor::Luxar::ZELT::Filters {

/// What a padded row is made of, in pixels: `left` times the first pixel, `count` pixels from `from` on,
/// `right` times the last one.
struct row_padding {
    int64_t left;
    int64_t from;
    int64_t count;
    int64_t right;
};

/// A source image as padded rows are read from it.
struct padded_source {
    const uint8_t* first;
    int64_t x_stride; ///< in bytes, as y_stride
    int64_t y_stride;
    int32_t width;
    int32_t height;
    int32_t channels; ///< numbers of a pixel
    row_padding padding;
};

} // namespace Qor::Luxar::ZELT::Filters
