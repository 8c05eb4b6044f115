#include "filters/kernels/gauss_smoothing.h"

#include <cstring>

namespace Qor::Luxar::ZELT::Filters {
namespace {

/// In front of each row and behind it, in elements.
constexpr int64_t margin = 16;

template <class T>
void clamp_row(uint8_t* first, int64_t width)
{
    T* const row = reinterpret_cast<T*>(first);
    row[-2] = row[-1] = row[0];
    row[width + 1] = row[width] = row[width - 1];
}

} // namespace

smoothing::smoothing(size s, pixel_type element, const recursion& filter)
    : size_(s), element_(element), filter_(filter), history_(new double[3 * static_cast<size_t>(s.width)]),
      lanes_(new double[static_cast<size_t>(s.width) * static_cast<size_t>(gauss_level().rows_at_once)])
{
}

void smoothing::run(const gauss_plane& src, const gauss_plane& scratch, const gauss_plane& dst,
                    smooth_function up)
{
    const gauss_job job{size_.width, size_.height, filter_, src, scratch, dst, history_.get(), lanes_.get()};
    gauss_level().rows_and_down[table_index_of(element_)](job);
    up(job);
}

scratch_image::scratch_image(size s, pixel_type element) : size_(s), plane_()
{
    const int64_t bytes = element == pixel_type::float_64 ? 8 : 4;
    const int64_t row = (s.width + 2 * margin) * bytes;
    memory_.reset(new uint8_t[static_cast<size_t>(row * s.height)]);
    plane_ = {memory_.get() + margin * bytes, bytes, row};
}

void scratch_image::clear() noexcept
{
    std::memset(memory_.get(), 0, static_cast<size_t>(plane_.y_stride * size_.height));
}

void scratch_image::clamp_rows() noexcept
{
    for (int64_t y = 0; y < size_.height; ++y) {
        uint8_t* const row = plane_.first + y * plane_.y_stride;
        is_double() ? clamp_row<double>(row, size_.width) : clamp_row<float>(row, size_.width);
    }
}

smoothed_image::smoothed_image(size s, pixel_type element, const std::optional<recursion>& filter)
    : scratch_(s, element)
{
    if (filter)
        smoothing_.emplace(s, element, *filter);
    else
        scratch_.clear();
}

const gauss_plane& smoothed_image::of(const gauss_plane& src)
{
    const pixel_type own = is_double() ? pixel_type::float_64 : pixel_type::float_32;
    if (smoothing_)
        smoothing_->run(src, scratch_.plane(), scratch_.plane(), gauss_level().up[table_index_of(own)]);
    scratch_.clamp_rows();
    return scratch_.plane();
}

} // namespace Qor::Luxar::ZELT::Filters
