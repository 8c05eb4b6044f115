// Exponential, logarithm and power of double-precision numbers, by tables and short polynomials in a small rest.
//
// A result is the sum of one large term and a small correction, so that little but its rounding counts. The polynomials
// have the least error in their interval. Products and sums are in a fixed order, and are fused only where the result
// is exact: without fused operations it takes more steps to the same bits.
#pragma once

#include "arithmetic/kernels/doubles_tables.inl"
#include "arithmetic/kernels/elementary.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions {

inline constexpr double least_normal = 0x1p-1022;
inline constexpr double log_2_high = 0x1.62e42fefa38p-1; // 42 bits
inline constexpr double log_2_low = 0x1.ef35793c7673p-45;

#if defined(__AVX512F__)

inline reals entry(const double (&table)[16], words index)
{
    const __m512i i = __builtin_bit_cast(__m512i, index);
    return _mm512_maskz_permutex2var_pd(0xff, load(table), i, load(table + 8));
}
inline reals entry(const double (&table)[32], words index)
{
    const __m512i i = __builtin_bit_cast(__m512i, index);
    const __mmask8 upper = _mm512_test_epi64_mask(i, __builtin_bit_cast(__m512i, words{} + 16));
    const reals a = _mm512_maskz_permutex2var_pd(0xff, load(table), i, load(table + 8));
    const reals b = _mm512_maskz_permutex2var_pd(0xff, load(table + 16), i, load(table + 24));
    return _mm512_mask_blend_pd(upper, a, b);
}
inline bool all_ordinary(reals x) { return _mm512_fpclass_pd_mask(x, 0xff) == 0; }
inline reals exponent_in(words raised)
{
    const __m512i w = __builtin_bit_cast(__m512i, raised);
    return _mm512_maskz_cvtepi64_pd(0xff, _mm512_maskz_srai_epi64(0xff, w, 52));
}

#else

/// table[index mod size]
template <int size>
reals entry(const double (&table)[size], words index)
{
    index &= size - 1;
#if defined(__AVX2__)
    return reals{table[index[0]], table[index[1]], table[index[2]], table[index[3]]};
#else
    return reals{table[index[0]], table[index[1]]};
#endif
}

/// True when all numbers are positive, finite and not denormal.
inline bool all_ordinary(reals x)
{
    const auto inside = (x >= least_normal) & (x < infinity);
#if defined(__AVX2__)
    return _mm256_movemask_pd(__builtin_bit_cast(__m256d, inside)) == 0xf;
#elif defined(__SSE2__)
    return _mm_movemask_pd(__builtin_bit_cast(__m128d, inside)) == 0x3;
#else
    return (inside[0] & inside[1]) != 0;
#endif
}

/// The upper twelve bits as a number with its sign.
inline reals exponent_in(words raised)
{
    constexpr double low_bits = 0x1p52; // a whole number ored into its low bits is added
    const words biased = (raised >> 52) ^ 0x800;
    return reals_of(biased | __builtin_bit_cast(uint64_t, low_bits)) - (low_bits + 0x800);
}

#endif

#if defined(__AVX512F__)
inline reals product_plus(reals a, reals b, reals c) { return _mm512_fmadd_pd(a, b, c); }
inline reals product_minus_1(reals a, reals b) { return _mm512_fmsub_pd(a, b, all(1)); }
inline reals rest_of_product(reals a, reals b, reals product) { return _mm512_fmsub_pd(a, b, product); }
#elif defined(__FMA__)
inline reals product_plus(reals a, reals b, reals c) { return _mm256_fmadd_pd(a, b, c); }
inline reals product_minus_1(reals a, reals b) { return _mm256_fmsub_pd(a, b, all(1)); }
inline reals rest_of_product(reals a, reals b, reals product) { return _mm256_fmsub_pd(a, b, product); }
#else
/// a b + c, where a b is exact.
inline reals product_plus(reals a, reals b, reals c) { return a * b + c; }
/// a b - 1, which is exact, for a b of few bits.
inline reals product_minus_1(reals a, reals b)
{
    const reals high = reals_of(bits_of(a) & ~uint64_t{0x7ffffff});
    return (high * b - 1) + (a - high) * b;
}
/// a, rounded to 26 bits; what is left has no more either.
inline reals upper_half(reals a) { return reals_of((bits_of(a) + 0x4000000) & ~uint64_t{0x7ffffff}); }
/// a b - product, where product is a b rounded.
inline reals rest_of_product(reals a, reals b, reals product)
{
    const reals a_high = upper_half(a), b_high = upper_half(b);
    const reals a_low = a - a_high, b_low = b - b_high;
    return (((a_high * b_high - product) + a_high * b_low) + a_low * b_high) + a_low * b_low;
}
#endif

/// Numbers as they are.
struct unchanged {
    reals operator()(reals v) const { return v; }
};

/// A positive number is 2^exponent m, with m in the range of a table of logarithms, and index that of its entry.
struct table_parts {
    reals exponent, m;
    words index;
};
template <int size>
table_parts parts_for(const table_of_logarithms<size>& t, reals x)
{
    constexpr int bits_of_size = size == 16 ? 4 : 5;
    const words raised = bits_of(x) - __builtin_bit_cast(uint64_t, t.from);
    const reals m = reals_of(bits_of(x) - (raised & (uint64_t{0xfff} << 52)));
    const words index = raised >> (52 - bits_of_size);
    return {exponent_in(raised), m, index};
}

