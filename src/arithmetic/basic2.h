// The facet of pixel-wise arithmetic.
#pragma once

#include "frame/facet.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor::Luxar::ZELT {

class CBasic2 : public rounding_facet<IBasicOps2> {
public:
    HRESULT Add(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Subtract(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT ReverseSubtract(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg,
                            IPixmat2** ppIOut) noexcept override;
    HRESULT Multiply(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Divide(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT ReverseDivide(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT SetTo(IPixmat2* pIImg, VARIANT b, IRectangle* pIRect) noexcept override;
    HRESULT AddOffset(IPixmat2* pIA, IPixmat2* pIB, ICoordinateFloat* pIPos, double fa,
                      double fb) noexcept override;
    HRESULT AddIntegerOffset(IPixmat2* pIA, IPixmat2* pIB, ICoordinateInt* pIPos, double fa, double fb,
                             IPixmat2* pIOut, IPixmat2** ppIOut) noexcept override;
    HRESULT Min(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Max(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Abs(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Threshold(IPixmat2* pIImage, VARIANT lowLimit, VARIANT lowValue, VARIANT highLimit,
                      VARIANT highValue, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Normalize(IPixmat2* pIImage, double low, double high, IPixmat2* pIOutImg,
                      IPixmat2** ppIOut) noexcept override;
    HRESULT Equals(IPixmat2* pIImgA, IPixmat2* pIImgB, VARIANT_BOOL* pResult) noexcept override;
    HRESULT AutoThreshold(IPixmat2* pIImage, VARIANT belowValue, VARIANT aboveValue,
                          ZELT_AutoThreshold_Method method, IPixmat2* pIOutImg,
                          IPixmat2** ppIOut) noexcept override;
    HRESULT Margins(IPixmat2* pIImage, LONG imgMargins, IPixmat2* pIOutImg,
                    IPixmat2** ppIOut) noexcept override;
    HRESULT Combine(IPixmat2* pIBaseImage, IPixmat2* pICombineImage, IPixmat2* pIWeightMask,
                    IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Exp(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Log(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Modulate(IPixmat2* pIImage, IPixmat2* pIMask, double weight, IPixmat2* pIOutImage,
                     IPixmat2** ppIOut) noexcept override;
    HRESULT Extend(IPixmat2* pIImage, IRectangle* pIExtendedImageDomain,
                   ZELT_BoundaryCondition boundaryCondition, double padValue, IPixmat2* pIOut,
                   IPixmat2** ppIPixmat) noexcept override;
    HRESULT Power(IPixmat2* pIA, double exponent, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
};
using CBasic2Disp = scripting<CBasic2>;

} // namespace Qor::Luxar::ZELT
