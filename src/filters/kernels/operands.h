// What the fronts of the filters ask of their operands.
#pragma once

#include "pixel/memory_2d.h"

namespace Qor::Luxar::ZELT::Filters {

/// The texts of one filter's refusals, in the order in which they are looked for.
struct operand_texts {
    const char* types_differ;
    const char* unsupported;
    const char* sizes_differ;
    const char* in_place; ///< null when the output may be the input
};

inline bool is_colour(pixel_type type) { return type == pixel_type::rgb || type == pixel_type::bgr; }

/// How many numbers a pixel of a supported type has, and of which type they are.
inline int32_t channels_of(pixel_type type) { return is_colour(type) ? 3 : 1; }
inline pixel_type element_of(pixel_type type) { return is_colour(type) ? pixel_type::unsigned_8 : type; }

/// The place of an element type in tables of loops: unsigned 8, 16, 32 bit, signed 8, 16, 32 bit, float,
/// double.
inline int table_index_of(pixel_type element)
{
    switch (element) {
    case pixel_type::unsigned_8: return 0;
    case pixel_type::unsigned_16: return 1;
    case pixel_type::unsigned_32: return 2;
    case pixel_type::signed_8: return 3;
    case pixel_type::signed_16: return 4;
    case pixel_type::signed_32: return 5;
    case pixel_type::float_32: return 6;
    default: return 7;
    }
}

inline uint8_t* first_pixel(const memory_2d& m) { return m.data + m.offset; }

inline void require(bool condition, const char* text)
{
    if (!condition) throw std::invalid_argument(text);
}

/// For filters of the eight real types and the 24-bit colours.
inline void check_operands(const memory_2d& src, const memory_2d& dst, const operand_texts& texts)
{
    require(src.type == dst.type, texts.types_differ);
    switch_scalar(element_of(src.type), texts.unsupported, [](auto) {});
    require(src.width == dst.width && src.height == dst.height, texts.sizes_differ);
    if (texts.in_place) require(first_pixel(src) != first_pixel(dst), texts.in_place);
}

} // namespace Qor::Luxar::ZELT::Filters
