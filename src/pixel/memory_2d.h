// The typed view that every kernel reads and writes through. Plain data: copied freely, owns nothing.
#pragma once

#include "pixel/pixel_type.h"

namespace Qor::Luxar::ZELT {

/// Pixel (x, y) lies at data + offset + y * y_stride + x * x_stride. Nothing may be assumed about the strides.
struct memory_2d {
    pixel_type type;
    int32_t width;
    int32_t height;
    int64_t offset;
    int64_t x_stride;
    int64_t y_stride;
    uint8_t* data;

    /// The part of the view inside a rectangle; null means all of it. Left and top are deliberately not compared
    /// with 0: callers that need it check with fits() first.
    /// Throws std::invalid_argument "memory_2d::make_view: invalid rectangle".
    memory_2d make_view(const rectangle* r) const;
};

/// The view of an image's buffer. Throws for an encoding without pixel type.
memory_2d view_of(const image_layout& layout, void* data);

/// Copies one pixel array onto another of the same type and size, any strides on both sides.
/// Throws std::invalid_argument: unsupported layouts first, then "target pixel_type and source pixel_type not
/// identical", "target width and source width not identical", "target height and source height not identical".
void copy_pixels(const image_layout& target_layout, void* target, const image_layout& source_layout,
                 const void* source);

} // namespace Qor::Luxar::ZELT
