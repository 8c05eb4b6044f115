// How the flat-field family sees an image: by encoding and storage size, so that a 12-bit and a 16-bit image
// are of one kind, and a 24-bit image counts as one of four bytes.
#pragma once

#include "zelt/pixmat/layout.h"

namespace Qor::Luxar::ZELT::FlatField {

/// A layout and the buffer that its offset and strides address.
struct image {
    image_layout layout;
    uint8_t* data = nullptr;

    /// No image was given, or one without pixels.
    bool absent() const { return data == nullptr; }
};

/// How a kernel ended. Unless it is done, nothing was written.
enum class outcome {
    done,
    unsupported, ///< there is no kernel for these pixel types
    too_small,   ///< an image does not cover the rectangle of the source
};

/// Whole bytes for a pixel of so many bits, rounded up to a power of two. 0 when there are no bits.
constexpr int64_t storage_bytes(int32_t bits)
{
    if (bits <= 0) return 0;
    int64_t bytes = 1;
    while (bytes * 8 < bits) bytes *= 2;
    return bytes;
}

constexpr int64_t encoding_key(const image_layout& l)
{
    return storage_bytes(l.bits) * 8 | int64_t{l.encoding} * 256;
}

/// The kinds of numbers that kernels exist for, in the order of their tables.
enum class number { u8, u16, u32, i8, i16, i32, f32, f64, none };
inline constexpr int number_count = 8;

constexpr number number_of(const image_layout& l)
{
    switch (encoding_key(l)) {
    case 8: return number::u8;
    case 16: return number::u16;
    case 32: return number::u32;
    case 264: return number::i8;
    case 272: return number::i16;
    case 288: return number::i32;
    case 544: return number::f32;
    case 576: return number::f64;
    default: return number::none;
    }
}

/// True when a value of so many bytes can be read or written at each pixel without touching what lies behind
/// the last one. It fails for packed pixels of 17 to 24 bits, for instance, whose storage counts as four
/// bytes.
constexpr bool holds(const image_layout& l, int64_t bytes)
{
    const int64_t distance = l.x_stride < 0 ? -int64_t{l.x_stride} : l.x_stride;
    return bytes * 8 < int64_t{l.bits} + 8 || distance >= bytes;
}
constexpr bool holds_its_storage(const image_layout& l) { return holds(l, storage_bytes(l.bits)); }

constexpr bool is_empty(const image_layout& l) { return l.width <= 0 || l.height <= 0; }

/// True when the image has a pixel for each pixel of the source.
inline bool covers(const image& i, const image_layout& source)
{
    return is_empty(source) ||
           (!i.absent() && i.layout.width >= source.width && i.layout.height >= source.height);
}

} // namespace Qor::Luxar::ZELT::FlatField
