// One row of two exposures merged. L is the long exposure's pixel, H the short one's; which of them a pixel
// takes, and which is scaled, differs between the rules with and without a gain. That is deliberate.
#pragma once

#include "flatfield/kernels/flatten.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield {

/// Toward zero, limited to the type; NaN gives 0. Without a branch, so that it is vectorised.
template <class T>
T limited(double v)
{
    constexpr double high = sizeof(T) == 2 ? 0x1p15 - 1 : 0x1p31 - 1;
    constexpr double low = -high - 1;
    v = v == v ? v : 0;
    v = v < low ? low : v;
    return static_cast<T>(static_cast<int32_t>(v < high ? v : high));
}

/// Limited to a 16-bit destination, as it is for a 32-bit one.
template <class T>
T fitted(int32_t v)
{
    if constexpr (sizeof(T) == 2)
        return clipped<T>(v);
    else
        return v;
}

// The operations: what a pixel becomes where the long exposure is saturated, and where it is below.

/// No references.
template <class T, class S>
struct merge_raw {
    double ratio;

    T saturated(S l, S) const { return limited<T>(static_cast<double>(l) * ratio); }
    T below(S, S h) const
    {
        // Deliberately a threshold in 16 bits.
        if constexpr (sizeof(T) == 2)
            return h < 32768 ? -32768 : 32767;
        else
            return h < 65535 ? h : 0x7FFFFFFF;
    }
};

template <class T, class S, class D>
struct merge_dark {
    double ratio;

    T saturated(S l, S, D d) const
    {
        return limited<T>(static_cast<double>(static_cast<int32_t>(difference(l, d))) * ratio);
    }
    T below(S, S h, D d) const { return fitted<T>(static_cast<int32_t>(difference(h, d))); }
};

template <class T, class S, class D>
struct merge_float_gain {
    double ratio;

    T saturated(S, S h, D d, float g) const
    {
        return limited<T>(static_cast<double>(static_cast<int32_t>(difference(h, d))) * ratio *
                          static_cast<double>(g));
    }
    T below(S l, S, D d, float g) const
    {
        const float product = multiply_float<int32_t, S, D>::product(l, d, g);
        if constexpr (sizeof(T) == 2) {
            // The limits come before the conversion, so that infinite gains end at them.
            const float sum = product + 0.5f;
            if (sum >= 32767.0f) return 32767;
            if (sum < -32768.0f) return -32768;
        }
        return static_cast<T>(rounded(product));
    }

    template <class Count, class Long, class Short, class Dark, class Gain>
    bool has_small_gain(Count n, Long, Short, Dark, Gain gain) const
    {
        return all_small<int32_t>(n, gain);
    }
    T below_with_small_gain(S l, S, D d, float g) const
    {
        return fitted<T>(multiply_small_float<int32_t, S, D>{}(l, d, g));
    }
};

template <class T, class S, class D>
struct merge_fixed_gain {
    double ratio;
    uint32_t shift;

    T saturated(S, S h, D d, uint16_t g) const
    {
        // A negative product comes out of the logical shift as a large positive number.
        const double product =
            static_cast<double>(static_cast<int32_t>(difference(h, d))) * ratio * static_cast<double>(g);
        return limited<T>(static_cast<double>(static_cast<uint32_t>(truncated(product)) >> shift));
    }
    T below(S l, S, D d, uint16_t g) const
    {
        return fitted<T>(static_cast<int32_t>((difference(l, d) * g) >> shift));
    }
};

/// Sixteen-bit lanes throughout: signed compare, wrapping differences, the high half of a signed product.
struct merge_lanes {
    int16_t saturated;
    uint16_t ratio;
    uint32_t left_shift;

    int16_t operator()(uint16_t l, uint16_t h, int16_t d, uint16_t g) const
    {
        const auto dark = static_cast<uint16_t>(d);
        const auto from_long = static_cast<uint16_t>(l - dark);
        const auto from_short =
            static_cast<uint16_t>(static_cast<uint32_t>(static_cast<uint16_t>(h - dark)) * ratio);
        const auto v = static_cast<int16_t>(saturated > static_cast<int16_t>(l) ? from_long : from_short);
        const auto high = static_cast<uint16_t>((int32_t{v} * static_cast<int16_t>(g)) >> 16);
        return static_cast<int16_t>(left_shift < 16 ? high << left_shift : 0);
    }
};

template <class Count, class Row, class S>
bool reaches(Count n, Row row, S level)
{
    const int64_t end = n;
    S most = 0;
    for (int64_t x = 0; x < end; ++x) most = row[x] > most ? static_cast<S>(row[x]) : most;
    return most >= level;
}

/// dst = below(pixels...) for n pixels that are none of them saturated.
template <class Count, class Operation, class Dst, class... Sources>
void merge_below(Count n, Operation operation, Dst dst, Sources... sources)
{
    if constexpr (requires { &Operation::below_with_small_gain; })
        if (operation.has_small_gain(n, sources...)) {
            const auto below = [=](auto... pixels) { return operation.below_with_small_gain(pixels...); };
            return each_pixel(n, below, dst, sources...);
        }
    const auto below = [=](auto... pixels) { return operation.below(pixels...); };
    each_pixel(n, below, dst, sources...);
}

