// One pass over the samples of an image: extremes with counts and first positions, and four sums.
//
// The sums of integers are those of adding doubles one by one in scan order. As long as a sum stays below 2^53 that
// is the exact integer, found in any order; a block where it might not is added one by one.
// The sums of float and double images go through 16 lanes, see scalar_lanes.inl; rows are added in row order.
#pragma once

#include "statistics/kernels/scalar_blocks.inl"
#include "statistics/kernels/scalar_lanes.inl"
#include "statistics/kernels/statistics_table.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics {

template <class T>
inline constexpr bool is_integer = static_cast<T>(0.5) == 0;

/// Part of a row: n samples side by side, the first at (x, y).
struct sample_block {
    const uint8_t* p;
    int n;
    int64_t x;
    int64_t y;
    int64_t step;

    int32_t x_of(int i) const { return static_cast<int32_t>(x + step * i); }
};

template <class T>
struct extremes {
    value_range<T> range;
    uint64_t minimum_count, maximum_count;
    coordinate<int32_t> minimum_at, maximum_at;
};

/// The rule a pixel at a time. It is written with negations for NaN: one replaces the minimum and is replaced by
/// the next pixel; to the maximum it counts as equal.
template <class T>
void compare_one_by_one(sample_block b, extremes<T>& e)
{
    const auto y = static_cast<int32_t>(b.y);
    for (int i = 0; i < b.n; ++i) {
        const T v = load_element<T>(b.p, i);
        if (!(v >= e.range.minimum)) {
            e.range.minimum = v;
            e.minimum_count = 1;
            e.minimum_at = {b.x_of(i), y};
        } else if (v == e.range.minimum) {
            ++e.minimum_count;
        }
        if (v > e.range.maximum) {
            e.range.maximum = v;
            e.maximum_count = 1;
            e.maximum_at = {b.x_of(i), y};
        } else if (!(v < e.range.maximum)) {
            ++e.maximum_count;
        }
    }
}

template <size_t Bytes>
struct counter;
template <>
struct counter<1> {
    using type = uint8_t;
};
template <>
struct counter<2> {
    using type = uint16_t;
};
template <>
struct counter<4> {
    using type = uint32_t;
};
template <>
struct counter<8> {
    using type = uint64_t;
};

/// How often a value stands in a block. Short runs, so that counters as narrow as the pixels suffice.
template <class T>
uint64_t count_of(const uint8_t* p, int n, T value)
{
    using count_type = typename counter<sizeof(T)>::type;
    constexpr int run = 128;
    uint64_t total = 0;
    for (int start = 0; start < n; start += run) {
        const int length = n - start < run ? n - start : run;
        const uint8_t* const q = p + static_cast<ptrdiff_t>(start) * static_cast<ptrdiff_t>(sizeof(T));
        count_type count = 0;
        for (int i = 0; i < length; ++i)
            count = static_cast<count_type>(count + (load_element<T>(q, i) == value ? 1 : 0));
        total += count;
    }
    return total;
}

/// The first place of a value that is in the block. The least place of each run needs no branch on a pixel.
template <class T>
int find_first(const uint8_t* p, int n, T value)
{
    using place_type = typename counter<sizeof(T)>::type;
    constexpr int run = 64;
    for (int start = 0; start < n; start += run) {
        const int length = n - start < run ? n - start : run;
        const uint8_t* const q = p + static_cast<ptrdiff_t>(start) * static_cast<ptrdiff_t>(sizeof(T));
        place_type place = run;
        for (int i = 0; i < length; ++i) {
            const auto here = static_cast<place_type>(load_element<T>(q, i) == value ? i : run);
            place = here < place ? here : place;
        }
        if (place < run) return start + static_cast<int>(place);
    }
    return n - 1;
}

