// The plain data that describes an image: encoding, layout record, rectangles, coordinates, sizes.
#pragma once

#include <cstdint>

namespace Qor::Luxar {

/// The pixel encoding that an image declares. Together with its nominal bits it selects a pixel type.
enum PixmatEncoding : int32_t {
    PixmatEncoding_Unsigned = 0,
    PixmatEncoding_Signed = 1,
    PixmatEncoding_Float = 2,
    PixmatEncoding_RGB = 3,
    PixmatEncoding_RGBA = 4,
    PixmatEncoding_BGR = 5,
    PixmatEncoding_Reserved3 = 6,
    PixmatEncoding_Reserved4 = 7,
    PixmatEncoding_Data = 8,
    PixmatEncoding_Reserved1 = 9,
    PixmatEncoding_Complex_Float = 10,
    PixmatEncoding_Reserved2 = 11,
    PixmatEncoding_Complex_Float_Half_Even = 12,
    PixmatEncoding_BGRA = 13,
    PixmatEncoding_Float_Vector2D = 14,
    PixmatEncoding_Float_Vector3D = 15,
    PixmatEncoding_Float_Vector4D = 16,
    PixmatEncoding_Complex_Float_Half_Odd = 17,
};

/// The in-memory copy of an image descriptor. Offset and strides are in bytes; strides may be negative.
struct image_layout {
    int32_t width = 0;
    int32_t height = 0;
    int32_t bits = 0; ///< nominal depth: 12-bit data in 16-bit words says 12
    PixmatEncoding encoding = PixmatEncoding_Data;
    int32_t offset = 0;
    int32_t x_stride = 0;
    int32_t y_stride = 0;

    friend bool operator==(const image_layout&, const image_layout&) = default;
};

/// A packed layout: offset 0, x stride (bits + 7) / 8, y stride x stride times width.
/// A y stride beyond 32 bits keeps its low bits; the image factory refuses such sizes.
constexpr image_layout packed_layout(int32_t width, int32_t height, int32_t bits, PixmatEncoding encoding)
{
    const auto x_stride = static_cast<int32_t>((int64_t{bits} + 7) / 8);
    const auto y_stride = static_cast<int32_t>(static_cast<uint32_t>(int64_t{x_stride} * width));
    return {width, height, bits, encoding, 0, x_stride, y_stride};
}

/// Right and bottom are exclusive.
struct rectangle {
    int32_t left = 0;
    int32_t top = 0;
    int32_t right = 0;
    int32_t bottom = 0;

    friend bool operator==(const rectangle&, const rectangle&) = default;
};

template <class T>
struct coordinate {
    T x{};
    T y{};

    friend bool operator==(const coordinate&, const coordinate&) = default;
};

struct size {
    int32_t width = 0;
    int32_t height = 0;

    friend bool operator==(const size&, const size&) = default;
};

} // namespace Qor::Luxar
