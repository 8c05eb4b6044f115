// Sums and extremes of pixels as doubles. Sample i of a row is added to lane i mod 16 of each sum, and the lanes of
// a row are folded by halves: lane l takes lane l + 8, then l + 4, l + 2, l + 1. This order is the definition of
// the sums of float and double images: it is the same at every level and stride.
// 32-bit integers are summed the same way where every sum is exact, so that there the order is free.
#pragma once

#include "statistics/kernels/scalar_vectors.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics {

inline constexpr int lane_count = 16;

inline constexpr int lane_parts = lane_count / vector_doubles; ///< vectors that hold the lanes of a sum

/// The lanes of a row's sums.
struct row_lanes {
    doubles sum[lane_parts];
    doubles squares[lane_parts];
    doubles weighted[lane_parts];
};

struct row_sums {
    double sum;
    double squares;
    double weighted;
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

/// Folds lanes by halves with an operation of two values.
template <int Count, class T, class Operation>
T folded(const T* lanes, Operation operation)
{
    if constexpr (Count == 1) {
        return lanes[0];
    } else {
        T half[Count / 2];
        for (int i = 0; i < Count / 2; ++i) half[i] = operation(lanes[i], lanes[i + Count / 2]);
        return folded<Count / 2>(half, operation);
    }
}

/// The halves of vectors are folded as vectors as long as there are several.
inline double sum_of_lanes(const doubles (&lanes)[lane_parts])
{
    const doubles one = folded<lane_parts>(lanes, [](doubles a, doubles b) { return a + b; });
    double left[vector_doubles];
    store_vector(left, one);
    return folded<vector_doubles>(left, [](double a, double b) { return a + b; });
}

inline row_sums sums_of(const row_lanes& lanes)
{
    return {sum_of_lanes(lanes.sum), sum_of_lanes(lanes.squares), sum_of_lanes(lanes.weighted)};
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

/// The extremes so far, NaNs passed over.
template <class T>
struct extreme_lanes {
    using whole = typename vector_of<T>::whole;
    static constexpr int wholes = lane_count * static_cast<int>(sizeof(T)) / vector_bytes;
    whole least[wholes], greatest[wholes];

    explicit extreme_lanes(T first)
    {
        for (int j = 0; j < wholes; ++j) least[j] = greatest[j] = whole{} + first;
    }
    void compare(const void* p)
    {
#pragma GCC unroll 8
        for (int j = 0; j < wholes; ++j) {
            const auto v = load_vector<whole>(static_cast<const uint8_t*>(p) + j * vector_bytes);
            least[j] = lesser(v, least[j]);
            greatest[j] = greater(v, greatest[j]);
        }
    }
    value_range<T> range() const
    {
        T low[lane_count], high[lane_count];
        for (int j = 0; j < wholes; ++j) {
            store_vector(low + j * (vector_bytes / static_cast<int>(sizeof(T))), least[j]);
            store_vector(high + j * (vector_bytes / static_cast<int>(sizeof(T))), greatest[j]);
        }
        return {folded<lane_count>(low, [](T a, T b) { return a < b ? a : b; }),
                folded<lane_count>(high, [](T a, T b) { return a > b ? a : b; })};
    }
};

/// The places of the samples that go to the lanes next.
struct lane_places {
    doubles place[lane_parts];
    doubles advance;

    lane_places(double x, double step) : advance(doubles{} + step * lane_count)
    {
        constexpr double ramp[lane_count] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15};
        for (int j = 0; j < lane_parts; ++j)
            place[j] = load_vector<doubles>(ramp + j * vector_doubles) * step + x;
    }
};

/// Adds n samples, of which the first belongs to lane 0. The lanes of a last, incomplete set of samples are filled up
/// with zeros for the sums, which changes no lane since none is ever -0, and with a pixel for the extremes.
template <class T>
[[gnu::always_inline]] inline void add_lanes(const uint8_t* p, int n, lane_places at, row_lanes& lanes,
                                             extreme_lanes<T>& extremes)
{
    constexpr int element = static_cast<int>(sizeof(T));
    row_lanes l = lanes;
    const auto add = [&](const void* samples) {
#pragma GCC unroll 8
        for (int j = 0; j < lane_parts; ++j) {
            const doubles v =
                load_doubles<T>(static_cast<const uint8_t*>(samples) + j * vector_doubles * element);
            l.sum[j] += v;
            l.squares[j] = add_product<T>(v, v, l.squares[j]);
            l.weighted[j] = add_product<T>(v, at.place[j], l.weighted[j]);
            at.place[j] += at.advance;
        }
    };
    const int even = n / lane_count * lane_count;
    const uint8_t* const end = p + static_cast<ptrdiff_t>(even) * element;
    for (const uint8_t* q = p; q != end; q += lane_count * element) {
        add(q);
        extremes.compare(q);
    }
    if (even < n) {
        T for_sums[lane_count] = {}, for_extremes[lane_count];
        for (T& v : for_extremes) v = load_element<T>(p, 0);
        __builtin_memcpy(for_sums, end, static_cast<size_t>((n - even) * element));
        __builtin_memcpy(for_extremes, end, static_cast<size_t>((n - even) * element));
        add(for_sums);
        extremes.compare(for_extremes);
    }
    lanes = l;
}

/// Adds part of a row, of which the first sample lies at x.
template <class T>
value_range<T> add_part(const uint8_t* p, int n, double x, double step, row_lanes& lanes)
{
    extreme_lanes<T> extremes(load_element<T>(p, 0));
    add_lanes<T>(p, n, lane_places(x, step), lanes, extremes);
    return extremes.range();
}

/// Adds whole rows that follow each other without a gap and hands each row's sums to end_row.
template <class T, class EndRow>
value_range<T> add_whole_rows(const uint8_t* p, int width, int rows, double step, EndRow end_row)
{
    extreme_lanes<T> extremes(load_element<T>(p, 0));
    const lane_places start(0.0, step);
    for (int row = 0; row < rows; ++row) {
        row_lanes lanes{};
        add_lanes<T>(p, width, start, lanes, extremes);
        end_row(row, sums_of(lanes));
        p += static_cast<ptrdiff_t>(width) * static_cast<ptrdiff_t>(sizeof(T));
    }
    return extremes.range();
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics
