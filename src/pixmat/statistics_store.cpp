#include "pixmat/statistics_store.h"

#include <algorithm>
#include <string_view>

namespace Qor::Luxar {
namespace {

// What the scalar statistics of an image come to.
constexpr size_t usual_keys = 16, usual_length = 16;

std::wstring_view text_of(BSTR key) noexcept { return {key, SysStringLen(key)}; }

/// From the end: keys of one family begin alike.
bool same(std::wstring_view a, std::wstring_view b) noexcept
{
    return std::equal(a.rbegin(), a.rend(), b.rbegin(), b.rend());
}

} // namespace

const statistics_store::entry* statistics_store::find(std::wstring_view key) const noexcept
{
    const std::wstring_view keys = keys_;
    for (const entry& e : entries_)
        if (same(keys.substr(e.key_begin, e.key_length), key)) return &e;
    return nullptr;
}

HRESULT statistics_store::set(BSTR key, const VARIANT* value) noexcept
{
    if (!key || !value) return E_POINTER;
    variant held;
    if (const HRESULT hr = VariantCopyInd(held.put(), value); failed(hr)) return hr;
    try {
        const std::lock_guard lock(mutex_);
        const std::wstring_view text = text_of(key);
        if (const entry* known = find(text)) {
            std::swap(entries_[static_cast<size_t>(known - entries_.data())].value, held);
        } else {
            if (entries_.empty()) {
                entries_.reserve(usual_keys);
                keys_.reserve(usual_keys * usual_length);
            }
            const size_t begin =
                entries_.empty() ? 0 : entries_.back().key_begin + entries_.back().key_length;
            keys_.replace(begin, keys_.npos, text); // of a key that found no memory for its entry, too
            entries_.push_back({begin, text.size(), std::move(held)});
        }
        any_.store(true, std::memory_order_release);
        return S_OK;
    } catch (...) {
        return E_OUTOFMEMORY;
    }
}

HRESULT statistics_store::get(BSTR key, VARIANT* value) const noexcept
{
    if (!value) return E_POINTER;
    *value = empty_variant();
    if (!key) return E_POINTER;
    if (!any_.load(std::memory_order_acquire)) return S_FALSE;
    const std::lock_guard lock(mutex_);
    const entry* known = find(text_of(key));
    return known ? VariantCopy(value, known->value.get()) : S_FALSE;
}

void statistics_store::drop() noexcept
{
    if (!any_.load(std::memory_order_acquire)) return;
    std::vector<entry> old;
    {
        const std::lock_guard lock(mutex_);
        old.swap(entries_);
        keys_.clear();
        any_.store(false, std::memory_order_release);
    }
}

} // namespace Qor::Luxar
