// Keyed values of one image.
#pragma once

#include "zelt/com/variant.h"

#include <atomic>
#include <mutex>
#include <string>
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
    struct entry {
        std::wstring key;
        variant value;
    };

    std::atomic<bool> any_{false};
    mutable std::mutex mutex_;
    std::vector<entry> entries_; // sorted by key
};

} // namespace Qor::Luxar
