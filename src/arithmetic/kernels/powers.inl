// Powers of single and of double precision, by the tables of doubles.inl.
#pragma once

#include "arithmetic/kernels/doubles.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions {

/// What a power does with negative numbers.
struct exponent_kind {
    double exponent;
    words sign; ///< the bits that an odd exponent leaves to the sign
    bool whole;
};
inline exponent_kind kind_of(double exponent)
{
    const double size = exponent < 0 ? -exponent : exponent;
    const bool small = size < 0x1p53; // from here on all numbers are whole and even
    const int64_t cut = small ? static_cast<int64_t>(size) : 0;
    const bool is_whole = !small || static_cast<double>(cut) == size;
    const bool is_odd = small && is_whole && (cut & 1) != 0;
    return {exponent, words{} | (is_odd ? sign_bit : 0), is_whole};
}

/// The power of x, where size is that of its magnitude.
inline reals power_with_sign(reals x, reals size, exponent_kind kind)
{
    const reals signed_size = with_sign(size, bits_of(x) & kind.sign);
    if (kind.whole) return signed_size;
    const reals of_negative = x > -infinity ? all(__builtin_nan("")) : signed_size;
    return x < 0 ? of_negative : signed_size;
}

/// x^exponent by the logarithm of x, for an exponent of up to largest_exponent.
inline constexpr double largest_exponent = 0x1p16;
inline reals power_by_logarithm(sum_of_reals log, reals exponent)
{
    const reals product = log.high * exponent;
    return exponential_of_sum(product, rest_of_product(log.high, exponent, product) + log.low * exponent);
}

/// x^exponent for any x. The exponent is neither 0, nor infinite, nor NaN. Above 2^65 it is as good as infinite, but for
/// an x of 1.
[[gnu::noinline, gnu::cold]] inline reals power_of_any(reals x, exponent_kind kind)
{
    const reals exponent = at_most(at_least(all(kind.exponent), -0x1p65), all(0x1p65));
    const reals a = magnitude(x);
    const auto denormal = a < least_normal;
    const auto [high, low] =
        logarithm_in_parts(denormal ? a * 0x1p54 : a, [=](reals e) { return denormal ? e - 54 : e; });
    const reals product = high * exponent;
    const reals rest = rest_of_product(high, exponent, product) + low * exponent;
    const reals ordinary = exponential_of_sum(product, at_most(at_least(rest, -0x1p-10), all(0x1p-10)));
    const reals of_zero = all(kind.exponent > 0 ? 0 : infinity);
    const reals of_infinity = all(kind.exponent > 0 ? infinity : 0);
    const reals size = a == 0 ? of_zero : a < infinity ? ordinary : a == infinity ? of_infinity : a;
    return power_with_sign(x, size, kind);
}

/// log2(x), to 2^-37 of it, for a positive, finite float x.
inline reals logarithm_2(reals x)
{
    const auto [exponent, m, index] = parts_for(logarithms_16, x);
    const reals r = product_plus(m, entry(logarithms_16.reciprocal, index), all(-1));
    const reals from = exponent + entry(logarithms_2_16, index);
    const reals square = r * r; // and short chains of sums
    const reals front = r * -0x1.715476532f42p-1 + 0x1.71547652c389ap+0;
    const reals middle = r * -0x1.715462a4a4bcp-2 + 0x1.ec70931afae3bp-2;
    const reals back = r * -0x1.ed4e01cd20b8fp-3 + 0x1.27d5a91b39c1p-2;
    return from + r * (front + square * (middle + square * back));
}

/// 2^t, to 2^-29.7 of it. What leaves the range of floats at either end becomes infinite or 0 when it is stored.
inline reals power_of_2(reals t)
{
    constexpr double shift = whole / 16; // the sum ends in sixteenths
    const reals limited = at_most(at_least(t, -200), all(200));
    const reals shifted = limited + shift;
    const reals r = limited - (shifted - shift);
    const words bits = bits_of(shifted);
    const words from = bits_of(entry(powers_16.high, bits)) + ((bits >> 4) << 52);
    return reals_of(from) * polynomial(r, 0x1.fffffff625fd5p-1, 0x1.62e42ffea9d3cp-1, 0x1.ec00ccdd1ba3dp-3,
                                       0x1.c6add24a0e557p-5);
}

/// x^exponent for any float x, and an exponent as above.
[[gnu::noinline, gnu::cold]] inline reals power_of_any_float(reals x, exponent_kind kind)
{
    const reals a = magnitude(x);
    const reals log_a = a == 0 ? all(-infinity) : logarithm_2(a);
    return power_with_sign(x, power_of_2((a < infinity ? log_a : a) * kind.exponent), kind);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions
