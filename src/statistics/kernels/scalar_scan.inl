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

/// Samples side by side: part of a row, the first at (x, y), or whole rows without a gap between them.
struct sample_block {
    const uint8_t* p;
    int width; ///< of a row
    int rows;
    int64_t x;
    int64_t y;
    int64_t step;

    int n() const { return width * rows; }
    int64_t last_x() const { return x + step * (width - 1); }
    int64_t last_y() const { return y + step * (rows - 1); }
    coordinate<int32_t> place_of(int i) const
    {
        return {static_cast<int32_t>(x + step * (i % width)), static_cast<int32_t>(y + step * (i / width))};
    }
};

/// visit(value, x, y) for each sample in scan order.
template <class T, class Visit>
void each_sample(sample_block b, Visit visit)
{
    const uint8_t* p = b.p;
    for (int row = 0; row < b.rows; ++row)
        for (int i = 0; i < b.width; ++i) {
            visit(load_element<T>(p, 0), b.x + b.step * i, b.y + b.step * row);
            p += sizeof(T);
        }
}

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
    each_sample<T>(b, [&](T v, int64_t x, int64_t y) {
        const coordinate<int32_t> here{static_cast<int32_t>(x), static_cast<int32_t>(y)};
        if (!(v >= e.range.minimum)) {
            e.range.minimum = v;
            e.minimum_count = 1;
            e.minimum_at = here;
        } else if (v == e.range.minimum) {
            ++e.minimum_count;
        }
        if (v > e.range.maximum) {
            e.range.maximum = v;
            e.maximum_count = 1;
            e.maximum_at = here;
        } else if (!(v < e.range.maximum)) {
            ++e.maximum_count;
        }
    });
}

/// A vector of elements; where two of them are equal, a comparison has all bits of a lane set.
template <class T>
struct element_vector {
    typedef T type __attribute__((vector_size(vector_bytes)));
    static constexpr int lanes = vector_bytes / static_cast<int>(sizeof(T));
};

/// How often a value stands in a block. Short runs, so that counters as narrow as the pixels suffice.
template <class T>
uint64_t count_of(const uint8_t* p, int n, T value)
{
    using vector = typename element_vector<T>::type;
    constexpr int lanes = element_vector<T>::lanes;
    constexpr int run = 127 * lanes;
    const int whole = n / lanes * lanes;
    uint64_t total = 0;
    for (int start = 0; start < whole; start += run) {
        const int end = whole - start > run ? start + run : whole;
        auto count = vector{} != vector{};
        for (int i = start; i < end; i += lanes)
            count += load_vector<vector>(p + i * static_cast<ptrdiff_t>(sizeof(T))) == value;
        for (int i = 0; i < lanes; ++i) total += static_cast<uint64_t>(-static_cast<int64_t>(count[i]));
    }
    for (int i = whole; i < n; ++i) total += load_element<T>(p, i) == value ? 1 : 0;
    return total;
}

/// The first place of a value that is in the block. A run of vectors needs one branch.
template <class T>
int find_first(const uint8_t* p, int n, T value)
{
    using vector = typename element_vector<T>::type;
    constexpr int lanes = element_vector<T>::lanes;
    int i = 0;
    for (; n - i >= 4 * lanes; i += 4 * lanes) {
        auto equal = vector{} != vector{};
        for (int j = 0; j < 4; ++j)
            equal |= load_vector<vector>(p + (i + j * lanes) * static_cast<ptrdiff_t>(sizeof(T))) == value;
        uint64_t words[vector_bytes / 8], any = 0;
        store_vector(words, equal);
        for (const uint64_t w : words) any |= w;
        if (any != 0) break;
    }
    while (i < n - 1 && !(load_element<T>(p, i) == value)) ++i;
    return i;
}

