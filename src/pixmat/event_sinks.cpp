#include "pixmat/event_sinks.h"

#include <algorithm>

namespace Qor::Luxar {

std::vector<event_sinks::entry>::iterator event_sinks::find(IUnknown* identity) noexcept
{
    return std::find_if(entries_.begin(), entries_.end(),
                        [=](const entry& e) { return e.identity.get() == identity; });
}

HRESULT event_sinks::add(IPixmatEvents* sink, PixmatEventMode mode) noexcept
{
    if (!sink || mode != PixmatEventMode_AfterCommit) return E_INVALIDARG;
    entry candidate{0, com_ptr(sink), query<IUnknown>(sink)};
    try {
        const std::lock_guard lock(mutex_);
        if (find(candidate.identity.get()) != entries_.end()) return E_INVALIDARG;
        candidate.number = next_number_;
        entries_.push_back(std::move(candidate));
        ++next_number_;
        any_.store(true, std::memory_order_release);
        return S_OK;
    } catch (...) {
        return E_OUTOFMEMORY;
    }
}

HRESULT event_sinks::remove(IPixmatEvents* sink) noexcept
{
    const auto identity = query<IUnknown>(sink);
    if (!identity) return E_INVALIDARG;
    entry gone; // freed after the lock
    const std::lock_guard lock(mutex_);
    const auto place = find(identity.get());
    if (place == entries_.end()) return E_INVALIDARG;
    gone = std::move(*place);
    entries_.erase(place);
    any_.store(!entries_.empty(), std::memory_order_release);
    return S_OK;
}

com_ptr<IPixmatEvents> event_sinks::next(uint64_t& number, uint64_t end) noexcept
{
    const std::lock_guard lock(mutex_);
    for (const entry& e : entries_)
        if (e.number > number && e.number < end) {
            number = e.number;
            return e.sink;
        }
    return nullptr;
}

void event_sinks::notify(IPixmat2* image, const rectangle* changed) noexcept
{
    if (empty()) return;
    uint64_t end = 0;
    {
        const std::lock_guard lock(mutex_);
        end = next_number_;
    }
    uint64_t number = 0;
    while (const auto sink = next(number, end)) sink->OnPixmatChanged(image, changed);
}

} // namespace Qor::Luxar
