// One pixel at a time, in the widest arithmetic there is: what conversions must give. A long double holds every
// 64-bit integer, float and double exactly.
#pragma once

#include "support/cases.h"

#include <array>

namespace Qor::Luxar::Test {

using namespace ZELT;
using ZELT::Test::generator;

using wide = long double;
static_assert(std::numeric_limits<wide>::digits >= 64);

inline bool is_complex(pixel_type t) { return t >= pixel_type::complex_32 && t <= pixel_type::half_odd_64; }
inline bool is_colour(pixel_type t) { return t >= pixel_type::rgb; }
inline bool is_number(pixel_type t) { return t <= pixel_type::float_64; }
inline bool is_integer(pixel_type t) { return t <= pixel_type::signed_64; }
/// 0 for full, 1 for half even, 2 for half odd.
inline int complex_kind(pixel_type t) { return (static_cast<int>(t) - 10) % 3; }

/// A pixel of any type, taken apart: the value or real part, the imaginary part, red to alpha.
struct sample {
    wide value = 0;
    wide imaginary = 0;
    std::array<uint8_t, 4> colour{0, 0, 0, 255};
};

/// body(T{}) with the type of a number or of a complex pixel's parts.
template <class Body>
void with_part(pixel_type t, Body&& body)
{
    switch (static_cast<int>(t)) {
    case 0: return body(uint8_t{});
    case 1: return body(uint16_t{});
    case 2: return body(uint32_t{});
    case 3: return body(uint64_t{});
    case 4: return body(int8_t{});
    case 5: return body(int16_t{});
    case 6: return body(int32_t{});
    case 7: return body(int64_t{});
    case 8:
    case 10:
    case 11:
    case 12: return body(float{});
    default: return body(double{});
    }
}

inline sample read_sample(pixel_type t, const uint8_t* at)
{
    sample s;
    if (is_colour(t)) {
        const int bytes = GetPixmatBits(t) / 8;
        std::memcpy(s.colour.data(), at, static_cast<size_t>(bytes));
        if (t == pixel_type::bgr || t == pixel_type::bgra) std::swap(s.colour[0], s.colour[2]);
        return s;
    }
    with_part(t, [&]<class T>(T part) {
        std::memcpy(&part, at, sizeof part);
        s.value = static_cast<wide>(part);
        if (!is_complex(t)) return;
        std::memcpy(&part, at + sizeof part, sizeof part);
        s.imaginary = static_cast<wide>(part);
    });
    return s;
}

/// Writes what the target can hold of a sample, as plain C does.
inline void write_sample(pixel_type t, uint8_t* at, sample s)
{
    if (is_colour(t)) {
        if (t == pixel_type::bgr || t == pixel_type::bgra) std::swap(s.colour[0], s.colour[2]);
        std::memcpy(at, s.colour.data(), static_cast<size_t>(GetPixmatBits(t)) / 8);
        return;
    }
    with_part(t, [&]<class T>(T) {
        const T parts[2] = {static_cast<T>(s.value), static_cast<T>(s.imaginary)};
        std::memcpy(at, parts, is_complex(t) ? sizeof parts : sizeof(T));
    });
}

inline wide lowest(pixel_type t, int bits) { return t >= pixel_type::signed_8 ? -ldexpl(1, bits - 1) : 0; }
inline wide highest(pixel_type t, int bits)
{
    return ldexpl(1, t >= pixel_type::signed_8 ? bits - 1 : bits) - 1;
}

inline wide rounded_into(wide v, wide low, wide high)
{
    return std::isnan(v) ? 0 : std::clamp(roundl(v), low, high);
}

/// Whether two types have a recoding, and what it makes of a pixel for a target of a nominal depth.
inline bool recode_sample(pixel_type from, pixel_type to, int bits, sample& s)
{
    if (is_complex(from) && is_complex(to)) return complex_kind(from) == complex_kind(to);
    if (is_colour(from) && is_colour(to)) return true;
    if (is_complex(from) ? complex_kind(from) != 0 || is_colour(to) : is_complex(to) && complex_kind(to) != 0)
        return false;
    if (is_colour(from) && is_complex(to)) return false;
    s.imaginary = 0;
    if (is_colour(from)) s.value = 0.299 * s.colour[0] + 0.587 * s.colour[1] + 0.114 * s.colour[2];
    if (is_integer(to)) s.value = rounded_into(s.value, lowest(to, bits), highest(to, bits));
    const auto grey = is_colour(to) ? static_cast<uint8_t>(rounded_into(s.value, 0, 255)) : uint8_t{0};
    s.colour = {grey, grey, grey, 255};
    return true;
}

/// The same for a cast.
inline bool cast_sample(pixel_type from, pixel_type to, int, sample& s)
{
    if (is_colour(from) || is_colour(to)) return from == to;
    if (is_complex(from) && is_complex(to)) return complex_kind(from) == complex_kind(to);
    if ((is_complex(from) && complex_kind(from) != 0) || (is_complex(to) && complex_kind(to) != 0))
        return false;
    s.imaginary = 0;
    if (!is_integer(to)) return true;
    const wide whole = truncl(s.value);
    const bool held = whole >= -ldexpl(1, 63) && whole < ldexpl(1, 64); // NaN is not
    uint64_t low_bits = 0;
    if (held)
        low_bits =
            whole < 0 ? static_cast<uint64_t>(static_cast<int64_t>(whole)) : static_cast<uint64_t>(whole);
    with_part(to, [&]<class T>(T) { s.value = static_cast<wide>(static_cast<T>(low_bits)); });
    return true;
}

/// A pixel that lies where conversions go wrong: halves, limits of all integers, NaN, infinities, denormals.
inline void write_random(pixel_type t, uint8_t* at, generator& random)
{
    for (int i = 0; i < GetPixmatBits(t) / 8; ++i) at[i] = static_cast<uint8_t>(random());
    if (is_integer(t) || is_colour(t)) {
        if (random() % 4 == 0)
            std::memset(at, random() % 2 ? 0xff : 0, static_cast<size_t>(GetPixmatBits(t) / 8));
        return;
    }
    constexpr auto infinity = std::numeric_limits<double>::infinity();
    const double powers[] = {7, 8, 11, 12, 15, 16, 31, 32, 52, 53, 63, 64, 200};
    const double specials[] = {
        0, -0.0, infinity, -infinity, std::nan(""), 1e-310, -1e300, 0x1.fffffffffffffp-2};
    const auto value = [&]() -> double {
        const double sign = random() % 2 ? 1 : -1;
        switch (random() % 5) {
        case 0: return specials[random() % std::size(specials)];
        case 1: return sign * (static_cast<double>(random() % 70000) + 0.5);
        case 2:
            return sign * (std::ldexp(1, static_cast<int>(powers[random() % std::size(powers)])) -
                           0.5 * static_cast<double>(random() % 4));
        case 3:
            return sign * std::ldexp(static_cast<double>(random() >> 11), -static_cast<int>(random() % 60));
        default: return sign * static_cast<double>(random() % 300);
        }
    };
    with_part(t, [&]<class T>(T) {
        const T parts[2] = {static_cast<T>(value()), static_cast<T>(value())};
        std::memcpy(at, parts, is_complex(t) ? sizeof parts : sizeof(T));
    });
}

/// The same bytes, or NaN in the same places.
inline bool same_pixel(pixel_type t, const uint8_t* a, const uint8_t* b)
{
    const auto bytes = static_cast<size_t>(GetPixmatBits(t) / 8);
    if (std::memcmp(a, b, bytes) == 0) return true;
    if (is_integer(t) || is_colour(t)) return false;
    bool same = true;
    with_part(t, [&]<class T>(T) {
        for (size_t i = 0; i < bytes; i += sizeof(T)) {
            T parts[2];
            std::memcpy(&parts[0], a + i, sizeof(T));
            std::memcpy(&parts[1], b + i, sizeof(T));
            same = same && ZELT::Test::same_bits(parts[0], parts[1]);
        }
    });
    return same;
}

} // namespace Qor::Luxar::Test