/// The same as pixel by pixel for a block without NaN: only a block that reaches an extreme is searched for it.
template <class T>
void compare_block(sample_block b, value_range<T> range, extremes<T>& e)
{
    if (range.minimum <= e.range.minimum) {
        if (range.minimum < e.range.minimum) {
            const int first = find_first<T>(b.p, b.n(), range.minimum);
            e.range.minimum = load_element<T>(b.p, first);
            e.minimum_count = 0;
            e.minimum_at = b.place_of(first);
        }
        e.minimum_count += count_of<T>(b.p, b.n(), range.minimum);
    }
    if (range.maximum >= e.range.maximum) {
        if (range.maximum > e.range.maximum) {
            const int first = find_first<T>(b.p, b.n(), range.maximum);
            e.range.maximum = load_element<T>(b.p, first);
            e.maximum_count = 0;
            e.maximum_at = b.place_of(first);
        }
        e.maximum_count += count_of<T>(b.p, b.n(), range.maximum);
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
    each_sample<T>(b, [&](T element, int64_t x, int64_t y) {
        const auto v = static_cast<double>(element);
        s.sum += v;
        s.squares += v * v;
        s.moment_x += static_cast<double>(x) * v;
        s.moment_y += static_cast<double>(y) * v;
    });
}

inline constexpr double exact_limit = 9007199254740992.0; // 2^53

/// No sum can pass 2^53 on the way through the block.
template <class T>
bool stays_exact(sample_block b, const block_sums<T>& block, const four_sums& s)
{
    const double low = __builtin_fabs(static_cast<double>(block.minimum));
    const double high = __builtin_fabs(static_cast<double>(block.maximum));
    const double largest = low > high ? low : high;
    const double most = largest * b.n();
    return __builtin_fabs(s.sum) + most < exact_limit && s.squares + largest * most < exact_limit &&
           __builtin_fabs(s.moment_x) + static_cast<double>(b.last_x()) * most < exact_limit &&
           __builtin_fabs(s.moment_y) + static_cast<double>(b.last_y()) * most < exact_limit;
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
        s.moment_y += y * sum + static_cast<double>(b.step) * static_cast<double>(block.by_row);
    } else {
        add_one_by_one<T>(b, s);
    }
}

/// A block of one row of 32-bit integers: the lanes hold whole numbers, exact wherever add_integers uses them.
template <class T>
block_sums<T> sum_exact_lanes(sample_block b)
{
    row_lanes lanes{};
    const value_range<T> range = add_part<T>(b.p, b.width, 0.0, 1.0, lanes);
    const row_sums sums = sums_of(lanes);
    const bool usable = __builtin_fabs(sums.sum) < exact_limit && sums.squares < exact_limit &&
                        __builtin_fabs(sums.weighted) < exact_limit;
    if (!usable) return {0, 0, 0, 0, range.minimum, range.maximum};
    return {static_cast<int64_t>(sums.sum),
            static_cast<int64_t>(sums.squares),
            static_cast<int64_t>(sums.weighted),
            0,
            range.minimum,
            range.maximum};
}

/// The sums of a row of floats or doubles.
inline void add_row(int64_t y, row_sums row, four_sums& s)
{
    s.sum += row.sum;
    s.squares += row.squares;
    s.moment_x += row.weighted;
    s.moment_y += static_cast<double>(y) * row.sum;
}

template <class T>
struct scanner {
    extremes<T> e;
    four_sums s;
    row_lanes lanes; ///< of a row in several parts, float and double only
    bool exact;      ///< in any order, integers only

