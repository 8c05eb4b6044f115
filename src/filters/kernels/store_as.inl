// Computed doubles as pixels: limited to the range of the type and cut toward zero, a NaN as the lowest value. Floats
// take the value itself.
#pragma once

#include "filters/kernels/tile.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

template <class T>
ZELT_INLINE void store_as(doubles v, uint8_t* to)
{
    typedef T numbers __attribute__((vector_size(lanes * sizeof(T))));
    numbers n;
    if constexpr (static_cast<T>(0.5) == 0) {
        constexpr bool is_signed = static_cast<T>(-1) < 0;
        constexpr auto high = static_cast<double>((uint64_t{1} << (8 * sizeof(T) - (is_signed ? 1 : 0))) - 1);
        constexpr double low = is_signed ? -high - 1 : 0;
        v = v >= low ? v : doubles{} + low;
        v = v < high ? v : doubles{} + high;
    }
    if constexpr (sizeof(T) < 4) {
        typedef int32_t ints __attribute__((vector_size(lanes * 4)));
        n = __builtin_convertvector(__builtin_convertvector(v, ints), numbers);
    } else {
        n = __builtin_convertvector(v, numbers);
    }
    __builtin_memcpy(to, &n, sizeof n);
}

/// The first `count` of them.
template <class T>
inline void store_some_as(doubles v, int64_t count, uint8_t* to)
{
    uint8_t all[lanes * sizeof(T)];
    store_as<T>(v, all);
    __builtin_memcpy(to, all, static_cast<size_t>(count) * sizeof(T));
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters
