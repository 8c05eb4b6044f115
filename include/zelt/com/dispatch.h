// Late binding: IDispatch and what it passes, enumerators, error support, class factories.
#pragma once

#include "zelt/com/unknown.h"

namespace Qor {

struct VARIANT;
struct ITypeInfo;

inline constexpr uint16_t DISPATCH_METHOD = 1;
inline constexpr uint16_t DISPATCH_PROPERTYGET = 2;
inline constexpr uint16_t DISPATCH_PROPERTYPUT = 4;
inline constexpr uint16_t DISPATCH_PROPERTYPUTREF = 8;

inline constexpr DISPID DISPID_VALUE = 0;
inline constexpr DISPID DISPID_UNKNOWN = -1;
inline constexpr DISPID DISPID_PROPERTYPUT = -3;
inline constexpr DISPID DISPID_NEWENUM = -4;

inline constexpr LCID LOCALE_USER_DEFAULT = 1024;

/// Arguments of a late-bound call, last one first. The first cNamedArgs of them are named.
struct DISPPARAMS {
    VARIANT* rgvarg;
    DISPID* rgdispidNamedArgs;
    uint32_t cArgs;
    uint32_t cNamedArgs;
};

/// Filled when Invoke answers DISP_E_EXCEPTION; the caller frees the strings.
struct EXCEPINFO {
    uint16_t wCode;
    uint16_t wReserved;
    BSTR bstrSource;
    BSTR bstrDescription;
    BSTR bstrHelpFile;
    uint32_t dwHelpContext;
    HRESULT scode;
};

struct IDispatch : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0001-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IDispatch";
    using base = IUnknown;

    virtual HRESULT GetTypeInfoCount(uint32_t* count) noexcept = 0;
    virtual HRESULT GetTypeInfo(uint32_t index, LCID locale, ITypeInfo** info) noexcept = 0;
    /// The first name is a method or property, the others are arguments of it. Case does not matter.
    virtual HRESULT GetIDsOfNames(const GUID& reserved, OLECHAR** names, uint32_t count, LCID locale,
                                  DISPID* ids) noexcept = 0;
    virtual HRESULT Invoke(DISPID id, const GUID& reserved, LCID locale, uint16_t flags, DISPPARAMS* params,
                           VARIANT* result, EXCEPINFO* exception, uint32_t* bad_argument) noexcept = 0;
};

struct IEnumVARIANT : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0002-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IEnumVARIANT";
    using base = IUnknown;

    virtual HRESULT Next(ULONG count, VARIANT* items, ULONG* fetched) noexcept = 0;
    virtual HRESULT Skip(ULONG count) noexcept = 0;
    virtual HRESULT Reset() noexcept = 0;
    virtual HRESULT Clone(IEnumVARIANT** out) noexcept = 0;
};

struct ISupportErrorInfo : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0003-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "ISupportErrorInfo";
    using base = IUnknown;

    /// S_OK when failures of that interface leave error information, else S_FALSE.
    virtual HRESULT InterfaceSupportsErrorInfo(const GUID& id) noexcept = 0;
};

struct IErrorInfo : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0004-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IErrorInfo";
    using base = IUnknown;

    virtual HRESULT GetGUID(GUID* id) noexcept = 0;
    virtual HRESULT GetSource(BSTR* text) noexcept = 0;
    virtual HRESULT GetDescription(BSTR* text) noexcept = 0;
    virtual HRESULT GetHelpFile(BSTR* text) noexcept = 0;
    virtual HRESULT GetHelpContext(uint32_t* context) noexcept = 0;
};

struct ICreateErrorInfo : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0005-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "ICreateErrorInfo";
    using base = IUnknown;

    virtual HRESULT SetGUID(const GUID& id) noexcept = 0;
    virtual HRESULT SetSource(const OLECHAR* text) noexcept = 0;
    virtual HRESULT SetDescription(const OLECHAR* text) noexcept = 0;
    virtual HRESULT SetHelpFile(const OLECHAR* text) noexcept = 0;
    virtual HRESULT SetHelpContext(uint32_t context) noexcept = 0;
};

struct IClassFactory : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0006-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IClassFactory";
    using base = IUnknown;

    /// With an outer object only IUnknown may be asked for, else CLASS_E_NOAGGREGATION.
    virtual HRESULT CreateInstance(IUnknown* outer, const GUID& id, void** out) noexcept = 0;
    virtual HRESULT LockServer(LONG lock) noexcept = 0;
};

inline constexpr uint32_t INTERFACESAFE_FOR_UNTRUSTED_CALLER = 1;
inline constexpr uint32_t INTERFACESAFE_FOR_UNTRUSTED_DATA = 2;

/// Script hosts ask it before they trust an object.
struct IObjectSafety : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0007-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IObjectSafety";
    using base = IUnknown;

    virtual HRESULT GetInterfaceSafetyOptions(const GUID& id, uint32_t* supported,
                                              uint32_t* enabled) noexcept = 0;
    virtual HRESULT SetInterfaceSafetyOptions(const GUID& id, uint32_t mask, uint32_t enabled) noexcept = 0;
};

} // namespace Qor
