// The source rows that one worker has at hand. Filters that go down an image read each row once and find it here for
// all output rows that need it, whatever the strides; border and interior look the same.
#pragma once

#include "filters/kernels/operands.h"
#include "filters/kernels/padded_row.h"

#include <algorithm>
#include <utility>
#include <vector>

namespace Qor::Luxar::ZELT::Filters {

/// The view as padded rows that cover the columns from -before to width - 1 + after; both may be negative,
/// but at least one column is left.
inline padded_source padded(const memory_2d& src, int64_t before, int64_t after)
{
    const int64_t first = -before, end = src.width + after;
    const int64_t from = std::clamp<int64_t>(first, 0, src.width),
                  to = std::clamp<int64_t>(end, 0, src.width);
    const int64_t left = std::clamp<int64_t>(before, 0, end - first), count = std::max<int64_t>(to - from, 0);
    return {first_pixel(src),
            src.x_stride,
            src.y_stride,
            src.width,
            src.height,
            channels_of(src.type),
            {left, from, count, end - first - left - count}};
}

/// The length of such a row, in numbers.
inline int64_t elements_of(const padded_source& src)
{
    return (src.padding.left + src.padding.count + src.padding.right) * src.channels;
}

/// Rows of E. At most `capacity` neighbouring rows are asked for at a time. The source's own pixels start at
/// the beginning of a cache line, so that not every vector crosses one.
template <class E>
class row_ring {
public:
    using loader = void (*)(const padded_source&, int64_t y, E* to);

    /// slack: how many numbers may be read beyond a row.
    row_ring(const padded_source& src, loader load, int64_t capacity, int64_t slack)
        : src_(src), load_(load),
          before_(round_up(src.padding.left * src.channels) - src.padding.left * src.channels),
          length_(round_up(before_ + elements_of(src) + slack)), loaded_(static_cast<size_t>(capacity), -1),
          elements_(static_cast<size_t>(capacity * length_ + line))
    {
    }

    /// The row at y, or the nearest one of the image.
    const E* operator[](int64_t y)
    {
        y = std::clamp<int64_t>(y, 0, src_.height - 1);
        const int64_t slot = y % static_cast<int64_t>(loaded_.size());
        const auto address = reinterpret_cast<uintptr_t>(elements_.data());
        const auto to_line =
            static_cast<int64_t>((line * sizeof(E) - address % (line * sizeof(E))) / sizeof(E));
        E* const row = elements_.data() + to_line + slot * length_ + before_;
        if (std::exchange(loaded_[static_cast<size_t>(slot)], y) != y) load_(src_, y, row);
        return row;
    }

private:
    static constexpr int64_t line = 64 / sizeof(E);
    static int64_t round_up(int64_t n) { return (n + line - 1) / line * line; }

    padded_source src_;
    loader load_;
    int64_t before_; ///< numbers of a slot before its row
    int64_t length_;
    std::vector<int64_t> loaded_; ///< which row lies in a slot
    std::vector<E> elements_;
};

} // namespace Qor::Luxar::ZELT::Filters
