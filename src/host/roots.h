// The root objects of both generations.
#pragma once

#include "arithmetic/arithmetic.h"
#include "conversions/complex.h"
#include "conversions/conversions.h"
#include "filters/filters.h"
#include "flatfield/flatfield.h"
#include "fourier/fourier.h"
#include "frame/operation.h"
#include "geometry/geometry.h"
#include "morphology/morphology.h"
#include "statistics/statistics.h"
#include "threads/cancellation.h"
#include "utilities/utilities.h"
#include "zelt/interfaces/zelt.h"

#include <vector>

namespace Qor::Luxar::ZELT {

/// What all roots do: keep the rounding mode, make facets at first use and keep them.
template <class Base, class Root>
class root_object : public Base {
public:
    explicit root_object(IUnknown* outer) noexcept : Base(outer) {}

    HRESULT get_Rounding(ZELT_Rounding* mode) noexcept override
    {
        if (!mode) return E_POINTER;
        *mode = rounding_;
        return S_OK;
    }

    HRESULT put_Rounding(ZELT_Rounding mode) noexcept override
    {
        if (mode == ZELT_Rounding_Default)
            return ReportError( // the second generation speaks for both
                CLSID_ZELT2,
                L"ZELT_Rounding_Default specified for entire library - should be specific rounding mode",
                Root::iid, E_INVALIDARG);
        rounding_ = mode;
        for (ZeltRoundable* r : roundables_) r->set(mode);
        return S_OK;
    }

protected:
    /// The facet of a property. A facet never sees a stale mode: it is set before anybody gets the facet.
    template <class Facet, class Interface, class... Args>
    HRESULT hand_out(com_ptr<Interface>& kept, Interface** out, Args... args) noexcept
    {
        if (!kept) {
            const HRESULT hr = run_frame(Root::iid, [&] {
                const com_ptr<Facet> facet = make<Facet>(args...);
                if constexpr (requires { facet->roundable(); }) {
                    facet->roundable().set(rounding_);
                    roundables_.push_back(&facet->roundable());
                }
                kept = facet;
                return S_OK;
            });
            if (failed(hr)) return hr;
        }
        if (!out) return E_POINTER;
        kept.copy_to(out);
        return S_OK;
    }

private:
    ZELT_Rounding rounding_ = ZELT_Rounding_Wrap;
    std::vector<ZeltRoundable*> roundables_; // owned by the facets, which the roots hold
};

template <class Interface>
using scripted_root =
    dispatching<aggregatable<Interface, error_support<Interface>, safe_for_scripts>, Interface>;
template <class Interface>
using plain_root = dispatching<aggregatable<Interface>, Interface>;

class CZelt final : public root_object<scripted_root<IZELT>, IZELT> {
public:
    using root_object::root_object;

    HRESULT get_Basic(IBasicOps** facet) noexcept override { return hand_out<CBasic>(basic_, facet); }
    HRESULT get_Conversions(IConversions** facet) noexcept override
    {
        return hand_out<CConversions>(conversions_, facet);
    }
    HRESULT get_Transforms(ITransforms** facet) noexcept override
    {
        return hand_out<CTransforms>(transforms_, facet);
    }
    HRESULT get_Statistics(IStatistics** facet) noexcept override
    {
        return hand_out<CStatistics>(statistics_, facet);
    }
    HRESULT get_Math(IMath** facet) noexcept override { return hand_out<CMath>(math_, facet); }
    HRESULT get_Complex(IComplexOps** facet) noexcept override
    {
        return hand_out<CComplexOps>(complex_, facet);
    }
    HRESULT get_Filters(IFilters** facet) noexcept override
    {
        return hand_out<CFilters>(filters_, facet, static_cast<IZELT*>(this));
    }
    HRESULT get_Geometric(IGeometric** facet) noexcept override
    {
        return hand_out<CGeometric>(geometric_, facet);
    }
    HRESULT get_Noise(INoise** facet) noexcept override { return hand_out<CNoise>(noise_, facet); }
    HRESULT get_Miscellaneous(IMiscellaneous** facet) noexcept override
    {
        return hand_out<CMiscellaneous>(miscellaneous_, facet);
    }
    HRESULT get_Morphology(IMorphology** facet) noexcept override
    {
        return hand_out<CMorphology>(morphology_, facet);
    }
    HRESULT get_FlatFielding(IFlatFielding** facet) noexcept override
    {
        return hand_out<CFlatFielding>(flat_fielding_, facet);
    }

private:
    com_ptr<IBasicOps> basic_;
    com_ptr<IConversions> conversions_;
    com_ptr<ITransforms> transforms_;
    com_ptr<IStatistics> statistics_;
    com_ptr<IMath> math_;
    com_ptr<IComplexOps> complex_;
    com_ptr<IFilters> filters_;
    com_ptr<IGeometric> geometric_;
    com_ptr<INoise> noise_;
    com_ptr<IMiscellaneous> miscellaneous_;
    com_ptr<IMorphology> morphology_;
    com_ptr<IFlatFielding> flat_fielding_;
};

/// The facet itself, where a root hands out classes without the scripts' layer.
template <class Facet>
using plain = Facet;

/// The second generation, whose facets are made in the given form.
template <template <class> class Form, class Base>
class zelt2_root : public root_object<Base, IZELT2> {
public:
    using root_object<Base, IZELT2>::root_object;

