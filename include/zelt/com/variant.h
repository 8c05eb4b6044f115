// VARIANT, its functions, and `variant`, which owns one.
#pragma once

#include "zelt/com/bstr.h"
#include "zelt/com/dispatch.h"

namespace Qor {

struct SAFEARRAY;

enum : VARTYPE {
    VT_EMPTY = 0,
    VT_NULL = 1,
    VT_I2 = 2,
    VT_I4 = 3,
    VT_R4 = 4,
    VT_R8 = 5,
    VT_BSTR = 8,
    VT_DISPATCH = 9,
    VT_ERROR = 10,
    VT_BOOL = 11,
    VT_VARIANT = 12,
    VT_UNKNOWN = 13,
    VT_I1 = 16,
    VT_UI1 = 17,
    VT_UI2 = 18,
    VT_UI4 = 19,
    VT_I8 = 20,
    VT_UI8 = 21,
    VT_INT = 22,
    VT_UINT = 23,
    VT_ARRAY = 0x2000,
    VT_BYREF = 0x4000,
    VT_TYPEMASK = 0x0fff,
};

/// A value with its type. With VT_BYREF, `byref` points to a value of the type; with VT_ARRAY, `parray` is
/// held.
struct VARIANT {
    VARTYPE vt;
    uint16_t reserved[3];
    union {
        int64_t llVal;
        uint64_t ullVal;
        int32_t lVal;
        uint32_t ulVal;
        int32_t intVal;
        uint32_t uintVal;
        int16_t iVal;
        uint16_t uiVal;
        int8_t cVal;
        uint8_t bVal;
        float fltVal;
        double dblVal;
        VARIANT_BOOL boolVal;
        HRESULT scode;
        BSTR bstrVal;
        IUnknown* punkVal;
        IDispatch* pdispVal;
        SAFEARRAY* parray;
        void* byref;
    };
};

ZELT_API void VariantInit(VARIANT* v) noexcept;
/// Frees what the value owns and makes it empty. E_INVALIDARG for null, DISP_E_BADVARTYPE for an unknown
/// type, DISP_E_ARRAYISLOCKED for an array in use (both leave the value alone).
ZELT_API HRESULT VariantClear(VARIANT* v) noexcept;
/// A deep copy: strings and arrays are copied, objects are shared. The target is cleared first, except when
/// it is the source. A failure leaves the target empty, unless it could not be cleared: then it is as before.
ZELT_API HRESULT VariantCopy(VARIANT* target, const VARIANT* source) noexcept;
/// The same, after following VT_BYREF (and VT_BYREF | VT_VARIANT once).
ZELT_API HRESULT VariantCopyInd(VARIANT* target, const VARIANT* source) noexcept;
/// Converts by the automation rules; target may be source. Numbers convert to numbers with a range check
/// (DISP_E_OVERFLOW); a real number to an integer rounds half to even; NaN to an integer is DISP_E_OVERFLOW;
/// VT_BOOL is -1 or 0 as a number (all bits set in an unsigned type), any number but 0 is true; strings are
/// read and written in the C locale, the whole string (blanks around it aside) must be the number, and
/// "True"/"False" in any case for VT_BOOL; VT_EMPTY converts to 0, false and the empty string; VT_NULL to
/// nothing but itself; VT_ERROR to itself and to a string ("Error 2147614724"); objects convert to VT_UNKNOWN
/// and VT_DISPATCH by query; equal types are copied; anything else is DISP_E_TYPEMISMATCH. VT_BYREF sources
/// are followed. The target is untouched on failure.
ZELT_API HRESULT VariantChangeType(VARIANT* target, const VARIANT* source, uint16_t flags,
                                   VARTYPE type) noexcept;

constexpr VARIANT empty_variant() noexcept { return VARIANT{VT_EMPTY, {}, {.llVal = 0}}; }

/// What an argument looks like that a late-bound caller left out.
constexpr VARIANT missing_argument() noexcept
{
    VARIANT v{VT_ERROR, {}, {.llVal = 0}};
    v.scode = DISP_E_PARAMNOTFOUND;
    return v;
}

constexpr bool is_missing(const VARIANT& v) noexcept
{
    return v.vt == VT_ERROR && v.scode == DISP_E_PARAMNOTFOUND;
}

/// Owns a VARIANT.
class variant {
public:
    variant() noexcept : v_(empty_variant()) {}
    variant(int32_t n) noexcept : variant() { v_.vt = VT_I4, v_.lVal = n; }
    variant(uint32_t n) noexcept : variant() { v_.vt = VT_UI4, v_.ulVal = n; }
    variant(double n) noexcept : variant() { v_.vt = VT_R8, v_.dblVal = n; }
    variant(float n) noexcept : variant() { v_.vt = VT_R4, v_.fltVal = n; }
    variant(bool b) noexcept : variant() { v_.vt = VT_BOOL, v_.boolVal = b ? VARIANT_TRUE : VARIANT_FALSE; }
    /// Throws std::bad_alloc.
    ZELT_API variant(const wchar_t* text);
    /// Shares the object: VT_DISPATCH when the pointer is one, else VT_UNKNOWN.
    variant(IDispatch* object) noexcept : variant()
    {
        v_.vt = VT_DISPATCH, v_.pdispVal = com_ptr(object).detach();
    }
    variant(IUnknown* object) noexcept : variant()
    {
        v_.vt = VT_UNKNOWN, v_.punkVal = com_ptr(object).detach();
    }
    /// A deep copy. Throws std::bad_alloc.
    ZELT_API variant(const variant& other);
    variant(variant&& other) noexcept : v_(std::exchange(other.v_, empty_variant())) {}
    variant& operator=(variant other) noexcept
    {
        std::swap(v_, other.v_);
        return *this;
    }
    ~variant() { clear(); }

    static variant attach(const VARIANT& v) noexcept
    {
        variant owner;
        owner.v_ = v;
        return owner;
    }
    [[nodiscard]] VARIANT detach() noexcept { return std::exchange(v_, empty_variant()); }
    VARIANT* put() noexcept
    {
        clear();
        return &v_;
    }
    VARIANT* get() noexcept { return &v_; }
    const VARIANT* get() const noexcept { return &v_; }
    VARTYPE type() const noexcept { return v_.vt; }
    const VARIANT* operator->() const noexcept { return &v_; }

private:
    /// A number owns nothing: most values need no call.
    void clear() noexcept
    {
        if (v_.vt <= VT_R8)
            v_ = empty_variant();
        else
            VariantClear(&v_);
    }

    VARIANT v_;
};

} // namespace Qor
