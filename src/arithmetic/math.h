// The facet of mathematical functions of pixels.
#pragma once

#include "frame/facet.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor::Luxar::ZELT {

class CMath : public rounding_facet<IMath> {
public:
    HRESULT Sin(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Cos(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Tan(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Asin(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Acos(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Atan(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept override;
    HRESULT Atan2(IPixmat2* pIImageA, IPixmat2* pIImageB, IPixmat2* pIOutImg,
                  IPixmat2** ppIOut) noexcept override;
};
using CMathDisp = scripting<CMath>;

} // namespace Qor::Luxar::ZELT
