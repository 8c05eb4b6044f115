// Sums and extremes of a block of 8- or 16-bit pixels, in integers: exact, whatever the order.
#pragma once

#include "statistics/kernels/scalar_vectors.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics {

/// What a block of up to max_block pixels adds to a scan. The weight of a pixel is its place in the block.
template <class T>
struct block_sums {
    int64_t sum;
    int64_t squares;
    int64_t weighted;
    T minimum;
    T maximum;
};

inline constexpr int max_block = 8192;

template <class T>
block_sums<T> plain_block(const uint8_t* p, int n)
{
    const T first = load_element<T>(p, 0);
    block_sums<T> result{0, 0, 0, first, first};
    for (int i = 0; i < n; ++i) {
        const T v = load_element<T>(p, i);
        const int64_t wide = v;
        result.sum += wide;
        result.squares += wide * wide;
        result.weighted += wide * i;
        result.minimum = v < result.minimum ? v : result.minimum;
        result.maximum = v > result.maximum ? v : result.maximum;
    }
    return result;
}

#ifdef __SSE2__

// The pixels are summed as u = v - bias, which brings every type to unsigned bytes or signed 16 bits; the bias is
// put right at the end. The weights are split: (sum of u in vector k) * k * lanes + u * (lane), and the first is
// gained without a product: adding up the running sum after each vector counts vector k (vectors - k) times.
struct raw_sums {
    int64_t sum;
    int64_t squares;
    int64_t weighted;
};

template <class T>
block_sums<T> without_bias(raw_sums raw, int64_t bias, int64_t n, int64_t low, int64_t high)
{
    return {raw.sum + bias * n, raw.squares + 2 * bias * raw.sum + bias * bias * n,
            raw.weighted + bias * (n * (n - 1) / 2), static_cast<T>(low + bias), static_cast<T>(high + bias)};
}

/// The vectors of a block: whole ones from the pixels, and what is left in one that is filled up, with zero
/// after the bias for sums and with the first pixel for extremes.
template <class T>
struct block_tail {
    static constexpr int lanes = static_cast<int>(sizeof(bits) / sizeof(T));
    T for_sums[lanes];
    T for_extremes[lanes];

    block_tail(const uint8_t* block, int whole, int n, T bias)
    {
        const T first = load_element<T>(block, 0);
        for (int i = 0; i < lanes; ++i) {
            for_sums[i] = bias;
            for_extremes[i] = first;
        }
        const auto bytes = static_cast<size_t>(n - whole) * sizeof(T);
        __builtin_memcpy(for_sums, block + static_cast<size_t>(whole) * sizeof(T), bytes);
        __builtin_memcpy(for_extremes, block + static_cast<size_t>(whole) * sizeof(T), bytes);
    }
};

struct byte_sums {
    bits weight_even, weight_odd, low_bytes;
    bits sum, prefix, squares, weighted, least, greatest;

    byte_sums()
        : low_bytes(set_i16(0xff)), sum(zero_bits()), prefix(sum), squares(sum), weighted(sum),
          least(set_i16(-1)), greatest(sum)
    {
        int16_t even[sizeof(bits) / 2], odd[sizeof(bits) / 2];
        for (size_t i = 0; i < sizeof(bits) / 2; ++i) {
            even[i] = static_cast<int16_t>(2 * i);
            odd[i] = static_cast<int16_t>(2 * i + 1);
        }
        weight_even = load_bits(even);
        weight_odd = load_bits(odd);
    }
    void add(bits u)
    {
        const bits even = and_bits(u, low_bytes);
        const bits odd = high_bytes(u);
        sum = add_i64(sum, sad(u, zero_bits()));
        prefix = add_i64(prefix, sum);
        squares = add_i32(squares, add_i32(madd(even, even), madd(odd, odd)));
        weighted = add_i32(weighted, add_i32(madd(even, weight_even), madd(odd, weight_odd)));
    }
    void compare(bits u)
    {
        least = min_u8(least, u);
        greatest = max_u8(greatest, u);
    }
};

