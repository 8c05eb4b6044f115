// A smoothing and its scratch, for the fronts of the Gaussian family.
#pragma once

#include "filters/kernels/gauss_levels.h"
#include "filters/kernels/operands.h"
#include "pixel/pixel_buffer.h"

#include <optional>

namespace Qor::Luxar::ZELT::Filters {

/// One channel of a view.
inline gauss_plane plane_of(const memory_2d& m, int channel = 0)
{
    return {m.data + m.offset + channel, m.x_stride, m.y_stride};
}

/// Runs the recursion over channels of one size and element type.
class smoothing {
public:
    smoothing(size s, pixel_type element, const recursion& filter);

    /// From the source through the scratch into pixels of a type.
    void run(const gauss_plane& src, const gauss_plane& scratch, const gauss_plane& dst, smooth_function up);

private:
    size size_;
    pixel_type element_;
    recursion filter_;
    pixel_buffer history_;
    pixel_buffer lanes_; // a double's size suits both kinds of scratch
};

/// Rows of floats, or of doubles for double pixels, with room for clamped pixels beside them; not filled.
class scratch_image {
public:
    scratch_image(size s, pixel_type element);

    const gauss_plane& plane() const noexcept { return plane_; }
    bool is_double() const noexcept { return plane_.x_stride == 8; }
    void clear() noexcept;

    /// Repeats the first and the last pixel of each row twice beyond it.
    void clamp_rows() noexcept;

private:
    size size_;
    gauss_plane plane_;
    pixel_buffer memory_;
};

/// A channel smoothed, for differences of it.
class smoothed_image {
public:
    /// Without a filter all is 0.
    smoothed_image(size s, pixel_type element, const std::optional<recursion>& filter);

    /// Replaces what an earlier call has made.
    const gauss_plane& of(const gauss_plane& src);
    bool is_double() const noexcept { return scratch_.is_double(); }

private:
    scratch_image scratch_;
    std::optional<smoothing> smoothing_;
};

} // namespace Qor::Luxar::ZELT::Filters
