// Vectors of 16-bit numbers at the width of a level, for what the compiler would compute in 32 bits.
#pragma once

#include "pixel/level.h"

#include <cstdint>
#ifdef __SSE2__
#include <immintrin.h>
#endif

namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic {

#if defined(__AVX512BW__)
inline constexpr int word_lanes = 32;
#elif defined(__AVX2__)
inline constexpr int word_lanes = 16;
#else
inline constexpr int word_lanes = 8;
#endif
using words = uint16_t __attribute__((vector_size(2 * word_lanes)));
using signed_words = int16_t __attribute__((vector_size(2 * word_lanes)));

inline words all_words(uint16_t value) { return words{} + value; }

/// The upper halves of products, for which the compiler would compute them in twice the width.
inline words upper_halves(words a, words b)
{
#if defined(__AVX512BW__)
    return __builtin_bit_cast(
        words, _mm512_mulhi_epu16(__builtin_bit_cast(__m512i, a), __builtin_bit_cast(__m512i, b)));
#elif defined(__AVX2__)
    return __builtin_bit_cast(
        words, _mm256_mulhi_epu16(__builtin_bit_cast(__m256i, a), __builtin_bit_cast(__m256i, b)));
#elif defined(__SSE2__)
    return __builtin_bit_cast(
        words, _mm_mulhi_epu16(__builtin_bit_cast(__m128i, a), __builtin_bit_cast(__m128i, b)));
#else
    words upper{};
    for (int i = 0; i < word_lanes; ++i) upper[i] = static_cast<uint16_t>((uint32_t{a[i]} * b[i]) >> 16);
    return upper;
#endif
}

/// f on vectors of so many bytes. dst may be a source.
template <class Function, class... Sources>
void each_vector(int64_t bytes, Function f, uint8_t* dst, const Sources*... sources)
{
    constexpr auto step = static_cast<int64_t>(sizeof(words));
    const auto load = [](const uint8_t* from, int64_t size) {
        words v{};
        __builtin_memcpy(&v, from, static_cast<size_t>(size));
        return v;
    };
    int64_t at = 0;
    for (; at + step <= bytes; at += step) {
        const words result = f(load(sources + at, step)...);
        __builtin_memcpy(dst + at, &result, sizeof result);
    }
    const words result = f(load(sources + at, bytes - at)...);
    __builtin_memcpy(dst + at, &result, static_cast<size_t>(bytes - at));
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
