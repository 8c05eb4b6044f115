// How kernels use a pool.
#pragma once

#include "threads/cancellation.h"
#include "threads/single_threaded_pool.h"

#include <atomic>

namespace Qor::Luxar::Thread {

/// Runs body(i, where) over the range on the pool, on the calling thread when the pool is null. The body is
/// referred to and not copied, however much it captures, so this allocates nothing.
template <class Body>
void run_parallel(ThreadPool* pool, range indices, const Body& body)
{
    SingleThreadedPool local;
    (pool ? *pool : local).parallel(indices, std::cref(body));
}

/// The same for an operation that can be cancelled: a request is looked for before each index, one that has
/// begun is finished, and Cancelled is thrown here, on the calling thread, when all workers have stopped.
template <class Body>
void run_cancellable(ThreadPool* pool, range indices, const Body& body)
{
    // Two operations may run into one request, and the other may take it first. Indices are missing here all
    // the same.
    std::atomic<bool> incomplete{false};
    run_parallel(pool, indices, [&](int32_t i, const ThreadInformation& where) {
        if (ZELT::IsCancelled()) {
            incomplete.store(true, std::memory_order_relaxed);
            return;
        }
        body(i, where);
    });
    ZELT::ThrowIfCancelled();
    if (incomplete.load(std::memory_order_relaxed)) throw ZELT::Cancelled();
}

} // namespace Qor::Luxar::Thread
