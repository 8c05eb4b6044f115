// Handing out of indices, progress, nesting, failures of bodies; both pools, also through run_parallel.
#include "threads/multi_threaded_pool.h"
#include "threads/run_parallel.h"

#include "zelt/debug_sink.h"

#include <algorithm>
#include <condition_variable>
#include <gtest/gtest.h>
#include <limits>
#include <mutex>
#include <set>
#include <string>
#include <thread>
#include <vector>

using namespace Qor::Luxar::Thread;

namespace {

constexpr int32_t biggest = std::numeric_limits<int32_t>::max();
constexpr int32_t lowest = std::numeric_limits<int32_t>::min();

/// Records what it is told; stops from a fraction on.
struct recorder final : ThreadObserver {
    explicit recorder(double stop = 2.0) : stop_from(stop), reached(stop_from <= 0.0) {}
    bool IsStopped() override { return reached; }
    void Progress(double fraction) override
    {
        fractions.push_back(fraction);
        if (fraction >= stop_from) reached = true;
    }
    const double stop_from;
    std::atomic<bool> reached;
    std::vector<double> fractions;
};

/// Every caller waits until so many are here: proves that they run at the same time.
class meeting {
public:
    explicit meeting(int expected) : missing_(expected) {}
    void join()
    {
        std::unique_lock lock(mutex_);
        --missing_;
        all_here_.notify_all();
        all_here_.wait(lock, [this] { return missing_ <= 0; });
    }

private:
    std::mutex mutex_;
    std::condition_variable all_here_;
    int missing_;
};

template <class Exception, class Call>
std::string text_of(Call&& call)
{
    try {
        call();
    } catch (const Exception& e) {
        return e.what();
    }
    return "nothing was thrown";
}

TEST(ThreadPool, RunsEveryIndexOfAnyRangeOnce)
{
    MultiThreadedPool four(4);
    SingleThreadedPool single;
    for (ThreadPool* pool :
         {static_cast<ThreadPool*>(&four), static_cast<ThreadPool*>(&single), (ThreadPool*)nullptr})
        for (range r : {range{0, 1000},
                        {-7, 5},
                        {3, 3},
                        {5, -5},
                        {41, 42},
                        {biggest - 3, biggest},
                        {lowest, lowest + 3},
                        {biggest, biggest},
                        {biggest, lowest}}) {
            std::mutex mutex;
            std::vector<int32_t> seen;
            const int workers = pool ? pool->GetThreadCount() : 1;
            run_parallel(pool, r, [&](int32_t i, const ThreadInformation& where) {
                const std::lock_guard lock(mutex);
                EXPECT_TRUE(where.worker >= 0 && where.worker < workers);
                seen.push_back(i);
            });
            std::vector<int32_t> expected;
            for (int64_t i = r.start; i < r.end; ++i) expected.push_back(static_cast<int32_t>(i));
            std::sort(seen.begin(), seen.end());
            EXPECT_EQ(seen, expected) << workers << " workers, " << r.start << " to " << r.end;
        }
}

TEST(ThreadPool, ClaimsIndicesInRisingOrderOnEveryWorker)
{
    MultiThreadedPool pool(3);
    std::vector<std::vector<int32_t>> seen(3);
    meeting all(3);
    pool.parallel({0, 500}, [&](int32_t i, const ThreadInformation& where) {
        if (i < 3) all.join(); // also proves that three rows run at once
        seen[static_cast<std::size_t>(where.worker)].push_back(i);
    });
    for (const auto& rows : seen) {
        EXPECT_FALSE(rows.empty());
        EXPECT_TRUE(std::is_sorted(rows.begin(), rows.end()));
    }
}

TEST(ThreadPool, KnowsItsWorkersAndNobodyElse)
{
    MultiThreadedPool pool(2), other(2);
    EXPECT_EQ(pool.GetCurrentWorker(), -1);
    std::atomic<int> wrong{0};
    std::set<std::thread::id> threads;
    std::mutex mutex;
    for (int job = 0; job < 3; ++job)
        pool.parallel({0, 20}, [&](int32_t, const ThreadInformation& where) {
            if (pool.GetCurrentWorker() != where.worker || other.GetCurrentWorker() != -1) ++wrong;
            const std::lock_guard lock(mutex);
            threads.insert(std::this_thread::get_id());
        });
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(pool.GetCurrentWorker(), -1);
    EXPECT_LE(threads.size(), 2u); // the same threads for all jobs
    EXPECT_EQ(threads.count(std::this_thread::get_id()), 0u);
    EXPECT_EQ(SingleThreadedPool().GetCurrentWorker(), 0);
    EXPECT_EQ(MultiThreadedPool(0).GetThreadCount(), std::max(1, int(std::thread::hardware_concurrency())));
    EXPECT_EQ(MultiThreadedPool(-5).GetThreadCount(), MultiThreadedPool(0).GetThreadCount());
}

TEST(ThreadPool, FinishesTheOtherRowsAndHandsOverTheException)
{
    MultiThreadedPool pool(3);
    std::atomic<int> done{0};
    const auto job = [&](auto failure) {
        done = 0;
        pool.parallel({0, 100}, [&](int32_t i, const ThreadInformation&) {
            if (i == 17) throw failure;
            ++done;
        });
    };
    EXPECT_EQ(text_of<std::invalid_argument>([&] { job(std::invalid_argument("row 17")); }), "row 17");
    EXPECT_EQ(done, 99);
    EXPECT_THROW(job(42L), long);
    EXPECT_EQ(done, 99);
    EXPECT_THROW(pool.parallel({0, 5}, parallel_body()), std::bad_function_call);
    EXPECT_NO_THROW(pool.parallel({5, 5}, parallel_body()));
    EXPECT_THROW(SingleThreadedPool().parallel({0, 5}, parallel_body()), std::bad_function_call);
}

TEST(ThreadPool, KeepsTheExceptionThatWasStoredLast)
{
    static std::atomic<int> lines;
    lines = 0;
    Qor::set_debug_sink([](const char*, void*) noexcept { ++lines; }, nullptr);
    MultiThreadedPool pool(2);
    meeting both(2);
    const auto body = [&](int32_t i, const ThreadInformation&) {
        both.join();
        if (i == 0) throw std::runtime_error("first");
        while (lines == 0) std::this_thread::yield(); // the first is being stored, under the job's lock
        throw std::runtime_error("last");
    };
    EXPECT_EQ(text_of<std::runtime_error>([&] { pool.parallel({0, 2}, body); }), "last");
    Qor::set_debug_sink(nullptr, nullptr);
}

TEST(ThreadPool, WritesCaughtExceptionsToTheDebugStream)
{
    static std::string text;
    text.clear();
    Qor::set_debug_sink([](const char* piece, void*) noexcept { text += piece; }, nullptr);
    MultiThreadedPool pool(1);
    EXPECT_THROW(pool.parallel({0, 1}, [](auto...) { throw std::out_of_range("too far"); }),
                 std::out_of_range);
    EXPECT_THROW(pool.parallel({0, 1}, [](auto...) { throw 7; }), int);
    Qor::set_debug_sink(nullptr, nullptr);
    EXPECT_EQ(text, "MultiThreadedPool::parallel -> catch( std::exception& ) : too far\n"
                    "MultiThreadedPool::parallel -> catch( ... )\n");
}

TEST(ThreadPool, RunsNestedCallsInOrderOnTheSameWorker)
{
    MultiThreadedPool pool(2);
    std::atomic<int> wrong{0}, inner{0};
    const auto outer = [&](int32_t i, const ThreadInformation& where) {
        int32_t expected = 10;
        pool.parallel({10, 20}, [&](int32_t j, const ThreadInformation& nested) {
            if (j != expected++ || nested.worker != where.worker || pool.GetCurrentWorker() != where.worker)
                ++wrong;
            ++inner;
            if (i == 3 && j == 15) throw std::invalid_argument("inner");
        });
        if (i == 3) ++wrong; // the exception must leave the outer body too
    };
    EXPECT_EQ(text_of<std::invalid_argument>([&] { pool.parallel({0, 8}, outer); }), "inner");
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(inner, 7 * 10 + 6);
}

TEST(ThreadPool, LetsOneCallerInAtATime)
{
    MultiThreadedPool pool(2); // not started yet: the callers also race for the start
    int running = 0, mixed = 0, rows = 0;
    std::mutex mutex;
    std::vector<std::thread> callers;
    for (int caller = 1; caller <= 4; ++caller)
        callers.emplace_back([&, caller] {
            for (int job = 0; job < 20; ++job)
                pool.parallel({0, 5}, [&, caller](int32_t, const ThreadInformation&) {
                    const std::lock_guard lock(mutex);
                    if (rows++ % 5 == 0) running = caller; // jobs that overlapped would mix their callers
                    mixed += running != caller;
                });
        });
    for (auto& caller : callers) caller.join();
    EXPECT_EQ(rows, 4 * 20 * 5);
    EXPECT_EQ(mixed, 0);
}

TEST(ThreadPool, ReportsRisingProgressAndTheEnd)
{
    recorder many, empty, one;
    MultiThreadedPool(4, &many).parallel({-50, 150}, [](auto...) {});
    ASSERT_GT(many.fractions.size(), 1u);
    EXPECT_TRUE(std::is_sorted(many.fractions.begin(), many.fractions.end()));
    EXPECT_EQ(many.fractions.back(), 1.0);
    EXPECT_GT(many.fractions.front(), 1.0 / 200); // the first index is never above the initial highest one
    MultiThreadedPool(2, &empty).parallel({5, 5}, [](auto...) { FAIL(); });
    EXPECT_EQ(empty.fractions, std::vector{1.0});
    MultiThreadedPool(1, &one).parallel({0, 4}, [](auto...) {});
    EXPECT_EQ(one.fractions, (std::vector{0.5, 0.75, 1.0, 1.0}));

    recorder single, nothing;
    SingleThreadedPool(&single).parallel({4, 8}, [](auto...) {});
    EXPECT_EQ(single.fractions, (std::vector{0.25, 0.5, 0.75, 1.0}));
    SingleThreadedPool(&nothing).parallel({4, 4}, [](auto...) {});
    EXPECT_TRUE(nothing.fractions.empty());
}

TEST(ThreadPool, StopsWhenTheObserverSaysSo)
{
    for (const double from : {0.0, 0.25}) {
        std::atomic<int> rows{0};
        const auto count = [&](auto...) { ++rows; };
        recorder single(from), one(from), three(from);
        SingleThreadedPool(&single).parallel({0, 100}, count);
        EXPECT_EQ(rows, from > 0 ? 25 : 1); // asked after each index only
        rows = 0;
        MultiThreadedPool(1, &one).parallel({0, 100}, count);
        EXPECT_EQ(rows, from > 0 ? 25 : 1);
        rows = 0;
        MultiThreadedPool(3, &three).parallel({0, 100}, count);
        EXPECT_LT(rows, 100);
        EXPECT_TRUE(std::count(three.fractions.begin(), three.fractions.end(), 1.0) == 0);
    }
}

TEST(ThreadPool, StopsTheOthersAfterAFailureWhenObserved)
{
    struct failing final : ThreadObserver {
        bool IsStopped() override { return false; }
        void Progress(double) override { throw std::logic_error("observer"); }
    } broken;
    recorder watcher;
    std::atomic<int> rows{0};
    MultiThreadedPool pool(1, &watcher), observed(2, &broken);
    EXPECT_THROW(pool.parallel({0, 100},
                               [&](int32_t i, const ThreadInformation&) {
                                   ++rows;
                                   if (i == 9) throw std::bad_alloc();
                               }),
                 std::bad_alloc);
    EXPECT_EQ(rows, 10);
    EXPECT_EQ(watcher.fractions.back(), 0.09); // and no closing 1.0
    EXPECT_THROW(observed.parallel({0, 100}, [](auto...) {}), std::logic_error);
    EXPECT_THROW(observed.parallel({3, 3}, [](auto...) {}), std::logic_error);
    EXPECT_THROW(observed.parallel({3, 3}, [](auto...) {}), std::logic_error); // the job mutex was given back
}

TEST(RunParallel, RefersToTheBodyAndCopiesNothing)
{
    struct counted {
        int* copies;
        explicit counted(int* c) : copies(c) {}
        counted(const counted& other) : copies(other.copies) { ++*copies; }
        void operator()(int32_t, const ThreadInformation&) const {}
    };
    int copies = 0;
    const counted body(&copies);
    MultiThreadedPool pool(2);
    run_parallel(&pool, {0, 10}, body);
    run_parallel(nullptr, {0, 10}, body);
    EXPECT_EQ(copies, 0);
}

} // namespace
