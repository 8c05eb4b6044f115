// A fork while other threads are inside the library: the child can use all of it.
#include "frame/exception_translator.h"
#include "pixel/buffer_pool.h"
#include "zelt/com/class_registry.h"
#include "zelt/zelt.h"

#include <gtest/gtest.h>

#include <atomic>
#include <stdexcept>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

namespace {

using namespace zelt;

constexpr int megabyte = 1 << 20;

void use_the_pool()
{
    const auto block = Qor::Luxar::take_block(4 * megabyte);
    block.base[0] = 1;
    Qor::Luxar::give_block(block.base, block.bytes);
}

void fail()
{
    try {
        throw std::runtime_error("told");
    } catch (...) {
        TranslateCurrentException();
    }
}

void look_up_a_class()
{
    GUID id;
    CLSIDFromProgID(L"ZELT.Main2", &id);
}

/// The status of a child that works; one that hangs is ended by its alarm.
int status_of_child(void (*work)())
{
    const pid_t child = fork();
    if (child == 0) {
        alarm(20);
        work();
        _exit(0);
    }
    int status = -1;
    waitpid(child, &status, 0);
    return status;
}

TEST(Fork, FindsNoMutexHeldByAThreadOfTheParent)
{
#ifdef __SANITIZE_ADDRESS__ // release builds and the thread sanitizer do run it
    GTEST_SKIP() << "the address sanitizer's allocator may stay locked in the child";
#endif
    for (void (*work)() : {use_the_pool, fail, look_up_a_class}) {
        std::atomic<bool> stop{false};
        std::thread others[] = {std::thread([&] {
                                    while (!stop) work();
                                }),
                                std::thread([&] {
                                    while (!stop) work();
                                })};
        int hung = 0;
        for (int i = 0; i < 60 && hung == 0; ++i) hung = status_of_child(work);
        stop = true;
        for (std::thread& t : others) t.join();
        EXPECT_EQ(hung, 0);
    }
}

TEST(Fork, StartsWithAnEmptyPoolAndLeavesThatOfTheParent)
{
    use_the_pool();
    const size_t before = Qor::Luxar::pooled_bytes();
    ASSERT_GT(before, 0u);
    EXPECT_EQ(status_of_child([] {
                  if (Qor::Luxar::pooled_bytes() != 0) _exit(1);
                  use_the_pool();
                  if (Qor::Luxar::pooled_bytes() == 0) _exit(2);
              }),
              0);
    EXPECT_EQ(Qor::Luxar::pooled_bytes(), before);
    const auto block = Qor::Luxar::take_block(4 * megabyte);
    EXPECT_TRUE(block.recycled);
    block.base[4 * megabyte - 1] = 1;
    Qor::Luxar::give_block(block.base, block.bytes);
}

} // namespace
