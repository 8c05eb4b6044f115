// The root objects: where a client begins.
#pragma once

#include "zelt/interfaces/enums.h"
#include "zelt/interfaces/facets.h"

namespace Qor::Luxar::ZELT {

inline constexpr GUID CLSID_ZELT = guid("5a1e0001-0001-4000-8000-00000000c0de");
inline constexpr GUID CLSID_ZELT2 = guid("5a1e0001-0002-4000-8000-00000000c0de");
inline constexpr GUID CLSID_ZELT2NoDispatch = guid("5a1e0001-0003-4000-8000-00000000c0de");
inline constexpr GUID CLSID_Complex = guid("5a1e0001-0004-4000-8000-00000000c0de");

/// The first generation's root, created as "ZELT.Main". Facets are made at first use, kept for the root's life and
/// handed out again with a reference added. Make the first call to a property from one thread.
/// Fails  E_POINTER for a null out pointer (a facet made by the call stays); E_OUTOFMEMORY; what a facet's creation
///        answers.
struct IZELT : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0300-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IZELT";
    using base = IDispatch;

    /// The rounding mode of all facets of this root that round. A new root has ZELT_Rounding_Wrap.
    virtual HRESULT get_Rounding(ZELT_Rounding* mode) noexcept = 0;
    /// Takes effect at once in the facets that exist. Values beyond the enumeration are stored as they are; arithmetic
    /// then answers E_UNEXPECTED.
    /// Fails  E_INVALIDARG "ZELT_Rounding_Default specified for entire library - should be specific rounding mode".
    virtual HRESULT put_Rounding(ZELT_Rounding mode) noexcept = 0;
    virtual HRESULT get_Basic(IBasicOps** facet) noexcept = 0;
    virtual HRESULT get_Conversions(IConversions** facet) noexcept = 0;
    virtual HRESULT get_Transforms(ITransforms** facet) noexcept = 0;
    virtual HRESULT get_Statistics(IStatistics** facet) noexcept = 0;
    virtual HRESULT get_Math(IMath** facet) noexcept = 0;
    virtual HRESULT get_Complex(IComplexOps** facet) noexcept = 0;
    virtual HRESULT get_Filters(IFilters** facet) noexcept = 0;
    virtual HRESULT get_Geometric(IGeometric** facet) noexcept = 0;
    virtual HRESULT get_Noise(INoise** facet) noexcept = 0;
    virtual HRESULT get_Miscellaneous(IMiscellaneous** facet) noexcept = 0;
    virtual HRESULT get_Morphology(IMorphology** facet) noexcept = 0;
    virtual HRESULT get_FlatFielding(IFlatFielding** facet) noexcept = 0;
};

/// The second generation's root, created as "ZELT.Main2". What IZELT says of properties holds here.
struct IZELT2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0302-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IZELT2";
    using base = IDispatch;

    virtual HRESULT get_Rounding(ZELT_Rounding* mode) noexcept = 0;
    virtual HRESULT put_Rounding(ZELT_Rounding mode) noexcept = 0;
    virtual HRESULT get_Basic(IBasicOps2** facet) noexcept = 0;
    virtual HRESULT get_Conversions(IConversions2** facet) noexcept = 0;
    virtual HRESULT get_Transforms(ITransforms2** facet) noexcept = 0;
    virtual HRESULT get_Statistics(IStatistics** facet) noexcept = 0;
    virtual HRESULT get_Math(IMath** facet) noexcept = 0;
    virtual HRESULT get_Complex(IComplexOps2** facet) noexcept = 0;
    virtual HRESULT get_Filters(IFilters2** facet) noexcept = 0;
    virtual HRESULT get_Geometric(IGeometric2** facet) noexcept = 0;
    virtual HRESULT get_Noise(INoise2** facet) noexcept = 0;
    virtual HRESULT get_Miscellaneous(IMiscellaneous** facet) noexcept = 0;
    virtual HRESULT get_Morphology(IMorphology** facet) noexcept = 0;
    virtual HRESULT get_FlatFielding(IFlatFielding** facet) noexcept = 0;
    /// Asks whatever cancellable operation looks next, in the whole process, to stop: it fails with E_FAIL "ZELT call was
    /// cancelled". The request stays until one takes it. Any thread may call.
    virtual HRESULT Cancel() noexcept = 0;
    virtual HRESULT get_Fourier(IFourier** facet) noexcept = 0;
};

} // namespace Qor::Luxar::ZELT
