#include "threads/cancellation.h"

#include <atomic>
#include <cstdint>

namespace Qor::Luxar::ZELT {
namespace {

/// Relaxed throughout: the byte orders nothing else, it only has to be seen some time.
std::atomic<uint8_t> cancel_requested{0};

} // namespace

void RequestCancel() noexcept { cancel_requested.store(1, std::memory_order_relaxed); }

bool IsCancelled() noexcept { return cancel_requested.load(std::memory_order_relaxed) != 0; }

void ThrowIfCancelled()
{
    if (!IsCancelled()) return;
    cancel_requested.store(0, std::memory_order_relaxed);
    throw Cancelled();
}

} // namespace Qor::Luxar::ZELT
