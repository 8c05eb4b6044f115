// How rows of numbers leave the Gaussian family as pixels.
#pragma once

#include "filters/kernels/gauss_table.h"
#include "pixel/rows.h"

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
    /// The same through 32 bits, for which every processor has instructions.
#ifdef __AVX512DQ__
    static constexpr bool has_narrow = false;
#else
    static constexpr bool has_narrow = !is_real<T>;
#endif
    static bool is_narrow(double v) { return __builtin_fabs(v) < 0x1p31; }
    static T of_narrow(double v) { return static_cast<T>(static_cast<int32_t>(v)); }
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
    static constexpr bool has_narrow = false;
};

/// Turns `count` numbers into pixels `x_stride` bytes apart.
template <class Store, class Number>
void store(const Number* numbers, int64_t count, uint8_t* pixels, int64_t x_stride)
{
    using T = typename Store::pixel;
    const auto store_all = [&](auto row) {
        if constexpr (Store::has_narrow) {
            int64_t wide = 0; // of the size of a number, which makes a vector of it
            for (int64_t i = 0; i < count; ++i)
                wide |= Store::is_narrow(static_cast<double>(numbers[i])) ? 0 : 1;
            if (!wide) {
                for (int64_t i = 0; i < count; ++i)
                    row[i] = Store::of_narrow(static_cast<double>(numbers[i]));
                return;
            }
        }
        for (int64_t i = 0; i < count; ++i) row[i] = Store::of(static_cast<double>(numbers[i]));
    };
    if (x_stride == int64_t{sizeof(T)})
        store_all(contiguous_row<T>{pixels});
    else
        store_all(strided_row<T>{pixels, x_stride});
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::gauss