/// The same as pixel by pixel for a block without NaN: only a block that reaches an extreme is searched for it.
template <class T>
void compare_block(sample_block b, value_range<T> range, extremes<T>& e)
{
    const auto y = static_cast<int32_t>(b.y);
    if (range.minimum <= e.range.minimum) {
        if (range.minimum < e.range.minimum) {
            const int first = find_first<T>(b.p, b.n, range.minimum);
            e.range.minimum = load_element<T>(b.p, first);
            e.minimum_count = 0;
            e.minimum_at = {b.x_of(first), y};
        }
        e.minimum_count += count_of<T>(b.p, b.n, range.minimum);
    }
    if (range.maximum >= e.range.maximum) {
        if (range.maximum > e.range.maximum) {
            const int first = find_first<T>(b.p, b.n, range.maximum);
            e.range.maximum = load_element<T>(b.p, first);
            e.maximum_count = 0;
            e.maximum_at = {b.x_of(first), y};
        }
        e.maximum_count += count_of<T>(b.p, b.n, range.maximum);
    }
}

/// Copies samples side by side. A pixel of an odd depth is the one or three bytes of that depth, the lowest
/// first, widened to its element: nothing beside it is read.
template <class T>
void gather(const uint8_t* p, int64_t stride, int n, int32_t pixel_bytes, T* to)
{
    if (pixel_bytes == static_cast<int32_t>(sizeof(T))) {
        for (int i = 0; i < n; ++i) to[i] = load_element<T>(p + stride * i, 0);
        return;
    }
    if constexpr (is_integer<T> && sizeof(T) != 1) {
        const int unused = 8 * (static_cast<int>(sizeof(T)) - pixel_bytes);
        for (int i = 0; i < n; ++i) {
            T v = 0;
            __builtin_memcpy(&v, p + stride * i, static_cast<size_t>(pixel_bytes));
            if constexpr (static_cast<T>(-1) < 0) {
                const uint32_t top = static_cast<uint32_t>(v) << unused; // moves the sign to its place
                v = static_cast<T>(static_cast<T>(top) >> unused);
            }
            to[i] = v;
        }
    }
}

struct four_sums {
    double sum;
    double squares;
    double moment_x;
    double moment_y;
};

template <class T>
void add_one_by_one(sample_block b, four_sums& s)
{
    const auto y = static_cast<double>(b.y);
    for (int i = 0; i < b.n; ++i) {
        const auto v = static_cast<double>(load_element<T>(b.p, i));
        s.sum += v;
        s.squares += v * v;
        s.moment_x += static_cast<double>(b.x + b.step * i) * v;
        s.moment_y += y * v;
    }
}

inline constexpr double exact_limit = 9007199254740992.0; // 2^53

/// No sum can pass 2^53 on the way through the block.
template <class T>
bool stays_exact(sample_block b, const block_sums<T>& block, const four_sums& s)
{
    const double low = __builtin_fabs(static_cast<double>(block.minimum));
    const double high = __builtin_fabs(static_cast<double>(block.maximum));
    const double largest = low > high ? low : high;
    const double most = largest * b.n;
    return __builtin_fabs(s.sum) + most < exact_limit && s.squares + largest * most < exact_limit &&
           __builtin_fabs(s.moment_x) + static_cast<double>(b.x_of(b.n - 1)) * most < exact_limit &&
           __builtin_fabs(s.moment_y) + static_cast<double>(b.y) * most < exact_limit;
}

/// No sum can pass 2^53 whatever the pixels of the grid are: true for 8 bits in all but huge images.
template <class T>
bool always_exact(const sample_grid& g)
{
    if constexpr (!is_integer<T> || sizeof(T) > 2) return false;
    const double largest = sizeof(T) == 1 ? 255.0 : 65535.0;
    const double pixels = static_cast<double>(g.width) * static_cast<double>(g.height);
    return largest * pixels * (largest + g.width + g.height) < exact_limit;
}

/// Adds what the block as a whole has where no sum can pass 2^53 on the way, else pixel by pixel.
template <class T>
void add_integers(sample_block b, const block_sums<T>& block, bool exact, four_sums& s)
{
    if (exact || stays_exact<T>(b, block, s)) {
        const auto sum = static_cast<double>(block.sum);
        const auto x = static_cast<double>(b.x);
        const auto y = static_cast<double>(b.y);
        s.sum += sum;
        s.squares += static_cast<double>(block.squares);
        s.moment_x += x * sum + static_cast<double>(b.step) * static_cast<double>(block.weighted);
        s.moment_y += y * sum;
    } else {
        add_one_by_one<T>(b, s);
    }
}

