// Loops over single pixels against limits, and what is found of all pixels.
#pragma once

#include "arithmetic/kernels/look_up.inl"
#include "arithmetic/kernels/operators.inl"
#include "arithmetic/kernels/thresholds_table.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic {

using Arithmetic::binning;
using Arithmetic::difference;
using Arithmetic::extremes;
using Arithmetic::long_size;
using Arithmetic::pixel_grid;
using Arithmetic::stretch;
using Arithmetic::threshold_limits;

template <class T>
inline constexpr bool is_narrow = is_integer<T> && sizeof(T) < 4;

/// The ends of an integer type.
template <class T>
inline constexpr T top_of = is_signed<T> ? static_cast<T>((1u << (8 * sizeof(T) - 1)) - 1u)
                                         : static_cast<T>(-1);
template <class T>
inline constexpr T bottom_of = static_cast<T>(~top_of<T>);

/// dst = f(src), pixel by pixel.
template <class T, class Function>
void map_pixels(pixel_grid src, pixel_grid dst, long_size extent, Function f)
{
    constexpr auto adjacent = static_cast<int64_t>(sizeof(T));
    const bool contiguous = src.x_stride == adjacent && dst.x_stride == adjacent;
    for (int64_t y = 0; y < extent.height; ++y) {
        uint8_t* const from = src.first + y * src.y_stride;
        uint8_t* const to = dst.first + y * dst.y_stride;
        if (contiguous)
            each(extent.width, f, contiguous_row<T>{to}, contiguous_row<T>{from});
        else
            each(extent.width, f, strided_row<T>{to, dst.x_stride}, strided_row<T>{from, src.x_stride});
    }
}

/// NaN stays, and a low limit above the high one wins.
template <class T>
void threshold(pixel_grid src, pixel_grid dst, long_size extent, threshold_limits l)
{
    const T low_limit = static_cast<T>(l.low_limit), low_value = static_cast<T>(l.low_value);
    const T high_limit = static_cast<T>(l.high_limit), high_value = static_cast<T>(l.high_value);
    map_pixels<T>(src, dst, extent, [=](T p) {
        const T not_low = p > high_limit ? high_value : p;
        return p < low_limit ? low_value : not_low;
    });
}

/// The most negative integer stays what it is.
template <class T>
void absolute(pixel_grid src, pixel_grid dst, long_size extent)
{
    map_pixels<T>(src, dst, extent, [](T p) {
        if constexpr (is_same<T, float>)
            return __builtin_fabsf(p);
        else if constexpr (is_same<T, double>)
            return __builtin_fabs(p);
        else
            return static_cast<T>(p < 0 ? 0u - static_cast<uint32_t>(p) : static_cast<uint32_t>(p));
    });
}

/// In one step for the vector instructions: there is none for unsigned integers.
template <class T>
double as_double(T p)
{
    if constexpr (is_same<T, uint32_t>)
        return static_cast<double>(static_cast<int32_t>(p ^ 0x80000000u)) + 0x1p31;
    else
        return static_cast<double>(p);
}

/// Eight and sixteen bits: pixels are limited in their own type first, so that values hardly leave it.
template <class T>
struct narrow_stretch {
    T first, end;
    double factor;

    explicit narrow_stretch(stretch s)
        : first(static_cast<T>(s.offset)), end(static_cast<T>(s.end)), factor(s.factor)
    {
    }
    T operator()(T p) const
    {
        p = p < first ? first : p;
        p = p < end ? p : end;
        double v = static_cast<double>(static_cast<uint16_t>(p - first)) * factor;
        if constexpr (is_signed<T>) v += static_cast<double>(bottom_of<T>);
        const auto whole = static_cast<int32_t>(v);
        return static_cast<T>(whole < top_of<T> ? whole : top_of<T>);
    }
};

/// Factors and offsets are whole, and so is every value. Inside the type the product is exact.
template <class T>
struct wide_stretch {
    double offset, factor;

    explicit wide_stretch(stretch s) : offset(s.offset), factor(s.factor) {}
    T operator()(T p) const
    {
        constexpr double lowest = -0x1p31,
                         highest = 0x1p31 - 1; // both types after a shift of the unsigned one
        double v = (as_double(p) - offset) * factor - 0x1p31;
        v = v < lowest ? lowest : v;
        v = v < highest ? v : highest;
        const auto whole = static_cast<uint32_t>(static_cast<int32_t>(v));
        return static_cast<T>(is_signed<T> ? whole : whole ^ 0x80000000u);
    }
};

/// Values are lifted by the least normal number, deliberately: results rely on no pixel being exactly 0.
template <class T>
struct real_stretch {
    double offset, factor;

    explicit real_stretch(stretch s) : offset(s.offset), factor(s.factor) {}
    T operator()(T p) const
    {
        constexpr double least = sizeof(T) == 4 ? 0x1p-126 : 0x1p-1022;
        return static_cast<T>((static_cast<double>(p) - offset) * factor + least);
    }
};