template <class T>
block_sums<T> byte_block(const uint8_t* p, int n)
{
    constexpr int lanes = static_cast<int>(sizeof(bits));
    constexpr int64_t bias = static_cast<T>(-1) < 0 ? -128 : 0;
    const bits flip = set_i16(bias == 0 ? int16_t{0} : static_cast<int16_t>(0x8080));
    const int whole = n / lanes * lanes;

    byte_sums s;
    for (int i = 0; i < whole; i += lanes) {
        const bits u = xor_bits(load_bits(p + i), flip);
        s.add(u);
        s.compare(u);
    }
    int64_t vectors = whole / lanes;
    if (whole < n) {
        const block_tail<T> tail(p, whole, n, static_cast<T>(bias));
        s.add(xor_bits(load_bits(tail.for_sums), flip));
        s.compare(xor_bits(load_bits(tail.for_extremes), flip));
        ++vectors;
    }
    const int64_t sum = sum_of<int64_t>(s.sum);
    const int64_t weighted =
        lanes * (vectors * sum - sum_of<int64_t>(s.prefix)) + sum_of<int32_t>(s.weighted);
    return without_bias<T>({sum, sum_of<int32_t>(s.squares), weighted}, bias, n, least_of<uint8_t>(s.least),
                           greatest_of<uint8_t>(s.greatest));
}

struct short_sums {
    bits ones, weight, low_half;
    bits sum, prefix, weighted; ///< 32-bit lanes: emptied every 128 vectors
    bits squares, least, greatest;

    short_sums()
        : ones(set_i16(1)), low_half(set_i64(0xffffffff)), sum(zero_bits()), prefix(sum), weighted(sum),
          squares(sum), least(set_i16(INT16_MAX)), greatest(set_i16(INT16_MIN))
    {
        int16_t w[sizeof(bits) / 2];
        for (size_t i = 0; i < sizeof(bits) / 2; ++i) w[i] = static_cast<int16_t>(i);
        weight = load_bits(w);
    }
    void add(bits u)
    {
        sum = add_i32(sum, madd(u, ones));
        prefix = add_i32(prefix, sum);
        weighted = add_i32(weighted, madd(u, weight));
        // A pair of squares is at most 2^31 and so fits 32 bits without a sign.
        const bits square = madd(u, u);
        squares = add_i64(squares, add_i64(and_bits(square, low_half), high_halves(square)));
    }
    void compare(bits u)
    {
        least = min_i16(least, u);
        greatest = max_i16(greatest, u);
    }
};

template <class T>
block_sums<T> short_block(const uint8_t* p, int n)
{
    constexpr int lanes = static_cast<int>(sizeof(bits) / 2);
    constexpr int64_t bias = static_cast<T>(-1) < 0 ? 0 : 32768;
    const bits flip = set_i16(bias == 0 ? int16_t{0} : INT16_MIN);
    const int whole = n / lanes * lanes;

    short_sums s;
    raw_sums raw{0, 0, 0};
    const auto empty = [&](int64_t start, int64_t vectors) {
        const int64_t sum = sum_of<int32_t>(s.sum);
        raw.sum += sum;
        raw.weighted +=
            start * sum + lanes * (vectors * sum - sum_of<int32_t>(s.prefix)) + sum_of<int32_t>(s.weighted);
        s.sum = s.prefix = s.weighted = zero_bits();
    };
    for (int start = 0; start < whole;) {
        const int end = whole - start > 128 * lanes ? start + 128 * lanes : whole;
        for (int i = start; i < end; i += lanes) {
            const bits u = xor_bits(load_bits(p + 2 * static_cast<ptrdiff_t>(i)), flip);
            s.add(u);
            s.compare(u);
        }
        empty(start, (end - start) / lanes);
        start = end;
    }
    if (whole < n) {
        const block_tail<T> tail(p, whole, n, static_cast<T>(bias));
        s.add(xor_bits(load_bits(tail.for_sums), flip));
        s.compare(xor_bits(load_bits(tail.for_extremes), flip));
        empty(whole, 1);
    }
    raw.squares = sum_of<int64_t>(s.squares);
    return without_bias<T>(raw, bias, n, least_of<int16_t>(s.least), greatest_of<int16_t>(s.greatest));
}

#endif // __SSE2__

template <class T>
block_sums<T> sum_block(const uint8_t* p, int n)
{
#ifdef __SSE2__
    if (n >= 32) {
        if constexpr (sizeof(T) == 1)
            return byte_block<T>(p, n);
        else
            return short_block<T>(p, n);
    }
#endif
    return plain_block<T>(p, n);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics
