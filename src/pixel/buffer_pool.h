// Big blocks of memory on huge pages, a few of which are kept for the next image.
#pragma once

#include <cstddef>
#include <cstdint>

namespace Qor::Luxar {

struct mapped_block {
    uint8_t* base = nullptr; ///< null when the memory cannot be had
    size_t bytes = 0;        ///< the whole block, for give_block
    bool recycled = false;   ///< holds what was left in it; a fresh block is zero
};

/// A block that starts at a 2 MiB boundary. Any thread may take and give, also while the process ends.
mapped_block take_block(size_t at_least) noexcept;
void give_block(uint8_t* base, size_t bytes) noexcept;

/// What waits for reuse now, in bytes.
size_t pooled_bytes() noexcept;
inline constexpr size_t most_pooled_bytes = size_t{256} << 20;
inline constexpr int most_pooled_blocks = 4;

} // namespace Qor::Luxar
