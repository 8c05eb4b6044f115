#include "arithmetic/kernels/padding.h"

#include "arithmetic/kernels/plane.h"

#include <algorithm>
#include <cstring>
#include <limits>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

constexpr int32_t wrap = 2; // the rounding mode

double lowest_of(storage type)
{
    switch (type) {
    case storage::i8: return -128.0;
    case storage::i16: return -32768.0;
    case storage::i32: return -2147483648.0;
    case storage::f32: return static_cast<double>(std::numeric_limits<float>::min());
    case storage::f64: return std::numeric_limits<double>::min();
    default: return 0;
    }
}

void fill_part(const image& dst, const rectangle& r, double value)
{
    const image part = part_of(dst, r);
    combine(method::assign, wrap, part, number{storage::f64, value, 0}, part);
}

/// `inner`, which fits dst, gets the pixels of src from (left, top) on, all else the value. Where the pixels are there
/// already they stay.
void copy_and_fill(const image& src, int64_t left, int64_t top, const image& dst, const rectangle& inner,
                   double value)
{
    const int32_t width = dst.layout.width, height = dst.layout.height;
    const storage type = real_storage_of(dst.layout);
    const plane from = plane_of(src, type), to = plane_of(dst, type);
    const bool empty = inner.left == inner.right || inner.top == inner.bottom;
    uint8_t* const source = empty ? nullptr : from.at(left, top); // of nothing, the place may be far away
    const bool copies = !empty && to.at(inner.left, inner.top) != source;
    fill_part(dst, {0, 0, width, inner.top}, value);
    fill_part(dst, {0, inner.bottom, width, height}, value);
    if (!from.adjacent() || !to.adjacent()) {
        fill_part(dst, {0, inner.top, inner.left, inner.bottom}, value);
        fill_part(dst, {inner.right, inner.top, width, inner.bottom}, value);
        const image part = part_of(dst, inner);
        image pixels{part.layout, source};
        pixels.layout.x_stride = src.layout.x_stride;
        pixels.layout.y_stride = src.layout.y_stride;
        if (copies) combine(method::assign, wrap, part, pixels, part);
        return;
    }
    // All of a row while it is in the cache.
    alignas(64) uint8_t block[block_pixels * sizeof(double)];
    const image one_row{{block_pixels, 1, dst.layout.bits, dst.layout.encoding, 0, dst.layout.x_stride, 0},
                        block};
    fill_part(one_row, {0, 0, block_pixels, 1}, value);
    const pixel_fill fill(block, type);
    const int64_t bytes = bytes_of(type);
    for (int32_t y = inner.top; y < inner.bottom; ++y) {
        fill(to.at(0, y), inner.left * bytes);
        if (copies)
            std::memcpy(to.at(inner.left, y), source + (y - inner.top) * from.y_stride,
                        static_cast<size_t>((inner.right - inner.left) * bytes));
        fill(to.at(inner.right, y), (width - inner.right) * bytes);
    }
}

} // namespace

outcome set_margins(const image& src, int32_t margin, const image& dst)
{
    const storage type = real_storage_of(src.layout);
    if (type == storage::none) return outcome::unsupported;
    if (real_storage_of(dst.layout) != type) return outcome::no_type_fits;
    const int64_t width = src.layout.width, height = src.layout.height;
    if (width <= 0 || height <= 0) return outcome::done;

    const stable_operand stable(src, bytes_of(type), dst, bytes_of(type));
    const auto first = [=](int64_t length) { return std::clamp<int64_t>(int64_t{margin} + 1, 0, length); };
    const auto end = [=](int64_t length) {
        return std::clamp<int64_t>(length - margin, first(length), length);
    };
    const rectangle inner{static_cast<int32_t>(first(width)), static_cast<int32_t>(first(height)),
                          static_cast<int32_t>(end(width)), static_cast<int32_t>(end(height))};
    copy_and_fill(stable.pixels(), inner.left, inner.top, dst, inner, lowest_of(type));
    return outcome::done;
}

outcome extend(const image& src, coordinate<int32_t> left_top, double pad, const image& dst)
{
    const storage type = real_storage_of(src.layout);
    if (type == storage::none || real_storage_of(dst.layout) != type) return outcome::unsupported;
    const int64_t width = dst.layout.width, height = dst.layout.height;
    if (width <= 0 || height <= 0) return outcome::done;

    const int64_t left = left_top.x, top = left_top.y;
    const stable_operand stable(src, bytes_of(type), dst, bytes_of(type), left == 0 && top == 0);
    const auto first = [](int64_t shift, int64_t length) { return std::clamp<int64_t>(-shift, 0, length); };
    const auto end = [](int64_t shift, int64_t there, int64_t begin, int64_t length) {
        return std::clamp<int64_t>(there - shift, begin, length);
    };
    const int64_t x = first(left, width), y = first(top, height);
    const rectangle inner{static_cast<int32_t>(x), static_cast<int32_t>(y),
                          static_cast<int32_t>(end(left, src.layout.width, x, width)),
                          static_cast<int32_t>(end(top, src.layout.height, y, height))};
    copy_and_fill(stable.pixels(), x + left, y + top, dst, inner, pad);
    return outcome::done;
}

} // namespace Qor::Luxar::ZELT::Arithmetic
