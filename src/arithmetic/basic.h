// The first generation of pixel-wise arithmetic.
#pragma once

#include "arithmetic/basic2.h"

namespace Qor::Luxar::ZELT {

/// Works on a second-generation object of its own, whose rounding mode is its own.
class CBasic : public automation<IBasicOps> {
public:
    ZeltRoundable& roundable() noexcept { return second_->roundable(); }

    HRESULT Add(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept override;
    HRESULT AddEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                  IPixmat2** ppIOut) noexcept override;
    HRESULT Subtract(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept override;
    HRESULT SubtractEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                       IPixmat2** ppIOut) noexcept override;
    HRESULT ReverseSubtract(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept override;
    HRESULT ReverseSubtractEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                              IPixmat2** ppIOut) noexcept override;
    HRESULT Multiply(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept override;
    HRESULT MultiplyEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                       IPixmat2** ppIOut) noexcept override;
    HRESULT Divide(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept override;
    HRESULT DivideEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                     IPixmat2** ppIOut) noexcept override;
    HRESULT ReverseDivide(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept override;
    HRESULT ReverseDivideEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                            IPixmat2** ppIOut) noexcept override;
    HRESULT SetTo(IPixmat2* pIImg, VARIANT b, IRectangle* pIRect) noexcept override;
    HRESULT AddOffset(IPixmat2* pIA, IPixmat2* pIB, ICoordinateFloat* pIPos,
                      ZELT_Offset mode) noexcept override;
    HRESULT Min(IPixmat2* pIA, VARIANT b) noexcept override;
    HRESULT MinEx(IPixmat2* pIA, VARIANT b, IPixmatDescriptor* pIOutDescr,
                  IPixmat2** ppIOut) noexcept override;
    HRESULT Max(IPixmat2* pIA, VARIANT b) noexcept override;
    HRESULT MaxEx(IPixmat2* pIA, VARIANT b, IPixmatDescriptor* pIOutDescr,
                  IPixmat2** ppIOut) noexcept override;
    HRESULT Abs(IPixmat2* pIImage) noexcept override;
    HRESULT AbsEx(IPixmat2* pIImage, IPixmatDescriptor* pIOutDescr, IPixmat2** ppIOut) noexcept override;
    HRESULT Threshold(IPixmat2* pIImage, VARIANT lowLimit, VARIANT lowValue, VARIANT highLimit,
                      VARIANT highValue) noexcept override;
    HRESULT ThresholdEx(IPixmat2* pIImage, VARIANT lowLimit, VARIANT lowValue, VARIANT highLimit,
                        VARIANT highValue, IPixmatDescriptor* pIOutDescr,
                        IPixmat2** ppIOut) noexcept override;

private:
    com_ptr<CBasic2> second_ = make<CBasic2>();
};

} // namespace Qor::Luxar::ZELT