/// Saturated pixels of a frame lie together: most pieces of a row have none. In the others each pixel is computed
/// in both ways, since loops without a choice are vectorised.
template <class T, class Count, class S, class Operation, class Dst, class Long, class... Others>
void merge_piece(Count n, S level, Operation operation, Dst dst, Long l, Others... others)
{
    if (!reaches(n, l, level)) return merge_below(n, operation, dst, l, others...);
    T above[piece], below[piece];
    const contiguous_row<T> above_row{reinterpret_cast<uint8_t*>(above)};
    const contiguous_row<T> below_row{reinterpret_cast<uint8_t*>(below)};
    const auto saturated = [=](auto... pixels) { return operation.saturated(pixels...); };
    each_pixel(n, saturated, above_row, l, others...);
    merge_below(n, operation, below_row, l, others...);
    const auto choose = [=](S at, T where_saturated, T elsewhere) {
        return at >= level ? where_saturated : elsewhere;
    };
    each_pixel(n, choose, dst, l, above_row, below_row);
}

template <template <class> class Row, class T, class S, class Operation, class... References>
void merge_row(const row_job& job, int64_t y, Operation operation, References... references)
{
    const auto dst = row_of<Row, T>(job.dst, y);
    const auto l = row_of<Row, S>(job.src, y);
    const auto h = row_of<Row, S>(job.brief, y);
    const auto level = static_cast<S>(job.saturated);
    each_piece(job.width, [=](int64_t begin, auto n) {
        merge_piece<T>(n, level, operation, row_from(dst, begin), row_from(l, begin), row_from(h, begin),
                       row_from(references, begin)...);
    });
}

template <template <class> class Row, class T, class S>
void merge_raw_row(const row_job& job, int64_t y)
{
    merge_row<Row, T, S>(job, y, merge_raw<T, S>{job.ratio});
}

template <template <class> class Row, class T, class S, class D>
void merge_dark_row(const row_job& job, int64_t y)
{
    merge_row<Row, T, S>(job, y, merge_dark<T, S, D>{job.ratio}, row_of<Row, D>(job.dark, y));
}

template <template <class> class Row, class T, class S, class D>
void merge_float_gain_row(const row_job& job, int64_t y)
{
    merge_row<Row, T, S>(job, y, merge_float_gain<T, S, D>{job.ratio}, row_of<Row, D>(job.dark, y),
                         row_of<Row, float>(job.gain, y));
}

template <template <class> class Row, class T, class S, class D>
void merge_fixed_gain_row(const row_job& job, int64_t y)
{
    merge_row<Row, T, S>(job, y, merge_fixed_gain<T, S, D>{job.ratio, job.shift}, row_of<Row, D>(job.dark, y),
                         row_of<Row, uint16_t>(job.gain, y));
}

template <template <class> class Row>
void merge_lanes_row(const row_job& job, int64_t y)
{
    const merge_lanes lanes{static_cast<int16_t>(job.saturated), job.lane_ratio, job.left_shift};
    each_pixel(job.width, lanes, row_of<Row, int16_t>(job.dst, y), row_of<Row, uint16_t>(job.src, y),
               row_of<Row, uint16_t>(job.brief, y), row_of<Row, int16_t>(job.dark, y),
               row_of<Row, uint16_t>(job.gain, y));
}

template <template <class> class Row, class S, class D, class... T>
constexpr void fill_merges(FlatField::merge_table& table, FlatField::dark_kind dark)
{
    using namespace FlatField;
    int i = 0;
    ((table.raw[i] = merge_raw_row<Row, T, S>,
      table.single[dark][gain_absent][i] = subtract_row<Row, T, S, D>,
      table.single[dark][gain_fixed][i] = multiply_fixed_row<Row, T, S, D, uint16_t>,
      table.single[dark][gain_float][i] = multiply_float_row<Row, T, S, D>,
      table.references[dark][gain_absent][i] = merge_dark_row<Row, T, S, D>,
      table.references[dark][gain_fixed][i] = merge_fixed_gain_row<Row, T, S, D>,
      table.references[dark][gain_float][i] = merge_float_gain_row<Row, T, S, D>, ++i),
     ...);
}

/// S: the type of both exposures.
template <template <class> class Row, class S>
constexpr FlatField::merge_table make_merge_table()
{
    FlatField::merge_table table{};
    fill_merges<Row, S, uint16_t, int16_t, int32_t>(table, FlatField::dark_unsigned);
    fill_merges<Row, S, int16_t, int16_t, int32_t>(table, FlatField::dark_signed);
    if constexpr (sizeof(S) == 2) table.lanes = merge_lanes_row<Row>;
    return table;
}

template <template <class> class Row, class S>
inline constexpr FlatField::merge_table merge_rows = make_merge_table<Row, S>();

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield
