#include "filters/kernels/gauss.h"

#include "filters/kernels/convolve.h"
#include "filters/kernels/gauss_smoothing.h"

#include <cstring>
#include <memory>

namespace Qor::Luxar::ZELT::Filters {
namespace {

bool is_empty(const memory_2d& m) { return m.width <= 0 || m.height <= 0; }
size extent_of(const memory_2d& m) { return {m.width, m.height}; }

smooth_function up_for(pixel_type type)
{
    return is_colour(type) ? gauss_level().up_colour : gauss_level().up[table_index_of(type)];
}

/// Nothing for a sigma that cannot be had by recursion.
std::optional<recursion> scaled(double sigma, pole_set poles)
{
    if (sigma >= least_recursive_sigma) return pole_scaled(sigma, poles);
    return std::nullopt;
}

/// A filter of the differences of each smoothed channel; `functions` is a member of the level's table.
void filter_differences(const memory_2d& src, const std::optional<recursion>& filter, const memory_2d& dst,
                        const difference_function (&functions)[8])
{
    if (is_empty(src)) return;
    const pixel_type element = element_of(src.type);
    smoothed_image smoothed(extent_of(src), element, filter);
    for (int c = 0; c < channels_of(src.type); ++c)
        functions[table_index_of(element)](
            {src.width, src.height, smoothed.of(plane_of(src, c)), plane_of(dst, c), {}});
}

/// Below sigma 0.5 nine weights take the place of the recursion.
void nine_weights(const memory_2d& src, double sigma, const memory_2d& dst, Thread::ThreadPool* pool)
{
    const small_gaussian kernel = gaussian_3x3(sigma);
    const auto convolve_into = [&](const memory_2d& to) {
        convolve(src, {kernel.values, 3, 3}, {1, 1}, to, pool);
    };
    if (first_pixel(src) != first_pixel(dst)) return convolve_into(dst);
    const auto layout =
        packed_layout(src.width, src.height, GetPixmatBits(src.type), GetPixmatEncoding(src.type));
    const std::unique_ptr<uint8_t[]> pixels(
        new uint8_t[static_cast<size_t>(layout.y_stride) * static_cast<size_t>(src.height)]);
    convolve_into(view_of(layout, pixels.get()));
    const image_layout to{dst.width,
                          dst.height,
                          layout.bits,
                          layout.encoding,
                          0,
                          static_cast<int32_t>(dst.x_stride),
                          static_cast<int32_t>(dst.y_stride)};
    copy_pixels(to, first_pixel(dst), layout, pixels.get());
}

} // namespace

void gauss(const memory_2d& src, double sigma, const memory_2d& dst, Thread::ThreadPool* pool)
{
    check_operands(src, dst,
                   {.types_differ = "Gauss: src and dst pixel types must be identical",
                    .unsupported = "Gauss: unsupported pixel type",
                    .sizes_differ = "ZELT GaussDerivative input and output images must have the same size",
                    .in_place = nullptr});
    if (sigma < least_recursive_sigma) return nine_weights(src, sigma, dst, pool);
    if (is_empty(src)) return;
    const pixel_type element = element_of(src.type);
    scratch_image scratch(extent_of(src), element);
    smoothing recursive(extent_of(src), element, young_van_vliet(sigma));
    for (int c = 0; c < channels_of(src.type); ++c)
        recursive.run(plane_of(src, c), scratch.plane(), plane_of(dst, c), up_for(src.type));
}

void gauss_derivative(const memory_2d& src, double sigma, const memory_2d& dst)
{
    check_operands(src, dst,
                   {.types_differ = "GaussDerivative: src and dst pixel types must be identical",
                    .unsupported = "GaussDerivative: unsupported pixel type",
                    .sizes_differ = "ZELT GaussDerivative input and output images must have the same size",
                    .in_place = nullptr});
    filter_differences(src, scaled(sigma, pole_set::first_derivative), dst, gauss_level().gradient);
}

void laplacian_gaussian(const memory_2d& src, double sigma, const memory_2d& dst)
{
    check_operands(src, dst,
                   {.types_differ = "LaplacianGaussian: src and dst pixel types must be identical",
                    .unsupported = "LaplacianGaussian: unsupported pixel type",
                    .sizes_differ = "ZELT LaplacianGaussian input and output images must have the same size",
                    .in_place = nullptr});
    filter_differences(src, scaled(sigma, pole_set::second_derivative), dst, gauss_level().laplacian);
}

void sdgd_gaussian(const memory_2d& src, double sigma, const memory_2d& dst)
{
    check_operands(src, dst,
                   {.types_differ = "SDGDGaussian: src and dst pixel types must be identical",
                    .unsupported = "SDGDGaussian: unsupported pixel type",
                    .sizes_differ = "ZELT SDGDGaussian input and output images must have the same size",
                    .in_place = nullptr});
    if (sigma < least_recursive_sigma) return;
    filter_differences(src, pole_scaled(sigma, pole_set::second_derivative), dst, gauss_level().sdgd);
}

void gauss_smooth(const memory_2d& src, double sigma, pole_set poles, const memory_2d& dst)
{
    constexpr auto unsupported = "GaussSmooth: unsupported pixel type";
    switch_scalar(src.type, unsupported, [](auto) {});
    require(dst.type == pixel_type::float_32, unsupported);
    require(extent_of(src) == extent_of(dst),
            "ZELT GaussSmooth input and output images must have the same size");
    if (is_empty(src)) return;
    scratch_image scratch(extent_of(src), src.type);
    const auto& table = gauss_level();
    if (const auto filter = scaled(sigma, poles)) {
        smoothing(extent_of(src), src.type, *filter)
            .run(plane_of(src), scratch.plane(), plane_of(dst),
                 scratch.is_double() ? table.up_narrow : table.up[table_index_of(pixel_type::float_32)]);
    } else {
        for (int64_t y = 0; y < dst.height; ++y)
            for (int64_t x = 0; x < dst.width; ++x)
                std::memset(plane_of(dst).first + y * dst.y_stride + x * dst.x_stride, 0, sizeof(float));
    }
}

void gauss_xy_derivatives(const memory_2d& src, double sigma, pole_set poles, const memory_2d& dst_x,
                          const memory_2d& dst_y)
{
    constexpr auto unsupported = "GaussXYDerivatives: unsupported pixel type";
    switch_scalar(src.type, unsupported, [](auto) {});
    require(dst_x.type == pixel_type::float_32 && dst_y.type == pixel_type::float_32, unsupported);
    require(extent_of(src) == extent_of(dst_x) && extent_of(src) == extent_of(dst_y),
            "ZELT GaussXYDerivatives input and output images must have the same size");
    if (is_empty(src)) return;
    smoothed_image smoothed(extent_of(src), src.type, scaled(sigma, poles));
    const auto differences = smoothed.is_double() ? gauss_level().xy_of_doubles : gauss_level().xy_of_floats;
    differences({src.width, src.height, smoothed.of(plane_of(src)), plane_of(dst_x), plane_of(dst_y)});
}

} // namespace Qor::Luxar::ZELT::Filters
