#pragma once

#include "threads/thread_pool.h"

namespace Qor::Luxar::Thread {

/// Runs every body on the calling thread, in rising order. Making one costs nothing.
class SingleThreadedPool final : public ThreadPool {
public:
    /// observer: may be null; it is not owned and must outlive the pool.
    explicit SingleThreadedPool(ThreadObserver* observer = nullptr) noexcept : observer_(observer) {}

    int GetThreadCount() const override { return 1; }
    int GetCurrentWorker() const override { return 0; }
    /// An exception of the body leaves at once. The observer hears of every index and is asked after each; no
    /// closing Progress(1.0) follows.
    void parallel(range indices, const parallel_body& body) override;

private:
    ThreadObserver* const observer_;
};

} // namespace Qor::Luxar::Thread
