// Complex numbers as objects, and operations on complex images.
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

struct IComplexOps : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0303-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IComplexOps";
    using base = IDispatch;
};

struct IComplexOps2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0304-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IComplexOps2";
    using base = IDispatch;
};

} // namespace Qor::Luxar::ZELT
