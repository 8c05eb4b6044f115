// The loops behind dark and gain references.
#pragma once

#include "flatfield/kernels/each_pixel.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield {

template <class T, class Dst, class Src>
void subtract_offset(Dst dst, Src src, T offset)
{
    const auto subtract = [=](T p) { return static_cast<T>(p - offset); };
    for (int32_t y = 0; y < src.height; ++y) each_pixel(src.width, subtract, dst[y], src[y]);
}

/// Row after row, in a Sum: doubles are added one by one, integers are exact in 64 bits.
template <class Sum, class Src>
double sum_pixels(Src src)
{
    using T = typename Src::value_type;
    Sum sum = 0;
    for (int32_t y = 0; y < src.height; ++y) {
        const auto row = src[y];
        for (int32_t x = 0; x < src.width; ++x) sum += static_cast<Sum>(static_cast<T>(row[x]));
    }
    return static_cast<double>(sum);
}

/// A pixel that saw no signal gets the highest gain, 50. The order of the comparisons lets a NaN of the norm
/// through.
template <class T, class Dst, class Src>
void real_gain(Dst dst, Src src, double norm)
{
    using S = typename Src::value_type;
    constexpr double highest = 50.0;
    const auto gain_of = [=](S pixel) {
        const auto p = static_cast<double>(pixel);
        const double gain = norm / p;
        return static_cast<T>(p > 0 ? (highest < gain ? highest : gain) : highest);
    };
    for (int32_t y = 0; y < src.height; ++y) each_pixel(src.width, gain_of, dst[y], src[y]);
}

/// numerator: the norm times the range of T. unit: what a pixel counts, a power of two or its negative.
template <class T, class Dst, class Src>
void fixed_gain(Dst dst, Src src, double numerator, double unit)
{
    constexpr double highest = static_cast<T>(-1);
    const auto gain_of = [=](T p) {
        const double gain = numerator / (p * unit);
        const double stored = __builtin_floor((p == 0 || highest < gain ? highest : gain) + 0.5);
        return stored >= -0x1p63 ? static_cast<T>(static_cast<int64_t>(stored)) : T{0};
    };
    for (int32_t y = 0; y < src.height; ++y) each_pixel(src.width, gain_of, dst[y], src[y]);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield
