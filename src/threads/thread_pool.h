// One interface for loops over rows, whoever runs them: a kernel is written once and given a pool.
#pragma once

#include <cstdint>
#include <functional>

namespace Qor::Luxar::Thread {

/// What a body learns about where it runs.
struct ThreadInformation {
    int32_t worker; ///< 0 to GetThreadCount() - 1
};

/// The indices start, start + 1, ... up to end, which is excluded. Empty when end is not above start.
struct range {
    int32_t start;
    int32_t end;
};

/// Called once for each index, concurrently: it may read shared data and must write only what belongs to its
/// index. A pool that runs a job holds its own copy. Captures of more than two words make that copy an
/// allocation; pass std::cref of the callable instead, as run_parallel does, to have none.
using parallel_body = std::function<void(int32_t index, const ThreadInformation& where)>;

/// Watches jobs and may end them early. During a job its calls come one at a time, from any worker; each call
/// of parallel, a nested one too, first asks IsStopped on its own thread.
class ThreadObserver {
public:
    /// True ends the job: indices that have begun are finished, no other begins.
    virtual bool IsStopped() = 0;
    /// fraction: above 0, at most 1, and rising during a job.
    virtual void Progress(double fraction) = 0;

protected:
    ~ThreadObserver() = default; // not owned by anybody here, and no slot of the interface
};

class ThreadPool {
public:
    virtual ~ThreadPool() = default;
    virtual int GetThreadCount() const = 0;
    /// The worker index of the calling thread, -1 when it is no worker of this pool.
    virtual int GetCurrentWorker() const = 0;
    /// Runs body(i, worker) for every i of the range and returns when all have ended. Exceptions of the body
    /// come out here. A call from inside a body of the same pool runs the range in order on the same worker.
    /// An empty body raises std::bad_function_call at the first index.
    virtual void parallel(range indices, const parallel_body& body) = 0;

protected:
    ThreadPool() = default;
    ThreadPool(const ThreadPool&) = delete;
    ThreadPool& operator=(const ThreadPool&) = delete;
};

} // namespace Qor::Luxar::Thread
