#include "pixmat/convert_store.h"

#include <algorithm>
#include <limits>

namespace Qor::Luxar::Convert {
namespace {

/// Limits of an integer target, in the type in which values are compared with them. For a double, `high` may be the
/// power of two above the range; for floats the limits must be exact.
template <class W>
struct limits {
    W low, high;

    explicit limits(const nominal_range& r) noexcept
    {
        if constexpr (std::is_floating_point_v<W>) {
            low = static_cast<W>(r.low);
            high = static_cast<W>(r.high);
        } else {
            using of = std::numeric_limits<W>;
            low = std::is_unsigned_v<W>
                      ? W{0}
                      : static_cast<W>(std::max<int64_t>(r.low, static_cast<int64_t>(of::min())));
            high = static_cast<W>(std::min<uint64_t>(r.high, static_cast<uint64_t>(of::max())));
        }
    }
    W limit(W v) const noexcept { return v < low ? low : v > high ? high : v; }
};

/// Rounds half away from zero. The value lies within the integer type; the remainder is exact, and twice the
/// remainder, truncated, is what the rounding adds.
template <class Integer, class Real>
Integer rounded(Real v) noexcept
{
    const auto whole = static_cast<Integer>(v);
    const Real rest = v - static_cast<Real>(whole);
    return static_cast<Integer>(whole + static_cast<Integer>(rest + rest));
}

/// A value for an integer pixel T, which the limits describe.
template <class T, class W>
T to_integer(W v, const limits<W>& l) noexcept
{
    if constexpr (std::is_integral_v<W>) {
        return static_cast<T>(l.limit(v));
    } else {
        v = v == v ? v : W{0};
        if constexpr (sizeof(T) < 4 || std::is_same_v<T, int32_t>)
            return static_cast<T>(rounded<int32_t>(l.limit(v)));
        else if constexpr (sizeof(T) == 4)
            return static_cast<T>(rounded<int64_t>(l.limit(v)));
        else {
            if (v >= l.high) return std::numeric_limits<T>::max();
            if (v <= l.low) return std::numeric_limits<T>::min();
            return v < 0x1p52 ? static_cast<T>(rounded<int64_t>(v)) : static_cast<T>(v);
        }
    }
}

/// The low bits of a truncated value.
template <class T, class W>
T to_low_bits(W v) noexcept
{
    if constexpr (std::is_integral_v<W>)
        return static_cast<T>(v);
    else if (v >= -0x1p63 && v < 0x1p63)
        return static_cast<T>(static_cast<int64_t>(v));
    else if (v >= 0x1p63 && v < 0x1p64)
        return static_cast<T>(static_cast<uint64_t>(v));
    else
        return 0;
}

enum class way { value, cast };

template <way Way, class T, class W>
void store_numbers(const void* __restrict values, int count, uint8_t* __restrict to, int64_t stride,
                   const nominal_range& range) noexcept
{
    const W* const in = static_cast<const W*>(values);
    const limits<W> l(range);
    for_each_pixel<sizeof(T)>(count, stride, [=](int i, int64_t at) {
        if constexpr (std::is_floating_point_v<T>)
            write(to + at, static_cast<T>(in[i]));
        else if constexpr (Way == way::value)
            write(to + at, to_integer<T>(in[i], l));
        else
            write(to + at, to_low_bits<T>(in[i]));
    });
}

template <class Part, class W>
void store_real_parts(const void* __restrict values, int count, uint8_t* __restrict to, int64_t stride,
                      const nominal_range&) noexcept
{
    const W* const in = static_cast<const W*>(values);
    for_each_pixel<2 * sizeof(Part)>(count, stride, [=](int i, int64_t at) {
        write(to + at, static_cast<Part>(in[i]));
        write(to + at + sizeof(Part), Part{0});
    });
}

template <class Part>
void store_pairs(const void* __restrict values, int count, uint8_t* __restrict to, int64_t stride,
                 const nominal_range&) noexcept
{
    const double* const in = static_cast<const double*>(values);
    for_each_pixel<2 * sizeof(Part)>(count, stride, [=](int i, int64_t at) {
        write(to + at, static_cast<Part>(in[2 * i]));
        write(to + at + sizeof(Part), static_cast<Part>(in[2 * i + 1]));
    });
}

template <bool Alpha, class W>
void store_greys(const void* __restrict values, int count, uint8_t* __restrict to, int64_t stride,
                 const nominal_range&) noexcept
{
    const W* const in = static_cast<const W*>(values);
    const limits<W> bytes(nominal_range{0, 255});
    for (int i = 0; i < count; ++i, to += stride) {
        to[0] = to[1] = to[2] = to_integer<uint8_t>(in[i], bytes);
        if constexpr (Alpha) to[3] = 255;
    }
}

template <int Red, bool Alpha>
void store_colours(const void* __restrict values, int count, uint8_t* __restrict to, int64_t stride,
                   const nominal_range&) noexcept
{
    const auto* const in = static_cast<const colour_32*>(values);
    for (int i = 0; i < count; ++i, to += stride) {
        to[Red] = in[i].channel[0];
        to[1] = in[i].channel[1];
        to[2 - Red] = in[i].channel[2];
        if constexpr (Alpha) to[3] = in[i].channel[3];
    }
}

template <class From, class To>
void row_to_float(const uint8_t* __restrict from, uint8_t* __restrict to, int64_t count,
                  const nominal_range&) noexcept
{
    for (int64_t i = 0; i < count; ++i)
        write(to + i * static_cast<int64_t>(sizeof(To)),
              static_cast<To>(read<From>(from + i * static_cast<int64_t>(sizeof(From)))));
}

template <class From, class To>
void row_to_integer(const uint8_t* __restrict from, uint8_t* __restrict to, int64_t count,
                    const nominal_range& range) noexcept
{
    static_assert(sizeof(To) <= 2); // the limits are exact in any float
    const limits<From> l(range);
    for (int64_t i = 0; i < count; ++i)
        write(to + i * static_cast<int64_t>(sizeof(To)),
              to_integer<To>(read<From>(from + i * static_cast<int64_t>(sizeof(From))), l));
}

template <way Way, class W>
store_pixels store_as(pixel_type type) noexcept
{
    store_pixels s = nullptr;
    if (with_number(type, [&]<class T>(pixel<T>) { s = store_numbers<Way, T, W>; })) return s;
    if (type == pixel_type::complex_32) return store_real_parts<float, W>;
    if (type == pixel_type::complex_64) return store_real_parts<double, W>;
    if (Way == way::cast || !is_colour(type)) return nullptr;
    return type == pixel_type::rgb || type == pixel_type::bgr ? store_greys<false, W> : store_greys<true, W>;
}

template <way Way>
store_pixels store_as(pixel_type type, working kind) noexcept
{
    switch (kind) {
    case working::narrow: return store_as<Way, int32_t>(type);
    case working::wide: return store_as<Way, int64_t>(type);
    case working::huge: return store_as<Way, uint64_t>(type);
    case working::real: return store_as<Way, double>(type);
    default: return nullptr;
    }
}

} // namespace

store_pixels store_value(pixel_type type, working kind) noexcept { return store_as<way::value>(type, kind); }

store_pixels store_cast(pixel_type type, working kind) noexcept { return store_as<way::cast>(type, kind); }

store_pixels store_pair(pixel_type type) noexcept
{
    if (type < pixel_type::complex_32 || type > pixel_type::half_odd_64) return nullptr;
    return type < pixel_type::complex_64 ? store_pairs<float> : store_pairs<double>;
}

store_pixels store_colour(pixel_type type) noexcept
{
    switch (type) {
    case pixel_type::rgb: return store_colours<0, false>;
    case pixel_type::rgba: return store_colours<0, true>;
    case pixel_type::bgr: return store_colours<2, false>;
    case pixel_type::bgra: return store_colours<2, true>;
    default: return nullptr;
    }
}

convert_row direct_value(pixel_type from, pixel_type to) noexcept
{
    using p = pixel_type;
    if (to == p::float_32) {
        if (from == p::unsigned_8) return row_to_float<uint8_t, float>;
        if (from == p::unsigned_16) return row_to_float<uint16_t, float>;
        if (from == p::signed_16) return row_to_float<int16_t, float>;
    }
    if (from == p::float_32) {
        if (to == p::unsigned_8) return row_to_integer<float, uint8_t>;
        if (to == p::unsigned_16) return row_to_integer<float, uint16_t>;
        if (to == p::signed_16) return row_to_integer<float, int16_t>;
    }
    return nullptr;
}

nominal_range range_of(pixel_type type, int32_t bits) noexcept
{
    const bool is_signed = type >= pixel_type::signed_8 && type <= pixel_type::signed_64;
    const int storage = type <= pixel_type::signed_64 ? 8 << (static_cast<int>(type) % 4) : 64;
    const int depth = bits >= 1 && bits < storage ? bits : storage; // odd declarations have any number
    const int magnitude = is_signed ? depth - 1 : depth;
    const uint64_t high = ~uint64_t{0} >> (64 - magnitude);
    return {is_signed ? -static_cast<int64_t>(high) - 1 : 0, high};
}

} // namespace Qor::Luxar::Convert
