// The loops behind offsets, comparison and blending, as plain data shared by all instruction-set levels.
#pragma once

#include "arithmetic/kernels/arithmetic_table.h"

namespace Qor::Luxar::ZELT::Arithmetic {

/// fa * a + fb * (ratio * b)
struct sum_weights {
    double fa;
    double ratio;
    double fb;
};

/// fa * a + fb * (b00 * w00 + b10 * w10 + b01 * w01 + b11 * w11), added from left to right. The first digit is the
/// distance to the left, the second one that upwards.
struct bilinear_weights {
    double w00, w10, w01, w11;
    double fa, fb;
};

/// Computing blocks for bilinear_function; b10 and b11 may lie a pixel before b00 and b01.
struct bilinear_operands {
    const double* a;
    const double *b00, *b10, *b01, *b11;
};

/// How a mask pixel p becomes a weight: (p - lowest) * reciprocal.
struct mask_range {
    double lowest;
    double reciprocal;
};

/// Adjacent pixels of one storage; the result may be an operand. Integers must not leave 32 bits.
using sum_function = void (*)(const uint8_t* a, const uint8_t* b, uint8_t* dst, int64_t count, sum_weights w);
using blend_function = void (*)(const uint8_t* base, const uint8_t* other, const uint8_t* mask, uint8_t* dst,
                                int64_t count, mask_range range);
/// Whether adjacent numbers are equal, each to each.
using equal_function = bool (*)(const uint8_t* a, const uint8_t* b, int64_t count);

constexpr int narrow_index(storage s) { return (s >= storage::i8 ? 2 : 0) + (bytes_of(s) == 2 ? 1 : 0); }

struct compositing_table {
    sum_function sum[real_count];     ///< null for 32-bit integers
    sum_function float_sum[4];        ///< the same in float, ratio times fb at once: u8, u16, i8, i16
    blend_function blend[real_count]; ///< null for 32-bit integers
    equal_function equal[real_count]; ///< Float 32 and 64

    // The same on blocks of doubles. The result may be an operand.
    void (*sum_blocks)(const double* a, const double* b, int32_t count, sum_weights w, double* result);
    void (*blend_blocks)(const double* base, const double* other, const double* mask, int32_t count,
                         mask_range range, double* result);
    void (*bilinear_blocks)(bilinear_operands operands, int32_t count, bilinear_weights w, double* result);
};

} // namespace Qor::Luxar::ZELT::Arithmetic
