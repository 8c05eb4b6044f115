// Loops over adjacent pixels of a narrow integer type or Float 32 with real numbers of another type: a Float 32 image,
// or a number in double precision. What is computed is what blocks compute.
#pragma once

#include "arithmetic/kernels/blocks.inl"
#include "arithmetic/kernels/direct.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic {

using Arithmetic::mixed_form;

template <class T>
inline constexpr T lowest = is_signed<T> ? static_cast<T>(-highest<T> - 1) : T{0};

/// True when no pixel of T leaves 32 bits: results of a number and a pixel lie between those of the outermost pixels.
/// A number divided by a pixel of 0 is infinite.
template <operation Op, class W, class T>
bool fits_32_bits(constant_row<W> a, contiguous_row<T>)
{
    const W ends[] = {operate<Op>(a.value, W{lowest<T>}), operate<Op>(a.value, W{highest<T>})};
    return Op != operation::divide && fit_32_bits(ends, 2);
}
template <operation Op, class W, class T>
bool fits_32_bits(contiguous_row<T>, constant_row<W> b)
{
    const W ends[] = {operate<Op>(W{lowest<T>}, b.value), operate<Op>(W{highest<T>}, b.value)};
    return fit_32_bits(ends, 2);
}
template <operation Op, class W, class A, class B>
bool fits_32_bits(contiguous_row<A>, contiguous_row<B>)
{
    return false;
}

/// A sum as a fused product with 1, which has the same bits: conversions keep the units for sums busy.
template <operation Op, class W>
W operate_beside_conversions(W a, W b)
{
#ifdef __FMA__
    if constexpr (is_same<W, double> && Op == operation::add) return __builtin_fma(a, 1.0, b);
    if constexpr (is_same<W, double> && Op == operation::subtract) return __builtin_fma(b, -1.0, a);
#endif
    return operate<Op>(a, b);
}

template <operation Op, rounding Mode, class W, class T, class A, class B, class RowA, class RowB>
void combine_mixed(RowA a, RowB b, contiguous_row<T> dst, int64_t count, range limits)
{
    if constexpr (is_real<T>) {
        const auto f = [=](A v, B w) {
            const W r = operate_beside_conversions<Op>(static_cast<W>(v), static_cast<W>(w));
            return static_cast<T>(Mode == rounding::saturate ? clamp(r, bounds<W>(limits)) : r);
        };
        each(count, f, dst, a, b);
    } else if constexpr (Mode == rounding::saturate) {
        const bounds<W> limit(limits);
        const auto f = [=](A v, B w) {
            return truncated_within<T>(operate<Op>(static_cast<W>(v), static_cast<W>(w)), limit);
        };
        each(count, f, dst, a, b);
    } else if (fits_32_bits<Op, W>(a, b)) {
        const auto f = [](A v, B w) {
            return static_cast<T>(static_cast<int32_t>(operate<Op>(static_cast<W>(v), static_cast<W>(w))));
        };
        each(count, f, dst, a, b);
    } else {
        constexpr int64_t piece = 512;
        alignas(64) W values[piece];
        for (int64_t first = 0; first < count; first += piece) {
            const auto n = static_cast<int32_t>(first + piece < count ? piece : count - first);
            const auto f = [](A v, B w) { return operate<Op>(static_cast<W>(v), static_cast<W>(w)); };
            each(n, f, static_cast<W*>(values), advanced(a, first), advanced(b, first));
            truncate<T>(static_cast<const W*>(values), n, advanced(dst, first));
        }
    }
}

template <operation Op, mixed_form Form, rounding Mode, class T>
void mixed(const uint8_t* a, const uint8_t* b, uint8_t* dst, int64_t count, range limits)
{
    const contiguous_row<T> out{dst};
    const auto row = [](const uint8_t* at) { return operand<form::images, form::value_left, T>(at); };
    const auto reals = [](const uint8_t* at) { return operand<form::images, form::value_left, float>(at); };
    const auto number = [](const uint8_t* at) {
        return operand<form::value_left, form::value_left, double>(at);
    };
    if constexpr (Form == mixed_form::real_right)
        combine_mixed<Op, Mode, float, T, T, float>(row(a), reals(b), out, count, limits);
    if constexpr (Form == mixed_form::real_left)
        combine_mixed<Op, Mode, float, T, float, T>(reals(a), row(b), out, count, limits);
    if constexpr (Form == mixed_form::number_right)
        combine_mixed<Op, Mode, double, T, T, double>(row(a), number(b), out, count, limits);
    if constexpr (Form == mixed_form::number_left)
        combine_mixed<Op, Mode, double, T, double, T>(number(a), row(b), out, count, limits);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
