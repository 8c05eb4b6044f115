// Magnitudes of gradients: two sums over 3 x 3 pixels and their hypotenuse.
#pragma once

#include "filters/kernels/gradients_table.h"
#include "filters/kernels/padded_row.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

using Filters::gradient_rows;

// The two sums at a place: p[row][column] are the pixels, from above to below and from left to right. Floats are added
// in the order written here.
struct sobel {
    template <class E>
    static void add(const E (&p)[3][3], E& a, E& b)
    {
        a = static_cast<E>(p[0][0] + 2 * p[0][1] + p[0][2] - p[2][0] - 2 * p[2][1] - p[2][2]);
        b = static_cast<E>(p[0][0] + 2 * p[1][0] + p[2][0] - p[0][2] - 2 * p[1][2] - p[2][2]);
    }
};
struct prewitt {
    template <class E>
    static void add(const E (&p)[3][3], E& a, E& b)
    {
        a = static_cast<E>(p[0][0] + p[0][1] + p[0][2] - p[2][0] - p[2][1] - p[2][2]);
        b = static_cast<E>(p[0][0] + p[1][0] + p[2][0] - p[0][2] - p[1][2] - p[2][2]);
    }
};
struct derivative {
    template <class E>
    static void add(const E (&p)[3][3], E& a, E& b)
    {
        a = static_cast<E>(p[0][1] - p[2][1]);
        b = static_cast<E>(p[1][0] - p[1][2]);
    }
};

/// The sums of a run of places.
inline constexpr int64_t run_length = 64;
template <class E>
struct run_of_sums {
    E a[run_length];
    E b[run_length];
};

template <class Filter, class E>
void add_run(const gradient_rows<E>& in, int64_t x, int64_t count, run_of_sums<E>& sums)
{
    const E *const above = in.row[0] + x, *const here = in.row[1] + x, *const below = in.row[2] + x;
    const int64_t step = in.step;
    for (int64_t i = 0; i < count; ++i) {
        const E p[3][3] = {{above[i], above[i + step], above[i + 2 * step]},
                           {here[i], here[i + step], here[i + 2 * step]},
                           {below[i], below[i + step], below[i + 2 * step]}};
        Filter::add(p, sums.a[i], sums.b[i]);
    }
}

template <class T>
constexpr T highest = static_cast<T>((uint64_t{1} << (8 * sizeof(T) - (static_cast<T>(-1) < 0 ? 1 : 0))) - 1);

// The magnitudes of a run, converted: limited at the top and cut for integers.

/// 8 bits: the squares' sum is a whole number below 2^21, whose root in float is cut rightly.
template <class T>
void store_run(const run_of_sums<int16_t>& sums, int64_t count, contiguous_row<T> to)
{
    for (int64_t i = 0; i < count; ++i) {
        const int32_t a = sums.a[i], b = sums.b[i];
        const auto root = static_cast<int32_t>(__builtin_sqrtf(static_cast<float>(a * a + b * b)));
        to[i] = static_cast<T>(root < highest<T> ? root : highest<T>);
    }
}

/// 16 bits: the squares' sum is a whole number below 2^38, whose root in double is rounded once.
template <class T>
void store_run(const run_of_sums<int32_t>& sums, int64_t count, contiguous_row<T> to)
{
    for (int64_t i = 0; i < count; ++i) {
        const double a = sums.a[i], b = sums.b[i];
        const auto root = static_cast<int32_t>(__builtin_sqrt(a * a + b * b));
        to[i] = static_cast<T>(root < highest<T> ? root : highest<T>);
    }
}

// Elsewhere the root of the rounded squares is within two units in the last place of what hypot gives. Where that cannot
// change the pixel hypot is spared: it is many times slower.

inline constexpr uint64_t units_apart = 4;

/// 32 bits: cutting tells them apart only beside a whole number. A single difference has an exact root.
template <class T>
void store_run(const run_of_sums<double>& sums, int64_t count, contiguous_row<T> to)
{
    constexpr double top = highest<T>;
    bool doubtful = false;
    for (int64_t i = 0; i < count; ++i) {
        const double a = sums.a[i], b = sums.b[i];
        const double root = __builtin_sqrt(a * a + b * b), limited = root < top ? root : top;
        const T cut = static_cast<T>(limited);
        const double rest = limited - static_cast<double>(cut);
        doubtful |= (rest < 0x1p-18 || rest > 1 - 0x1p-18) && a != 0 && b != 0 && limited < top;
        to[i] = cut;
    }
    if (!doubtful) return;
    for (int64_t i = 0; i < count; ++i) {
        const double root = __builtin_hypot(sums.a[i], sums.b[i]);
        to[i] = static_cast<T>(root < top ? root : top);
    }
}

inline void store_run(const run_of_sums<double>& sums, int64_t count, contiguous_row<double> to)
{
    for (int64_t i = 0; i < count; ++i) to[i] = __builtin_hypot(sums.a[i], sums.b[i]);
}

#ifdef __FMA__
/// The root in single precision and what it misses, within 2^-44 of the root. False where that can be rounded
/// in two ways, where the square is too small for its errors to be floats, and where it is not finite: then
/// `low` is a NaN.
inline bool store_near_roots(const run_of_sums<float>& sums, int64_t count, contiguous_row<float> to)
{
    int32_t doubtful = 0;
    for (int64_t i = 0; i < count; ++i) {
        const float a = sums.a[i], b = sums.b[i];
        const float p = a * a, q = b * b;
        const float more = p > q ? p : q, less = p > q ? q : p;
        const float square = more + less;
        const float rest = less - (square - more) + (__builtin_fmaf(a, a, -p) + __builtin_fmaf(b, b, -q));
        const float root = __builtin_sqrtf(square);
        const float missing = (__builtin_fmaf(-root, root, square) + rest) * (0.5f / root);
        const float margin = root * 0x1p-44f;
        const float low = root + (missing - margin), high = root + (missing + margin);
        const bool none = (a == 0) & (b == 0);
        doubtful |= none | ((low == high) & (square >= 0x1p-100f)) ? 0 : 1;
        to[i] = none ? 0 : low;
    }
    return doubtful == 0;
}
#endif

/// Floats have 29 bits less: rounding tells them apart only beside the middle between two floats, or where
/// floats lose bits. Squares of floats are exact and stay in the range of doubles.
inline void store_run(const run_of_sums<float>& sums, int64_t count, contiguous_row<float> to)
{
#ifdef __FMA__
    if (store_near_roots(sums, count, to)) return;
#endif
    uint64_t doubtful = 0; // as wide as a root, which makes vectors of both
    for (int64_t i = 0; i < count; ++i) {
        const double a = sums.a[i], b = sums.b[i];
        const double root = __builtin_sqrt(a * a + b * b);
        uint64_t bits;
        __builtin_memcpy(&bits, &root, sizeof bits);
        const uint64_t above_middle = (bits & 0x1FFFFFFF) - (0x10000000 - units_apart);
        doubtful |= above_middle <= 2 * units_apart ? 1 : 0;
        doubtful |= root >= 0x1p-126 || root == 0 ? 0 : 1;
        to[i] = static_cast<float>(root);
    }
    if (doubtful == 0) return;
    for (int64_t i = 0; i < count; ++i) to[i] = static_cast<float>(__builtin_hypot(sums.a[i], sums.b[i]));
}

template <class Filter, class T, class E>
void gradient_row(const gradient_rows<E>& in, uint8_t* to)
{
    constexpr int64_t bytes = sizeof(T), ahead = 4 * run_length * bytes; // in the output, four runs
    const int64_t elements = in.elements;
    run_of_sums<E> sums;
    for (int64_t x = 0; x < elements; x += run_length) {
        const int64_t count = elements - x < run_length ? elements - x : run_length;
        prefetch(in.next_row, to + ahead, x * bytes, (x + run_length) * bytes);
        add_run<Filter>(in, x, count, sums);
        store_run(sums, count, contiguous_row<T>{to + x * bytes});
    }
}

template <class T, class E>
inline constexpr Filters::gradient_loops<E> gradient_loops_of{
    load_padded_row<T, E>, gradient_row<sobel, T, E>, gradient_row<prewitt, T, E>,
    gradient_row<derivative, T, E>};

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters
