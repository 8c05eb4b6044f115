// Rows of an output whose pixels need not lie side by side.
#pragma once

#include "filters/kernels/operands.h"

#include <cstring>
#include <vector>

namespace Qor::Luxar::ZELT::Filters {

/// Gives loops a row to fill side by side, of any alignment: the image's own where that is possible.
class output_rows {
public:
    explicit output_rows(const memory_2d& dst)
        : dst_(dst), pixel_bytes_(GetPixmatBits(dst.type) / 8),
          scratch_(dst.x_stride == pixel_bytes_ ? 0 : static_cast<size_t>(dst.width * pixel_bytes_))
    {
    }

    uint8_t* begin(int64_t y) { return scratch_.empty() ? row(y) : scratch_.data(); }

    /// The row that was begun is filled.
    void end(int64_t y)
    {
        if (scratch_.empty()) return;
        uint8_t* to = row(y);
        for (const uint8_t* from = scratch_.data(); from < scratch_.data() + scratch_.size();
             from += pixel_bytes_, to += dst_.x_stride)
            std::memcpy(to, from, static_cast<size_t>(pixel_bytes_));
    }

private:
    uint8_t* row(int64_t y) const { return first_pixel(dst_) + y * dst_.y_stride; }

    memory_2d dst_;
    int64_t pixel_bytes_;
    std::vector<uint8_t> scratch_;
};

} // namespace Qor::Luxar::ZELT::Filters
