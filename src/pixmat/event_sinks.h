// Who listens to one image.
#pragma once

#include "zelt/pixmat/pixmat.h"

#include <atomic>
#include <mutex>
#include <vector>

namespace Qor::Luxar {

/// Any thread may call. Sinks may come and go while a notification runs: one that has gone is not called any more,
/// one that has come waits for the next.
class event_sinks {
public:
    HRESULT add(IPixmatEvents* sink, PixmatEventMode mode) noexcept;
    HRESULT remove(IPixmatEvents* sink) noexcept;
    /// Calls each sink in the order of their coming; no lock is held meanwhile.
    void notify(IPixmat2* image, const rectangle* changed) noexcept;
    bool empty() const noexcept { return !any_.load(std::memory_order_acquire); }

private:
    struct entry {
        uint64_t number;
        com_ptr<IPixmatEvents> sink;
        com_ptr<IUnknown> identity;
    };
    std::vector<entry>::iterator find(IUnknown* identity) noexcept;
    com_ptr<IPixmatEvents> next(uint64_t& number, uint64_t end) noexcept;

    std::atomic<bool> any_{false};
    std::mutex mutex_;
    std::vector<entry> entries_; // by rising number
    uint64_t next_number_ = 1;
};

} // namespace Qor::Luxar
