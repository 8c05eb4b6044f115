// The request to cancel, and the protocol of the operations that honour it.
#include "threads/multi_threaded_pool.h"
#include "threads/run_parallel.h"

#include <gtest/gtest.h>
#include <string>
#include <thread>

using namespace Qor::Luxar;

namespace {

TEST(Cancellation, StandsUntilItIsThrownOnce)
{
    EXPECT_FALSE(ZELT::IsCancelled());
    EXPECT_NO_THROW(ZELT::ThrowIfCancelled());
    ZELT::RequestCancel();
    ZELT::RequestCancel();
    EXPECT_TRUE(ZELT::IsCancelled());
    EXPECT_TRUE(ZELT::IsCancelled());
    try {
        ZELT::ThrowIfCancelled();
        FAIL();
    } catch (const std::runtime_error& e) {
        EXPECT_STREQ(e.what(), "ZELT call was cancelled");
    }
    EXPECT_FALSE(ZELT::IsCancelled());
    EXPECT_NO_THROW(ZELT::ThrowIfCancelled());
}

TEST(Cancellation, StopsTheNextCancellableLoopBeforeItsFirstRowAndNoOther)
{
    Thread::MultiThreadedPool two(2);
    for (Thread::ThreadPool* pool : {static_cast<Thread::ThreadPool*>(&two), (Thread::ThreadPool*)nullptr}) {
        std::atomic<int> rows{0};
        const auto count = [&](auto...) { ++rows; };
        ZELT::RequestCancel();
        Thread::run_parallel(pool, {0, 10}, count);
        EXPECT_EQ(rows, 10);
        EXPECT_THROW(Thread::run_cancellable(pool, {0, 10}, count), ZELT::Cancelled);
        EXPECT_EQ(rows, 10);
        Thread::run_cancellable(pool, {0, 10}, count);
        EXPECT_EQ(rows, 20);
    }
}

TEST(Cancellation, FinishesTheRowThatHasBegun)
{
    int begun = 0, finished = 0;
    EXPECT_THROW(Thread::run_cancellable(nullptr, {0, 10},
                                         [&](int32_t i, const auto&) {
                                             ++begun;
                                             if (i == 4) std::thread(ZELT::RequestCancel).join();
                                             ++finished;
                                         }),
                 ZELT::Cancelled);
    EXPECT_EQ(begun, 5);
    EXPECT_EQ(finished, 5);
}

TEST(Cancellation, FailsALoopWhoseRequestAnotherOneTook)
{
    struct taker final
        : Thread::ThreadObserver { // plays the other operation, between the last row and the end
        bool IsStopped() override { return false; }
        void Progress(double fraction) override
        {
            if (fraction == 1.0) {
                EXPECT_THROW(ZELT::ThrowIfCancelled(), ZELT::Cancelled);
            }
        }
    } other;
    Thread::SingleThreadedPool pool(&other);
    EXPECT_THROW(Thread::run_cancellable(&pool, {0, 10},
                                         [](int32_t i, const auto&) {
                                             if (i == 4) ZELT::RequestCancel();
                                         }),
                 ZELT::Cancelled);
    EXPECT_FALSE(ZELT::IsCancelled());
}

} // namespace