/// m (1 + rest) is the inverse of a table's entry.
struct logarithm_parts {
    reals high; ///< the logarithm of 2^exponent m / (1 + rest), to 2^-42
    reals low;  ///< what it lacks
    reals rest;
};
template <int size, class Adjust>
logarithm_parts split(const table_of_logarithms<size>& t, reals x, Adjust adjust)
{
    const auto [own_exponent, m, index] = parts_for(t, x);
    const reals exponent = adjust(own_exponent);
    return {product_plus(exponent, all(log_2_high), entry(t.high, index)),
            exponent * log_2_low + entry(t.low, index), product_minus_1(m, entry(t.reciprocal, index))};
}

/// log(x) for a positive, finite x that is not denormal.
template <class Adjust = unchanged>
reals logarithm_of_normal(reals x, Adjust adjust = {})
{
    const auto [high, low, r] = split(logarithms_16, x, adjust);
    const reals sum = high + r;
    const reals lost = (high - sum) + r;
    const reals square = r * r; // and short chains of sums
    const reals front = (r * -0x1.ffffffffffeap-3 + 0x1.555555555553dp-2) +
                        square * (r * -0x1.555555587da92p-3 + 0x1.9999999ada32dp-3);
    const reals back = (r * -0x1.ffffbed39eecdp-4 + 0x1.2492343ca50adp-3) +
                       square * (r * -0x1.9a9988f74230dp-4 + 0x1.c7fbc111bf1a5p-4);
    const reals curve = square * (r * (front + square * square * back) - 0.5);
    return sum + (curve + (low + lost));
}

/// log(x) for any x. Apart, since it would cost the quick form its registers.
[[gnu::noinline, gnu::cold]] inline reals logarithm_of_any(reals x)
{
    const auto denormal = x < least_normal;
    const reals r = logarithm_of_normal(denormal ? x * 0x1p54 : x,
                                        [=](reals exponent) { return denormal ? exponent - 54 : exponent; });
    const reals of_zero = x == 0 ? all(-infinity) : all(__builtin_nan(""));
    const reals unusual = x == x ? of_zero : x;
    return x > 0 ? (x < infinity ? r : x) : unusual;
}

inline reals logarithm_of_double(reals x)
{
    return all_ordinary(x) ? logarithm_of_normal(x) : logarithm_of_any(x);
}

/// 16 / log 2, and log 2 / 16 in two parts. The first has 38 bits, so that its product with a whole number of up to
/// 15 bits is exact.
inline constexpr double sixteenths = 0x1.71547652b82fep4;
inline constexpr double sixteenth_high = 0x1.62e42fefa4p-5;
inline constexpr double sixteenth_low = -0x1.8432a1b0e2634p-47;

/// mantissa 2^floor(n / 16), rounded once; bits end in n + 32 * 1023.
inline reals scaled(reals mantissa, [[maybe_unused]] reals n, [[maybe_unused]] words bits)
{
#if defined(__AVX512F__)
    return _mm512_maskz_scalef_pd(0xff, mantissa, n * (1.0 / 16));
#else
    const words half = (bits >> 5) << 52; // two powers, since one may be no normal number
    return (mantissa * reals_of(half)) * reals_of(((bits >> 4) << 52) - half);
#endif
}

/// exp(x + rest), where the rest is far below a unit of x. From -745.2 to 709.8 it is neither 0 nor infinite.
template <class... Rest>
reals exponential_of_sum(reals x, Rest... rest)
{
    const reals limited = at_most(at_least(x, -746), all(710));
    constexpr double shift = whole + 32 * 1023; // leaves the exponents of two factors in the low bits
    const reals shifted = limited * sixteenths + shift;
    const reals n = shifted - shift;
    const reals r = ((product_plus(n, all(-sixteenth_high), limited) - n * sixteenth_low) + ... + rest);
    const words bits = bits_of(shifted);
    const reals square = r * r; // and short chains of sums
    const reals front = r * 0x1.5555555555557p-3 + 0x1.0000000000001p-1;
    const reals middle = r * 0x1.11111110ab2dp-7 + 0x1.55555554e8d7ep-5;
    const reals back = r * 0x1.a01b65bf46ca8p-13 + 0x1.6c17ede66a746p-10;
    const reals grown = r + square * (front + square * (middle + square * back));
    const reals from = entry(powers_16.high, bits);
    const reals mantissa = from + (entry(powers_16.low, bits) + from * grown);
    return scaled(mantissa, n, bits);
}

inline reals exponential_of_double(reals x) { return exponential_of_sum(x); }

/// Two numbers whose sum counts. The second is below half a unit of the first.
struct sum_of_reals {
    reals high, low;
};

/// log(x) to some 66 bits, for a positive, finite x that is not denormal.
template <class Adjust = unchanged>
sum_of_reals logarithm_in_parts(reals x, Adjust adjust = {})
{
    const auto [high, low, r] = split(logarithms_32, x, adjust);
    const reals sum = high + r;
    const reals lost = (high - sum) + r;
    const reals half = r * -0.5;
    const reals curve = half * r;
    const reals curved = sum + curve;
    const reals lost_of_curve = ((sum - curved) + curve) + rest_of_product(half, r, curve);
    const reals square = r * r;
    const reals front = (r * -0x1.ffffffffffffdp-3 + 0x1.5555555555555p-2) +
                        square * (r * -0x1.555555556c9dp-3 + 0x1.99999999a2d5ap-3);
    const reals back = (r * -0x1.fffff9e100d18p-4 + 0x1.2492472dd4a13p-3) +
                       square * (r * -0x1.99e8010f5b48p-4 + 0x1.c760dd71bd3f5p-4);
    const reals rest = (square * r) * (front + square * square * back) + ((low + lost) + lost_of_curve);
    const reals result = curved + rest;
    return {result, (curved - result) + rest};
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions
