// Keyed values of one image.
#pragma once

#include "zelt/com/variant.h"

#include <atomic>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace Qor::Luxar {

/// Keys are compared exactly, case included. Any thread may call; values are freed outside the lock, since that
/// may call foreign objects.
class statistics_store {
public:
    HRESULT set(BSTR key, const VARIANT* value) noexcept;
    /// S_FALSE and an empty value for a key that is not there.
    HRESULT get(BSTR key, VARIANT* value) const noexcept;
    /// Forgets all keys. Costs nothing when there are none.
    void drop() noexcept;

private:
    // An image has a dozen keys or two, often written all at once: the texts stand behind one another, so that a key
    // needs no memory of its own, and a search goes through all of them.
    struct entry {
        size_t key_begin;
        size_t key_length;
        variant value;
    };
    const entry* find(std::wstring_view key) const noexcept;

    std::atomic<bool> any_{false};
    mutable std::mutex mutex_;
    std::wstring keys_;
    std::vector<entry> entries_;
};

} // namespace Qor::Luxar
