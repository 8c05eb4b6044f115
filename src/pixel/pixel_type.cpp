#include "pixel/pixel_type.h"

namespace Qor::Luxar::ZELT {
namespace {

struct type_row {
    PixmatEncoding encoding;
    int32_t bits;
};

// In the order of pixel_type.
constexpr type_row rows[pixel_type_count] = {
    {PixmatEncoding_Unsigned, 8},
    {PixmatEncoding_Unsigned, 16},
    {PixmatEncoding_Unsigned, 32},
    {PixmatEncoding_Unsigned, 64},
    {PixmatEncoding_Signed, 8},
    {PixmatEncoding_Signed, 16},
    {PixmatEncoding_Signed, 32},
    {PixmatEncoding_Signed, 64},
    {PixmatEncoding_Float, 32},
    {PixmatEncoding_Float, 64},
    {PixmatEncoding_Complex_Float, 64},
    {PixmatEncoding_Complex_Float_Half_Even, 64},
    {PixmatEncoding_Complex_Float_Half_Odd, 64},
    {PixmatEncoding_Complex_Float, 128},
    {PixmatEncoding_Complex_Float_Half_Even, 128},
    {PixmatEncoding_Complex_Float_Half_Odd, 128},
    {PixmatEncoding_RGB, 24},
    {PixmatEncoding_RGBA, 32},
    {PixmatEncoding_BGR, 24},
    {PixmatEncoding_BGRA, 32},
};

constexpr const char* names[] = {
    "Unsigned",
    "Signed",
    "Float",
    "RGB",
    "RGBA",
    "BGR",
    "Reserved3",
    "Reserved4",
    "Data",
    "Reserved1",
    "Complex_Float",
    "Reserved2",
    "Complex_Float_Half_Even",
    "BGRA",
    "Float_Vector2D",
    "Float_Vector3D",
    "Float_Vector4D",
    "Complex_Float_Half_Odd",
};

} // namespace

pixel_type GetPixelType(PixmatEncoding encoding, int32_t bits)
{
    // One key for both: the numbers of unusual declarations may run into each other, and do so everywhere alike.
    int64_t key = int64_t{encoding} * 256 + bits;
    const bool integer = key >> 8 == PixmatEncoding_Unsigned || key >> 8 == PixmatEncoding_Signed;
    const int64_t depth = key & 255;
    if (integer && depth >= 9 && depth <= 16) key += 16 - depth; // any depth of two bytes
    for (int i = 0; i < pixel_type_count; ++i)
        if (int64_t{rows[i].encoding} * 256 + rows[i].bits == key) return static_cast<pixel_type>(i);
    throw std::invalid_argument("Unsupported Pixmat encoding/bits");
}

PixmatEncoding GetPixmatEncoding(pixel_type type)
{
    const auto i = static_cast<uint32_t>(type);
    if (i >= pixel_type_count) throw std::invalid_argument("GetPixmatEncoding: unknown pixel_type");
    return rows[i].encoding;
}

int32_t GetPixmatBits(pixel_type type)
{
    const auto i = static_cast<uint32_t>(type);
    if (i >= pixel_type_count) throw std::invalid_argument("GetPixmatBits: unknown pixel_type");
    return rows[i].bits;
}

const char* GetPixmatEncodingName(PixmatEncoding encoding) noexcept
{
    const auto i = static_cast<uint32_t>(encoding);
    return i < sizeof names / sizeof *names ? names[i] : "Unknown_Encoding";
}

} // namespace Qor::Luxar::ZELT
