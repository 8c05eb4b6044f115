#include "pixel/buffer_pool.h"

#include "com/held_over_fork.h"

#include <algorithm>
#include <type_traits>
#include <utility>

#include <sys/mman.h>

#if defined(__SANITIZE_ADDRESS__)
#define ZELT_ADDRESS_SANITIZER 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define ZELT_ADDRESS_SANITIZER 1
#endif
#endif
#ifdef ZELT_ADDRESS_SANITIZER
#include <sanitizer/asan_interface.h>
#endif

namespace Qor::Luxar {
namespace {

constexpr size_t huge_page = size_t{2} << 20;

// The address sanitizer knows nothing of mapped memory unless it is told what may be used.
void allow([[maybe_unused]] uint8_t* base, [[maybe_unused]] size_t used,
           [[maybe_unused]] size_t bytes) noexcept
{
#ifdef ZELT_ADDRESS_SANITIZER
    __asan_unpoison_memory_region(base, used);
    __asan_poison_memory_region(base + used, bytes - used);
#endif
}

struct block {
    uint8_t* base;
    size_t bytes;
};

void unmap(block b) noexcept
{
    allow(b.base, b.bytes, b.bytes);
    munmap(b.base, b.bytes);
}

block map(size_t bytes) noexcept
{
    void* const raw =
        mmap(nullptr, bytes + huge_page, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (raw == MAP_FAILED) return {nullptr, 0};
    auto* const first = static_cast<uint8_t*>(raw);
    const size_t before = (huge_page - reinterpret_cast<uintptr_t>(first) % huge_page) % huge_page;
    uint8_t* const base = first + before;
    if (before > 0) munmap(first, before);
    munmap(base + bytes, huge_page - before);
    madvise(base, bytes, MADV_HUGEPAGE); // an advice: refused, the block is still good
    return {base, bytes};
}

// Oldest first. Lives as long as the process and is never destroyed, so that an image that a static object
// holds may go at any time.
struct block_pool {
    block waiting[most_pooled_blocks];
    int count;
    size_t bytes;
    bool closed;

    block remove(int i) noexcept
    {
        const block b = waiting[i];
        std::move(waiting + i + 1, waiting + count, waiting + i);
        --count;
        bytes -= b.bytes;
        return b;
    }
};
static_assert(std::is_trivially_destructible_v<block_pool>);
constinit block_pool pool{};
constinit std::mutex pool_mutex; // for all of the pool

struct end_of_process {
    ~end_of_process()
    {
        const std::lock_guard lock(pool_mutex);
        pool.closed = true;
        while (pool.count > 0) unmap(pool.remove(pool.count - 1));
    }
} const end_of_pool;

/// A child starts with an empty pool: blocks that wait are its parent's memory, and writing to them costs a copy.
void forget_blocks_of_parent() noexcept
{
    while (pool.count > 0) unmap(pool.remove(pool.count - 1));
}
const held_over_fork<pool_mutex, forget_blocks_of_parent> fork_safe;

} // namespace

mapped_block take_block(size_t at_least) noexcept
{
    if (at_least > PTRDIFF_MAX - 2 * huge_page) return {};
    {
        const std::lock_guard lock(pool_mutex);
        int best = -1;
        for (int i = 0; i < pool.count; ++i) {
            const size_t bytes = pool.waiting[i].bytes;
            const bool fits = bytes >= at_least && bytes / 2 <= at_least; // a block much too big waits on
            if (fits && (best < 0 || bytes < pool.waiting[best].bytes)) best = i;
        }
        if (best >= 0) {
            const block b = pool.remove(best);
            allow(b.base, at_least, b.bytes);
            return {b.base, b.bytes, true};
        }
    }
    const block b = map((at_least + huge_page - 1) / huge_page * huge_page);
    if (b.base) allow(b.base, at_least, b.bytes);
    return {b.base, b.bytes, false};
}

void give_block(uint8_t* base, size_t bytes) noexcept
{
    block too_much[most_pooled_blocks + 1];
    int count = 0;
    {
        const std::lock_guard lock(pool_mutex);
        if (pool.closed || bytes > most_pooled_bytes) {
            too_much[count++] = {base, bytes};
        } else {
            while (pool.count == most_pooled_blocks || pool.bytes + bytes > most_pooled_bytes)
                too_much[count++] = pool.remove(0);
            allow(base, 0, bytes);
            pool.waiting[pool.count++] = {base, bytes};
            pool.bytes += bytes;
        }
    }
    for (int i = 0; i < count; ++i) unmap(too_much[i]);
}

size_t pooled_bytes() noexcept
{
    const std::lock_guard lock(pool_mutex);
    return pool.bytes;
}

} // namespace Qor::Luxar
