// Elementary functions of single-precision numbers, computed in double precision and rounded once at the end.
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

/// s, the root of u, and arcsin(s) for s <= 1/2. From there on, with s the root of (1 - |x|) / 2,
/// arcsin(|x|) is pi / 2 - 2 arcsin(s). The lesser of both u is always the right one.
struct half_arc {
    reals magnitude;
    reals arc;
};
inline half_arc half_arc_of(reals x)
{
    const reals a = magnitude(x);
    const reals u = at_most(a * a, (1 - a) * 0.5);
    return {a, root(u) * polynomial(u, 0x1.0000000117f17p+0, 0x1.55554848e38f0p-3, 0x1.333988d616bb7p-4,
                                    0x1.6c91bbfc3d46bp-5, 0x1.0554db2b626ccp-5, 0x1.cf525c1aa010dp-7,
                                    0x1.365bebf396a7cp-5)};
}

/// Outside [-1, 1] the root is NaN.
inline reals arc_sine(reals x)
{
    const half_arc h = half_arc_of(x);
    const reals r = h.magnitude > 0.5 ? pi / 2 - (h.arc + h.arc) : h.arc;
    return with_sign(r, sign_of(x));
}

inline reals arc_cosine(reals x)
{
    const half_arc h = half_arc_of(x);
    const reals arc = flip(h.arc, sign_of(x));
    const reals from = where_signed(bits_of(x), all(pi), all(0));
    return h.magnitude > 0.5 ? from + (arc + arc) : pi / 2 - arc;
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

/// 2^t. What leaves the range of floats at either end becomes infinite or 0 when it is stored.
inline reals exponential_2(reals t)
{
    constexpr double shift = whole + 1023; // the sum ends in the exponent's bits
    const reals limited = at_most(at_least(t, -200), all(200));
    const reals shifted = limited + shift;
    const reals f = limited - (shifted - shift);
    const reals mantissa =
        polynomial(f, 0x1.00000002614ffp+0, 0x1.62e430c7e9231p-1, 0x1.ebfbdadcb0c84p-3, 0x1.c6aed4b951609p-5,
                   0x1.3b2dbbc0f5821p-7, 0x1.5f456a8a9f4d0p-10, 0x1.41d333708e8f4p-13);
    return reals_of(bits_of(shifted) << 52) * mantissa;
}

inline reals exponential(reals x) { return exponential_2(x * 0x1.71547652b82fep0); }

/// x is 2^exponent times a number m from root 1/2 to root 2; w is (m - 1) / (m + 1). x is positive and finite.
struct binary_parts {
    reals exponent;
    reals w;
};
inline binary_parts parts_of(reals x)
{
    constexpr uint64_t one = uint64_t{1023} << 52, exponents = uint64_t{0xfff} << 52;
    constexpr uint64_t root_half = 0x3fe6a09e667f3bcd;
    const words bits = bits_of(x);
    const words raised = bits + (one - root_half);
    constexpr double low_bits = 0x1p52; // a whole number ored into its low bits is added
    const reals biased = reals_of((raised >> 52) | __builtin_bit_cast(uint64_t, low_bits));
    const reals m = reals_of(bits - (raised & exponents) + one);
    return {biased - (low_bits + 1023), (m - 1) / (m + 1)};
}

/// log(x) for a positive, finite x: log(m) is twice the hyperbolic arc tangent of w.
inline reals logarithm_of_ordinary(reals x)
{
    const auto [exponent, w] = parts_of(x);
    const reals log_m = w * polynomial(w * w, 0x1.fffffffa1422ep+0, 0x1.5555876cbf5d7p-1,
                                       0x1.995786c2a7179p-2, 0x1.32704c3afbeefp-2);
    return exponent * 0x1.62e42fefa39efp-1 + log_m;
}

inline reals logarithm(reals x)
{
    const reals of_zero = x == 0 ? all(-infinity) : all(__builtin_nan(""));
    const reals unusual = x == x ? of_zero : x;
    return x > 0 ? (x < infinity ? logarithm_of_ordinary(x) : x) : unusual;
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions
