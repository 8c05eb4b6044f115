// Conversions go through blocks of pixels that stay in the first-level cache: load (pixel type, stride -> working
// type), then store (working type -> pixel type, stride). Each piece is written once for all partners.
#pragma once

#include "pixel/memory_2d.h"

#include <cstring>
#include <type_traits>

namespace Qor::Luxar::Convert {

using namespace ZELT;

inline constexpr int block_size = 256; ///< pixels

/// What the pixels of a block are between load and store. Integers never pass through a double.
enum class working : uint8_t {
    narrow, ///< int32_t: integers of 8 and 16 bits, signed 32
    wide,   ///< int64_t: unsigned 32, signed 64
    huge,   ///< uint64_t: unsigned 64
    real,   ///< double: floats, real parts of complex pixels, luminances
    pair,   ///< two doubles: complex pixels
    colour, ///< colour_32 in the order red, green, blue, alpha
};

struct alignas(64) block {
    unsigned char bytes[block_size * 2 * sizeof(double)];
};

/// What an integer pixel of a nominal depth can say: 0 to 4095 for unsigned 12 bits.
struct nominal_range {
    int64_t low;
    uint64_t high;
};

using load_pixels = void (*)(const uint8_t* from, int64_t stride, int count, void* values) noexcept;
using store_pixels = void (*)(const void* values, int count, uint8_t* to, int64_t stride,
                              const nominal_range& range) noexcept;
/// Whole rows whose pixels are adjacent on both sides.
using convert_row = void (*)(const uint8_t* from, uint8_t* to, int64_t count,
                             const nominal_range& range) noexcept;

template <class T>
T read(const uint8_t* address) noexcept
{
    T value;
    std::memcpy(&value, address, sizeof value);
    return value;
}
template <class T>
void write(uint8_t* address, T value) noexcept
{
    std::memcpy(address, &value, sizeof value);
}

/// body(i, byte distance of pixel i): a fixed distance where the pixels are adjacent, so that the compiler can
/// use vectors.
template <size_t Bytes, class Body>
void for_each_pixel(int count, int64_t stride, Body&& body) noexcept
{
    constexpr auto bytes = static_cast<int64_t>(Bytes);
    if (stride == bytes)
        for (int i = 0; i < count; ++i) body(i, i * bytes);
    else
        for (int i = 0; i < count; ++i) body(i, i * stride);
}

/// body(from, to, count) for each block of two views of the same size, row by row.
template <class Body>
void for_each_block(const memory_2d& from, const memory_2d& to, Body&& body)
{
    for (int64_t y = 0; y < to.height; ++y) {
        const uint8_t* source = from.data + from.offset + y * from.y_stride;
        uint8_t* target = to.data + to.offset + y * to.y_stride;
        for (int32_t x = 0; x < to.width; x += block_size) {
            const int count = to.width - x < block_size ? to.width - x : block_size;
            body(source + x * from.x_stride, target + x * to.x_stride, count);
            if (to.width - x <= block_size) break; // x + block_size may not be a number any more
        }
    }
}

/// Calls the body for one of the ten number types and says whether the type was one.
template <class Body>
bool with_number(pixel_type type, Body&& body)
{
    switch (type) {
    case pixel_type::unsigned_64: body(pixel<uint64_t>{}); return true;
    case pixel_type::signed_64: body(pixel<int64_t>{}); return true;
    default: return ZELT::detail::try_scalar(type, body);
    }
}

constexpr bool is_number(pixel_type type) noexcept { return type <= pixel_type::float_64; }
constexpr bool is_float(pixel_type type) noexcept
{
    return type == pixel_type::float_32 || type == pixel_type::float_64;
}
constexpr bool is_colour(pixel_type type) noexcept { return type >= pixel_type::rgb; }
constexpr bool is_full_complex(pixel_type type) noexcept
{
    return type == pixel_type::complex_32 || type == pixel_type::complex_64;
}

} // namespace Qor::Luxar::Convert
