#include "zelt/com/error_info.h"

#include "com/implements.h"

#include <new>

namespace Qor {

namespace {

class error_object final : public implements<ICreateErrorInfo, IErrorInfo> {
public:
    HRESULT SetGUID(const GUID& id) noexcept override
    {
        id_ = id;
        return S_OK;
    }
    HRESULT SetSource(const OLECHAR* text) noexcept override { return set(source_, text); }
    HRESULT SetDescription(const OLECHAR* text) noexcept override { return set(description_, text); }
    HRESULT SetHelpFile(const OLECHAR* text) noexcept override { return set(help_file_, text); }
    HRESULT SetHelpContext(uint32_t context) noexcept override
    {
        help_context_ = context;
        return S_OK;
    }

    HRESULT GetGUID(GUID* id) noexcept override { return give(id, id_); }
    HRESULT GetSource(BSTR* text) noexcept override { return give(text, source_); }
    HRESULT GetDescription(BSTR* text) noexcept override { return give(text, description_); }
    HRESULT GetHelpFile(BSTR* text) noexcept override { return give(text, help_file_); }
    HRESULT GetHelpContext(uint32_t* context) noexcept override { return give(context, help_context_); }

private:
    static HRESULT set(bstr& field, const OLECHAR* text) noexcept
    {
        if (!text) return E_POINTER;
        bstr copy = bstr::attach(SysAllocString(text));
        if (!copy.get()) return E_OUTOFMEMORY;
        field = std::move(copy);
        return S_OK;
    }
    template <class T>
    static HRESULT give(T* out, const T& field) noexcept
    {
        if (!out) return E_POINTER;
        *out = field;
        return S_OK;
    }
    static HRESULT give(BSTR* out, const bstr& field) noexcept
    {
        if (!out) return E_POINTER;
        *out = field.get() ? SysAllocStringLen(field.get(), SysStringLen(field.get())) : nullptr;
        return field.get() && !*out ? E_OUTOFMEMORY : S_OK;
    }

    GUID id_{};
    bstr source_;
    bstr description_;
    bstr help_file_;
    uint32_t help_context_ = 0;
};

thread_local com_ptr<IErrorInfo> current;

} // namespace

HRESULT CreateErrorInfo(ICreateErrorInfo** out) noexcept
{
    if (!out) return E_POINTER;
    *out = new (std::nothrow) error_object;
    return *out ? S_OK : E_OUTOFMEMORY;
}

HRESULT SetErrorInfo(uint32_t reserved, IErrorInfo* info) noexcept
{
    if (reserved != 0) return E_INVALIDARG;
    current = com_ptr(info);
    return S_OK;
}

HRESULT GetErrorInfo(uint32_t reserved, IErrorInfo** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    if (reserved != 0) return E_INVALIDARG;
    *out = current.detach();
    return *out ? S_OK : S_FALSE;
}

} // namespace Qor
