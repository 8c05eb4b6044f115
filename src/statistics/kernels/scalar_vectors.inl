// Vectors of a level: the few operations on 8- and 16-bit integers that compilers do not find by themselves,
// and minimum and maximum of floats without the care for NaN that a comparison has.
#pragma once

#include <cstddef>
#include <cstdint>
#ifdef __SSE2__
#include <immintrin.h>
#endif

namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics {

template <class T>
T load_element(const uint8_t* p, int64_t i)
{
    T value;
    __builtin_memcpy(&value, p + i * static_cast<int64_t>(sizeof(T)), sizeof value);
    return value;
}

#ifdef __SSE2__

// Suffixes tell the lanes: u8, i16, i32, i64. madd multiplies 16-bit lanes and adds neighbours into 32 bits;
// sad adds eight bytes each into 64 bits.
#if defined(__AVX512BW__)
using bits = __m512i;
inline bits load_bits(const void* p) { return _mm512_loadu_si512(p); }
inline void store_bits(void* p, bits a) { _mm512_storeu_si512(p, a); }
inline bits zero_bits() { return _mm512_setzero_si512(); }
inline bits set_i16(int16_t a) { return _mm512_set1_epi16(a); }
inline bits set_i64(int64_t a) { return _mm512_set1_epi64(a); }
inline bits and_bits(bits a, bits b) { return _mm512_and_si512(a, b); }
inline bits xor_bits(bits a, bits b) { return _mm512_xor_si512(a, b); }
inline bits add_i16(bits a, bits b) { return _mm512_add_epi16(a, b); }
inline bits add_i32(bits a, bits b) { return _mm512_add_epi32(a, b); }
inline bits add_i64(bits a, bits b) { return _mm512_add_epi64(a, b); }
inline bits min_u8(bits a, bits b) { return _mm512_min_epu8(a, b); }
inline bits max_u8(bits a, bits b) { return _mm512_max_epu8(a, b); }
inline bits min_i16(bits a, bits b) { return _mm512_min_epi16(a, b); }
inline bits max_i16(bits a, bits b) { return _mm512_max_epi16(a, b); }
inline bits high_bytes(bits a) { return _mm512_srli_epi16(a, 8); }
inline bits high_halves(bits a) { return _mm512_maskz_srli_epi64(0xff, a, 32); }
inline bits high_shorts(bits a) { return _mm512_maskz_srai_epi32(0xffff, a, 16); } // with their sign
inline bits madd(bits a, bits b) { return _mm512_madd_epi16(a, b); }
inline bits sad(bits a, bits b) { return _mm512_sad_epu8(a, b); }
#elif defined(__AVX2__)
using bits = __m256i;
inline bits load_bits(const void* p) { return _mm256_loadu_si256(static_cast<const bits*>(p)); }
inline void store_bits(void* p, bits a) { _mm256_storeu_si256(static_cast<bits*>(p), a); }
inline bits zero_bits() { return _mm256_setzero_si256(); }
inline bits set_i16(int16_t a) { return _mm256_set1_epi16(a); }
inline bits set_i64(int64_t a) { return _mm256_set1_epi64x(a); }
inline bits and_bits(bits a, bits b) { return _mm256_and_si256(a, b); }
inline bits xor_bits(bits a, bits b) { return _mm256_xor_si256(a, b); }
inline bits add_i16(bits a, bits b) { return _mm256_add_epi16(a, b); }
inline bits add_i32(bits a, bits b) { return _mm256_add_epi32(a, b); }
inline bits add_i64(bits a, bits b) { return _mm256_add_epi64(a, b); }
inline bits min_u8(bits a, bits b) { return _mm256_min_epu8(a, b); }
inline bits max_u8(bits a, bits b) { return _mm256_max_epu8(a, b); }
inline bits min_i16(bits a, bits b) { return _mm256_min_epi16(a, b); }
inline bits max_i16(bits a, bits b) { return _mm256_max_epi16(a, b); }
inline bits high_bytes(bits a) { return _mm256_srli_epi16(a, 8); }
inline bits high_halves(bits a) { return _mm256_srli_epi64(a, 32); }
inline bits high_shorts(bits a) { return _mm256_srai_epi32(a, 16); } // with their sign
inline bits madd(bits a, bits b) { return _mm256_madd_epi16(a, b); }
inline bits sad(bits a, bits b) { return _mm256_sad_epu8(a, b); }
#else
using bits = __m128i;
inline bits load_bits(const void* p) { return _mm_loadu_si128(static_cast<const bits*>(p)); }
inline void store_bits(void* p, bits a) { _mm_storeu_si128(static_cast<bits*>(p), a); }
inline bits zero_bits() { return _mm_setzero_si128(); }
inline bits set_i16(int16_t a) { return _mm_set1_epi16(a); }
inline bits set_i64(int64_t a) { return _mm_set1_epi64x(a); }
inline bits and_bits(bits a, bits b) { return _mm_and_si128(a, b); }
inline bits xor_bits(bits a, bits b) { return _mm_xor_si128(a, b); }
inline bits add_i16(bits a, bits b) { return _mm_add_epi16(a, b); }
inline bits add_i32(bits a, bits b) { return _mm_add_epi32(a, b); }
inline bits add_i64(bits a, bits b) { return _mm_add_epi64(a, b); }
inline bits min_u8(bits a, bits b) { return _mm_min_epu8(a, b); }
inline bits max_u8(bits a, bits b) { return _mm_max_epu8(a, b); }
inline bits min_i16(bits a, bits b) { return _mm_min_epi16(a, b); }
inline bits max_i16(bits a, bits b) { return _mm_max_epi16(a, b); }
inline bits high_bytes(bits a) { return _mm_srli_epi16(a, 8); }
inline bits high_halves(bits a) { return _mm_srli_epi64(a, 32); }
inline bits high_shorts(bits a) { return _mm_srai_epi32(a, 16); } // with their sign
inline bits madd(bits a, bits b) { return _mm_madd_epi16(a, b); }
inline bits sad(bits a, bits b) { return _mm_sad_epu8(a, b); }
#endif

/// The sum of all 32- or 64-bit lanes.
template <class Lane>
int64_t sum_of(bits a)
{
    Lane lanes[sizeof(bits) / sizeof(Lane)];
    store_bits(lanes, a);
    int64_t sum = 0;
    for (const Lane l : lanes) sum += l;
    return sum;
}

/// The least and the greatest of all lanes.
template <class Lane>
Lane least_of(bits a)
{
    Lane lanes[sizeof(bits) / sizeof(Lane)];
    store_bits(lanes, a);
    Lane least = lanes[0];
    for (const Lane l : lanes) least = l < least ? l : least;
    return least;
}
template <class Lane>
Lane greatest_of(bits a)
{
    Lane lanes[sizeof(bits) / sizeof(Lane)];
    store_bits(lanes, a);
    Lane greatest = lanes[0];
    for (const Lane l : lanes) greatest = l > greatest ? l : greatest;
    return greatest;
}

#endif // __SSE2__

// Vectors for floating-point work: as many doubles as fit a register, and elements to fill one.
#if defined(__AVX512F__)
inline constexpr int vector_bytes = 64;
#elif defined(__AVX2__)
inline constexpr int vector_bytes = 32;
#else
inline constexpr int vector_bytes = 16;
#endif
inline constexpr int vector_doubles = vector_bytes / 8;

typedef double doubles __attribute__((vector_size(vector_bytes)));
typedef float floats __attribute__((vector_size(vector_bytes)));

template <class T>
struct vector_of;
template <>
struct vector_of<float> {
    typedef floats whole;
    typedef float part __attribute__((vector_size(vector_bytes / 2))); ///< as many as there are doubles
};
template <>
struct vector_of<int32_t> {
    typedef int32_t whole __attribute__((vector_size(vector_bytes)));
    typedef int32_t part __attribute__((vector_size(vector_bytes / 2)));
};
template <>
struct vector_of<uint32_t> {
    typedef uint32_t whole __attribute__((vector_size(vector_bytes)));
    typedef int32_t part __attribute__((vector_size(vector_bytes / 2)));
};
template <>
struct vector_of<double> {
    typedef doubles whole;
    typedef doubles part;
};

/// The lesser and the greater of two lanes; with a NaN in a lane the second argument wins.
template <class V>
V lesser(V a, V b)
{
    return a < b ? a : b;
}
template <class V>
V greater(V a, V b)
{
    return a > b ? a : b;
}
#if defined(__AVX512F__)
inline floats lesser(floats a, floats b) { return _mm512_maskz_min_ps(static_cast<__mmask16>(-1), a, b); }
inline floats greater(floats a, floats b) { return _mm512_maskz_max_ps(static_cast<__mmask16>(-1), a, b); }
inline doubles lesser(doubles a, doubles b) { return _mm512_maskz_min_pd(static_cast<__mmask8>(-1), a, b); }
inline doubles greater(doubles a, doubles b) { return _mm512_maskz_max_pd(static_cast<__mmask8>(-1), a, b); }
/// a * b + c where the product is exact, so that fusing the two changes nothing.
inline doubles add_exact_product(doubles a, doubles b, doubles c) { return _mm512_fmadd_pd(a, b, c); }
#elif defined(__AVX2__)
inline floats lesser(floats a, floats b) { return _mm256_min_ps(a, b); }
inline floats greater(floats a, floats b) { return _mm256_max_ps(a, b); }
inline doubles lesser(doubles a, doubles b) { return _mm256_min_pd(a, b); }
inline doubles greater(doubles a, doubles b) { return _mm256_max_pd(a, b); }
inline doubles add_exact_product(doubles a, doubles b, doubles c) { return _mm256_fmadd_pd(a, b, c); }
#else
#ifdef __SSE2__
inline floats lesser(floats a, floats b) { return _mm_min_ps(a, b); }
inline floats greater(floats a, floats b) { return _mm_max_ps(a, b); }
inline doubles lesser(doubles a, doubles b) { return _mm_min_pd(a, b); }
inline doubles greater(doubles a, doubles b) { return _mm_max_pd(a, b); }
#endif
inline doubles add_exact_product(doubles a, doubles b, doubles c) { return a * b + c; }
#endif

/// As many 32-bit elements as there are doubles, each turned into one exactly.
template <class Part>
doubles widened(Part a)
{
    return __builtin_convertvector(a, doubles);
}
#if defined(__AVX512F__)
inline doubles widened(vector_of<float>::part a) { return _mm512_maskz_cvtps_pd(0xff, a); }
#endif

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics
