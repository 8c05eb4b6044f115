// Where the pixels of an image lie, and which images lie in each other's way.
#pragma once

#include "arithmetic/kernels/binary.h"

#include <vector>

namespace Qor::Luxar::ZELT::Arithmetic {

/// A pixel at the origin, where each row begins, and what a pixel is.
struct plane {
    uint8_t* first = nullptr;
    int64_t x_stride = 0;
    int64_t y_stride = 0;
    storage type = storage::none;

    uint8_t* at(int64_t x, int64_t y) const { return first + y * y_stride + x * x_stride; }
    bool adjacent() const { return x_stride == bytes_of(type); }
};

inline plane plane_of(const image& i, storage type)
{
    return {i.data + i.layout.offset, i.layout.x_stride, i.layout.y_stride, type};
}

inline size extent_of(const image& i) { return {i.layout.width, i.layout.height}; }

/// True when rows of adjacent pixels follow each other without a gap, so that they are one row.
inline bool is_packed(const plane& p, size extent) { return p.y_stride == p.x_stride * extent.width; }

/// The storage of real pixels of 8 to 32 bits or Float; none for all others.
storage real_storage_of(const image_layout& layout) noexcept;

/// The pixels of an image inside a rectangle that fits it.
image part_of(const image& whole, const rectangle& r) noexcept;

/// One pixel, many times.
class pixel_fill {
public:
    /// `pixels` is a block of pixels, all alike.
    pixel_fill(const uint8_t* pixels, storage type) noexcept;

    /// Fills so many bytes, whole pixels.
    void operator()(uint8_t* to, int64_t bytes) const noexcept;

private:
    alignas(64) uint8_t block_[block_pixels * 16];
    int64_t block_bytes_;
    bool bytes_alike_;
};

/// A kernel's operand that stays as it is while the kernel writes its output.
class stable_operand {
public:
    /// The image itself when no output pixel lies on a pixel that is read later: it shares no memory with the
    /// output, or its pixels are the output's, one for one (in_step: each is read before it is written). Else a
    /// packed copy of it. Throws std::bad_alloc.
    stable_operand(const image& operand, int64_t pixel_bytes, const image& output, int64_t output_bytes,
                   bool in_step = true);
    stable_operand(const stable_operand&) = delete;
    stable_operand& operator=(const stable_operand&) = delete;

    const image& pixels() const noexcept { return pixels_; }

private:
    image pixels_;
    std::vector<uint8_t> copy_;
};

} // namespace Qor::Luxar::ZELT::Arithmetic
