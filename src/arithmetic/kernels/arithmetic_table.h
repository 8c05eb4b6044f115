// The pieces of pixel-wise arithmetic, as plain data shared by all instruction-set levels.
#pragma once

#include <cstdint>

namespace Qor::Luxar::ZELT::Arithmetic {

/// How a pixel lies in memory. The real types come first.
enum class storage { u8, u16, u32, i8, i16, i32, f32, f64, c32, c64, none };
inline constexpr int real_count = 8;
inline constexpr int storage_count = 10;

constexpr int64_t bytes_of(storage s)
{
    constexpr int64_t bytes[] = {1, 2, 4, 1, 2, 4, 4, 8, 8, 16, 0};
    return bytes[static_cast<int>(s)];
}
constexpr bool is_complex(storage s) { return s == storage::c32 || s == storage::c64; }
constexpr bool is_float(storage s) { return s == storage::f32 || s == storage::f64; }
constexpr bool is_unsigned(storage s) { return s <= storage::u32; }

/// What both operands become before an operator sees them.
enum class computing { u32, i32, f32, f64, c32, c64 };
inline constexpr int computing_count = 6;

/// Operators of two operands. The reversed forms are these with their operands exchanged.
enum class operation { add, subtract, multiply, divide, min, max };
inline constexpr int operation_count = 6;

enum class rounding { wrap, saturate };
inline constexpr int rounding_count = 2;

/// The nominal range of a destination. Every limit is exact as a double.
struct range {
    double lower;
    double upper;
};

/// Pixels in a block; each of its buffers has room for so many of the widest computing type.
inline constexpr int32_t block_pixels = 256;

/// Widens pixels of one storage, any stride, to a computing type. Complex numbers: real parts, then, block_pixels
/// behind, imaginary ones.
using load_function = void (*)(const uint8_t* from, int64_t stride, int32_t count, void* to);
/// result[i] = a[i] op b[i] in a computing type.
using apply_function = void (*)(const void* a, const void* b, int32_t count, void* result);
/// Narrows a computing type to pixels of one storage, any stride.
using store_function = void (*)(const void* from, int32_t count, range limits, uint8_t* to, int64_t stride);
/// dst[i] = a[i] op b[i] on adjacent pixels of one storage. dst may be a or b.
using direct_function = void (*)(const uint8_t* a, const uint8_t* b, uint8_t* dst, int64_t count,
                                 range limits);

/// Which operands of a direct loop are images; the other one is a single value.
enum class form { images, value_right, value_left };
inline constexpr int form_count = 3;

/// The operands of a direct loop whose output has the type of one image: the other one is a Float 32 image or a
/// number in double precision.
enum class mixed_form { real_right, real_left, number_right, number_left };
inline constexpr int mixed_form_count = 4;

/// Narrow integers plus a number: pixels, limited, plus a whole number and, below a limit, 1 more, low bits kept; then
/// negated.
struct narrow_sum {
    int32_t least, greatest, whole, below;
    bool negated;
};
/// Narrow integers times a number: the size of a pixel times a factor, whose fraction has twice the bits of a pixel,
/// cut down, low bits kept. Pixels beyond the limits have results of their own.
struct narrow_product {
    uint32_t whole, fraction;
    bool negative;
    int32_t least, greatest, under, over;
};
using narrow_sum_function = void (*)(const uint8_t* src, uint8_t* dst, int64_t count, narrow_sum);
using narrow_product_function = void (*)(const uint8_t* src, uint8_t* dst, int64_t count, narrow_product);

struct arithmetic_table {
    load_function load[computing_count][storage_count];
    load_function load_byte[2]; ///< Float 32 and 64, truncated to one byte, to u32
    apply_function apply[operation_count][computing_count];
    store_function store[computing_count][storage_count][rounding_count];
    direct_function direct[operation_count][form_count][storage_count][rounding_count];
    direct_function mixed[operation_count][mixed_form_count][storage_count]
                         [rounding_count];       ///< null: in blocks
    narrow_sum_function plus_number[real_count]; ///< for integers of one or two bytes, null for others
    narrow_product_function times_number[real_count];
};

} // namespace Qor::Luxar::ZELT::Arithmetic