/// 32-bit integers: the lanes hold whole numbers, exact wherever add_integers uses them.
template <class T>
block_sums<T> sum_exact_lanes(sample_block b)
{
    row_lanes lanes{};
    const value_range<T> range = add_lanes<T>(b.p, b.n, 0.0, 1.0, lanes);
    const double sum = sum_of_lanes(lanes.sum), squares = sum_of_lanes(lanes.squares),
                 weighted = sum_of_lanes(lanes.weighted);
    const bool usable =
        __builtin_fabs(sum) < exact_limit && squares < exact_limit && __builtin_fabs(weighted) < exact_limit;
    if (!usable) return {0, 0, 0, range.minimum, range.maximum};
    return {static_cast<int64_t>(sum), static_cast<int64_t>(squares), static_cast<int64_t>(weighted),
            range.minimum, range.maximum};
}

template <class T>
struct scanner {
    extremes<T> e;
    four_sums s;
    row_lanes lanes; ///< of the row at hand, float and double only
    double row_sum;
    bool exact; ///< in any order, integers only

    void add(sample_block b)
    {
        if constexpr (!is_integer<T>) {
            const auto x = static_cast<double>(b.x);
            const value_range<T> range = add_lanes<T>(b.p, b.n, x, static_cast<double>(b.step), lanes);
            // A NaN in the block leaves one in the sum. So do infinities of both signs, which does no harm.
            row_sum = sum_of_lanes(lanes.sum);
            const bool comparable = row_sum == row_sum && e.range.minimum == e.range.minimum &&
                                    e.range.maximum == e.range.maximum;
            if (comparable)
                compare_block<T>(b, range, e);
            else
                compare_one_by_one<T>(b, e);
        } else {
            block_sums<T> block;
            if constexpr (sizeof(T) == 4)
                block = sum_exact_lanes<T>(b);
            else
                block = sum_block<T>(b.p, b.n);
            compare_block<T>(b, {block.minimum, block.maximum}, e);
            add_integers<T>(b, block, exact, s);
        }
    }
    void end_row(int64_t y)
    {
        if constexpr (!is_integer<T>) {
            s.sum += row_sum;
            s.squares += sum_of_lanes(lanes.squares);
            s.moment_x += sum_of_lanes(lanes.weighted);
            s.moment_y += static_cast<double>(y) * row_sum;
            lanes = {};
        }
    }
};

/// The grid has at least one pixel. The extremes start there with a count of 1, and the scan counts it once more.
/// Every block but the last of a row is a whole number of lanes long.
template <class T>
void scan(const sample_grid& grid, scan_result& result)
{
    const sample_grid g = grid;
    const int64_t columns = (static_cast<int64_t>(g.width) + g.step - 1) / g.step;
    const int64_t stride = g.x_stride * g.step;
    const bool side_by_side =
        stride == static_cast<int64_t>(sizeof(T)) && g.pixel_bytes == static_cast<int32_t>(sizeof(T));
    constexpr int gathered = 1024;
    T buffer[gathered];
    const int length = side_by_side ? max_block / static_cast<int>(sizeof(T)) : gathered;

    scanner<T> scanner{};
    scanner.exact = always_exact<T>(g);
    T corner{};
    gather<T>(g.first, 0, 1, g.pixel_bytes, &corner);
    scanner.e = {{corner, corner}, 1, 1, {0, 0}, {0, 0}};
    for (int64_t y = 0; y < g.height; y += g.step) {
        const uint8_t* const row = g.first + y * g.y_stride;
        for (int64_t start = 0; start < columns; start += length) {
            const auto n = static_cast<int>(columns - start < length ? columns - start : length);
            const uint8_t* p = row + start * stride;
            if (!side_by_side) {
                gather<T>(p, stride, n, g.pixel_bytes, buffer);
                p = reinterpret_cast<const uint8_t*>(buffer);
            }
            scanner.add({p, n, start * g.step, y, g.step});
        }
        scanner.end_row(y);
    }
    const extremes<T>& e = scanner.e;
    result = {static_cast<double>(e.range.minimum),
              static_cast<double>(e.range.maximum),
              e.minimum_count,
              e.maximum_count,
              e.minimum_at.x,
              e.minimum_at.y,
              e.maximum_at.x,
              e.maximum_at.y,
              scanner.s.sum,
              scanner.s.squares,
              scanner.s.moment_x,
              scanner.s.moment_y};
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::scalar_statistics
