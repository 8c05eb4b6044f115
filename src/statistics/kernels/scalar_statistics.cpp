#include "statistics/kernels/scalar_statistics.h"

#include "statistics/kernels/statistics_levels.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace Qor::Luxar::ZELT::Statistics {

namespace {

/// 2^bits - 1, with the shift taken modulo 64.
double all_ones(int32_t bits)
{
    return static_cast<double>((uint64_t{1} << (static_cast<uint32_t>(bits) % 64)) - 1);
}

/// 2^(bits-1), with the shift taken modulo 64.
double half_range(int32_t bits)
{
    return static_cast<double>(uint64_t{1} << ((static_cast<uint32_t>(bits) - 1) % 64));
}

scan_function scan_of(pixel_type element)
{
    const statistics_table& table = statistics_level();
    switch (element) {
    case pixel_type::unsigned_8: return table.scan_u8;
    case pixel_type::unsigned_16: return table.scan_u16;
    case pixel_type::unsigned_32: return table.scan_u32;
    case pixel_type::signed_8: return table.scan_i8;
    case pixel_type::signed_16: return table.scan_i16;
    case pixel_type::signed_32: return table.scan_i32;
    case pixel_type::float_32: return table.scan_f32;
    default: return table.scan_f64;
    }
}

sample_grid grid_of(const image_layout& image, const void* data, const rectangle& area, int32_t step,
                    const value_format& format)
{
    const int64_t corner =
        image.offset + int64_t{area.top} * image.y_stride + int64_t{area.left} * image.x_stride;
    return {static_cast<const uint8_t*>(data) + corner,
            area.right - area.left,
            area.bottom - area.top,
            image.x_stride,
            image.y_stride,
            step,
            format.pixel_bytes};
}

/// Extremes start at the pixel in the area's corner, also where there is nothing to scan. That pixel may lie outside
/// the image: the nearest one stands for it.
scan_result start_only(const image_layout& image, const void* data, rectangle area,
                       const value_format& format)
{
    scan_result result{};
    result.minimum = result.maximum = std::numeric_limits<double>::quiet_NaN();
    if (image.width <= 0 || image.height <= 0) return result;
    area.left = std::min(area.left, image.width - 1);
    area.top = std::min(area.top, image.height - 1);
    area.right = area.left + 1;
    area.bottom = area.top + 1;
    scan_of(format.element)(grid_of(image, data, area, 1, format), result);
    const double corner = result.minimum;
    result = {};
    result.minimum = result.maximum = corner;
    result.minimum_count = result.maximum_count = 1;
    return result;
}

} // namespace

std::optional<value_format> find_value_format(PixmatEncoding encoding, int32_t bits)
{
    const int32_t bytes = (bits + 7) / 8;
    if (encoding == PixmatEncoding_Float && bits == 32)
        return value_format{pixel_type::float_32, bytes, 0, 1};
    if (encoding == PixmatEncoding_Float && bits == 64)
        return value_format{pixel_type::float_64, bytes, 0, 1};
    if (bits < 1 || bits > 32) return {};
    const auto pick = [&](pixel_type narrow, pixel_type middle, pixel_type wide) {
        return bits == 8 ? narrow : bits <= 16 ? middle : wide;
    };
    if (encoding == PixmatEncoding_Unsigned)
        return value_format{pick(pixel_type::unsigned_8, pixel_type::unsigned_16, pixel_type::unsigned_32),
                            bytes, 0, all_ones(bits)};
    if (encoding == PixmatEncoding_Signed)
        return value_format{pick(pixel_type::signed_8, pixel_type::signed_16, pixel_type::signed_32), bytes,
                            -half_range(bits), half_range(bits) - 1};
    return {};
}

double range_minimum(PixmatEncoding encoding, int32_t bits)
{
    return encoding == PixmatEncoding_Signed ? -half_range(bits) : 0.0;
}

double range_maximum(PixmatEncoding encoding, int32_t bits)
{
    if (encoding == PixmatEncoding_Float) return 1.0;
    return encoding == PixmatEncoding_Signed ? half_range(bits) - 1 : all_ones(bits);
}

void measure(const image_layout& image, const void* data, const rectangle& area, int32_t step,
             const value_format& format, image_statistics& record)
{
    const sample_grid grid = grid_of(image, data, area, step, format);
    scan_result r;
    if (grid.width > 0 && grid.height > 0)
        scan_of(format.element)(grid, r);
    else
        r = start_only(image, data, area, format);

    record.minimum = r.minimum;
    record.minimum_count = r.minimum_count;
    record.minimum_x = r.minimum_x + area.left;
    record.minimum_y = r.minimum_y + area.top;
    record.maximum = r.maximum;
    record.maximum_count = r.maximum_count;
    record.maximum_x = r.maximum_x + area.left;
    record.maximum_y = r.maximum_y + area.top;

    // The divisor is a product of whole numbers in 32 bits, read as signed: it wraps for huge images.
    const auto samples = static_cast<int32_t>(static_cast<uint32_t>(grid.height / step) *
                                              static_cast<uint32_t>(grid.width / step));
    const double per_sum = 1.0 / r.sum;
    record.gravity_x = r.moment_x * per_sum + area.left;
    record.gravity_y = r.moment_y * per_sum + area.top;
    record.mean = r.sum / static_cast<double>(samples);
    record.sum_squares = r.sum_squares * (static_cast<double>(step) * static_cast<double>(step));
    record.minimum_valid = record.maximum_valid = record.gravity_valid = true;
    record.mean_valid = record.sum_squares_valid = true;
}

} // namespace Qor::Luxar::ZELT::Statistics
