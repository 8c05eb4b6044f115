// Sums and extremes of pixels as doubles. Sample i of a row is added to lane i mod 16 of each sum, and the lanes of
// a row are folded by halves: lane l takes lane l + 8, then l + 4, l + 2, l + 1. This order is the definition of
// the sums of float and double images: it is the same at every level and stride.
// 32-bit integers are summed the same way where every sum is exact, so that there the order is free.
#pragma once

#include "statistics/kernels/scalar_vectors.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {

inline constexpr int lane_count = 16;

struct row_lanes {
    double sum[lane_count];
    double squares[lane_count];
    double weighted[lane_count];
};

template <class T> struct value_range {
    T minimum;
    T maximum;
};

inline double folded(const double (&lanes)[lane_count])
{
    double l[lane_count];
    __builtin_memcpy(l, lanes, sizeof l);
    for (int half = lane_count / 2; half > 0; half /= 2)
        for (int i = 0; i < half; ++i) l[i] += l[i + half];
    return l[0];
}

template <class V> V load_vector(const uint8_t* p)
{
    V v;
    __builtin_memcpy(&v, p, sizeof v);
    return v;
}

template <class T> doubles load_doubles(const uint8_t* p)
{
    using part = typename vector_of<T>::part;
    if constexpr (sizeof(T) == sizeof(double)) {
        return load_vector<part>(p);
    } else if constexpr (static_cast<T>(-1) < 0) {
        return __builtin_convertvector(load_vector<part>(p), doubles);
    } else {
        // Unsigned: shifted into the signed range and back, both exact.
        return __builtin_convertvector(load_vector<part>(p) ^ INT32_MIN, doubles) + 2147483648.0;
    }
}

/// c + a * b, fused where that cannot be seen: the product of two floats, or of a float and a place below 2^29,
/// is exact in double. 32-bit sums are used only where they are exact altogether.
template <class T> doubles add_product(doubles a, doubles b, doubles c)
{
    if constexpr (sizeof(T) == sizeof(double))
        return a * b + c;
    else
        return add_exact_product(a, b, c);
}

/// Adds n samples, of which the first belongs to lane 0 and lies at x. Extremes pass NaNs over.
template <class T> value_range<T> add_lanes(const uint8_t* p, int n, double x, double step, row_lanes& lanes)
{
    using whole = typename vector_of<T>::whole;
    constexpr int parts = lane_count / vector_doubles;
    constexpr int element = static_cast<int>(sizeof(T));
    constexpr int wholes = lane_count * element / vector_bytes;

    doubles sum[parts], squares[parts], weighted[parts], place[parts];
    __builtin_memcpy(sum, lanes.sum, sizeof sum);
    __builtin_memcpy(squares, lanes.squares, sizeof squares);
    __builtin_memcpy(weighted, lanes.weighted, sizeof weighted);
    for (int i = 0; i < lane_count; ++i) place[i / vector_doubles][i % vector_doubles] = x + step * i;
    const doubles advance = doubles{} + step * lane_count;

    const T first = load_element<T>(p, 0);
    whole least[wholes], greatest[wholes];
    for (int j = 0; j < wholes; ++j) least[j] = greatest[j] = whole{} + first;

    const int even = n / lane_count * lane_count;
    const uint8_t* const end = p + static_cast<ptrdiff_t>(even) * element;
    for (const uint8_t* q = p; q != end; q += lane_count * element) {
#pragma GCC unroll 8
        for (int j = 0; j < parts; ++j) {
            const doubles v = load_doubles<T>(q + j * vector_doubles * element);
            sum[j] += v;
            squares[j] = add_product<T>(v, v, squares[j]);
            weighted[j] = add_product<T>(v, place[j], weighted[j]);
            place[j] += advance;
        }
#pragma GCC unroll 8
        for (int j = 0; j < wholes; ++j) {
            const whole v = load_vector<whole>(q + j * vector_bytes);
            least[j] = lesser(v, least[j]);
            greatest[j] = greater(v, greatest[j]);
        }
    }
    __builtin_memcpy(lanes.sum, sum, sizeof sum);
    __builtin_memcpy(lanes.squares, squares, sizeof squares);
    __builtin_memcpy(lanes.weighted, weighted, sizeof weighted);

    T low[lane_count], high[lane_count];
    __builtin_memcpy(low, least, sizeof low);
    __builtin_memcpy(high, greatest, sizeof high);
    for (int i = even; i < n; ++i) {
        const T v = load_element<T>(p, i);
        const auto wide = static_cast<double>(v);
        const int lane = i - even;
        lanes.sum[lane] += wide;
        lanes.squares[lane] += wide * wide;
        lanes.weighted[lane] += wide * (x + step * i);
        low[lane] = v < low[lane] ? v : low[lane];
        high[lane] = v > high[lane] ? v : high[lane];
    }
    value_range<T> range{low[0], high[0]};
    for (int i = 1; i < lane_count; ++i) {
        range.minimum = low[i] < range.minimum ? low[i] : range.minimum;
        range.maximum = high[i] > range.maximum ? high[i] : range.maximum;
    }
    return range;
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
