// The closed list of pixel types that kernels know, and how a kernel is selected by type.
#pragma once

#include "zelt/pixmat/layout.h"

#include <stdexcept>

namespace Qor::Luxar::ZELT {

/// Numeric order is the order of every per-type switch. The number of a type never changes.
enum class pixel_type : int32_t {
    unsigned_8 = 0,
    unsigned_16 = 1,
    unsigned_32 = 2,
    unsigned_64 = 3,
    signed_8 = 4,
    signed_16 = 5,
    signed_32 = 6,
    signed_64 = 7,
    float_32 = 8,
    float_64 = 9,
    complex_32 = 10,
    half_even_32 = 11,
    half_odd_32 = 12,
    complex_64 = 13,
    half_even_64 = 14,
    half_odd_64 = 15,
    rgb = 16,
    rgba = 17,
    bgr = 18,
    bgra = 19,
};

inline constexpr int pixel_type_count = 20;

/// Storage of the pixels that are not plain numbers. Full and half-complex share one storage.
template <class Part>
struct complex_pixel {
    Part real;
    Part imaginary;
};
struct colour_24 {
    uint8_t channel[3];
};
struct colour_32 {
    uint8_t channel[4];
};

/// Throws std::invalid_argument "Unsupported Pixmat encoding/bits".
pixel_type GetPixelType(PixmatEncoding encoding, int32_t bits);

/// Throws std::invalid_argument "GetPixmatEncoding: unknown pixel_type".
PixmatEncoding GetPixmatEncoding(pixel_type type);

/// Storage bits: the nominal depth is lost here. Throws "GetPixmatBits: unknown pixel_type".
int32_t GetPixmatBits(pixel_type type);

/// "Unsigned" ... "Complex_Float_Half_Odd", or "Unknown_Encoding".
const char* GetPixmatEncodingName(PixmatEncoding encoding) noexcept;

constexpr bool is_half_complex(PixmatEncoding encoding) noexcept
{
    return encoding == PixmatEncoding_Complex_Float_Half_Even ||
           encoding == PixmatEncoding_Complex_Float_Half_Odd;
}

/// The width of the image that a layout stands for: 2w - 2 and 2w - 1 for half-complex, else w. One beyond 32 bits keeps
/// its low bits and is negative then; the image factory refuses it.
constexpr int32_t full_width(const image_layout& layout) noexcept
{
    if (!is_half_complex(layout.encoding)) return layout.width;
    const int missing = layout.encoding == PixmatEncoding_Complex_Float_Half_Even ? 2 : 1;
    return static_cast<int32_t>(2 * int64_t{layout.width} - missing);
}

constexpr bool is_well_formed(const rectangle& r) noexcept { return r.left <= r.right && r.top <= r.bottom; }

constexpr bool fits(const rectangle& r, size s) noexcept
{
    return is_well_formed(r) && r.left >= 0 && r.top >= 0 && r.right <= s.width && r.bottom <= s.height;
}

/// Names a storage type for a generic lambda: [&]<class T>(pixel<T>) { ... }.
template <class T>
struct pixel {
    using type = T;
};

namespace detail {

/// Calls the body for one of the eight real types and says whether the type was one.
template <class Body>
bool try_scalar(pixel_type type, Body&& body)
{
    switch (type) {
    case pixel_type::unsigned_8: body(pixel<uint8_t>{}); return true;
    case pixel_type::unsigned_16: body(pixel<uint16_t>{}); return true;
    case pixel_type::unsigned_32: body(pixel<uint32_t>{}); return true;
    case pixel_type::signed_8: body(pixel<int8_t>{}); return true;
    case pixel_type::signed_16: body(pixel<int16_t>{}); return true;
    case pixel_type::signed_32: body(pixel<int32_t>{}); return true;
    case pixel_type::float_32: body(pixel<float>{}); return true;
    case pixel_type::float_64: body(pixel<double>{}); return true;
    default: return false;
    }
}

} // namespace detail

/// The standard set: every real type except the 64-bit integers. Any other type is a std::runtime_error.
template <class Body>
void switch_scalar(pixel_type type, Body&& body)
{
    if (!detail::try_scalar(type, body))
        throw std::runtime_error("SWITCH_PIXELENCODING: Format not supported");
}

/// The standard set and the 24-bit colours, which share one instantiation on colour_24.
template <class Body>
void switch_scalar_or_colour(pixel_type type, Body&& body)
{
    if (type == pixel_type::rgb || type == pixel_type::bgr)
        body(pixel<colour_24>{});
    else
        switch_scalar(type, body);
}

/// A family's own switch over the eight real types: std::invalid_argument with the family's text.
template <class Body>
void switch_scalar(pixel_type type, const char* unsupported, Body&& body)
{
    if (!detail::try_scalar(type, body)) throw std::invalid_argument(unsupported);
}

} // namespace Qor::Luxar::ZELT
