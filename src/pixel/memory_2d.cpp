#include "pixel/memory_2d.h"

#include "pixel/rows.h"

#include <cstring>

namespace Qor::Luxar::ZELT {
namespace {

using namespace ZELT_LEVEL;

template <size_t Bytes>
struct element {
    uint8_t byte[Bytes];
};

template <class Element>
void copy_elements(const memory_2d& target, const memory_2d& source)
{
    with_rows<Element, Element>(target, source,
                                [width = source.width, height = source.height](auto to, auto from) {
                                    for (int32_t y = 0; y < height; ++y) {
                                        const auto target_row = to[y];
                                        const auto source_row = from[y];
                                        for (int32_t x = 0; x < width; ++x)
                                            target_row[x] = static_cast<Element>(source_row[x]);
                                    }
                                });
}

void copy_rows(const memory_2d& target, const memory_2d& source, int64_t pixel_bytes)
{
    if (source.width <= 0) return;
    for (int64_t y = 0; y < source.height; ++y)
        std::memmove(target.data + target.offset + y * target.y_stride,
                     source.data + source.offset + y * source.y_stride,
                     static_cast<size_t>(source.width * pixel_bytes));
}

} // namespace

memory_2d memory_2d::make_view(const rectangle* r) const
{
    if (!r) return *this;
    if (r->left > r->right || r->right > width || r->top > r->bottom || r->bottom > height)
        throw std::invalid_argument("memory_2d::make_view: invalid rectangle");
    memory_2d part = *this;
    // A left edge far below 0 makes a width beyond 32 bits; such a view is as unusable as it was asked for.
    part.width = static_cast<int32_t>(static_cast<uint32_t>(r->right) - static_cast<uint32_t>(r->left));
    part.height = static_cast<int32_t>(static_cast<uint32_t>(r->bottom) - static_cast<uint32_t>(r->top));
    part.offset += r->top * y_stride + r->left * x_stride;
    return part;
}

memory_2d view_of(const image_layout& layout, void* data)
{
    return {GetPixelType(layout.encoding, layout.bits),
            layout.width,
            layout.height,
            layout.offset,
            layout.x_stride,
            layout.y_stride,
            static_cast<uint8_t*>(data)};
}

void copy_pixels(const image_layout& target_layout, void* target, const image_layout& source_layout,
                 const void* source)
{
    const memory_2d to = view_of(target_layout, target);
    const memory_2d from = view_of(source_layout, const_cast<void*>(source)); // read only
    if (to.type != from.type)
        throw std::invalid_argument("target pixel_type and source pixel_type not identical");
    if (to.width != from.width) throw std::invalid_argument("target width and source width not identical");
    if (to.height != from.height)
        throw std::invalid_argument("target height and source height not identical");
    const int64_t bytes = GetPixmatBits(to.type) / 8;
    if (to.x_stride == bytes && from.x_stride == bytes) return copy_rows(to, from, bytes);
    switch (bytes) {
    case 1: return copy_elements<element<1>>(to, from);
    case 2: return copy_elements<element<2>>(to, from);
    case 3: return copy_elements<element<3>>(to, from);
    case 4: return copy_elements<element<4>>(to, from);
    case 8: return copy_elements<element<8>>(to, from);
    case 16: return copy_elements<element<16>>(to, from);
    default: throw std::invalid_argument("Unsupported pixel_type");
    }
}

} // namespace Qor::Luxar::ZELT
