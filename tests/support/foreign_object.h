// Objects of somebody else: counted, with an interface of ours, and not to be called by name.
#pragma once

#include "com/implements.h"

namespace Qor::Luxar::ZELT::Test {

template <class Interface>
class foreign_object : public implements<Interface> {
public:
    HRESULT GetTypeInfoCount(uint32_t*) noexcept override { return E_NOTIMPL; }
    HRESULT GetTypeInfo(uint32_t, LCID, ITypeInfo**) noexcept override { return E_NOTIMPL; }
    HRESULT GetIDsOfNames(const GUID&, OLECHAR**, uint32_t, LCID, DISPID*) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT Invoke(DISPID, const GUID&, LCID, uint16_t, DISPPARAMS*, VARIANT*, EXCEPINFO*,
                   uint32_t*) noexcept override
    {
        return E_NOTIMPL;
    }
};

} // namespace Qor::Luxar::ZELT::Test
