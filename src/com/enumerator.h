// IEnumVARIANT over a list of values, for collections that scripts walk through.
#pragma once

#include "com/implements.h"

#include <memory>
#include <vector>

namespace Qor {

/// The values are shared by an enumerator and its clones and never change.
class variant_enumerator final : public implements<IEnumVARIANT> {
public:
    explicit variant_enumerator(std::shared_ptr<const std::vector<variant>> values, size_t next = 0) noexcept
        : values_(std::move(values)), next_(next)
    {
    }

    /// S_FALSE when fewer than `count` are left. `fetched` may be null only for a count of 1.
    HRESULT Next(ULONG count, VARIANT* items, ULONG* fetched) noexcept override
    {
        if (!items || (!fetched && count != 1)) return E_POINTER;
        ULONG n = 0;
        HRESULT hr = S_OK;
        for (; n < count && next_ < values_->size() && succeeded(hr); ++n, ++next_) {
            items[n] = empty_variant();
            hr = VariantCopy(&items[n], (*values_)[next_].get());
        }
        if (failed(hr)) { // nothing is handed out, and the place is kept
            for (; n > 0; --n, --next_) VariantClear(&items[n - 1]);
            return hr;
        }
        if (fetched) *fetched = n;
        return n == count ? S_OK : S_FALSE;
    }
    HRESULT Skip(ULONG count) noexcept override
    {
        const size_t left = values_->size() - next_;
        next_ += count < left ? count : left;
        return count <= left ? S_OK : S_FALSE;
    }
    HRESULT Reset() noexcept override
    {
        next_ = 0;
        return S_OK;
    }
    HRESULT Clone(IEnumVARIANT** out) noexcept override
    {
        if (!out) return E_POINTER;
        *out = try_make<variant_enumerator>(values_, next_).detach();
        return *out ? S_OK : E_OUTOFMEMORY;
    }

private:
    std::shared_ptr<const std::vector<variant>> values_;
    size_t next_;
};

} // namespace Qor
