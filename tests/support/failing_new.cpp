#include "support/failing_new.h"

#include <atomic>
#include <cstdlib>
#include <new>

namespace Qor::Luxar::ZELT::Test {

namespace {

constinit std::atomic<int64_t> made{0};
constinit std::atomic<int64_t> freed{0};
constinit std::atomic<int64_t> until_failure{0}; // not above 0: never

void* allocate(std::size_t size, std::size_t alignment) noexcept
{
    if (until_failure.load() > 0 && until_failure.fetch_sub(1) == 1) return nullptr;
    if (size == 0) size = 1;
    void* const block = alignment <= __STDCPP_DEFAULT_NEW_ALIGNMENT__
                            ? std::malloc(size)
                            : std::aligned_alloc(alignment, (size + alignment - 1) / alignment * alignment);
    if (block) made.fetch_add(1, std::memory_order_relaxed);
    return block;
}

void* allocate_or_throw(std::size_t size, std::size_t alignment)
{
    void* const block = allocate(size, alignment);
    if (!block) throw std::bad_alloc();
    return block;
}

void deallocate(void* block) noexcept
{
    if (block) freed.fetch_add(1, std::memory_order_relaxed);
    std::free(block);
}

} // namespace

failing_allocation::failing_allocation(int64_t n) noexcept { until_failure = n; }
failing_allocation::~failing_allocation() { until_failure = 0; }
bool failing_allocation::happened() const noexcept { return until_failure.load() <= 0; }

int64_t allocation_count() noexcept { return made.load(); }
int64_t live_allocations() noexcept { return made.load() - freed.load(); }

} // namespace Qor::Luxar::ZELT::Test

using namespace Qor::Luxar::ZELT::Test;
using std::align_val_t;
using std::nothrow_t;
using std::size_t;

// clang-format off
void* operator new(size_t n) { return allocate_or_throw(n, 1); }
void* operator new[](size_t n) { return allocate_or_throw(n, 1); }
void* operator new(size_t n, const nothrow_t&) noexcept { return allocate(n, 1); }
void* operator new[](size_t n, const nothrow_t&) noexcept { return allocate(n, 1); }
void* operator new(size_t n, align_val_t a) { return allocate_or_throw(n, static_cast<size_t>(a)); }
void* operator new[](size_t n, align_val_t a) { return allocate_or_throw(n, static_cast<size_t>(a)); }
void* operator new(size_t n, align_val_t a, const nothrow_t&) noexcept { return allocate(n, static_cast<size_t>(a)); }
void* operator new[](size_t n, align_val_t a, const nothrow_t&) noexcept { return allocate(n, static_cast<size_t>(a)); }
void operator delete(void* p) noexcept { deallocate(p); }
void operator delete[](void* p) noexcept { deallocate(p); }
void operator delete(void* p, size_t) noexcept { deallocate(p); }
void operator delete[](void* p, size_t) noexcept { deallocate(p); }
void operator delete(void* p, const nothrow_t&) noexcept { deallocate(p); }
void operator delete[](void* p, const nothrow_t&) noexcept { deallocate(p); }
void operator delete(void* p, align_val_t) noexcept { deallocate(p); }
void operator delete[](void* p, align_val_t) noexcept { deallocate(p); }
void operator delete(void* p, size_t, align_val_t) noexcept { deallocate(p); }
void operator delete[](void* p, size_t, align_val_t) noexcept { deallocate(p); }
void operator delete(void* p, align_val_t, const nothrow_t&) noexcept { deallocate(p); }
void operator delete[](void* p, align_val_t, const nothrow_t&) noexcept { deallocate(p); }
