#include "pixmat/levels.h"

#include "pixmat/convert_store.h"

#include <sleef.h>

namespace Qor::Luxar::Convert {
namespace {

void to_power(double* values, int count, double exponent) noexcept
{
    if (exponent == 1.0) return;
    int i = 0;
#ifdef __SSE2__
    for (; i + 2 <= count; i += 2) // the same bits as one by one
        _mm_storeu_pd(values + i, Sleef_cinz_powd2_u10sse2(_mm_loadu_pd(values + i), _mm_set1_pd(exponent)));
#endif
    for (; i < count; ++i) values[i] = Sleef_cinz_powd1_u10purec(values[i], exponent);
}

} // namespace

void levels::apply(double* values, int count) const noexcept
{
    for (int i = 0; i < count; ++i) {
        const double u = (values[i] - 0.5) * contrast + 0.5 + brightness;
        values[i] = u < 0.0 ? 0.0 : u > 1.0 ? 1.0 : u;
    }
    to_power(values, count, 1.0 / gamma);

    double base[block_size];
    for (int i = 0; i < count; ++i) base[i] = values[i] < 0.5 ? 2.0 * values[i] : 2.0 * (1.0 - values[i]);
    to_power(base, count, sigma);
    for (int i = 0; i < count; ++i) values[i] = values[i] < 0.5 ? 0.5 * base[i] : 1.0 - 0.5 * base[i];
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
