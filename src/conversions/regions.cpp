#include "conversions/regions.h"

#include <algorithm>
#include <limits>

namespace Qor::Luxar::ZELT {
namespace {

/// Keeps extreme arguments in range; a region that this touches is empty or outside anyway.
int32_t limited(int64_t v) noexcept
{
    return static_cast<int32_t>(
        std::clamp<int64_t>(v, std::numeric_limits<int32_t>::min(), std::numeric_limits<int32_t>::max()));
}

/// One axis of a region.
struct span {
    int64_t first;
    int64_t end;
    int64_t at;
};

/// A negative position becomes 0, and its opposite takes the place of the area's first edge: it is not added to it, so
/// the edge of a given area is lost. Deliberate: clients have always seen it so.
span clipped(span s, int64_t target_length) noexcept
{
    if (s.at < 0) {
        s.first = -s.at;
        s.at = 0;
    }
    s.end = s.first + std::min(target_length - s.at, s.end - s.first);
    return s;
}

} // namespace

conversion_regions compute_regions(const image_layout& source, const image_layout& target,
                                   const rectangle* area, const coordinate<int32_t>* point) noexcept
{
    const rectangle r = area ? *area : rectangle{0, 0, source.width, source.height};
    span x{r.left, r.right, 0};
    span y{r.top, r.bottom, 0};
    if (point) {
        x = clipped({x.first, x.end, point->x}, target.width);
        y = clipped({y.first, y.end, point->y}, target.height);
    }
    return {{limited(x.first), limited(y.first), limited(x.end), limited(y.end)},
            {limited(x.at), limited(y.at)},
            {limited(x.at), limited(y.at), limited(x.at + x.end - x.first), limited(y.at + y.end - y.first)}};
}

} // namespace Qor::Luxar::ZELT
