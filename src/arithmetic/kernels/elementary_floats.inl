// Elementary functions of single-precision numbers, computed in single precision.
//
// The last sum of each has a large term that is exact, or nearly, and a small one: of every eleventh float, and of all
// from 1/4 to 4 for the logarithm, below 1 for the arcs and up to 100 for sine and cosine, the largest errors are 0.91
// units in the last place for the exponential, 0.96 for the logarithm, 0.75 for the arc sine, 0.80 for the arc cosine
// and 0.94 for sine and cosine.
// Products and sums keep a fixed order, and are fused only where that leaves the bits as they are. The polynomials have
// the least relative error in their interval, by exchange of its extremes, their coefficients rounded one by one.
#pragma once

#include "arithmetic/kernels/floats.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions::singles {

/// Pi / 2 as two floats, and log(2) as two numbers with so few bits that their products with exponents are exact.
inline constexpr float half_pi = 0x1.921fb6p0f, half_pi_rest = -0x1.777a5cp-25f;
inline constexpr float log_2 = 0x1.62e4p-1f, log_2_rest = 0x1.7f7cp-20f;

/// x is n log(2) + r; what leaves the range of floats becomes infinite or 0.
inline floats exponential(floats x)
{
    const floats limited = at_most(at_least(x, all(-105)), all(90));
    const floats shifted = limited * 0x1.715476p0f + whole;
    const floats n = shifted - whole;
    const floats t = exact_product_plus(n, -log_2, limited);
    const floats r = exact_product_plus(n, -log_2_rest, t);
    const floats square = r * r;
    const floats p = polynomial(r, square, 0x1.fffffcp-2f, 0x1.55548cp-3f, 0x1.555858p-5f, 0x1.123deap-7f,
                                0x1.6ac83ap-10f);
    return scaled(1 + (t + exact_product_plus(n, -log_2_rest, square * p)), n, shifted);
}

/// log(x) for a positive, finite x of full precision: x is 2^n times 1 + f, from root 1/2 to root 2.
inline floats logarithm_of_ordinary(floats x, floats further_n = floats{})
{
    constexpr uint32_t one = 0x3f800000, root_half = 0x3f3504f3;
    const half_words raised = bits_of(x) + (one - root_half);
    const auto biased = __builtin_bit_cast(half_integers, raised >> 23);
    const floats n = __builtin_convertvector(biased - 127, floats) + further_n;
    const floats f = floats_of((raised & 0x7fffff) + root_half) - 1;
    const floats square = f * f;
    const floats p = polynomial(f, square, 0x1.555554p-2f, -0x1.000228p-2f, 0x1.99a036p-3f, -0x1.547220p-3f,
                                0x1.22d5fcp-3f, -0x1.0d7ebcp-3f, 0x1.05a556p-3f, -0x1.3a2262p-4f);
    const floats small = exact_product_plus(square, -0.5f, square * f * p);
    return exact_product_plus(n, log_2, f + exact_product_plus(n, log_2_rest, small));
}

inline floats logarithm(floats x)
{
    const half_integers short_of_bits = x < 0x1p-126f;
    const floats v =
        logarithm_of_ordinary(short_of_bits ? x * 0x1p23f : x, short_of_bits ? all(-23) : all(0));
    const floats of_zero = x == 0 ? all(-__builtin_inff()) : all(__builtin_nanf(""));
    const floats unusual = x == x ? of_zero : x;
    return x > 0 ? (x < __builtin_inff() ? v : x) : unusual;
}

/// Angles up to here are reduced in single precision: their distance from multiples of pi / 8 is nearly exact.
inline constexpr float quick_angle = 100;

/// Where the sine and the cosine begin to count eighths of a half turn: where the sine is -1.
inline constexpr float sine_start = 4, cosine_start = 8;

/// The sine of an angle up to quick_angle, or the cosine by where its count starts. x is n pi / 8 + r + rest. With s
/// and c for the sine and cosine of n pi / 8, the result is s cos(r) + c sin(r); from the largest term on that is
/// s + r + (c - 1) r + ... Eight eighths further on only the sign is another. The sine of -0 comes out as 0.
inline floats sine_from(floats x, float start)
{
    constexpr float sines[8] = {-0x1p0f, -0x1.d906bcp-1f, -0x1.6a09e6p-1f, -0x1.87de2ap-2f,
                                0,       0x1.87de2ap-2f,  0x1.6a09e6p-1f,  0x1.d906bcp-1f};
    constexpr float sines_rest[8] = {0, -0x1.e651a8p-26f, -0x1.9fcef4p-27f, -0x1.abaa58p-28f,
                                     0, 0x1.abaa58p-28f,  0x1.9fcef4p-27f,  0x1.e651a8p-26f};
    constexpr float cosines_less_1[8] = {-1, -0x1.3c10eap-1f, -0x1.2bec34p-2f, -0x1.37ca18p-4f,
                                         0,  -0x1.37ca18p-4f, -0x1.2bec34p-2f, -0x1.3c10eap-1f};
    // The first two parts of pi / 8 have 12 and 16 bits: their products with counts of 8 bits are exact.
    const floats shifted = x * 0x1.45f306p1f + (whole + start);
    const floats n = shifted - (whole + start);
    const floats t = exact_product_plus(n, -0x1.922p-2f, x);
    const floats r = exact_product_plus(n, 0x1.2aeep-20f, t);
    const floats rest = exact_product_plus(n, 0x1.2aeep-20f, t - r) + n * 0x1.e973dcp-37f;
    const half_words count = bits_of(shifted);
    const floats s = entry(sines, count);
    const floats less = entry(cosines_less_1, count) * r;
    const floats square = r * r;
    const floats of_sine = square * (square * 0x1.10b706p-7f - 0x1.555544p-3f);
    const floats of_cosine = square * (square * 0x1.54b8aep-5f - 0x1.ffffc4p-2f);
    const floats small = (entry(sines_rest, count) + rest) + (s * of_cosine + (r + less) * of_sine);
    return flip(s + (r + (less + small)), (count << 28) & float_sign_bit);
}

/// About 1 / (2 v), within an eighth.
inline floats rough_half_inverse(floats v) { return floats_of(0x7e7504f3 - bits_of(v)); }

/// s + rest is arcsin(|x|) for |x| <= 1/2. From there on, with the root of (1 - |x|) / 2 for |x|,
/// arcsin(|x|) is pi / 2 - 2 (s + rest). Outside [-1, 1] the root is NaN.
struct half_arc {
    floats s, rest;
    half_integers small;
};
inline half_arc half_arc_of(floats x)
{
    const floats a = magnitude(x);
    const half_integers small = a <= 0.5f;
    const floats half = exact_product_plus(a, -0.5f, all(0.5f));
    const floats root_of_half = root(half);
    const floats u = small ? a * a : half, s = small ? a : root_of_half;
    const floats of_root = remainder(half, root_of_half, root_of_half) * rough_half_inverse(root_of_half);
    const floats p =
        polynomial(u, u * u, 0x1.5555c8p-3f, 0x1.330204p-4f, 0x1.747bb6p-5f, 0x1.8c3e80p-6f, 0x1.595c26p-5f);
    return {s, s * u * p + (small ? all(0) : of_root), small};
}

inline floats arc_sine(floats x)
{
    const auto [s, rest, small] = half_arc_of(x);
    const floats from = half_pi - (s + s);
    const floats of_from = (half_pi - from) - (s + s);
    const floats large = from + ((of_from + half_pi_rest) - (rest + rest));
    return with_sign(small ? s + rest : large, sign_of(x));
}

inline floats arc_cosine(floats x)
{
    const auto [s, rest, small] = half_arc_of(x);
    const half_integers negative = __builtin_bit_cast(half_integers, bits_of(x)) < 0;
    const half_words turned = sign_of(x) ^ (small ? half_words{} + float_sign_bit : half_words{});
    const floats from = small ? all(half_pi) : negative ? all(2 * half_pi) : all(0);
    const floats of_from = small ? all(half_pi_rest) : negative ? all(2 * half_pi_rest) : all(0);
    return from + (flip(small ? s : s + s, turned) + (flip(small ? rest : rest + rest, turned) + of_from));
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions::singles
