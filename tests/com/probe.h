// An object whose references the tests can see.
#pragma once

#include "com/implements.h"
#include "zelt/com/safe_array.h"

struct probe final : Qor::implements<Qor::IDispatch> {
    Qor::HRESULT GetTypeInfoCount(uint32_t*) noexcept override { return Qor::E_NOTIMPL; }
    Qor::HRESULT GetTypeInfo(uint32_t, Qor::LCID, Qor::ITypeInfo**) noexcept override
    {
        return Qor::E_NOTIMPL;
    }
    Qor::HRESULT GetIDsOfNames(const Qor::GUID&, Qor::OLECHAR**, uint32_t, Qor::LCID,
                               Qor::DISPID*) noexcept override
    {
        return Qor::E_NOTIMPL;
    }
    Qor::HRESULT Invoke(Qor::DISPID, const Qor::GUID&, Qor::LCID, uint16_t, Qor::DISPPARAMS*, Qor::VARIANT*,
                        Qor::EXCEPINFO*, uint32_t*) noexcept override
    {
        return Qor::E_NOTIMPL;
    }
};

inline Qor::com_ptr<Qor::IDispatch> make_probe() { return Qor::com_ptr<Qor::IDispatch>::attach(new probe); }

inline Qor::ULONG references(Qor::IUnknown* object)
{
    object->AddRef();
    return object->Release();
}
