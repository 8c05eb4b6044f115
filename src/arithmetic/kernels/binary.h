// Pixel-wise arithmetic of an image with an image or a number.
#pragma once

#include "arithmetic/kernels/arithmetic_table.h"
#include "zelt/pixmat/layout.h"

namespace Qor::Luxar::ZELT::Arithmetic {

/// A layout and the buffer that its offset and strides address.
struct image {
    image_layout layout;
    uint8_t* data = nullptr;
};

/// A number in one of the real types, or a complex number for complex images.
struct number {
    storage type = storage::f64;
    double real = 0;
    double imaginary = 0;
};

/// What is computed of a (the first operand) and b.
enum class method { add, subtract, reverse_subtract, multiply, divide, reverse_divide, min, max, assign };

/// How a kernel ended. Unless it is done, nothing was written.
enum class outcome {
    done,
    unsupported,      ///< there is no kernel for these types
    other_size,       ///< the output has another size than the first image
    too_small,        ///< the output does not cover the first image
    no_type_fits,     ///< the output has the type of neither image
    unknown_rounding, ///< no mode that kernels know
};

/// The storage of real and complex pixels; none for all others, 64-bit integers, BGRA, and pixels that lie closer
/// together than their storage among them.
storage storage_of(const image_layout& layout) noexcept;

/// dst = a method b. Images of one size; dst may be either of them. rounding: a ZELT_Rounding.
/// Integer division by zero is a processor fault at every level.
outcome combine(method m, int32_t rounding, const image& a, const image& b, const image& dst) noexcept;

/// What the numeric form needs of its images before a number is looked at.
outcome check_number_form(const image& a, const image& dst) noexcept;

/// dst = a method b over the size of a; check_number_form must have said done. A complex b needs a complex dst.
outcome combine(method m, int32_t rounding, const image& a, const number& b, const image& dst) noexcept;

} // namespace Qor::Luxar::ZELT::Arithmetic
