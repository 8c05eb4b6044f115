// A process that forks copies its mutexes as they are: one that another thread holds would stay locked in the child for
// ever. A mutex of the process is therefore held by the forking thread itself during a fork.
#pragma once

#include <mutex>
#include <pthread.h>

namespace Qor {

/// For a static object beside a static mutex. Code that holds one such mutex must not wait for another. `in_child` runs
/// in the child while the mutex is held; it may only do what is allowed between fork and exec.
template <std::mutex& Mutex, void (*in_child)() noexcept = nullptr>
class held_over_fork {
public:
    held_over_fork() noexcept // without memory for the handlers the mutex is as any other
    {
        pthread_atfork([] { Mutex.lock(); }, [] { Mutex.unlock(); },
                       [] {
                           if constexpr (in_child != nullptr) in_child();
                           Mutex.unlock();
                       });
    }
};

} // namespace Qor
