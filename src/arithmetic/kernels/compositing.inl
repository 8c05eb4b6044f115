// Weighted sums, blends and comparisons of pixels. Everything is computed in double, each product and sum rounded as
// it is written.
#pragma once

#include "arithmetic/kernels/compositing_table.h"
#include "arithmetic/kernels/operators.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic {

using Arithmetic::bilinear_operands;
using Arithmetic::bilinear_weights;
using Arithmetic::mask_range;
using Arithmetic::sum_weights;

/// Truncated toward zero; integers of T must not leave 32 bits.
template <class T>
T narrowed(double v)
{
    if constexpr (is_integer<T>) return static_cast<T>(static_cast<int32_t>(v));
    return static_cast<T>(v);
}

inline double weighted_sum(double a, double b, sum_weights w) { return w.fa * a + w.fb * (w.ratio * b); }

inline double blended(double base, double other, double mask, mask_range range)
{
    const double w = (mask - range.lowest) * range.reciprocal;
    return base * (1.0 - w) + other * w;
}

template <class T>
contiguous_row<T> row_at(const uint8_t* first)
{
    return {const_cast<uint8_t*>(first)};
}

template <class T>
void sum(const uint8_t* a, const uint8_t* b, uint8_t* dst, int64_t count, sum_weights w)
{
    const auto f = [=](T p, T q) {
        return narrowed<T>(weighted_sum(static_cast<double>(p), static_cast<double>(q), w));
    };
    each(count, f, row_at<T>(dst), row_at<T>(a), row_at<T>(b));
}

template <class T>
void float_sum(const uint8_t* a, const uint8_t* b, uint8_t* dst, int64_t count, sum_weights w)
{
    const auto fa = static_cast<float>(w.fa);
    const auto fb = static_cast<float>(w.fb * w.ratio);
    const auto f = [=](T p, T q) {
        const float v = fa * static_cast<float>(p) + fb * static_cast<float>(q);
        return static_cast<T>(static_cast<int32_t>(v));
    };
    each(count, f, row_at<T>(dst), row_at<T>(a), row_at<T>(b));
}

template <class T>
void blend(const uint8_t* base, const uint8_t* other, const uint8_t* mask, uint8_t* dst, int64_t count,
           mask_range range)
{
    const auto f = [=](T p, T q, T m) {
        return narrowed<T>(
            blended(static_cast<double>(p), static_cast<double>(q), static_cast<double>(m), range));
    };
    each(count, f, row_at<T>(dst), row_at<T>(base), row_at<T>(other), row_at<T>(mask));
}

/// Bytes. Most of a usual mask is all or nothing, and there one of the images is the result: the weights are exactly 0
/// and 1. Wider pixels come from memory no faster than they are blended.
inline void blend_bytes(const uint8_t* base, const uint8_t* other, const uint8_t* mask, uint8_t* dst,
                        int64_t count, mask_range range)
{
    constexpr int64_t piece = 128;
    for (int64_t first = 0; first < count; first += piece) {
        const int64_t n = first + piece < count ? piece : count - first;
        const uint8_t* const m = mask + first;
        uint8_t mixed = 0;
        for (int64_t i = 0; i < n; ++i)
            mixed = static_cast<uint8_t>(mixed | (static_cast<uint8_t>(m[i] + 1) > 1 ? 1 : 0));
        if (mixed)
            blend<uint8_t>(base + first, other + first, m, dst + first, n, range);
        else
            each(
                n, [](uint8_t b, uint8_t o, uint8_t w) { return w != 0 ? o : b; }, dst + first, base + first,
                other + first, m);
    }
}

inline void sum_blocks(const double* a, const double* b, int32_t count, sum_weights w, double* result)
{
    each(
        count, [=](double p, double q) { return weighted_sum(p, q, w); }, result, a, b);
}

inline void blend_blocks(const double* base, const double* other, const double* mask, int32_t count,
                         mask_range range, double* result)
{
    each(
        count, [=](double p, double q, double m) { return blended(p, q, m, range); }, result, base, other,
        mask);
}

inline void bilinear_blocks(bilinear_operands o, int32_t count, bilinear_weights w, double* result)
{
    const auto f = [=](double a, double b00, double b10, double b01, double b11) {
        return w.fa * a + w.fb * (w.w00 * b00 + w.w10 * b10 + w.w01 * b01 + w.w11 * b11);
    };
    each(count, f, result, o.a, o.b00, o.b10, o.b01, o.b11);
}

template <class T>
struct flag_like {
    using type = int32_t;
};
template <>
struct flag_like<double> {
    using type = int64_t;
};

/// Looks at pieces, so that a difference ends the work early.
template <class T>
bool equal(const uint8_t* a, const uint8_t* b, int64_t count)
{
    constexpr int64_t piece = 1024;
    for (int64_t first = 0; first < count; first += piece) {
        const int64_t end = first + piece < count ? first + piece : count;
        typename flag_like<T>::type differ = 0;
        for (int64_t i = first; i < end; ++i)
            differ |= static_cast<T>(row_at<T>(a)[i]) == static_cast<T>(row_at<T>(b)[i]) ? 0 : 1;
        if (differ) return false;
    }
    return true;
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
