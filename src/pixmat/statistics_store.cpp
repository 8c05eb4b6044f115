#include "pixmat/statistics_store.h"

#include <algorithm>
#include <string_view>

namespace Qor::Luxar {
namespace {

std::wstring_view text_of(BSTR key) noexcept { return {key, SysStringLen(key)}; }

template <class Entries>
auto place_of(Entries& entries, std::wstring_view key) noexcept
{
    return std::lower_bound(entries.begin(), entries.end(), key,
                            [](const auto& e, std::wstring_view k) { return e.key < k; });
}

} // namespace

HRESULT statistics_store::set(BSTR key, const VARIANT* value) noexcept
{
    if (!key || !value) return E_POINTER;
    variant held;
    if (const HRESULT hr = VariantCopyInd(held.put(), value); failed(hr)) return hr;
    try {
        const std::lock_guard lock(mutex_);
        const std::wstring_view text = text_of(key);
        const auto place = place_of(entries_, text);
        if (place != entries_.end() && place->key == text)
            std::swap(place->value, held);
        else
            entries_.insert(place, entry{std::wstring(text), std::move(held)});
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
    const std::wstring_view text = text_of(key);
    const auto place = place_of(entries_, text);
    if (place == entries_.end() || place->key != text) return S_FALSE;
    return VariantCopy(value, place->value.get());
}

void statistics_store::drop() noexcept
{
    if (!any_.load(std::memory_order_acquire)) return;
    std::vector<entry> old;
    {
        const std::lock_guard lock(mutex_);
        old.swap(entries_);
        any_.store(false, std::memory_order_release);
    }
}

} // namespace Qor::Luxar
