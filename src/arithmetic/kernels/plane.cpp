#include "arithmetic/kernels/plane.h"

#include <algorithm>
#include <cstring>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

/// The bytes from the lowest pixel to the highest, as numbers: pointers into different memory have no order.
struct byte_range {
    intptr_t first;
    intptr_t end;
};

byte_range bytes_of(const image& i, int64_t pixel_bytes)
{
    const plane p = plane_of(i, storage::none);
    const int64_t x_reach = (int64_t{i.layout.width} - 1) * p.x_stride;
    const int64_t y_reach = (int64_t{i.layout.height} - 1) * p.y_stride;
    const auto origin = reinterpret_cast<intptr_t>(p.first);
    return {origin + std::min<int64_t>(x_reach, 0) + std::min<int64_t>(y_reach, 0),
            origin + std::max<int64_t>(x_reach, 0) + std::max<int64_t>(y_reach, 0) + pixel_bytes};
}

bool share_memory(const image& a, int64_t a_bytes, const image& b, int64_t b_bytes)
{
    for (const image* i : {&a, &b})
        if (i->layout.width <= 0 || i->layout.height <= 0) return false;
    const byte_range x = bytes_of(a, a_bytes), y = bytes_of(b, b_bytes);
    return x.first < y.end && y.first < x.end;
}

bool same_pixels(const image& a, int64_t a_bytes, const image& b, int64_t b_bytes)
{
    return a.data + a.layout.offset == b.data + b.layout.offset && a.layout.x_stride == b.layout.x_stride &&
           a.layout.y_stride == b.layout.y_stride && a_bytes == b_bytes;
}

} // namespace

storage real_storage_of(const image_layout& layout) noexcept
{
    const storage s = storage_of(layout);
    return layout.bits < 8 || is_complex(s) ? storage::none : s;
}

image part_of(const image& whole, const rectangle& r) noexcept
{
    image part = whole;
    part.layout.width = r.right - r.left;
    part.layout.height = r.bottom - r.top;
    part.layout.offset = 0; // the product of 32 bits may be longer
    part.data = plane_of(whole, storage::none).at(r.left, r.top);
    return part;
}

pixel_fill::pixel_fill(const uint8_t* pixels, storage type) noexcept
    : block_bytes_(bytes_of(type) * block_pixels),
      bytes_alike_(std::memcmp(pixels, pixels + 1, static_cast<size_t>(bytes_of(type) - 1)) == 0)
{
    std::memcpy(block_, pixels, static_cast<size_t>(block_bytes_));
}

void pixel_fill::operator()(uint8_t* to, int64_t bytes) const noexcept
{
    if (bytes_alike_) {
        std::memset(to, *block_, static_cast<size_t>(bytes));
        return;
    }
    for (int64_t i = 0; i < bytes; i += block_bytes_)
        std::memcpy(to + i, block_, static_cast<size_t>(std::min(block_bytes_, bytes - i)));
}

stable_operand::stable_operand(const image& operand, int64_t pixel_bytes, const image& output,
                               int64_t output_bytes, bool in_step)
    : pixels_(operand)
{
    if (in_step && same_pixels(operand, pixel_bytes, output, output_bytes)) return;
    if (!share_memory(operand, pixel_bytes, output, output_bytes)) return;
    const int64_t width = operand.layout.width, height = operand.layout.height;
    if (width * pixel_bytes > INT32_MAX) throw std::bad_alloc(); // no layout tells of such rows
    copy_.resize(static_cast<size_t>(width * pixel_bytes * height));
    uint8_t* to = copy_.data();
    const plane from = plane_of(operand, storage::none);
    for (int64_t y = 0; y < height; ++y)
        for (int64_t x = 0; x < width; ++x, to += pixel_bytes)
            std::memcpy(to, from.at(x, y), static_cast<size_t>(pixel_bytes));
    pixels_.data = copy_.data();
    pixels_.layout.offset = 0;
    pixels_.layout.x_stride = static_cast<int32_t>(pixel_bytes);
    pixels_.layout.y_stride = static_cast<int32_t>(width * pixel_bytes);
}

} // namespace Qor::Luxar::ZELT::Arithmetic
