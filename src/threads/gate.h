#pragma once

#include <condition_variable>
#include <mutex>

namespace Qor::Luxar::Thread::Internal {

/// A gate before which a known number of workers gathers. One other thread waits for them to be complete, and
/// opens and closes the gate; it stays open until it is closed, so nobody who has arrived can be left behind.
/// A failing mutex or condition variable ends the process: a worker in the middle of a gate has no way back.
class gate {
public:
    /// Closed, nobody there, so many expected.
    void reset(int expected) noexcept;
    /// Closed, nobody there.
    void close() noexcept;
    void open() noexcept;
    /// For a worker: be counted, then wait until the gate is open.
    void arrive_and_pass() noexcept;
    void await_all() noexcept;

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    int arrived_ = 0;
    int expected_ = 0;
    bool open_ = false;
};

} // namespace Qor::Luxar::Thread::Internal
