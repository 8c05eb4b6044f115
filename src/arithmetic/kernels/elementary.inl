// Tangents, arc tangents, and sines and cosines of larger angles, of single-precision numbers, computed in double
// precision and rounded once at the end.
//
// Products and sums in a fixed order and no fused ones: the bits are the same at every level. The polynomials have the
// least relative error in their interval, at most 2^-27.5, which leaves results within 0.6 units in the last place
// (a half is the least that rounding costs). Special values are told where they need care; NaN passes through.
#pragma once

#include "arithmetic/kernels/reals.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions {

inline constexpr double pi = 0x1.921fb54442d18p1;
inline constexpr double infinity = __builtin_inf();

/// Added to a number below 2^51, leaves the nearest whole number in the low bits; subtracted again, as a number.
inline constexpr double whole = 0x1.8p52;

/// Pi in two parts. The first has 29 bits, so that its product with a whole number of up to 24 bits is exact.
inline constexpr double pi_high = 0x1.921fb54p1;
inline constexpr double pi_low = 0x1.10b4611a62633p-29;

/// Angles up to here are reduced with enough bits. Up to there no float comes closer to a zero than 2^-28.
inline constexpr float largest_angle = 0x1p22f;

/// sin(r) for |r| <= pi / 2.
inline reals sine_of_half_turn(reals r)
{
    return r * polynomial(r * r, 0x1.ffffffd25a685p-1, -0x1.555547ef51523p-3, 0x1.110e7b396c915p-7,
                          -0x1.9f6445024d1d6p-13, 0x1.5d38b56bc1ad6p-19);
}

/// x is n pi + r, and sin(x) is sin(r), negative for an odd n.
inline reals sine(reals x)
{
    const reals shifted = x * (1 / pi) + whole;
    const reals n = shifted - whole;
    const reals r = (x - n * pi_high) - n * pi_low;
    return sine_of_half_turn(flip(r, bits_of(shifted) << 63));
}

/// The same, from half a turn further on.
inline reals cosine(reals x)
{
    const reals shifted = (x * (1 / pi) + 0.5) + whole;
    const reals n = (shifted - whole) - 0.5;
    const reals r = (x - n * pi_high) - n * pi_low;
    return sine_of_half_turn(flip(r, bits_of(shifted) << 63));
}

/// x is n pi / 2 + r, and tan(x) is p / q for even n, else -q / p, where tan(r) = p / q.
inline reals tangent(reals x)
{
    const reals shifted = x * (2 / pi) + whole;
    const reals n = shifted - whole;
    const reals r = (x - n * (pi_high / 2)) - n * (pi_low / 2);
    const reals u = r * r;
    const reals p = r * polynomial(u, 0x1.0000000018490p+0, -0x1.c822eeb3c7e61p-4, 0x1.19d8685901e6fp-10);
    const reals q = polynomial(u, 1.0, -0x1.c75e10e5ba6c8p-2, 0x1.05b542b0588a3p-6);
    const words odd = bits_of(shifted) << 63;
    return flip(where_signed(odd, q, p), odd) / where_signed(odd, p, q);
}

/// The angle of (d, n) in the first quadrant. Neither is infinite; d is not 0.
/// Near the axes it is that of n / d or of -d / n, in between that of (n - d) / (n + d), from an eighth of a turn.
inline reals arc_of_quotient(reals n, reals d)
{
    const auto middle = n > d * 0x1.a827999fcef32p-2; // tan(pi / 8)
    const auto steep = n > d * 0x1.3504f333f9de6p1;   // tan(3 pi / 8)
    const reals from = steep ? all(pi / 2) : middle ? all(pi / 4) : all(0);
    const reals t = (steep ? -d : middle ? n - d : n) / (steep ? n : middle ? n + d : d);
    return from + t * polynomial(t * t, 0x1.fffffffad143dp-1, -0x1.55554414d2208p-2, 0x1.9990406d8e62dp-3,
                                 -0x1.23a30be296f0ap-3, 0x1.b116f8cff2db6p-4, -0x1.ee5eba6538a27p-5);
}

/// More than any float, and little enough to be divided by.
inline constexpr double beyond_floats = 0x1p400;

inline reals arc_tangent(reals x)
{
    return with_sign(arc_of_quotient(at_most(magnitude(x), all(beyond_floats)), all(1)), sign_of(x));
}

/// Two infinite numbers count as equal. A zero x becomes a number that no y but 0 is small beside.
inline reals arc_tangent_2(reals y, reals x)
{
    const reals width = at_most(magnitude(x), all(beyond_floats)) + 0x1p-600;
    const reals r = arc_of_quotient(at_most(magnitude(y), all(beyond_floats)), width);
    return with_sign(where_signed(bits_of(x), pi - r, r), sign_of(y));
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions
