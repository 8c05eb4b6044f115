// Vectors of doubles side by side, and rows of them one above the other, that stay in registers.
#pragma once

#include "pixel/level.h"

#include <cstdint>
#ifdef __SSE2__
#include <immintrin.h>
#endif

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

#if defined(__AVX512F__)
inline constexpr int vector_bytes = 64;
#elif defined(__AVX2__)
inline constexpr int vector_bytes = 32;
#else
inline constexpr int vector_bytes = 16;
#endif
inline constexpr int lanes = vector_bytes / 8;
typedef double doubles __attribute__((vector_size(vector_bytes)));

#define ZELT_INLINE [[gnu::always_inline]] inline

ZELT_INLINE doubles load_vector(const double* from)
{
    doubles v;
    __builtin_memcpy(&v, from, sizeof v);
    return v;
}
ZELT_INLINE doubles load_vector(const float* from)
{
    typedef float half __attribute__((vector_size(vector_bytes / 2)));
    half v;
    __builtin_memcpy(&v, from, sizeof v);
#if defined(__AVX512F__)
    return _mm512_maskz_cvtps_pd(0xFF, v); // compilers make four instructions of what is below
#elif defined(__AVX2__)
    return _mm256_cvtps_pd(v);
#else
    return __builtin_convertvector(v, doubles);
#endif
}
ZELT_INLINE void store_vector(double* to, doubles v) { __builtin_memcpy(to, &v, sizeof v); }
ZELT_INLINE void store_vector(float* to, doubles v)
{
    typedef float half __attribute__((vector_size(vector_bytes / 2)));
#if defined(__AVX512F__)
    const half h = _mm512_maskz_cvtpd_ps(0xFF, v);
#elif defined(__AVX2__)
    const half h = _mm256_cvtpd_ps(v);
#else
    const half h = __builtin_convertvector(v, half);
#endif
    __builtin_memcpy(to, &h, sizeof h);
}

/// Copies a line of the cache to an aligned place in memory that is not read again soon: past the cache, where that is
/// possible, which otherwise first reads what is overwritten.
inline constexpr int64_t line_bytes = 64;
ZELT_INLINE void stream_line(const void* from, void* to)
{
#ifdef __SSE2__
#if defined(__AVX512F__)
    typedef __m512i part;
    const auto stream = [](part* p, part v) { _mm512_stream_si512(p, v); };
#elif defined(__AVX2__)
    typedef __m256i part;
    const auto stream = [](part* p, part v) { _mm256_stream_si256(p, v); };
#else
    typedef __m128i part;
    const auto stream = [](part* p, part v) { _mm_stream_si128(p, v); };
#endif
    for (int64_t i = 0; i < line_bytes / int64_t{sizeof(part)}; ++i)
        stream(static_cast<part*>(to) + i, static_cast<const part*>(from)[i]);
#else
    __builtin_memcpy(to, from, line_bytes);
#endif
}

/// Count vectors. They nest instead of being an array: compilers keep what has a name in registers, and put
/// into memory what is counted.
template <int Count>
struct vectors {
    doubles v;
    vectors<Count - 1> more;
};
template <>
struct vectors<0> {
};

/// As many in each of some rows.
template <int Rows, int Count>
struct tile {
    vectors<Count> row;
    tile<Rows - 1, Count> below;
};
template <int Count>
struct tile<0, Count> {
};

/// Compilers are not to load again what is used several times: a load that crosses lines of the cache costs two.
ZELT_INLINE void keep([[maybe_unused]] doubles& v)
{
#if defined(__AVX512F__)
    __asm__("" : "+v"(v));
#elif defined(__SSE2__)
    __asm__("" : "+x"(v));
#endif
}

template <int Count, class E>
ZELT_INLINE void load(vectors<Count>& to, const E* from)
{
    if constexpr (Count > 0) {
        to.v = load_vector(from);
        keep(to.v);
        load(to.more, from + lanes);
    }
}

/// Calls f(row, offset, vector) for every vector; the offset is in numbers.
template <int Row = 0, int Rows, int Count, class F>
ZELT_INLINE void for_each_vector(const tile<Rows, Count>& t, F&& f)
{
    if constexpr (Rows > 0) {
        for_each_vector<Row, 0>(t.row, f);
        for_each_vector<Row + 1>(t.below, f);
    }
}
template <int Row, int Offset, int Count, class F>
ZELT_INLINE void for_each_vector(const vectors<Count>& v, F&& f)
{
    if constexpr (Count > 0) {
        f(Row, Offset, v.v);
        for_each_vector<Row, Offset + lanes>(v.more, f);
    }
}

/// How a product joins a sum: rounded before it, as everywhere, or fused with it where the processor can do
/// that. For products without rounding these give the same bits.
enum class joined { rounded, fused };
#ifdef __FMA__
inline constexpr joined exact_products = joined::fused;
#else
inline constexpr joined exact_products = joined::rounded;
#endif

template <joined How>
ZELT_INLINE doubles add_product(doubles sum, double k, doubles x)
{
#ifdef __FMA__
    if constexpr (How == joined::fused) {
#ifdef __AVX512F__
        return _mm512_fmadd_pd(_mm512_set1_pd(k), x, sum);
#else
        return _mm256_fmadd_pd(_mm256_set1_pd(k), x, sum);
#endif
    }
#endif
    return sum + k * x;
}

template <joined How, int Count>
ZELT_INLINE void add_products(vectors<Count>& sum, double k, const vectors<Count>& x)
{
    if constexpr (Count > 0) {
        sum.v = add_product<How>(sum.v, k, x.v);
        add_products<How>(sum.more, k, x.more);
    }
}

/// The same for rows First to Last. *k is the factor of row First, and each row's factor lies `distance`
/// before that of the row above.
template <joined How, int First, int Last, int Rows, int Count>
ZELT_INLINE void add_products(tile<Rows, Count>& sum, const double* k, int64_t distance,
                              const vectors<Count>& x)
{
    if constexpr (First > 0) {
        add_products<How, First - 1, Last - 1>(sum.below, k, distance, x);
    } else if constexpr (Last >= 0) {
        add_products<How>(sum.row, *k, x);
        add_products<How, 0, Last - 1>(sum.below, k - distance, distance, x);
    }
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters
