#include "arithmetic/kernels/narrow_numbers.h"

#include <algorithm>
#include <cmath>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

struct whole_range {
    int64_t least, greatest;
};

whole_range pixels_of(storage type)
{
    const int bits = static_cast<int>(8 * bytes_of(type));
    if (is_unsigned(type)) return {0, (int64_t{1} << bits) - 1};
    return {-(int64_t{1} << (bits - 1)), (int64_t{1} << (bits - 1)) - 1};
}

whole_range whole(range limits)
{
    return {static_cast<int64_t>(limits.lower), static_cast<int64_t>(limits.upper)};
}

/// A fraction whose terms have 63 bits at most.
struct ratio {
    uint64_t numerator, denominator;
};

/// |value|, or 1 / |value|, exactly; false beyond 2^-9 .. 2^16.
bool exact_ratio(double value, bool inverse, ratio* r)
{
    const double size = std::fabs(value);
    if (!(size >= 0x1p-9 && size <= 0x1p16)) return false;
    int exponent;
    auto mantissa = static_cast<uint64_t>(std::ldexp(std::frexp(size, &exponent), 53));
    exponent -= 53;
    while (mantissa % 2 == 0) mantissa /= 2, ++exponent;
    *r = exponent < 0 ? ratio{mantissa, uint64_t{1} << -exponent} : ratio{mantissa << exponent, 1};
    if (inverse) std::swap(r->numerator, r->denominator);
    return true;
}

/// The fraction with a denominator up to `most` that has the same whole products with whole numbers up to `most` as x has
/// in double precision. Its candidates, the neighbours a/b <= x < c/d, come from a walk down the tree of fractions.
/// A product just below a whole number k is rounded up to k if it lacks no more than half a step of the doubles below
/// k, which is at least 2^-54 and less than 2^-53 of k. So if x lacks 2^-54 of c/d or less, all its products with multiples
/// of d are rounded up, from 2^-53 on none is; in between it depends on k, and no fraction does.
bool common_fraction(ratio x, uint64_t most, ratio* result)
{
    uint64_t a = x.numerator / x.denominator, b = 1, c = a + 1, d = 1;
    uint64_t above_a = x.numerator % x.denominator,
             below_c = x.denominator - above_a; // x b - a and c - x d, scaled
    while (b + d <= most) {
        const uint64_t left = std::min(above_a / below_c, (most - b) / d);
        a += left * c, b += left * d, above_a -= left * below_c;
        const uint64_t room = (most - d) / b;
        const uint64_t right = above_a == 0 ? room : std::min((below_c - 1) / above_a, room);
        c += right * a, d += right * b, below_c -= right * above_a;
    }
    __extension__ using wide = unsigned __int128;
    const wide all = wide{c} * x.denominator;
    *result = {a, b};
    if (below_c > all >> 53) return true;
    *result = {c, d};
    return below_c <= all >> 54;
}

} // namespace

bool plan_sum(operation op, bool reversed, const number& b, storage type, rounding mode, range limits,
              narrow_sum* plan) noexcept
{
    const double added = op == operation::add ? b.real : -b.real;
    const bool negated = op == operation::subtract && reversed;
    if (!(std::fabs(added) <= 0x1p20)) return false;
    // Sums cut toward zero are those with the next lower whole number, plus 1 where a fraction left them negative.
    const double down = std::floor(added), fraction = added - down;
    // So close to a whole number that rounding reaches it; sums in single precision are rounded early.
    if (fraction != 0 && (b.type == storage::f32 || fraction < 0x1p-30 || fraction > 1 - 0x1p-30))
        return false;
    const whole_range pixels = pixels_of(type);
    auto step = static_cast<int64_t>(down);
    int64_t below = fraction != 0 ? -step : pixels.least;
    if (below > pixels.greatest) ++step, below = pixels.least;
    below = std::max(below, pixels.least);

    whole_range limited = pixels;
    if (mode == rounding::saturate) {
        // Each whole number is the sum of some pixel, so that limits of pixels do for those of sums.
        const whole_range given = whole(limits);
        const whole_range sums = negated ? whole_range{-given.greatest, -given.least} : given;
        const int64_t low = sums.least - step, high = sums.greatest - step;
        limited = {std::max(low - 1 < below ? low - 1 : low, pixels.least),
                   std::min(high >= below ? high : high - 1, pixels.greatest)};
        if (limited.least > limited.greatest) return false; // all beyond
    }
    *plan = {static_cast<int32_t>(limited.least), static_cast<int32_t>(limited.greatest),
             static_cast<int32_t>(step), static_cast<int32_t>(below), negated};
    return true;
}

bool plan_product(operation op, const number& b, storage type, rounding mode, range limits,
                  narrow_product* plan) noexcept
{
    const whole_range pixels = pixels_of(type);
    const int64_t most = std::max(pixels.greatest, -pixels.least);
    const bool negative = std::signbit(b.real);
    ratio factor;
    if ((negative && is_unsigned(type)) || !exact_ratio(b.real, op == operation::divide, &factor) ||
        !common_fraction(factor, static_cast<uint64_t>(most), &factor))
        return false;
    // The next larger fraction is at least 1 / most^2 away, so the next larger multiple of 2^-32 (2^-16 for bytes) is
    // between them and gives the same whole products.
    const int bits = static_cast<int>(16 * bytes_of(type));
    const uint64_t rest = ((factor.numerator % factor.denominator) << bits) + factor.denominator - 1;
    const uint64_t whole_part = factor.numerator / factor.denominator, fraction = rest / factor.denominator;

    *plan = {static_cast<uint32_t>(whole_part),
             static_cast<uint32_t>(fraction),
             negative,
             static_cast<int32_t>(pixels.least),
             static_cast<int32_t>(pixels.greatest),
             0,
             0};
    if (mode != rounding::saturate) return true;
    const uint64_t scaled = (whole_part << bits) + fraction;
    const auto largest_within = [&](int64_t product) {
        const uint64_t beyond = static_cast<uint64_t>(product + 1) << bits;
        return scaled == 0 ? most : std::min(static_cast<int64_t>((beyond - 1) / scaled), most);
    };
    const whole_range given = whole(limits);
    const whole_range ends = negative ? whole_range{given.greatest, given.least} : given;
    plan->greatest = static_cast<int32_t>(std::min(largest_within(std::abs(ends.greatest)), pixels.greatest));
    plan->least = static_cast<int32_t>(std::max(-largest_within(std::abs(ends.least)), pixels.least));
    plan->over = static_cast<int32_t>(ends.greatest);
    plan->under = static_cast<int32_t>(ends.least);
    return true;
}

} // namespace Qor::Luxar::ZELT::Arithmetic
