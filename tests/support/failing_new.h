// Memory that runs out when a test wants it to. The operators new and delete of the whole test program are
// replaced; they count, and otherwise do what they always do.
//
//     for (int n = 1;; ++n) {
//         const HRESULT hr = with_failing_allocation(n, [&] { return method_under_test(); });
//         if (hr == S_OK) break;
//         EXPECT_EQ(hr, E_OUTOFMEMORY);
//     }
//
// Allocations of all threads count. An EXPECT that fails allocates too: keep it out of the function.
#pragma once

#include <cstdint>

namespace Qor::Luxar::ZELT::Test {

/// The n-th allocation, counted from 1, fails as long as the object lives; only that one does. One at a time.
class failing_allocation {
public:
    explicit failing_allocation(int64_t n) noexcept;
    ~failing_allocation();
    failing_allocation(const failing_allocation&) = delete;
    failing_allocation& operator=(const failing_allocation&) = delete;

    /// Whether the n-th allocation was reached.
    bool happened() const noexcept;
};

template <class Function>
auto with_failing_allocation(int64_t n, Function&& function)
{
    const failing_allocation armed(n);
    return function();
}

/// Allocations since the program began, and those of them that are not freed yet.
int64_t allocation_count() noexcept;
int64_t live_allocations() noexcept;

} // namespace Qor::Luxar::ZELT::Test
