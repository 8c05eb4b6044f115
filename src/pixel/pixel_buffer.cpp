#include "pixel/pixel_buffer.h"

#include <cstring>
#include <new>

namespace Qor::Luxar {

pixel_buffer pixel_buffer::allocate(size_t bytes, fill content) noexcept
{
    pixel_buffer buffer;
    if (bytes > PTRDIFF_MAX) return buffer;
    if (bytes >= mapped_from) {
        const mapped_block block = take_block(bytes);
        buffer.base_ = block.base;
        buffer.mapped_bytes_ = block.bytes;
        if (block.recycled && content == zeroed) std::memset(block.base, 0, bytes);
        return buffer;
    }
    // Aligned forms of operator new take several times as long: they go past the caches of the C library.
    buffer.allocated_ = ::operator new(bytes + alignment, std::nothrow);
    if (!buffer.allocated_) return buffer;
    auto* const first = static_cast<uint8_t*>(buffer.allocated_);
    buffer.base_ = first + (alignment - reinterpret_cast<uintptr_t>(first) % alignment);
    if (content == zeroed) std::memset(buffer.base_, 0, bytes);
    return buffer;
}

pixel_buffer::~pixel_buffer()
{
    if (mapped_bytes_ > 0)
        give_block(base_, mapped_bytes_);
    else
        ::operator delete(allocated_);
}

} // namespace Qor::Luxar
