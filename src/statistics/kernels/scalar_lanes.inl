// Sums and extremes of pixels as doubles. Sample i of a row is added to lane i mod 16 of each sum, and the lanes of
// a row are folded by halves: lane l takes lane l + 8, then l + 4, l + 2, l + 1. This order is the definition of
// the sums of float and double images: it is the same at every level and stride.
// 32-bit integers are summed the same way where every sum is exact, so that there the order is free.
#pragma once

#include "statistics/kernels/scalar_vectors.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics {

inline constexpr int lane_count = 16;

struct row_lanes {
    double sum[lane_count];
    double squares[lane_count];
    double weighted[lane_count];
};

template <class T>
struct value_range {
    T minimum;
    T maximum;
};

template <class V>
V load_vector(const void* p)
{
    V v;
    __builtin_memcpy(&v, p, sizeof v);
    return v;
}

template <class V>
void store_vector(void* p, V v)
{
    __builtin_memcpy(p, &v, sizeof v);
}

/// Folds a row's lanes by halves with an operation of two values.
template <class T, class Operation>
T folded(const T (&lanes)[lane_count], Operation operation)
{
    T l[lane_count / 2];
    for (int i = 0; i < 8; ++i) l[i] = operation(lanes[i], lanes[i + 8]);
    for (int i = 0; i < 4; ++i) l[i] = operation(l[i], l[i + 4]);
    for (int i = 0; i < 2; ++i) l[i] = operation(l[i], l[i + 2]);
    return operation(l[0], l[1]);
}

inline double sum_of_lanes(const double (&lanes)[lane_count])
{
    return folded(lanes, [](double a, double b) { return a + b; });
}

template <class T>
doubles load_doubles(const uint8_t* p)
{
    using part = typename vector_of<T>::part;
    if constexpr (sizeof(T) == sizeof(double)) {
        return load_vector<part>(p);
    } else if constexpr (static_cast<T>(-1) < 0) {
        return widened(load_vector<part>(p));
    } else {
        // Unsigned: shifted into the signed range and back, both exact.
        return widened(load_vector<part>(p) ^ INT32_MIN) + 2147483648.0;
    }
}

/// c + a * b, fused where that cannot be seen: the product of two floats, or of a float and a place below 2^29,
/// is exact in double. 32-bit sums are used only where they are exact altogether.
template <class T>
doubles add_product(doubles a, doubles b, doubles c)
{
    if constexpr (sizeof(T) == sizeof(double))
        return a * b + c;
    else
        return add_exact_product(a, b, c);
}

/// Adds n samples, of which the first belongs to lane 0 and lies at x. Extremes pass NaNs over.
template <class T>
value_range<T> add_lanes(const uint8_t* p, int n, double x, double step, row_lanes& lanes)
{
    using whole = typename vector_of<T>::whole;
    constexpr int parts = lane_count / vector_doubles;
    constexpr int element = static_cast<int>(sizeof(T));
    constexpr int wholes = lane_count * element / vector_bytes;

    constexpr double ramp[lane_count] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15};
    doubles sum[parts], squares[parts], weighted[parts], place[parts];
    for (int j = 0; j < parts; ++j) {
        const int lane = j * vector_doubles;
        sum[j] = load_vector<doubles>(lanes.sum + lane);
        squares[j] = load_vector<doubles>(lanes.squares + lane);
        weighted[j] = load_vector<doubles>(lanes.weighted + lane);
        place[j] = load_vector<doubles>(ramp + lane) * step + x;
    }
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
    for (int j = 0; j < parts; ++j) {
        const int lane = j * vector_doubles;
        store_vector(lanes.sum + lane, sum[j]);
        store_vector(lanes.squares + lane, squares[j]);
        store_vector(lanes.weighted + lane, weighted[j]);
    }
    T low[lane_count], high[lane_count];
    for (int j = 0; j < wholes; ++j) {
        store_vector(low + j * (vector_bytes / element), least[j]);
        store_vector(high + j * (vector_bytes / element), greatest[j]);
    }
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
    return {folded(low, [](T a, T b) { return a < b ? a : b; }),
            folded(high, [](T a, T b) { return a > b ? a : b; })};
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics
