// The memory of an image's pixels.
#pragma once

#include "pixel/buffer_pool.h"

#include <cstddef>
#include <cstdint>
#include <utility>

namespace Qor::Luxar {

/// Owns memory that starts at a 64-byte boundary. Small buffers come from operator new; big ones are mapped on
/// huge pages and go through a recycling pool, since page faults of a fresh output cost several times the work
/// of an operation.
class pixel_buffer {
public:
    enum fill {
        zeroed,
        uninitialised, ///< for operations that write every pixel; a recycled buffer holds old pixels
    };
    static constexpr size_t alignment = 64;
    static constexpr size_t mapped_from = size_t{4} << 20; ///< bytes

    pixel_buffer() noexcept = default;
    pixel_buffer(pixel_buffer&& other) noexcept
        : base_(std::exchange(other.base_, nullptr)), allocated_(std::exchange(other.allocated_, nullptr)),
          mapped_bytes_(std::exchange(other.mapped_bytes_, 0))
    {
    }
    pixel_buffer& operator=(pixel_buffer&& other) noexcept
    {
        std::swap(base_, other.base_);
        std::swap(allocated_, other.allocated_);
        std::swap(mapped_bytes_, other.mapped_bytes_);
        return *this;
    }
    ~pixel_buffer();

    /// An empty buffer when the memory cannot be had. No bytes are a buffer, too.
    static pixel_buffer allocate(size_t bytes, fill content) noexcept;

    uint8_t* data() const noexcept { return base_; }
    explicit operator bool() const noexcept { return base_ != nullptr; }

private:
    uint8_t* base_ = nullptr;
    void* allocated_ = nullptr; // from operator new, with room to begin at a boundary
    size_t mapped_bytes_ = 0;
};

} // namespace Qor::Luxar
