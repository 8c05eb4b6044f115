#include "threads/multi_threaded_pool.h"

#include "frame/debug_stream.h"
#include "threads/gate.h"

#include <algorithm>
#include <exception>
#include <map>
#include <memory>
#include <mutex>
#include <thread>
#include <unistd.h>
#include <vector>

namespace Qor::Luxar::Thread {
namespace {

/// One call of parallel, on the stack of its caller.
struct job {
    job(range indices, const parallel_body& work, ThreadObserver* watcher)
        : step(1.0 / (static_cast<double>(indices.end) - indices.start)), start(indices.start),
          end(indices.end), body(work), observer(watcher), stop(watcher && watcher->IsStopped()),
          next(indices.start), highest_reported(indices.start)
    {
    }

    const double step; // infinite for an empty range, and then not used
    const int32_t start;
    const int32_t end;
    const parallel_body body;
    ThreadObserver* const observer;
    std::atomic<bool> stop;
    std::atomic<int64_t> next; // wider than an index: every worker takes one beyond the end
    std::mutex mutex;          // for all that follows, and for calls of the observer
    std::exception_ptr caught;
    int32_t highest_reported;

    void run_on(int worker) noexcept
    {
        const ThreadInformation here{worker};
        try {
            for (int64_t i; (i = next.fetch_add(1, std::memory_order_relaxed)) < end;) {
                body(static_cast<int32_t>(i), here);
                if (observer && !goes_on_after(static_cast<int32_t>(i))) return;
            }
        } catch (const std::exception& e) {
            const std::lock_guard lock(mutex);
            dbg() << "MultiThreadedPool::parallel -> catch( std::exception& ) : " << e.what() << '\n';
            keep_current_exception();
        } catch (...) {
            const std::lock_guard lock(mutex);
            dbg() << "MultiThreadedPool::parallel -> catch( ... )" << '\n';
            keep_current_exception();
        }
    }

private:
    bool goes_on_after(int32_t i)
    {
        if (stop) return false;
        const std::lock_guard lock(mutex);
        if (i <= highest_reported) return true; // rows that end out of order must not set the fraction back
        highest_reported = i;
        observer->Progress((static_cast<double>(i) - start + 1) * step);
        if (!observer->IsStopped()) return true;
        stop = true;
        return false;
    }

    /// A later failure replaces an earlier one.
    void keep_current_exception() noexcept
    {
        caught = std::current_exception();
        stop = true;
    }
};

int at_least_one_thread(int threads)
{
    return threads >= 1 ? threads : std::max(1, static_cast<int>(std::thread::hardware_concurrency()));
}

} // namespace

class MultiThreadedPool::implementation {
public:
    implementation(int threads, ThreadObserver* observer)
        : process_(getpid()), thread_count_(at_least_one_thread(threads)), observer_(observer)
    {
    }
    implementation(const implementation& other) : implementation(other.thread_count_, other.observer_) {}
    ~implementation() { end_workers(); }

    bool belongs_here() const noexcept { return process_ == getpid(); }
    int thread_count() const noexcept { return thread_count_; }

    /// Needs no lock: once the workers are ready the table stays as it is, and before that no body runs.
    int current_worker() const
    {
        if (!ready_.load(std::memory_order_acquire)) return -1;
        const auto entry = workers_.find(std::this_thread::get_id());
        return entry == workers_.end() ? -1 : entry->second;
    }

    void parallel(range indices, const parallel_body& body)
    {
        job work(indices, body, observer_);
        if (const int worker = current_worker(); worker != -1) {
            for (int32_t i = work.start; i < work.end; ++i) work.body(i, {worker});
            return;
        }
        const std::lock_guard lock(job_mutex_);
        run(work);
        if (work.caught) std::rethrow_exception(work.caught);
        if (observer_ && !work.stop) observer_->Progress(1.0);
    }

private:
    void run(job& work)
    {
        start_workers();
        job_ = &work;
        end_gate_.close();
        start_gate_.open();
        end_gate_.await_all();
        start_gate_.close();
        end_gate_.open();
        start_gate_.await_all(); // all are parked again: nobody looks at the job any more
    }

    void start_workers()
    {
        if (!threads_.empty()) return;
        start_gate_.reset(thread_count_);
        end_gate_.reset(thread_count_);
        try {
            threads_.reserve(static_cast<std::size_t>(thread_count_));
            for (int worker = 0; worker < thread_count_; ++worker)
                threads_.emplace_back(&implementation::live, this, worker);
            start_gate_.await_all();
            if (start_failure_) std::rethrow_exception(start_failure_);
        } catch (...) {
            end_workers();
            throw;
        }
        ready_.store(true, std::memory_order_release);
    }

    /// Also for a start that failed half way: who has not arrived yet finds the gate open.
    void end_workers() noexcept
    {
        if (threads_.empty()) return;
        shutdown_ = true;
        start_gate_.open();
        for (auto& thread : threads_) thread.join();
        threads_.clear();
        workers_.clear();
        start_failure_ = nullptr;
        shutdown_ = false;
    }

    void live(int worker) noexcept
    {
        enter_table(worker);
        for (;;) {
            start_gate_.arrive_and_pass();
            if (shutdown_) return;
            // Here a worker would take on its priority. The only one in use is 0, normal, which a thread has
            // from its start on this platform.
            job_->run_on(worker);
            end_gate_.arrive_and_pass();
        }
    }

    void enter_table(int worker) noexcept
    {
        const std::lock_guard lock(table_mutex_);
        try {
            workers_[std::this_thread::get_id()] = worker;
        } catch (...) {
            start_failure_ = std::current_exception(); // the starter looks when all have arrived
        }
    }

    const pid_t process_;
    const int thread_count_;
    ThreadObserver* const observer_;
    std::mutex job_mutex_; // outermost: held for a whole job
    std::vector<std::thread> threads_;
    std::atomic<bool> ready_{false};
    std::mutex table_mutex_; // for the two that follow, while workers start
    std::map<std::thread::id, int> workers_;
    std::exception_ptr start_failure_;
    Internal::gate start_gate_;
    Internal::gate end_gate_;
    bool shutdown_ = false; // this and the job are handed to the workers through the start gate
    job* job_ = nullptr;
};

MultiThreadedPool::MultiThreadedPool(int threads, ThreadObserver* observer)
    : implementation_(new implementation(threads, observer))
{
}

MultiThreadedPool::~MultiThreadedPool()
{
    const implementation* const mine = implementation_.load();
    if (mine->belongs_here()) delete mine;
}

/// A forked process has a copy of the pool without its threads, with mutexes as they happened to be. Nothing
/// of it can be used, joined or destroyed, so it is left behind, deliberately not freed, and a fresh one
/// takes its place.
MultiThreadedPool::implementation& MultiThreadedPool::of_this_process()
{
    implementation* mine = implementation_.load();
    if (mine->belongs_here()) return *mine;
    auto fresh = std::make_unique<implementation>(*mine);
    if (implementation_.compare_exchange_strong(mine, fresh.get())) return *fresh.release();
    return *mine; // another thread of this process was first
}

int MultiThreadedPool::GetThreadCount() const { return implementation_.load()->thread_count(); }

int MultiThreadedPool::GetCurrentWorker() const
{
    const implementation& mine = *implementation_.load();
    return mine.belongs_here() ? mine.current_worker() : -1;
}

void MultiThreadedPool::parallel(range indices, const parallel_body& body)
{
    of_this_process().parallel(indices, body);
}

} // namespace Qor::Luxar::Thread
