// Sums and extremes of a block of 8- or 16-bit pixels, in integers: exact, whatever the order.
#pragma once

#include "statistics/kernels/scalar_vectors.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics {

/// A block is at most so many vectors: its sums then stay within their lanes.
#ifdef __SSE2__
template <class T>
inline constexpr int block_lanes = static_cast<int>(sizeof(bits) / sizeof(T));
#else
template <class T>
inline constexpr int block_lanes = 16;
#endif
template <class T>
inline constexpr int max_block = 128 * block_lanes<T>;

/// What a block adds to a scan: rows of one width that follow each other in memory without a gap. A pixel's weights are
/// its place in its row and the row's place in the block.
template <class T>
struct block_sums {
    int64_t sum;
    int64_t squares;
    int64_t weighted;
    int64_t by_row;
    T minimum;
    T maximum;
};

template <class T>
block_sums<T> plain_block(const uint8_t* p, int width, int rows)
{
    const T first = load_element<T>(p, 0);
    block_sums<T> result{0, 0, 0, 0, first, first};
    for (int row = 0; row < rows; ++row) {
        int64_t row_sum = 0;
        for (int i = 0; i < width; ++i) {
            const T v = load_element<T>(p, i);
            const int64_t wide = v;
            row_sum += wide;
            result.squares += wide * wide;
            result.weighted += wide * i;
            result.minimum = v < result.minimum ? v : result.minimum;
            result.maximum = v > result.maximum ? v : result.maximum;
        }
        result.sum += row_sum;
        result.by_row += row_sum * row;
        p += static_cast<ptrdiff_t>(width) * static_cast<ptrdiff_t>(sizeof(T));
    }
    return result;
}

#ifdef __SSE2__

// The pixels are summed as u = v - bias, which brings every type to unsigned bytes or signed 16 bits; the bias is
// put right at the end. The weights are split: (sum of u in vector k of a row) * k * lanes + u * (lane), and the
// first is gained without a product: adding up the row's running sum after each vector counts vector k
// (vectors - k) times. The rows are weighted the same way, by adding up the running sum after each row.
struct raw_sums {
    int64_t sum;
    int64_t squares;
    int64_t prefix; ///< of the vectors in a row
    int64_t by_lane;
    int64_t row_prefix;
};

struct block_shape {
    int64_t width;
    int64_t rows;
    int64_t lanes;

    int64_t vectors() const { return (width + lanes - 1) / lanes; } ///< of a row
};

template <class T>
block_sums<T> without_bias(raw_sums raw, block_shape b, int64_t bias, int64_t low, int64_t high)
{
    const int64_t n = b.width * b.rows;
    const int64_t weighted = b.lanes * (b.vectors() * raw.sum - raw.prefix) + raw.by_lane;
    const int64_t by_row = b.rows * raw.sum - raw.row_prefix;
    return {raw.sum + bias * n,
            raw.squares + 2 * bias * raw.sum + bias * bias * n,
            weighted + bias * (n * (b.width - 1) / 2),
            by_row + bias * (n * (b.rows - 1) / 2),
            static_cast<T>(low + bias),
            static_cast<T>(high + bias)};
}

/// What is left of a row after its whole vectors, in one that is filled up: with zero after the bias for sums and with
/// the row's first pixel for extremes.
template <class T>
struct block_tail {
    static constexpr int lanes = static_cast<int>(sizeof(bits) / sizeof(T));
    T for_sums[lanes];
    T for_extremes[lanes];

    block_tail(const uint8_t* row, int whole, int width, T bias)
    {
        const T first = load_element<T>(row, 0);
        for (int i = 0; i < lanes; ++i) {
            for_sums[i] = bias;
            for_extremes[i] = first;
        }
        const auto bytes = static_cast<size_t>(width - whole) * sizeof(T);
        __builtin_memcpy(for_sums, row + static_cast<size_t>(whole) * sizeof(T), bytes);
        __builtin_memcpy(for_extremes, row + static_cast<size_t>(whole) * sizeof(T), bytes);
    }
};

/// Of vectors of bytes.
template <class T>
struct byte_sums {
    static constexpr int lanes = static_cast<int>(sizeof(bits));
    static constexpr int64_t bias = static_cast<T>(-1) < 0 ? -128 : 0;
    bits low_bytes = set_i16(0xff), flip = set_i16(bias == 0 ? int16_t{0} : static_cast<int16_t>(0x8080));
    bits row = zero_bits(), sum = row, prefix = row, row_prefix = row; ///< 64-bit lanes
    bits squares = row;                                                ///< 32-bit lanes
    bits even = row, odd = row; ///< 16-bit lanes: the bytes of all vectors
    bits least = set_i16(-1), greatest = row;

