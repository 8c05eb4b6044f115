#include "zelt/com/variant.h"

#include "com/variant_parts.h"

#include <cstring>
#include <new>

namespace Qor {

void VariantInit(VARIANT* v) noexcept
{
    if (v) *v = empty_variant();
}

HRESULT VariantClear(VARIANT* v) noexcept
{
    if (!v) return E_INVALIDARG;
    if (!is_known_type(v->vt)) return DISP_E_BADVARTYPE;
    // Empty first: an object that goes away may look at its place again.
    const VARIANT old = std::exchange(*v, empty_variant());
    if (SAFEARRAY* array = held_array(old)) {
        const HRESULT hr = SafeArrayDestroy(array);
        if (failed(hr)) *v = old;
        return hr;
    }
    if (old.vt == VT_BSTR)
        SysFreeString(old.bstrVal);
    else if (old.vt == VT_UNKNOWN)
        com_ptr<IUnknown>::attach(old.punkVal) = nullptr;
    else if (old.vt == VT_DISPATCH)
        com_ptr<IDispatch>::attach(old.pdispVal) = nullptr;
    return S_OK;
}

HRESULT copy_value(const VARIANT& source, VARIANT* target) noexcept
{
    *target = empty_variant();
    if (!is_known_type(source.vt)) return DISP_E_BADVARTYPE;
    VARIANT copy = source;
    HRESULT hr = S_OK;
    if (SAFEARRAY* array = held_array(source))
        hr = SafeArrayCopy(array, &copy.parray);
    else if (source.vt == VT_BSTR)
        hr = copy_text(source.bstrVal, &copy.bstrVal);
    else if (source.vt == VT_UNKNOWN)
        copy.punkVal = com_ptr(source.punkVal).detach();
    else if (source.vt == VT_DISPATCH)
        copy.pdispVal = com_ptr(source.pdispVal).detach();
    if (succeeded(hr)) *target = copy;
    return hr;
}

HRESULT replace_value(VARIANT* target, const VARIANT& value) noexcept
{
    const HRESULT hr = VariantClear(target);
    if (succeeded(hr)) {
        *target = value;
    } else {
        VARIANT unwanted = value;
        VariantClear(&unwanted);
    }
    return hr;
}

HRESULT follow_reference(const VARIANT& source, VARIANT* borrowed) noexcept
{
    *borrowed = source;
    if (!is_known_type(source.vt)) return DISP_E_BADVARTYPE;
    if (!(source.vt & VT_BYREF)) return S_OK;
    if (!source.byref) return E_INVALIDARG;
    if (source.vt == (VT_BYREF | VT_VARIANT)) {
        const VARIANT inner = *static_cast<const VARIANT*>(source.byref);
        if (inner.vt == (VT_BYREF | VT_VARIANT)) return E_INVALIDARG;
        return follow_reference(inner, borrowed);
    }
    *borrowed = empty_variant();
    borrowed->vt = static_cast<VARTYPE>(source.vt & ~VT_BYREF);
    // Every member of the union begins at the same address.
    std::memcpy(&borrowed->llVal, source.byref,
                borrowed->vt & VT_ARRAY ? sizeof(SAFEARRAY*) : size_of_type(borrowed->vt));
    return S_OK;
}

namespace {

// The copy is made before the target is cleared: the source may be part of what the target holds.
HRESULT copy_into(VARIANT* target, const VARIANT& source) noexcept
{
    VARIANT copy;
    const HRESULT copied = copy_value(source, &copy);
    const HRESULT replaced = replace_value(target, copy);
    return failed(replaced) ? replaced : copied;
}

} // namespace

HRESULT VariantCopy(VARIANT* target, const VARIANT* source) noexcept
{
    if (!target || !source) return E_INVALIDARG;
    if (target == source) return is_known_type(source->vt) ? S_OK : DISP_E_BADVARTYPE;
    return copy_into(target, *source);
}

HRESULT VariantCopyInd(VARIANT* target, const VARIANT* source) noexcept
{
    if (!target || !source) return E_INVALIDARG;
    if (target == source && !(source->vt & VT_BYREF)) return VariantCopy(target, source);
    VARIANT borrowed;
    const HRESULT hr = follow_reference(*source, &borrowed);
    if (succeeded(hr)) return copy_into(target, borrowed);
    const HRESULT cleared = VariantClear(target);
    return failed(cleared) ? cleared : hr;
}

variant::variant(const wchar_t* text) : variant()
{
    v_.bstrVal = SysAllocString(text);
    if (text && !v_.bstrVal) throw std::bad_alloc();
    v_.vt = VT_BSTR;
}

variant::variant(const variant& other) : variant()
{
    if (failed(copy_value(other.v_, &v_))) throw std::bad_alloc();
}

} // namespace Qor
