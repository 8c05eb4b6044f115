#include "filters/kernels/gauss_smoothing.h"

#include <cstring>
#include <new>

namespace Qor::Luxar::ZELT::Filters {
namespace {

/// In front of each row and behind it, in elements.
constexpr int64_t margin = 16;

/// A scratch of more bytes than this is written past the cache: it would not find all of it there anyway.
constexpr int64_t most_cached_bytes = int64_t{8} << 20;

template <class T>
void clamp_row(uint8_t* first, int64_t width)
{
    T* const row = reinterpret_cast<T*>(first);
    row[-2] = row[-1] = row[0];
    row[width + 1] = row[width] = row[width - 1];
}

int64_t in_blocks(int64_t width)
{
    const int64_t block = gauss_level().lines_at_once;
    return (width + block - 1) / block * block;
}

/// Uninitialised.
pixel_buffer memory_of(int64_t elements, int64_t bytes_of_one)
{
    auto memory =
        pixel_buffer::allocate(static_cast<size_t>(elements * bytes_of_one), pixel_buffer::uninitialised);
    if (!memory) throw std::bad_alloc();
    return memory;
}

} // namespace

smoothing::smoothing(size s, pixel_type element, const recursion& filter)
    : size_(s), element_(element), filter_(filter), history_(memory_of(3 * in_blocks(s.width), 8)),
      lanes_(memory_of(in_blocks(s.width) * gauss_level().lines_at_once, 8))
{
}

void smoothing::run(const gauss_plane& src, const gauss_plane& scratch, const gauss_plane& dst,
                    smooth_function up)
{
    const gauss_job job{size_.width,
                        size_.height,
                        filter_,
                        src,
                        scratch,
                        dst,
                        reinterpret_cast<double*>(history_.data()),
                        lanes_.data(),
                        scratch.y_stride * size_.height > most_cached_bytes};
    gauss_level().rows_and_down[table_index_of(element_)](job);
    up(job);
}

scratch_image::scratch_image(size s, pixel_type element) : size_(s), plane_()
{
    const int64_t bytes = element == pixel_type::float_64 ? 8 : 4;
    // An odd number of cache lines, so that neighbouring rows do not compete for the same places in a cache.
    constexpr int64_t line = 64;
    const int64_t row = ((s.width + 2 * margin) * bytes + line - 1) / line / 2 * 2 * line + line;
    memory_ = memory_of(row * s.height, 1);
    plane_ = {memory_.data() + margin * bytes, bytes, row};
}

void scratch_image::clear() noexcept
{
    std::memset(memory_.data(), 0, static_cast<size_t>(plane_.y_stride * size_.height));
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
