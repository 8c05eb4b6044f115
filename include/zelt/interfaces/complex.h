// Complex numbers as objects.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor::Luxar::ZELT {

/// A complex number; a new one is 0 + 0i. A get with a null out pointer answers E_POINTER.
struct IComplex : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0301-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IComplex";
    using base = IDispatch;

    virtual HRESULT get_Real(double* value) noexcept = 0;
    virtual HRESULT put_Real(double value) noexcept = 0;
    virtual HRESULT get_Imaginary(double* value) noexcept = 0;
    virtual HRESULT put_Imaginary(double value) noexcept = 0;
};

} // namespace Qor::Luxar::ZELT
