// What the files behind VARIANT and SAFEARRAY share.
#pragma once

#include "zelt/com/safe_array.h"

namespace Qor {

/// Bytes of a value of the type, flags aside; 0 for VT_EMPTY, VT_NULL and unknown types.
constexpr uint32_t size_of_type(VARTYPE type) noexcept
{
    switch (type) {
    case VT_I1:
    case VT_UI1: return 1;
    case VT_I2:
    case VT_UI2:
    case VT_BOOL: return 2;
    case VT_I4:
    case VT_UI4:
    case VT_INT:
    case VT_UINT:
    case VT_R4:
    case VT_ERROR: return 4;
    case VT_I8:
    case VT_UI8:
    case VT_R8: return 8;
    case VT_BSTR:
    case VT_UNKNOWN:
    case VT_DISPATCH: return sizeof(void*);
    case VT_VARIANT: return sizeof(VARIANT);
    default: return 0;
    }
}

/// Whether a VARIANT may be of that type.
constexpr bool is_known_type(VARTYPE type) noexcept
{
    const auto base = static_cast<VARTYPE>(type & VT_TYPEMASK);
    const int flags = type & ~VT_TYPEMASK;
    if (flags & ~(VT_ARRAY | VT_BYREF)) return false;
    if (flags) return size_of_type(base) > 0;
    return base == VT_EMPTY || base == VT_NULL || (base != VT_VARIANT && size_of_type(base) > 0);
}

/// The array that the value holds; null for anything else.
inline SAFEARRAY* held_array(const VARIANT& v) noexcept
{
    return (v.vt & VT_ARRAY) && !(v.vt & VT_BYREF) && is_known_type(v.vt) ? v.parray : nullptr;
}

/// A null string copies to a null string.
inline HRESULT copy_text(BSTR source, BSTR* target) noexcept
{
    *target = source ? SysAllocStringLen(source, SysStringLen(source)) : nullptr;
    return source && !*target ? E_OUTOFMEMORY : S_OK;
}

/// The value behind VT_BYREF, borrowed; any other value as it is. E_INVALIDARG for a null reference and for a
/// reference to a variant that is one itself, DISP_E_BADVARTYPE for unknown types.
HRESULT follow_reference(const VARIANT& source, VARIANT* borrowed) noexcept;

/// A deep copy of a value of a known type into a target that owns nothing; empty after a failure.
HRESULT copy_value(const VARIANT& source, VARIANT* target) noexcept;

/// Puts a value into the place of the target's, which is cleared. When that fails the value is freed instead.
HRESULT replace_value(VARIANT* target, const VARIANT& value) noexcept;

} // namespace Qor
