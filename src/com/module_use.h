// What keeps the library loaded for a component host: its objects, and clients that lock it by IClassFactory::LockServer.
#pragma once

#include "zelt/com/types.h"

#include <atomic>

namespace Qor {

LONG server_lock_count() noexcept;

/// Objects alive, of every class.
extern constinit std::atomic<LONG> live_objects;

/// A member of every object. Nothing is published with the count, so its order does not matter; a host that asks
/// whether the library is in use has made its own threads quiet first.
class counted_life {
public:
    counted_life() noexcept { live_objects.fetch_add(1, std::memory_order_relaxed); }
    ~counted_life() { live_objects.fetch_sub(1, std::memory_order_relaxed); }
    counted_life(const counted_life&) = delete;
    counted_life& operator=(const counted_life&) = delete;
};

} // namespace Qor
