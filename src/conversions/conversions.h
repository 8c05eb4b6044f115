// The facets of conversions between image formats.
#pragma once

#include "frame/facet.h"
#include "zelt/interfaces/conversions.h"

namespace Qor::Luxar::ZELT {

class CConversions2 : public rounding_facet<IConversions2> {
public:
    HRESULT Recode(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IRectangle* pISrcArea,
                   ICoordinateInt* pIDstPoint) noexcept override;
    HRESULT RecodeEx(IPixmat2* pIIn, IPixmatDescriptor* pIDescr, IRectangle* pISrcArea,
                     ICoordinateInt* pIDstPoint, IPixmat2** ppIOut) noexcept override;
    HRESULT Cast(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IRectangle* pISrcArea,
                 ICoordinateInt* pIDstPoint) noexcept override;
    HRESULT CastEx(IPixmat2* pIIn, IPixmatDescriptor* pIDescr, IRectangle* pISrcArea,
                   ICoordinateInt* pIDstPoint, IPixmat2** ppIOut) noexcept override;

    HRESULT Copy(IPixmat2*, IRectangle*, IPixmat2**) noexcept override { return E_NOTIMPL; }
    HRESULT Paste(IPixmat2*, IPixmat2*, ICoordinateInt*) noexcept override { return E_NOTIMPL; }
    HRESULT ToGrey(IPixmat2*, LONG, IPixmat2**) noexcept override { return E_NOTIMPL; }
    HRESULT ToSafeArray(IPixmat2*, uint16_t, ULONG, IRectangle*, VARIANT*) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT FromSafeArray(VARIANT, PixmatEncoding, LONG, ULONG, IPixmat2*, IPixmat2**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT Reformat(IPixmat2*, IPixmat2*, ULONG, IRectangle*) noexcept override { return E_NOTIMPL; }
    HRESULT ReformatEx(IPixmat2*, ULONG, LONG, PixmatEncoding, IRectangle*, IPixmat2**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT ApplyLUT(IPixmat2*, ILookupTable*, PixmatEncoding, IPixmat2**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT ApplyLevels(IPixmat2*, double, double, double, double, LONG, PixmatEncoding,
                        IPixmat2**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT Interleave(IPixmat2*, IPixmat2*, LONG, LONG) noexcept override { return E_NOTIMPL; }
    HRESULT Split(IPixmat2*, LONG, LONG, IPixmat2**) noexcept override { return E_NOTIMPL; }
    HRESULT ApplyLUTEx(IPixmat2*, IPixmat2*, ILookupTable*) noexcept override { return E_NOTIMPL; }
    HRESULT ApplyLevelsEx(IPixmat2*, IPixmat2*, double, double, double, double) noexcept override
    {
        return E_NOTIMPL;
    }
};
using CConversions2Disp = scripting<CConversions2>;

/// Forwards to a second-generation object of its own.
class CConversions : public automation<IConversions> {
public:
    ZeltRoundable& roundable() noexcept { return second_->roundable(); }

    HRESULT Recode(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IRectangle* pISrcArea,
                   ICoordinateInt* pIDstPoint) noexcept override
    {
        return second_->Recode(pIDstImage, pISrcImage, pISrcArea, pIDstPoint);
    }
    HRESULT RecodeEx(IPixmat2* pIIn, IPixmatDescriptor* pIDescr, IRectangle* pISrcArea,
                     ICoordinateInt* pIDstPoint, IPixmat2** ppIOut) noexcept override
    {
        return second_->RecodeEx(pIIn, pIDescr, pISrcArea, pIDstPoint, ppIOut);
    }
    HRESULT Cast(IPixmat2*, IPixmatDescriptor*) noexcept override { return E_NOTIMPL; }
    HRESULT Cut(IPixmat2* pIIn, IRectangle* pISrcArea, IPixmat2** ppIOut) noexcept override
    {
        return second_->Copy(pIIn, pISrcArea, ppIOut);
    }
    HRESULT Paste(IPixmat2* pIIn, IPixmat2* pISelection, ICoordinateInt* pIDstPoint) noexcept override
    {
        return second_->Paste(pIIn, pISelection, pIDstPoint);
    }
    HRESULT ToGrey(IPixmat2* pIIn, LONG bits, IPixmat2** ppIOut) noexcept override
    {
        return second_->ToGrey(pIIn, bits, ppIOut);
    }
    HRESULT ToSafeArray(IPixmat2* pIIn, uint16_t varType, ULONG layout, IRectangle* pISrcArea,
                        VARIANT* pArray) noexcept override
    {
        return second_->ToSafeArray(pIIn, varType, layout, pISrcArea, pArray);
    }
    HRESULT FromSafeArray(VARIANT array, PixmatEncoding encoding, LONG bits, ULONG layout,
                          IPixmat2** ppIOut) noexcept override
    {
        return second_->FromSafeArray(array, encoding, bits, layout, nullptr, ppIOut);
    }
    HRESULT Reformat(IPixmat2* pIIn, ULONG layout, LONG bits, PixmatEncoding encoding, IRectangle* pISrcArea,
                     IPixmat2** ppIOut) noexcept override
    {
        return second_->ReformatEx(pIIn, layout, bits, encoding, pISrcArea, ppIOut);
    }

private:
    com_ptr<CConversions2> second_ = make<CConversions2>();
};

} // namespace Qor::Luxar::ZELT