template <class T>
void stretched(pixel_grid src, pixel_grid dst, long_size extent, stretch s)
{
    if constexpr (is_real<T>) {
        map_pixels<T>(src, dst, extent, real_stretch<T>(s));
    } else if constexpr (sizeof(T) == 4) {
        map_pixels<T>(src, dst, extent, wide_stretch<T>(s));
    } else if constexpr (sizeof(T) == 2) {
        map_pixels<T>(src, dst, extent, narrow_stretch<T>(s));
    } else {
        uint8_t table[256];
        const narrow_stretch<T> f(s);
        for (int i = 0; i < 256; ++i) table[i] = static_cast<uint8_t>(f(static_cast<T>(i)));
        const bool contiguous = src.x_stride == 1 && dst.x_stride == 1;
        for (int64_t y = 0; y < extent.height; ++y) {
            const uint8_t* const from = src.first + y * src.y_stride;
            uint8_t* const to = dst.first + y * dst.y_stride;
            if (contiguous)
                look_up(table, from, to, extent.width);
            else
                for (int64_t x = 0; x < extent.width; ++x)
                    to[x * dst.x_stride] = table[from[x * src.x_stride]];
        }
    }
}

/// The type in which the vector instructions of every level have minimum and maximum, and the bit that turns one
/// order into the other.
template <class T>
struct ordered {
    using type = T;
    static constexpr int flip = 0;
};
template <>
struct ordered<int8_t> {
    using type = uint8_t;
    static constexpr int flip = 0x80;
};
template <>
struct ordered<uint16_t> {
    using type = int16_t;
    static constexpr int flip = 0x8000;
};

/// The extremes of some pixels, NaN passed over. None: the least is the top of the type.
template <class T>
struct running_extremes {
    T least, greatest;

    running_extremes()
    {
        if constexpr (is_integer<T>) {
            least = top_of<T>;
            greatest = bottom_of<T>;
        } else {
            least = static_cast<T>(__builtin_inf());
            greatest = -least;
        }
    }
    void add(T low, T high)
    {
        least = low < least ? low : least;
        greatest = greatest < high ? high : greatest;
    }
};

template <class T, class Row>
void add_row(running_extremes<T>& found, Row row, int64_t count)
{
    if constexpr (is_integer<T>) {
        using O = typename ordered<T>::type;
        constexpr int flip = ordered<T>::flip;
        running_extremes<O> in_row;
        for (int64_t i = 0; i < count; ++i) {
            const O p = static_cast<O>(static_cast<T>(row[i]) ^ flip);
            in_row.add(p, p);
        }
        if (count > 0) found.add(static_cast<T>(in_row.least ^ flip), static_cast<T>(in_row.greatest ^ flip));
    } else { // the compiler does not exchange comparisons of floats, so they go in lanes
        constexpr int lanes = 128 / sizeof(T);
        const running_extremes<T> none;
        T least[lanes], greatest[lanes];
        for (int l = 0; l < lanes; ++l) least[l] = none.least, greatest[l] = none.greatest;
        int64_t i = 0;
        for (; i + lanes <= count; i += lanes)
            for (int l = 0; l < lanes; ++l) {
                const T p = row[i + l];
                least[l] = p < least[l] ? p : least[l];
                greatest[l] = greatest[l] < p ? p : greatest[l];
            }
        for (int l = 0; l < lanes; ++l) found.add(least[l], greatest[l]);
        for (; i < count; ++i) found.add(row[i], row[i]);
    }
}

template <class T>
extremes find_extremes(pixel_grid src, long_size extent)
{
    running_extremes<T> found;
    for (int64_t y = 0; y < extent.height; ++y) {
        uint8_t* const row = src.first + y * src.y_stride;
        if (src.x_stride == static_cast<int64_t>(sizeof(T)))
            add_row(found, contiguous_row<T>{row}, extent.width);
        else
            add_row(found, strided_row<T>{row, src.x_stride}, extent.width);
    }
    return {static_cast<double>(found.least), static_cast<double>(found.greatest)};
}

template <difference D, class T>
double distance(T p, T minimum)
{
    if constexpr (D == difference::real)
        return as_double(p) - as_double(minimum);
    else if constexpr (is_real<T> || is_narrow<T>)
        return static_cast<double>(p - minimum);
    else
        return as_double(static_cast<T>(static_cast<uint32_t>(p) - static_cast<uint32_t>(minimum)));
}

template <difference D, class T, class Row>
void bins_of_row(Row row, int64_t count, binning b, uint16_t* bins)
{
    const T minimum = static_cast<T>(b.minimum);
    const contiguous_row<uint16_t> out{reinterpret_cast<uint8_t*>(bins)};
    if (is_narrow<T> && b.scale == 1.0) { // never beyond the last bin: that of the greatest pixel
        each(
            count, [=](T p) { return static_cast<uint16_t>(p - minimum); }, out, row);
        return;
    }
    const double scale = b.scale;
    const double last = b.last;
    each(
        count,
        [=](T p) {
            double bin = distance<D>(p, minimum) * scale;
            bin = bin > 0 ? bin : 0; // NaN, too
            bin = bin < last ? bin : last;
            return static_cast<uint16_t>(static_cast<int32_t>(bin));
        },
        out, row);
}

template <difference D, class T>
void bins(const uint8_t* from, int64_t stride, int64_t count, binning b, uint16_t* to)
{
    auto* const first = const_cast<uint8_t*>(from);
    if (stride == static_cast<int64_t>(sizeof(T)))
        bins_of_row<D, T>(contiguous_row<T>{first}, count, b, to);
    else
        bins_of_row<D, T>(strided_row<T>{first, stride}, count, b, to);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
