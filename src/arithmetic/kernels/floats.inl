// Vectors of single precision at the width of a level, and what functions need beside + - * /.
// Every operation here is exactly rounded, or moves bits, so that the width never shows in a result.
#pragma once

#include "arithmetic/kernels/reals.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions::singles {

inline constexpr int float_lanes = 2 * lanes;
using floats = float __attribute__((vector_size(4 * float_lanes)));
using half_words = uint32_t __attribute__((vector_size(4 * float_lanes)));
using half_integers = int32_t __attribute__((vector_size(4 * float_lanes)));

inline constexpr uint32_t float_sign_bit = uint32_t{1} << 31;

inline half_words bits_of(floats v) { return __builtin_bit_cast(half_words, v); }
inline floats floats_of(half_words w) { return __builtin_bit_cast(floats, w); }
inline floats all(float v) { return v - floats{}; }
inline floats magnitude(floats v) { return floats_of(bits_of(v) & ~float_sign_bit); }
inline half_words sign_of(floats v) { return bits_of(v) & float_sign_bit; }
/// v, which is not negative, with the sign of another value.
inline floats with_sign(floats v, half_words sign) { return floats_of(bits_of(v) | sign); }
inline floats flip(floats v, half_words sign) { return floats_of(bits_of(v) ^ sign); }

inline floats load(const float* p)
{
    floats v;
    __builtin_memcpy(&v, p, sizeof v);
    return v;
}
inline void store(float* p, floats v) { __builtin_memcpy(p, &v, sizeof v); }

/// Both halves of some floats as reals, where no fused product is at hand.
struct halves {
    reals low, high;
};

#if defined(__AVX512F__)

inline floats root(floats v) { return _mm512_maskz_sqrt_ps(0xffff, v); }
/// Not below, or not above, a limit. NaN stays.
inline floats at_least(floats v, floats limit) { return _mm512_maskz_max_ps(0xffff, limit, v); }
inline floats at_most(floats v, floats limit) { return _mm512_maskz_min_ps(0xffff, limit, v); }

#elif defined(__AVX2__)

inline floats root(floats v) { return _mm256_sqrt_ps(v); }
inline floats at_least(floats v, floats limit) { return _mm256_max_ps(limit, v); }
inline floats at_most(floats v, floats limit) { return _mm256_min_ps(limit, v); }

#elif defined(__SSE2__)

inline floats root(floats v) { return _mm_sqrt_ps(v); }
inline floats at_least(floats v, floats limit) { return _mm_max_ps(limit, v); }
inline floats at_most(floats v, floats limit) { return _mm_min_ps(limit, v); }
inline halves widened(floats v) { return {_mm_cvtps_pd(v), _mm_cvtps_pd(_mm_movehl_ps(v, v))}; }
inline floats narrowed(halves v) { return _mm_movelh_ps(_mm_cvtpd_ps(v.low), _mm_cvtpd_ps(v.high)); }

#else

inline floats root(floats v)
{
    for (int i = 0; i < float_lanes; ++i) v[i] = __builtin_sqrtf(v[i]);
    return v;
}
inline floats at_least(floats v, floats limit) { return v < limit ? limit : v; }
inline floats at_most(floats v, floats limit) { return v > limit ? limit : v; }
inline halves widened(floats v)
{
    halves wide{};
    for (int i = 0; i < lanes; ++i) wide.low[i] = v[i], wide.high[i] = v[i + lanes];
    return wide;
}
inline floats narrowed(halves v)
{
    floats narrow{};
    for (int i = 0; i < lanes; ++i)
        narrow[i] = static_cast<float>(v.low[i]), narrow[i + lanes] = static_cast<float>(v.high[i]);
    return narrow;
}

#endif

/// c - a b, rounded once, where a b is close to c: then product and difference are exact in double precision.
inline floats remainder(floats c, floats a, floats b)
{
#if defined(__AVX512F__)
    return _mm512_maskz_fnmadd_ps(0xffff, a, b, c);
#elif defined(__FMA__)
    return _mm256_fnmadd_ps(a, b, c);
#else
    const halves from = widened(c), m = widened(a), n = widened(b);
    return narrowed({from.low - m.low * n.low, from.high - m.high * n.high});
#endif
}

/// a b + c, where a b fits a float: fused or not, the bits are the same.
inline floats exact_product_plus(floats a, float b, floats c)
{
#if defined(__AVX512F__)
    return _mm512_maskz_fmadd_ps(0xffff, a, all(b), c);
#elif defined(__FMA__)
    return _mm256_fmadd_ps(a, all(b), c);
#else
    return a * b + c;
#endif
}

/// The entry of a table at the low three bits of each index.
inline floats entry(const float (&table)[8], half_words index)
{
#if defined(__AVX512F__)
    return _mm512_maskz_permutexvar_ps(0xffff, __builtin_bit_cast(__m512i, index),
                                       _mm512_maskz_broadcast_f32x8(0xffff, _mm256_loadu_ps(table)));
#elif defined(__AVX2__)
    return _mm256_permutevar8x32_ps(_mm256_loadu_ps(table), __builtin_bit_cast(__m256i, index));
#else
    const half_words place = index & 7;
    floats v{};
    for (int i = 0; i < float_lanes; ++i) v[i] = table[place[i]];
    return v;
#endif
}

/// Added to a number below 2^22, leaves the nearest whole number in the low bits; subtracted again, as a number.
inline constexpr float whole = 0x1.8p23f;

/// v 2^n, rounded once, for v from 1/2 to 2 and whole n from -252 to 254. `shifted` is n + whole.
inline floats scaled(floats v, [[maybe_unused]] floats n, [[maybe_unused]] floats shifted)
{
#if defined(__AVX512F__)
    return _mm512_maskz_scalef_ps(0xffff, v, n);
#else
    const half_words exponent = bits_of(shifted) - __builtin_bit_cast(uint32_t, whole);
    const auto half = __builtin_bit_cast(half_words, __builtin_bit_cast(half_integers, exponent) >> 1);
    const auto power = [](half_words e) { return floats_of((e + 127) << 23); };
    return v * power(half) * power(exponent - half);
#endif
}

/// The polynomial c0 + c1 x + c2 x^2 ..., two coefficients at a time: the chain of sums is half as long as one by one.
inline floats polynomial(floats, floats, float c) { return all(c); }
inline floats polynomial(floats x, floats, float c0, float c1) { return x * c1 + c0; }
template <class... Higher>
floats polynomial(floats x, floats square, float c0, float c1, Higher... higher)
{
    return polynomial(x, square, higher...) * square + (x * c1 + c0);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions::singles
