#include "conversions/overlap.h"

#include "pixmat/image.h"

namespace Qor::Luxar::ZELT {
namespace {

bool inside(const rectangle& r, const image_layout& layout) noexcept
{
    return r.left >= 0 && r.left < r.right && r.right <= layout.width && r.top >= 0 && r.top < r.bottom &&
           r.bottom <= layout.height;
}

/// The address of pixel (x, y) as a number: pointers into different memory have no order.
int64_t address(const image_pixels& p, int64_t x, int64_t y) noexcept
{
    return reinterpret_cast<intptr_t>(p.data) + p.layout.offset + x * p.layout.x_stride +
           y * p.layout.y_stride;
}

byte_span bytes_of(const image_pixels& p, const rectangle& r) noexcept
{
    image_layout part = p.layout;
    part.width = r.right - r.left;
    part.height = r.bottom - r.top;
    part.offset = 0;
    byte_span span = span_of(part);
    span.first += address(p, r.left, r.top);
    span.end += address(p, r.left, r.top);
    return span;
}

} // namespace

bool writes_over_source(const image_pixels& source, const image_pixels& target,
                        const conversion_regions& regions) noexcept
{
    if (!inside(regions.source, source.layout) || !inside(regions.target, target.layout)) return false;
    const bool stay = address(source, regions.source.left, regions.source.top) ==
                          address(target, regions.target.left, regions.target.top) &&
                      source.layout.x_stride == target.layout.x_stride &&
                      source.layout.y_stride == target.layout.y_stride;
    const byte_span read = bytes_of(source, regions.source);
    const byte_span written = bytes_of(target, regions.target);
    return !stay && read.first < written.end && written.first < read.end;
}

} // namespace Qor::Luxar::ZELT
