// One row of two exposures merged. L is the long exposure's pixel, H the short one's; which of them a pixel
// takes, and which is scaled, differs between the rules with and without a gain. That is deliberate.
#pragma once

#include "flatfield/kernels/flatten.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield {

/// Toward zero, limited to the type; NaN gives 0.
template <class T>
T limited(double v)
{
    constexpr int32_t high = sizeof(T) == 2 ? 0x7FFF : 0x7FFFFFFF;
    constexpr int32_t low = -high - 1;
    if (v < low) return static_cast<T>(low);
    if (v >= high) return static_cast<T>(high);
    return v == v ? static_cast<T>(v) : T{0};
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

/// No references.
template <class T, class S>
struct merge_raw {
    uint32_t saturated;
    double ratio;

    T operator()(S l, S h) const
    {
        if (l >= saturated) return limited<T>(static_cast<double>(l) * ratio);
        // Deliberately a threshold in 16 bits.
        if constexpr (sizeof(T) == 2)
            return h < 32768 ? -32768 : 32767;
        else
            return h < 65535 ? h : 0x7FFFFFFF;
    }
};

template <class T, class S, class D>
struct merge_dark {
    uint32_t saturated;
    double ratio;

    T operator()(S l, S h, D d) const
    {
        if (l >= saturated)
            return limited<T>(static_cast<double>(static_cast<int32_t>(difference(l, d))) * ratio);
        return fitted<T>(static_cast<int32_t>(difference(h, d)));
    }
};

template <class T, class S, class D>
struct merge_float_gain {
    uint32_t saturated;
    double ratio;

    T operator()(S l, S h, D d, float g) const
    {
        if (l >= saturated)
            return limited<T>(static_cast<double>(static_cast<int32_t>(difference(h, d))) * ratio *
                              static_cast<double>(g));
        const float product = static_cast<float>(static_cast<int32_t>(difference(l, d))) * g;
        if constexpr (sizeof(T) == 2) {
            // The limits come before the conversion, so that infinite gains end at them.
            const float sum = product + 0.5f;
            if (sum >= 32767.0f) return 32767;
            if (sum < -32768.0f) return -32768;
            return static_cast<T>(rounded(product));
        } else {
            return static_cast<T>(rounded(product));
        }
    }
};

template <class T, class S, class D>
struct merge_fixed_gain {
    uint32_t saturated;
    double ratio;
    uint32_t shift;

    T operator()(S l, S h, D d, uint16_t g) const
    {
        if (l >= saturated) {
            // A negative product comes out of the logical shift as a large positive number.
            const double product =
                static_cast<double>(static_cast<int32_t>(difference(h, d))) * ratio * static_cast<double>(g);
            return limited<T>(static_cast<double>(static_cast<uint32_t>(truncated(product)) >> shift));
        }
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

template <template <class> class Row, class T, class S>
void merge_raw_row(const row_job& job, int64_t y)
{
    each_pixel(0, job.width, merge_raw<T, S>{job.saturated, job.ratio}, row_of<Row, T>(job.dst, y),
               row_of<Row, S>(job.src, y), row_of<Row, S>(job.brief, y));
}

template <template <class> class Row, class T, class S, class D>
void merge_dark_row(const row_job& job, int64_t y)
{
    each_pixel(0, job.width, merge_dark<T, S, D>{job.saturated, job.ratio}, row_of<Row, T>(job.dst, y),
               row_of<Row, S>(job.src, y), row_of<Row, S>(job.brief, y), row_of<Row, D>(job.dark, y));
}

template <template <class> class Row, class T, class S, class D>
void merge_float_gain_row(const row_job& job, int64_t y)
{
    each_pixel(0, job.width, merge_float_gain<T, S, D>{job.saturated, job.ratio}, row_of<Row, T>(job.dst, y),
               row_of<Row, S>(job.src, y), row_of<Row, S>(job.brief, y), row_of<Row, D>(job.dark, y),
               row_of<Row, float>(job.gain, y));
}

template <template <class> class Row, class T, class S, class D>
void merge_fixed_gain_row(const row_job& job, int64_t y)
{
    each_pixel(0, job.width, merge_fixed_gain<T, S, D>{job.saturated, job.ratio, job.shift},
               row_of<Row, T>(job.dst, y), row_of<Row, S>(job.src, y), row_of<Row, S>(job.brief, y),
               row_of<Row, D>(job.dark, y), row_of<Row, uint16_t>(job.gain, y));
}

template <template <class> class Row>
void merge_lanes_row(const row_job& job, int64_t y)
{
    const merge_lanes lanes{static_cast<int16_t>(job.saturated), job.lane_ratio, job.left_shift};
    each_pixel(0, job.width, lanes, row_of<Row, int16_t>(job.dst, y), row_of<Row, uint16_t>(job.src, y),
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
