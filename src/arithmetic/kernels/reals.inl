// Vectors of double precision at the width of a level, and what functions need beside + - * /.
// Every operation here is exactly rounded, or moves bits, so that the width never shows in a result.
#pragma once

#include "pixel/level.h"

#include <cstdint>
#ifdef __SSE2__
#include <immintrin.h>
#endif

namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions {

#if defined(__AVX512F__)
inline constexpr int lanes = 8;
#elif defined(__AVX2__)
inline constexpr int lanes = 4;
#else
inline constexpr int lanes = 2;
#endif
using reals = double __attribute__((vector_size(8 * lanes)));
using words = uint64_t __attribute__((vector_size(8 * lanes)));

inline constexpr uint64_t sign_bit = uint64_t{1} << 63;

inline words bits_of(reals v) { return __builtin_bit_cast(words, v); }
inline reals reals_of(words w) { return __builtin_bit_cast(reals, w); }
inline reals all(double v) { return v - reals{}; }
inline reals magnitude(reals v) { return reals_of(bits_of(v) & ~sign_bit); }
inline words sign_of(reals v) { return bits_of(v) & sign_bit; }
/// v, which is not negative, with the sign of another value.
inline reals with_sign(reals v, words sign) { return reals_of(bits_of(v) | sign); }
inline reals flip(reals v, words sign) { return reals_of(bits_of(v) ^ sign); }

#if defined(__AVX512F__)

// Masks of ones: GCC 12 warns of variables without a value inside the forms without a mask.
inline reals load(const float* p) { return _mm512_maskz_cvtps_pd(0xff, _mm256_loadu_ps(p)); }
inline reals load(const double* p) { return _mm512_loadu_pd(p); }
inline void store(float* p, reals v) { _mm256_storeu_ps(p, _mm512_maskz_cvtpd_ps(0xff, v)); }
inline void store(double* p, reals v) { _mm512_storeu_pd(p, v); }
inline reals root(reals v) { return _mm512_maskz_sqrt_pd(0xff, v); }
inline reals at_least(reals v, double limit) { return _mm512_maskz_max_pd(0xff, all(limit), v); }
inline reals at_most(reals v, reals limit) { return _mm512_maskz_min_pd(0xff, limit, v); }
inline reals where_signed(words sign, reals a, reals b)
{
    return _mm512_mask_blend_pd(_mm512_movepi64_mask(__builtin_bit_cast(__m512i, sign)), b, a);
}

#elif defined(__AVX2__)

inline reals load(const float* p) { return _mm256_cvtps_pd(_mm_loadu_ps(p)); }
inline reals load(const double* p) { return _mm256_loadu_pd(p); }
inline void store(float* p, reals v) { _mm_storeu_ps(p, _mm256_cvtpd_ps(v)); }
inline void store(double* p, reals v) { _mm256_storeu_pd(p, v); }
inline reals root(reals v) { return _mm256_sqrt_pd(v); }
inline reals at_least(reals v, double limit) { return _mm256_max_pd(all(limit), v); }
inline reals at_most(reals v, reals limit) { return _mm256_min_pd(limit, v); }
inline reals where_signed(words sign, reals a, reals b) { return _mm256_blendv_pd(b, a, reals_of(sign)); }

#else

/// a where bit 63 of `sign` is set, else b.
inline reals where_signed(words sign, reals a, reals b)
{
    const words mask = 0 - (sign >> 63);
    return reals_of((bits_of(a) & mask) | (bits_of(b) & ~mask));
}

#ifdef __SSE2__

inline reals load(const float* p)
{
    return _mm_cvtps_pd(_mm_castsi128_ps(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(p))));
}
inline reals load(const double* p) { return _mm_loadu_pd(p); }
inline void store(float* p, reals v)
{
    _mm_storel_epi64(reinterpret_cast<__m128i*>(p), _mm_castps_si128(_mm_cvtpd_ps(v)));
}
inline void store(double* p, reals v) { _mm_storeu_pd(p, v); }
inline reals root(reals v) { return _mm_sqrt_pd(v); }
/// Not below, or not above, a limit. NaN stays.
inline reals at_least(reals v, double limit) { return _mm_max_pd(all(limit), v); }
inline reals at_most(reals v, reals limit) { return _mm_min_pd(limit, v); }

#else

template <class T>
reals load(const T* p)
{
    T in[lanes];
    __builtin_memcpy(in, p, sizeof in);
    return reals{static_cast<double>(in[0]), static_cast<double>(in[1])};
}
template <class T>
void store(T* p, reals v)
{
    const T out[lanes] = {static_cast<T>(v[0]), static_cast<T>(v[1])};
    __builtin_memcpy(p, out, sizeof out);
}
inline reals root(reals v) { return reals{__builtin_sqrt(v[0]), __builtin_sqrt(v[1])}; }
inline reals at_least(reals v, double limit) { return v < all(limit) ? all(limit) : v; }
inline reals at_most(reals v, reals limit) { return v > limit ? limit : v; }

#endif
#endif

/// The polynomial c0 + c1 x + c2 x^2 ..., from the highest power down.
inline reals polynomial(reals, double c) { return all(c); }
template <class... Higher>
reals polynomial(reals x, double c, Higher... higher)
{
    return polynomial(x, higher...) * x + c;
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions
