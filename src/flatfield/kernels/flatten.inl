// One camera row: the dark reference subtracted, the gain multiplied in. Differences of integers live in 32
// bits and wrap; every product of integers is formed unsigned, so that nothing here is undefined.
#pragma once

#include "flatfield/kernels/each_pixel.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield {

template <class S, class D>
uint32_t difference(S s, D d)
{
    return static_cast<uint32_t>(s) - static_cast<uint32_t>(d);
}

/// The nearest value of a narrow type. Computed in 32 bits.
template <class T>
T clipped(int32_t v)
{
    constexpr int32_t low = T(-1) > T(0) ? 0 : -1 - ((1 << (8 * sizeof(T) - 1)) - 1);
    constexpr int32_t high = low + ((1 << (8 * sizeof(T))) - 1);
    v = v < low ? low : v;
    return static_cast<T>(v > high ? high : v);
}

/// Toward zero; 0 for NaN and for what has no place in 64 bits.
inline int64_t truncated(double v) { return v >= -0x1p63 && v < 0x1p63 ? static_cast<int64_t>(v) : 0; }

/// Half is added in single precision, then the floor is taken. The low 64 bits.
inline int64_t rounded(float v)
{
    const double sum = v + 0.5f;
    if (!(sum >= -0x1p63 && sum < 0x1p63)) return 0; // NaN too
    const auto whole = static_cast<int64_t>(sum);
    return whole - (static_cast<double>(whole) > sum ? 1 : 0); // a sum beyond 2^23 is whole
}

// The operations. T is the destination's type, S the source's, D the dark reference's, G the gain's.

template <class T, class S, class D>
struct subtract {
    T operator()(S s, D d) const
    {
        if constexpr (is_real<S>)
            return s - d;
        else if constexpr (is_real<T>)
            return static_cast<T>(static_cast<int32_t>(difference(s, d)));
        else if constexpr (is_same<T, S>::value && is_same<T, D>::value && is_narrow<T> && T(-1) > T(0))
            return static_cast<T>((s > d ? s : d) - d); // the same in the width of the type, and faster
        else if constexpr (is_narrow<T>)
            return clipped<T>(static_cast<int32_t>(difference(s, d)));
        else if constexpr (is_same<T, uint32_t>::value && is_narrow<S>)
            // Deliberately a threshold: only 0 and the top value come out of this pairing.
            return static_cast<int32_t>(difference(s, d)) < 0 ? 0 : 0xFFFFFFFF;
        else
            return static_cast<T>(difference(s, d));
    }
};

template <class T, class S, class D, class G>
struct multiply_fixed {
    uint32_t shift;

    T operator()(S s, D d, G g) const
    {
        if constexpr (is_real<S>) {
            return (s - d) * g; // all are of one real type; the shift plays no part
        } else if constexpr (is_real<T>) {
            const T product = static_cast<T>(static_cast<int32_t>(difference(s, d))) * static_cast<T>(g);
            return static_cast<T>(static_cast<uint32_t>(static_cast<int64_t>(product)) >>
                                  shift); // below 2^33
        } else {
            // For a narrow destination the difference is first cut to its width, and extended again.
            const auto cut = static_cast<T>(difference(s, d));
            return static_cast<T>((static_cast<uint32_t>(cut) * static_cast<uint32_t>(g)) >> shift);
        }
    }
};

template <class T, class S, class D>
struct multiply_float {
    static float product(S s, D d, float g)
    {
        if constexpr (is_narrow<T>)
            return static_cast<float>(static_cast<T>(difference(s, d))) * g;
        else if constexpr (is_same<T, uint32_t>::value)
            return static_cast<float>(difference(s, d)) * g;
        else
            return static_cast<float>(static_cast<int32_t>(difference(s, d))) * g;
    }

    T operator()(S s, D d, float g) const
    {
        if constexpr (is_real<T>)
            return static_cast<T>(static_cast<int32_t>(difference(s, d))) * static_cast<T>(g);
        else
            return static_cast<T>(rounded(product(s, d, g)));
    }
};

// Differences are above -65536 and below 98304, and 98304 times 2^14 is below 2^31.
inline constexpr float small_gain = 16384.0f;

/// The same result for gains below small_gain in size, and not negative where T is unsigned and narrow:
/// everything fits 32 bits, and the loop is vectorised.
template <class T, class S, class D>
struct multiply_small_float {
    T operator()(S s, D d, float g) const
    {
        const float sum = multiply_float<T, S, D>::product(s, d, g) + 0.5f;
        const auto whole = static_cast<int32_t>(sum);
        if constexpr (T(-1) > T(0)) return static_cast<T>(whole); // of a positive number
        return static_cast<T>(whole -
                              (static_cast<float>(whole) > sum ? 1 : 0)); // a sum beyond 2^23 is whole
    }
};

