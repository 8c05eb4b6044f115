#include "threads/gate.h"

namespace Qor::Luxar::Thread::Internal {

void gate::reset(int expected) noexcept
{
    const std::lock_guard lock(mutex_);
    expected_ = expected;
    arrived_ = 0;
    open_ = false;
}

void gate::close() noexcept
{
    const std::lock_guard lock(mutex_);
    arrived_ = 0;
    open_ = false;
}

void gate::open() noexcept
{
    const std::lock_guard lock(mutex_);
    open_ = true;
    changed_.notify_all();
}

void gate::arrive_and_pass() noexcept
{
    std::unique_lock lock(mutex_);
    ++arrived_;
    changed_.notify_all();
    changed_.wait(lock, [this] { return open_; });
}

void gate::await_all() noexcept
{
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [this] { return arrived_ == expected_; });
}

} // namespace Qor::Luxar::Thread::Internal
