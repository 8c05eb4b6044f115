// Bytes through a table of 256, many at once: the lower half of a byte picks a place in all sixteen rows of the
// table, the upper half, bit by bit, one of the rows.
#pragma once

#include <cstdint>
#ifdef __AVX2__
#include <immintrin.h>
#endif

namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic {

#ifdef __AVX2__

#if defined(__AVX512BW__)
using byte_vector = __m512i;
inline byte_vector load_bytes(const uint8_t* p) { return _mm512_loadu_si512(p); }
inline void store_bytes(uint8_t* p, byte_vector a) { _mm512_storeu_si512(p, a); }
inline byte_vector lower_halves(byte_vector a) { return _mm512_and_si512(a, _mm512_set1_epi8(15)); }
inline byte_vector next_bits(byte_vector a) { return _mm512_add_epi8(a, a); }
inline byte_vector pick(byte_vector row, byte_vector places) { return _mm512_shuffle_epi8(row, places); }
/// b where the upper bit of `bits` is set.
inline byte_vector choose(byte_vector a, byte_vector b, byte_vector bits)
{
    return _mm512_mask_blend_epi8(_mm512_movepi8_mask(bits), a, b);
}
inline byte_vector load_row(const uint8_t* p)
{
    return _mm512_maskz_broadcast_i32x4(0xffff, _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)));
}
#else
using byte_vector = __m256i;
inline byte_vector load_bytes(const uint8_t* p)
{
    return _mm256_loadu_si256(reinterpret_cast<const byte_vector*>(p));
}
inline void store_bytes(uint8_t* p, byte_vector a)
{
    _mm256_storeu_si256(reinterpret_cast<byte_vector*>(p), a);
}
inline byte_vector lower_halves(byte_vector a) { return _mm256_and_si256(a, _mm256_set1_epi8(15)); }
inline byte_vector next_bits(byte_vector a) { return _mm256_add_epi8(a, a); }
inline byte_vector pick(byte_vector row, byte_vector places) { return _mm256_shuffle_epi8(row, places); }
inline byte_vector choose(byte_vector a, byte_vector b, byte_vector bits)
{
    return _mm256_blendv_epi8(a, b, bits);
}
inline byte_vector load_row(const uint8_t* p)
{
    return _mm256_broadcastsi128_si256(_mm_loadu_si128(reinterpret_cast<const __m128i*>(p)));
}
#endif

/// What the 2^Bits rows from `rows` on have at the places; bit 7 of `bits` decides between their halves.
template <int Bits>
byte_vector pick_among(const uint8_t* rows, byte_vector places, byte_vector bits)
{
    if constexpr (Bits == 0) {
        return pick(load_row(rows), places);
    } else {
        const byte_vector next = next_bits(bits);
        return choose(pick_among<Bits - 1>(rows, places, next),
                      pick_among<Bits - 1>(rows + (8 << Bits), places, next), bits);
    }
}

/// Whole vectors only: the number of bytes that were done.
inline int64_t look_up_vectors(const uint8_t* table, const uint8_t* src, uint8_t* dst, int64_t count)
{
    uint8_t rows[256]; // of the loop's own, so that no store can change them
    __builtin_memcpy(rows, table, sizeof rows);
    constexpr auto step = static_cast<int64_t>(sizeof(byte_vector));
    int64_t i = 0;
    for (; i + step <= count; i += step) {
        const byte_vector bytes = load_bytes(src + i);
        store_bytes(dst + i, pick_among<4>(rows, lower_halves(bytes), bytes));
    }
    return i;
}

#else

inline int64_t look_up_vectors(const uint8_t*, const uint8_t*, uint8_t*, int64_t) { return 0; }

#endif

/// dst may be src.
inline void look_up(const uint8_t* table, const uint8_t* src, uint8_t* dst, int64_t count)
{
    for (int64_t i = look_up_vectors(table, src, dst, count); i < count; ++i) dst[i] = table[src[i]];
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