template <class T, class Count, class Row>
bool all_small(Count n, Row gain)
{
    const int64_t end = n;
    // The bits of positive floats are ordered like their values. Those of a NaN lie above the limit, and so do those
    // of negative floats as they are.
    constexpr bool positive_only = T(-1) > T(0);
    constexpr uint32_t limit = __builtin_bit_cast(uint32_t, small_gain) - 1;
    const auto bits_of = [=](int64_t x) {
        const auto bits = __builtin_bit_cast(uint32_t, static_cast<float>(gain[x]));
        return positive_only ? bits : bits & 0x7FFFFFFF;
    };
#if defined(__SSE2__) && !defined(__SSE4_1__)
    // No maximum of these here; but a difference is negative above the limit.
    uint32_t signs = 0;
    for (int64_t x = 0; x < end; ++x) signs |= bits_of(x) | (limit - bits_of(x));
    return signs >> 31 == 0;
#else
    uint32_t most = 0;
    for (int64_t x = 0; x < end; ++x) most = bits_of(x) > most ? bits_of(x) : most;
    return most <= limit;
#endif
}

template <class T, class S, class D, class Count, class Dst, class Src, class Dark, class Gain>
void multiply_float_piece(Count n, Dst dst, Src src, Dark dark, Gain gain)
{
    if (all_small<T>(n, gain))
        each_pixel(n, multiply_small_float<T, S, D>{}, dst, src, dark, gain);
    else
        each_pixel(n, multiply_float<T, S, D>{}, dst, src, dark, gain);
}

// The rows.

template <template <class> class Row, class T, class S, class D>
void subtract_row(const row_job& job, int64_t y)
{
    each_pixel(job.width, subtract<T, S, D>{}, row_of<Row, T>(job.dst, y), row_of<Row, S>(job.src, y),
               row_of<Row, D>(job.dark, y));
}

template <template <class> class Row, class T, class S, class D, class G>
void multiply_fixed_row(const row_job& job, int64_t y)
{
    each_pixel(job.width, multiply_fixed<T, S, D, G>{job.shift}, row_of<Row, T>(job.dst, y),
               row_of<Row, S>(job.src, y), row_of<Row, D>(job.dark, y), row_of<Row, G>(job.gain, y));
}

template <template <class> class Row, class T, class S, class D>
void multiply_float_row(const row_job& job, int64_t y)
{
    const auto dst = row_of<Row, T>(job.dst, y);
    const auto src = row_of<Row, S>(job.src, y);
    const auto dark = row_of<Row, D>(job.dark, y);
    const auto gain = row_of<Row, float>(job.gain, y);
    if constexpr (!is_same<Row<T>, contiguous_row<T>>::value || is_real<T> || is_same<T, uint32_t>::value)
        each_pixel(job.width, multiply_float<T, S, D>{}, dst, src, dark, gain);
    else
        each_piece(job.width, [=](int64_t begin, auto n) {
            multiply_float_piece<T, S, D>(n, row_from(dst, begin), row_from(src, begin),
                                          row_from(dark, begin), row_from(gain, begin));
        });
}

template <template <class> class Row, class D, class... T>
constexpr void fill_mixed(row_function (&table)[FlatField::gain_kinds][8])
{
    int i = 0;
    ((table[FlatField::gain_absent][i] = subtract_row<Row, T, uint16_t, D>,
      table[FlatField::gain_fixed][i] = multiply_fixed_row<Row, T, uint16_t, D, uint16_t>,
      table[FlatField::gain_float][i] = multiply_float_row<Row, T, uint16_t, D>, ++i),
     ...);
}

template <template <class> class Row, class... T>
constexpr FlatField::flatten_table make_flatten_table()
{
    FlatField::flatten_table table{
        {{subtract_row<Row, T, T, T>...}, {multiply_fixed_row<Row, T, T, T, T>...}}, {}};
    fill_mixed<Row, uint16_t, T...>(table.mixed[FlatField::dark_unsigned]);
    fill_mixed<Row, int16_t, T...>(table.mixed[FlatField::dark_signed]);
    return table;
}

template <template <class> class Row>
inline constexpr FlatField::flatten_table flatten_rows =
    make_flatten_table<Row, uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>();

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield
