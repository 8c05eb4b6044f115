// Fixed-width automation types and result codes. The numbers of the codes never change.
#pragma once

#include "zelt/api.h"

#include <cstddef>
#include <cstdint>

namespace Qor {

using LONG = int32_t;
using ULONG = uint32_t;
using HRESULT = int32_t;
using OLECHAR = wchar_t;
using BSTR = OLECHAR*;
using VARIANT_BOOL = int16_t;
using VARTYPE = uint16_t;
using DISPID = int32_t;
using LCID = uint32_t;

inline constexpr VARIANT_BOOL VARIANT_TRUE = -1;
inline constexpr VARIANT_BOOL VARIANT_FALSE = 0;

constexpr HRESULT make_hresult(uint32_t code) noexcept { return static_cast<HRESULT>(code); }

inline constexpr HRESULT S_OK = 0;
inline constexpr HRESULT S_FALSE = 1;
inline constexpr HRESULT E_NOTIMPL = make_hresult(0x80004001);
inline constexpr HRESULT E_NOINTERFACE = make_hresult(0x80004002);
inline constexpr HRESULT E_POINTER = make_hresult(0x80004003);
inline constexpr HRESULT E_FAIL = make_hresult(0x80004005);
inline constexpr HRESULT E_SIZE_MISMATCH =
    make_hresult(0x8004000D); ///< a descriptor of another size than the input
inline constexpr HRESULT E_UNEXPECTED = make_hresult(0x8000FFFF);
inline constexpr HRESULT E_ACCESSDENIED = make_hresult(0x80070005);
inline constexpr HRESULT E_OUTOFMEMORY = make_hresult(0x8007000E);
inline constexpr HRESULT E_INVALIDARG = make_hresult(0x80070057);
inline constexpr HRESULT CLASS_E_NOAGGREGATION = make_hresult(0x80040110);
inline constexpr HRESULT CLASS_E_CLASSNOTAVAILABLE = make_hresult(0x80040111);
inline constexpr HRESULT REGDB_E_READREGDB = make_hresult(0x80040150);
inline constexpr HRESULT REGDB_E_WRITEREGDB = make_hresult(0x80040151);
inline constexpr HRESULT REGDB_E_INVALIDVALUE = make_hresult(0x80040153);
inline constexpr HRESULT REGDB_E_CLASSNOTREG = make_hresult(0x80040154);
inline constexpr HRESULT CO_E_CLASSSTRING = make_hresult(0x800401F3);
inline constexpr HRESULT CO_E_DLLNOTFOUND = make_hresult(0x800401F8);
inline constexpr HRESULT CO_E_ERRORINDLL = make_hresult(0x800401F9);
inline constexpr HRESULT DISP_E_MEMBERNOTFOUND = make_hresult(0x80020003);
inline constexpr HRESULT DISP_E_PARAMNOTFOUND = make_hresult(0x80020004);
inline constexpr HRESULT DISP_E_TYPEMISMATCH = make_hresult(0x80020005);
inline constexpr HRESULT DISP_E_UNKNOWNNAME = make_hresult(0x80020006);
inline constexpr HRESULT DISP_E_BADVARTYPE = make_hresult(0x80020008);
inline constexpr HRESULT DISP_E_EXCEPTION = make_hresult(0x80020009);
inline constexpr HRESULT DISP_E_OVERFLOW = make_hresult(0x8002000A);
inline constexpr HRESULT DISP_E_BADINDEX = make_hresult(0x8002000B);
inline constexpr HRESULT DISP_E_ARRAYISLOCKED = make_hresult(0x8002000D);
inline constexpr HRESULT DISP_E_BADPARAMCOUNT = make_hresult(0x8002000E);
inline constexpr HRESULT DISP_E_PARAMNOTOPTIONAL = make_hresult(0x8002000F);

constexpr bool succeeded(HRESULT code) noexcept { return code >= 0; }
constexpr bool failed(HRESULT code) noexcept { return code < 0; }

struct GUID {
    uint32_t data1;
    uint16_t data2;
    uint16_t data3;
    uint8_t data4[8];

    friend bool operator==(const GUID&, const GUID&) = default;
};

inline constexpr GUID GUID_NULL{};

namespace detail {
consteval uint32_t hex(const char* text, int digits)
{
    uint32_t value = 0;
    for (int i = 0; i < digits; ++i) {
        const char c = text[i];
        const int digit = c >= '0' && c <= '9'   ? c - '0'
                          : c >= 'a' && c <= 'f' ? c - 'a' + 10
                          : c >= 'A' && c <= 'F' ? c - 'A' + 10
                                                 : throw "not a hexadecimal digit";
        value = value * 16 + static_cast<uint32_t>(digit);
    }
    return value;
}
} // namespace detail

/// "01234567-89ab-cdef-0123-456789abcdef" as an identifier, at compile time.
consteval GUID guid(const char (&text)[37])
{
    GUID g{};
    g.data1 = detail::hex(text, 8);
    g.data2 = static_cast<uint16_t>(detail::hex(text + 9, 4));
    g.data3 = static_cast<uint16_t>(detail::hex(text + 14, 4));
    for (int i = 0; i < 2; ++i) g.data4[i] = static_cast<uint8_t>(detail::hex(text + 19 + 2 * i, 2));
    for (int i = 0; i < 6; ++i) g.data4[2 + i] = static_cast<uint8_t>(detail::hex(text + 24 + 2 * i, 2));
    return g;
}

/// "{01234567-89AB-CDEF-0123-456789ABCDEF}" into a buffer of at least 39 characters.
ZELT_API void guid_to_text(const GUID& id, char (&text)[39]) noexcept;

} // namespace Qor
