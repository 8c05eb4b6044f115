// How rows of numbers leave the Gaussian family as pixels.
#pragma once

#include "filters/kernels/gauss_table.h"
#include "pixel/level.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::gauss {

template <class T>
inline constexpr bool is_real = static_cast<T>(0.5) != 0;

/// Cut toward zero, the low bits kept; NaN and what 64 bits cannot hold give 0. Reals are only rounded.
template <class T>
struct cut {
    using pixel = T;

    static T of(double v)
    {
        if constexpr (is_real<T>)
            return static_cast<T>(v);
        else
            return v > -0x1p63 && v < 0x1p63 ? static_cast<T>(static_cast<int64_t>(v)) : T{0};
    }
};

/// Cut toward zero and limited to the type; NaN gives its lowest value. Reals are only rounded.
template <class T>
struct limited {
    using pixel = T;

    static T of(double v)
    {
        if constexpr (is_real<T>) {
            return static_cast<T>(v);
        } else {
            constexpr bool is_signed = static_cast<T>(-1) < static_cast<T>(1);
            constexpr auto highest = static_cast<double>((uint64_t{1} << (8 * sizeof(T) - is_signed)) - 1);
            constexpr double lowest = is_signed ? -highest - 1 : 0;
            const double above = v > lowest ? v : lowest;
            return static_cast<T>(static_cast<int64_t>(above < highest ? above : highest));
        }
    }
};

/// Turns `count` numbers into pixels `x_stride` bytes apart.
template <class Store, class Number>
void store(const Number* numbers, int64_t count, uint8_t* pixels, int64_t x_stride)
{
    for (int64_t i = 0; i < count; ++i) {
        const typename Store::pixel p = Store::of(static_cast<double>(numbers[i]));
        __builtin_memcpy(pixels + i * x_stride, &p, sizeof p);
    }
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::gauss
