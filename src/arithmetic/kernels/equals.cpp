#include "arithmetic/kernels/equals.h"

#include "arithmetic/kernels/compositing_levels.h"
#include "arithmetic/kernels/plane.h"

#include <cstring>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

bool is_colour(const image_layout& l)
{
    const bool colour = l.encoding == PixmatEncoding_RGB || l.encoding == PixmatEncoding_RGBA ||
                        l.encoding == PixmatEncoding_BGR;
    return colour && (l.bits == 24 || l.bits == 32);
}

/// How pixels are compared: so many parts, each of them bytes or a floating-point number.
struct comparison {
    int64_t pixel_bytes = 0; ///< 0: there is none
    storage part = storage::none;
    int32_t parts = 1;
};

comparison comparison_of(const image_layout& l)
{
    if (is_colour(l)) return {l.bits / 8};
    const storage s = storage_of(l);
    if (s == storage::none || l.bits < 8) return {};
    switch (s) {
    case storage::f32:
    case storage::f64: return {bytes_of(s), s};
    case storage::c32: return {bytes_of(s), storage::f32, 2};
    case storage::c64: return {bytes_of(s), storage::f64, 2};
    default: return {bytes_of(s)};
    }
}

template <class T>
bool equal_parts(const uint8_t* a, const uint8_t* b, int32_t parts)
{
    for (int32_t i = 0; i < parts; ++i) {
        T p, q;
        std::memcpy(&p, a + static_cast<size_t>(i) * sizeof p, sizeof p);
        std::memcpy(&q, b + static_cast<size_t>(i) * sizeof q, sizeof q);
        if (!(p == q)) return false;
    }
    return true;
}

/// Row by row, a pixel at a time.
template <class Equal>
bool compare_pixels(const plane& a, const plane& b, size extent, Equal equal)
{
    for (int64_t y = 0; y < extent.height; ++y)
        for (int64_t x = 0; x < extent.width; ++x)
            if (!equal(a.at(x, y), b.at(x, y))) return false;
    return true;
}

template <size_t Bytes>
bool same_bytes(const uint8_t* a, const uint8_t* b)
{
    return std::memcmp(a, b, Bytes) == 0;
}

bool compare_strided(const plane& a, const plane& b, size extent, const comparison& how)
{
    if (how.part == storage::f32)
        return compare_pixels(a, b, extent, [parts = how.parts](const uint8_t* p, const uint8_t* q) {
            return equal_parts<float>(p, q, parts);
        });
    if (how.part == storage::f64)
        return compare_pixels(a, b, extent, [parts = how.parts](const uint8_t* p, const uint8_t* q) {
            return equal_parts<double>(p, q, parts);
        });
    switch (how.pixel_bytes) {
    case 1: return compare_pixels(a, b, extent, same_bytes<1>);
    case 2: return compare_pixels(a, b, extent, same_bytes<2>);
    case 3: return compare_pixels(a, b, extent, same_bytes<3>);
    default: return compare_pixels(a, b, extent, same_bytes<4>);
    }
}

bool compare_rows(const plane& a, const plane& b, size extent, const comparison& how)
{
    const bool in_one_row = is_packed(a, extent) && is_packed(b, extent);
    const int64_t rows = in_one_row ? 1 : extent.height;
    const int64_t pixels = int64_t{extent.width} * (in_one_row ? extent.height : 1);
    const equal_function equal =
        how.part == storage::none ? nullptr : compositing_level().equal[static_cast<int>(how.part)];
    for (int64_t y = 0; y < rows; ++y) {
        const bool same =
            equal ? equal(a.at(0, y), b.at(0, y), pixels * how.parts)
                  : std::memcmp(a.at(0, y), b.at(0, y), static_cast<size_t>(pixels * how.pixel_bytes)) == 0;
        if (!same) return false;
    }
    return true;
}

} // namespace

outcome equals(const image& a, const image& b, bool* same) noexcept
{
    const comparison how = comparison_of(a.layout);
    if (how.pixel_bytes == 0 || comparison_of(b.layout).pixel_bytes == 0) return outcome::unsupported;
    const plane p = plane_of(a, how.part), q = plane_of(b, how.part);
    const size extent = extent_of(a);
    if (extent.width <= 0 || extent.height <= 0)
        *same = true;
    else if (p.x_stride == how.pixel_bytes && q.x_stride == how.pixel_bytes)
        *same = compare_rows(p, q, extent, how);
    else
        *same = compare_strided(p, q, extent, how);
    return outcome::done;
}

} // namespace Qor::Luxar::ZELT::Arithmetic