    bits without_sign(bits v) const { return bias == 0 ? v : xor_bits(v, flip); }
    void add(bits u)
    {
        const bits low = and_bits(u, low_bytes);
        const bits high = high_bytes(u);
        row = add_i64(row, sad(u, zero_bits()));
        prefix = add_i64(prefix, row);
        squares = add_i32(squares, add_i32(madd(low, low), madd(high, high)));
        even = add_i16(even, low);
        odd = add_i16(odd, high);
    }
    void compare(bits u)
    {
        least = min_u8(least, u);
        greatest = max_u8(greatest, u);
    }
    void end_row()
    {
        sum = add_i64(sum, row);
        row_prefix = add_i64(row_prefix, sum);
        row = zero_bits();
    }
    block_sums<T> result(block_shape shape) const
    {
        int16_t low[lanes / 2], high[lanes / 2];
        store_bits(low, even);
        store_bits(high, odd);
        int32_t by_lane = 0; // below 2^31: 128 vectors of 64 bytes
        for (int i = 0; i < lanes / 2; ++i) by_lane += 2 * i * low[i] + (2 * i + 1) * high[i];
        return without_bias<T>({sum_of<int64_t>(sum), sum_of<int32_t>(squares), sum_of<int64_t>(prefix),
                                by_lane, sum_of<int64_t>(row_prefix)},
                               shape, bias, least_of<uint8_t>(least), greatest_of<uint8_t>(greatest));
    }
};

/// Of vectors of 16-bit pixels.
template <class T>
struct short_sums {
    static constexpr int lanes = static_cast<int>(sizeof(bits) / 2);
    static constexpr int64_t bias = static_cast<T>(-1) < 0 ? 0 : 32768;
    bits ones = set_i16(1), low_half = set_i64(0xffffffff), flip = set_i16(INT16_MIN);
    bits row = zero_bits(), sum = row, prefix = row, row_prefix = row; ///< 32-bit lanes, of pairs of pixels
    bits odd = row;                                                    ///< 32-bit lanes: every second pixel
    bits squares = row;                                                ///< 64-bit lanes
    bits least = set_i16(INT16_MAX), greatest = set_i16(INT16_MIN);

    bits without_sign(bits v) const { return bias == 0 ? v : xor_bits(v, flip); }
    void add(bits u)
    {
        row = add_i32(row, madd(u, ones));
        prefix = add_i32(prefix, row);
        odd = add_i32(odd, high_shorts(u));
        // A pair of squares is at most 2^31 and so fits 32 bits without a sign.
        const bits square = madd(u, u);
        squares = add_i64(squares, add_i64(and_bits(square, low_half), high_halves(square)));
    }
    void compare(bits u)
    {
        least = min_i16(least, u);
        greatest = max_i16(greatest, u);
    }
    void end_row()
    {
        sum = add_i32(sum, row);
        row_prefix = add_i32(row_prefix, sum);
        row = zero_bits();
    }
    block_sums<T> result(block_shape shape) const
    {
        int32_t pairs[lanes / 2];
        store_bits(pairs, sum);
        int64_t by_lane = sum_of<int32_t>(odd);
        for (int i = 0; i < lanes / 2; ++i) by_lane += int64_t{2 * i} * pairs[i];
        return without_bias<T>({sum_of<int32_t>(sum), sum_of<int64_t>(squares), sum_of<int32_t>(prefix),
                                by_lane, sum_of<int32_t>(row_prefix)},
                               shape, bias, least_of<int16_t>(least), greatest_of<int16_t>(greatest));
    }
};

template <template <class> class Sums, class T>
block_sums<T> vector_block(const uint8_t* p, int width, int rows)
{
    constexpr int lanes = Sums<T>::lanes;
    const int whole = width / lanes * lanes;
    Sums<T> s;
    for (int row = 0; row < rows; ++row) {
        for (int i = 0; i < whole; i += lanes) {
            const bits u = s.without_sign(load_bits(p + i * static_cast<ptrdiff_t>(sizeof(T))));
            s.add(u);
            s.compare(u);
        }
        if (whole < width) {
            const block_tail<T> tail(p, whole, width, static_cast<T>(Sums<T>::bias));
            s.add(s.without_sign(load_bits(tail.for_sums)));
            s.compare(s.without_sign(load_bits(tail.for_extremes)));
        }
        s.end_row();
        p += static_cast<ptrdiff_t>(width) * static_cast<ptrdiff_t>(sizeof(T));
    }
    return s.result({width, rows, lanes});
}

#endif // __SSE2__

/// The block has at most max_block pixels; of a row that is not whole vectors long, the rest counts as one.
template <class T>
block_sums<T> sum_block(const uint8_t* p, int width, int rows)
{
#ifdef __SSE2__
    if (width >= 32) {
        if constexpr (sizeof(T) == 1)
            return vector_block<byte_sums, T>(p, width, rows);
        else
            return vector_block<short_sums, T>(p, width, rows);
    }
#endif
    return plain_block<T>(p, width, rows);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics
