#include "pixmat/levels.h"

#include "pixmat/convert_store.h"

#include <sleef.h>

namespace Qor::Luxar::Convert {
namespace {

double power(double base, double exponent) noexcept
{
    return exponent == 1.0 ? base : Sleef_cinz_powd1_u10purec(base, exponent);
}

} // namespace

double levels::apply(double level) const noexcept
{
    double u = (level - 0.5) * contrast + 0.5 + brightness;
    u = u < 0.0 ? 0.0 : u > 1.0 ? 1.0 : u;
    u = power(u, 1.0 / gamma);
    if (u < 0.5) return 0.5 * power(2.0 * u, sigma);
    return 1.0 - 0.5 * power(2.0 * (1.0 - u), sigma);
}

level_scale level_scale::of(pixel_type type, int32_t bits) noexcept
{
    if (is_colour(type)) return {0.0, 255.0};
    if (!is_number(type) || is_float(type)) return {};
    const nominal_range r = range_of(type, bits);
    const auto low = static_cast<double>(r.low);
    return {low, static_cast<double>(r.high) - low};
}

} // namespace Qor::Luxar::Convert
