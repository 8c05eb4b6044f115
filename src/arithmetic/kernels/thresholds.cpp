#include "arithmetic/kernels/thresholds.h"

#include "arithmetic/kernels/pixel_bins.h"
#include "arithmetic/kernels/plane.h"

namespace Qor::Luxar::ZELT::Arithmetic {

std::optional<memory_2d> view_by_depth_class(const image_layout& layout, uint8_t* data) noexcept
{
    constexpr pixel_type types[] = {pixel_type::unsigned_8, pixel_type::unsigned_16, pixel_type::unsigned_32,
                                    pixel_type::signed_8,   pixel_type::signed_16,   pixel_type::signed_32,
                                    pixel_type::float_32,   pixel_type::float_64};
    const storage s = real_storage_of(layout);
    if (s == storage::none) return {};
    return memory_2d{types[static_cast<int>(s)],
                     layout.width,
                     layout.height,
                     layout.offset,
                     layout.x_stride,
                     layout.y_stride,
                     data};
}

void threshold(const memory_2d& src, threshold_limits limits, const memory_2d& dst) noexcept
{
    threshold_level().threshold[index(src.type)](grid_of(src), grid_of(dst), joined_extent(src, dst), limits);
}

void absolute(const memory_2d& src, const memory_2d& dst) noexcept
{
    threshold_level().absolute[index(src.type)](grid_of(src), grid_of(dst), joined_extent(src, dst));
}

} // namespace Qor::Luxar::ZELT::Arithmetic