    HRESULT get_Basic(IBasicOps2** facet) noexcept override
    {
        return this->template hand_out<Form<CBasic2>>(basic_, facet);
    }
    HRESULT get_Conversions(IConversions2** facet) noexcept override
    {
        return this->template hand_out<Form<CConversions2>>(conversions_, facet);
    }
    HRESULT get_Transforms(ITransforms2** facet) noexcept override
    {
        return this->template hand_out<Form<CTransforms2>>(transforms_, facet);
    }
    HRESULT get_Statistics(IStatistics** facet) noexcept override
    {
        return this->template hand_out<Form<CStatistics>>(statistics_, facet);
    }
    HRESULT get_Math(IMath** facet) noexcept override
    {
        return this->template hand_out<Form<CMath>>(math_, facet);
    }
    HRESULT get_Complex(IComplexOps2** facet) noexcept override
    {
        return this->template hand_out<Form<CComplexOps2>>(complex_, facet);
    }
    HRESULT get_Filters(IFilters2** facet) noexcept override
    {
        return this->template hand_out<Form<CFilters2>>(filters_, facet, static_cast<IZELT2*>(this));
    }
    HRESULT get_Geometric(IGeometric2** facet) noexcept override
    {
        return this->template hand_out<Form<CGeometric2>>(geometric_, facet);
    }
    HRESULT get_Noise(INoise2** facet) noexcept override
    {
        return this->template hand_out<Form<CNoise2>>(noise_, facet);
    }
    HRESULT get_Miscellaneous(IMiscellaneous** facet) noexcept override
    {
        return this->template hand_out<CMiscellaneous>(miscellaneous_, facet);
    }
    HRESULT get_Morphology(IMorphology** facet) noexcept override
    {
        return this->template hand_out<Form<CMorphology>>(morphology_, facet);
    }
    HRESULT get_FlatFielding(IFlatFielding** facet) noexcept override
    {
        return this->template hand_out<Form<CFlatFielding>>(flat_fielding_, facet);
    }
    HRESULT Cancel() noexcept override
    {
        RequestCancel();
        return S_OK;
    }
    HRESULT get_Fourier(IFourier** facet) noexcept override
    {
        return this->template hand_out<Form<CFourier>>(fourier_, facet);
    }

private:
    com_ptr<IBasicOps2> basic_;
    com_ptr<IConversions2> conversions_;
    com_ptr<ITransforms2> transforms_;
    com_ptr<IStatistics> statistics_;
    com_ptr<IMath> math_;
    com_ptr<IComplexOps2> complex_;
    com_ptr<IFilters2> filters_;
    com_ptr<IGeometric2> geometric_;
    com_ptr<INoise2> noise_;
    com_ptr<IMiscellaneous> miscellaneous_;
    com_ptr<IMorphology> morphology_;
    com_ptr<IFlatFielding> flat_fielding_;
    com_ptr<IFourier> fourier_;
};

using CZelt2 = zelt2_root<scripting, scripted_root<IZELT2>>;
using CZelt2NoDispatch = zelt2_root<plain, plain_root<IZELT2>>;

} // namespace Qor::Luxar::ZELT
