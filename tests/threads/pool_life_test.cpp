// Start, end and fork of the multi-threaded pool, and what happens when threads or memory run out.
#include "support/failing_new.h"
#include "threads/multi_threaded_pool.h"

#include <atomic>
#include <chrono>
#include <fstream>
#include <gtest/gtest.h>
#include <memory>
#include <new>
#include <string>
#include <sys/resource.h>
#include <sys/wait.h>
#include <system_error>
#include <thread>
#include <unistd.h>

using namespace Qor::Luxar::Thread;
using Qor::Luxar::ZELT::Test::with_failing_allocation;

namespace {

int threads_of_this_process()
{
    std::ifstream status("/proc/self/status");
    for (std::string line; std::getline(status, line);)
        if (line.rfind("Threads:", 0) == 0) return std::stoi(line.substr(8));
    return -1;
}

/// A joined thread stays in the system's count for a moment longer.
bool soon_has_threads(int expected)
{
    for (int i = 0; i < 5000; ++i, std::this_thread::sleep_for(std::chrono::milliseconds(1)))
        if (threads_of_this_process() == expected) return true;
    return false;
}

/// All rows of one job ran.
bool works(ThreadPool& pool)
{
    std::atomic<int> sum{0};
    pool.parallel({0, 10}, [&](int32_t i, const ThreadInformation&) { sum += i; });
    return sum == 45;
}

/// Exit status of a child that runs the check; -1 when it had to be killed after ten seconds.
template <class Check>
int in_a_child(Check&& check)
{
    const pid_t child = fork();
    if (child == 0) {
        alarm(10);
        _exit(check() ? 0 : 1);
    }
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

TEST(PoolLife, StartsItsWorkersWithTheFirstJobAndEndsThemWithThePool)
{
    const int before = threads_of_this_process();
    {
        MultiThreadedPool pool(3);
        EXPECT_TRUE(soon_has_threads(before));
        for (int job = 0; job < 3; ++job) {
            EXPECT_TRUE(works(pool));
            EXPECT_TRUE(soon_has_threads(before + 3));
        }
    }
    EXPECT_TRUE(soon_has_threads(before));
}

TEST(PoolLife, SurvivesManyShortLives)
{
    for (int i = 0; i < 300; ++i) {
        MultiThreadedPool used(1 + i % 4), unused(4);
        EXPECT_TRUE(works(used));
    }
}

TEST(PoolLife, EndsTheWorkersOfAStartThatFailsAtAnyAllocation)
{
    const int before = threads_of_this_process();
    for (int n = 1;; ++n) {
        MultiThreadedPool pool(4);
        std::atomic<int> rows{0};
        const parallel_body body = [&](int32_t, const ThreadInformation&) { ++rows; };
        const bool started = with_failing_allocation(n, [&] {
            try {
                pool.parallel({0, 10}, body);
            } catch (const std::bad_alloc&) {
                return false;
            }
            return true;
        });
        EXPECT_EQ(rows, started ? 10 : 0);
        if (started) {
            EXPECT_GT(n, 1 + 4 + 4); // the list, and for each worker a thread and an entry in the table
            break;
        }
        EXPECT_TRUE(soon_has_threads(before)) << n;
        EXPECT_EQ(pool.GetCurrentWorker(), -1);
        EXPECT_TRUE(works(pool)) << n; // the next call starts afresh
    }
}

// The sanitizers need the address space for themselves.
#if !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__)
TEST(PoolLife, PassesOnThatTheSystemHasNoMoreThreads)
{
    const auto fails_as_told = [] {
        const rlimit little{rlim_t{1} << 30, rlim_t{1} << 30}; // stacks are 8 MB each
        setrlimit(RLIMIT_AS, &little);
        MultiThreadedPool greedy(1000), modest(2);
        try {
            greedy.parallel({0, 10}, [](auto...) {});
        } catch (const std::system_error& e) {
            return e.code() == std::errc::resource_unavailable_try_again && soon_has_threads(1) &&
                   works(modest);
        }
        return false;
    };
    EXPECT_EQ(in_a_child(fails_as_told), 0);
}
#endif

#if !defined(__SANITIZE_THREAD__) // which refuses threads in a child of a process with threads
TEST(PoolLife, WorksAfterAForkWhateverThePoolWasDoing)
{
    const auto check = [](MultiThreadedPool& pool) {
        const bool first = pool.GetCurrentWorker() == -1 && pool.GetThreadCount() == 2 && works(pool);
        return first && works(pool) && soon_has_threads(3);
    };
    auto pool = std::make_unique<MultiThreadedPool>(2);
    const auto works_and_ends = [&] {
        const bool good = check(*pool);
        pool.reset();
        return good && soon_has_threads(1);
    };
    EXPECT_EQ(in_a_child(works_and_ends), 0) << "not started";
    EXPECT_TRUE(works(*pool));
    EXPECT_EQ(in_a_child(works_and_ends), 0) << "workers parked";
    EXPECT_EQ(in_a_child([&] { return pool.reset(), true; }), 0) << "destroyed unused";
    EXPECT_EQ(in_a_child([&] { return check(*pool) && in_a_child(works_and_ends) == 0; }), 0) << "grandchild";

    std::atomic<bool> running{false}, end{false};
    std::thread caller([&] {
        pool->parallel({0, 1}, [&](auto...) {
            running = true;
            while (!end) std::this_thread::yield();
        });
    });
    while (!running) std::this_thread::yield();
    EXPECT_EQ(in_a_child(works_and_ends), 0) << "job mutex held";
    end = true;
    caller.join();

    int from_body = -2;
    pool->parallel({0, 1}, [&](auto...) { from_body = in_a_child([&] { return check(*pool); }); });
    EXPECT_EQ(from_body, 0) << "forked by a worker";
    EXPECT_TRUE(works(*pool)) << "the parent goes on";
}
#endif

} // namespace
