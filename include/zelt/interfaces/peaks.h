// Result objects of the peak finders and of pyramid sharpness.
#pragma once

#include "zelt/com/safe_array.h"
#include "zelt/pixmat/values.h"

namespace Qor::Luxar::ZELT {

/// One peak; it does not change once it is made.
struct IPeak : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0311-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPeak";
    using base = IDispatch;

    virtual HRESULT get_Position(ICoordinateFloat** position) noexcept = 0;
    virtual HRESULT get_Value(double* value) noexcept = 0;
};

/// Peaks in result order. Indices count from 0; one outside is E_INVALIDARG.
struct IPeaks : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0312-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPeaks";
    using base = IDispatch;

    virtual HRESULT get_Count(LONG* count) noexcept = 0;
    virtual HRESULT get_Item(LONG index, IPeak** peak) noexcept = 0;
    virtual HRESULT get__NewEnum(IUnknown** enumerator) noexcept = 0;
};

struct IPyramidSharpnessResult : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0313-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPyramidSharpnessResult";
    using base = IDispatch;

    virtual HRESULT get_NumberOfPyramids(LONG* count) noexcept = 0;
    virtual HRESULT get_SharpnessArray(SAFEARRAY** array) noexcept = 0;
    virtual HRESULT get_AggregateSharpness(double* value) noexcept = 0;
};

} // namespace Qor::Luxar::ZELT
