#pragma once

#include "threads/thread_pool.h"

#include <atomic>

namespace Qor::Luxar::Thread {

/// Runs bodies on its own worker threads while the caller sleeps. Workers are started by the first job and
/// sleep between jobs; one job runs at a time, and a second caller waits for its turn. Indices are handed out
/// one by one, in rising order, to whichever worker is free. In a process forked from the one that made the
/// pool, the pool works like a new one, whatever it was doing.
class MultiThreadedPool final : public ThreadPool {
public:
    /// threads: below 1 means one per hardware thread. observer: may be null; it is not owned and must
    /// outlive the pool. Starts no thread.
    explicit MultiThreadedPool(int threads, ThreadObserver* observer = nullptr);
    ~MultiThreadedPool() override;

    int GetThreadCount() const override;
    int GetCurrentWorker() const override;
    /// After an exception of a body, the last one caught is rethrown when all workers have stopped. Without
    /// an observer the other workers first finish the remaining indices; with one they stop after their
    /// current index. The observer hears of rising indices only and, when nothing failed or stopped, of
    /// Progress(1.0) at the end. Throws std::system_error or std::bad_alloc when the workers cannot be
    /// started; the next call tries again.
    void parallel(range indices, const parallel_body& body) override;

private:
    class implementation;

    implementation& of_this_process();

    std::atomic<implementation*> implementation_;
};

} // namespace Qor::Luxar::Thread