    void add_integer_block(sample_block b)
    {
        block_sums<T> block;
        if constexpr (sizeof(T) == 4)
            block = sum_exact_lanes<T>(b);
        else
            block = sum_block<T>(b.p, b.width, b.rows);
        compare_block<T>(b, {block.minimum, block.maximum}, e);
        add_integers<T>(b, block, exact, s);
    }
    /// A NaN in the block leaves one in its sum. So do infinities of both signs, which does no harm.
    void compare_reals(sample_block b, double sum, value_range<T> range)
    {
        const bool comparable =
            sum == sum && e.range.minimum == e.range.minimum && e.range.maximum == e.range.maximum;
        if (comparable)
            compare_block<T>(b, range, e);
        else
            compare_one_by_one<T>(b, e);
    }
    void add_whole_rows_of(sample_block b)
    {
        if constexpr (is_integer<T>) {
            add_integer_block(b);
        } else {
            double sum = 0; // only to see a NaN
            four_sums sums = s;
            const auto range = add_whole_rows<T>(b.p, b.width, b.rows, static_cast<double>(b.step),
                                                 [&](int row, row_sums r) {
                                                     sum += r.sum;
                                                     add_row(b.y + b.step * row, r, sums);
                                                 });
            s = sums;
            compare_reals(b, sum, range);
        }
    }
    /// Part of the row at hand.
    void add_part_of_row(sample_block b)
    {
        if constexpr (is_integer<T>) {
            add_integer_block(b);
        } else {
            const auto range =
                add_part<T>(b.p, b.width, static_cast<double>(b.x), static_cast<double>(b.step), lanes);
            compare_reals(b, sum_of_lanes(lanes.sum), range);
        }
    }
    void end_row(int64_t y)
    {
        if constexpr (!is_integer<T>) {
            add_row(y, sums_of(lanes), s);
            lanes = {};
        }
    }
};

/// How many samples a block has, and how many rows of this width, which follow each other without a gap, it can have.
template <class T>
inline constexpr int block_length = is_integer<T> && sizeof(T) < 4 ? max_block<T>
                                                                   : 8192 / static_cast<int>(sizeof(T));
template <class T>
int rows_of_block(int64_t width)
{
    // Every row of a block of small integers is made up to whole vectors; the others of 32 bits have blocks of a row.
    if (width > block_length<T>) return 0;
    if constexpr (is_integer<T> && sizeof(T) < 4)
        return block_length<T> /
               static_cast<int>((width + block_lanes<T> - 1) / block_lanes<T> * block_lanes<T>);
    else
        return is_integer<T> ? 1 : block_length<T> / static_cast<int>(width);
}

/// The grid has at least one pixel. The extremes start there with a count of 1, and the scan counts it once more.
/// Every part but the last of a row is a whole number of lanes long.
template <class T>
void scan(const sample_grid& grid, scan_result& result)
{
    const sample_grid g = grid;
    const int64_t columns = (static_cast<int64_t>(g.width) + g.step - 1) / g.step;
    const int64_t stride = g.x_stride * g.step;
    const bool side_by_side =
        stride == static_cast<int64_t>(sizeof(T)) && g.pixel_bytes == static_cast<int32_t>(sizeof(T));
    const bool packed = side_by_side && g.step == 1 && g.y_stride == columns * stride;
    constexpr int gathered = 1024;
    T buffer[gathered];
    const auto adjoining = [&](const uint8_t* p, int n) {
        if (side_by_side) return p;
        gather<T>(p, stride, n, g.pixel_bytes, buffer);
        return reinterpret_cast<const uint8_t*>(buffer);
    };
    const int length = side_by_side ? block_length<T> : gathered;

    scanner<T> scanner{};
    scanner.exact = always_exact<T>(g);
    T corner{};
    gather<T>(g.first, 0, 1, g.pixel_bytes, &corner);
    scanner.e = {{corner, corner}, 1, 1, {0, 0}, {0, 0}};
    const int most_rows = packed ? rows_of_block<T>(columns) : 1;
    for (int64_t y = 0; y < g.height;) {
        const uint8_t* const row = g.first + y * g.y_stride;
        if (columns <= length) {
            const int64_t left = (static_cast<int64_t>(g.height) - y + g.step - 1) / g.step;
            const int rows = left < most_rows ? static_cast<int>(left) : most_rows;
            const auto n = static_cast<int>(columns);
            scanner.add_whole_rows_of({adjoining(row, n), n, rows, 0, y, g.step});
            y += int64_t{rows} * g.step;
            continue;
        }
        for (int64_t start = 0; start < columns; start += length) {
            const auto n = static_cast<int>(columns - start < length ? columns - start : length);
            scanner.add_part_of_row({adjoining(row + start * stride, n), n, 1, start * g.step, y, g.step});
        }
        scanner.end_row(y);
        y += g.step;
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
